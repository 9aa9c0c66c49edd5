#include "agent/sources/HostSource.h"

#include <gtest/gtest.h>
#include <linux/if_addr.h>
#include <sched.h>
#include <sys/resource.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <filesystem>
#include <stdexcept>
#include <thread>

#include "agent/Agent.h"
#include "agent/Seams.h"
#include "agent/interface/Instrumentation.h"
#include "agent/testing/NetworkNamespace.h"
#include "agent/testing/TemporaryDirectory.h"
#include "agent/testing/Trees.h"

namespace zorva::agent {
namespace {

using namespace ZV::NodeLexicon;
using testing::enterNewNetwork;
using testing::Interfaces;
using testing::succeedsInChild;
using testing::TemporaryDirectory;
namespace fs = std::filesystem;

// A host with the test's files and this process's network.
class HostFiles : public ::testing::Test {
 protected:
  HostFiles() {
    options_.root = directory_.path() + '.';
    options_.comparisons = 0;         // each change is noticed once
    options_.includeLoopback = true;  // so that there is an interface on every machine
  }

  // The first interface, as the source sees it now.
  const Node& look(HostSource& source) {
    if (source.changed() || tree_ == nullptr) {
      tree_ = source.read();
      ++reads_;
    }
    const Node* node = tree_->nextOfType(NodeType::NetworkIPConfig, 0);
    if (node == nullptr) throw std::runtime_error("no interface at all");
    return *node;
  }

  StringList servers(HostSource& source) {
    const StringList* list = look(source).list(PROP_DNS_SERVER_ADDRESSES);
    return list == nullptr ? StringList{"absent"} : *list;
  }

  TemporaryDirectory directory_;
  HostSourceOptions options_;
  std::shared_ptr<const TreeSnapshot> tree_;
  int reads_ = 0;
};

TEST_F(HostFiles, ServersAndSuffixesComeFromResolvConf) {
  directory_.write("etc/resolv.conf", "search a.org b.org\nnameserver 192.0.2.1\nnameserver fe80::1%eth0\n");
  HostSource source(options_);
  EXPECT_EQ(servers(source), (StringList{"192.0.2.1", "fe80::1%eth0"}));
  EXPECT_EQ(*look(source).list(PROP_DNS_SUFFIXES), (StringList{"a.org", "b.org"}));
  EXPECT_EQ(reads_, 1) << "nothing is read again while nothing changes";
}

const StringList kResolversDefault{"127.0.0.1"};

TEST_F(HostFiles, WithoutServersTheResolverAsksItsOwnHost) {
  HostSource source(options_);
  EXPECT_EQ(servers(source), kResolversDefault) << "without a file";
  directory_.write("etc/resolv.conf", "");
  EXPECT_EQ(servers(source), kResolversDefault) << "with an empty one";
  EXPECT_EQ(*look(source).text(kDnsOwner), "/etc/resolv.conf");
}

TEST_F(HostFiles, ResolvConfThatIsNoRegularFileCountsAsAbsent) {
  directory_.link("/dev/zero", "etc/resolv.conf");
  HostSource source(options_);
  EXPECT_EQ(servers(source), kResolversDefault) << "an endless device";
  fs::remove(directory_ / "etc/resolv.conf");
  fs::create_directory(directory_ / "etc/resolv.conf");
  EXPECT_EQ(servers(source), kResolversDefault) << "a directory";
}

TEST_F(HostFiles, ResolvConfThatMayNotBeReadCountsAsAbsentUntilItMay) {
  directory_.write("etc/resolv.conf", "nameserver 192.0.2.1\n");
  fs::permissions(directory_ / "etc/resolv.conf", fs::perms::none);
  fs::permissions(directory_.path(), fs::perms::all);
  EXPECT_TRUE(succeedsInChild([this] {
    HostSource source(options_);
    if (::getuid() == 0 && ::seteuid(65534) != 0) return false;
    const bool absent = servers(source) == kResolversDefault;
    if (::getuid() == 0 && ::seteuid(0) != 0) return false;
    fs::permissions(directory_ / "etc/resolv.conf", fs::perms::all);
    return absent && servers(source) == StringList{"192.0.2.1"};
  }));
}

TEST_F(HostFiles, TheSystemHasWhatTheResolverMakesOfTheFile) {
  std::string text = "search a.org b.org\noptions ndots:2 rotate\n";
  for (const char* last : {"1", "2", "3", "4"}) text += std::string("nameserver 192.0.2.") + last + '\n';
  directory_.write("etc/resolv.conf", text);
  HostSource source(options_);
  EXPECT_EQ(servers(source), (StringList{"192.0.2.1", "192.0.2.2", "192.0.2.3"}));
  const Node* system = tree_->find("/system");
  EXPECT_EQ(*system->list(kResolverServers), servers(source));
  EXPECT_EQ(*system->list(kResolverNotAsked), StringList{"192.0.2.4"});
  EXPECT_EQ(*system->list(kResolverSearch), (StringList{"a.org", "b.org"}));
  EXPECT_EQ(*system->list(kResolverOptions), (StringList{"ndots:2", "rotate"}));
}

TEST_F(HostFiles, OnlyTheBeginningOfAHugeResolvConfIsLookedAt) {
  std::string text(std::size_t{64} << 10, '\n');
  directory_.write("etc/resolv.conf", "nameserver 192.0.2.1\n" + text + "nameserver 192.0.2.2\n");
  HostSource source(options_);
  EXPECT_EQ(servers(source), StringList{"192.0.2.1"});
}

TEST_F(HostFiles, ALongLineWithoutEndSaysNothing) {
  directory_.write("etc/resolv.conf", "search " + std::string(100000, 'x'));
  HostSource source(options_);
  EXPECT_TRUE(look(source).list(PROP_DNS_SUFFIXES)->empty());
}

TEST_F(HostFiles, ResolvConfThatIsReplacedByARenameIsReadAgain) {
  directory_.write("etc/resolv.conf", "nameserver 192.0.2.1\n");
  HostSource source(options_);
  EXPECT_EQ(servers(source), (StringList{"192.0.2.1"}));
  directory_.write("etc/resolv.conf.new", "nameserver 192.0.2.2\n");
  fs::rename(directory_ / "etc/resolv.conf.new", directory_ / "etc/resolv.conf");
  EXPECT_EQ(servers(source), (StringList{"192.0.2.2"}));
  directory_.write("etc/resolv.conf", "nameserver 192.0.2.3\n");
  EXPECT_EQ(servers(source), (StringList{"192.0.2.3"})) << "the new file is watched in turn";
}

TEST_F(HostFiles, AChainOfLinksIsFollowedAndWatched) {
  directory_.write("run/real.conf", "nameserver 192.0.2.1\n");
  directory_.link("../run/real.conf", "var/second.conf");
  directory_.link("../var/second.conf", "etc/resolv.conf");
  HostSource source(options_);
  EXPECT_EQ(servers(source), (StringList{"192.0.2.1"}));
  directory_.write("run/real.conf", "nameserver 192.0.2.2\n");
  EXPECT_EQ(servers(source), (StringList{"192.0.2.2"}));
  directory_.write("run/other.conf", "nameserver 192.0.2.3\n");
  fs::remove(directory_ / "var/second.conf");
  directory_.link("../run/other.conf", "var/second.conf");
  EXPECT_EQ(servers(source), (StringList{"192.0.2.3"}));
}

TEST_F(HostFiles, LinksThatLeadInACircleCountAsAbsent) {
  directory_.link("b", "etc/resolv.conf");
  directory_.link("resolv.conf", "etc/b");
  HostSource source(options_);
  EXPECT_EQ(servers(source), kResolversDefault);
}

TEST_F(HostFiles, TheServersOfALocalStubAreShown) {
  directory_.write("etc/resolv.conf", "nameserver 127.0.0.53\nsearch example.org\n");
  HostSource source(options_);
  EXPECT_EQ(servers(source), (StringList{"127.0.0.53"})) << "nothing better is known";
  directory_.write("run/systemd/resolve/resolv.conf", "nameserver 192.0.2.1\nnameserver 192.0.2.2\n");
  EXPECT_EQ(servers(source), (StringList{"192.0.2.1", "192.0.2.2"}));
  EXPECT_EQ(*look(source).list(PROP_DNS_SUFFIXES), (StringList{"example.org"}));
}

TEST_F(HostFiles, TheDomainComesFromHostsOrResolvConf) {
  EXPECT_TRUE(succeedsInChild([this] {
    if (::unshare(CLONE_NEWUTS) != 0) return true;  // without the right to its own name the host has another one
    ::sethostname("host1", 5);
    directory_.write("etc/resolv.conf", "domain last.org\n");
    HostSource source(options_);
    bool good = *look(source).text(PROP_DOMAIN_NAME) == "last.org";
    directory_.write("etc/hosts", "127.0.1.1 host1.example.org host1\n");
    good = good && *look(source).text(PROP_DOMAIN_NAME) == "example.org";
    ::sethostname("host2.lab.org", 13);
    good = good && *look(source).text(PROP_DOMAIN_NAME) == "lab.org";
    return good && *look(source).text(PROP_HOST_NAME) == "host2" && tree_->systemName() == "host2.lab.org";
  }));
}

TEST_F(HostFiles, TheSystemIsCalledByItsProductOrComputer) {
  HostSource nameless(options_);
  EXPECT_EQ(nameless.read()->find("/system")->description(), "Computer");
  directory_.write("sys/class/dmi/id/product_name", "Model 7 \n");
  HostSource named(options_);
  EXPECT_EQ(named.read()->find("/system")->description(), "Model 7");
  directory_.write("sys/class/dmi/id/product_name", "BMC\n");
  HostSource misleading(options_);
  EXPECT_EQ(misleading.read()->find("/system")->description(), "Computer");
}

TEST_F(HostFiles, LoopbackIsLeftOutUnlessItIsWanted) {
  HostSource with(options_);
  EXPECT_NE(with.read()->find("/system/lo"), nullptr);
  options_.includeLoopback = false;
  HostSource without(options_);
  EXPECT_EQ(without.read()->find("/system/lo"), nullptr);
}

TEST_F(HostFiles, WithoutSocketsTheReasonIsReported) {
  EXPECT_TRUE(succeedsInChild([this] {
    HostSource source(options_);
    rlimit before{};
    ::getrlimit(RLIMIT_NOFILE, &before);
    const rlimit none{0, before.rlim_max};
    ::setrlimit(RLIMIT_NOFILE, &none);
    try {
      source.read();
    } catch (const std::runtime_error& error) {
      ::setrlimit(RLIMIT_NOFILE, &before);  // UBSan needs a descriptor to examine an object
      return std::string(error.what()) == "a netlink socket cannot be opened: Too many open files";
    }
    return false;
  }));
}

// Runs the test in its own network, in a child process, because a process cannot go back.
template <typename Work>
bool succeedsInNewNetwork(Work work) {
  return succeedsInChild([&] {
    if (!enterNewNetwork()) throw std::runtime_error("no network namespace");
    Interfaces interfaces;
    HostSource source;
    return work(interfaces, source);
  });
}

unsigned int stateOf(const TreeSnapshot& tree, const std::string& name) {
  const Node* node = tree.find("/system/" + name + "/ip");
  return node == nullptr ? 0 : *node->number(PROP_ENABLED_STATE);
}

TEST(HostNetwork, InterfacesComeAndGo) {
  ZORVAGENT_NEEDS_NETWORK_NAMESPACE();
  EXPECT_TRUE(succeedsInNewNetwork([](Interfaces& interfaces, HostSource& source) {
    bool good = source.read()->find("/system/zv0") == nullptr && !source.changed();
    interfaces.addBridge("zv0");
    good = good && source.changed() && source.read()->find("/system/zv0/ip") != nullptr && !source.changed();
    interfaces.rename("zv0", "zv1");
    good = good && source.changed();
    auto tree = source.read();
    good = good && tree->find("/system/zv0") == nullptr && tree->find("/system/zv1") != nullptr;
    interfaces.remove("zv1");
    return good && source.changed() && source.read()->find("/system/zv1") == nullptr;
  }));
}

// Whether a link gets into that state soon: the kernel takes time for carriers.
bool becomes(HostSource& source, const std::string& name, unsigned int state) {
  for (int i = 0; i < 300; ++i) {
    if (source.changed() && stateOf(*source.read(), name) == state) return true;
    std::this_thread::sleep_for(std::chrono::milliseconds(10));
  }
  return false;
}

TEST(HostNetwork, TheRawStateShowsUpDownAndCarrier) {
  ZORVAGENT_NEEDS_NETWORK_NAMESPACE();
  EXPECT_TRUE(succeedsInNewNetwork([](Interfaces& interfaces, HostSource&) {
    HostSource source({.includeLoopback = true, .root = ""});
    interfaces.addPair("zv0", "zv1");
    const bool down = stateOf(*source.read(), "zv0") == 16;
    interfaces.setUp("zv0", true);
    const bool withoutCarrier = becomes(source, "zv0", 12);
    interfaces.setUp("zv1", true);
    const bool up = becomes(source, "zv0", 1);
    interfaces.setUp("lo", true);  // its operational state is unknown
    return down && withoutCarrier && up && becomes(source, "lo", 1);
  }));
}

TEST(HostNetwork, AddressesHaveTheirPrefixAndOrigin) {
  ZORVAGENT_NEEDS_NETWORK_NAMESPACE();
  EXPECT_TRUE(succeedsInNewNetwork([](Interfaces& interfaces, HostSource& source) {
    interfaces.addBridge("zv0");
    interfaces.setUp("zv0", true);
    source.read();
    interfaces.addAddress("zv0", "192.0.2.10", 24);
    interfaces.addAddress("zv0", "198.51.100.7", 25, 0, 600);
    interfaces.addAddress("zv0", "2001:db8::10", 64, IFA_F_NODAD);
    interfaces.addAddress("zv0", "2001:db8::20", 128, IFA_F_NODAD, 600);
    interfaces.addAddress("zv0", "2001:db8:1::30", 64, IFA_F_NODAD | IFA_F_NOPREFIXROUTE, 600);
    if (!source.changed()) return false;
    const auto tree = source.read();
    const Node* node = tree->find("/system/zv0/ip");
    AddressList globals;
    for (const InterfaceAddress& address : node->addresses()) {
      if (address.origin != AddressOrigin::LinkLocal) globals.push_back(address);
    }
    const auto has = [&](const InterfaceAddress& address) {
      return std::find(globals.begin(), globals.end(), address) != globals.end();
    };
    return globals.size() == 5 && globals[0] == InterfaceAddress{"192.0.2.10", 24, AddressOrigin::Static} &&
           globals[1] == InterfaceAddress{"198.51.100.7", 25, AddressOrigin::Dhcp} &&
           has({"2001:db8::10", 64, AddressOrigin::Static}) && has({"2001:db8::20", 128, AddressOrigin::Dhcp}) &&
           has({"2001:db8:1::30", 64, AddressOrigin::Slaac}) && *node->number(PROP_PROTOCOL_IF_TYPE) == 4098;
  }));
}

// Makes a link with each of these names that the kernel takes.
std::vector<std::string> addAll(Interfaces& interfaces, const std::vector<std::string>& names) {
  std::vector<std::string> taken;
  for (const std::string& name : names) {
    try {
      interfaces.addBridge(name);
      taken.push_back(name);
    } catch (const std::runtime_error&) {
      // The kernel refuses "/", ":", blanks and patterns.
    }
  }
  return taken;
}

TEST(HostNetwork, NamesOfFifteenBytesOfAnythingThatTheKernelTakesAreNodes) {
  ZORVAGENT_NEEDS_NETWORK_NAMESPACE();
  EXPECT_TRUE(succeedsInNewNetwork([](Interfaces& interfaces, HostSource& source) {
    std::vector<std::string> names{"\x01\x02\x03\x04\x05\x06\x07\x08\x0E\x0F\x10\x1B[2J", "\"\\={}<>&'#;$(x)`",
                                   "\xC3\xBC\xE2\x82\xAC", "...", "-rf"};
    for (int byte = 1; byte < 256; ++byte) names.emplace_back(15, static_cast<char>(byte));
    const std::vector<std::string> taken = addAll(interfaces, names);
    const auto tree = source.read();
    const auto back = testing::treeFromJson(treeToJson(*tree), "tree");
    for (const std::string& name : taken) {
      const Node* node = tree->find("/system/" + name + "/ip");
      if (node == nullptr || *node->text(PROP_NAME) != name) return false;
      if (back->find("/system/" + name + "/ip") == nullptr) return false;
    }
    return taken.size() > 200;
  }));
}

TEST(HostNetwork, ReportsThatWereLostCountAsAChange) {
  ZORVAGENT_NEEDS_NETWORK_NAMESPACE();
  EXPECT_TRUE(succeedsInNewNetwork([](Interfaces& interfaces, HostSource& source) {
    source.read();
    interfaces.addBridge("zv0");
    // More events than the socket's buffer holds.
    for (int i = 0; i < 3000; ++i) interfaces.setUp("zv0", i % 2 == 0);
    return source.changed() && stateOf(*source.read(), "zv0") == 16 && !source.changed();
  }));
}

TEST(HostNetwork, ManyInterfacesAreAllThere) {
  ZORVAGENT_NEEDS_NETWORK_NAMESPACE();
  EXPECT_TRUE(succeedsInNewNetwork([](Interfaces& interfaces, HostSource& source) {
    constexpr int kCount = 300;  // several messages of the kernel
    for (int i = 0; i < kCount; ++i) interfaces.addBridge("zv" + std::to_string(i));
    const auto tree = source.read();
    for (int i = 0; i < kCount; ++i) {
      if (tree->find("/system/zv" + std::to_string(i) + "/ip") == nullptr) return false;
    }
    return true;
  }));
}

// One walk like those of the tree's readers: every node has its name and its grandparent.
bool walks(std::size_t& nodes) {
  ZV::Instrumentation cursor;
  cursor.selectNode(NODE_NETWORK_IP_CONFIG);
  for (; cursor; ++cursor) {
    std::string name;
    if (!cursor.getProperty(PROP_NAME, name) || name.empty()) return false;
    ZV::Instrumentation ancestor(cursor);
    ancestor.selectNode(ancestor.getPathToParentNode());
    ancestor.selectNode(ancestor.getPathToParentNode());
    if (ancestor.getNodeDescription().empty()) return false;
    ++nodes;
  }
  return true;
}

TEST(HostNetwork, InterfacesComeAndGoAThousandTimesWhileFourThreadsWalkTheTree) {
  ZORVAGENT_NEEDS_NETWORK_NAMESPACE();
  EXPECT_TRUE(succeedsInNewNetwork([](Interfaces& interfaces, HostSource&) {
    reset();
    setConfig(Config());
    constexpr unsigned int kGroup = 7;
    interfaces.addBridge("zvfixed");
    std::atomic<bool> stop = false;
    std::atomic<int> failures = 0;
    std::vector<std::thread> threads;
    for (int i = 0; i < 4; ++i) {
      threads.emplace_back([&] {
        while (!stop) {
          std::size_t nodes = 0;
          if (!walks(nodes) || nodes == 0) ++failures;
        }
      });
    }
    for (int round = 0; round < 25; ++round) {
      for (int i = 0; i < 40; ++i) interfaces.addBridge("zv" + std::to_string(i), kGroup);
      interfaces.removeGroup(kGroup);
    }
    stop = true;
    for (std::thread& thread : threads) thread.join();
    const auto tree = currentTree();
    return failures == 0 && tree->find("/system/zvfixed") != nullptr && tree->find("/system/zv0") == nullptr;
  }));
}

TEST(HostNetwork, AForkedProcessHearsOfChangesAndDoesNotTakeThemFromItsParent) {
  ZORVAGENT_NEEDS_NETWORK_NAMESPACE();
  EXPECT_TRUE(succeedsInNewNetwork([](Interfaces& interfaces, HostSource&) {
    reset();
    setConfig(Config());
    currentTree();
    const bool childIsGood = succeedsInChild([&] {
      Interfaces own;
      const bool without = currentTree()->find("/system/zv0") == nullptr;
      own.addBridge("zv0");
      return without && currentTree()->find("/system/zv0") != nullptr;
    });
    const bool parentSees = currentTree()->find("/system/zv0") != nullptr;
    interfaces.remove("zv0");
    return childIsGood && parentSees && currentTree()->find("/system/zv0") == nullptr;
  }));
}

TEST(AddressOrigins, AreRecognizedByRangeProtocolFlagsAndPrefix) {
  constexpr unsigned int kFromRouter = 2;
  constexpr unsigned int kKernelLinkLocal = 3;
  const auto origin = [](const char* address, unsigned int prefix, unsigned int flags, unsigned int protocol) {
    return originOf({address, prefix, AddressOrigin::Unknown}, flags, protocol);
  };
  EXPECT_EQ(origin("192.0.2.1", 24, IFA_F_PERMANENT, 0), AddressOrigin::Static);
  EXPECT_EQ(origin("192.0.2.1", 24, 0, 0), AddressOrigin::Dhcp);
  EXPECT_EQ(origin("169.254.3.4", 16, IFA_F_PERMANENT, 0), AddressOrigin::LinkLocal);
  EXPECT_EQ(origin("fe80::1", 64, IFA_F_PERMANENT, 0), AddressOrigin::LinkLocal);
  EXPECT_EQ(origin("febf::1", 64, IFA_F_PERMANENT, 0), AddressOrigin::LinkLocal);
  EXPECT_EQ(origin("fec0::1", 64, IFA_F_PERMANENT, 0), AddressOrigin::Static);
  EXPECT_EQ(origin("2001:db8::1", 64, IFA_F_PERMANENT, kKernelLinkLocal), AddressOrigin::LinkLocal);
  EXPECT_EQ(origin("2001:db8::1", 64, IFA_F_MANAGETEMPADDR, kFromRouter), AddressOrigin::Slaac);
  EXPECT_EQ(origin("2001:db8::1", 64, 0, 0), AddressOrigin::Slaac);
  EXPECT_EQ(origin("2001:db8::1", 128, 0, 0), AddressOrigin::Dhcp);
  EXPECT_EQ(origin("2001:db8::1", 128, IFA_F_TEMPORARY, 0), AddressOrigin::Slaac);
  EXPECT_EQ(origin("2001:db8::1", 64, IFA_F_PERMANENT, 0), AddressOrigin::Static);
}

}  // namespace
}  // namespace zorva::agent
