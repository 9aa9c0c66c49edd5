#include "access/FailedLogins.h"

#include <gtest/gtest.h>

namespace zorva::access {
namespace {

using std::chrono::milliseconds;
using std::chrono::minutes;

std::string groupOf(const std::string& address) {
  Origin origin;
  origin.way = Origin::Way::Network;
  origin.address = address;
  return clientGroup(origin);
}

TEST(FailedLogins, TheDelayDoublesUpToItsLimit) {
  FailedLogins failed;
  Clock::time_point now = Clock::now();
  for (const int delay : {250, 500, 1000, 2000, 4000, 8000, 8000, 8000}) {
    EXPECT_EQ(failed.remaining("a", now), milliseconds(0));
    EXPECT_EQ(failed.add("a", now).delay, milliseconds(delay));
    EXPECT_EQ(failed.remaining("a", now), milliseconds(delay));
    EXPECT_EQ(failed.remaining("b", now), milliseconds(0));
    now += milliseconds(delay);
  }
  now += minutes(11);
  EXPECT_EQ(failed.add("a", now).delay, milliseconds(250));
}

TEST(FailedLogins, TheTableIsBounded) {
  FailedLogins failed;
  const Clock::time_point now = Clock::now();
  for (std::size_t i = 0; i <= FailedLogins::kMostClients; ++i) failed.add(std::to_string(i), now);
  EXPECT_EQ(failed.remaining("0", now), milliseconds(0));
  EXPECT_GT(failed.remaining("1", now), milliseconds(0));
}

TEST(FailedLogins, AClientCannotChooseAnotherAddressOfItsOwn) {
  EXPECT_EQ(groupOf("2001:db8::1"), groupOf("2001:db8::ffff:2"));
  EXPECT_NE(groupOf("2001:db8::1"), groupOf("2001:db8:0:1::1"));
  EXPECT_EQ(groupOf("fe80::1%eth0"), groupOf("fe80::2%eth0"));
  EXPECT_EQ(groupOf("::ffff:192.0.2.1"), groupOf("192.0.2.1"));
  EXPECT_NE(groupOf("192.0.2.1"), groupOf("192.0.2.2"));
  Origin one{Origin::Way::Loopback, false, "127.0.0.1", {}, {}};
  Origin two{Origin::Way::Loopback, false, "127.3.2.1", {}, {}};
  EXPECT_EQ(clientGroup(one), clientGroup(two));
}

}  // namespace
}  // namespace zorva::access
