#include "access/UsersFile.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include "agent/testing/TemporaryDirectory.h"

namespace zorva::access {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

class UsersFile : public ::testing::Test {
 protected:
  std::string path() const { return directory_ / "users"; }

  /// Closed to other users, as zorvactl makes it.
  void writeUsers(const std::string& text) const { ::chmod(directory_.write("users", text).c_str(), 0640); }

  mode_t mode() const {
    struct stat status {};
    ::stat(path().c_str(), &status);
    return status.st_mode & 07777U;
  }
  std::function<void(const std::string&)> log() {
    return [this](const std::string& line) { lines_.push_back(line); };
  }

  zorva::agent::testing::TemporaryDirectory directory_;
  std::vector<std::string> lines_;
};

TEST_F(UsersFile, AFileThatIsAbsentHasNoUsers) { EXPECT_TRUE(readUsersFile(path()).isEmpty()); }

TEST_F(UsersFile, ADirectoryIsNoFile) { EXPECT_THROW(readUsersFile(directory_.path()), UsersError); }

TEST_F(UsersFile, ANewFileIsNotReadableForAll) {
  Users users;
  users.put({"alice"});
  EXPECT_EQ(writeUsersFile(path(), users, "no-such-group"), "");
  EXPECT_EQ(mode(), 0640U);
  EXPECT_NE(readUsersFile(path()).find("alice"), nullptr);
}

TEST_F(UsersFile, AFileKeepsItsRights) {
  directory_.write("users", "bob:*:read\n");
  ::chmod(path().c_str(), 0600);
  Users users = readUsersFile(path());
  users.put({"alice"});
  EXPECT_EQ(writeUsersFile(path(), users, "no-such-group"), "");
  EXPECT_EQ(mode(), 0600U);
}

TEST_F(UsersFile, ASymbolicLinkStays) {
  directory_.write("real", "bob:*:read\n");
  ASSERT_EQ(::symlink((directory_ / "real").c_str(), path().c_str()), 0);
  EXPECT_EQ(writeUsersFile(path(), Users(), "no-such-group"), "");
  struct stat status {};
  ::lstat(path().c_str(), &status);
  EXPECT_TRUE(S_ISLNK(status.st_mode));
  EXPECT_EQ(zorva::agent::testing::contentsOf(directory_ / "real"), "");
}

TEST_F(UsersFile, IfItCannotBeWrittenTheOldOneStays) {
  directory_.write("users", "bob:*:read\n");
  ASSERT_EQ(::mkdir((path() + ".new").c_str(), 0700), 0);
  EXPECT_THROW((void)writeUsersFile(path(), Users(), "no-such-group"), std::runtime_error);
  EXPECT_NE(readUsersFile(path()).find("bob"), nullptr);
}

TEST_F(UsersFile, AChangeIsReadOnce) {
  writeUsers("bob:*:read\n");
  WatchedUsers users(path(), log());
  EXPECT_EQ(users.refresh(), nullptr);
  writeUsers("bob:*:read\nalice:*:read\n");
  const auto before = users.refresh();
  ASSERT_NE(before, nullptr);
  EXPECT_EQ(before->find("alice"), nullptr);
  EXPECT_NE(users.users()->find("alice"), nullptr);
  EXPECT_EQ(users.refresh(), nullptr);
  ::unlink(path().c_str());
  EXPECT_NE(users.refresh(), nullptr);
  EXPECT_TRUE(users.users()->isEmpty());
}

TEST_F(UsersFile, AFileThatBreaksLeavesTheUsersAndOneLine) {
  writeUsers("bob:*:read\n");
  WatchedUsers users(path(), log());
  writeUsers("bob:*:read\nalice\n");
  EXPECT_EQ(users.refresh(), nullptr);
  EXPECT_EQ(users.refresh(), nullptr);
  EXPECT_NE(users.users()->find("bob"), nullptr);
  EXPECT_THAT(lines_, ElementsAre(HasSubstr("the users stay as they were: " + path() + ":2: ")));
}

TEST_F(UsersFile, AFileThatAllMayReadLeavesALine) {
  directory_.write("users", "bob:*:read\n");
  ::chmod(path().c_str(), 0644);
  const WatchedUsers users(path(), log());
  EXPECT_THAT(lines_, ElementsAre(path() + ": all users of this host may read it; its rights should be 0640"));
}

TEST_F(UsersFile, AFileThatIsBrokenAtTheStartIsAnError) {
  directory_.write("users", "bob\n");
  EXPECT_THROW(WatchedUsers(path(), log()), UsersError);
  EXPECT_THAT(lines_, IsEmpty());
}

}  // namespace
}  // namespace zorva::access
