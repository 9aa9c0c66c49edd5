#include "cli/testing/Running.h"

namespace zorva::cli {
namespace {

TEST(Tree, IsReadBackAsTheSameTree) {
  const TestHost host({TestHost::port("eth0", R"("domain_name": "a\u0001\"b", "addresses":
      [{"address": "192.0.2.10", "prefix_length": 24, "origin": "dhcp"}])"),
                       TestHost::port("eth1")});
  const std::string first = shown(host, {"tree", "--output", "json"});
  host.writeTree(first);
  EXPECT_EQ(shown(host, {"tree", "--output", "json"}), first);
  EXPECT_THAT(first, HasSubstr("192.0.2.10"));
}

}  // namespace
}  // namespace zorva::cli
