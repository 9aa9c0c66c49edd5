#include "http/HostNames.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "http/testing/TestServer.h"
#include "http/testing/TestWire.h"
#include "util/HostName.h"

namespace zorva::http {
namespace {

using ::testing::HasSubstr;
using testing::Server;
using testing::Wire;

TEST(HostNames, AreOwnNamesAndAddressesWithAnyPort) {
  const HostNames names({"www.example.org", "alias:5989"});
  for (const std::string& name :
       {std::string("localhost"), std::string("LOCALHOST:5988"), std::string("localhost."), std::string("127.0.0.1"),
        std::string("127.1.2.3:80"), std::string("[::1]:5989"), std::string("WWW.example.org"),
        std::string("www.example.org.:1"), std::string("alias"), util::kernelHostName()}) {
    EXPECT_TRUE(names.has(name)) << name;
  }
}

TEST(HostNames, OfOthersMayBeginAsOwnNames) {
  const HostNames names({"host1"});
  for (const std::string& name :
       {std::string(), std::string("localhost.example.net"), std::string("host1.example.net"),
        util::kernelHostName() + ".example.net", std::string("127.0.0.1.example.net"), std::string("192.0.2.99"),
        std::string("[2001:db8::99]:5988"), std::string("x"), std::string(":"), std::string("127.1")}) {
    EXPECT_FALSE(names.has(name)) << name;
  }
}

TEST(Origin, OfThisServerHasItsSchemeAndHost) {
  EXPECT_FALSE(checkOrigin({{"Host", "localhost:5988"}}, "http").has_value());
  EXPECT_FALSE(checkOrigin({{"Host", "localhost:5988"}, {"Origin", "http://LOCALHOST:5988"}}, "http").has_value());
  for (const char* origin : {"http://localhost:3000", "https://localhost:5988", "http://localhost", "null", "",
                             "http://example.net", "http://localhost:5988.example.net"}) {
    const auto refusal = checkOrigin({{"Host", "localhost:5988"}, {"Origin", origin}}, "http");
    ASSERT_TRUE(refusal.has_value()) << origin;
    EXPECT_EQ(refusal->status, 403);
  }
}

TEST(WebPages, GetNoAnswerButARefusalByAnyMethod) {
  Server server([](const HttpRequest&, ResponseSink& sink) { sink.begin(200, {}); }, {},
                {{"/", textPage("This is a server.\n")}});
  for (const char* first : {"GET / HTTP/1.1", "HEAD / HTTP/1.1", "OPTIONS * HTTP/1.1", "POST /cimom HTTP/1.1",
                            "M-POST /cimom HTTP/1.1", "GET /cimom HTTP/1.1", "PUT / HTTP/1.1"}) {
    for (const char* fields : {"Host: rebound.example.net\r\n", "Host: localhost\r\nOrigin: http://example.net\r\n"}) {
      SCOPED_TRACE(std::string(first) + " " + fields);
      Wire wire(server.port());
      ASSERT_TRUE(wire.send(std::string(first) + "\r\n" + fields + "Content-Length: 0\r\n\r\n"));
      EXPECT_EQ(wire.receive(std::chrono::seconds(2)).status, 403);
    }
  }
}

TEST(WebPages, ANameOfTheConfigurationIsAnOwnNameFromThenOn) {
  Server server([](const HttpRequest&, ResponseSink& sink) { sink.begin(200, {}); }, {},
                {{"/", textPage("This is a server.\n")}});
  const std::string request = "GET / HTTP/1.1\r\nHost: www.example.net\r\n\r\n";
  Wire before(server.port());
  ASSERT_TRUE(before.send(request));
  EXPECT_THAT(before.receive().body, HasSubstr("'www.example.net', which is no name or address of this host"));
  server.http().setHostNames({"www.example.net"});
  Wire after(server.port());
  ASSERT_TRUE(after.send(request));
  EXPECT_EQ(after.receive().status, 200);
}

}  // namespace
}  // namespace zorva::http
