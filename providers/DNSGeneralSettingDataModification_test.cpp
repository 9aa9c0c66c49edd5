// ModifyInstance of ZORVA_DNSGeneralSettingData, which writes to the file of the host's first interface.
#include <filesystem>

#include "providers/testing/ModificationTestSupport.h"

extern "C" CMPIInstanceMI* DNSGeneralSettingDataProvider_Create_InstanceMI(const CMPIBroker*, const CMPIContext*,
                                                                           CMPIStatus*);

namespace ZV::Test {
namespace {

using std::string_literals::operator""s;
using ::testing::ElementsAre;
using ::testing::ElementsAreArray;
using ::testing::IsEmpty;
using ::testing::Optional;

constexpr const char* kClass = "ZORVA_DNSGeneralSettingData";
constexpr const char* kFile = "DOMAINNAME=d\nDNSSUFFIXES=old \nCONFIG_NAME=office\n";
constexpr const char* kMissing =
    "In modifyDNSGeneralSettingDataCMPIInstance function PROPERTY_CONFIGURATION_NAME does not found";
constexpr const char* kFailed = "modifyDNSSettingDataCMPIInstance Failed";  // the text of the class for DNS settings

const Instance kEmpty(kClass);
const Instance kWhole =
    kEmpty.with("DNSSuffixesToAppend", texts({"a.example.org", "b"})).with("ConfigurationName", "home");

class DNSGeneralSettingDataModification : public ::testing::Test {
 protected:
  DNSGeneralSettingDataModification() {
    world_.nic("eth0", usualNic()).nic("eth1").install().file("eth0", kFile).file("eth1", kFile);
  }
  Outcome modify(const Instance& instance, const char* instanceID = "dnsgen1:host1") {
    return provider_.modifyInstance(Path(kClass).key("InstanceID", instanceID), instance);
  }
  std::string content() const { return world_.fileContent("eth0").value_or("no file"); }

  World world_;
  RecordingLogger logger_;
  RecordingBroker broker_;
  InstanceProvider provider_{DNSGeneralSettingDataProvider_Create_InstanceMI, broker_};
};

// A failed modification, with the status as the broker left it: nothing is returned, and returnDone is not called.
void expectLeftOpen(const Outcome& outcome) {
  EXPECT_TRUE(outcome.markedEntry());
  EXPECT_EQ(0U, outcome.calls.count("returnDone"));
  EXPECT_FALSE(outcome.markedExit());
  EXPECT_EQ(kFailed, outcome.errors().back());
  EXPECT_EQ("Zorvagent.DNSGeneralSettingDataProvider", outcome.lines.back().category);
  EXPECT_EQ("DNSGeneralSettingData_ModifyInstance", outcome.lines.back().function);
  EXPECT_EQ("providers/DNSGeneralSettingDataProvider.cpp", outcome.lines.back().file);
}

// --- a whole operation

TEST_F(DNSGeneralSettingDataModification, WritesBothValuesInTheirOrder) {
  const Outcome outcome = modify(kWhole);
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
  EXPECT_EQ(std::nullopt, outcome.message);
  EXPECT_EQ("DOMAINNAME=d\nDNSSUFFIXES=a.example.org b \nCONFIG_NAME=home\n", content());
  const std::string file = world_.filePath("eth0");
  EXPECT_THAT(outcome.story(), ElementsAreArray(joined({
                                   {"log 4000 banner", "log 4000 ENTERING DNSGeneralSettingData_ModifyInstance",
                                    "log 3000 ENTERING modifyDNSGeneralSettingDataCMPIInstance, broker=ADDR ref=ADDR "
                                    "properties=0 instance=ADDR status=ADDR",
                                    "log 4000 VARIABLE nodeString = Computer",
                                    "log 4000 VARIABLE dnsSuffixes.size() = 2", "log 4000 VARIABLE fileName = " + file},
                                   writeLines(file, "DNSSUFFIXES", "a.example.org b "),
                                   writeLines(file, "CONFIG_NAME", "home"),
                                   {"returnDone()"},
                               })));
  EXPECT_THAT(
      outcome.calls.lines(),
      ElementsAre("ref.getKey(\"InstanceID\")", "string \"dnsgen1:host1\".getCharPtr()",
                  "instance.getProperty(\"DNSSuffixesToAppend\")", "A1.getSize()", "A1.getElementAt(0)",
                  "string \"a.example.org\".getCharPtr()", "A1.getElementAt(1)", "string \"b\".getCharPtr()",
                  "instance.getProperty(\"ConfigurationName\")", "string \"home\".getCharPtr()", "returnDone()"));
}

TEST_F(DNSGeneralSettingDataModification, LeavesTheOtherFilesAndTheNodeAsTheyAre) {
  modify(kWhole);
  EXPECT_EQ(kFile, world_.fileContent("eth1"));
  EXPECT_THAT(world_.list(0, NodeLexicon::PROP_DNS_SUFFIXES), Optional(ElementsAre("example.org")));
}

TEST_F(DNSGeneralSettingDataModification, TheInstanceIDOfAnotherSystemTakesEffectHere) {
  for (const char* instanceID : {"dnsgen1:elsewhere", "", "x"}) {
    world_.file("eth0", kFile);
    EXPECT_EQ(CMPI_RC_OK, modify(kWhole, instanceID).rc);
    EXPECT_EQ("DOMAINNAME=d\nDNSSUFFIXES=a.example.org b \nCONFIG_NAME=home\n", content());
  }
}

TEST_F(DNSGeneralSettingDataModification, ThePropertyListDecidesNothing) {
  EXPECT_EQ(CMPI_RC_OK, provider_.modifyInstance(Path(kClass).key("InstanceID", "x"), kWhole, {"Caption"}).rc);
  EXPECT_EQ("DOMAINNAME=d\nDNSSUFFIXES=a.example.org b \nCONFIG_NAME=home\n", content());
}

// --- which properties count as present

TEST_F(DNSGeneralSettingDataModification, SuffixesAloneAreWrittenAndTheMissingNameIsLogged) {
  broker_.missingProperty = {CMPI_RC_OK, CMPI_nullValue};
  const Outcome outcome = modify(kEmpty.with("DNSSuffixesToAppend", texts({"a"})));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
  EXPECT_EQ("DOMAINNAME=d\nDNSSUFFIXES=a \nCONFIG_NAME=office\n", content());
  EXPECT_THAT(outcome.errors(), ElementsAre(kMissing));
  EXPECT_EQ("modifyDNSGeneralSettingDataCMPIInstance", outcome.lines.back().function);
  EXPECT_EQ("factory/InstanceModification.cpp", outcome.lines.back().file);
  EXPECT_EQ("Zorvagent.DNSObjFactory", outcome.lines.back().category);
  expectDoneWithoutExit(outcome);
}

TEST_F(DNSGeneralSettingDataModification, SuffixesAloneAreAnsweredWithTheBrokersCodeForTheMissingName) {
  const Outcome outcome = modify(kEmpty.with("DNSSuffixesToAppend", texts({"a"})));
  EXPECT_EQ(broker_.missingProperty.rc, outcome.rc);
  EXPECT_EQ("DOMAINNAME=d\nDNSSUFFIXES=a \nCONFIG_NAME=office\n", content());
  expectDoneWithoutExit(outcome);
}

TEST_F(DNSGeneralSettingDataModification, AConfigurationNameAloneIsWritten) {
  const Outcome outcome = modify(kEmpty.with("ConfigurationName", "home"));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
  EXPECT_EQ("DOMAINNAME=d\nDNSSUFFIXES=old \nCONFIG_NAME=home\n", content());
  EXPECT_THAT(outcome.errors(), IsEmpty());
}

TEST_F(DNSGeneralSettingDataModification, WithNeitherPropertyTheFailureStaysInTheLog) {
  const Outcome outcome = modify(kEmpty);
  EXPECT_EQ(broker_.missingProperty.rc, outcome.rc);
  EXPECT_EQ(kFile, content());
  EXPECT_THAT(outcome.errors(), ElementsAre(kMissing, kFailed));
  EXPECT_TRUE(outcome.lines.exited("modifyDNSGeneralSettingDataCMPIInstance"));
  expectLeftOpen(outcome);
}

TEST_F(DNSGeneralSettingDataModification, AFailureIsASuccessToTheClientIfTheBrokerSaysNoCode) {
  broker_.missingProperty = {CMPI_RC_OK, CMPI_nullValue};
  const Outcome outcome = modify(kEmpty);
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
  expectLeftOpen(outcome);
}

TEST_F(DNSGeneralSettingDataModification, AFailureGivesTheMessageThatTheBrokerLeftInTheStatus) {
  broker_.failEach("getProperty", Mode::RcAndNull);
  const Outcome outcome = modify(kWhole);
  EXPECT_EQ(CMPI_RC_ERR_FAILED, outcome.rc);
  EXPECT_THAT(outcome.message, Optional("the broker failed as it was asked to"s));
  EXPECT_EQ(kFile, content());
  expectLeftOpen(outcome);
}

TEST_F(DNSGeneralSettingDataModification, ASuccessGivesTheBrokersCodeWithoutItsMessage) {
  broker_.failEach("getProperty", Mode::SetRc);  // the list is returned even so
  const Outcome outcome = modify(kEmpty.with("DNSSuffixesToAppend", texts({"a"})));
  EXPECT_EQ(CMPI_RC_ERR_FAILED, outcome.rc);
  EXPECT_EQ(std::nullopt, outcome.message);
  EXPECT_EQ("DOMAINNAME=d\nDNSSUFFIXES=a \nCONFIG_NAME=office\n", content());
  expectDoneWithoutExit(outcome);
}

TEST_F(DNSGeneralSettingDataModification, ATextThatTheBrokerFailsToGiveCountsAsAbsent) {
  for (const Mode mode : {Mode::SetRc, Mode::RcAndNull}) {
    broker_.failEach("getCharPtr", mode);
    const Outcome outcome = modify(kEmpty.with("ConfigurationName", "home"));
    EXPECT_EQ(CMPI_RC_ERR_FAILED, outcome.rc) << "of the broker";
    EXPECT_EQ(kFile, content()) << nameOf(mode);
    EXPECT_THAT(outcome.errors(), ElementsAre(kMissing, kFailed));
  }
}

TEST_F(DNSGeneralSettingDataModification, TheStatusOfAPropertyIsNotLookedAt) {
  broker_.failEach("getProperty", Mode::SetRc);
  modify(kWhole);
  EXPECT_EQ("DOMAINNAME=d\nDNSSUFFIXES=a.example.org b \nCONFIG_NAME=home\n", content());
}

TEST_F(DNSGeneralSettingDataModification, NullPropertiesCountAsAbsent) {
  const Outcome outcome =
      modify(kEmpty.with("DNSSuffixesToAppend", null(CMPI_stringA)).with("ConfigurationName", null(CMPI_string)));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
  EXPECT_EQ(kFile, content());
  EXPECT_THAT(outcome.errors(), ElementsAre(kMissing, kFailed));
  expectLeftOpen(outcome);
}

TEST_F(DNSGeneralSettingDataModification, SuffixesThatAreNoArrayAreSkipped) {
  EXPECT_EQ(CMPI_RC_OK, modify(kWhole.with("DNSSuffixesToAppend", "a")).rc);
  EXPECT_EQ("DOMAINNAME=d\nDNSSUFFIXES=old \nCONFIG_NAME=home\n", content());
}

TEST_F(DNSGeneralSettingDataModification, AConfigurationNameThatIsNoTextCountsAsAbsent) {
  EXPECT_THAT(modify(kWhole.with("ConfigurationName", uint16(1))).errors(), ElementsAre(kMissing));
  EXPECT_EQ("DOMAINNAME=d\nDNSSUFFIXES=a.example.org b \nCONFIG_NAME=office\n", content());
}

TEST_F(DNSGeneralSettingDataModification, AnEmptyArrayAndAnEmptyNameEmptyTheirKeys) {
  EXPECT_EQ(CMPI_RC_OK, modify(kWhole.with("DNSSuffixesToAppend", texts({})).with("ConfigurationName", "")).rc);
  EXPECT_EQ("DOMAINNAME=d\nDNSSUFFIXES=\nCONFIG_NAME=\n", content());
}

TEST_F(DNSGeneralSettingDataModification, NothingIsValidated) {
  modify(kEmpty.with("DNSSuffixesToAppend", texts({"a b", "..", "\"q\""})).with("ConfigurationName", "x\ny"));
  EXPECT_EQ("DOMAINNAME=d\nDNSSUFFIXES=a b .. \"q\" \nCONFIG_NAME=x\ny\n", content());
}

TEST_F(DNSGeneralSettingDataModification, ElementsThatTheBrokerFailsToGiveAreLeftOut) {
  for (const Mode mode : kAllStatusModes) {
    broker_.failNext("getElementAt", mode);
    modify(kWhole);
    EXPECT_EQ("DOMAINNAME=d\nDNSSUFFIXES=b \nCONFIG_NAME=home\n", content()) << nameOf(mode);
  }
}

TEST_F(DNSGeneralSettingDataModification, AHundredThousandSuffixesAreWritten) {
  std::vector<std::string> suffixes;
  std::string value;
  for (int i = 0; i < 100000; ++i) {
    suffixes.push_back("s" + std::to_string(i));
    value += suffixes.back() + " ";
  }
  broker_.keepsLines = false;
  EXPECT_EQ(CMPI_RC_OK, modify(kWhole.with("DNSSuffixesToAppend", texts(suffixes))).rc);
  EXPECT_TRUE("DOMAINNAME=d\nDNSSUFFIXES=" + value + "\nCONFIG_NAME=home\n" == content());
}

// --- which file

TEST_F(DNSGeneralSettingDataModification, ASkippedInterfaceOfTheServiceProcessorKeepsItsFile) {
  World world;
  world.bmc().nic("bmc0").host().nic("eth0").install().file("bmc0", kFile).file("eth0", kFile);
  EXPECT_EQ(CMPI_RC_OK, modify(kWhole).rc);
  EXPECT_EQ(kFile, world.fileContent("bmc0"));
  EXPECT_NE(kFile, world.fileContent("eth0"));
}

TEST_F(DNSGeneralSettingDataModification, WithoutAnInterfaceTheNameIsWrittenToTheFileWithoutOne) {
  World world;
  world.bmc().nic("bmc0").install().file("", kFile);
  const Outcome outcome = modify(kWhole);
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
  EXPECT_EQ("DOMAINNAME=d\nDNSSUFFIXES=old \nCONFIG_NAME=home\n", world.fileContent(""));
  EXPECT_THAT(outcome.errors(), ElementsAre("Name Property is not available from Instrumentation"));
  EXPECT_THAT(outcome.calls.only({"getProperty"}), ElementsAre("instance.getProperty(\"ConfigurationName\")"));
}

TEST_F(DNSGeneralSettingDataModification, AnInterfaceWithoutANameHasTheFileWithoutOne) {
  World world;
  world.nic("x", {.isUnnamed = true}).install().file("", kFile);
  EXPECT_EQ(CMPI_RC_OK, modify(kWhole).rc);
  EXPECT_EQ("DOMAINNAME=d\nDNSSUFFIXES=a.example.org b \nCONFIG_NAME=home\n", world.fileContent(""));
}

TEST_F(DNSGeneralSettingDataModification, AMissingFileAndAMissingKeyAreASuccessAndStayMissing) {
  world_.file("eth0", "X=1\n");
  EXPECT_EQ(CMPI_RC_OK, modify(kWhole).rc);
  EXPECT_EQ("X=1\n", content());
  std::filesystem::remove(world_.filePath("eth0"));
  EXPECT_EQ(CMPI_RC_OK, modify(kWhole).rc);
  EXPECT_EQ(std::nullopt, world_.fileContent("eth0"));
}

// --- failures

TEST_F(DNSGeneralSettingDataModification, ATreeThatCannotBeReadIsAHostWithoutInterfaces) {
  world_.installUnreadable();
  const Outcome outcome = modify(kEmpty);
  EXPECT_THAT(outcome.errors(), ElementsAre("Select Node for NetworkIPConfig failed", kMissing, kFailed));
  expectLeftOpen(outcome);
}

TEST_F(DNSGeneralSettingDataModification, WhateverTheBrokerFailsAtTheOtherLinesStay) {
  const std::size_t tried =
      forEachFailure(broker_,
                     [&](std::size_t, Mode mode) {
                       world_.file("eth0", kFile);
                       try {
                         const Outcome outcome = modify(kWhole);
                         const bool isDone = outcome.calls.count("returnDone") == 1;
                         EXPECT_NE(isDone, outcome.lines.back().subject() == kFailed);
                       } catch (const InjectedFailure&) {
                         EXPECT_EQ(Mode::Throw, mode);
                       }
                       EXPECT_EQ(0U, content().find("DOMAINNAME=d\nDNSSUFFIXES="));
                     },
                     {Mode::SetRc, Mode::ReturnNull, Mode::NullHandle, Mode::RcAndNull, Mode::Throw});
  EXPECT_GT(tried, 40U);
}

TEST_F(DNSGeneralSettingDataModification, WhateverTheTreeThrowsFliesOnUnlessItIsTheSelection) {
  std::size_t flown = 0;
  const std::size_t tried = forEachTreeFailure([&](std::size_t, Thrown) {
    try {
      modify(kWhole);
    } catch (...) {
      ++flown;
    }
  });
  EXPECT_EQ(tried - 2, flown);
  EXPECT_GT(tried, 16U);
}

TEST_F(DNSGeneralSettingDataModification, WithoutResultPathOrInstanceNothingBreaks) {
  CMPIInstanceMI* mi = provider_.mi();
  const CMPIInstance* instance = broker_.make(kWhole);
  EXPECT_EQ(CMPI_RC_OK, mi->ft->modifyInstance(mi, nullptr, nullptr, nullptr, nullptr, nullptr).rc);
  EXPECT_EQ(kFile, content());
  EXPECT_THAT(logger_.pairs().errors(), ElementsAre("Instance to be Modified is NULL", kFailed));
  EXPECT_EQ(CMPI_RC_OK, mi->ft->modifyInstance(mi, nullptr, nullptr, nullptr, instance, nullptr).rc);
  EXPECT_EQ("DOMAINNAME=d\nDNSSUFFIXES=a.example.org b \nCONFIG_NAME=home\n", content());
}

}  // namespace
}  // namespace ZV::Test
