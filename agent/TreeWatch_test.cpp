#include "agent/TreeWatch.h"

#include <gtest/gtest.h>
#include <sys/eventfd.h>

#include <filesystem>
#include <future>
#include <thread>

#include "agent/Agent.h"
#include "agent/Seams.h"
#include "agent/files/DirectoryWatch.h"
#include "agent/testing/TemporaryDirectory.h"
#include "util/FileDescriptor.h"

namespace zorva::agent {
namespace {

using namespace std::chrono_literals;
using testing::TemporaryDirectory;

std::string document(const std::string& domain) {
  return R"({"system_name": "host1", "nodes": [{"type": "System", "name": "system", "description": "Computer",
    "children": [{"type": "Port", "name": "eth0", "description": "", "children": [
      {"type": "NetworkIPConfig", "name": "ip", "description": "",
       "properties": {"name": "eth0", "domain_name": ")" +
         domain + "\"}}]}]}]}";
}

class TreeWatchTest : public ::testing::Test {
 protected:
  TreeWatchTest() {
    std::filesystem::create_directory(directory_ / "data");
    directory_.write("tree.json", document("a.example"));
    loadConfig(directory_.write("agent.toml",
                                "[agent]\ndata_dir = \"data/\"\n[tree]\nsource = \"file\"\nfile = "
                                "\"tree.json\"\n[bmc]\nfile = \"bmc.json\"\n"));
  }
  ~TreeWatchTest() override { reset(); }

  static std::string domainOf(const TreeSnapshot& tree) {
    return *tree.find("/system/eth0/ip")->text(ZV::NodeLexicon::PROP_DOMAIN_NAME);
  }

  TemporaryDirectory directory_;
};

TEST_F(TreeWatchTest, ReturnsTheSameTreeWhileNothingChanges) {
  TreeWatch watch;
  const auto tree = watch.tree();
  EXPECT_EQ(domainOf(*tree), "a.example");
  EXPECT_EQ(watch.tree(), tree);
}

TEST_F(TreeWatchTest, SleepsUntilTheSourceChanges) {
  TreeWatch watch;
  watch.tree();
  auto slept = std::async(std::launch::async, [&] {
    std::vector<pollfd> none;
    while (domainOf(*watch.tree()) == "a.example") watch.wait(none);
    return true;
  });
  EXPECT_EQ(slept.wait_for(200ms), std::future_status::timeout);
  directory_.write("tree.json", document("b.example"));
  EXPECT_EQ(slept.wait_for(20s), std::future_status::ready);
}

TEST_F(TreeWatchTest, IsWokenByTheOverlay) {
  TreeWatch watch;
  watch.tree();
  directory_.write("data/overlay.json", R"({"/system/eth0/ip": {"domain_name": "set.example"}})");
  std::vector<pollfd> none;
  watch.wait(none);
  EXPECT_EQ(domainOf(*watch.tree()), "set.example");
}

TEST_F(TreeWatchTest, IsWokenByAnotherDescriptorAndByTime) {
  TreeWatch watch;
  watch.tree();
  const util::FileDescriptor event(::eventfd(1, EFD_CLOEXEC));
  std::vector<pollfd> others{{event.get(), POLLIN, 0}};
  watch.wait(others);
  EXPECT_EQ(others.front().revents, POLLIN);
  others.clear();
  watch.wait(others, 1ms);
}

std::chrono::nanoseconds processorTime() {
  timespec used{};
  ::clock_gettime(CLOCK_THREAD_CPUTIME_ID, &used);
  return std::chrono::seconds(used.tv_sec) + std::chrono::nanoseconds(used.tv_nsec);
}

// Other programs may make files in the directory of all temporary ones, which is on the way: that wakes it, and the
// tree stays the same.
TEST_F(TreeWatchTest, SleepsWhileNothingChanges) {
  TreeWatch watch;
  const auto tree = watch.tree();
  std::vector<pollfd> none;
  const auto start = std::chrono::steady_clock::now();
  const auto usedBefore = processorTime();
  for (auto slept = 0ms; slept < 200ms;) {
    const auto begin = std::chrono::steady_clock::now();
    watch.wait(none, 200ms);
    slept = std::chrono::duration_cast<std::chrono::milliseconds>(std::chrono::steady_clock::now() - begin);
    EXPECT_EQ(watch.tree(), tree);
    if (std::chrono::steady_clock::now() - start > 20s) break;
  }
  EXPECT_LT((processorTime() - usedBefore) * 4, std::chrono::steady_clock::now() - start);
}

TEST_F(TreeWatchTest, GoesOnAfterATreeThatCannotBeRead) {
  TreeWatch watch;
  watch.tree();
  directory_.write("tree.json", "no tree");
  EXPECT_THROW(watch.tree(), ConfigError);
  directory_.write("tree.json", document("c.example"));
  std::vector<pollfd> none;
  watch.wait(none, 20s);
  EXPECT_EQ(domainOf(*watch.tree()), "c.example");
}

TEST(DirectoryWatch, ReportsEntriesAndTheirContents) {
  const TemporaryDirectory directory;
  DirectoryWatch watch;
  EXPECT_FALSE(watch.changed());
  EXPECT_EQ(watch.descriptor(), -1);
  EXPECT_FALSE(watch.watch(directory / "none"));
  EXPECT_TRUE(watch.watch(directory.path()));
  EXPECT_FALSE(watch.changed());
  directory.write("new", "x");
  EXPECT_TRUE(watch.changed());
  EXPECT_FALSE(watch.changed());
  directory.write("new", "y");
  EXPECT_TRUE(watch.changed());
}

TEST(DirectoryWatch, FollowsADirectoryThatIsMadeAgain) {
  const TemporaryDirectory directory;
  const std::string path = directory / "data";
  std::filesystem::create_directory(path);
  DirectoryWatch watch;
  EXPECT_TRUE(watch.watch(path));
  std::filesystem::remove(path);
  EXPECT_TRUE(watch.changed());
  EXPECT_FALSE(watch.watch(path));
  std::filesystem::create_directory(path);
  EXPECT_TRUE(watch.watch(path));
}

}  // namespace
}  // namespace zorva::agent
