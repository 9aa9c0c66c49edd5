#include <gtest/gtest.h>

#include <filesystem>

#include "agent/testing/NetworkNamespace.h"
#include "agent/testing/PrivateHostTest.h"
#include "agent/testing/TemporaryDirectory.h"

namespace zorva::agent::testing {
namespace {

TEST(PrivateHost, LeavesThisMachineAsItIs) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  const std::string before = contentsOf("/etc/resolv.conf");
  EXPECT_TRUE(succeedsOnPrivateHost([] {
    writeFile("/etc/resolv.conf", "nameserver 192.0.2.1\n");
    writeFile("/etc/zorva-private-host", "");
    Interfaces().addPair("eth0", "far0");
    return contentsOf("/etc/resolv.conf") == "nameserver 192.0.2.1\n";
  }));
  EXPECT_EQ(contentsOf("/etc/resolv.conf"), before);
  EXPECT_FALSE(std::filesystem::exists("/etc/zorva-private-host"));
}

TEST(PrivateHost, RunsTheRealDaemons) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(succeedsOnHostWithDaemons([] {
    Interfaces().addPair("eth0", "far0");
    Daemons daemons;
    for (const char* name : {"systemd-resolved", "systemd-networkd", "NetworkManager"}) daemons.start(name);
    EXPECT_NE(outputOf("resolvectl status").find("(eth0)"), std::string::npos);
    EXPECT_NE(outputOf("networkctl list --no-pager").find("eth0"), std::string::npos);
    EXPECT_NE(outputOf("nmcli device").find("eth0"), std::string::npos);
    EXPECT_EQ(contentsOf("/etc/machine-id"), "0123456789abcdef0123456789abcdef\n");
    return true;
  }));
}

TEST(PrivateHost, AFailedExpectationIsAFailure) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_FALSE(succeedsOnPrivateHost([] { return false; }));
  EXPECT_THROW(outputOf("echo this is said; false"), std::runtime_error);
}

}  // namespace
}  // namespace zorva::agent::testing
