// ModifyInstance of ZORVA_DNSGeneralSettingData, which writes to the file of the host's first interface.

#include <filesystem>

#include "providers/testing/ModificationTestSupport.h"
#include "tests/support/ManyTexts.h"

namespace ZV::Test {
namespace {

using std::string_literals::operator""s;

constexpr const char* kClass = "ZORVA_DNSGeneralSettingData";
constexpr const char* kFile = "DOMAINNAME=d\nDNSSUFFIXES=old \nCONFIG_NAME=office\n";

const Instance kEmpty(kClass);
const Instance kWhole =
    kEmpty.with("DNSSuffixesToAppend", texts({"a.example.org", "b"})).with("ConfigurationName", "home");

class DNSGeneralSettingDataModification : public InstanceTest {
 protected:
  DNSGeneralSettingDataModification() : InstanceTest("DNSGeneralSettingDataProvider") {
    world.nic("eth0", usualNic()).nic("eth1").install().file("eth0", kFile).file("eth1", kFile);
  }
  Outcome modify(const Instance& instance, const char* instanceID = "dnsgen1:host1") {
    return provider.modifyInstance(Path(kClass).key("InstanceID", instanceID), instance);
  }
  std::string content() const { return world.fileContent("eth0").value_or("no file"); }
};

// --- a whole operation

TEST_F(DNSGeneralSettingDataModification, WritesBothValuesToTheFile) {
  EXPECT_EQ(CMPI_RC_OK, modify(kWhole).rc);
  EXPECT_EQ("DOMAINNAME=d\nDNSSUFFIXES=a.example.org b \nCONFIG_NAME=home\n", content());
}

TEST_F(DNSGeneralSettingDataModification, LeavesTheOtherFilesAndTheNodeAsTheyAre) {
  modify(kWhole);
  EXPECT_EQ(kFile, world.fileContent("eth1"));
  EXPECT_THAT(world.list(0, NodeLexicon::PROP_DNS_SUFFIXES), Optional(ElementsAre("example.org")));
}

TEST_F(DNSGeneralSettingDataModification, TheInstanceIDOfAnotherSystemTakesEffectHere) {
  for (const char* instanceID : {"dnsgen1:elsewhere", "", "x"}) {
    world.file("eth0", kFile);
    EXPECT_EQ(CMPI_RC_OK, modify(kWhole, instanceID).rc);
    EXPECT_EQ("DOMAINNAME=d\nDNSSUFFIXES=a.example.org b \nCONFIG_NAME=home\n", content());
  }
}

TEST_F(DNSGeneralSettingDataModification, ThePropertyListDecidesNothing) {
  EXPECT_EQ(CMPI_RC_OK, provider.modifyInstance(Path(kClass).key("InstanceID", "x"), kWhole, {"Caption"}).rc);
  EXPECT_EQ("DOMAINNAME=d\nDNSSUFFIXES=a.example.org b \nCONFIG_NAME=home\n", content());
}

// --- which properties count as present

TEST_F(DNSGeneralSettingDataModification, AConfigurationNameAloneIsWritten) {
  const Outcome outcome = modify(kEmpty.with("ConfigurationName", "home"));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
  EXPECT_EQ("DOMAINNAME=d\nDNSSUFFIXES=old \nCONFIG_NAME=home\n", content());
}

TEST_F(DNSGeneralSettingDataModification, ATextThatTheBrokerFailsToGiveCountsAsAbsent) {
  for (const Mode mode : {Mode::SetRc, Mode::RcAndNull}) {
    broker.failEach("getCharPtr", mode);
    const Outcome outcome = modify(kEmpty.with("ConfigurationName", "home"));
    EXPECT_EQ(CMPI_RC_ERR_FAILED, outcome.rc) << "of the broker";
    EXPECT_EQ(kFile, content()) << nameOf(mode);
  }
}

TEST_F(DNSGeneralSettingDataModification, NullPropertiesCountAsAbsent) {
  const Outcome outcome =
      modify(kEmpty.with("DNSSuffixesToAppend", null(CMPI_stringA)).with("ConfigurationName", null(CMPI_string)));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
  EXPECT_EQ(kFile, content());
}

TEST_F(DNSGeneralSettingDataModification, SuffixesThatAreNoArrayAreSkipped) {
  EXPECT_EQ(CMPI_RC_OK, modify(kWhole.with("DNSSuffixesToAppend", "a")).rc);
  EXPECT_EQ("DOMAINNAME=d\nDNSSUFFIXES=old \nCONFIG_NAME=home\n", content());
}

TEST_F(DNSGeneralSettingDataModification, AConfigurationNameThatIsNoTextCountsAsAbsent) {
  EXPECT_EQ(CMPI_RC_OK, modify(kWhole.with("ConfigurationName", uint16(1))).rc);
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
    broker.failNext("getElementAt", mode);
    modify(kWhole);
    EXPECT_EQ("DOMAINNAME=d\nDNSSUFFIXES=b \nCONFIG_NAME=home\n", content()) << nameOf(mode);
  }
}

TEST_F(DNSGeneralSettingDataModification, AHundredThousandSuffixesAreWritten) {
  const ManyTexts many("s");
  broker.keepsLines = false;
  EXPECT_EQ(CMPI_RC_OK, modify(kWhole.with("DNSSuffixesToAppend", texts(many.texts))).rc);
  EXPECT_TRUE("DOMAINNAME=d\nDNSSUFFIXES=" + many.line + "\nCONFIG_NAME=home\n" == content());
}

// --- which file

TEST_F(DNSGeneralSettingDataModification, ASkippedInterfaceOfTheServiceProcessorKeepsItsFile) {
  World other;
  other.bmc().nic("bmc0").host().nic("eth0").install().file("bmc0", kFile).file("eth0", kFile);
  EXPECT_EQ(CMPI_RC_OK, modify(kWhole).rc);
  EXPECT_EQ(kFile, other.fileContent("bmc0"));
  EXPECT_NE(kFile, other.fileContent("eth0"));
}

TEST_F(DNSGeneralSettingDataModification, WithoutAnInterfaceTheNameIsWrittenToTheFileWithoutOne) {
  World other;
  other.bmc().nic("bmc0").install().file("", kFile);
  const Outcome outcome = modify(kWhole);
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
  EXPECT_EQ("DOMAINNAME=d\nDNSSUFFIXES=old \nCONFIG_NAME=home\n", other.fileContent(""));
  EXPECT_THAT(outcome.calls.only({"getProperty"}), ElementsAre("instance.getProperty(\"ConfigurationName\")"));
}

TEST_F(DNSGeneralSettingDataModification, AnInterfaceWithoutANameHasTheFileWithoutOne) {
  World other;
  other.nic("x", {.isUnnamed = true}).install().file("", kFile);
  EXPECT_EQ(CMPI_RC_OK, modify(kWhole).rc);
  EXPECT_EQ("DOMAINNAME=d\nDNSSUFFIXES=a.example.org b \nCONFIG_NAME=home\n", other.fileContent(""));
}

TEST_F(DNSGeneralSettingDataModification, AMissingFileAndAMissingKeyAreASuccessAndStayMissing) {
  world.file("eth0", "X=1\n");
  EXPECT_EQ(CMPI_RC_OK, modify(kWhole).rc);
  EXPECT_EQ("X=1\n", content());
  std::filesystem::remove(world.filePath("eth0"));
  EXPECT_EQ(CMPI_RC_OK, modify(kWhole).rc);
  EXPECT_EQ(std::nullopt, world.fileContent("eth0"));
}

// --- failures

TEST_F(DNSGeneralSettingDataModification, WithoutResultPathOrInstanceNothingBreaks) {
  CMPIInstanceMI* mi = provider.mi();
  const CMPIInstance* instance = broker.make(kWhole);
  EXPECT_EQ(CMPI_RC_OK, mi->ft->modifyInstance(mi, nullptr, nullptr, nullptr, nullptr, nullptr).rc);
  EXPECT_EQ(kFile, content());
  EXPECT_EQ(CMPI_RC_OK, mi->ft->modifyInstance(mi, nullptr, nullptr, nullptr, instance, nullptr).rc);
  EXPECT_EQ("DOMAINNAME=d\nDNSSUFFIXES=a.example.org b \nCONFIG_NAME=home\n", content());
}

}  // namespace
}  // namespace ZV::Test
