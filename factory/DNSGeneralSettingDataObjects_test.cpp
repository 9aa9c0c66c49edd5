#include "factory/DNSGeneralSettingDataObjects.h"

#include "factory/testing/SettingObjectsTest.h"

namespace ZV::Test {
namespace {

using std::string_literals::operator""s;

constexpr const char* kClass = "ZORVA_DNSGeneralSettingData";

const std::vector<std::string> kAllProperties = {
    "InstanceID", "Caption", "Description", "ElementName", "ConfigurationName", "AddressOrigin", "DNSSuffixesToAppend"};

using Instances = std::vector<CMPIInstance*>;
using Paths = std::vector<CMPIObjectPath*>;

class DNSGeneralSettingDataObjectsTest : public SettingObjectsTest<DNSGeneralSettingData> {
 protected:
  DNSGeneralSettingDataObjectsTest() : SettingObjectsTest(kClass, makeDNSGeneralSettingDataInstance) {}
};

// --- which properties

TEST_F(DNSGeneralSettingDataObjectsTest, TheListAndTheFlagChooseTheProperties) {
  const std::vector<std::string> key = {"InstanceID"};
  EXPECT_EQ(kAllProperties, made(nullptr, false).names());
  EXPECT_EQ(key, made(nullptr, true).names());
  EXPECT_EQ(key, made({}, false).names());
  EXPECT_EQ(key, made({}, true).names());
  EXPECT_EQ(key, made({"caption", "NoSuchProperty"}).names());
  for (const bool isObjPath : {false, true}) {
    EXPECT_THAT(made({"ConfigurationName", "Caption"}, isObjPath).names(),
                ElementsAre("InstanceID", "Caption", "ConfigurationName"));
  }
}

TEST_F(DNSGeneralSettingDataObjectsTest, EachPropertyCanBeAskedForAlone) {
  for (const std::string& name : kAllProperties) {
    const auto expected = name == "InstanceID" ? std::vector{name} : std::vector{"InstanceID"s, name};
    EXPECT_EQ(expected, made({name}).names());
  }
}

TEST_F(DNSGeneralSettingDataObjectsTest, WhetherToAppendSuffixesIsNeverSet) {
  EXPECT_THAT(made({"AppendPrimarySuffixes", "AppendParentSuffixes"}).names(), ElementsAre("InstanceID"));
}

TEST_F(DNSGeneralSettingDataObjectsTest, TheFilterIsSetIfMoreThanThePathIsRequested) {
  make();
  EXPECT_THAT(broker_.calls().lines(), Contains("I1.setPropertyFilter(null, {\"InstanceID\"})"));
  broker_.startOver();
  make(nullptr, true);
  EXPECT_EQ(0U, broker_.callsOf("setPropertyFilter"));
}

// --- values

TEST_F(DNSGeneralSettingDataObjectsTest, ValuesHaveTheTypesOfTheClass) {
  world_->file("eth0", "CONFIG_NAME=office\nDNSSUFFIXES=a.example.org b.example.org \n");
  const Instance instance = made();
  EXPECT_EQ(chars("dnsgen1:host1"), instance["InstanceID"]);
  EXPECT_EQ(chars("DNS General Configuration"), instance["Caption"]);
  EXPECT_EQ(chars("Represents DNS General Configuration for DNS Protocol EndPoint"), instance["Description"]);
  EXPECT_EQ(chars("DNSGeneralSettingData"), instance["ElementName"]);
  EXPECT_EQ(chars("office"), instance["ConfigurationName"]);
  EXPECT_EQ(uint16(2), instance["AddressOrigin"]);
  EXPECT_EQ(texts({"a.example.org", "b.example.org"}), instance["DNSSuffixesToAppend"]);
}

TEST_F(DNSGeneralSettingDataObjectsTest, WithoutAFileTheConfigurationNameIsEmptyAndTheSuffixesAreTheNodes) {
  const Instance instance = made();
  EXPECT_EQ(chars(""), instance["ConfigurationName"]);
  EXPECT_EQ(texts({"example.org"}), instance["DNSSuffixesToAppend"]);
}

TEST_F(DNSGeneralSettingDataObjectsTest, AnEmptyListOfSuffixesIsLeftOut) {
  world_->file("eth0", "DNSSUFFIXES=\n");
  EXPECT_FALSE(made().has("DNSSuffixesToAppend"));
  newWorld().nic("eth0").install();
  EXPECT_FALSE(made().has("DNSSuffixesToAppend"));
}

TEST_F(DNSGeneralSettingDataObjectsTest, ANodeWithoutANameReadsTheFileWithoutOneAndKeepsTheInstanceID) {
  newWorld().host("host1").nic("x", {.isUnnamed = true}).install().file("", "CONFIG_NAME=nameless\n");
  const Instance instance = made();
  EXPECT_EQ(chars("dnsgen1:host1"), instance["InstanceID"]);
  EXPECT_EQ(chars("nameless"), instance["ConfigurationName"]);
}

TEST_F(DNSGeneralSettingDataObjectsTest, SuffixesAreCountedInSixteenBits) {
  std::string content = "DNSSUFFIXES=";
  for (int i = 0; i < 65536 + 2; ++i) content += std::to_string(i) + " ";
  world_->file("eth0", content + "\n");
  EXPECT_EQ(texts({"0", "1"}), made()["DNSSuffixesToAppend"]);
}

// --- failures of the broker

TEST_F(DNSGeneralSettingDataObjectsTest, PathAndInstanceAreMadeWithoutTheStatus) {
  for (const char* name : {"newObjectPath", "newInstance", "getNameSpace"}) {
    broker_.failNext(name, Mode::SetRc);
    EXPECT_EQ(kAllProperties, made().names());
    EXPECT_EQ(CMPI_RC_OK, status_.rc) << name;
  }
}

TEST_F(DNSGeneralSettingDataObjectsTest, ASuffixWhoseStringFailsLeavesItsElementUnset) {
  world_->file("eth0", "DNSSUFFIXES=a b c \n");
  for (const Mode mode : {Mode::SetRc, Mode::RcAndNull, Mode::ReturnNull}) {
    broker_.failNext("newString", mode);
    EXPECT_EQ(list(CMPI_stringA, {null(CMPI_string), text("b"), text("c")}), made()["DNSSuffixesToAppend"]);
    EXPECT_THAT(errors(), IsEmpty());
  }
}

// --- all, one, and paths

TEST_F(DNSGeneralSettingDataObjectsTest, ThereIsOneInstanceAndOnePathWhateverTheNumberOfInterfaces) {
  world_->nic("eth1").nic("eth2").install();
  Instances instances;
  Paths paths;
  EXPECT_EQ(0, getAllDNSGeneralSettingDataCMPIInstances(broker_.cmpi(), ref_, nullptr, &instances, &status_));
  EXPECT_THAT(instances, SizeIs(1));
  EXPECT_EQ(0, getAllDNSGeneralSettingDataCMPIObjectPaths(broker_.cmpi(), ref_, &paths, &status_));
  EXPECT_THAT(paths, SizeIs(1));
}

TEST_F(DNSGeneralSettingDataObjectsTest, ThePathHasTheKeyOfTheInstanceTheNamespaceOfTheRequestAndThisHost) {
  Paths paths;
  const CMPIObjectPath* ref = broker_.make(Path(kClass, "root/other").on("elsewhere"), "ref");
  EXPECT_EQ(0, getAllDNSGeneralSettingDataCMPIObjectPaths(broker_.cmpi(), ref, &paths, &status_));
  ASSERT_THAT(paths, SizeIs(1));
  EXPECT_EQ(Path(kClass, "root/other").on("host1").key("InstanceID", made()["InstanceID"]),
            RecordingBroker::read(paths[0]));
}

TEST_F(DNSGeneralSettingDataObjectsTest, TheKeyIsReadAndComparedWithNothing) {
  for (const Path& path :
       {Path(kClass).key("InstanceID", "dnsgen1:elsewhere"), Path(kClass).key("InstanceID", ""), Path(kClass)}) {
    Instances instances;
    broker_.startOver();
    const CMPIObjectPath* ref = broker_.make(path, "ref");
    EXPECT_EQ(0, getOneDNSGeneralSettingDataCMPIInstance(broker_.cmpi(), ref, nullptr, &instances, &status_));
    EXPECT_EQ("ref.getKey(\"InstanceID\")", broker_.calls().lines().at(0));
    ASSERT_THAT(instances, SizeIs(1));
    EXPECT_EQ(chars("dnsgen1:host1"), RecordingBroker::read(instances[0])["InstanceID"]);
  }
}

TEST_F(DNSGeneralSettingDataObjectsTest, WithoutABrokerOrAPathNothingBreaks) {
  Instances instances;
  Paths paths;
  EXPECT_EQ(0, getAllDNSGeneralSettingDataCMPIInstances(nullptr, ref_, nullptr, &instances, &status_));
  EXPECT_EQ(0, getOneDNSGeneralSettingDataCMPIInstance(broker_.cmpi(), nullptr, nullptr, &instances, &status_));
  EXPECT_THAT(instances, SizeIs(2));
  EXPECT_EQ(1, getAllDNSGeneralSettingDataCMPIObjectPaths(nullptr, ref_, &paths, &status_));
}

}  // namespace
}  // namespace ZV::Test
