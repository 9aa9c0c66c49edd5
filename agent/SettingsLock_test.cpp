#include "agent/SettingsLock.h"

#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/file.h>
#include <sys/inotify.h>
#include <sys/stat.h>
#include <unistd.h>

#include <atomic>
#include <filesystem>
#include <thread>
#include <vector>

#include "agent/files/FileLock.h"
#include "agent/testing/TemporaryDirectory.h"
#include "util/FileDescriptor.h"

namespace zorva::agent {
namespace {

using testing::contentsOf;
using ::testing::HasSubstr;
using testing::TemporaryDirectory;

constexpr const char* kFile = "HOSTNAME=host1\nDOMAINNAME=example.org\nMTU=1500\n";

bool canLock(const std::string& path, int operation) {
  const util::FileDescriptor file(::open(path.c_str(), O_RDWR | O_CLOEXEC));
  return file && ::flock(file.get(), operation | LOCK_NB) == 0;
}

TEST(SettingsLock, ReadersShareItAndAChangeHasItAlone) {
  const TemporaryDirectory directory;
  {
    const SettingsLock one(directory.path(), Access::Read);
    const SettingsLock other(directory.path(), Access::Read);
    EXPECT_TRUE(canLock(directory / "settings.lock", LOCK_SH));
    EXPECT_FALSE(canLock(directory / "settings.lock", LOCK_EX));
  }
  const SettingsLock change(directory.path(), Access::Change);
  EXPECT_FALSE(canLock(directory / "settings.lock", LOCK_SH));
}

TEST(SettingsLock, ReadingIsNoChangeOfTheDirectory) {
  const TemporaryDirectory directory;
  { const SettingsLock makesTheFiles(directory.path(), Access::Read); }
  const util::FileDescriptor watch(::inotify_init1(IN_CLOEXEC | IN_NONBLOCK));
  constexpr std::uint32_t kChanges = IN_CLOSE_WRITE | IN_CREATE | IN_DELETE | IN_MOVE | IN_ATTRIB | IN_MODIFY;
  ASSERT_GE(::inotify_add_watch(watch.get(), directory.path().c_str(), kChanges), 0);
  const auto hasChanged = [&] {
    char events[4096];
    return ::read(watch.get(), events, sizeof events) > 0;
  };
  { const SettingsLock read(directory.path(), Access::Read); }
  EXPECT_FALSE(hasChanged());
  { const SettingsLock change(directory.path(), Access::Change); }
  EXPECT_TRUE(hasChanged());
}

TEST(FileLock, WaitsNoLongerThanAllowed) {
  const TemporaryDirectory directory;
  const std::string path = directory / "lock";
  const FileLock held(path);
  try {
    const auto deadline = std::chrono::steady_clock::now() + std::chrono::milliseconds(20);
    const FileLock other(openLockFile(path, 0600), path, FileLock::Mode::Shared, deadline);
    FAIL();
  } catch (const std::runtime_error& error) {
    EXPECT_EQ(error.what(), path + ": another process has held the lock for too long");
  }
}

TEST(SettingsLock, ThreadsOfOneProcessExcludeEachOther) {
  const TemporaryDirectory directory;
  std::atomic<int> inside = 0;
  std::vector<std::thread> threads;
  threads.reserve(4);
  for (int i = 0; i < 4; ++i) {
    threads.emplace_back([&] {
      for (int n = 0; n < 20; ++n) {
        const SettingsLock lock(directory.path(), Access::Change);
        EXPECT_EQ(++inside, 1);
        std::this_thread::yield();
        --inside;
      }
    });
  }
  for (std::thread& each : threads) each.join();
}

TEST(SettingsLock, AChangeGetsItsTurnAlthoughReadersNeverLeaveItFree) {
  const TemporaryDirectory directory;
  std::atomic<bool> done = false;
  std::vector<std::thread> readers;
  readers.reserve(3);
  for (int i = 0; i < 3; ++i) {
    readers.emplace_back([&, i] {
      while (!done) {
        const SettingsLock lock(directory.path(), Access::Read);
        std::this_thread::sleep_for(std::chrono::milliseconds(20 + i));
      }
    });
  }
  for (int i = 0; i < 5; ++i) EXPECT_NO_THROW(SettingsLock(directory.path(), Access::Change));
  done = true;
  for (std::thread& each : readers) each.join();
}

TEST(SettingsLock, WhoReadsNeedsNoDirectory) {
  EXPECT_NO_THROW(SettingsLock("/nowhere/", Access::Read));
  try {
    const SettingsLock lock("/nowhere/", Access::Change);
    FAIL();
  } catch (const std::runtime_error& error) {
    EXPECT_STREQ(error.what(), "/nowhere/: there is no such data directory");
  }
}

TEST(SettingsLock, OnlyThoseWhoMayWriteTheDirectoryMayHoldIt) {
  const TemporaryDirectory directory;
  ::chmod(directory.path().c_str(), 0775);
  const SettingsLock lock(directory.path(), Access::Change);
  struct stat status {};
  ASSERT_EQ(::stat((directory / "settings.lock").c_str(), &status), 0);
  EXPECT_EQ(status.st_mode & 0777U, 0660U);
}

TEST(SettingsLock, WhoMayNotOpenItReadsAllTheSame) {
  if (::geteuid() != 0) GTEST_SKIP() << "only root can become somebody else";
  const TemporaryDirectory directory;
  ::chmod(directory.path().c_str(), 0755);
  const SettingsLock change(directory.path(), Access::Change);
  EXPECT_TRUE(testing::succeedsInChild([&] {
    if (::setuid(65534) != 0) return false;
    const SettingsLock lock(directory.path(), Access::Read);
    return true;
  }));
}

/// Makes a change after which the file has that text.
std::string finishAfter(const TemporaryDirectory& directory, const std::string& text) {
  directory.write("ifcfg-eth0", kFile);
  SettingsLock lock(directory.path(), Access::Change);
  lock.keepAside("eth0");
  EXPECT_EQ(contentsOf(directory / "settings.before"), kFile);
  directory.write("ifcfg-eth0", text);
  std::string problem = lock.finish();
  EXPECT_FALSE(std::filesystem::exists(directory / "settings.before"));
  EXPECT_EQ(contentsOf(directory / "settings.lock"), "");
  return problem;
}

void expectToStay(const std::string& text) {
  const TemporaryDirectory directory;
  EXPECT_EQ(finishAfter(directory, text), "");
  EXPECT_EQ(contentsOf(directory / "ifcfg-eth0"), text);
}

TEST(SettingsLock, AFileThatWasRewrittenWholeStays) {
  expectToStay("HOSTNAME=new\nDOMAINNAME=example.org\nMTU=1500\n");
}

TEST(SettingsLock, AFileThatWasCutShortIsPutBack) {
  const TemporaryDirectory directory;
  for (const char* text : {"", "HOSTNAME=ne", "HOSTNAME=new\nDOMAINNAME=example.org\n"}) {
    EXPECT_THAT(finishAfter(directory, text), HasSubstr("ifcfg-eth0: could not be written whole, and is as it was"));
    EXPECT_EQ(contentsOf(directory / "ifcfg-eth0"), kFile);
  }
}

TEST(SettingsLock, WhatSomebodyElseWroteMeanwhileStays) { expectToStay("OTHER=1\n"); }

TEST(SettingsLock, NothingIsKeptAsideOfWhatIsNoFile) {
  const TemporaryDirectory directory;
  SettingsLock lock(directory.path(), Access::Change);
  for (const std::string& name : {std::string("eth9"), std::string("../x"), std::string(), std::string("a\0b", 3)}) {
    EXPECT_NO_THROW(lock.keepAside(name));
  }
  EXPECT_FALSE(std::filesystem::exists(directory / "settings.before"));
}

TEST(SettingsLock, TheFileThatIsKeptAsideIsAsClosedToOthersAsItself) {
  const TemporaryDirectory directory;
  ::chmod(directory.write("ifcfg-eth0", kFile).c_str(), 0600);
  SettingsLock lock(directory.path(), Access::Change);
  lock.keepAside("eth0");
  struct stat status {};
  ASSERT_EQ(::stat((directory / "settings.before").c_str(), &status), 0);
  EXPECT_EQ(status.st_mode & 0777U, 0600U);
}

/// Leaves the data directory as a process does that is killed when the file has that text.
void dieAfter(const TemporaryDirectory& directory, const std::string& text) {
  directory.write("ifcfg-eth0", kFile);
  const pid_t child = testing::startChild([&] {
    SettingsLock lock(directory.path(), Access::Change);
    lock.keepAside("eth0");
    directory.write("ifcfg-eth0", text);
    ::_exit(0);
    return true;
  });
  ASSERT_TRUE(testing::succeeded(child));
  ASSERT_EQ(contentsOf(directory / "settings.lock"), "eth0");
}

TEST(SettingsLock, WhoTakesItNextPutsBackWhatAKilledProcessLeft) {
  for (const Access access : {Access::Read, Access::Change}) {
    const TemporaryDirectory directory;
    dieAfter(directory, "HOSTNAME=ne");
    const SettingsLock lock(directory.path(), access);
    EXPECT_EQ(contentsOf(directory / "ifcfg-eth0"), kFile);
    EXPECT_FALSE(std::filesystem::exists(directory / "settings.before"));
    EXPECT_EQ(contentsOf(directory / "settings.lock"), "");
  }
}

TEST(SettingsLock, AChangeThatWasWholeWhenItsProcessWasKilledStays) {
  const TemporaryDirectory directory;
  dieAfter(directory, "HOSTNAME=new\nDOMAINNAME=example.org\nMTU=1500\n");
  const SettingsLock lock(directory.path(), Access::Read);
  EXPECT_THAT(contentsOf(directory / "ifcfg-eth0"), HasSubstr("HOSTNAME=new\n"));
}

TEST(SettingsLock, ALockFileWithNonsenseInItIsHarmless) {
  const TemporaryDirectory directory;
  directory.write("settings.before", kFile);
  directory.write("ifcfg-eth0", "");
  for (const std::string& text : {std::string("../x"), std::string(4000, 'x'), std::string("a\0b", 3)}) {
    directory.write("settings.lock", text);
    const SettingsLock lock(directory.path(), Access::Change);
    EXPECT_EQ(contentsOf(directory / "settings.lock"), "");
    EXPECT_EQ(contentsOf(directory / "ifcfg-eth0"), "");
  }
}

TEST(SettingsLock, TheTargetOfALinkIsRestoredInPlace) {
  const TemporaryDirectory directory;
  directory.write("elsewhere/file", kFile);
  directory.link(directory / "elsewhere/file", "ifcfg-eth0");
  SettingsLock lock(directory.path(), Access::Change);
  lock.keepAside("eth0");
  directory.write("elsewhere/file", "HOST");
  EXPECT_NE(lock.finish(), "");
  EXPECT_EQ(contentsOf(directory / "elsewhere/file"), kFile);
  EXPECT_TRUE(std::filesystem::is_symlink(directory / "ifcfg-eth0"));
}

}  // namespace
}  // namespace zorva::agent
