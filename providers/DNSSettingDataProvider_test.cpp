// ZORVA_DNSSettingData as a CIM server reads it.

#include <sys/inotify.h>
#include <unistd.h>

#include <array>
#include <cstring>

#include "providers/testing/InstanceTest.h"
#include "util/NotCopied.h"

namespace ZV::Test {
namespace {

// Counts how often a file is opened.
class OpenCounter : zorva::util::NotCopied {
 public:
  // Watches closing too, because the kernel merges equal events in a row.
  explicit OpenCounter(const std::string& path) : inotify_(::inotify_init1(IN_NONBLOCK | IN_CLOEXEC)) {
    ::inotify_add_watch(inotify_, path.c_str(), IN_OPEN | IN_CLOSE);
  }
  ~OpenCounter() { ::close(inotify_); }

  int take() {
    alignas(inotify_event) std::array<char, 4096> reports;
    const ssize_t got = ::read(inotify_, reports.data(), reports.size());
    int opened = 0;
    for (ssize_t at = 0; at < got;) {
      inotify_event event;
      std::memcpy(&event, reports.data() + at, sizeof event);
      if ((event.mask & IN_OPEN) != 0) ++opened;
      at += static_cast<ssize_t>(sizeof event) + static_cast<ssize_t>(event.len);
    }
    return opened;
  }

 private:
  int inotify_;
};

class Settings : public InstanceTest {
 protected:
  Settings() : InstanceTest("DNSSettingDataProvider") {}
};

TEST_F(Settings, DomainNameAloneComesWithTheKeyAndReadsTheFileOnce) {
  world.nic("eth0", usualNic()).install().file("eth0", "DOMAINNAME=d\n");
  OpenCounter opens(world.filePath("eth0"));
  EXPECT_THAT(found(settingPath("Computer%eth0"), {"DomainName"}).at(0).names(),
              ElementsAre("InstanceID", "DomainName"));
  EXPECT_EQ(1, opens.take());
}

TEST_F(Settings, WholeInstanceReadsTheFileOnceForEachOfItsFourValues) {
  world.nic("eth0", usualNic()).install().file("eth0", "DOMAINNAME=d\n");
  OpenCounter opens(world.filePath("eth0"));
  instances();
  EXPECT_EQ(4, opens.take());
  instances({});
  paths();
  EXPECT_EQ(0, opens.take());
}

TEST_F(Settings, PropertiesThatTheClassLacksAreIgnored) {
  world.nic("eth0", usualNic()).install();
  EXPECT_THAT(found(settingPath("Computer%eth0"), {"Name", "Caption"}).at(0).names(),
              ElementsAre("InstanceID", "Caption"));
}

TEST_F(Settings, OfAnInterfaceWithoutANameHaveNoInstanceIDAndNoElementName) {
  world.nic("x", {.isUnnamed = true}).install();
  ASSERT_THAT(instances(), SizeIs(1));
  EXPECT_THAT(instances()[0].names(), ElementsAre("Caption", "Description", "AddressOrigin", "ConfigurationName",
                                                  "UseSuffixWhenRegistering", "DHCPOptionsToUse"));
}

TEST_F(Settings, EmptyKeyFindsTheInterfaceWithoutAName) {
  world.nic("eth0").nic("x", {.domain = "nameless.example.org", .isUnnamed = true}).install();
  for (const Path& path : {settingPath(""), classPath()}) {
    EXPECT_EQ(chars("nameless.example.org"), found(path).at(0)["DomainName"]);
  }
}

TEST_F(Settings, OfTwoInterfacesOfOneNameTheFirstIsFound) {
  world.nic("eth0", {.domain = "first"}).nic("eth0", {.domain = "second"}).install();
  EXPECT_EQ(chars("first"), found(settingPath("Computer%eth0")).at(0)["DomainName"]);
}

TEST_F(Settings, AreFoundByTheExactInstanceID) {
  world.nic("eth0").install();
  EXPECT_THAT(found(settingPath("Computer%eth0")), SizeIs(1));
  for (const char* id : {"Computer%eth", "Computer%eth00", "computer%eth0", "eth0", "BMC%eth0", "Computer%eth0 ", ""}) {
    EXPECT_THAT(found(settingPath(id)), IsEmpty()) << id;
  }
}

TEST_F(Settings, ComeInTheOrderOfTheTree) {
  world.bmc().nic("bmc0").host().nic("eth1").nic("eth0").install();
  std::vector<std::string> ids;
  for (const Path& path : paths()) ids.push_back(path["InstanceID"].text());
  EXPECT_THAT(ids, ElementsAre("BMC%bmc0", "Computer%eth1", "Computer%eth0"));
}

TEST_F(Settings, FileWithoutServersLeavesThemOutEvenIfTheNodeHasThem) {
  world.nic("eth0", usualNic()).install().file("eth0", "DNSSERVERS=\n");
  EXPECT_FALSE(instances().at(0).has("DNSServerAddresses"));
}

TEST_F(Settings, MissingFileCostsTheConfigurationNameAlone) {
  world.nic("eth0", usualNic()).install();
  const Instance instance = instances().at(0);
  EXPECT_EQ(chars(""), instance["ConfigurationName"]);
  EXPECT_EQ(chars("example.org"), instance["DomainName"]);
  EXPECT_EQ(chars("host1"), instance["RequestedHostname"]);
  EXPECT_EQ(texts({"192.0.2.53"}), instance["DNSServerAddresses"]);
}

TEST(SettingNames, AreCountedInSixteenBits) {
  World world;
  for (int i = 0; i < 65536 + 2; ++i) world.nic(std::to_string(i));
  world.install();
  RecordingBroker broker;
  broker.keepsLines = false;
  InstanceProvider provider(DNSSettingDataProvider_Create_InstanceMI, broker);
  EXPECT_THAT(provider.enumerateInstanceNames(Path(kSettingClass)).paths(), SizeIs(2));
}

}  // namespace
}  // namespace ZV::Test
