// Changes of a plain /etc/resolv.conf.
#include <gtest/gtest.h>
#include <sys/mount.h>
#include <unistd.h>

#include "agent/apply/testing/ApplyHost.h"
#include "agent/testing/DnsListeners.h"

namespace zorva::agent {
namespace {

using testing::ApplyHost;
using testing::contentsOf;
using testing::outputOf;
using testing::writeFile;

constexpr const char* kFile = "/etc/resolv.conf";
constexpr const char* kBefore =
    "# ours\noptions ndots:1 rotate\nnameserver 203.0.113.1\nnameserver 203.0.113.2\nsortlist 192.0.2.0\n"
    "domain old.example";

bool onPlainHost(const std::function<void(ApplyHost&)>& work) {
  return testing::succeedsOnPrivateHost([&] {
    writeFile(kFile, kBefore);
    ApplyHost host;
    work(host);
    return true;
  });
}

TEST(ResolvConfChange, KeepsOptionsCommentsAndOtherLines) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onPlainHost([](ApplyHost& host) {
    host.want("eth0", "DNSSERVERS=192.0.2.1 2001:db8::1\nDNSSUFFIXES=lab.example example.org\n");
    EXPECT_EQ(host.apply({"eth0"}),
              "eth0: dns_server_addresses 203.0.113.1 203.0.113.2 -> 192.0.2.1 2001:db8::1 \n"
              "eth0: dns_suffixes old.example -> lab.example example.org \n");
    EXPECT_EQ(contentsOf(kFile),
              "# ours\noptions ndots:1 rotate\nnameserver 192.0.2.1\nnameserver 2001:db8::1\nsortlist 192.0.2.0\n"
              "search lab.example example.org\n");
    EXPECT_EQ(host.shown("eth0"), "192.0.2.1 2001:db8::1 /lab.example example.org ");
  }));
}

TEST(ResolvConfChange, ASecondOneChangesNothing) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onPlainHost([](ApplyHost& host) {
    host.want("eth0", "DNSSERVERS=192.0.2.1\nDOMAINNAME=new.example\n");
    host.apply();
    const std::string first = outputOf("stat -c '%i %y' /etc/resolv.conf; cat /etc/resolv.conf");
    EXPECT_NE(first.find("search new.example old.example\n"), std::string::npos) << first;
    EXPECT_EQ(host.apply(), "eth0: nothing\n");
    EXPECT_EQ(outputOf("stat -c '%i %y' /etc/resolv.conf; cat /etc/resolv.conf"), first);
  }));
}

TEST(ResolvConfChange, ADryRunOnlySaysWhatWouldChange) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onPlainHost([](ApplyHost& host) {
    host.want("eth0", "DNSSERVERS=192.0.2.1\n");
    ApplyOptions dry;
    dry.dryRun = true;
    EXPECT_EQ(host.apply({}, dry), "eth0: dns_server_addresses 203.0.113.1 203.0.113.2 -> 192.0.2.1 \n");
    EXPECT_EQ(contentsOf(kFile), kBefore);
    EXPECT_EQ(outputOf("ls /var/lib/zorvagent"), "ifcfg-eth0\n");
  }));
}

TEST(ResolvConfChange, IsTakenBackToTheLastByte) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onPlainHost([](ApplyHost& host) {
    host.want("eth0", "DNSSERVERS=192.0.2.1\n");
    host.apply();
    host.want("eth0", "DNSSERVERS=192.0.2.2\n");
    host.apply();
    EXPECT_EQ(host.revert({"eth0"}), "eth0: dns_server_addresses 192.0.2.2 -> 203.0.113.1 203.0.113.2 \n");
    EXPECT_EQ(contentsOf(kFile), kBefore);
    EXPECT_EQ(host.revert({"eth0"}), "eth0: nothing\n");
    EXPECT_EQ(host.revert(), "");
  }));
}

TEST(ResolvConfChange, AFileThatWasNotThereIsRemovedAgain) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onPlainHost([](ApplyHost& host) {
    ::unlink(kFile);
    host.want("eth0", "DNSSERVERS=192.0.2.1\n");
    EXPECT_EQ(host.apply(), "eth0: dns_server_addresses 127.0.0.1 -> 192.0.2.1 \n");
    host.revert();
    EXPECT_NE(::access(kFile, F_OK), 0);
  }));
}

TEST(ResolvConfChange, IsRefusedWhereTwoInterfacesHaveDifferentLists) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onPlainHost([](ApplyHost& host) {
    host.want("eth0", "DNSSERVERS=192.0.2.1\n");
    host.want("tun1", "DNSSERVERS=192.0.2.9\n");
    const std::string result = host.apply();
    EXPECT_NE(result.find("eth0: PROBLEM /etc/resolv.conf is that of the whole host, and eth0 has other settings than "
                          "tun1; apply one of them by its name\n"),
              std::string::npos)
        << result;
    EXPECT_NE(result.find("tun1: PROBLEM /etc/resolv.conf is that of the whole host"), std::string::npos) << result;
    EXPECT_EQ(contentsOf(kFile), kBefore);
    host.apply({"tun1"});
    EXPECT_EQ(host.shown("eth0"), "192.0.2.9 /old.example ");
    host.apply({"eth0"});
    host.revert({"tun1"});
    EXPECT_EQ(contentsOf(kFile), kBefore) << "the file is one for both";
    host.want("tun1", "DNSSERVERS=192.0.2.1\n");
    EXPECT_EQ(host.apply().find("PROBLEM"), std::string::npos) << "they agree";
  }));
}

struct Generated {
  const char* name;
  const char* make;  // a command
  const char* generator;
};

class GeneratedResolvConf : public ::testing::TestWithParam<Generated> {};

TEST_P(GeneratedResolvConf, IsLeftAlone) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onPlainHost([](ApplyHost& host) {
    outputOf(std::string("f=/etc/resolv.conf; ") + GetParam().make);
    const std::string before = outputOf("ls -l /etc/resolv.conf; cat /etc/resolv.conf");
    host.want("eth0", "DNSSERVERS=192.0.2.1\n");
    const std::string start =
        std::string("eth0: PROBLEM /etc/resolv.conf is generated by ") + GetParam().generator + " (";
    ApplyOptions dry;
    dry.dryRun = true;
    for (const std::string& result : {host.apply({}, dry), host.apply()}) {
      EXPECT_TRUE(result.starts_with(start)) << result;
      EXPECT_NE(result.find("), and a change would be lost; "), std::string::npos) << result;
    }
    EXPECT_EQ(outputOf("ls -l /etc/resolv.conf; cat /etc/resolv.conf"), before);
  }));
}

#define ZORVAGENT_LINKED(target) \
  "mkdir -p $(dirname " target "); echo nameserver 203.0.113.7 > " target "; ln -sf " target " $f"

INSTANTIATE_TEST_SUITE_P(
    By, GeneratedResolvConf,
    ::testing::Values(
        Generated{"Resolved", ZORVAGENT_LINKED("/run/systemd/resolve/stub-resolv.conf"), "systemd-resolved"},
        Generated{"RelativeLink",
                  ZORVAGENT_LINKED("/run/systemd/resolve/resolv.conf") "; ln -sf ../run/systemd/resolve/resolv.conf $f",
                  "systemd-resolved"},
        Generated{"NetworkManagerLink", ZORVAGENT_LINKED("/run/NetworkManager/resolv.conf"), "NetworkManager"},
        Generated{"ResolvconfLink", ZORVAGENT_LINKED("/run/resolvconf/resolv.conf"), "resolvconf"},
        Generated{"NetconfigLink", ZORVAGENT_LINKED("/run/netconfig/resolv.conf"), "netconfig"},
        Generated{"ConnmanLink", ZORVAGENT_LINKED("/run/connman/resolv.conf"), "ConnMan"},
        Generated{"OtherLink", ZORVAGENT_LINKED("/run/mydaemon/resolv.conf"), "a program"},
        Generated{
            "LinkToLink",
            ZORVAGENT_LINKED("/run/connman/resolv.conf") "; ln -s /run/connman/resolv.conf /etc/other; ln -sf other $f",
            "ConnMan"},
        Generated{"NetworkManager", "echo '# Generated by NetworkManager' > $f", "NetworkManager"},
        Generated{"Resolvconf",
                  "echo '# Dynamic resolv.conf(5) file for glibc resolver(3) generated by resolvconf(8)' > $f",
                  "resolvconf"},
        Generated{"Dhclient", "echo '; generated by /usr/sbin/dhclient-script' > $f", "dhclient-script"},
        Generated{"Dhcpcd", "echo '# Generated by dhcpcd from eth0.dhcp' > $f", "dhcpcd"},
        Generated{"Netconfig", "echo '### /etc/resolv.conf file autogenerated by netconfig!' > $f", "netconfig"},
        Generated{"Connman", "echo '# Generated by Connection Manager' > $f", "ConnMan"},
        Generated{"CloudInit", "echo '; Created by cloud-init on instance boot automatically, do not edit.' > $f",
                  "cloud-init"},
        Generated{"Container", "echo nameserver 203.0.113.7 > /etc/mine; mount --bind /etc/mine $f",
                  "the container's engine"},
        Generated{"Other", "echo '# This file is generated by frob.' > $f", "a program"}),
    [](const auto& generated) { return generated.param.name; });

TEST(ResolvConfChange, FollowsALinkToAPlainFile) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onPlainHost([](ApplyHost& host) {
    outputOf("mkdir /etc/net; mv /etc/resolv.conf /etc/net/mine; ln -s net/mine /etc/resolv.conf");
    host.want("eth0", "DNSSERVERS=192.0.2.1\n");
    host.apply();
    EXPECT_TRUE(std::filesystem::is_symlink(kFile));
    EXPECT_NE(contentsOf("/etc/net/mine").find("nameserver 192.0.2.1\n"), std::string::npos);
  }));
}

TEST(ResolvConfChange, AReadOnlyFileSystemIsReportedAndNothingIsRemembered) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onPlainHost([](ApplyHost& host) {
    host.want("eth0", "DNSSERVERS=192.0.2.1\n");
    outputOf("mount --bind /etc /etc && mount -o remount,ro,bind /etc");
    EXPECT_EQ(host.apply(), "eth0: PROBLEM /etc/resolv.conf.new: cannot be opened: Read-only file system\n");
    EXPECT_EQ(contentsOf(kFile), kBefore);
    EXPECT_EQ(host.revert(), "");
    outputOf(
        "umount /etc; mount --bind /var/lib/zorvagent /var/lib/zorvagent; "
        "mount -o remount,ro,bind /var/lib/zorvagent");
    EXPECT_THROW(host.apply(), std::runtime_error);
    EXPECT_EQ(contentsOf(kFile), kBefore) << "what cannot be taken back is not done";
  }));
}

TEST(ResolvConfChange, AProcessThatIsKilledLeavesTheOldStateOrTheNewOne) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onPlainHost([](ApplyHost& host) {
    host.want("eth0", "DNSSERVERS=192.0.2.1\n");
    host.apply();
    const std::string after = contentsOf(kFile);
    host.revert();
    constexpr int kDeaths = 30;
    for (int death = 0; death < kDeaths; ++death) {
      testing::killAfter(std::chrono::microseconds(500 * death), [] { ApplyHost::apply(); });
      const std::string left = contentsOf(kFile);
      EXPECT_TRUE(left == kBefore || left == after) << left;
      host.revert();
      EXPECT_EQ(contentsOf(kFile), kBefore);
    }
  }));
}

TEST(ResolvConfChange, TheCLibraryAsksTheServerThatWasSet) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(onPlainHost([](ApplyHost& host) {
    const std::vector<std::string> servers{"203.0.113.1", "192.0.2.99"};
    for (const std::string& server : servers) host.interfaces.addAddress("lo", server, 32);
    writeFile("/etc/nsswitch.conf", "hosts: dns\n");
    host.want("eth0", "DNSSERVERS=192.0.2.99\nDNSSUFFIXES=new.example\n");
    const auto askedFor = [&](const std::string& name) {
      testing::DnsListeners listeners(servers, testing::DnsListeners::kNoSuchName);
      listeners.lookUp(name);
      StringList asked = listeners.asked;
      asked.insert(asked.end(), listeners.names.begin(), listeners.names.end());
      return asked;
    };
    EXPECT_EQ(askedFor("name"), (StringList{"203.0.113.1", "name.old.example", "name"}));
    host.apply();
    EXPECT_EQ(askedFor("name"), (StringList{"192.0.2.99", "name.new.example", "name"}));
    host.revert();
    EXPECT_EQ(askedFor("name"), (StringList{"203.0.113.1", "name.old.example", "name"}));
  }));
}

}  // namespace
}  // namespace zorva::agent
