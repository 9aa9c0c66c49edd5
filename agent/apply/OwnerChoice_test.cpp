// Through whom a change goes while an owner is restarted, after it has left for good, and how it is taken back then.
#include "agent/apply/OwnerChoice.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <net/if.h>

#include <array>
#include <filesystem>
#include <utility>

#include "agent/apply/OwnerDoubts.h"
#include "agent/apply/testing/ApplyHost.h"
#include "agent/testing/FakeDaemon.h"

namespace zorva::agent {
namespace {

using namespace testing;
using ::testing::HasSubstr;
using ::testing::Not;

class ChoiceOfOwner : public PrivateHostTest {};

constexpr const char* kSocket = "/run/dbus/system_bus_socket";
constexpr const char* kNetworkd = "systemd-networkd";
constexpr const char* kManager = "NetworkManager";
constexpr const char* kHasRun = "/run/systemd/netif/state";
constexpr const char* kLan = "/etc/systemd/network/10-lan.network";
constexpr int kIndex = 7;

/// What is doubted of an owner of eth0: "starting", "unclear", "stopped", or "nothing".
std::string doubtAbout(const char* owner, bool runs) {
  BusCalls bus(kSocket);
  Link link;
  link.name = "eth0";
  link.index = kIndex;
  const auto doubt = OwnerDoubts(bus, "").about(owner, link, runs);
  if (!doubt) return "nothing";
  EXPECT_THAT(doubt->refusal, HasSubstr(owner));
  EXPECT_THAT(doubt->refusal, HasSubstr("eth0"));
  return doubt->kind == OwnerDoubt::Kind::Starting  ? "starting"
         : doubt->kind == OwnerDoubt::Kind::Unclear ? "unclear"
                                                    : "stopped";
}

/// A service manager with one unit.
struct FakeUnit {
  const char* state;
  const char* file;
  unsigned int job = 0;

  FakeDaemon run() const {
    return {"org.freedesktop.systemd1", [this](sd_bus_message* answer, const std::string& method) {
              if (method == "LoadUnit") return ::sd_bus_message_append(answer, "o", "/unit");
              return ::sd_bus_message_append(answer, "a{sv}", 3, "ActiveState", "s", state, "UnitFileState", "s", file,
                                             "Job", "(uo)", job, "/job");
            }};
  }
};

bool itsServiceTells() {
  const Daemons daemons;
  struct Case {
    FakeUnit unit;
    const char* never;   ///< the doubt where it has not run since the host started
    const char* hasRun;  ///< and where it has
  };
  constexpr std::array kCases{Case{{"activating", "disabled"}, "starting", "starting"},
                              Case{{"deactivating", "enabled"}, "starting", "starting"},
                              Case{{"active", "enabled"}, "starting", "starting"},
                              Case{{"inactive", "disabled", 5}, "starting", "starting"},
                              Case{{"inactive", "enabled"}, "nothing", "stopped"},
                              Case{{"failed", "enabled-runtime"}, "nothing", "stopped"},
                              Case{{"inactive", "disabled"}, "nothing", "nothing"},
                              Case{{"inactive", ""}, "nothing", "nothing"}};
  for (const Case& one : kCases) {
    const FakeDaemon manager = one.unit.run();
    std::filesystem::remove(kHasRun);
    EXPECT_EQ(doubtAbout(kNetworkd, false), one.never) << one.unit.state << one.unit.file;
    writeFile(kHasRun, "");
    EXPECT_EQ(doubtAbout(kNetworkd, false), one.hasRun) << one.unit.state << one.unit.file;
  }
  return true;
}

TEST_F(ChoiceOfOwner, AsksTheServiceManagerAboutAnAbsentOwner) {
  EXPECT_TRUE(succeedsOnHostWithDaemons(itsServiceTells));
}

bool itsFilesTell() {
  const Daemons daemons;
  EXPECT_EQ(doubtAbout(kNetworkd, false), "nothing");
  writeFile(kHasRun, "");
  EXPECT_EQ(doubtAbout(kNetworkd, false), "unclear");
  EXPECT_EQ(doubtAbout("systemd-resolved", false), "nothing");
  writeFile("/run/systemd/resolve/resolv.conf", "");
  EXPECT_EQ(doubtAbout("systemd-resolved", false), "unclear");
  EXPECT_EQ(doubtAbout(kManager, false), "nothing");
  writeFile("/run/NetworkManager/devices/7", "[device]\nmanaged=false\n");
  EXPECT_EQ(doubtAbout(kManager, false), "nothing");
  writeFile("/run/NetworkManager/devices/7", "[device]\nmanaged=true\n");
  EXPECT_EQ(doubtAbout(kManager, false), "unclear");
  return true;
}

TEST_F(ChoiceOfOwner, LooksAtTheFilesOfAnAbsentOwnerWithoutAServiceManager) {
  EXPECT_TRUE(succeedsOnHostWithDaemons(itsFilesTell));
}

bool networkdTells() {
  const Daemons daemons;
  EXPECT_EQ(doubtAbout(kNetworkd, true), "starting") << "it has ended since";
  {
    const FakeDaemon fake("org.freedesktop.network1", [](sd_bus_message* answer, const std::string& method) {
      return method == "GetAll" ? ::sd_bus_message_append(answer, "a{sv}", 0) : -1;
    });
    EXPECT_EQ(doubtAbout(kNetworkd, true), "nothing") << "it does not know the link";
  }
  const std::pair<const char*, const char*> cases[] = {
      {"pending", "starting"}, {"initialized", "starting"}, {"unmanaged", "nothing"}, {"configured", "unclear"}};
  for (const auto& [state, doubt] : cases) {
    const FakeDaemon fake("org.freedesktop.network1", [&](sd_bus_message* answer, const std::string& method) {
      if (method == "GetLinkByIndex") return ::sd_bus_message_append(answer, "so", "eth0", "/link");
      return ::sd_bus_message_append(answer, "a{sv}", 1, "AdministrativeState", "s", state);
    });
    EXPECT_EQ(doubtAbout(kNetworkd, true), doubt) << state;
  }
  return true;
}

TEST_F(ChoiceOfOwner, AsksNetworkdWhetherItHasLookedAtTheLink) {
  EXPECT_TRUE(succeedsOnHostWithDaemons(networkdTells));
}

bool networkManagerTells() {
  const Daemons daemons;
  EXPECT_EQ(doubtAbout(kManager, true), "starting") << "it has ended since";
  struct Case {
    int startup;
    int managed;
    const char* active;
    unsigned int flags;
    const char* doubt;
  };
  constexpr unsigned int kExternal = 0x80;
  constexpr std::array kCases{Case{1, 1, "/", 0, "starting"}, Case{1, 0, "/", 0, "nothing"},
                              Case{0, 1, "/", 0, "nothing"}, Case{0, 1, "/active", 0, "unclear"},
                              Case{0, 1, "/active", kExternal, "nothing"}};
  for (const Case& one : kCases) {
    const FakeDaemon fake("org.freedesktop.NetworkManager", [&](sd_bus_message* answer, const std::string& method) {
      if (method == "GetDeviceByIpIface") return ::sd_bus_message_append(answer, "o", "/device");
      return ::sd_bus_message_append(answer, "a{sv}", 4, "Startup", "b", one.startup, "Managed", "b", one.managed,
                                     "ActiveConnection", "o", one.active, "StateFlags", "u", one.flags);
    });
    EXPECT_EQ(doubtAbout(kManager, true), one.doubt) << one.startup << one.managed << one.active;
  }
  return true;
}

TEST_F(ChoiceOfOwner, AsksNetworkManagerWhetherItHasLookedAtTheDevice) {
  EXPECT_TRUE(succeedsOnHostWithDaemons(networkManagerTells));
}

bool onHostWithNetworkd(const std::function<void(ApplyHost&, Daemons&)>& work) {
  return succeedsOnHostWithDaemons([&] {
    writeFile("/etc/resolv.conf", "nameserver 203.0.113.1\n");
    writeFile(kLan, "[Match]\nName=eth0\n[Network]\nDNS=192.0.2.53\n");
    ApplyHost host;
    host.want("eth0", "DNSSERVERS=192.0.2.1\n");
    Daemons daemons;
    daemons.start("systemd-resolved");
    work(host, daemons);
    return true;
  });
}

bool showsSoon(const std::string& settings) {
  for (int turn = 0; turn < 200; ++turn) {
    if (ApplyHost::shown("eth0") == settings) return true;
    std::this_thread::sleep_for(std::chrono::milliseconds(50));
  }
  return false;
}

TEST_F(ChoiceOfOwner, RefusesToPassOverAnOwnerThatIsOnlyStopped) {
  EXPECT_TRUE(onHostWithNetworkd([](ApplyHost& host, Daemons& daemons) {
    daemons.start(kNetworkd);
    EXPECT_TRUE(showsSoon("192.0.2.53 /"));
    daemons.stop(kNetworkd);
    const FakeUnit unit{"inactive", "enabled"};
    const FakeDaemon manager = unit.run();
    EXPECT_EQ(host.apply(),
              "eth0: PROBLEM systemd-networkd may own the DNS settings of eth0 and does not run; 'systemctl start "
              "systemd-networkd' starts it, or 'systemctl disable --now systemd-networkd' leaves eth0 to others\n");
    EXPECT_FALSE(std::filesystem::exists("/var/lib/zorvagent/applied/state.json"));
  }));
}

TEST_F(ChoiceOfOwner, GoesToTheNextOwnerWhereTheFormerOneIsDisabled) {
  EXPECT_TRUE(onHostWithNetworkd([](ApplyHost& host, Daemons& daemons) {
    daemons.start(kNetworkd);
    EXPECT_TRUE(showsSoon("192.0.2.53 /"));
    host.apply();
    daemons.stop(kNetworkd);
    const FakeUnit unit{"inactive", "disabled"};
    const FakeDaemon manager = unit.run();
    host.apply();
    EXPECT_THAT(outputOf("resolvectl dns eth0"), HasSubstr(": 192.0.2.1\n"));
    const auto results = revertSettings({});
    EXPECT_THAT(ApplyHost::linesOf(results), Not(HasSubstr("PROBLEM")));
    EXPECT_THAT(results.front().note, HasSubstr("systemd-networkd has its settings of before, which are not in use"));
    EXPECT_FALSE(std::filesystem::exists("/etc/systemd/network/10-lan.network.d"));
    EXPECT_EQ(host.revert(), "");
  }));
}

TEST_F(ChoiceOfOwner, TakesBackFromAnOwnerThatHasLostTheInterface) {
  EXPECT_TRUE(onHostWithNetworkd([](ApplyHost& host, Daemons& daemons) {
    EXPECT_EQ(host.apply(), "eth0: dns_server_addresses -> 192.0.2.1 \n");
    daemons.start(kNetworkd);
    EXPECT_TRUE(showsSoon("192.0.2.53 /"));
    const auto results = revertSettings({});
    ASSERT_EQ(results.size(), 1U);
    EXPECT_EQ(results.front().problem, "");
    EXPECT_EQ(results.front().note,
              "systemd-networkd (/etc/systemd/network/10-lan.network) has eth0 now; nothing is left of what "
              "systemd-resolved was given");
    EXPECT_EQ(ApplyHost::shown("eth0"), "192.0.2.53 /");
    EXPECT_EQ(host.revert(), "");
  }));
}

TEST_F(ChoiceOfOwner, TakesBackTheFileOfTheHostAfterAnOwnerHasCome) {
  EXPECT_TRUE(onHostWithNetworkd([](ApplyHost& host, Daemons& daemons) {
    daemons.stop("systemd-resolved");
    std::filesystem::remove_all("/run/systemd/resolve");
    EXPECT_EQ(host.apply(), "eth0: dns_server_addresses 203.0.113.1 -> 192.0.2.1 \n");
    daemons.start(kNetworkd);
    EXPECT_TRUE(showsSoon("192.0.2.53 /"));
    EXPECT_EQ(host.revert(), "eth0: nothing\n");
    EXPECT_EQ(contentsOf("/etc/resolv.conf"), "nameserver 203.0.113.1\n");
    EXPECT_EQ(host.revert(), "");
  }));
}

// It has the new settings in use, and the old ones on the disk.
TEST_F(ChoiceOfOwner, IsRememberedWhereItMayHaveTakenWhatFailed) {
  EXPECT_TRUE(onHostWithNetworkd([](ApplyHost& host, Daemons&) {
    const std::string index = std::to_string(::if_nametoindex("eth0"));
    std::filesystem::create_directories("/run/systemd/netif/links");
    int lastByte = 53;
    const FakeDaemon fake("org.freedesktop.network1", [&](sd_bus_message* answer, const std::string& method) {
      if (method == "Reload") {
        lastByte = 1;
        writeFile("/run/systemd/netif/links/" + index, "");
      }
      const std::string links = "{\"Interfaces\":[{\"Index\":" + index + ",\"Name\":\"eth0\",\"NetworkFile\":\"" +
                                kLan + "\",\"DNS\":[{\"Family\":2,\"Address\":[192,0,2," + std::to_string(lastByte) +
                                "]}]}]}";
      return method == "Describe" ? ::sd_bus_message_append(answer, "s", links.c_str()) : -1;
    });
    EXPECT_EQ(host.apply(),
              "eth0: PROBLEM systemd-networkd: Reload is refused: it does not want to; 'journalctl --unit "
              "systemd-networkd' may say more; see to that, and apply again; 'zorvactl revert eth0' takes back "
              "what may have been changed\n");
    EXPECT_FALSE(std::filesystem::exists(kLan + std::string(".d/50-zorva.conf")));
    EXPECT_THAT(host.revert(), HasSubstr("PROBLEM")) << "it is not forgotten";
  }));
}

}  // namespace
}  // namespace zorva::agent
