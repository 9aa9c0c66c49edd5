// Changes that go through systemd-networkd.
#include <gtest/gtest.h>
#include <net/if.h>

#include <chrono>
#include <thread>

#include "agent/apply/testing/ApplyHost.h"
#include "agent/testing/DnsListeners.h"
#include "agent/testing/FakeDaemon.h"

namespace zorva::agent {
namespace {

using namespace testing;

constexpr const char* kLan = "/etc/systemd/network/10-lan.network";
constexpr const char* kLanDropIn = "/etc/systemd/network/10-lan.network.d/50-zorva.conf";
constexpr const char* kLanBefore = "192.0.2.53 2001:db8::53 /lan.example ";

// A file of all that this host's systemd-networkd has for its links.
std::string filesOfNetworkd() {
  return outputOf("cd /etc/systemd/network && find . -type f | sort | xargs tail -n +1");
}

struct NetworkdHost : ApplyHost {
  NetworkdHost() {
    writeFile("/etc/resolv.conf", "nameserver 203.0.113.1\n");
    writeFile(kLan,
              "[Match]\nName=eth0\n[Network]\nAddress=192.0.2.10/24\nDNS=192.0.2.53 2001:db8::53\n"
              "Domains=lan.example ~corp.example\n");
    writeFile("/etc/systemd/network/20-vpn.network",
              "[Match]\nName=tun1\n[Network]\nAddress=198.51.100.10/24\nDNS=198.51.100.53\nDomains=vpn.example\n");
  }

  void start(bool withResolved = false) {
    if (withResolved) daemons.start("systemd-resolved");
    daemons.start("systemd-networkd");
    expectShown("eth0", kLanBefore);
  }

  // A daemon may take a moment.
  static void expectShown(const std::string& interface, const std::string& expected) {
    constexpr int kTurns = 250;
    for (int turn = 0; turn < kTurns && shown(interface) != expected; ++turn) {
      std::this_thread::sleep_for(std::chrono::milliseconds(20));
    }
    EXPECT_EQ(shown(interface), expected);
  }

  Daemons daemons;
};

bool onNetworkdHost(const std::function<void(NetworkdHost&)>& work) {
  return succeedsOnHostWithDaemons([&] {
    NetworkdHost host;
    work(host);
    return true;
  });
}

class NetworkdChange : public ::testing::TestWithParam<bool> {};

INSTANTIATE_TEST_SUITE_P(With, NetworkdChange, ::testing::Values(false, true),
                         [](const auto& way) { return way.param ? "Resolved" : "NetworkdAlone"; });

TEST_P(NetworkdChange, IsShownLastsAndIsTakenBack) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onNetworkdHost([](NetworkdHost& host) {
    host.start(GetParam());
    const std::string before = filesOfNetworkd();
    host.want("eth0", "DNSSERVERS=192.0.2.99 fe80::5 2001:db8::53\nDNSSUFFIXES=new.example lan.example\n");
    host.want("tun1", "DNSSERVERS=198.51.100.99\n");
    const std::string changes =
        "eth0: dns_server_addresses 192.0.2.53 2001:db8::53 -> 192.0.2.99 fe80::5%eth0 2001:db8::53 \n"
        "eth0: dns_suffixes lan.example -> new.example lan.example \n"
        "eth0: domain_name lan.example -> new.example \n"
        "tun1: dns_server_addresses 198.51.100.53 -> 198.51.100.99 \n";
    ApplyOptions dry;
    dry.dryRun = true;
    EXPECT_EQ(host.apply({}, dry), changes);
    EXPECT_EQ(filesOfNetworkd(), before) << "a dry run only says what would change";

    EXPECT_EQ(host.apply(), changes);
    const std::string after = "192.0.2.99 fe80::5%eth0 2001:db8::53 /new.example lan.example ";
    EXPECT_EQ(host.shown("eth0"), after);
    EXPECT_EQ(host.shown("tun1"), "198.51.100.99 /vpn.example ");
    EXPECT_EQ(outputOf("networkctl --no-pager status eth0 | grep -c 'Route Domains: corp.example'"), "1\n");
    const std::string files = filesOfNetworkd();
    EXPECT_EQ(host.apply(), "eth0: nothing\ntun1: nothing\n");
    EXPECT_EQ(filesOfNetworkd(), files);

    host.daemons.stop("systemd-networkd");
    host.daemons.start("systemd-networkd");
    host.expectShown("eth0", after);

    EXPECT_EQ(host.revert({"eth0"}),
              "eth0: dns_server_addresses 192.0.2.99 fe80::5%eth0 2001:db8::53 -> 192.0.2.53 2001:db8::53 \n"
              "eth0: dns_suffixes new.example lan.example -> lan.example \n"
              "eth0: domain_name new.example -> lan.example \n");
    EXPECT_EQ(host.shown("eth0"), kLanBefore);
    EXPECT_EQ(host.shown("tun1"), "198.51.100.99 /vpn.example ");
    EXPECT_EQ(host.revert(), "tun1: dns_server_addresses 198.51.100.99 -> 198.51.100.53 \n");
    EXPECT_EQ(filesOfNetworkd(), before);
    EXPECT_FALSE(std::filesystem::exists("/etc/systemd/network/10-lan.network.d"));
    EXPECT_EQ(
        host.revert({"eth0", "eth9"}),
        "eth9: PROBLEM there is no interface eth9; 'zorvactl show --all' lists those that there are\neth0: nothing\n");
  }));
}

TEST(NetworkdWriter, PutsItsSettingsInPlaceOfLearnedOnesAndGivesThemBack) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onNetworkdHost([](NetworkdHost& host) {
    writeFile("/etc/systemd/network/05-far.network",
              "[Match]\nName=far0\n[Network]\nAddress=192.0.2.1/24\nDHCPServer=yes\n"
              "[DHCPServer]\nDNS=192.0.2.53\nSendOption=15:string:lease.example\n");
    writeFile(kLan, "[Match]\nName=eth0\n[Network]\nDHCP=ipv4\n[DHCPv4]\nUseDomains=yes\n");
    host.daemons.start("systemd-networkd");
    host.expectShown("eth0", "192.0.2.53 /lease.example ");
    host.want("eth0", "DNSSERVERS=192.0.2.99\nDOMAINNAME=mine.example\n");
    EXPECT_EQ(host.apply({"eth0"}),
              "eth0: dns_server_addresses 192.0.2.53 -> 192.0.2.99 \n"
              "eth0: dns_suffixes lease.example -> mine.example lease.example \n"
              "eth0: domain_name lease.example -> mine.example \n");
    host.want("eth0", "DNSSERVERS=192.0.2.99\nDOMAINNAME=other.example\n");
    EXPECT_EQ(host.apply({"eth0"}),
              "eth0: dns_suffixes mine.example lease.example -> other.example lease.example \n"
              "eth0: domain_name mine.example -> other.example \n")
        << "a domain that is replaced does not stay as a suffix";
    host.revert({"eth0"});
    host.expectShown("eth0", "192.0.2.53 /lease.example ");
  }));
}

TEST(NetworkdWriter, KeepsPortsAndNamesOfServersThatStay) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onNetworkdHost([](NetworkdHost& host) {
    writeFile(kLan,
              "[Match]\nName=eth0\n[Network]\nAddress=192.0.2.10/24\n"
              "DNS=192.0.2.53:5353#dns.example [2001:db8::53]:854 2001:db8::54#six.example\n");
    host.daemons.start("systemd-networkd");
    host.expectShown("eth0", "192.0.2.53 2001:db8::53 2001:db8::54 /");
    host.want("eth0", "DNSSERVERS=2001:db8::54 192.0.2.99 2001:db8::53 192.0.2.53\n");
    host.apply();
    const auto tree = currentTree();
    const StringList* servers = tree->find("/system/eth0/ip")->list(kDnsServersInFull);
    ASSERT_NE(servers, nullptr);
    EXPECT_EQ(*servers, (StringList{"2001:db8::54#six.example", "192.0.2.99", "[2001:db8::53]:854",
                                    "192.0.2.53:5353#dns.example"}));
  }));
}

TEST(NetworkdWriter, ReplacesWhatResolvectlHasSet) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onNetworkdHost([](NetworkdHost& host) {
    host.start(true);
    outputOf("resolvectl dns eth0 192.0.2.77");
    host.expectShown("eth0", "192.0.2.77 /lan.example ");
    host.want("eth0", "DNSSERVERS=192.0.2.99\n");
    EXPECT_EQ(host.apply(), "eth0: dns_server_addresses 192.0.2.77 -> 192.0.2.99 \n");
  }));
}

TEST(NetworkdWriter, RefusesAFileThatOtherInterfacesHaveToo) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onNetworkdHost([](NetworkdHost& host) {
    writeFile(kLan, "[Match]\nName=eth0 far0\n[Network]\nDNS=192.0.2.53\n");
    host.daemons.start("systemd-networkd");
    host.expectShown("eth0", "192.0.2.53 /");
    host.want("eth0", "DNSSERVERS=192.0.2.99\n");
    EXPECT_EQ(host.apply(), std::string("eth0: PROBLEM ") + kLan +
                                " is the file of far0 too; give eth0 a file of its own in /etc/systemd/network\n");
    host.want("far0", "DNSSERVERS=192.0.2.99\n");
    EXPECT_EQ(host.apply(),
              "far0: dns_server_addresses 192.0.2.53 -> 192.0.2.99 \n"
              "eth0: dns_server_addresses 192.0.2.53 -> 192.0.2.99 \n")
        << "they agree";
  }));
}

TEST(NetworkdWriter, WhatIsNotTakenIsNamedAndPutBack) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onNetworkdHost([](NetworkdHost& host) {
    writeFile("/etc/systemd/network/10-lan.network.d/90-mine.conf", "[Network]\nDNS=\nDNS=192.0.2.66\n");
    host.daemons.start("systemd-networkd");
    host.expectShown("eth0", "192.0.2.66 /lan.example ");
    const std::string before = filesOfNetworkd();
    host.want("eth0", "DNSSERVERS=192.0.2.99\nDNSSUFFIXES=new.example\n");
    EXPECT_EQ(host.apply(),
              "eth0: PROBLEM systemd-networkd did not take dns_server_addresses (it has 192.0.2.66, not 192.0.2.99); "
              "see what else sets it there, and apply again; eth0 is as it was before\n");
    EXPECT_EQ(filesOfNetworkd(), before);
    host.expectShown("eth0", "192.0.2.66 /lan.example ");
    EXPECT_EQ(host.revert(), "") << "nothing was changed, and nothing is remembered";
  }));
}

TEST(NetworkdWriter, AReloadThatIsRefusedLeavesTheFilesAsTheyWere) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onNetworkdHost([](NetworkdHost& host) {
    const unsigned int index = ::if_nametoindex("eth0");
    const FakeDaemon fake("org.freedesktop.network1", [&](sd_bus_message* answer, const std::string& method) {
      const std::string links = "{\"Interfaces\":[{\"Index\":" + std::to_string(index) +
                                ",\"Name\":\"eth0\",\"NetworkFile\":\"" + kLan + "\"}]}";
      return method == "Describe" ? ::sd_bus_message_append(answer, "s", links.c_str()) : -1;
    });
    const std::string before = filesOfNetworkd();
    host.want("eth0", "DNSSERVERS=192.0.2.99\n");
    EXPECT_EQ(host.apply(),
              "eth0: PROBLEM systemd-networkd: Reload is refused: it does not want to; 'journalctl --unit "
              "systemd-networkd' may say more; see to that, and apply again\n");
    EXPECT_EQ(filesOfNetworkd(), before);
    EXPECT_EQ(host.revert(), "");
  }));
}

TEST(NetworkdWriter, AFileOutsideOfItsDirectoriesIsRefused) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onNetworkdHost([](NetworkdHost& host) {
    const unsigned int index = ::if_nametoindex("eth0");
    for (const std::string file : {"/etc/passwd", "/etc/systemd/network/../../passwd.network",
                                   "/etc/systemd/network/.network", "/etc/systemd/network/x"}) {
      const FakeDaemon fake("org.freedesktop.network1", [&](sd_bus_message* answer, const std::string& method) {
        const std::string links = "{\"Interfaces\":[{\"Index\":" + std::to_string(index) +
                                  ",\"Name\":\"eth0\",\"NetworkFile\":\"" + file + "\"}]}";
        return method == "Describe" ? ::sd_bus_message_append(answer, "s", links.c_str()) : 0;
      });
      host.want("eth0", "DNSSERVERS=192.0.2.99\n");
      EXPECT_EQ(host.apply(), "eth0: PROBLEM systemd-networkd has eth0 from '" + file +
                                  "', which is no .network file that a drop-in can be put beside\n");
    }
  }));
}

TEST(NetworkdWriter, AReadOnlyFileSystemIsReported) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onNetworkdHost([](NetworkdHost& host) {
    host.start();
    outputOf("mount --bind /etc /etc && mount -o remount,ro,bind /etc");
    host.want("eth0", "DNSSERVERS=192.0.2.99\n");
    EXPECT_EQ(host.apply(),
              "eth0: PROBLEM systemd-networkd needs a drop-in: /etc/systemd/network/10-lan.network.d/: cannot be made: "
              "Read-only file system; see to that, and apply again\n");
    host.expectShown("eth0", kLanBefore);
  }));
}

TEST(NetworkdWriter, ADaemonThatDoesNotAnswerIsNotPassedOver) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onNetworkdHost([](NetworkdHost& host) {
    host.start();
    host.want("eth0", "DNSSERVERS=192.0.2.99\n");
    const std::string before = filesOfNetworkd();
    host.daemons.freeze("systemd-networkd");
    EXPECT_EQ(host.apply(),
              "eth0: PROBLEM systemd-networkd does not answer, so who owns the DNS settings of eth0 is not known; try "
              "again when it does, or stop it\n");
    EXPECT_EQ(filesOfNetworkd(), before);
    EXPECT_EQ(contentsOf("/etc/resolv.conf"), "nameserver 203.0.113.1\n");
    host.daemons.thaw("systemd-networkd");
    EXPECT_EQ(host.apply(), "eth0: dns_server_addresses 192.0.2.53 2001:db8::53 -> 192.0.2.99 \n");
  }));
}

TEST(NetworkdWriter, TheCLibraryAsksTheServerThatWasSet) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onNetworkdHost([](NetworkdHost& host) {
    for (const char* server : {"192.0.2.53", "192.0.2.99"}) host.interfaces.addAddress("lo", server, 32);
    writeFile("/etc/nsswitch.conf", "hosts: dns\n");
    host.start(true);
    writeFile("/etc/resolv.conf", "nameserver 127.0.0.53\n");
    host.want("eth0", "DNSSERVERS=192.0.2.99\n");
    const auto askedFor = [](const std::string& name) {
      DnsListeners listeners({"192.0.2.53", "192.0.2.99"}, DnsListeners::kNoSuchName);
      listeners.lookUp(name);
      return listeners.asked;
    };
    EXPECT_EQ(askedFor("before.lan.example."), StringList{"192.0.2.53"});
    host.apply();
    EXPECT_EQ(askedFor("after.lan.example."), StringList{"192.0.2.99"});
    host.revert();
    EXPECT_EQ(askedFor("again.lan.example."), StringList{"192.0.2.53"});
  }));
}

// What is in a drop-in is all of it, and the state before the first change is known.
TEST(NetworkdWriter, AProcessThatIsKilledLeavesTheOldStateOrTheNewOne) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onNetworkdHost([](NetworkdHost& host) {
    host.start();
    const std::string before = filesOfNetworkd();
    host.want("eth0", "DNSSERVERS=192.0.2.99\n");
    host.apply();
    const std::string after = filesOfNetworkd();
    host.revert();
    EXPECT_EQ(filesOfNetworkd(), before);
    constexpr int kDeaths = 16;
    for (int death = 0; death < kDeaths; ++death) {
      killAfter(std::chrono::milliseconds(5 * death), [] { ApplyHost::apply(); });
      const std::string left = filesOfNetworkd();
      EXPECT_TRUE(left == before || left == after) << left;
      host.revert();
      EXPECT_EQ(filesOfNetworkd(), before);
      host.expectShown("eth0", kLanBefore);
    }
  }));
}

}  // namespace
}  // namespace zorva::agent
