#include "http/ClientIdentity.h"

#include <arpa/inet.h>
#include <gtest/gtest.h>
#include <netinet/in.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstring>

#include "util/FileDescriptor.h"

namespace zorva::http {
namespace {

sockaddr_in loopback(const char* address) {
  sockaddr_in name{};
  name.sin_family = AF_INET;
  ::inet_pton(AF_INET, address, &name.sin_addr);
  return name;
}

/// Listens, and reports the client of a connection.
class Host {
 public:
  Host() : socket_(::socket(AF_INET, SOCK_STREAM, 0)) {
    sockaddr_in name = loopback("127.0.0.1");
    EXPECT_EQ(::bind(socket_.get(), reinterpret_cast<const sockaddr*>(&name), sizeof name), 0);
    EXPECT_EQ(::listen(socket_.get(), 4), 0);
    socklen_t size = sizeof address_;
    ::getsockname(socket_.get(), reinterpret_cast<sockaddr*>(&address_), &size);
  }

  util::FileDescriptor connectFrom(const char* address) const {
    util::FileDescriptor client(::socket(AF_INET, SOCK_STREAM, 0));
    const sockaddr_in name = loopback(address);
    EXPECT_EQ(::bind(client.get(), reinterpret_cast<const sockaddr*>(&name), sizeof name), 0);
    EXPECT_EQ(::connect(client.get(), reinterpret_cast<const sockaddr*>(&address_), sizeof address_), 0);
    return client;
  }

  std::string next() const {
    sockaddr_storage peer{};
    socklen_t size = sizeof peer;
    const util::FileDescriptor taken(::accept(socket_.get(), reinterpret_cast<sockaddr*>(&peer), &size));
    return clientOf(taken.get(), peer);
  }

 private:
  util::FileDescriptor socket_;
  sockaddr_in address_{};
};

TEST(ClientIdentity, IsTheUserWhicheverLoopbackAddressAndPortAreUsed) {
  const Host host;
  const util::FileDescriptor one = host.connectFrom("127.0.0.1");
  const std::string client = host.next();
  if (client == "this host") GTEST_SKIP() << "the kernel does not say who owns a socket";
  EXPECT_EQ(client, "user " + std::to_string(::getuid()));
  const util::FileDescriptor other = host.connectFrom("127.0.0.7");
  EXPECT_EQ(host.next(), client);
}

TEST(ClientIdentity, TellsUsersApart) {
  constexpr uid_t kOther = 65534;
  if (::getuid() != 0) GTEST_SKIP() << "another user is needed";
  const Host host;
  int ends[2];
  ASSERT_EQ(::pipe(ends), 0);
  const pid_t child = ::fork();
  if (child == 0) {
    const bool changed = ::setuid(kOther) == 0;
    const util::FileDescriptor connection = changed ? host.connectFrom("127.0.0.1") : util::FileDescriptor();
    char byte = 0;
    ::close(ends[1]);
    ::_exit(::read(ends[0], &byte, 1) == 0 ? 0 : 1);
  }
  const std::string client = host.next();
  ::close(ends[1]);
  ::close(ends[0]);
  ::waitpid(child, nullptr, 0);
  if (client == "this host") GTEST_SKIP() << "the kernel does not say who owns a socket";
  EXPECT_EQ(client, "user 65534");
}

TEST(ClientIdentity, OfAnotherHostIsItsAddress) {
  const sockaddr_in name = loopback("192.0.2.7");
  sockaddr_storage peer{};
  std::memcpy(&peer, &name, sizeof name);
  EXPECT_EQ(clientOf(-1, peer), "192.0.2.7");
}

}  // namespace
}  // namespace zorva::http
