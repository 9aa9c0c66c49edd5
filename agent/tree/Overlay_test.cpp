#include "agent/tree/Overlay.h"

#include <gtest/gtest.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <unistd.h>

#include <atomic>
#include <csignal>
#include <filesystem>
#include <map>
#include <thread>

#include "agent/Agent.h"
#include "agent/Seams.h"
#include "agent/interface/Instrumentation.h"
#include "agent/testing/TemporaryDirectory.h"
#include "agent/testing/Trees.h"

namespace zorva::agent {
namespace {

using namespace ZV::NodeLexicon;
using testing::contentsOf;
using testing::startChild;
using testing::succeeded;
using testing::succeedsInChild;
using testing::TemporaryDirectory;
using ZV::Instrumentation;

constexpr const char* kTree = R"({"system_name": "host1", "nodes": [
  {"type": "System", "name": "system", "description": "Computer", "children": [
    {"type": "Port", "name": "eth0", "children": [{"type": "NetworkIPConfig", "name": "ip", "properties":
      {"name": "eth0", "host_name": "host1", "domain_name": "example.org", "dns_suffixes": ["example.org"]}}]},
    {"type": "Port", "name": "eth1", "children": [{"type": "NetworkIPConfig", "name": "ip", "properties":
      {"name": "second"}}]}]}]})";

class OverlayTest : public ::testing::Test {
 protected:
  OverlayTest() { start(); }
  ~OverlayTest() override { reset(); }

  // As in a new process.
  void start() {
    reset();
    Config config;
    config.dataDir = data();
    config.logTarget = directory_ / "log";
    setConfig(config);
    setTreeSource(std::make_shared<testing::FixedSource>(testing::treeFromJson(kTree, "tree")));
  }

  std::string data() const { return directory_ / "data/"; }
  std::string overlayFile() const { return data() + "overlay.json"; }
  std::string logged() const { return contentsOf(directory_ / "log"); }

  static bool set(const std::string& path, Properties property, std::string value) {
    Instrumentation cursor;
    cursor.selectNode(path);
    return cursor.setProperty(property, value);
  }
  static bool setList(const std::string& path, Properties property, std::vector<std::string> value) {
    Instrumentation cursor;
    cursor.selectNode(path);
    return cursor.setProperty(property, std::move(value));
  }

  // The value that a cursor sees that is placed now.
  static std::string get(const std::string& path, Properties property) {
    Instrumentation cursor;
    cursor.selectNode(NODE_NETWORK_IP_CONFIG);
    cursor.selectNode(path);
    std::string value = "absent";
    cursor.getProperty(property, value);
    return value;
  }

  TemporaryDirectory directory_;
  const std::string made_ = std::filesystem::create_directory(data()) ? data() : "";
  const std::string eth0_ = "/system/eth0/ip";
  const std::string eth1_ = "/system/eth1/ip";
};

TEST_F(OverlayTest, ThereIsNothingToRemoveIfThereIsNoDirectory) {
  std::filesystem::remove_all(data());

  EXPECT_EQ(clearOverlay(), 0U);
  EXPECT_EQ(clearOverlay("eth0"), 0U);
  EXPECT_FALSE(std::filesystem::exists(data()));
}

TEST_F(OverlayTest, AValueThatIsSetWinsOverTheSourceFromTheNextPlacementOn) {
  Instrumentation before;
  before.selectNode(eth0_);
  EXPECT_TRUE(set(eth0_, PROP_DOMAIN_NAME, "lab.example.org"));
  EXPECT_EQ(get(eth0_, PROP_DOMAIN_NAME), "lab.example.org");
  std::string own;
  before.getProperty(PROP_DOMAIN_NAME, own);
  EXPECT_EQ(own, "example.org") << "a cursor stays in its snapshot";
  EXPECT_EQ(get(eth1_, PROP_DOMAIN_NAME), "absent") << "another interface has nothing of it";
}

TEST_F(OverlayTest, TheFourPropertiesCanBeSetAndOthersCannot) {
  EXPECT_TRUE(set(eth0_, PROP_HOST_NAME, "a"));
  EXPECT_TRUE(set(eth0_, PROP_DOMAIN_NAME, "b"));
  EXPECT_TRUE(setList(eth0_, PROP_DNS_SUFFIXES, {"c"}));
  EXPECT_TRUE(setList(eth0_, PROP_DNS_SERVER_ADDRESSES, {}));
  const std::string written = contentsOf(overlayFile());
  EXPECT_FALSE(set(eth0_, PROP_NAME, "x"));
  EXPECT_FALSE(set(eth0_, PROP_DNS_SUFFIXES, "a text for a list"));
  EXPECT_FALSE(setList(eth0_, PROP_HOST_NAME, {"a list for a text"}));
  EXPECT_FALSE(setList(eth0_, PROP_ENABLED_STATE, {}));
  EXPECT_EQ(contentsOf(overlayFile()), written);
}

TEST_F(OverlayTest, NothingIsSetAtANodeWithoutAnIpConfigurationOrAtNone) {
  EXPECT_FALSE(set("/system/eth0", PROP_HOST_NAME, "x"));
  EXPECT_FALSE(set("/nowhere", PROP_HOST_NAME, "x"));
  EXPECT_FALSE(std::filesystem::exists(overlayFile()));
}

TEST_F(OverlayTest, NothingIsSetAtANodeThatIsGone) {
  Instrumentation cursor;
  cursor.selectNode(eth0_);
  setTreeSource(std::make_shared<testing::FixedSource>(testing::treeFromJson("{}", "tree")));
  std::string value = "x";
  EXPECT_FALSE(cursor.setProperty(PROP_HOST_NAME, value));
}

TEST_F(OverlayTest, AValueOutlivesTheProcess) {
  EXPECT_TRUE(setList(eth0_, PROP_DNS_SERVER_ADDRESSES, {"192.0.2.1", ""}));
  start();
  EXPECT_EQ(*currentTree()->find(eth0_)->list(PROP_DNS_SERVER_ADDRESSES), (StringList{"192.0.2.1", ""}));
}

TEST_F(OverlayTest, AValueSetByAnotherProcessIsSeen) {
  EXPECT_EQ(get(eth0_, PROP_HOST_NAME), "host1");
  EXPECT_TRUE(succeedsInChild([this] { return set(eth0_, PROP_HOST_NAME, "other"); }));
  EXPECT_EQ(get(eth0_, PROP_HOST_NAME), "other");
}

TEST_F(OverlayTest, AValueEqualToTheSourcesOwnClearsItsEntry) {
  EXPECT_TRUE(set(eth0_, PROP_DOMAIN_NAME, "lab.example.org"));
  EXPECT_TRUE(setList(eth0_, PROP_DNS_SUFFIXES, {"lab.example.org"}));
  EXPECT_TRUE(set(eth0_, PROP_DOMAIN_NAME, "example.org"));
  EXPECT_TRUE(setList(eth0_, PROP_DNS_SUFFIXES, {"example.org"}));
  EXPECT_TRUE(overlayEntries().empty());
  EXPECT_FALSE(testing::isOverlaid(*currentTree()->find(eth0_), PROP_DOMAIN_NAME));
}

TEST_F(OverlayTest, ValuesThatWereSetAreMarkedInTheTreeAndListed) {
  EXPECT_TRUE(set(eth0_, PROP_HOST_NAME, "other"));
  const auto tree = currentTree();
  EXPECT_TRUE(testing::isOverlaid(*tree->find(eth0_), PROP_HOST_NAME));
  EXPECT_FALSE(testing::isOverlaid(*tree->find(eth0_), PROP_DOMAIN_NAME));
  const auto entries = overlayEntries();
  ASSERT_EQ(entries.size(), 1U);
  EXPECT_EQ(entries[0].path, eth0_);
  EXPECT_EQ(entries[0].propertyName, "host_name");
  EXPECT_EQ(std::get<std::string>(entries[0].value), "other");
}

TEST_F(OverlayTest, ValuesAreClearedByInterfaceByPathAndAltogether) {
  const auto setBoth = [this] {
    return set(eth0_, PROP_HOST_NAME, "a") && set(eth0_, PROP_DOMAIN_NAME, "b") && set(eth1_, PROP_HOST_NAME, "c");
  };
  ASSERT_TRUE(setBoth());
  EXPECT_EQ(clearOverlay("eth7"), 0U);
  EXPECT_EQ(clearOverlay("eth0"), 2U);
  EXPECT_EQ(get(eth0_, PROP_HOST_NAME), "host1");
  EXPECT_EQ(get(eth1_, PROP_HOST_NAME), "c");
  EXPECT_EQ(clearOverlay("second"), 1U) << "the name that the interface's node has";
  ASSERT_TRUE(setBoth());
  EXPECT_EQ(clearOverlay(eth1_), 1U);
  EXPECT_EQ(clearOverlay(), 2U);
  EXPECT_EQ(clearOverlay(), 0U);
}

TEST_F(OverlayTest, ValuesOfAnInterfaceThatIsNotThereWaitForIt) {
  EXPECT_TRUE(set(eth0_, PROP_HOST_NAME, "other"));
  setTreeSource(std::make_shared<testing::FixedSource>(testing::treeFromJson("{}", "tree")));
  EXPECT_EQ(overlayEntries().size(), 1U);
  setTreeSource(std::make_shared<testing::FixedSource>(testing::treeFromJson(kTree, "tree")));
  EXPECT_EQ(get(eth0_, PROP_HOST_NAME), "other");
}

TEST_F(OverlayTest, AnyBytesAreStored) {
  std::string bytes;
  for (int byte = 0; byte < 256; ++byte) bytes += static_cast<char>(byte);
  EXPECT_TRUE(set(eth0_, PROP_HOST_NAME, bytes));
  start();
  EXPECT_EQ(get(eth0_, PROP_HOST_NAME), bytes);
}

TEST_F(OverlayTest, AMissingDataDirectoryFailsTheWriteAndIsNotMade) {
  std::filesystem::remove(data());
  EXPECT_FALSE(set(eth0_, PROP_HOST_NAME, "x"));
  EXPECT_FALSE(std::filesystem::exists(data()));
  EXPECT_NE(logged().find(eth0_ + ": the value is not stored: " + data() +
                          "overlay.lock: cannot be opened: No such file or directory"),
            std::string::npos)
      << logged();
  EXPECT_EQ(get(eth0_, PROP_HOST_NAME), "host1");
}

TEST_F(OverlayTest, ADataDirectoryThatComesLaterIsNoticed) {
  std::filesystem::remove(data());
  EXPECT_EQ(get(eth0_, PROP_HOST_NAME), "host1");
  directory_.write("data/overlay.json", R"({"/system/eth0/ip": {"host_name": "late"}})");
  EXPECT_EQ(get(eth0_, PROP_HOST_NAME), "late");
}

TEST_F(OverlayTest, ADataDirectoryThatIsNotWritableFailsTheWriteAndLeavesTheOldValues) {
  ASSERT_TRUE(set(eth0_, PROP_HOST_NAME, "old"));
  ::chmod(directory_.path().c_str(), 0755);
  ::chmod((data() + "overlay.lock").c_str(), 0666);
  ::chmod(data().c_str(), 0555);
  EXPECT_TRUE(succeedsInChild([this] {
    setLogLevel(LogStream::Log, 6000);  // opens the log while this process may
    if (::getuid() == 0 && ::setuid(65534) != 0) return false;
    return !set(eth0_, PROP_HOST_NAME, "new") && get(eth0_, PROP_HOST_NAME) == "old";
  }));
  ::chmod(data().c_str(), 0755);
  EXPECT_NE(contentsOf(overlayFile()).find("old"), std::string::npos);
  EXPECT_NE(logged().find("overlay.json.new: cannot be opened: Permission denied"), std::string::npos) << logged();
}

// The kernel's limit of a file's size simulates a full disk: writing stops in the middle.
TEST_F(OverlayTest, AFullDiskFailsTheWriteAndLeavesTheOldValues) {
  ASSERT_TRUE(set(eth0_, PROP_HOST_NAME, "old"));
  const std::string before = contentsOf(overlayFile());
  EXPECT_TRUE(succeedsInChild([this] {
    std::signal(SIGXFSZ, SIG_IGN);
    const rlimit limit{4096, 4096};
    ::setrlimit(RLIMIT_FSIZE, &limit);
    setLogTarget(LogStream::Log, "off");
    return !set(eth0_, PROP_HOST_NAME, std::string(100000, 'x'));
  }));
  EXPECT_EQ(contentsOf(overlayFile()), before);
  EXPECT_FALSE(std::filesystem::exists(overlayFile() + ".new")) << "no file is left over";
}

TEST_F(OverlayTest, AFileThatIsWrongIsLoggedAndNotUsedAndNotWrittenOver) {
  directory_.write("data/overlay.json", "{\"/system/eth0/ip\": {\n\"host_name\": 7}}");
  EXPECT_EQ(get(eth0_, PROP_HOST_NAME), "host1");
  EXPECT_NE(logged().find("overlay.json:2: /system/eth0/ip.host_name: expected a text"), std::string::npos) << logged();
  EXPECT_FALSE(set(eth0_, PROP_HOST_NAME, "x"));
  EXPECT_THROW(overlayEntries(), ConfigError);
  EXPECT_THROW(clearOverlay("eth0"), ConfigError);
  EXPECT_NE(contentsOf(overlayFile()).find("7"), std::string::npos);
  EXPECT_EQ(clearOverlay(), 0U) << "all of it can be taken back";
  EXPECT_TRUE(set(eth0_, PROP_HOST_NAME, "x"));
}

TEST_F(OverlayTest, OnlyPropertiesThatCanBeSetMayBeInTheFile) {
  for (const char* text : {R"({"/a": {"name": "x"}})", R"({"/a": {"enabled_state": 1}})", R"({"/a": {"nonsense": 1}})",
                           R"({"/a": []})", "[]", "", "{"}) {
    directory_.write("data/overlay.json", text);
    EXPECT_THROW(overlayEntries(), ConfigError) << text;
  }
}

TEST_F(OverlayTest, ALinkInThePlaceOfTheLockOrTheTemporaryFileIsNotFollowed) {
  directory_.write("victim", "whole");
  directory_.link(directory_ / "victim", "data/overlay.json.new");
  EXPECT_FALSE(set(eth0_, PROP_HOST_NAME, "x"));
  EXPECT_EQ(contentsOf(directory_ / "victim"), "whole");
  EXPECT_TRUE(set(eth0_, PROP_HOST_NAME, "x")) << "the link itself has been removed";
}

TEST_F(OverlayTest, SettingTheSameValueAgainWritesNothing) {
  ASSERT_TRUE(set(eth0_, PROP_HOST_NAME, "x"));
  struct stat before {};
  ASSERT_EQ(::stat(overlayFile().c_str(), &before), 0);
  EXPECT_TRUE(set(eth0_, PROP_HOST_NAME, "x"));
  struct stat after {};
  ASSERT_EQ(::stat(overlayFile().c_str(), &after), 0);
  EXPECT_EQ(before.st_ino, after.st_ino);
}

// Before each write, each process checks whether its earlier value is still there: a value that the other one loses
// would not come back.
TEST_F(OverlayTest, TwoProcessesThatWriteAThousandTimesEachLoseNothing) {
  constexpr int kWrites = 1000;
  constexpr int kNodes = 10;
  const TemporaryDirectory shared("/dev/shm");  // where syncing costs nothing
  const auto writeAll = [&](const std::string& who) {
    const Overlay overlay(shared.path());
    std::map<std::string, std::string> written;
    for (int i = 0; i <= kWrites; ++i) {
      const OverlayValues values = overlay.read();
      for (const auto& [path, value] : written) {
        if (std::get<std::string>(values.at(path).at(PROP_HOST_NAME)) != value) return false;
      }
      if (i == kWrites) break;
      const std::string path = "/system/" + who + std::to_string(i % kNodes) + "/ip";
      overlay.set(path, PROP_HOST_NAME, PropertyValue(written[path] = std::to_string(i)));
    }
    return true;
  };
  const pid_t first = startChild([&] { return writeAll("first"); });
  const pid_t second = startChild([&] { return writeAll("second"); });
  EXPECT_TRUE(succeeded(first));
  EXPECT_TRUE(succeeded(second));
  EXPECT_EQ(Overlay(shared.path()).read().size(), std::size_t{2} * kNodes);
}

TEST_F(OverlayTest, ThreadsThatWriteAtTheSameTimeLoseNothing) {
  std::vector<std::thread> threads;
  std::atomic<int> stored = 0;
  for (int number = 0; number < 4; ++number) {
    threads.emplace_back([&, number] {
      for (int i = 0; i < 10; ++i) {
        stored += set(number % 2 == 0 ? eth0_ : eth1_, number < 2 ? PROP_HOST_NAME : PROP_DOMAIN_NAME,
                      std::to_string(number) + '-' + std::to_string(i));
      }
    });
  }
  for (std::thread& thread : threads) thread.join();
  EXPECT_EQ(stored, 40);
  EXPECT_EQ(overlayEntries().size(), 4U);
  EXPECT_EQ(get(eth0_, PROP_HOST_NAME), "0-9");
  EXPECT_EQ(get(eth1_, PROP_DOMAIN_NAME), "3-9");
}

}  // namespace
}  // namespace zorva::agent
