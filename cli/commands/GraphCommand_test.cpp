#include <filesystem>

#include "cli/testing/Running.h"

namespace zorva::cli {
namespace {

TEST(Graph, ReachesEveryObjectAndNamesWhatCannotBeFetched) {
  const std::string text = shown(TestHost(), {"graph"});
  EXPECT_THAT(text, StartsWith("ZORVA_ComputerSystem."));
  for (const char* each : {"ZORVA_DNSProtocolEndPoint eth1", "ZORVA_RemoteServiceAccessPoint 2001:db8::53",
                           "ZORVA_DNSSettingData Computer%eth0", "ZORVA_DNSGeneralSettingData dnsgen1:host1"}) {
    EXPECT_THAT(text, HasSubstr(each));
  }
  EXPECT_THAT(text, HasSubstr("\nReferences whose far end cannot be fetched:\n"
                              "  ZORVA_DNSGeneralElementSettingData.ManagedElement = ZORVA_ComputerSystem: "
                              "its provider gives this end without keys, by design"));
}

TEST(Graph, CanBeginAtOneObject) {
  EXPECT_THAT(shown(TestHost(), {"graph", kEndpoint}), StartsWith("ZORVA_DNSProtocolEndPoint."));
}

TEST(Graph, ShowsWhatIsThereWithoutTheCompanionLibrary) {
  const TestHost host;
  host.directory().link(ZORVA_LIB_DIR "/libzorvadnsclientprofileprovider.so.1",
                        "lib/libzorvadnsclientprofileprovider.so.1");
  const std::string directory = host.directory() / "lib";
  for (const char* companion : {"", "this is no library"}) {
    if (*companion != '\0') host.directory().write("lib/libzorvahostprofileprovider.so.1", companion);
    const Outcome outcome = host.run({"graph", "--provider-dir", directory});
    EXPECT_EQ(outcome.exitCode, 0) << outcome.err;
    EXPECT_THAT(outcome.out, HasSubstr("ZORVA_DNSSettingData Computer%eth0"));
    EXPECT_THAT(outcome.out, EndsWith("\nEvery reference that could be asked for leads to an object.\n"));
    EXPECT_THAT(outcome.err, AllOf(StartsWith("zorvactl: warning: ZORVA_ComputerSystem, ZORVA_SPComputerSystem, "),
                                   HasSubstr("\nzorvactl: warning: associations of ZORVA_DNSProtocolEndPoint eth0, ")));
    EXPECT_EQ(std::count(outcome.err.begin(), outcome.err.end(), '\n'), 2) << outcome.err;
    EXPECT_THAT(shown(host, {"classes", "--provider-dir", directory}),
                AllOf(HasSubstr("ZORVA_ComputerSystem                    - "),
                      HasSubstr("ZORVA_DNSProtocolEndPoint               2 ")));
  }
}

TEST(Graph, FailsIfNothingCanBeAsked) {
  expectRefused(TestHost(), {"graph", "--provider-dir", "/nowhere"}, 1, "no class could be asked: ");
}

TEST(Graph, IsWrittenForGraphviz) {
  EXPECT_THAT(shown(TestHost(), {"graph", "-o", "dot"}), AllOf(StartsWith("digraph dns {"), EndsWith("}\n")));
  const json graph = jsonShown(TestHost(), {"graph"});
  EXPECT_GT(graph["objects"].size(), 6U);
  EXPECT_LT(graph["associations"][0]["Dependent"].get<std::size_t>(), graph["objects"].size());
}

TEST(Graph, SaysWhatToInstallForAPicture) {
  const Outcome without = TestHost().runWith({{"PATH", "/nowhere"}}, {"graph", "-o", "svg"});
  EXPECT_EQ(without.exitCode, 1);
  EXPECT_THAT(without.err, HasSubstr("apt-get install graphviz"));
}

// The replacement for Graphviz's dot shows that it gets the graph, and that its output is passed on.
TEST(Graph, IsDrawnByDot) {
  const TestHost host;
  const std::string dot = host.directory().write(
      "bin/dot", "#!/bin/sh\nread -r first\nwhile read -r line; do :; done\necho \"<svg>$1 $first</svg>\"\n");
  std::filesystem::permissions(dot, std::filesystem::perms::owner_all);
  const Outcome outcome = host.runWith({{"PATH", host.directory() / "bin"}}, {"graph", "-o", "svg"});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.err;
  EXPECT_EQ(outcome.out, "<svg>-Tsvg digraph dns {</svg>\n");
}

}  // namespace
}  // namespace zorva::cli
