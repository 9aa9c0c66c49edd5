#include "providers/SettingAssociations.h"

namespace ZV::Test {
namespace {

using ::testing::Each;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;

const char* const kAssociation = "ZORVA_DNSGenEndPointElementSettingData";
const char* const kSister = "ZORVA_DNSEndPointElementSettingData";
const char* const kBuilder = "DNSGenEndpointElementSettingDataCMPIInstances";

const char* const kNoEndpoints = "Can't get ObjectPaths for DNSClient.             Exiting EnumerateInstanceNames";
const char* const kNoSettingsForNames =
    "Can't get ObjectPaths for DNSGeneralSettingData.             Exiting EnumerateInstanceNames";
const char* const kNoSettingsInBuilder = "getAllDNSGeneralSettingDataCMPIObjectPaths failed";
const char* const kNoSettingPaths = "getAllDNSGeneralSettingDataCMPIObjectPaths Failed";
const char* const kNoSettings = "getAllDNSGeneralSettingDataCMPIInstances Failed";
const char* const kBadEndpoint = "CMPIObjectPath is NULL for DNS Server";
const char* const kBadSettingInBuilder = "CMPIObjectPath is NULL for DNS Client";
const char* const kBadSettingForNames = "CMPIObjectPath is NULL for DNSGeneralSettingData";
const char* const kNoPathInBuilder =
    "Create CMPIObjectPath failed for                     DNSGenEndpointElementSettingData.";
const char* const kNoPathForNames =
    "Create CMPIObjectPath failed for                     DNSGenEndpointElementSettingData Class.";

class GenEndpointElementSettingData : public AssociationTest {
 protected:
  GenEndpointElementSettingData() : AssociationTest(genEndpointElementSettingData()) {}

  void installOne() { world.host().nic("eth0").install(); }
  void installThree() { world.host().nic("eth1").nic("eth0").bmc().nic("bmc0").install(); }
  void installServiceProcessorAlone() { world.bmc().nic("bmc0").install(); }

  Path pair(const std::string& endpoint) const { return pairOf(endpointPath(endpoint), generalSettingPath()); }
  Story setAll(const std::string& instance, const std::string& endpoint, const std::string& setting) const {
    return tell({setEnds(instance, endpoint, setting), flags(instance, 1)});
  }

  std::function<Outcome()> names() {
    return [this] { return enumerateInstanceNames(); };
  }
  std::function<Outcome()> instances() {
    return [this] { return enumerateInstances(); };
  }
};

// --- Enumerations

TEST_F(GenEndpointElementSettingData, NamesAreMadeOfBothPathsAndGoOutAtOnce) {
  installOne();
  const Outcome names = enumerateInstanceNames();
  EXPECT_EQ(tell({entry(operation("EnumInstanceNames")),
                  newEndpointPath("OP1", "eth0"),
                  newGeneralSettingPath("OP2"),
                  {inRootCimv2("OP1"), inRootCimv2("OP2")},  // the setting's host stays as it came
                  newHostPath("OP3", kAssociation),
                  keyEnds("OP3", "OP1", "OP2"),
                  {"returnObjectPath(OP3)"},
                  done(operation("EnumInstanceNames"))}),
            storyOf(names));
  EXPECT_EQ(CMPI_RC_OK, names.rc);
}

TEST_F(GenEndpointElementSettingData, InstancesAreBuiltFirstAndHandedOutThen) {
  installOne();
  const Outcome all = enumerateInstances();
  EXPECT_EQ(tell({entry(operation("EnumInstances")),
                  entry(kBuilder),
                  newEndpointPath("OP1", "eth0"),
                  newGeneralSettingPath("OP2"),
                  {inRootCimv2("OP1")},  // the endpoint's host stays as it came
                  placed("OP2"),
                  newHostPath("OP3", kAssociation),
                  {"newInstance(OP3)", R"(I1.setPropertyFilter(null, {"ManagedElement", "SettingData"}))"},
                  setAll("I1", "OP1", "OP2"),
                  exitMark(kBuilder),
                  {"returnInstance(I1)"},
                  done(operation("EnumInstances"))}),
            storyOf(all));
  EXPECT_EQ(CMPI_RC_OK, all.rc);
}
}  // namespace
}  // namespace ZV::Test
