#include "http/Listener.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

#include <chrono>
#include <stdexcept>
#include <thread>

#include "agent/testing/TemporaryDirectory.h"

namespace zorva::http {
namespace {

using ::testing::HasSubstr;
using ::testing::StartsWith;

class UnixListener : public ::testing::Test {
 protected:
  std::string problem() const {
    try {
      listenOnUnix(path_);
    } catch (const std::runtime_error& error) {
      return error.what();
    }
    return "nothing";
  }

  bool exists() const { return ::access(path_.c_str(), F_OK) == 0; }

  const agent::testing::TemporaryDirectory directory_;
  const std::string path_ = directory_ / "cim.sock";
};

TEST_F(UnixListener, IsForAllUsersAndRemovesItsFile) {
  {
    const Listener listener = listenOnUnix(path_);
    struct stat file {};
    ASSERT_EQ(::stat(path_.c_str(), &file), 0);
    EXPECT_EQ(file.st_mode & 07777U, 0666U);
    EXPECT_EQ(listener.url, "unix:" + path_);
    EXPECT_TRUE(listener.isLocal);
  }
  EXPECT_FALSE(exists());
}

TEST_F(UnixListener, ReplacesTheFileOfADeadServer) {
  Listener dead = listenOnUnix(path_);
  dead.socket.reset();
  ASSERT_TRUE(exists());
  EXPECT_EQ(problem(), "nothing");
}

TEST_F(UnixListener, LeavesTheFileOfItsSuccessor) {
  Listener dead = listenOnUnix(path_);
  dead.socket.reset();
  std::this_thread::sleep_for(std::chrono::milliseconds(20));  // the clock of file systems is coarse
  const Listener successor = listenOnUnix(path_);
  dead.file.reset();
  EXPECT_TRUE(exists());
}

TEST_F(UnixListener, IsRefusedWhereAServerListens) {
  const Listener live = listenOnUnix(path_);
  EXPECT_THAT(problem(), HasSubstr("another server listens there"));
  EXPECT_TRUE(exists());
}

TEST_F(UnixListener, IsRefusedWhereThereIsAnotherFile) {
  directory_.write("cim.sock", "text");
  EXPECT_THAT(problem(), HasSubstr("there is a file, and no socket"));
  EXPECT_EQ(agent::testing::contentsOf(path_), "text");
}

TEST(Listeners, APathThatIsTooLongIsRefused) {
  EXPECT_THROW(listenOnUnix("/tmp/" + std::string(200, 'x')), std::runtime_error);
  EXPECT_THROW(listenOnUnix("/no/such/directory/cim.sock"), std::runtime_error);
}

TEST(Listeners, OnlyHttpsListensOnAllAddresses) {
  EXPECT_THROW(checkAddresses({"0.0.0.0"}), std::invalid_argument);
  EXPECT_NO_THROW(checkAddresses({"0.0.0.0", "::"}, Door::Https));
  EXPECT_THROW(checkAddresses({"host1"}, Door::Https), std::invalid_argument);
  const auto listeners = listenOn(Addresses{"0.0.0.0"}, 0, Door::Https);
  EXPECT_THAT(listeners.front().url, StartsWith("https://0.0.0.0:"));
  EXPECT_FALSE(listeners.front().isLocal);
}

}  // namespace
}  // namespace zorva::http
