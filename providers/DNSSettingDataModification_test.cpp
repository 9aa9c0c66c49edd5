// ModifyInstance of ZORVA_DNSSettingData, which writes to the interface's file.

#include <sys/stat.h>

#include <filesystem>
#include <thread>

#include "providers/testing/ModificationTestSupport.h"
#include "tests/support/ManyTexts.h"

namespace ZV::Test {
namespace {

using std::string_literals::operator""s;

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

class DNSSettingDataModification : public InstanceTest {
 protected:
  DNSSettingDataModification() : InstanceTest("DNSSettingDataProvider") {
    world.nic("eth0", usualNic()).nic("eth1", usualNic()).install().file("eth0", kFile).file("eth1", kFile);
  }
  Outcome modify(const Instance& instance) {
    const Deadline deadline;
    return provider.modifyInstance(id("Computer%eth0"), instance);
  }
  // The current value of a key in the first file.
  std::string inFile(const std::string& key) {
    const std::string content = "\n" + world.fileContent("eth0").value_or("no file");
    const std::size_t found = content.find("\n" + key + "=");
    if (found == std::string::npos) return "no key";
    const std::size_t start = found + key.size() + 2;
    return content.substr(start, content.find('\n', start) - start);
  }
  std::vector<std::string> valuesInFile() {
    return {inFile("HOSTNAME"), inFile("DOMAINNAME"), inFile("DNSSERVERS"), inFile("CONFIG_NAME")};
  }
};

// --- a whole operation

TEST_F(DNSSettingDataModification, WritesTheFourValuesToTheFile) {
  EXPECT_EQ(CMPI_RC_OK, modify(whole()).rc);
  EXPECT_EQ(
      "# eth0\nBOOTPROTO=dhcp\nHOSTNAME=newhost\nDOMAINNAME=new.example.org\nDNSSERVERS=192.0.2.1 2001:db8::1 "
      "\nDNSSUFFIXES=a b \nCONFIG_NAME=home\n",
      world.fileContent("eth0"));
}

TEST_F(DNSSettingDataModification, LeavesTheOtherFilesAndTheNodesAsTheyAre) {
  modify(whole());
  EXPECT_EQ(kFile, world.fileContent("eth1"));
  EXPECT_THAT(world.text(0, NodeLexicon::PROP_HOST_NAME), Optional("host1"s));
  EXPECT_THAT(world.text(0, NodeLexicon::PROP_DOMAIN_NAME), Optional("example.org"s));
  EXPECT_THAT(world.list(0, NodeLexicon::PROP_DNS_SERVER_ADDRESSES), Optional(ElementsAre("192.0.2.53")));
}

TEST_F(DNSSettingDataModification, IsSeenByTheNextReader) {
  modify(whole());
  const Instance instance = provider.getInstance(id("Computer%eth0")).instances().at(0);
  EXPECT_EQ(chars("newhost"), instance["RequestedHostname"]);
  EXPECT_EQ(chars("new.example.org"), instance["DomainName"]);
  EXPECT_EQ(texts({"192.0.2.1", "2001:db8::1"}), instance["DNSServerAddresses"]);
  EXPECT_EQ(chars("home"), instance["ConfigurationName"]);
}

TEST_F(DNSSettingDataModification, ThePropertyListDecidesNothing) {
  const Outcome outcome = provider.modifyInstance(id("Computer%eth0"), whole(), {"Caption"});
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
  EXPECT_THAT(valuesInFile(), ElementsAre("newhost", "new.example.org", "192.0.2.1 2001:db8::1 ", "home"));
}

TEST_F(DNSSettingDataModification, OtherPropertiesOfTheInstanceAreNotRead) {
  modify(whole().with("InstanceID", "x").with("BootProtocol", "none").with("DNSSuffixesToAppend", texts({"c"})));
  EXPECT_EQ("dhcp", inFile("BOOTPROTO"));
  EXPECT_EQ("a b ", inFile("DNSSUFFIXES"));
}

TEST_F(DNSSettingDataModification, TheServiceProcessorsInterfaceHasAFileOfItsOwn) {
  world.bmc().nic("bmc0").install().file("bmc0", kFile);
  EXPECT_EQ(CMPI_RC_OK, provider.modifyInstance(id("BMC%bmc0"), whole()).rc);
  EXPECT_EQ(kFile, world.fileContent("eth0"));
  EXPECT_NE(kFile, world.fileContent("bmc0"));
}

TEST_F(DNSSettingDataModification, AnEmptyKeyMeansTheInterfaceWithoutANameAndTheFileOfTheOneBefore) {
  world.nic("x", {.isUnnamed = true}).install();
  EXPECT_EQ(CMPI_RC_OK, provider.modifyInstance(id(""), whole()).rc);
  EXPECT_EQ(kFile, world.fileContent("eth0"));
  EXPECT_NE(kFile, world.fileContent("eth1"));
}

// --- which properties count as present

TEST_F(DNSSettingDataModification, ServersAloneAreStoredAndTheConfigurationNameIsEmptied) {
  const Outcome outcome = modify(empty().with("DNSServerAddresses", texts({"192.0.2.1"})));
  EXPECT_THAT(valuesInFile(), ElementsAre("oldhost", "old.example.org", "192.0.2.1 ", ""));
  EXPECT_EQ(broker.missingProperty.rc, outcome.rc);  // what the broker said of the missing property
  EXPECT_EQ(std::nullopt, outcome.message);
  EXPECT_THAT(outcome.errors(), IsEmpty());
  expectDoneWithoutExit(outcome);
}

TEST_F(DNSSettingDataModification, AnEmptyInstanceEmptiesTheConfigurationNameAlone) {
  modify(empty());
  EXPECT_THAT(valuesInFile(), ElementsAre("oldhost", "old.example.org", "192.0.2.9 ", ""));
}

TEST_F(DNSSettingDataModification, NullPropertiesCountAsAbsent) {
  for (const auto state : std::initializer_list<CMPIValueState>{CMPI_nullValue, CMPI_notFound}) {
    world.file("eth0", kFile);
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
    world.file("eth0", kFile);
    broker.failEach("getProperty", mode);
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
      world.file("eth0", kFile);
      broker.startOver();
      broker.failAt(text.call, mode);
      const Outcome outcome = modify(empty().with(text.property, "new"));
      EXPECT_EQ("getCharPtr", outcome.calls.at(text.call - 1).name);
      const bool isName = text.property == std::string_view("ConfigurationName");
      EXPECT_THAT(valuesInFile(), ElementsAre("oldhost", "old.example.org", "192.0.2.9 ", isName ? "office" : ""));
      EXPECT_EQ(isName ? CMPI_RC_ERR_FAILED : broker.missingProperty.rc, outcome.rc) << "the broker's last code";
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
    broker.failNext("getElementAt", mode);
    modify(whole().with("DNSServerAddresses", texts({"a", "b"})));
    EXPECT_EQ("b ", inFile("DNSSERVERS")) << nameOf(mode);
  }
}

// --- names that are refused

TEST_F(DNSSettingDataModification, ARefusedDomainNameLeavesTheHostNameWrittenAndTheRestAsItWas) {
  const Outcome outcome = modify(whole().with("DomainName", "two words"));
  EXPECT_EQ(CMPI_RC_ERR_INVALID_PARAMETER, outcome.rc);
  EXPECT_EQ(
      "# eth0\nBOOTPROTO=dhcp\nHOSTNAME=newhost\nDOMAINNAME=old.example.org\nDNSSERVERS=192.0.2.9 \nDNSSUFFIXES=a b "
      "\nCONFIG_NAME=office\n",
      world.fileContent("eth0"));
  EXPECT_THAT(outcome.errors(), ElementsAre("modifyDNSSettingDataCMPIInstance Failed"));
  expectDoneWithoutExit(outcome);
}

TEST_F(DNSSettingDataModification, WhatIsNoDomainNameIsRefused) {
  const std::string longestLabel(63, 'a');
  const std::string longestName = longestLabel + "." + longestLabel + "." + longestLabel + "." + std::string(61, 'b');
  for (const std::string& name :
       {"a b"s, "a..b"s, ".a"s, ".."s, "a\nCONFIG_NAME=x"s, "a\tb"s, "\"a\""s, "a;b"s, "\xC3\xA4"s, "\xFF"s,
        longestLabel + "a", longestName + "b", std::string(1 << 20, 'a')}) {
    world.file("eth0", kFile);
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
      world.fileContent("eth0"));
}

TEST_F(DNSSettingDataModification, ATextEndsAtItsNul) {
  modify(whole().with("RequestedHostname", text("a\0 b"s)).with("ConfigurationName", text("c\0\nX=1"s)));
  EXPECT_THAT(valuesInFile(), ElementsAre("a", "new.example.org", "192.0.2.1 2001:db8::1 ", "c"));
}

TEST_F(DNSSettingDataModification, AConfigurationNameOfAMebibyteIsWrittenWholeAndReadBack) {
  const std::string name(1 << 20, 'n');
  EXPECT_EQ(CMPI_RC_OK, modify(whole().with("ConfigurationName", text(name))).rc);
  EXPECT_TRUE(name == inFile("CONFIG_NAME"));
  EXPECT_TRUE(chars(name) == provider.getInstance(id("Computer%eth0")).instances().at(0)["ConfigurationName"]);
}

TEST_F(DNSSettingDataModification, AHundredThousandServersAreWritten) {
  const ManyTexts many("2001:db8::");
  broker.keepsLines = false;
  EXPECT_EQ(CMPI_RC_OK, modify(whole().with("DNSServerAddresses", texts(many.texts))).rc);
  EXPECT_TRUE(many.line == inFile("DNSSERVERS"));
}

// --- no file

TEST_F(DNSSettingDataModification, AnythingButARegularFileIsASuccessAndStaysAsItIs) {
  const std::string path = world.filePath("eth0");
  std::filesystem::remove(path);
  std::filesystem::create_directory(path);
  EXPECT_EQ(CMPI_RC_OK, modify(whole()).rc);
  EXPECT_TRUE(std::filesystem::is_empty(path));
  std::filesystem::remove(path);
  std::filesystem::create_symlink("nowhere", path);
  EXPECT_EQ(CMPI_RC_OK, modify(whole()).rc);
  EXPECT_FALSE(std::filesystem::exists(world.dataDir() + "nowhere"));
  std::filesystem::remove(path);
  ASSERT_EQ(0, ::mkfifo(path.c_str(), 0600));
  EXPECT_EQ(CMPI_RC_OK, modify(whole()).rc);
  EXPECT_TRUE(std::filesystem::is_fifo(path));
}

// --- failures

TEST_F(DNSSettingDataModification, WithoutResultPathOrInstanceNothingBreaks) {
  CMPIInstanceMI* mi = provider.mi();
  const CMPIInstance* instance = broker.make(whole());
  const CMPIObjectPath* ref = broker.make(id("Computer%eth0"));
  EXPECT_EQ(CMPI_RC_ERR_FAILED, mi->ft->modifyInstance(mi, nullptr, nullptr, nullptr, instance, nullptr).rc);
  EXPECT_EQ(CMPI_RC_ERR_FAILED, mi->ft->modifyInstance(mi, nullptr, nullptr, ref, nullptr, nullptr).rc);
  EXPECT_EQ(kFile, world.fileContent("eth0"));
  EXPECT_EQ(CMPI_RC_OK, mi->ft->modifyInstance(mi, nullptr, nullptr, ref, instance, nullptr).rc);
  EXPECT_EQ("newhost", inFile("HOSTNAME"));
}

TEST_F(DNSSettingDataModification, TwoClientsAtOnceAreSafe) {
  broker.keepsLines = false;
  CMPIInstanceMI* mi = provider.mi();
  const auto change = [&](const char* name) {
    for (int i = 0; i < 30; ++i) {
      const CMPIInstance* instance = broker.make(whole().with("RequestedHostname", name));
      const CMPIObjectPath* ref = broker.make(id("Computer%eth0"));
      const CMPIResult* result = broker.makeResult();
      EXPECT_EQ(CMPI_RC_OK, mi->ft->modifyInstance(mi, nullptr, result, ref, instance, nullptr).rc);
    }
  };
  std::thread other(change, "other");
  change("own");
  other.join();
  world.file("eth0", kFile);
  change("last");
  EXPECT_THAT(valuesInFile(), ElementsAre("last", "new.example.org", "192.0.2.1 2001:db8::1 ", "home"));
}

}  // namespace
}  // namespace ZV::Test
