#include "agent/files/FileWatch.h"

#include <gtest/gtest.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <unistd.h>

#include <chrono>
#include <filesystem>
#include <thread>

#include "agent/testing/TemporaryDirectory.h"

namespace zorva::agent {
namespace {

using testing::succeedsInChild;
using testing::TemporaryDirectory;
namespace fs = std::filesystem;

constexpr int kAlwaysCompare = 1000000;
constexpr int kAlwaysWatch = 0;

// Comparing and watching must notice the same changes.
class FileWatchTest : public ::testing::TestWithParam<int> {
 protected:
  void watch(const std::string& name) { watchAll({directory_ / name}); }

  void watchAll(const std::vector<std::string>& paths) {
    // Waits until the tick in which the test made the files is over.
    if (GetParam() == kAlwaysCompare) std::this_thread::sleep_for(std::chrono::milliseconds(20));
    watch_.watch(paths);
  }

  TemporaryDirectory directory_;
  FileWatch watch_{GetParam()};
};

INSTANTIATE_TEST_SUITE_P(, FileWatchTest, ::testing::Values(kAlwaysCompare, kAlwaysWatch),
                         [](const auto& mode) { return mode.param == kAlwaysWatch ? "Watching" : "Comparing"; });

TEST_P(FileWatchTest, BeforeAnythingIsWatchedEverythingMayHaveChanged) { EXPECT_TRUE(watch_.changed()); }

TEST_P(FileWatchTest, NothingChangedIfNothingHappened) {
  directory_.write("file", "a");
  watch("file");
  EXPECT_FALSE(watch_.changed());
  EXPECT_FALSE(watch_.changed());
}

TEST_P(FileWatchTest, ReadingIsNoChange) {
  directory_.write("file", "a");
  watch("file");
  testing::contentsOf(directory_ / "file");
  EXPECT_FALSE(watch_.changed());
}

TEST_P(FileWatchTest, AWriteIsNoticedOnce) {
  directory_.write("file", "a");
  watch("file");
  directory_.write("file", "b");
  EXPECT_TRUE(watch_.changed());
  watch("file");
  EXPECT_FALSE(watch_.changed());
}

TEST_P(FileWatchTest, AWriteByAnotherNameOfTheFileIsNoticed) {
  directory_.write("file", "a");
  fs::create_directory(directory_ / "elsewhere");
  fs::create_hard_link(directory_ / "file", directory_ / "elsewhere/other");
  watch("file");
  directory_.write("elsewhere/other", "b");
  EXPECT_TRUE(watch_.changed());
}

TEST_P(FileWatchTest, AFileThatComesIsNoticed) {
  watch("file");
  EXPECT_FALSE(watch_.changed());
  directory_.write("file", "a");
  EXPECT_TRUE(watch_.changed());
}

TEST_P(FileWatchTest, ARemovedFileIsNoticed) {
  directory_.write("file", "a");
  watch("file");
  fs::remove(directory_ / "file");
  EXPECT_TRUE(watch_.changed());
}

TEST_P(FileWatchTest, AFileThatIsReplacedByARenameIsNoticed) {
  directory_.write("file", "a");
  directory_.write("new", "b");
  watch("file");
  fs::rename(directory_ / "new", directory_ / "file");
  EXPECT_TRUE(watch_.changed());
}

TEST_P(FileWatchTest, PermissionsThatChangeAreNoticed) {
  directory_.write("file", "a");
  watch("file");
  ::chmod((directory_ / "file").c_str(), 0600);
  EXPECT_TRUE(watch_.changed());
}

TEST_P(FileWatchTest, OtherFilesOfTheDirectoryDoNotMatter) {
  directory_.write("file", "a");
  watch("file");
  directory_.write("other", "b");
  fs::rename(directory_ / "other", directory_ / "file2");
  EXPECT_FALSE(watch_.changed());
}

TEST_P(FileWatchTest, AFileInDirectoriesThatComeOneAfterTheOtherIsNoticed) {
  for (const char* directory : {"a", "a/b"}) {
    watch("a/b/file");
    fs::create_directory(directory_ / directory);
    watch_.changed();  // may be noticed or not: there is no file before or after
  }
  watch("a/b/file");
  EXPECT_FALSE(watch_.changed());
  directory_.write("a/b/file", "");
  EXPECT_TRUE(watch_.changed());
}

TEST(FileReports, OfADirectoryThatComesAreNoticed) {
  const TemporaryDirectory directory;
  FileWatch watch(kAlwaysWatch);
  watch.watch({directory / "a/b/file"});
  directory.write("a/b/file", "");
  EXPECT_TRUE(watch.changed()) << "only the first directory was watched";
}

TEST_P(FileWatchTest, EveryLinkOfAChainIsWatched) {
  directory_.write("third/file", "a");
  directory_.link("../third/file", "second/link");
  directory_.link(directory_ / "second/link", "first/link");
  const auto replaceLink = [this](const std::string& name) {
    directory_.write(fs::path(name).parent_path() / "elsewhere", "another file");
    directory_.link("elsewhere", name + ".new");
    fs::rename(directory_ / (name + ".new"), directory_ / name);
  };
  watch("first/link");
  EXPECT_FALSE(watch_.changed());
  directory_.write("third/file", "b");
  EXPECT_TRUE(watch_.changed()) << "the file itself";
  watch("first/link");
  EXPECT_FALSE(watch_.changed());
  replaceLink("second/link");
  EXPECT_TRUE(watch_.changed()) << "the link in the middle";
  watch("first/link");
  replaceLink("first/link");
  EXPECT_TRUE(watch_.changed()) << "the first link";
}

TEST_P(FileWatchTest, ALinkAmongTheDirectoriesIsWatched) {
  directory_.write("real/file", "a");
  directory_.link("real", "run");
  watch("run/file");
  directory_.write("real/file", "b");
  EXPECT_TRUE(watch_.changed());
  watch("run/../run/./file");
  directory_.write("real/file", "c");
  EXPECT_TRUE(watch_.changed());
}

TEST_P(FileWatchTest, ALinkToItselfAndOneToNothingCanBeWatched) {
  directory_.link("loop", "loop");
  watch("loop");
  EXPECT_FALSE(watch_.changed());
  directory_.link("nothing", "broken");
  watch("broken");
  EXPECT_FALSE(watch_.changed());
  directory_.write("nothing", "");
  EXPECT_TRUE(watch_.changed());
}

TEST_P(FileWatchTest, SeveralFilesAreWatchedAtOnce) {
  watchAll({directory_ / "a", directory_ / "b"});
  directory_.write("b", "");
  EXPECT_TRUE(watch_.changed());
}

TEST_P(FileWatchTest, APathFromTheCurrentDirectoryIsWatchedThere) {
  const fs::path before = fs::current_path();
  fs::current_path(directory_.path());
  watchAll({"file"});
  EXPECT_FALSE(watch_.changed());
  directory_.write("file", "");
  EXPECT_TRUE(watch_.changed());
  fs::current_path(before);
}

TEST(FileComparison, AWriteInTheTickOfTheLookIsNotMissed) {
  const TemporaryDirectory directory;
  FileWatch watch(kAlwaysCompare);
  std::string text = "a";
  for (int i = 0; i < 200; ++i) {
    const std::string path = directory.write("file", text);
    watch.watch({path});
    text[0] = static_cast<char>('a' + i % 26);
    directory.write("file", text);
    ASSERT_TRUE(watch.changed()) << "the file has the same length, and perhaps the same time";
  }
}

TEST(FileComparison, AfterItsNumberOfQuestionsFilesAreWatched) {
  const TemporaryDirectory directory;
  const std::string path = directory.write("file", "a");
  std::this_thread::sleep_for(std::chrono::milliseconds(20));
  FileWatch watch(3);
  watch.watch({path});
  EXPECT_FALSE(watch.changed());
  EXPECT_FALSE(watch.changed());
  EXPECT_TRUE(watch.changed()) << "what happened up to now is read once more";
  watch.watch({path});
  EXPECT_FALSE(watch.changed());
  directory.write("file", "b");
  EXPECT_TRUE(watch.changed());
  EXPECT_FALSE(watch.changed()) << "a report comes once";
}

TEST(FileReports, ThatWereLostCountAsAChange) {
  const TemporaryDirectory busy("/dev/shm");  // making directories is fast there
  FileWatch watch(kAlwaysWatch);
  watch.watch({busy / "file"});
  // The kernel keeps some thousand events and then reports that it dropped one.
  const std::string other = busy / "other";
  for (int i = 0; i < 20000; ++i) {
    if (::mkdir(other.c_str(), 0700) != 0) ::rmdir(other.c_str());
  }
  EXPECT_TRUE(watch.changed());
  EXPECT_FALSE(watch.changed());
}

TEST(FileReports, FromWaysThatNoFileLeadsAlongAnyMoreDoNotMatter) {
  const TemporaryDirectory directory;
  directory.write("old/file", "a");
  directory.write("new/file", "b");
  FileWatch watch(kAlwaysWatch);
  watch.watch({directory / "old/file"});
  watch.watch({directory / "new/file"});
  directory.write("old/file", "c");
  fs::remove_all(directory / "old");
  EXPECT_FALSE(watch.changed());
  directory.write("new/file", "d");
  EXPECT_TRUE(watch.changed());
}

TEST(FileReports, WithoutInotifyEverythingMayAlwaysHaveChanged) {
  const TemporaryDirectory directory;
  const std::string path = directory.write("file", "a");
  EXPECT_TRUE(succeedsInChild([path] {
    FileWatch watch(kAlwaysWatch);
    const rlimit none{0, 0};
    ::setrlimit(RLIMIT_NOFILE, &none);
    watch.watch({path});
    return watch.changed() && watch.changed();
  }));
}

}  // namespace
}  // namespace zorva::agent
