// ModifyInstance of ZORVA_DNSSettingData, which writes to the interface's file.
#include <sys/stat.h>

#include <filesystem>
#include <thread>

#include "providers/testing/ModificationTestSupport.h"

extern "C" CMPIInstanceMI* DNSSettingDataProvider_Create_InstanceMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*);

namespace ZV::Test {
namespace {

using std::string_literals::operator""s;
using ::testing::ElementsAre;
using ::testing::ElementsAreArray;
using ::testing::IsEmpty;
using ::testing::Optional;

Path id(const std::string& instanceID) { return Path("ZORVA_DNSSettingData").key("InstanceID", instanceID.c_str()); }

Instance empty() { return Instance("ZORVA_DNSSettingData"); }
Instance whole() {
  return empty()
      .with("RequestedHostname", "newhost")
      .with("DomainName", "new.example.org")
      .with("DNSServerAddresses", texts({"192.0.2.1", "2001:db8::1"}))
      .with("ConfigurationName", "home");
}

constexpr const char* kFile =
    "# eth0\nBOOTPROTO=dhcp\nHOSTNAME=oldhost\nDOMAINNAME=old.example.org\nDNSSERVERS=192.0.2.9 \nDNSSUFFIXES=a b "
    "\nCONFIG_NAME=office\n";

class DNSSettingDataModification : public ::testing::Test {
 protected:
  DNSSettingDataModification() {
    world_.nic("eth0", usualNic()).nic("eth1", usualNic()).install().file("eth0", kFile).file("eth1", kFile);
  }
  Outcome modify(const Instance& instance) {
    const Deadline deadline;
    return provider_.modifyInstance(id("Computer%eth0"), instance);
  }
  // The current value of a key in the first file.
  std::string inFile(const std::string& key) {
    const std::string content = "\n" + world_.fileContent("eth0").value_or("no file");
    const std::size_t found = content.find("\n" + key + "=");
    if (found == std::string::npos) return "no key";
    const std::size_t start = found + key.size() + 2;
    return content.substr(start, content.find('\n', start) - start);
  }
  std::vector<std::string> valuesInFile() {
    return {inFile("HOSTNAME"), inFile("DOMAINNAME"), inFile("DNSSERVERS"), inFile("CONFIG_NAME")};
  }

  World world_;
  RecordingLogger logger_;
  RecordingBroker broker_;
  InstanceProvider provider_{DNSSettingDataProvider_Create_InstanceMI, broker_};
};

// --- a whole operation

TEST_F(DNSSettingDataModification, WritesTheFourValuesInTheirOrder) {
  const Outcome outcome = modify(whole());
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
  EXPECT_EQ(std::nullopt, outcome.message);
  EXPECT_EQ(
      "# eth0\nBOOTPROTO=dhcp\nHOSTNAME=newhost\nDOMAINNAME=new.example.org\nDNSSERVERS=192.0.2.1 2001:db8::1 "
      "\nDNSSUFFIXES=a b \nCONFIG_NAME=home\n",
      world_.fileContent("eth0"));
  const std::string file = world_.filePath("eth0");
  EXPECT_THAT(
      outcome.story(),
      ElementsAreArray(joined({
          {"log 4000 banner", "log 4000 ENTERING DNSSettingData_ModifyInstance",
           "log 3000 ENTERING modifyDNSSettingDataCMPIInstance, broker=ADDR ref=ADDR properties=0 instance=ADDR "
           "status=ADDR",
           "log 4000 VARIABLE fileName = " + file},
          writeLines(file, "HOSTNAME", "newhost"),
          writeLines(file, "DOMAINNAME", "new.example.org"),
          {"log 4000 VARIABLE dns_sfx = 192.0.2.1 2001:db8::1 ", "log 4000 VARIABLE dnsServers.size() = 2"},
          writeLines(file, "DNSSERVERS", "192.0.2.1 2001:db8::1 "),
          writeLines(file, "CONFIG_NAME", "home"),
          {"returnDone()"},
      })));
  EXPECT_THAT(
      outcome.calls.lines(),
      ElementsAre("ref.getKey(\"InstanceID\")", "string \"Computer%eth0\".getCharPtr()",
                  "instance.getProperty(\"RequestedHostname\")", "string \"newhost\".getCharPtr()",
                  "instance.getProperty(\"DomainName\")", "string \"new.example.org\".getCharPtr()",
                  "instance.getProperty(\"DNSServerAddresses\")", "A1.getSize()", "A1.getElementAt(0)",
                  "string \"192.0.2.1\".getCharPtr()", "A1.getElementAt(1)", "string \"2001:db8::1\".getCharPtr()",
                  "instance.getProperty(\"ConfigurationName\")", "string \"home\".getCharPtr()", "returnDone()"));
}

TEST_F(DNSSettingDataModification, LeavesTheOtherFilesAndTheNodesAsTheyAre) {
  modify(whole());
  EXPECT_EQ(kFile, world_.fileContent("eth1"));
  EXPECT_THAT(world_.text(0, NodeLexicon::PROP_HOST_NAME), Optional("host1"s));
  EXPECT_THAT(world_.text(0, NodeLexicon::PROP_DOMAIN_NAME), Optional("example.org"s));
  EXPECT_THAT(world_.list(0, NodeLexicon::PROP_DNS_SERVER_ADDRESSES), Optional(ElementsAre("192.0.2.53")));
}

TEST_F(DNSSettingDataModification, IsSeenByTheNextReader) {
  modify(whole());
  const Instance instance = provider_.getInstance(id("Computer%eth0")).instances().at(0);
  EXPECT_EQ(chars("newhost"), instance["RequestedHostname"]);
  EXPECT_EQ(chars("new.example.org"), instance["DomainName"]);
  EXPECT_EQ(texts({"192.0.2.1", "2001:db8::1"}), instance["DNSServerAddresses"]);
  EXPECT_EQ(chars("home"), instance["ConfigurationName"]);
}

TEST_F(DNSSettingDataModification, ThePropertyListDecidesNothing) {
  const Outcome outcome = provider_.modifyInstance(id("Computer%eth0"), whole(), {"Caption"});
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
  EXPECT_THAT(valuesInFile(), ElementsAre("newhost", "new.example.org", "192.0.2.1 2001:db8::1 ", "home"));
}

TEST_F(DNSSettingDataModification, OtherPropertiesOfTheInstanceAreNotRead) {
  modify(whole().with("InstanceID", "x").with("BootProtocol", "none").with("DNSSuffixesToAppend", texts({"c"})));
  EXPECT_EQ("dhcp", inFile("BOOTPROTO"));
  EXPECT_EQ("a b ", inFile("DNSSUFFIXES"));
}

TEST_F(DNSSettingDataModification, TheServiceProcessorsInterfaceHasAFileOfItsOwn) {
  world_.bmc().nic("bmc0").install().file("bmc0", kFile);
  EXPECT_EQ(CMPI_RC_OK, provider_.modifyInstance(id("BMC%bmc0"), whole()).rc);
  EXPECT_EQ(kFile, world_.fileContent("eth0"));
  EXPECT_NE(kFile, world_.fileContent("bmc0"));
}

TEST_F(DNSSettingDataModification, AnEmptyKeyMeansTheInterfaceWithoutANameAndTheFileOfTheOneBefore) {
  world_.nic("x", {.isUnnamed = true}).install();
  EXPECT_EQ(CMPI_RC_OK, provider_.modifyInstance(id(""), whole()).rc);
  EXPECT_EQ(kFile, world_.fileContent("eth0"));
  EXPECT_NE(kFile, world_.fileContent("eth1"));
}

// --- which properties count as present

TEST_F(DNSSettingDataModification, ServersAloneAreStoredAndTheConfigurationNameIsEmptied) {
  const Outcome outcome = modify(empty().with("DNSServerAddresses", texts({"192.0.2.1"})));
  EXPECT_THAT(valuesInFile(), ElementsAre("oldhost", "old.example.org", "192.0.2.1 ", ""));
  EXPECT_EQ(broker_.missingProperty.rc, outcome.rc);  // the broker's code for the missing property
  EXPECT_EQ(std::nullopt, outcome.message);
  EXPECT_THAT(outcome.errors(), IsEmpty());
  expectDoneWithoutExit(outcome);
}

TEST_F(DNSSettingDataModification, AMissingPropertyIsASuccessIfTheBrokerSaysNoCode) {
  broker_.missingProperty = {CMPI_RC_OK, CMPI_nullValue};
  EXPECT_EQ(CMPI_RC_OK, modify(empty().with("DNSServerAddresses", texts({"192.0.2.1"}))).rc);
  EXPECT_THAT(valuesInFile(), ElementsAre("oldhost", "old.example.org", "192.0.2.1 ", ""));
}

TEST_F(DNSSettingDataModification, AnEmptyInstanceEmptiesTheConfigurationNameAlone) {
  modify(empty());
  EXPECT_THAT(valuesInFile(), ElementsAre("oldhost", "old.example.org", "192.0.2.9 ", ""));
}

TEST_F(DNSSettingDataModification, NullPropertiesCountAsAbsent) {
  for (const auto state : std::initializer_list<CMPIValueState>{CMPI_nullValue, CMPI_notFound}) {
    world_.file("eth0", kFile);
    const Outcome outcome = modify(empty()
                                       .with("RequestedHostname", null(CMPI_string, state))
                                       .with("DomainName", null(CMPI_string, state))
                                       .with("DNSServerAddresses", null(CMPI_stringA, state))
                                       .with("ConfigurationName", null(CMPI_string, state)));
    EXPECT_EQ(CMPI_RC_OK, outcome.rc);
    EXPECT_THAT(valuesInFile(), ElementsAre("oldhost", "old.example.org", "192.0.2.9 ", ""));
  }
}

TEST_F(DNSSettingDataModification, PropertiesThatAreNoTextsCountAsAbsent) {
  const Outcome outcome = modify(empty()
                                     .with("RequestedHostname", uint16(1))
                                     .with("DomainName", texts({"a"}))
                                     .with("DNSServerAddresses", texts({"192.0.2.1"}))
                                     .with("ConfigurationName", boolean(true)));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
  EXPECT_THAT(valuesInFile(), ElementsAre("oldhost", "old.example.org", "192.0.2.1 ", ""));
}

TEST_F(DNSSettingDataModification, PropertiesThatTheBrokerFailsToGiveCountAsAbsent) {
  for (const Mode mode : kAllStatusModes) {
    world_.file("eth0", kFile);
    broker_.failEach("getProperty", mode);
    modify(whole());
    EXPECT_THAT(valuesInFile(), ElementsAre("oldhost", "old.example.org", "192.0.2.9 ", "")) << nameOf(mode);
  }
}

TEST_F(DNSSettingDataModification, ATextThatTheBrokerFailsToGiveLeavesWhatIsStored) {
  struct Text {
    const char* property;
    std::size_t call;  // the call that reads it
  };
  for (const Text& text : {Text{"RequestedHostname", 4}, Text{"DomainName", 5}, Text{"ConfigurationName", 7}}) {
    for (const Mode mode : {Mode::SetRc, Mode::RcAndNull}) {
      SCOPED_TRACE(std::string(text.property) + ' ' + nameOf(mode));
      world_.file("eth0", kFile);
      broker_.startOver();
      broker_.failAt(text.call, mode);
      const Outcome outcome = modify(empty().with(text.property, "new"));
      EXPECT_EQ("getCharPtr", outcome.calls.at(text.call - 1).name);
      const bool isName = text.property == std::string_view("ConfigurationName");
      EXPECT_THAT(valuesInFile(), ElementsAre("oldhost", "old.example.org", "192.0.2.9 ", isName ? "office" : ""));
      EXPECT_EQ(isName ? CMPI_RC_ERR_FAILED : broker_.missingProperty.rc, outcome.rc) << "the broker's last code";
      expectDoneWithoutExit(outcome);
    }
  }
}

TEST_F(DNSSettingDataModification, EmptyTextsAreValidAndWritten) {
  const Outcome outcome =
      modify(empty().with("RequestedHostname", "").with("DomainName", "").with("ConfigurationName", ""));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
  EXPECT_THAT(valuesInFile(), ElementsAre("", "", "192.0.2.9 ", ""));
}

// --- the list of servers

TEST_F(DNSSettingDataModification, AnEmptyArrayEmptiesTheKey) {
  const Outcome outcome = modify(whole().with("DNSServerAddresses", texts({})));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
  EXPECT_EQ("", inFile("DNSSERVERS"));
  EXPECT_THAT(outcome.lines.briefs(), testing::Contains("4000 VARIABLE dnsServers.size() = 0"));
}

TEST_F(DNSSettingDataModification, ServersThatAreNoArrayAreSkippedAndTheOthersAreHandled) {
  const Outcome outcome = modify(whole().with("DNSServerAddresses", "192.0.2.1"));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
  EXPECT_THAT(valuesInFile(), ElementsAre("newhost", "new.example.org", "192.0.2.9 ", "home"));
  EXPECT_THAT(outcome.errors(), IsEmpty());
}

TEST_F(DNSSettingDataModification, ServersAreNotValidated) {
  modify(whole().with("DNSServerAddresses", texts({"no address", "", "-", "\"quoted\""})));
  EXPECT_EQ("no address  - \"quoted\" ", inFile("DNSSERVERS"));
}

TEST_F(DNSSettingDataModification, ElementsWithoutATextAreLeftOut) {
  modify(whole().with("DNSServerAddresses", list(CMPI_stringA, {text("a"), null(CMPI_string), text("b")})));
  EXPECT_EQ("a b ", inFile("DNSSERVERS"));
  modify(whole().with("DNSServerAddresses", uint16s({1, 2})));
  EXPECT_EQ("", inFile("DNSSERVERS"));
}

TEST_F(DNSSettingDataModification, ElementsThatTheBrokerFailsToGiveAreLeftOut) {
  for (const Mode mode : kAllStatusModes) {
    broker_.failNext("getElementAt", mode);
    modify(whole().with("DNSServerAddresses", texts({"a", "b"})));
    EXPECT_EQ("b ", inFile("DNSSERVERS")) << nameOf(mode);
  }
}

// --- names that are refused

TEST_F(DNSSettingDataModification, ARefusedHostNameLeavesAllAsItWas) {
  const Outcome outcome = modify(whole().with("RequestedHostname", "two words"));
  EXPECT_EQ(CMPI_RC_ERR_INVALID_PARAMETER, outcome.rc);
  EXPECT_EQ(std::nullopt, outcome.message);
  EXPECT_EQ(kFile, world_.fileContent("eth0"));
  EXPECT_THAT(outcome.errors(), ElementsAre("modifyDNSSettingDataCMPIInstance Failed"));
  expectDoneWithoutExit(outcome);
  EXPECT_FALSE(outcome.lines.exited("modifyDNSSettingDataCMPIInstance"));
}

TEST_F(DNSSettingDataModification, ARefusedDomainNameLeavesTheHostNameWrittenAndTheRestAsItWas) {
  const Outcome outcome = modify(whole().with("DomainName", "two words"));
  EXPECT_EQ(CMPI_RC_ERR_INVALID_PARAMETER, outcome.rc);
  EXPECT_EQ(
      "# eth0\nBOOTPROTO=dhcp\nHOSTNAME=newhost\nDOMAINNAME=old.example.org\nDNSSERVERS=192.0.2.9 \nDNSSUFFIXES=a b "
      "\nCONFIG_NAME=office\n",
      world_.fileContent("eth0"));
  EXPECT_THAT(outcome.errors(), ElementsAre("modifyDNSSettingDataCMPIInstance Failed"));
  expectDoneWithoutExit(outcome);
}

TEST_F(DNSSettingDataModification, WhatIsNoDomainNameIsRefused) {
  const std::string longestLabel(63, 'a');
  const std::string longestName = longestLabel + "." + longestLabel + "." + longestLabel + "." + std::string(61, 'b');
  for (const std::string& name :
       {"a b"s, "a..b"s, ".a"s, ".."s, "a\nCONFIG_NAME=x"s, "a\tb"s, "\"a\""s, "a;b"s, "\xC3\xA4"s, "\xFF"s,
        longestLabel + "a", longestName + "b", std::string(1 << 20, 'a')}) {
    world_.file("eth0", kFile);
    EXPECT_EQ(CMPI_RC_ERR_INVALID_PARAMETER, modify(whole().with("DomainName", text(name))).rc) << inQuotes(name);
    EXPECT_THAT(valuesInFile(), ElementsAre("newhost", "old.example.org", "192.0.2.9 ", "office"));
  }
  for (const std::string& name : {"a"s, "a.b."s, "_x-1.EXAMPLE"s, longestLabel, longestName}) {
    EXPECT_EQ(CMPI_RC_OK, modify(whole().with("DomainName", text(name))).rc) << name;
    EXPECT_EQ(name, inFile("DOMAINNAME"));
  }
}

// --- hostile values

TEST_F(DNSSettingDataModification, QuotesAndLineFeedsOfTheConfigurationNameAreWrittenAsTheyAre) {
  EXPECT_EQ(CMPI_RC_OK, modify(whole().with("ConfigurationName", "\"it's\" #1\nDOMAINNAME=x")).rc);
  EXPECT_EQ(
      "# eth0\nBOOTPROTO=dhcp\nHOSTNAME=newhost\nDOMAINNAME=new.example.org\nDNSSERVERS=192.0.2.1 2001:db8::1 "
      "\nDNSSUFFIXES=a b \nCONFIG_NAME=\"it's\" #1\nDOMAINNAME=x\n",
      world_.fileContent("eth0"));
}

TEST_F(DNSSettingDataModification, ATextEndsAtItsNul) {
  modify(whole().with("RequestedHostname", text("a\0 b"s)).with("ConfigurationName", text("c\0\nX=1"s)));
  EXPECT_THAT(valuesInFile(), ElementsAre("a", "new.example.org", "192.0.2.1 2001:db8::1 ", "c"));
}

TEST_F(DNSSettingDataModification, AConfigurationNameOfAMebibyteIsWrittenWholeAndReadBack) {
  const std::string name(1 << 20, 'n');
  EXPECT_EQ(CMPI_RC_OK, modify(whole().with("ConfigurationName", text(name))).rc);
  EXPECT_TRUE(name == inFile("CONFIG_NAME"));
  EXPECT_TRUE(chars(name) == provider_.getInstance(id("Computer%eth0")).instances().at(0)["ConfigurationName"]);
}

TEST_F(DNSSettingDataModification, AHundredThousandServersAreWritten) {
  std::vector<std::string> servers;
  std::string value;
  for (int i = 0; i < 100000; ++i) {
    servers.push_back("2001:db8::" + std::to_string(i));
    value += servers.back() + " ";
  }
  broker_.keepsLines = false;
  EXPECT_EQ(CMPI_RC_OK, modify(whole().with("DNSServerAddresses", texts(servers))).rc);
  EXPECT_TRUE(value == inFile("DNSSERVERS"));
}

// --- no file

TEST_F(DNSSettingDataModification, AMissingFileIsASuccessAndStaysMissing) {
  std::filesystem::remove(world_.filePath("eth0"));
  const Outcome outcome = modify(whole());
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
  EXPECT_THAT(outcome.errors(), IsEmpty());
  EXPECT_EQ(std::nullopt, world_.fileContent("eth0"));
}

TEST_F(DNSSettingDataModification, AMissingKeyIsASuccessAndStaysMissing) {
  world_.file("eth0", "BOOTPROTO=dhcp\n");
  EXPECT_EQ(CMPI_RC_OK, modify(whole()).rc);
  EXPECT_EQ("BOOTPROTO=dhcp\n", world_.fileContent("eth0"));
}

TEST_F(DNSSettingDataModification, AnythingButARegularFileIsASuccessAndStaysAsItIs) {
  const std::string path = world_.filePath("eth0");
  std::filesystem::remove(path);
  std::filesystem::create_directory(path);
  EXPECT_EQ(CMPI_RC_OK, modify(whole()).rc);
  EXPECT_TRUE(std::filesystem::is_empty(path));
  std::filesystem::remove(path);
  std::filesystem::create_symlink("nowhere", path);
  EXPECT_EQ(CMPI_RC_OK, modify(whole()).rc);
  EXPECT_FALSE(std::filesystem::exists(world_.dataDir() + "nowhere"));
  std::filesystem::remove(path);
  ASSERT_EQ(0, ::mkfifo(path.c_str(), 0600));
  EXPECT_EQ(CMPI_RC_OK, modify(whole()).rc);
  EXPECT_TRUE(std::filesystem::is_fifo(path));
}

// --- failures

TEST_F(DNSSettingDataModification, AnUnknownInstanceIDFailsAndIsLoggedByTheProviderAlone) {
  for (const char* key : {"Computer%eth9", "computer%eth0", "eth0", ""}) {
    const Outcome outcome = provider_.modifyInstance(id(key), whole());
    EXPECT_EQ(CMPI_RC_ERR_FAILED, outcome.rc);
    EXPECT_EQ(std::nullopt, outcome.message);
    EXPECT_THAT(outcome.errors(), ElementsAre("modifyDNSSettingDataCMPIInstance Failed"));
    EXPECT_TRUE(outcome.lines.exited("modifyDNSSettingDataCMPIInstance"));
    EXPECT_EQ("Zorvagent.DNSSettingDataProvider", outcome.lines.back().category);
    EXPECT_EQ("DNSSettingData_ModifyInstance", outcome.lines.back().function);
    EXPECT_EQ("providers/DNSSettingDataProvider.cpp", outcome.lines.back().file);
    expectDoneWithoutExit(outcome);
    EXPECT_EQ(0U, outcome.calls.count("getProperty"));
  }
  EXPECT_EQ(kFile, world_.fileContent("eth0"));
}

TEST_F(DNSSettingDataModification, AMissingKeyOfThePathFailsWithTheCodeOfTheModification) {
  EXPECT_EQ(CMPI_RC_ERR_FAILED, provider_.modifyInstance(Path("ZORVA_DNSSettingData"), whole()).rc);
}

TEST_F(DNSSettingDataModification, WhateverTheBrokerFailsAtEachValueIsTheOldOrTheNewOrEmpty) {
  const std::size_t tried = forEachFailure(
      broker_,
      [&](std::size_t, Mode mode) {
        world_.file("eth0", kFile);
        try {
          const Outcome outcome = modify(whole());
          expectDoneWithoutExit(outcome);
          EXPECT_EQ(outcome.rc == CMPI_RC_OK || outcome.errors().empty(), outcome.errors().empty());
        } catch (const InjectedFailure&) {
          EXPECT_EQ(Mode::Throw, mode);
        }
        EXPECT_THAT(inFile("HOSTNAME"), testing::AnyOf("oldhost", "newhost", ""));
        EXPECT_THAT(inFile("DOMAINNAME"), testing::AnyOf("old.example.org", "new.example.org", ""));
        EXPECT_THAT(inFile("DNSSERVERS"), testing::AnyOf("192.0.2.9 ", "192.0.2.1 2001:db8::1 ", "192.0.2.1 ",
                                                         "2001:db8::1 ", " 2001:db8::1 ", "192.0.2.1  ", ""));
        EXPECT_THAT(inFile("CONFIG_NAME"), testing::AnyOf("office", "home", ""));
        EXPECT_EQ("dhcp", inFile("BOOTPROTO"));
      },
      {Mode::SetRc, Mode::ReturnNull, Mode::NullHandle, Mode::RcAndNull, Mode::Throw});
  EXPECT_GT(tried, 60U);
}

TEST_F(DNSSettingDataModification, WhateverTheTreeThrowsFliesOnBeforeAnythingIsWritten) {
  std::size_t flown = 0;
  const std::size_t tried = forEachTreeFailure([&](std::size_t, Thrown) {
    world_.file("eth0", kFile);
    try {
      modify(whole());
    } catch (...) {
      ++flown;
      EXPECT_EQ(kFile, world_.fileContent("eth0"));
    }
  });
  EXPECT_EQ(tried, flown);
  EXPECT_GT(tried, 10U);
}

TEST_F(DNSSettingDataModification, WithoutResultPathOrInstanceNothingBreaks) {
  CMPIInstanceMI* mi = provider_.mi();
  const CMPIInstance* instance = broker_.make(whole());
  const CMPIObjectPath* ref = broker_.make(id("Computer%eth0"));
  EXPECT_EQ(CMPI_RC_ERR_FAILED, mi->ft->modifyInstance(mi, nullptr, nullptr, nullptr, instance, nullptr).rc);
  EXPECT_EQ(CMPI_RC_ERR_FAILED, mi->ft->modifyInstance(mi, nullptr, nullptr, ref, nullptr, nullptr).rc);
  EXPECT_EQ(kFile, world_.fileContent("eth0"));
  EXPECT_EQ(CMPI_RC_OK, mi->ft->modifyInstance(mi, nullptr, nullptr, ref, instance, nullptr).rc);
  EXPECT_EQ("newhost", inFile("HOSTNAME"));
}

TEST_F(DNSSettingDataModification, TwoClientsAtOnceAreSafe) {
  broker_.keepsLines = false;
  CMPIInstanceMI* mi = provider_.mi();
  const auto change = [&](const char* name) {
    for (int i = 0; i < 30; ++i) {
      const CMPIInstance* instance = broker_.make(whole().with("RequestedHostname", name));
      const CMPIObjectPath* ref = broker_.make(id("Computer%eth0"));
      const CMPIResult* result = broker_.makeResult();
      EXPECT_EQ(CMPI_RC_OK, mi->ft->modifyInstance(mi, nullptr, result, ref, instance, nullptr).rc);
    }
  };
  std::thread other(change, "other");
  change("own");
  other.join();
  world_.file("eth0", kFile);
  change("last");
  EXPECT_THAT(valuesInFile(), ElementsAre("last", "new.example.org", "192.0.2.1 2001:db8::1 ", "home"));
}

}  // namespace
}  // namespace ZV::Test
