#include "agent/files/FileWatch.h"

#include <gtest/gtest.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <unistd.h>

#include <filesystem>

#include "agent/testing/TemporaryDirectory.h"

namespace zorvagent {
namespace {

using testing::succeedsInChild;
using testing::TemporaryDirectory;
namespace fs = std::filesystem;

class FileWatchTest : public ::testing::Test {
 protected:
  void watch(const std::string& name) { watch_.watch({directory_ / name}); }

  TemporaryDirectory directory_;
  FileWatch watch_;
};

TEST_F(FileWatchTest, BeforeAnythingIsWatchedEverythingMayHaveChanged) { EXPECT_TRUE(watch_.changed()); }

TEST_F(FileWatchTest, NothingChangedWhereNothingHappened) {
  directory_.write("file", "a");
  watch("file");
  EXPECT_FALSE(watch_.changed());
  EXPECT_FALSE(watch_.changed());
}

TEST_F(FileWatchTest, ReadingIsNoChange) {
  directory_.write("file", "a");
  watch("file");
  testing::contentsOf(directory_ / "file");
  EXPECT_FALSE(watch_.changed());
}

TEST_F(FileWatchTest, AWriteIsReportedOnce) {
  directory_.write("file", "a");
  watch("file");
  directory_.write("file", "b");
  EXPECT_TRUE(watch_.changed());
  EXPECT_FALSE(watch_.changed());
}

TEST_F(FileWatchTest, AWriteByAnotherNameOfTheFileIsNoticed) {
  directory_.write("file", "a");
  fs::create_directory(directory_ / "elsewhere");
  fs::create_hard_link(directory_ / "file", directory_ / "elsewhere/other");
  watch("file");
  directory_.write("elsewhere/other", "b");
  EXPECT_TRUE(watch_.changed());
}

TEST_F(FileWatchTest, AFileThatComesIsNoticed) {
  watch("file");
  EXPECT_FALSE(watch_.changed());
  directory_.write("file", "a");
  EXPECT_TRUE(watch_.changed());
}

TEST_F(FileWatchTest, AFileThatGoesIsNoticed) {
  directory_.write("file", "a");
  watch("file");
  fs::remove(directory_ / "file");
  EXPECT_TRUE(watch_.changed());
}

TEST_F(FileWatchTest, AFileThatIsReplacedByARenameIsNoticed) {
  directory_.write("file", "a");
  directory_.write("new", "b");
  watch("file");
  fs::rename(directory_ / "new", directory_ / "file");
  EXPECT_TRUE(watch_.changed());
}

TEST_F(FileWatchTest, PermissionsThatChangeAreNoticed) {
  directory_.write("file", "a");
  watch("file");
  ::chmod((directory_ / "file").c_str(), 0600);
  EXPECT_TRUE(watch_.changed());
}

TEST_F(FileWatchTest, OtherFilesOfTheDirectoryDoNotMatter) {
  directory_.write("file", "a");
  watch("file");
  directory_.write("other", "b");
  fs::rename(directory_ / "other", directory_ / "file2");
  EXPECT_FALSE(watch_.changed());
}

TEST_F(FileWatchTest, DirectoriesThatComeOneAfterTheOtherAreNoticed) {
  watch("a/b/file");
  fs::create_directory(directory_ / "a");
  EXPECT_TRUE(watch_.changed());
  watch("a/b/file");
  fs::create_directory(directory_ / "a/b");
  EXPECT_TRUE(watch_.changed());
  watch("a/b/file");
  directory_.write("a/b/file", "");
  EXPECT_TRUE(watch_.changed());
}

TEST_F(FileWatchTest, EveryLinkOfAChainIsWatched) {
  directory_.write("third/file", "a");
  directory_.link("../third/file", "second/link");
  directory_.link(directory_ / "second/link", "first/link");
  const auto replaceLink = [this](const std::string& name) {
    directory_.link("elsewhere", name + ".new");
    fs::rename(directory_ / (name + ".new"), directory_ / name);
  };
  watch("first/link");
  EXPECT_FALSE(watch_.changed());
  directory_.write("third/file", "b");
  EXPECT_TRUE(watch_.changed()) << "the file itself";
  replaceLink("second/link");
  EXPECT_TRUE(watch_.changed()) << "the link in the middle";
  watch("first/link");
  replaceLink("first/link");
  EXPECT_TRUE(watch_.changed()) << "the first link";
}

TEST_F(FileWatchTest, ALinkAmongTheDirectoriesIsWatched) {
  directory_.write("real/file", "a");
  directory_.link("real", "run");
  watch("run/file");
  directory_.write("real/file", "b");
  EXPECT_TRUE(watch_.changed());
  watch("run/../run/./file");
  directory_.write("real/file", "c");
  EXPECT_TRUE(watch_.changed());
}

TEST_F(FileWatchTest, ALinkToItselfAndOneToNothingCanBeWatched) {
  directory_.link("loop", "loop");
  watch("loop");
  EXPECT_FALSE(watch_.changed());
  directory_.link("nothing", "broken");
  watch("broken");
  EXPECT_FALSE(watch_.changed());
  directory_.write("nothing", "");
  EXPECT_TRUE(watch_.changed());
}

TEST_F(FileWatchTest, SeveralFilesAreWatchedAtOnce) {
  watch_.watch({directory_ / "a", directory_ / "b"});
  directory_.write("b", "");
  EXPECT_TRUE(watch_.changed());
}

TEST_F(FileWatchTest, APathFromTheCurrentDirectoryIsWatchedThere) {
  const fs::path before = fs::current_path();
  fs::current_path(directory_.path());
  watch_.watch({"file"});
  fs::current_path(before);
  EXPECT_FALSE(watch_.changed());
  directory_.write("file", "");
  EXPECT_TRUE(watch_.changed());
}

TEST_F(FileWatchTest, ReportsThatWereLostCountAsAChange) {
  const TemporaryDirectory busy("/dev/shm");  // where making directories is quick
  watch_.watch({busy / "file"});
  // The kernel keeps some thousand reports and then says that it dropped one.
  const std::string other = busy / "other";
  for (int i = 0; i < 20000; ++i) {
    if (::mkdir(other.c_str(), 0700) != 0) ::rmdir(other.c_str());
  }
  EXPECT_TRUE(watch_.changed());
  EXPECT_FALSE(watch_.changed());
}

TEST_F(FileWatchTest, WithoutInotifyEverythingMayAlwaysHaveChanged) {
  const std::string path = directory_.write("file", "a");
  EXPECT_TRUE(succeedsInChild([path] {
    FileWatch watch;
    const rlimit none{0, 0};
    ::setrlimit(RLIMIT_NOFILE, &none);
    watch.watch({path});
    return watch.changed() && watch.changed();
  }));
}

}  // namespace
}  // namespace zorvagent
