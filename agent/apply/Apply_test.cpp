// What holds for changes of every owner: trials, refusals, the state that is remembered, and changes that reach the
// host at once.
#include "agent/apply/Apply.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include "agent/apply/AppliedState.h"
#include "agent/apply/testing/ApplyHost.h"
#include "agent/files/FileLock.h"
#include "agent/interface/Instrumentation.h"
#include "agent/testing/LogLines.h"

namespace zorva::agent {
namespace {

using namespace testing;
using namespace ZV::NodeLexicon;
using std::chrono::seconds;
using ::testing::HasSubstr;

constexpr const char* kFile = "/etc/resolv.conf";
constexpr const char* kState = "/var/lib/zorvagent/applied/state.json";
constexpr const char* kBefore = "nameserver 203.0.113.1\n";
constexpr const char* kFirst = "nameserver 192.0.2.1\n";
constexpr const char* kSecond = "nameserver 192.0.2.2\n";

bool onHostWithDaemons(const std::function<void(ApplyHost&)>& work) {
  return succeedsOnHostWithDaemons([&] {
    writeFile(kFile, kBefore);
    ApplyHost host;
    work(host);
    return true;
  });
}

ApplyOptions onTrial(seconds length) {
  ApplyOptions options;
  options.trial = length;
  return options;
}

void applyFirst(const ApplyHost& host) {
  host.want("eth0", "DNSSERVERS=192.0.2.1\n");
  host.apply();
  EXPECT_EQ(contentsOf(kFile), kFirst);
}

std::string problemOf(const std::function<void()>& work) {
  try {
    work();
    return "nothing";
  } catch (const std::exception& error) {
    return error.what();
  }
}

TEST(Trial, ThatEndsIsTakenBackByAnyProcess) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onPlainHost(kBefore, [](ApplyHost& host) {
    EXPECT_FALSE(pendingTrial().has_value());
    EXPECT_TRUE(endTrial().empty());
    host.want("eth0", "DNSSERVERS=192.0.2.1\n");
    EXPECT_TRUE(succeedsInChild([&] {
      host.apply({}, onTrial(seconds(60)));
      return contentsOf(kFile) == kFirst;
    }));
    ASSERT_TRUE(pendingTrial().has_value());
    const auto left = *pendingTrial() - std::chrono::system_clock::now();
    EXPECT_GT(left, seconds(30));
    EXPECT_LE(left, seconds(60));
    EXPECT_EQ(ApplyHost::linesOf(endTrial()), "eth0: dns_server_addresses 192.0.2.1 -> 203.0.113.1 \n");
    EXPECT_EQ(contentsOf(kFile), kBefore);
    EXPECT_FALSE(pendingTrial().has_value());
    EXPECT_EQ(host.revert(), "") << "nothing was changed in the end";
  }));
}

TEST(Trial, ThatIsConfirmedStaysAndCanBeReverted) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onPlainHost(kBefore, [](ApplyHost& host) {
    host.want("eth0", "DNSSERVERS=192.0.2.1\n");
    host.apply({}, onTrial(seconds(60)));
    confirmTrial();
    EXPECT_FALSE(pendingTrial().has_value());
    EXPECT_TRUE(endTrial().empty());
    EXPECT_EQ(contentsOf(kFile), kFirst);
    host.revert();
    EXPECT_EQ(contentsOf(kFile), kBefore);
  }));
}

TEST(Trial, GoesBackToWhatWasAppliedBeforeIt) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onPlainHost(kBefore, [](ApplyHost& host) {
    applyFirst(host);
    host.want("eth0", "DNSSERVERS=192.0.2.2\n");
    host.apply({}, onTrial(seconds(60)));
    EXPECT_EQ(contentsOf(kFile), kSecond);
    endTrial();
    EXPECT_EQ(contentsOf(kFile), kFirst);
    host.revert();
    EXPECT_EQ(contentsOf(kFile), kBefore);
  }));
}

TEST(Trial, OfARevertGoesBackToWhatWasAppliedAndCanBeRevertedAgain) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onPlainHost(kBefore, [](ApplyHost& host) {
    applyFirst(host);
    EXPECT_EQ(host.revert({}, onTrial(seconds(60))), "eth0: dns_server_addresses 192.0.2.1 -> 203.0.113.1 \n");
    EXPECT_EQ(contentsOf(kFile), kBefore);
    endTrial();
    EXPECT_EQ(contentsOf(kFile), kFirst);
    host.revert();
    EXPECT_EQ(contentsOf(kFile), kBefore);
  }));
}

TEST(Trial, StopsOtherChangesWhileItRunsAndIsTakenBackByTheNextOneAfterItsEnd) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onPlainHost(kBefore, [](ApplyHost& host) {
    host.want("eth0", "DNSSERVERS=192.0.2.1\n");
    host.apply({}, onTrial(seconds(60)));
    const std::string problem = "a trial has not been confirmed; confirm it, or wait until it ends";
    EXPECT_EQ(problemOf([&] { host.apply(); }), problem);
    EXPECT_EQ(problemOf([&] { host.revert(); }), problem);
    endTrial();
    host.apply({}, onTrial(seconds(0)));
    EXPECT_EQ(contentsOf(kFile), kFirst);
    host.want("eth0", "DNSSERVERS=192.0.2.2\n");
    EXPECT_EQ(host.apply(), "eth0: dns_server_addresses 203.0.113.1 -> 192.0.2.2 \n");
    EXPECT_FALSE(pendingTrial().has_value());
    host.revert();
    EXPECT_EQ(contentsOf(kFile), kBefore);
  }));
}

TEST(Trial, OfNothingIsNone) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onPlainHost(kBefore, [](ApplyHost& host) {
    applyFirst(host);
    EXPECT_EQ(host.apply({}, onTrial(seconds(60))), "eth0: nothing\n");
    EXPECT_FALSE(pendingTrial().has_value());
  }));
}

TEST(Trial, ThatCannotBeTakenBackIsTriedAgain) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onPlainHost(kBefore, [](ApplyHost& host) {
    host.want("eth0", "DNSSERVERS=192.0.2.1\n");
    host.apply({}, onTrial(seconds(60)));
    outputOf("mount --bind /etc /etc && mount -o remount,ro,bind /etc");
    EXPECT_EQ(
        ApplyHost::linesOf(endTrial()),
        "eth0: PROBLEM /etc/resolv.conf.new: cannot be opened: Read-only file system; see to that, and apply again\n");
    EXPECT_TRUE(pendingTrial().has_value());
    outputOf("umount /etc");
    endTrial();
    EXPECT_EQ(contentsOf(kFile), kBefore);
    EXPECT_FALSE(pendingTrial().has_value());
  }));
}

TEST(AppliedState, OfAnotherUserOrOfAnotherShapeIsNotUsed) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onPlainHost(kBefore, [](ApplyHost& host) {
    applyFirst(host);
    const auto problem = [&] { return problemOf([&] { host.revert(); }); };
    outputOf(std::string("chown 65534 ") + kState);
    EXPECT_EQ(problem(), std::string(kState) + ": belongs to user 65534 and is not trusted; remove it");
    outputOf(std::string("chown 0 ") + kState + "; chmod 666 " + kState);
    EXPECT_EQ(problem(), std::string(kState) + ": can be written by other users and is not trusted; remove it");
    outputOf(std::string("chmod 644 ") + kState);
    for (const char* text : {"{\"first\": 7, \"added_domains\": {}}", "[]", "{\"first\": [{}], \"added_domains\": {}}",
                             "{\"first\": [], \"added_domains\": {\"eth0\": 7}}",
                             "{\"first\": [], \"added_domains\": {}, \"trial\": {}}", "{"}) {
      writeFile(kState, text);
      EXPECT_TRUE(problem().starts_with(kState)) << text << problem();
    }
    EXPECT_EQ(contentsOf(kFile), kFirst);
  }));
}

TEST(Refused, AreNamesWithoutAnInterfaceAndTheLoopbackInterface) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onPlainHost(kBefore, [](ApplyHost& host) {
    host.want("eth0", "DNSSERVERS=192.0.2.1\n");
    host.want("lo", "DNSSERVERS=192.0.2.1\n");
    host.want("gone0", "DNSSERVERS=192.0.2.1\n");
    EXPECT_EQ(host.apply({"eth0", "gone0", "lo", "a\nb", "gone0"}),
              "gone0: PROBLEM there is no interface gone0; 'zorvactl show --all' lists those that there are\n"
              "lo: PROBLEM lo is the loopback interface, which has no DNS settings of its own; name another one, "
              "'zorvactl show --all' lists them\n"
              "a\nb: PROBLEM there is no interface a\\nb; 'zorvactl show --all' lists those that there are\n"
              "eth0: dns_server_addresses 203.0.113.1 -> 192.0.2.1 \n");
    EXPECT_EQ(host.apply(), "eth0: nothing\n") << "files of interfaces that are gone are no reason to fail";
  }));
}

TEST(Refused, AreHostileValuesWithTheWholeInterface) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onPlainHost(kBefore, [](ApplyHost& host) {
    host.want("eth0", "DNSSERVERS=192.0.2.1\nDNSSUFFIXES=good.example ba/d\n");
    EXPECT_EQ(host.apply(), "eth0: PROBLEM dns_suffixes: 'ba/d' is no DNS name\n");
    EXPECT_EQ(contentsOf(kFile), kBefore);
    EXPECT_FALSE(std::filesystem::exists(kState));
  }));
}

TEST(Refused, IsAnInterfaceThatNetworkManagerDoesNotManage) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onHostWithDaemons([](ApplyHost& host) {
    Daemons daemons;
    daemons.start("NetworkManager");
    host.want("eth0", "DNSSERVERS=192.0.2.1\n");
    outputOf("nmcli device set eth0 managed no");
    EXPECT_EQ(host.apply(),
              "eth0: PROBLEM eth0 is unmanaged by NetworkManager; 'nmcli device set eth0 managed yes' lets "
              "it manage the interface\n");
    outputOf("nmcli device set eth0 managed yes");
    EXPECT_EQ(host.apply(),
              "eth0: PROBLEM eth0 has no active profile of NetworkManager; 'nmcli connection add type ethernet ifname "
              "eth0' makes one, and 'nmcli device connect eth0' uses it\n");
    EXPECT_EQ(contentsOf(kFile).find("192.0.2.1"), std::string::npos);
  }));
}

TEST(Refused, IsAnInterfaceWithoutAnOwnerBesideOneThatHasOne) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onHostWithDaemons([](ApplyHost& host) {
    Daemons daemons;
    writeFile("/etc/systemd/network/20-vpn.network", "[Match]\nName=tun1\n[Network]\nDNS=198.51.100.53\n");
    daemons.start("systemd-networkd");
    host.want("eth0", "DNSSERVERS=192.0.2.1\n");
    EXPECT_EQ(host.apply(),
              "eth0: PROBLEM eth0 has no owner of DNS settings, while others do, and /etc/resolv.conf is that of the "
              "whole host; let NetworkManager or systemd-networkd manage eth0\n");
  }));
}

TEST(Refused, IsATreeOfAFile) {
  Config config;
  config.file = "/agent.toml";
  config.source = "file";
  setConfig(config);
  EXPECT_EQ(problemOf([] { applySettings({}); }),
            "/agent.toml: tree.source: is a file and no host: nothing can be applied to it");
  reset();
}

TEST(Automatically, NothingIsAppliedThatWasTakenBack) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onPlainHost(kBefore, [](ApplyHost& host) {
    ApplyOptions automatic;
    automatic.automatic = true;
    applyFirst(host);
    host.revert({"eth0"});
    EXPECT_THAT(applySettings({}, automatic).front().note, HasSubstr("'zorvactl apply eth0' applies them again"));
    EXPECT_EQ(contentsOf(kFile), kBefore);

    applyFirst(host);
    host.want("eth0", "DNSSERVERS=192.0.2.2\n");
    host.apply({}, onTrial(seconds(60)));
    EXPECT_EQ(contentsOf(kFile), kSecond);
    endTrial();
    host.apply({}, automatic);
    EXPECT_EQ(contentsOf(kFile), kFirst) << "what was on trial";
    host.want("eth0", "DNSSERVERS=192.0.2.2 192.0.2.3\n");
    host.apply({}, automatic);
    EXPECT_EQ(contentsOf(kFile), "nameserver 192.0.2.2\nnameserver 192.0.2.3\n") << "other settings than those";
  }));
}

TEST(StateOfWhatIsApplied, LiesWhereOnlyRootWritesAndTheServersGroupReads) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onPlainHost(kBefore, [](ApplyHost& host) {
    host.want("eth0", "DNSSERVERS=192.0.2.1\n");
    outputOf(
        "chown 65534:65533 /var/lib/zorvagent; mkdir /etc/elsewhere; ln -s /etc/elsewhere /var/lib/zorvagent/applied");
    EXPECT_THAT(problemOf([&] { host.apply(); }), HasSubstr("applied/: is no directory that only its owner, root"));
    outputOf("rm /var/lib/zorvagent/applied; mkdir /var/lib/zorvagent/applied; chown 65534 /var/lib/zorvagent/applied");
    EXPECT_THAT(problemOf([&] { host.apply(); }), HasSubstr("applied/: is no directory that only its owner, root"));
    EXPECT_EQ(contentsOf(kFile), kBefore);
    outputOf("rmdir /var/lib/zorvagent/applied");
    host.apply();
    EXPECT_EQ(outputOf("stat -c %u:%g%A /var/lib/zorvagent/applied /var/lib/zorvagent/applied/state.json"),
              "0:65533drwxr-xr-x\n0:65533-rw-r--r--\n");
  }));
}

TEST(Applying, WaitsForAnotherProcessThatApplies) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onPlainHost(kBefore, [](ApplyHost& host) {
    host.want("eth0", "DNSSERVERS=192.0.2.1\n");
    auto lock = std::make_unique<FileLock>(appliedDirectory("/var/lib/zorvagent/") + "lock");
    const pid_t child = startChild([&] { return host.apply() != ""; });
    std::this_thread::sleep_for(std::chrono::milliseconds(300));
    EXPECT_EQ(contentsOf(kFile), kBefore);
    lock.reset();
    EXPECT_TRUE(succeeded(child));
    EXPECT_EQ(contentsOf(kFile), kFirst);
  }));
}

bool setServers(const std::string& interface, const std::vector<std::string>& servers) {
  ZV::Instrumentation cursor;
  for (cursor.selectNode(NODE_NETWORK_IP_CONFIG); cursor; ++cursor) {
    std::string name;
    if (cursor.getProperty(PROP_NAME, name) && name == interface) {
      return cursor.setProperty(PROP_DNS_SERVER_ADDRESSES, servers);
    }
  }
  return false;
}

void applyToHost() {
  Config config;
  config.dataDir = "/var/lib/zorvagent/";
  config.appliesToHost = true;
  setConfig(config);
}

TEST(AValueThatIsSet, ReachesTheHostAtOnceWhereThatIsConfigured) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onPlainHost(kBefore, [](ApplyHost&) {
    EXPECT_TRUE(setServers("eth0", {"192.0.2.9"}));
    EXPECT_EQ(contentsOf(kFile), kBefore) << "the overlay is the default";
    applyToHost();
    EXPECT_TRUE(setServers("eth0", {"192.0.2.1"}));
    EXPECT_EQ(contentsOf(kFile), kFirst);
  }));
}

TEST(AValueThatIsSet, IsAFailureWhereTheHostRefusesIt) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onPlainHost(kBefore, [](ApplyHost&) {
    applyToHost();
    LogLines log;
    EXPECT_FALSE(setServers("eth0", {"224.0.0.1"}));
    ASSERT_EQ(log.lines.size(), 1U);
    EXPECT_EQ(log.lines.front(),
              "eth0: the value is stored, but not applied to the host: dns_server_addresses: '224.0.0.1' is no unicast "
              "address");
    EXPECT_EQ(ApplyHost::shown("eth0"), "224.0.0.1 /");
    EXPECT_EQ(contentsOf(kFile), kBefore);
  }));
}

TEST(AValueThatIsSet, IsOnlyStoredByAProcessWithoutTheRights) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onPlainHost(kBefore, [](ApplyHost&) {
    applyToHost();
    outputOf("chmod 777 /var/lib/zorvagent");
    constexpr uid_t kNobody = 65534;
    if (::seteuid(kNobody) != 0) return;
    EXPECT_TRUE(setServers("eth0", {"192.0.2.1"}));
    EXPECT_EQ(contentsOf(kFile), kBefore);
    EXPECT_EQ(::seteuid(0), 0);
    ApplyHost::apply();
    EXPECT_EQ(contentsOf(kFile), kFirst) << "what has the rights applies it";
  }));
}

}  // namespace
}  // namespace zorva::agent
