#include "factory/DNSSettingDataObjects.h"

#include "factory/testing/SettingObjectsTest.h"

namespace ZV::Test {
namespace {

using std::string_literals::operator""s;

constexpr const char* kClass = "ZORVA_DNSSettingData";

const std::vector<std::string> kAllProperties = {"InstanceID",         "Caption",           "Description",
                                                 "ElementName",        "AddressOrigin",     "DomainName",
                                                 "RequestedHostname",  "ConfigurationName", "UseSuffixWhenRegistering",
                                                 "DNSServerAddresses", "DHCPOptionsToUse"};

class DNSSettingDataObjectsTest : public SettingObjectsTest<DNSSettingData> {
 protected:
  DNSSettingDataObjectsTest() : SettingObjectsTest(kClass, makeDNSSettingDataInstance) {}
};

// --- which properties

TEST_F(DNSSettingDataObjectsTest, WithoutAListAllPropertiesAreSetInTheirOrder) {
  EXPECT_EQ(kAllProperties, made().names());
}

TEST_F(DNSSettingDataObjectsTest, WithoutAListButForThePathAloneTheKeyIsSet) {
  EXPECT_THAT(made(nullptr, true).names(), ElementsAre("InstanceID"));
}

TEST_F(DNSSettingDataObjectsTest, WithAnEmptyListTheKeyIsSet) {
  EXPECT_THAT(made({}, false).names(), ElementsAre("InstanceID"));
  EXPECT_THAT(made({}, true).names(), ElementsAre("InstanceID"));
}

TEST_F(DNSSettingDataObjectsTest, WithAListTheKeyAndWhatItNamesAreSet) {
  for (const bool isObjPath : {false, true}) {
    EXPECT_THAT(made({"ElementName", "Caption"}, isObjPath).names(),
                ElementsAre("InstanceID", "Caption", "ElementName"));
  }
}

TEST_F(DNSSettingDataObjectsTest, EachPropertyCanBeAskedForAlone) {
  for (const std::string& name : kAllProperties) {
    const std::vector<std::string> expected =
        name == "InstanceID" ? std::vector{name} : std::vector{"InstanceID"s, name};
    EXPECT_EQ(expected, made({name}).names());
  }
}

TEST_F(DNSSettingDataObjectsTest, NamesOfTheListAreExactText) {
  make({"caption", "Captio", "Caption "});
  EXPECT_THAT(broker_.calls().only({"setProperty"}), SizeIs(1));
}

TEST_F(DNSSettingDataObjectsTest, NamesThatTheClassLacksOrThatAreGivenTwiceAreIgnored) {
  EXPECT_THAT(made({"NoSuchProperty", "Caption", "Caption", ""}).names(), ElementsAre("InstanceID", "Caption"));
}

TEST_F(DNSSettingDataObjectsTest, TheFilterIsSetIfMoreThanThePathIsRequested) {
  make(nullptr, false);
  EXPECT_THAT(broker_.calls().lines(), Contains("I1.setPropertyFilter(null, {\"InstanceID\"})"));
  broker_.startOver();
  make({"Caption"}, false);
  EXPECT_THAT(broker_.calls().lines(), Contains("I1.setPropertyFilter({\"Caption\"}, {\"InstanceID\"})"));
  broker_.startOver();
  make({"Caption"}, true);
  EXPECT_THAT(broker_.calls().only({"setPropertyFilter"}), IsEmpty());
}

// --- values

TEST_F(DNSSettingDataObjectsTest, ValuesHaveTheTypesOfTheClass) {
  world_->file("eth0", "CONFIG_NAME=office\nDOMAINNAME=d\nHOSTNAME=h\nDNSSERVERS=192.0.2.1 192.0.2.2 \n");
  const Instance instance = made();
  EXPECT_EQ(chars("Computer%eth0"), instance["InstanceID"]);
  EXPECT_EQ(chars("DNS Setting Configuration"), instance["Caption"]);
  EXPECT_EQ(chars("Represents DNS Setting Configuration for DNS Protocol EndPoint"), instance["Description"]);
  EXPECT_EQ(chars("DNSSettingData.eth0"), instance["ElementName"]);
  EXPECT_EQ(uint16(2), instance["AddressOrigin"]);
  EXPECT_EQ(chars("d"), instance["DomainName"]);
  EXPECT_EQ(chars("h"), instance["RequestedHostname"]);
  EXPECT_EQ(chars("office"), instance["ConfigurationName"]);
  EXPECT_EQ(boolean(false), instance["UseSuffixWhenRegistering"]);
  EXPECT_EQ(texts({"192.0.2.1", "192.0.2.2"}), instance["DNSServerAddresses"]);
  EXPECT_EQ(uint16s({8, 14, 17}), instance["DHCPOptionsToUse"]);
}

TEST_F(DNSSettingDataObjectsTest, EmptyTextsAreSet) {
  world_->file("eth0", "");
  const Instance instance = made();
  EXPECT_EQ(chars(""), instance["DomainName"]);
  EXPECT_EQ(chars(""), instance["RequestedHostname"]);
  EXPECT_EQ(chars(""), instance["ConfigurationName"]);
}

TEST_F(DNSSettingDataObjectsTest, ABareInterfaceLacksUnknownValues) {
  newWorld().nic("eth0").install();
  EXPECT_THAT(made().names(), ElementsAre("InstanceID", "Caption", "Description", "ElementName", "AddressOrigin",
                                          "ConfigurationName", "UseSuffixWhenRegistering", "DHCPOptionsToUse"));
}

TEST_F(DNSSettingDataObjectsTest, AnEmptyListOfServersIsLeftOut) {
  world_->file("eth0", "DNSSERVERS=\n");
  EXPECT_FALSE(made().has("DNSServerAddresses"));
  EXPECT_FALSE(made({"DNSServerAddresses"}).has("DNSServerAddresses"));
}

TEST_F(DNSSettingDataObjectsTest, ServersAreCountedInSixteenBits) {
  std::string content = "DNSSERVERS=";
  for (int i = 0; i < 65536 + 3; ++i) content += std::to_string(i) + " ";
  world_->file("eth0", content + "\n");
  EXPECT_EQ(texts({"0", "1", "2"}), made()["DNSServerAddresses"]);
}

TEST_F(DNSSettingDataObjectsTest, AHundredThousandServersGiveWhatIsLeftOfTheirNumber) {
  std::string content = "DNSSERVERS=";
  for (int i = 0; i < 100000; ++i) content += std::to_string(i) + " ";
  world_->file("eth0", content + "\n");
  broker_.keepsLines = false;
  EXPECT_THAT(made()["DNSServerAddresses"].texts(), SizeIs(100000 - 65536));
}

TEST_F(DNSSettingDataObjectsTest, AValueOfAMebibyteIsSetWhole) {
  const std::string value(1 << 20, 'v');
  world_->file("eth0", "CONFIG_NAME=" + value + "\n");
  EXPECT_EQ(chars(value), made()["ConfigurationName"]);
}

// --- failures of the broker

TEST_F(DNSSettingDataObjectsTest, PathAndInstanceAreMadeWithoutTheStatus) {
  for (const char* name : {"newObjectPath", "newInstance", "getNameSpace"}) {
    broker_.startOver();
    broker_.failNext(name, Mode::SetRc);
    EXPECT_EQ(kAllProperties, made().names());
    EXPECT_EQ(CMPI_RC_OK, status_.rc) << name;
  }
}

TEST_F(DNSSettingDataObjectsTest, AnArrayWithoutAHandleIsSkippedAndTheWorkGoesOn) {
  broker_.failNext("newArray", Mode::NullHandle);
  EXPECT_THAT(made().names(), Contains("DHCPOptionsToUse"));
  EXPECT_THAT(errors(), IsEmpty());
}

TEST_F(DNSSettingDataObjectsTest, AServerWhoseStringFailsLeavesItsElementUnset) {
  world_->file("eth0", "DNSSERVERS=a b c \n");
  for (const Mode mode : {Mode::SetRc, Mode::RcAndNull, Mode::ReturnNull}) {
    broker_.startOver();
    broker_.failNext("newString", mode);
    EXPECT_EQ(list(CMPI_stringA, {null(CMPI_string), text("b"), text("c")}), made()["DNSServerAddresses"]);
    EXPECT_EQ(3U, broker_.callsOf("newString"));
    EXPECT_THAT(errors(), IsEmpty());
  }
}

TEST_F(DNSSettingDataObjectsTest, APropertyThatTheInstanceRefusesStaysUnset) {
  broker_.failEach("setProperty", Mode::SetRc);
  EXPECT_THAT(made().names(), IsEmpty());
  EXPECT_EQ(kAllProperties.size(), broker_.callsOf("setProperty"));
  EXPECT_EQ(CMPI_RC_OK, status_.rc);
  EXPECT_THAT(errors(), IsEmpty());
}

// --- all, one, and paths

TEST_F(DNSSettingDataObjectsTest, OneInstanceIsFoundByExactText) {
  for (const char* key :
       {"Computer%eth", "Computer%eth00", "computer%eth0", "eth0", "BMC%eth0", "Computer%eth0 ", ""}) {
    CMPIInstance* instance = nullptr;
    const CMPIObjectPath* ref = broker_.make(Path(kClass).key("InstanceID", key), "ref");
    logger_.clear();
    EXPECT_EQ(1, getOneDNSSettingDataCMPIInstance(broker_.cmpi(), ref, nullptr, &instance, &status_)) << key;
    EXPECT_EQ(nullptr, instance);
    EXPECT_THAT(errors(), IsEmpty());
  }
}

TEST_F(DNSSettingDataObjectsTest, TheKeysFailuresAreLeftInTheStatus) {
  const CMPIObjectPath* ref = broker_.make(Path(kClass).key("InstanceID", "Computer%eth0"), "ref");
  for (const char* name : {"getKey", "getCharPtr"}) {
    broker_.startOver();
    broker_.failNext(name, Mode::RcAndNull);
    status_.rc = CMPI_RC_OK;
    CMPIInstance* instance = nullptr;
    EXPECT_EQ(1, getOneDNSSettingDataCMPIInstance(broker_.cmpi(), ref, nullptr, &instance, &status_));
    EXPECT_EQ(CMPI_RC_ERR_FAILED, status_.rc) << name;
  }
}

TEST_F(DNSSettingDataObjectsTest, PathsHaveTheKeyTheNamespaceOfTheRequestAndThisHost) {
  world_->bmc().nic("bmc0").install();
  std::vector<CMPIObjectPath*> paths;
  const CMPIObjectPath* ref = broker_.make(Path(kClass, "root/other").on("elsewhere"), "ref");
  EXPECT_EQ(0, getAllDNSSettingDataCMPIObjectPaths(broker_.cmpi(), ref, &paths, &status_));
  ASSERT_THAT(paths, SizeIs(2));
  const Path path = Path(kClass, "root/other").on("host1");
  EXPECT_EQ(path.key("InstanceID", chars("Computer%eth0")), RecordingBroker::read(paths[0]));
  EXPECT_EQ(path.key("InstanceID", chars("BMC%bmc0")), RecordingBroker::read(paths[1]));
}

TEST_F(DNSSettingDataObjectsTest, APathOfANodeWithoutANameHasNoKey) {
  newWorld().nic("x", {.isUnnamed = true}).install();
  std::vector<CMPIObjectPath*> paths;
  EXPECT_EQ(0, getAllDNSSettingDataCMPIObjectPaths(broker_.cmpi(), ref_, &paths, &status_));
  ASSERT_THAT(paths, SizeIs(1));
  EXPECT_EQ(Path(kClass).on("host1"), RecordingBroker::read(paths[0]));
}

TEST_F(DNSSettingDataObjectsTest, WithoutABrokerOrAPathNothingBreaks) {
  std::vector<CMPIInstance*> instances;
  std::vector<CMPIObjectPath*> paths;
  CMPIInstance* one = nullptr;
  EXPECT_EQ(0, getAllDNSSettingDataCMPIInstances(nullptr, ref_, nullptr, &instances, &status_));
  EXPECT_THAT(instances, ElementsAre(nullptr));
  EXPECT_EQ(1, getAllDNSSettingDataCMPIObjectPaths(nullptr, ref_, &paths, &status_));
  EXPECT_EQ(1, getOneDNSSettingDataCMPIInstance(nullptr, nullptr, nullptr, &one, &status_));
  EXPECT_EQ(0, getAllDNSSettingDataCMPIObjectPaths(broker_.cmpi(), nullptr, &paths, &status_));
  EXPECT_THAT(paths, SizeIs(1));
}

}  // namespace
}  // namespace ZV::Test
