#include "http/Reception.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <poll.h>
#include <sys/socket.h>

#include <algorithm>
#include <chrono>
#include <string>
#include <string_view>

#include "http/testing/TestCertificates.h"
#include "http/testing/TestServer.h"
#include "http/testing/TestWire.h"
#include "util/FileDescriptor.h"

namespace zorva::http {
namespace {

using std::chrono::milliseconds;
using std::chrono::seconds;
using ::testing::HasSubstr;
using testing::Server;
using ::testing::StartsWith;
using testing::Wire;
using testing::WireResponse;

/// A port of the loopback interface.
class Listening {
 public:
  Listening() {
    address_.sin_family = AF_INET;
    address_.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    socklen_t size = sizeof address_;
    EXPECT_EQ(::bind(socket_.get(), place(), size), 0);
    EXPECT_EQ(::listen(socket_.get(), 1), 0);
    EXPECT_EQ(::getsockname(socket_.get(), place(), &size), 0);
  }

  util::FileDescriptor connect() const {
    util::FileDescriptor client(::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0));
    EXPECT_EQ(::connect(client.get(), place(), sizeof address_), 0);
    const int isOn = 1;
    ::setsockopt(client.get(), IPPROTO_TCP, TCP_NODELAY, &isOn, sizeof isOn);
    return client;
  }

  util::FileDescriptor accept() const { return util::FileDescriptor(::accept(socket_.get(), nullptr, nullptr)); }

 private:
  const sockaddr* place() const { return reinterpret_cast<const sockaddr*>(&address_); }
  sockaddr* place() { return reinterpret_cast<sockaddr*>(&address_); }

  util::FileDescriptor socket_{::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0)};
  sockaddr_in address_{};
};

class Ports : public ::testing::Test {
 protected:
  std::shared_ptr<const TlsIdentity> identity() const {
    const testing::IssuedFiles files = testing::TestAuthority(directory_, "ca").issue("server");
    return TlsIdentity::load({files.certificate, files.key, {}});
  }

  std::unique_ptr<Server> serverWith(const HttpLimits& limits = {}) const {
    return std::make_unique<Server>([](const HttpRequest&, ResponseSink& sink) { sink.begin(200, {}); }, limits,
                                    Pages{{"/", textPage("This is a server.\n")}},
                                    std::make_shared<access::OpenGate>(access::Role::Read), identity());
  }

  const agent::testing::TemporaryDirectory directory_;
};

TEST_F(Ports, OfHttpsAnswerARequestWithoutTls) {
  const auto server = serverWith();
  for (const char* request : {"GET / HTTP/1.1\r\nHost: localhost\r\n\r\n", "\r\nGET / HTTP/1.1\r\n", "post"}) {
    Wire wire(server->tlsPort());
    ASSERT_TRUE(wire.send(request));
    const WireResponse answer = wire.receive(seconds(5));
    EXPECT_EQ(answer.status, 400);
    EXPECT_TRUE(answer.complete);
    EXPECT_EQ(answer.body,
              "This port speaks HTTPS: use https://127.0.0.1:" + std::to_string(server->tlsPort()) + "/\n");
  }
}

TEST_F(Ports, OfHttpsAnswerALongRequestWithoutTls) {
  const auto server = serverWith();
  Wire wire(server->tlsPort());
  wire.send(testing::posting(std::string(200'000, 'x')));
  EXPECT_EQ(wire.receive(seconds(5)).status, 400);
}

TEST_F(Ports, OfHttpAnswerAHelloOfTls) {
  const auto server = serverWith();
  Wire wire(server->port());
  ASSERT_TRUE(wire.send(std::string("\x16\x03\x01\x02\x00\x01\x00\x01\xfc\x03\x03", 11) + std::string(501, 'r')));
  const WireResponse answer = wire.receive(seconds(5));
  EXPECT_EQ(answer.status, 400);
  EXPECT_THAT(answer.body, StartsWith("This port speaks HTTP without TLS"));
}

TEST_F(Ports, OfHttpSayToTlsClientsThatThereIsNoTls) {
  const auto server = serverWith();
  const std::string said = testing::outputOf("curl -sS https://localhost:" + std::to_string(server->port()) + "/");
  EXPECT_THAT(said, HasSubstr("wrong version number"));
}

TEST_F(Ports, ACloseOfASilentClientIsNoticed) {
  const auto server = serverWith();
  { const Wire silent(server->port()); }
  { const Wire silent(server->tlsPort()); }
  for (int i = 0; i < 500 && server->http().isBusy(); ++i) std::this_thread::sleep_for(milliseconds(10));
  EXPECT_FALSE(server->http().isBusy());
}

TEST_F(Ports, ASilentClientIsCutOff) {
  HttpLimits limits;
  limits.arrival = milliseconds(200);
  const auto server = serverWith(limits);
  Wire plain(server->port());
  Wire tls(server->tlsPort());
  Wire half(server->tlsPort());
  ASSERT_TRUE(half.send(std::string("\x16\x03\x01\x02\x00\x01\x00", 7)));
  for (Wire* each : {&plain, &tls, &half}) EXPECT_TRUE(each->isClosedWithin(seconds(5)));
}

TEST_F(Ports, OfHttpsNoticeTheEndInTheMiddleOfAHello) {
  const auto server = serverWith();
  {
    Wire half(server->tlsPort());
    ASSERT_TRUE(half.send(std::string("\x16\x03\x01\x02\x00\x01\x00", 7)));
  }
  for (int i = 0; i < 500 && server->http().isBusy(); ++i) std::this_thread::sleep_for(milliseconds(10));
  EXPECT_FALSE(server->http().isBusy());
}

/// A connection that Reception has, and its client's end.
class HalfHello : public ::testing::Test {
 protected:
  HalfHello() {
    const Listening port;
    client_ = port.connect();
    Newcomer newcomer;
    newcomer.socket = port.accept();
    newcomer.door = Door::Https;
    newcomer.connection = connections_.add(newcomer.socket.get(), "192.0.2.1", "192.0.2.1");
    reception_.add(std::move(newcomer));
  }

  void send(std::string_view bytes) const {
    ASSERT_EQ(::send(client_.get(), bytes.data(), bytes.size(), MSG_NOSIGNAL), static_cast<ssize_t>(bytes.size()));
  }

  bool wakes() const {
    pollfd wait{reception_.descriptor(), POLLIN, 0};
    return ::poll(&wait, 1, 30) == 1;
  }

  void lookIfWoken() {
    if (wakes()) reception_.look();
  }

  static constexpr std::size_t kLength = 512;
  const std::string hello_ = std::string("\x16\x03\x01\x02\x00", 5) + std::string(kLength, 'r');
  Connections connections_;
  std::size_t admitted_ = 0;
  std::string bytes_;
  Reception reception_{connections_, [this](Newcomer&& newcomer) {
                         ++admitted_;
                         bytes_.resize(2 * kLength);
                         const ssize_t got = ::recv(newcomer.socket.get(), bytes_.data(), bytes_.size(), MSG_DONTWAIT);
                         bytes_.resize(got > 0 ? static_cast<std::size_t>(got) : 0);
                         connections_.remove(*newcomer.connection);
                       }};
  util::FileDescriptor client_;
};

TEST_F(HalfHello, WakesNoThreadUntilItIsWhole) {
  send(hello_.substr(0, 1));
  lookIfWoken();
  send(hello_.substr(1, 4));
  lookIfWoken();
  for (std::size_t at = 5; at + 1 < hello_.size(); at += 50) {
    send(std::string_view(hello_).substr(at, std::min<std::size_t>(50, hello_.size() - 1 - at)));
    EXPECT_FALSE(wakes()) << "at byte " << at;
  }
  EXPECT_EQ(admitted_, 0U);
  send(hello_.substr(hello_.size() - 1));
  EXPECT_TRUE(wakes());
  reception_.look();
  EXPECT_EQ(admitted_, 1U);
  EXPECT_EQ(bytes_, hello_);
}

TEST_F(HalfHello, OfALengthThatNoRecordHasIsLeftToTheTlsLibrary) {
  send(std::string("\x16\x03\x01\xff\xff", 5));
  lookIfWoken();
  EXPECT_EQ(admitted_, 1U);
}

TEST_F(HalfHello, IsForgottenWhenItsClientEnds) {
  send(hello_.substr(0, 100));
  lookIfWoken();
  client_.reset();
  lookIfWoken();
  EXPECT_EQ(admitted_, 0U);
  EXPECT_EQ(connections_.count(), 0U);
  EXPECT_FALSE(wakes());
}

TEST_F(Ports, SilentClientsGiveWayWhereAllConnectionsAreTaken) {
  constexpr std::size_t kPlaces = 10;
  HttpLimits limits;
  limits.connections = kPlaces;
  const auto server = serverWith(limits);
  std::vector<std::unique_ptr<Wire>> silent;
  for (int i = 0; i < 50; ++i) {
    silent.push_back(std::make_unique<Wire>(i % 2 == 0 ? server->port() : server->tlsPort()));
  }
  const auto open = [&] {
    return static_cast<std::size_t>(std::count_if(
        silent.begin(), silent.end(), [](const auto& each) { return !each->isClosedWithin(milliseconds(5)); }));
  };
  for (int i = 0; i < 100 && open() > kPlaces; ++i) std::this_thread::sleep_for(milliseconds(10));
  EXPECT_EQ(open(), kPlaces);
  Wire wire(server->port());
  ASSERT_TRUE(wire.send("GET / HTTP/1.1\r\nHost: localhost\r\n\r\n"));
  EXPECT_EQ(wire.receive().status, 200);
}

}  // namespace
}  // namespace zorva::http
