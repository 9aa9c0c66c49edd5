#include <gtest/gtest.h>

#include <cstdint>
#include <iomanip>
#include <limits>
#include <locale>
#include <map>
#include <sstream>
#include <thread>
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

TEST(ZAMessageBuffer, AnAddressIsWhatTheStreamWrites) {
  std::vector<std::uintptr_t> addresses = {0xabcdef, 0x7fff12345678, std::numeric_limits<std::uintptr_t>::max()};
  // Each number of digits, with zeros among them.
  for (std::uintptr_t address = 1; address != 0; address <<= 1) {
    addresses.push_back(address);
    addresses.push_back(address - 1);
  }
  for (const std::uintptr_t address : addresses) {
    const void* pointer = reinterpret_cast<const void*>(address);
    ZAMessageBuffer buffer;
    EXPECT_EQ(buffer.str(buffer << pointer), addressOf(pointer));
  }
}

/// Groups the digits in threes.
struct Grouping : std::numpunct<char> {
  std::string do_grouping() const override { return "\3"; }
};

TEST(ZAMessageBuffer, FollowsTheLocaleOfItsTime) {
  const void* pointer = reinterpret_cast<const void*>(std::uintptr_t{0xabcdef});
  const auto line = [&] {
    ZAMessageBuffer buffer;
    static_cast<std::ostream&>(buffer) << 1234567 << ' ' << pointer << ' ';
    return buffer.str(buffer << pointer);
  };
  const std::string before = line();
  const std::locale old = std::locale::global(std::locale(std::locale::classic(), new Grouping));
  const std::string grouped = line();
  std::ostringstream expected;
  expected << 1234567 << ' ' << pointer << ' ' << pointer;
  std::locale::global(old);
  EXPECT_EQ(grouped, expected.str());
  EXPECT_EQ(before, "1234567 0xabcdef 0xabcdef");
  EXPECT_EQ(line(), before);
}

TEST(ZAMessageBuffer, NothingOfABufferReachesTheNextOne) {
  for (int i = 0; i < 3; ++i) {
    ZAMessageBuffer buffer;
    static_cast<std::ostream&>(buffer) << true << ' ' << 10;
    EXPECT_EQ(buffer.str(buffer), "1 10") << i;
    static_cast<std::ostream&>(buffer) << std::boolalpha << std::hex << std::showbase << std::setfill('.')
                                       << std::setprecision(2);
    static_cast<std::ostream&>(buffer) << std::setw(6) << true << 10;
    EXPECT_EQ(buffer.str(buffer), "1 10..true0xa") << i;
    static_cast<std::ostream&>(buffer) << std::setw(40);
    if (i == 1) static_cast<std::ostream&>(buffer).setstate(std::ios_base::failbit);
  }
}

TEST(ZAMessageBuffer, SeveralAreFilledAtTheSameTimeByOneThreadAndByMany) {
  const auto compose = [](const std::string& name) {
    for (int i = 0; i < 1000; ++i) {
      ZAMessageBuffer outer;
      outer << name.c_str();
      ZAMessageBuffer inner;
      inner << "(" << name.c_str();
      ZAMessageBuffer innermost;
      static_cast<std::ostream&>(innermost) << i;
      outer << inner.str(inner << ",").c_str() << innermost.str(innermost).c_str();
      ASSERT_EQ(outer.str(outer << ")"), name + "(" + name + "," + std::to_string(i) + ")");
    }
  };
  std::vector<std::thread> threads;
  for (int i = 0; i < 100; ++i) threads.emplace_back(compose, "thread" + std::to_string(i));
  for (std::thread& thread : threads) thread.join();
}

TEST(ZAMessageBuffer, TakesTextOfAnyLength) {
  const std::string piece(1000, 'x');
  ZAMessageBuffer buffer;
  for (int i = 0; i < 1000; ++i) buffer << piece.c_str();
  static_cast<std::ostream&>(buffer) << piece;
  EXPECT_EQ(buffer.str(buffer), std::string(1001000, 'x'));
}

}  // namespace
