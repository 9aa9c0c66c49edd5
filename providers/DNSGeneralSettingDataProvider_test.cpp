// The host's general setting as a client reads it.

#include "providers/testing/InstanceTest.h"

namespace ZV::Test {
namespace {

class GeneralSettings : public InstanceTest {
 protected:
  GeneralSettings() : InstanceTest("DNSGeneralSettingDataProvider") { world.host("myhost"); }
};

TEST_F(GeneralSettings, ThereIsOneWhateverTheNumberOfInterfaces) {
  world.nic("eth0").nic("eth1").install();
  ASSERT_THAT(instances(), SizeIs(1));
  ASSERT_THAT(paths(), SizeIs(1));
  EXPECT_EQ(instances()[0]["InstanceID"], paths()[0]["InstanceID"]);
}

TEST_F(GeneralSettings, InstanceIDOfAnotherSystemGivesTheInstanceOfThisOne) {
  world.nic("eth0", usualNic()).install();
  for (const Path& path : {generalSettingPath("dnsgen1:elsewhere"), generalSettingPath(""), classPath()}) {
    EXPECT_EQ(chars("dnsgen1:myhost"), found(path).at(0)["InstanceID"]);
  }
}

TEST_F(GeneralSettings, ThereIsNoneWithTheServiceProcessorsInterfacesAlone) {
  world.bmc().nic("bmc0", usualNic()).install();
  EXPECT_THAT(instances(), IsEmpty());
  EXPECT_THAT(paths(), IsEmpty());
  EXPECT_THAT(found(generalSettingPath()), IsEmpty());
}

TEST_F(GeneralSettings, MissingFileGivesAnEmptyConfigurationNameAndTheSuffixesOfTheNode) {
  world.nic("eth0", usualNic()).install();
  const Instance instance = instances().at(0);
  EXPECT_EQ(chars(""), instance["ConfigurationName"]);
  EXPECT_EQ(texts({"example.org"}), instance["DNSSuffixesToAppend"]);
}

TEST_F(GeneralSettings, InterfaceWithoutANameReadsTheFileWithoutOne) {
  world.nic("x", {.isUnnamed = true}).install().file("", "CONFIG_NAME=nameless\n");
  EXPECT_EQ(chars("nameless"), instances().at(0)["ConfigurationName"]);
  EXPECT_EQ(chars("dnsgen1:myhost"), instances().at(0)["InstanceID"]);
}

}  // namespace
}  // namespace ZV::Test
