#include "agent/apply/BusCalls.h"

#include <gtest/gtest.h>
#include <net/if.h>
#include <unistd.h>

#include "agent/testing/FakeDaemon.h"
#include "agent/testing/NetworkNamespace.h"
#include "agent/testing/PrivateHostTest.h"

namespace zorva::agent {
namespace {

using testing::Daemons;
using testing::FakeDaemon;
using testing::Interfaces;

constexpr const char* kSocket = "/run/dbus/system_bus_socket";

SystemBus::Method methodOf(const std::string& destination, const std::string& member) {
  return {destination, "/org/example/thing", "org.example.Thing", member};
}

std::string problemOf(BusCalls& bus, const std::string& destination, const std::string& member) {
  const auto result = bus.call(methodOf(destination, member));
  return result ? "nothing" : result.error();
}

TEST(BusCalls, GiveArgumentsAndReadTheAnswer) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(testing::succeedsOnHostWithDaemons([] {
    Daemons daemons;
    BusCalls bus(kSocket);
    bool isThere = false;
    const auto result = bus.call(
        {"org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus", "NameHasOwner"},
        [](sd_bus_message* message) { return ::sd_bus_message_append(message, "s", "org.freedesktop.DBus"); },
        [&](BusReader& answer) { isThere = answer.flag(); });
    EXPECT_TRUE(result) << result.error();
    return isThere;
  }));
}

TEST(BusCalls, SayInOneLineWhyACallFailed) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(testing::succeedsOnHostWithDaemons([] {
    BusCalls bus(kSocket);
    EXPECT_EQ(problemOf(bus, "org.example.Absent", "Do"),
              std::string(kSocket) + ": the message bus cannot be reached: No such file or directory");
    Daemons daemons;
    EXPECT_EQ(problemOf(bus, "org.example.Absent", "Do"), "org.example.Absent does not run");
    const FakeDaemon fake("org.example.Fake", [](sd_bus_message*, const std::string&) { return -1; });
    EXPECT_EQ(problemOf(bus, "org.example.Fake", "Do"), "Do is refused: it does not want to");
    return true;
  }));
}

TEST(BusCalls, SayWhereRightsAreLacking) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(testing::succeedsOnHostWithDaemons([] {
    Interfaces().addPair("eth0", "far0");
    Daemons daemons;
    daemons.start("systemd-resolved");
    const unsigned int index = ::if_nametoindex("eth0");
    constexpr uid_t kNobody = 65534;
    if (::seteuid(kNobody) != 0) return false;
    BusCalls bus(kSocket);
    const auto result = bus.call(
        {"org.freedesktop.resolve1", "/org/freedesktop/resolve1", "org.freedesktop.resolve1.Manager", "RevertLink"},
        [=](sd_bus_message* message) { return ::sd_bus_message_append(message, "i", index); });
    EXPECT_TRUE(!result && result.error().ends_with("; run this as root")) << (result ? "nothing" : result.error());
    return ::seteuid(0) == 0;
  }));
}

TEST(BusCalls, WorkAgainAfterTheBusHasStartedAgain) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(testing::succeedsOnHostWithDaemons([] {
    BusCalls bus(kSocket);
    {
      Daemons daemons;
      EXPECT_EQ(problemOf(bus, "org.example.Absent", "Do"), "org.example.Absent does not run");
    }
    EXPECT_NE(problemOf(bus, "org.example.Absent", "Do"), "org.example.Absent does not run");
    Daemons daemons;
    EXPECT_EQ(problemOf(bus, "org.example.Absent", "Do"), "org.example.Absent does not run");
    return true;
  }));
}

TEST(BusCalls, WaitForADaemonForALimitedTime) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(testing::succeedsOnHostWithDaemons([] {
    Daemons daemons;
    daemons.start("systemd-resolved");
    daemons.freeze("systemd-resolved");
    constexpr std::chrono::seconds kLongest{1};
    BusCalls bus(kSocket, kLongest);
    EXPECT_EQ(problemOf(bus, "org.freedesktop.resolve1", "Do"), "org.freedesktop.resolve1 does not answer in time");
    daemons.freeze("dbus-daemon");
    BusCalls another(kSocket, kLongest);
    EXPECT_EQ(problemOf(another, "org.freedesktop.resolve1", "Do"), "the message bus does not answer in time");
    return true;
  }));
}

}  // namespace
}  // namespace zorva::agent
