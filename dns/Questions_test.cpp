#include "dns/Questions.h"

#include <gtest/gtest.h>

#include <memory>

#include "dns/testing/UdpServer.h"

namespace zorva::dns {
namespace {

using namespace std::chrono_literals;
using testing::UdpServer;
using Packets = std::vector<UdpServer::Packet>;

Inquiry to(const UdpServer& server, const std::string& name = ".") {
  ServerAddress address = *parseServer("127.0.0.1");
  address.port = server.port();
  return {address, {name, Type::Soa}};
}

Answer answerOf(const UdpServer& server, std::chrono::milliseconds timeout = 10s) {
  return ask({to(server)}, timeout).front();
}

TEST(Ask, ReturnsWhatTheServersSayInTheOrderOfTheInquiries) {
  const UdpServer good("127.0.0.1", 0, UdpServer::answering());
  const UdpServer refusing("127.0.0.1", 0, UdpServer::answering(5));
  const std::vector<Answer> answers = ask({to(refusing), to(good), to(refusing, "x.example.org")}, 10s);
  ASSERT_EQ(answers.size(), 3U);
  for (const Answer& answer : answers) {
    EXPECT_EQ(answer.kind, Answer::Kind::Response);
    EXPECT_GT(answer.time.count(), 0);
  }
  EXPECT_EQ(answers[0].response.code, ResponseCode::Refused);
  EXPECT_EQ(answers[1].response.code, ResponseCode::NoError);
  EXPECT_EQ(answers[2].response.code, ResponseCode::Refused);
  EXPECT_TRUE(ask({}, 10s).empty());
}

TEST(Ask, IgnoresPacketsThatAreNotTheAnswer) {
  const UdpServer server("127.0.0.1", 0, [](const std::string& query) {
    std::string otherId = UdpServer::response(query, 5);
    otherId[0] = static_cast<char>(otherId[0] + 1);
    std::string otherName = UdpServer::response(encodeQuery(0, {"x", Type::Soa}), 5);
    otherName.replace(0, 2, query.substr(0, 2));
    return Packets{{UdpServer::response(query, 5), true}, {otherId}, {otherName}, {query}, {""},
                   {UdpServer::response(query)}};
  });
  const Answer answer = answerOf(server);
  EXPECT_EQ(answer.kind, Answer::Kind::Response);
  EXPECT_EQ(answer.response.code, ResponseCode::NoError);
}

TEST(Ask, DoesNotWaitForeverForSilenceOrGarbage) {
  const UdpServer silent("127.0.0.1", 0, [](const std::string&) { return Packets{}; });
  const UdpServer elsewhere("127.0.0.1", 0, [](const std::string& query) {
    return Packets{{UdpServer::response(query), true}};
  });
  const UdpServer broken("127.0.0.1", 0, [](const std::string& query) {
    const std::string response = UdpServer::response(query);
    return Packets{{response.substr(0, response.size() - 1)}};
  });
  const std::vector<Answer> answers = ask({to(silent), to(elsewhere), to(broken)}, 300ms);
  EXPECT_EQ(answers[0].kind, Answer::Kind::None);
  EXPECT_EQ(answers[1].kind, Answer::Kind::None);
  EXPECT_EQ(answers[2].kind, Answer::Kind::Malformed);
  EXPECT_EQ(answers[2].problem, "it ends too early");
}

TEST(Ask, SaysThatNothingListensThere) {
  auto gone = std::make_unique<UdpServer>("127.0.0.1", 0, UdpServer::answering());
  const Inquiry inquiry = to(*gone);
  gone.reset();
  const Answer answer = ask({inquiry}, 10s).front();
  EXPECT_EQ(answer.kind, Answer::Kind::Unreachable);
  EXPECT_EQ(answer.problem, "Connection refused");
}

TEST(Ask, SaysThatTheInterfaceOfAZoneIsMissing) {
  const Answer answer = ask({{*parseServer("fe80::1%no-such-link"), {}}}, 10s).front();
  EXPECT_EQ(answer.kind, Answer::Kind::Unreachable);
  EXPECT_EQ(answer.problem, "this host has no interface no-such-link");
}

TEST(Ask, AsksMoreServersThanItHasSocketsAtOnce) {
  const UdpServer server("127.0.0.1", 0, UdpServer::answering());
  const std::vector<Answer> answers = ask(std::vector<Inquiry>(600, to(server)), 10s);
  for (const Answer& answer : answers) ASSERT_EQ(answer.kind, Answer::Kind::Response);
  EXPECT_EQ(server.queries(), 600);
}

}  // namespace
}  // namespace zorva::dns
