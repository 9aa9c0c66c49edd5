// zorvactl on real interfaces, in its own network namespace if the kernel permits that.

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstdlib>

#include "cli/testing/TestHost.h"

namespace zorva::cli {
namespace {

using testing::AllOf;
using testing::HasSubstr;
using testing::Not;

constexpr const char* kHostConfig = "[agent]\ndata_dir = \"DIR\"\n[tree]\nsource = \"host\"\n";

bool canMakeNetworks() { return std::system("unshare -rn sh -c 'ip link add zv0 type bridge' >/dev/null 2>&1") == 0; }

/// Runs a shell script in a new network, with zorvactl in $Z; returns its output.
std::string printedInNewNetwork(const TestHost& host, const std::string& script) {
  const std::string file =
      host.directory().write("script", "export ZORVAGENT_CONFIG=" + (host.directory() / "agent.toml") +
                                           " Z=" ZORVA_BIN_DIR "/zorvactl\n" + script);
  const std::string output = host.directory() / "output";
  EXPECT_EQ(std::system(("unshare -rn sh -e " + file + " >" + output + " 2>&1").c_str()), 0)
      << zorva::agent::testing::contentsOf(output);
  return zorva::agent::testing::contentsOf(output);
}

TEST(LiveHost, CanBeShown) {
  const TestHost host;
  host.configure(kHostConfig);
  for (const char* command : {"show", "tree", "classes", "graph"}) {
    const Outcome outcome = host.run({command});
    EXPECT_EQ(outcome.exitCode, 0) << command << ": " << outcome.err;
  }
}

TEST(LiveHost, HasAnEndpointForALinkWhileItIsThere) {
  if (!canMakeNetworks()) GTEST_SKIP() << "no network namespace, or no bridge in one, can be made here";
  const TestHost host;
  host.configure(kHostConfig);
  EXPECT_THAT(printedInNewNetwork(host,
                                  "ip link add zv0 type bridge\n"
                                  "$Z names ZORVA_DNSProtocolEndPoint\n"
                                  "ip link del zv0\n"
                                  "echo ---\n"
                                  "$Z names ZORVA_DNSProtocolEndPoint 2>/dev/null\n"),
              AllOf(HasSubstr("Name=\"zv0\""), testing::EndsWith("---\n")));
}

TEST(LiveHost, GivesSettingsAFileAndChangesThem) {
  if (!canMakeNetworks()) GTEST_SKIP() << "no network namespace, or no bridge in one, can be made here";
  const TestHost host;
  host.configure(kHostConfig);
  const std::string printed =
      printedInNewNetwork(host,
                          "ip link add zv0 type bridge\n"
                          "ip addr add 192.0.2.7/24 dev zv0\n"
                          "$Z ifcfg init zv0\n"
                          "$Z dns set zv0 192.0.2.1\n"
                          "$Z domain zv0 lab.example.org\n"
                          "$Z ai 'ZORVA_DNSProtocolEndPoint.Name=\"zv0\"' --result-class ZORVA_IPProtocolEndpoint\n");
  EXPECT_THAT(printed, AllOf(HasSubstr("192.0.2.7"), Not(HasSubstr("warning"))));
  const std::string file = zorva::agent::testing::contentsOf(host.directory() / "ifcfg-zv0");
  EXPECT_THAT(file, AllOf(HasSubstr("BOOTPROTO=static\n"), HasSubstr("DNSSERVERS=192.0.2.1 \n"),
                          HasSubstr("DOMAINNAME=lab.example.org\n")));
}

}  // namespace
}  // namespace zorva::cli
