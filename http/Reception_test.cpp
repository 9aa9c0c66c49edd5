#include "http/Reception.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <chrono>
#include <string>

#include "http/testing/TestCertificates.h"
#include "http/testing/TestServer.h"
#include "http/testing/TestWire.h"

namespace zorva::http {
namespace {

using std::chrono::milliseconds;
using std::chrono::seconds;
using ::testing::HasSubstr;
using testing::Server;
using ::testing::StartsWith;
using testing::Wire;
using testing::WireResponse;

class Ports : public ::testing::Test {
 protected:
  std::shared_ptr<const TlsIdentity> identity() const {
    const testing::IssuedFiles files = testing::TestAuthority(directory_, "ca").issue("server");
    return TlsIdentity::load({files.certificate, files.key, {}});
  }

  std::unique_ptr<Server> serverWith(const HttpLimits& limits = {}) const {
    return std::make_unique<Server>([](const HttpRequest&, ResponseSink& sink) { sink.begin(200, {}); }, limits,
                                    "This is a server.\n", std::make_shared<access::OpenGate>(access::Role::Read),
                                    identity());
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
