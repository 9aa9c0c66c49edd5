// A thread that sleeps is woken by the kernel, by owners of DNS settings and by files.

#include <gtest/gtest.h>

#include <chrono>
#include <filesystem>

#include "agent/Agent.h"
#include "agent/HostWatch.h"
#include "agent/testing/ObservedOwners.h"
#include "agent/testing/PrivateHostTest.h"

namespace zorva::agent {
namespace {

using namespace std::chrono_literals;
using namespace testing;
using Clock = std::chrono::steady_clock;

class OwnersWatch : public PrivateHostTest {};

/// Whether a change whose line has that text is reported.
bool isReported(HostWatch& watch, const std::string& text) {
  std::string all;
  for (const auto deadline = Clock::now() + 20s; Clock::now() < deadline;) {
    for (const HostChange& change : watch.changes()) all += jsonLine(change);
    if (all.find(text) != std::string::npos) return true;
    std::vector<pollfd> none;
    watch.wait(none, 20s);
  }
  ADD_FAILURE() << text << " is not in " << all;
  return false;
}

/// Does that while the caller already sleeps.
void later(const std::string& command) { outputOf("(sleep 0.3; " + command + ") >/dev/null 2>&1 &"); }

/// Whether it sleeps for so long once nothing happens any more: an address of a new interface is checked for a second.
bool sleepsFor(HostWatch& watch, std::chrono::milliseconds longest) {
  std::vector<pollfd> none;
  for (int tries = 0; tries < 10; ++tries) {
    watch.changes();
    const auto start = Clock::now();
    watch.wait(none, longest);
    if (Clock::now() - start >= longest) return true;
  }
  return false;
}

bool changesWakeWhoSleeps() {
  makeCables();
  Daemons daemons;
  daemons.start("systemd-resolved");
  std::filesystem::create_directory("/run/data");
  writeFile("/run/agent.toml", "[agent]\ndata_dir = \"/run/data\"\n");
  loadConfig("/run/agent.toml");
  HostWatch watch;
  later("resolvectl dns eth0 192.0.2.53");
  EXPECT_TRUE(isReported(watch, R"("new":["192.0.2.53"],"by":"systemd-resolved"})"));
  EXPECT_TRUE(sleepsFor(watch, 2500ms)) << "it looks although nothing was reported";
  later("ip link set eth0 down");
  EXPECT_TRUE(isReported(watch, R"("interface":"eth0","property":"enabled_state","old":1,"new":16,"by":"kernel"})"));
  later("hostname other");
  EXPECT_TRUE(isReported(watch, R"("property":"host_name")"));
  later("echo nameserver 192.0.2.7 >/etc/resolv.conf");
  EXPECT_TRUE(isReported(watch, R"("property":"resolver_servers")"));
  later("echo DNSSERVERS=192.0.2.9 >/run/data/ifcfg-eth0");
  EXPECT_TRUE(isReported(watch, R"("property":"ifcfg.DNSSERVERS")"));
  return true;
}

TEST_F(OwnersWatch, ChangesWakeWhoSleeps) { EXPECT_TRUE(succeedsOnHostWithDaemons(changesWakeWhoSleeps)); }

}  // namespace
}  // namespace zorva::agent
