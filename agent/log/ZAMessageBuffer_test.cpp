#include <gtest/gtest.h>

#include <map>
#include <sstream>
#include <vector>

#include "agent/interface/ZALogger.h"

namespace {

using ZALog::ZAMessageBuffer;

std::string addressOf(const void* pointer) {
  std::ostringstream text;
  text << pointer;
  return text.str();
}

TEST(ZAMessageBuffer, IsEmptyAtFirst) {
  ZAMessageBuffer buffer;
  EXPECT_EQ(buffer.str(buffer), "");
}

TEST(ZAMessageBuffer, AppendsTextAndReturnsItself) {
  ZAMessageBuffer buffer;
  EXPECT_EQ(&(buffer << "a"), &buffer);
  EXPECT_EQ(buffer.str(buffer << "b"), "ab");
}

TEST(ZAMessageBuffer, NoTextAtAllAppendsNothing) {
  ZAMessageBuffer buffer;
  EXPECT_EQ(buffer.str(buffer << "a" << static_cast<const char*>(nullptr) << "b"), "ab");
}

TEST(ZAMessageBuffer, TextAndValuesFollowOneAnother) {
  ZAMessageBuffer buffer;
  buffer << "n=";
  static_cast<std::ostream&>(buffer) << 42 << ' ' << true << 'x';
  buffer << " end";
  EXPECT_EQ(buffer.str(static_cast<std::ostream&>(buffer)), "n=42 1x end");
}

TEST(ZAMessageBuffer, APointerIsItsAddressAndNeverWhatItPointsAt) {
  const std::map<std::string, int> map{{"a", 1}};
  const std::vector<int> vector{1};
  int number = 7;
  ZAMessageBuffer buffer;
  buffer << " map=" << &map;
  buffer << " vector=" << &vector << " number=" << &number;
  EXPECT_EQ(buffer.str(buffer),
            " map=" + addressOf(&map) + " vector=" + addressOf(&vector) + " number=" + addressOf(&number));
}

TEST(ZAMessageBuffer, ANullPointerIsZero) {
  ZAMessageBuffer buffer;
  buffer << static_cast<int*>(nullptr);
  EXPECT_EQ(buffer.str(buffer), "0");
}

TEST(ZAMessageBuffer, TakesTextOfAnyLength) {
  const std::string piece(1000, 'x');
  ZAMessageBuffer buffer;
  for (int i = 0; i < 1000; ++i) buffer << piece.c_str();
  static_cast<std::ostream&>(buffer) << piece;
  EXPECT_EQ(buffer.str(buffer), std::string(1001000, 'x'));
}

}  // namespace
