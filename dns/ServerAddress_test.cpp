#include "dns/ServerAddress.h"

#include <gtest/gtest.h>

namespace zorva::dns {
namespace {

std::string read(const char* text) {
  const auto server = parseServer(text);
  return server ? server->text() : "none";
}

TEST(ServerAddress, IsReadAsOwnersWriteIt) {
  EXPECT_EQ(read("192.0.2.1"), "192.0.2.1");
  EXPECT_EQ(read("192.0.2.1:53"), "192.0.2.1");
  EXPECT_EQ(read("192.0.2.1:5353#dns.example.org"), "192.0.2.1:5353");
  EXPECT_EQ(read("192.0.2.1#dns.example.org"), "192.0.2.1");
  EXPECT_EQ(read("2001:DB8:0::1"), "2001:db8::1");
  EXPECT_EQ(read("[2001:db8::1]:5353"), "[2001:db8::1]:5353");
  EXPECT_EQ(read("[2001:db8::1]"), "2001:db8::1");
  EXPECT_EQ(read("fe80::1%eth0"), "fe80::1%eth0");
  EXPECT_EQ(read("[fe80::1%eth0]:5353#x"), "[fe80::1%eth0]:5353");
}

TEST(ServerAddress, IsNoneInOtherTexts) {
  for (const char* text : {"", "x", "192.0.2", "192.0.2.1:", "192.0.2.1:0", "192.0.2.1:65536", "192.0.2.1:5x",
                           "192.0.2.1%eth0", "fe80::1%", "[2001:db8::1", "[2001:db8::1]x", "2001:db8::1::2", "[]:53"}) {
    EXPECT_EQ(read(text), "none") << text;
  }
}

TEST(ServerAddress, NeedsTheInterfaceOfItsZone) {
  EXPECT_TRUE(socketAddress(*parseServer("fe80::1%lo")).has_value());
  EXPECT_TRUE(socketAddress(*parseServer("fe80::1%1")).has_value());
  EXPECT_FALSE(socketAddress(*parseServer("fe80::1%no-such-link")).has_value());
}

}  // namespace
}  // namespace zorva::dns
