#include "dns/Message.h"

#include <gtest/gtest.h>

#include <random>

#include "dns/testing/UdpServer.h"

namespace zorva::dns {
namespace {

using namespace std::string_literals;

constexpr std::uint16_t kId = 0x1234;
const Question kQuestion{"Example.org", Type::A};

std::string response(unsigned code = 0) { return testing::UdpServer::response(encodeQuery(kId, kQuestion), code); }

/// The question, with one record that begins with this name, and nothing after it.
std::string withName(const std::string& name) {
  std::string message = testing::UdpServer::response(encodeQuery(kId, kQuestion), 3);
  message[7] = 1;
  return message + name + "\0\1\0\1\0\0\0\0\0\0"s;
}

TEST(Query, IsWhatTheStandardSays) {
  EXPECT_EQ(encodeQuery(kId, {"a.bc", Type::A}), "\x12\x34\x01\0\0\1\0\0\0\0\0\0\1a\2bc\0\0\1\0\1"s);
  EXPECT_EQ(encodeQuery(kId, {"a.bc.", Type::A}), encodeQuery(kId, {"a.bc", Type::A}));
  EXPECT_EQ(encodeQuery(0, {".", Type::Soa}), "\0\0\x01\0\0\1\0\0\0\0\0\0\0\0\6\0\1"s);
}

TEST(Names, HaveLabelsOf63BytesAnd255InAll) {
  const std::string label(63, 'x');
  for (const std::string& name :
       {"."s, "a"s, "a."s, "_x.a-b"s, label, label + "." + label + "." + label + "." + label.substr(2)}) {
    EXPECT_TRUE(isName(name)) << name;
  }
  for (const std::string& name :
       {""s, ".."s, ".a"s, "a..b"s, "a.."s, label + "x", label + "." + label + "." + label + "." + label}) {
    EXPECT_FALSE(isName(name)) << name;
  }
}

TEST(Response, SaysItsCodeAndHowManyRecordsAnswer) {
  const auto good = decodeResponse(response(), kId, kQuestion);
  ASSERT_TRUE(good.has_value());
  EXPECT_EQ(good->code, ResponseCode::NoError);
  EXPECT_EQ(good->answers, 1U);
  const auto refused = decodeResponse(response(5), kId, kQuestion);
  ASSERT_TRUE(refused.has_value());
  EXPECT_EQ(codeName(refused->code), "REFUSED");
  EXPECT_EQ(codeName(static_cast<ResponseCode>(11)), "code 11");
}

TEST(Response, MayLeaveOutTheQuestionWhereItIsARefusal) {
  EXPECT_TRUE(decodeResponse("\x12\x34\x81\x85\0\0\0\0\0\0\0\0"s, kId, kQuestion).has_value());
  EXPECT_FALSE(decodeResponse("\x12\x34\x81\x80\0\0\0\0\0\0\0\0"s, kId, kQuestion).has_value());
}

TEST(Response, MayBeTruncated) {
  std::string message = response();
  message[2] = static_cast<char>(0x83);
  message.resize(message.size() - 8);
  const auto cut = decodeResponse(message, kId, kQuestion);
  ASSERT_TRUE(cut.has_value());
  EXPECT_TRUE(cut->isTruncated);
}

struct Bad {
  const char* what;
  std::string message;
  bool isForeign;
};

TEST(Response, IsRefusedWithAReason) {
  std::string query = encodeQuery(kId, kQuestion);
  std::string otherOperation = response();
  otherOperation[2] = static_cast<char>(0x91);
  std::string longName;
  for (int i = 0; i < 5; ++i) longName += "\x3F" + std::string(63, 'x');
  const Bad kBad[] = {
      {"it is shorter than a header", "\x12\x34\x81"s, true},
      {"it has another id", "\x12\x35" + response().substr(2), true},
      {"it is no response to a query", query, true},
      {"it is no response to a query", otherOperation, true},
      {"it answers another question", testing::UdpServer::response(encodeQuery(kId, {"example.net", Type::A})), true},
      {"it answers another question", testing::UdpServer::response(encodeQuery(kId, {"example.org", Type::Soa})), true},
      {"it answers another question", response().substr(0, 20), true},
      {"it ends too early", response().substr(0, response().size() - 1), false},
      {"a name points at itself or behind", withName("\xC0\x1D"s), false},
      {"a name points at itself or behind", withName("\1a\xC0\x1D"s), false},
      {"a name points at itself or behind", withName("\xFF\xFF"s), false},
      {"a name is longer than 255 bytes", withName(longName + "\0"s), false},
      {"a label is of no known kind", withName("\x40x\0"s), false},
      {"a label is of no known kind", withName("\x80x\0"s), false},
      {"a label ends too early", withName("\x3Fxx"s), false},
  };
  for (const Bad& bad : kBad) {
    const auto read = decodeResponse(bad.message, kId, kQuestion);
    ASSERT_FALSE(read.has_value()) << bad.what;
    EXPECT_EQ(read.error().what, bad.what);
    EXPECT_EQ(read.error().isForeign, bad.isForeign) << bad.what;
  }
}

/// Pointers that go back one after the other are no loop, and still end at 255 bytes.
TEST(Response, TakesBoundedTimeForManyRecordsOfChainedPointers) {
  std::string message = testing::UdpServer::response(encodeQuery(kId, kQuestion), 3);
  message[6] = message[7] = static_cast<char>(0xFF);
  std::size_t before = 12;
  while (message.size() < 16000) {
    const std::size_t begin = message.size();
    message +=
        "\1a"s + static_cast<char>(0xC0U | before >> 8U) + static_cast<char>(before & 0xFFU) + "\0\1\0\1\0\0\0\0\0\0"s;
    before = begin;
  }
  const auto read = decodeResponse(message, kId, kQuestion);
  ASSERT_FALSE(read.has_value());
  EXPECT_EQ(read.error().what, "a name is longer than 255 bytes");
}

TEST(Response, OfAnyBytesIsReadOrRefused) {
  std::mt19937 random(4711);
  const std::string good = response();
  for (int round = 0; round < 200000; ++round) {
    std::string message = good;
    for (unsigned change = random() % 4 + 1; change > 0; --change) {
      message[2 + random() % (message.size() - 2)] = static_cast<char>(random() % 4 == 0 ? 0xC0 : random());
    }
    message.resize(random() % 3 == 0 ? random() % message.size() : message.size());
    const auto read = decodeResponse(message, kId, kQuestion);
    if (read.has_value()) {
      ASSERT_LE(read->answers, 1U);
    } else {
      ASSERT_FALSE(read.error().what.empty());
    }
  }
}

}  // namespace
}  // namespace zorva::dns
