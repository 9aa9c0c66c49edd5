#include "agent/Agent.h"

#include <dlfcn.h>
#include <gtest/gtest.h>
#include <stdlib.h>
#include <sys/utsname.h>

#include <array>
#include <atomic>
#include <cstdio>
#include <filesystem>
#include <memory>
#include <regex>
#include <stdexcept>
#include <thread>

#include "agent/Seams.h"
#include "agent/files/FileWatch.h"
#include "agent/interface/Instrumentation.h"
#include "agent/interface/PlatformUtilities.h"
#include "agent/testing/TemporaryDirectory.h"
#include "agent/testing/Trees.h"

namespace zorva::agent {
namespace {

using testing::contentsOf;
using testing::succeedsInChild;
using testing::TemporaryDirectory;
using ZV::getSystemName;
using ZV::PlatformUtilities::getMaroviaDataDir;

std::string kernelName() {
  utsname name{};
  ::uname(&name);
  return name.nodename;
}

std::shared_ptr<const TreeSnapshot> treeNamed(const std::string& name) { return TreeBuilder(name).finish(); }

class AgentTest : public ::testing::Test {
 protected:
  AgentTest() { reset(); }
  ~AgentTest() override {
    ::unsetenv("ZORVAGENT_CONFIG");
    reset();
  }

  void configure(const std::string& text) {
    ::setenv("ZORVAGENT_CONFIG", directory_.write("agent.toml", text + "\n[log]\ntarget = \"log\"\n").c_str(), 1);
  }

  TemporaryDirectory directory_;
};

TEST_F(AgentTest, TheDataDirectoryIsTheConfiguredOneWithASlash) {
  configure("[agent]\ndata_dir = \"/srv/agent\"");
  EXPECT_STREQ(getMaroviaDataDir(), "/srv/agent/");
  EXPECT_EQ(dataDirectory(), "/srv/agent/");
}

TEST_F(AgentTest, TheDataDirectorysTextStaysValidWhenTheConfigurationChanges) {
  configure("[agent]\ndata_dir = \"/srv/first\"");
  const char* first = getMaroviaDataDir();
  loadConfig(directory_.write("other.toml", "agent.data_dir = \"/srv/second\""));
  EXPECT_STREQ(first, "/srv/first/");
  EXPECT_STREQ(getMaroviaDataDir(), "/srv/second/");
}

TEST_F(AgentTest, TheSystemNameIsTheConfiguredOne) {
  configure("[agent]\nsystem_name = \"node7\"");
  EXPECT_EQ(getSystemName(), "node7");
}

TEST_F(AgentTest, TheSystemNameIsElseThatOfTheTree) {
  setConfig(Config());
  setTreeSource(std::make_shared<testing::FixedSource>(treeNamed("from the tree")));
  EXPECT_EQ(getSystemName(), "from the tree");
  setTreeSource(std::make_shared<testing::FixedSource>(treeNamed("")));
  EXPECT_EQ(getSystemName(), kernelName()) << "a tree without a name";
}

TEST_F(AgentTest, TheSystemNameOfTheLiveHostIsTheKernels) {
  setConfig(Config());
  EXPECT_EQ(getSystemName(), kernelName());
}

TEST_F(AgentTest, ASourceThatThrowsAnythingLeavesTheKernelsName) {
  struct Failing : TreeSource {
    bool changed() override { return true; }
    std::shared_ptr<const TreeSnapshot> read() override { throw 42; }
  };
  setConfig(Config());
  setTreeSource(std::make_shared<Failing>());
  EXPECT_EQ(getSystemName(), kernelName());
}

TEST_F(AgentTest, AWrongConfigurationReachesSelectNodeOfAProgramThatAskedAsOneLineAndEverythingElseContinues) {
  ::setenv("ZORVAGENT_CONFIG", directory_.write("agent.toml", "[agent]\nlangauge = \"en\"\n").c_str(), 1);
  const std::string expected = directory_ / "agent.toml:2: agent.langauge: is not a known key; did you mean language?";
  askForExceptions();
  ::testing::internal::CaptureStderr();
  for (int i = 0; i < 2; ++i) {
    try {
      ZV::Instrumentation cursor;
      cursor.selectNode(ZV::NodeLexicon::NODE_NETWORK_IP_CONFIG);
      ADD_FAILURE() << "the configuration is wrong";
    } catch (const std::runtime_error& error) {
      EXPECT_EQ(error.what(), expected);
    }
  }
  EXPECT_EQ(getSystemName(), kernelName());
  EXPECT_STREQ(getMaroviaDataDir(), "/var/lib/zorvagent/");
  EXPECT_THROW(currentConfig(), ConfigError);
  EXPECT_THROW(overlayEntries(), ConfigError);
  EXPECT_NE(::testing::internal::GetCapturedStderr().find(expected), std::string::npos)
      << "the operator gets a message";
}

TEST_F(AgentTest, LoadingAWrongConfigurationThrowsAndLeavesTheOldOne) {
  configure("[agent]\nsystem_name = \"node7\"");
  EXPECT_EQ(getSystemName(), "node7");
  try {
    loadConfig(directory_.write("wrong.toml", "[tree]\nsource = 1\n"));
    FAIL() << "the configuration is wrong";
  } catch (const ConfigError& error) {
    EXPECT_EQ(error.file(), directory_ / "wrong.toml");
    EXPECT_EQ(error.line(), 2);
    EXPECT_EQ(error.key(), "tree.source");
    EXPECT_EQ(error.problem(), "expected a text in quotes");
  }
  EXPECT_EQ(getSystemName(), "node7");
}

TEST_F(AgentTest, AWrongTreeFileIsTellingAndIsReadAgainWhenItIsMended) {
  configure("[tree]\nsource = \"file\"\nfile = \"tree.json\"");
  directory_.write("tree.json", "{\n\"system\": \"x\"}");
  try {
    currentTree();
    FAIL() << "the tree is wrong";
  } catch (const ConfigError& error) {
    EXPECT_EQ(error.what(), directory_ / "tree.json:2: system: is not a known key");
  }
  directory_.write("tree.json", R"({"system_name": "mended"})");
  EXPECT_EQ(currentTree()->systemName(), "mended");
}

TEST_F(AgentTest, NothingIsReadAgainWhileNothingChanges) {
  struct Counting : testing::FixedSource {
    using FixedSource::FixedSource;
    std::shared_ptr<const TreeSnapshot> read() override {
      ++reads;
      return testing::FixedSource::read();
    }
    int reads = 0;
  };
  configure("[agent]\ndata_dir = \"data\"");
  std::filesystem::create_directory(directory_ / "data");
  const auto source = std::make_shared<Counting>(treeNamed("host1"));
  setTreeSource(source);
  const auto first = currentTree();
  // After this many checks, files are watched and no longer compared.
  for (int i = 0; i < 2 * FileWatch::kComparisons; ++i) ASSERT_EQ(currentTree(), first) << "the same snapshot";
  EXPECT_EQ(source->reads, 1);
}

TEST_F(AgentTest, AForkWaitsUntilNoThreadIsInsideSoThatTheChildCanGoOn) {
  configure("[agent]\ndata_dir = \"data\"\n[tree]\nsource = \"file\"\nfile = \"tree.json\"");
  directory_.write("tree.json", R"({"system_name": "host1"})");
  std::atomic<bool> stop = false;
  std::thread busy([&] {
    while (!stop) {
      directory_.write("tree.json", R"({"system_name": "host1"})");
      try {
        currentTree();
      } catch (const ConfigError&) {
        // The file was read while it was being written.
      }
    }
  });
  bool good = true;
  for (int i = 0; i < 50 && good; ++i) {
    good = succeedsInChild([] {
      try {
        currentTree();
      } catch (const ConfigError&) {
        // The file was read while it was being written.
      }
      return true;
    });
  }
  stop = true;
  busy.join();
  EXPECT_TRUE(good);
}

// The shared library, as a CIM server loads it.
std::string library() { return ZORVA_LIB_DIR "/libzorvagent.so.1"; }

std::size_t openDescriptors() {
  std::size_t count = 0;
  for ([[maybe_unused]] const auto& entry : std::filesystem::directory_iterator("/proc/self/fd")) ++count;
  return count;
}

TEST(AgentLibrary, IsLoadedAndUnloadedAHundredTimesAndReallyGone) {
  const std::size_t before = openDescriptors();
  for (int i = 0; i < 100; ++i) {
    void* handle = ::dlopen(library().c_str(), RTLD_NOW | RTLD_LOCAL);
    ASSERT_NE(handle, nullptr) << ::dlerror();
    using CurrentTree = std::shared_ptr<const TreeSnapshot> (*)();
    const auto readTree = reinterpret_cast<CurrentTree>(::dlsym(handle, "_ZN5zorva5agent11currentTreeEv"));
    ASSERT_NE(readTree, nullptr);
    EXPECT_NE(readTree(), nullptr) << "sockets, watches and the process's state are made, and must go with the library";
    ASSERT_EQ(::dlclose(handle), 0);
    ASSERT_EQ(::dlopen(library().c_str(), RTLD_NOW | RTLD_NOLOAD), nullptr) << "it is still there";
  }
  EXPECT_EQ(openDescriptors(), before);
}

// The output lines of a command.
std::vector<std::string> linesOf(const std::string& command) {
  std::vector<std::string> lines;
  FILE* pipe = ::popen(command.c_str(), "r");
  std::array<char, 4096> line;
  while (pipe != nullptr && std::fgets(line.data(), static_cast<int>(line.size()), pipe) != nullptr) {
    lines.emplace_back(line.data());
  }
  if (pipe != nullptr) ::pclose(pipe);
  return lines;
}

TEST(AgentLibrary, ExportsItsInterfacesAndNothingElse) {
  const auto symbols = linesOf("nm -DC --defined-only '" + library() + "'");
  EXPECT_GT(symbols.size(), 50U);
  const std::regex own("[0-9a-f]+ [A-Z] ((typeinfo|typeinfo name|vtable) for )?(ZV|ZALog|zorva)::.*\n");
  for (const std::string& symbol : symbols) EXPECT_TRUE(std::regex_match(symbol, own)) << symbol;
}

TEST(AgentLibrary, AForkAfterItIsUnloadedWorks) {
  void* handle = ::dlopen(library().c_str(), RTLD_NOW | RTLD_LOCAL);
  ASSERT_NE(handle, nullptr);
  using GetDataDir = const char* (*)();
  reinterpret_cast<GetDataDir>(::dlsym(handle, "_ZN2ZV17PlatformUtilities17getMaroviaDataDirEv"))();
  ::dlclose(handle);
  EXPECT_TRUE(succeedsInChild([] { return true; }));
}

}  // namespace
}  // namespace zorva::agent
