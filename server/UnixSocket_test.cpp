// zorvacimd on a Unix socket, and sockets of the service manager.

#include <arpa/inet.h>
#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <netinet/in.h>
#include <signal.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

#include <chrono>
#include <cstdlib>
#include <cstring>
#include <vector>

#include "http/testing/TestCertificates.h"
#include "http/testing/TestWire.h"
#include "server/testing/TestDaemon.h"
#include "util/FileDescriptor.h"

namespace zorva::server {
namespace {

using http::testing::outputOf;
using std::chrono::seconds;
using ::testing::AllOf;
using ::testing::HasSubstr;
using ::testing::Not;
using testing::TestDaemon;

const std::string kSocket = "[listen]\nsocket = \"cim.sock\"\n";

std::string page(const std::string& socket, const std::string& options = {}) {
  return outputOf("curl -sS --unix-socket " + socket + " " + options + " http://localhost/");
}

TEST(UnixSocket, AnswersAndIsRemovedAtTheEnd) {
  TestDaemon daemon(kSocket);
  const std::string path = daemon.directory() / "cim.sock";
  EXPECT_THAT(page(path), AllOf(HasSubstr("This is zorvacimd "), HasSubstr("zorvactl --url unix:" + path + " show")));
  EXPECT_TRUE(daemon.logs("process ")) << daemon.log();
  EXPECT_THAT(daemon.log(), Not(HasSubstr("TCP")));
  daemon.signal(SIGTERM);
  EXPECT_EQ(daemon.exitCodeWithin(seconds(20)), 0);
  EXPECT_NE(::access(path.c_str(), F_OK), 0);
}

TEST(UnixSocket, TakesAnyHost) {
  const TestDaemon daemon(kSocket);
  EXPECT_THAT(page(daemon.directory() / "cim.sock", "-H 'Host: any.example.net'"), HasSubstr("This is zorvacimd "));
}

TEST(UnixSocket, TheUserOfAChangeIsTheOneOfTheProcess) {
  const TestDaemon daemon(kSocket);
  const std::string whole = testing::changeOfDomain();
  const std::string request = daemon.directory().write("request", whole.substr(whole.find("\r\n\r\n") + 4));
  page(daemon.directory() / "cim.sock",
       "-H 'Content-Type: application/xml' -H 'CIMOperation: MethodCall' -H 'CIMMethod: "
       "SetProperty' -H 'CIMObject: root/cimv2' --data-binary @" +
           request);
  EXPECT_TRUE(daemon.logs(" (user " + std::to_string(::getuid()) + ")\" operation=SetProperty ")) << daemon.log();
}

TEST(UnixSocket, ReplacesTheOneOfAServerThatWasKilled) {
  const agent::testing::TemporaryDirectory directory;
  const std::string path = directory / "cim.sock";
  const std::string config = "[listen]\nsocket = \"" + path + "\"\n";
  {
    TestDaemon killed(config);
    killed.signal(SIGKILL);
    killed.exitCodeWithin(seconds(20));
  }
  ASSERT_EQ(::access(path.c_str(), F_OK), 0);
  const TestDaemon daemon(config);
  EXPECT_THAT(page(path), HasSubstr("This is zorvacimd "));
  try {
    const TestDaemon second(config);
    ADD_FAILURE() << "two servers listen";
  } catch (const std::runtime_error& error) {
    EXPECT_THAT(error.what(), HasSubstr("cim.sock: another server listens there"));
  }
}

// ---- Sockets that are handed over ----

/// Passes a listening socket on as descriptor 3 + place.
void handOver(int place, const sockaddr* address, socklen_t size) {
  const int socket = ::socket(address->sa_family, SOCK_STREAM, 0);
  ::bind(socket, address, size);
  ::listen(socket, 16);
  ::dup2(socket, 3 + place);
}

void handOverTcp(int place, const char* host) {
  sockaddr_in name{};
  name.sin_family = AF_INET;
  ::inet_pton(AF_INET, host, &name.sin_addr);
  handOver(place, reinterpret_cast<const sockaddr*>(&name), sizeof name);
}

void announce(const char* count, const char* names) {
  ::setenv("LISTEN_PID", std::to_string(::getpid()).c_str(), 1);
  ::setenv("LISTEN_FDS", count, 1);
  ::setenv("LISTEN_FDNAMES", names, 1);
}

TEST(InheritedSockets, AreOfAllKinds) {
  const agent::testing::TemporaryDirectory directory;
  const auto files = http::testing::TestAuthority(directory, "ca").issue("server");
  const std::string path = directory / "cim.sock";
  // The daemon's outputs must not be among the descriptors that are handed over.
  std::vector<util::FileDescriptor> places;
  for (int i = 0; i < 3; ++i) places.emplace_back(::fcntl(STDIN_FILENO, F_DUPFD_CLOEXEC, 3));
  const TestDaemon daemon("[tls]\ncertificate = \"" + files.certificate + "\"\nkey = \"" + files.key + "\"\n",
                          {"--log-level", "4500"}, [&] {
                            sockaddr_un name{};
                            name.sun_family = AF_UNIX;
                            std::memcpy(name.sun_path, path.c_str(), path.size());
                            handOver(0, reinterpret_cast<const sockaddr*>(&name), sizeof name);
                            handOverTcp(1, "127.0.0.1");
                            handOverTcp(2, "127.0.0.1");
                            announce("3", "socket:https:http");
                          });
  EXPECT_THAT(page(path), HasSubstr("This is zorvacimd "));
  ASSERT_NE(daemon.tlsPort(), 0);
  ASSERT_NE(daemon.port(), 0);
  EXPECT_THAT(outputOf("curl -sSk https://localhost:" + std::to_string(daemon.tlsPort())),
              HasSubstr("This is zorvacimd "));
  EXPECT_THAT(outputOf("curl -sS http://localhost:" + std::to_string(daemon.port())), HasSubstr("This is zorvacimd "));
}

TEST(InheritedSockets, WithoutHttpsLeaveItToTheConfiguration) {
  const agent::testing::TemporaryDirectory directory;
  const auto files = http::testing::TestAuthority(directory, "ca").issue("server");
  const TestDaemon daemon("[tls]\ncertificate = \"" + files.certificate + "\"\nkey = \"" + files.key + "\"\nport = 0\n",
                          {"--log-level", "4500"}, [] {
                            handOverTcp(0, "127.0.0.1");
                            announce("1", "http");
                          });
  ASSERT_NE(daemon.tlsPort(), 0);
  EXPECT_THAT(outputOf("curl -sSk https://localhost:" + std::to_string(daemon.tlsPort())),
              HasSubstr("This is zorvacimd "));
}

TEST(InheritedSockets, OfOtherAddressesNeedLogins) {
  const agent::testing::TemporaryDirectory directory;
  const auto files = http::testing::TestAuthority(directory, "ca").issue("server");
  try {
    const TestDaemon daemon("[tls]\ncertificate = \"" + files.certificate + "\"\nkey = \"" + files.key + "\"\n",
                            {"--log-level", "4500"}, [] {
                              handOverTcp(0, "0.0.0.0");
                              announce("1", "https");
                            });
    ADD_FAILURE() << "it serves on port " << daemon.tlsPort();
  } catch (const std::runtime_error& error) {
    EXPECT_THAT(error.what(), HasSubstr("can be reached from other hosts, and nobody can log in"));
  }
}

}  // namespace
}  // namespace zorva::server
