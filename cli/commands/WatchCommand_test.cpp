// watch: what is printed of changes that happen while it runs, on this host and through a server.

#include <algorithm>
#include <atomic>
#include <chrono>
#include <filesystem>
#include <future>
#include <thread>

#include "cli/testing/Running.h"
#include "cli/testing/TestServer.h"

namespace zorva::cli {
namespace {

using testing::ContainsRegex;

/// Runs it while the domain of an interface is set to one value after another. The file is replaced as a whole: while
/// it was written in place, a watcher would see the value go.
Outcome runWhileChanging(const TestHost& host, const Words& words, const std::string& interface = "eth0") {
  auto outcome = std::async(std::launch::async, [&] { return host.run(words); });
  for (int i = 0; outcome.wait_for(std::chrono::milliseconds(100)) != std::future_status::ready; ++i) {
    const std::string written =
        host.directory().write("overlay.new", R"({"/system/)" + interface + R"(/ip": {"domain_name": "d)" +
                                                  std::to_string(i) + ".example\"}}");
    std::filesystem::rename(written, host.dataFile("overlay.json"));
    if (i > 300) break;  // it hangs, and the test's time limit ends it
  }
  return outcome.get();
}

TEST(WatchCommand, WritesALineForEachChange) {
  const TestHost host;
  const Outcome outcome = runWhileChanging(host, {"watch", "--count", "2"});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.err;
  EXPECT_THAT(outcome.out, ContainsRegex("^20[^ ]+Z  eth0  domain_name  [^ ]+ -> d[0-9]+.example  .overlay.json.\n20"));
  EXPECT_EQ(std::count(outcome.out.begin(), outcome.out.end(), '\n'), 2);
  EXPECT_THAT(outcome.err, HasSubstr("watching"));
}

TEST(WatchCommand, WritesAJsonObjectOnALine) {
  const TestHost host;
  for (const Words& format : {Words{"--json"}, Words{"--output", "json"}}) {
    Words words{"watch", "--count", "1", "--quiet"};
    words.insert(words.end(), format.begin(), format.end());
    const Outcome outcome = runWhileChanging(host, words);
    EXPECT_EQ(outcome.exitCode, 0) << outcome.err;
  }
  const Outcome outcome = runWhileChanging(host, {"watch", "--count", "1", "--json"});
  EXPECT_EQ(outcome.out.find('\n'), outcome.out.size() - 1);
  const json change = contentOf(outcome.out);
  EXPECT_EQ(change["interface"], "eth0");
  EXPECT_EQ(change["property"], "domain_name");
  EXPECT_EQ(change["by"], "overlay.json");
  EXPECT_NE(change["old"], change["new"]);
}

TEST(WatchCommand, LeavesOutOtherInterfaces) {
  const TestHost host;
  std::atomic<bool> isOver = false;
  auto noise = std::async(std::launch::async, [&] {
    for (int i = 0; !isOver && i < 300; ++i) {
      host.directory().write("data/ifcfg-eth1", "DOMAINNAME=n" + std::to_string(i) + ".example\n");
      std::this_thread::sleep_for(std::chrono::milliseconds(30));
    }
  });
  const Outcome outcome = runWhileChanging(host, {"watch", "eth0", "--count", "2"});
  isOver = true;
  EXPECT_THAT(outcome.out, HasSubstr("  eth0  "));
  EXPECT_THAT(outcome.out, Not(HasSubstr("eth1")));
}

TEST(WatchCommand, SaysWhatChangesInFilesOfSettings) {
  const TestHost host;
  auto outcome = std::async(std::launch::async, [&] { return host.run({"watch", "--count", "1", "--json"}); });
  for (int i = 0; i < 300 && outcome.wait_for(std::chrono::milliseconds(100)) != std::future_status::ready; ++i) {
    host.directory().write("data/ifcfg-eth1", "DNSSERVERS=192.0.2." + std::to_string(i) + "\n");
  }
  const json change = contentOf(outcome.get().out);
  EXPECT_EQ(change["interface"], "eth1");
  EXPECT_EQ(change["property"], "ifcfg.DNSSERVERS");
  EXPECT_EQ(change["by"], "ifcfg-eth1");
}

TEST(WatchCommand, SaysTheSameThroughAServer) {
  const TestHost host;
  const TestServer server(host);
  const Outcome outcome = runWhileChanging(host, {"watch", "--url", server.url(), "--count", "1", "--json", "eth0"});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.err;
  const json change = contentOf(outcome.out);
  EXPECT_EQ(change["interface"], "eth0");
  EXPECT_EQ(change["property"], "domain_name");
  EXPECT_THAT(outcome.err, HasSubstr("watching"));
}

TEST(WatchCommand, SaysWhyAServerDoesNotReportChanges) {
  const TestHost host;
  const ScriptedServer old({ScriptedServer::reply("", "405 Method Not Allowed")});
  expectRefused(host, {"watch", "--url", old.url()}, 1, "does not report changes");
  const ScriptedServer full({ScriptedServer::reply("as many clients watch as may\n", "503 Service Unavailable",
                                                   "Content-Type: text/plain\r\n")});
  expectRefused(host, {"watch", "--url", full.url()}, 1, "as many clients watch as may");
  const ScriptedServer ending({ScriptedServer::reply("\n")});
  expectRefused(host, {"watch", "--url", ending.url()}, 1, "has ended the report of changes");
  const ScriptedServer wrong({ScriptedServer::reply("\n{\"a\": 1}\n")});
  expectRefused(host, {"watch", "--url", wrong.url()}, 1, "what came is no change");
}

TEST(WatchCommand, RefusesACountThatIsNone) {
  const TestHost host;
  for (const char* count : {"0", "-1", "x", "1x"}) {
    expectRefused(host, {"watch", "--count", count}, 2, "--count takes a whole number");
  }
}

}  // namespace
}  // namespace zorva::cli
