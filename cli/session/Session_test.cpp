#include "cli/testing/Running.h"

namespace zorva::cli {
namespace {

TEST(Configuration, ThatIsWrongIsReportedInOneLine) {
  for (const auto& [toml, told] :
       std::vector<std::pair<std::string, std::string>>{{"[agent]\nfoo = 1\n", "agent.toml:2: agent.foo: "},
                                                        {"[log]\nlevel = \"high\"\n", "agent.toml:2: log.level: "},
                                                        {"[agent\n", "agent.toml:1: "}}) {
    const TestHost host;
    host.configure(toml);
    const Outcome outcome = host.run({"show"});
    EXPECT_EQ(outcome.exitCode, 2) << toml;
    EXPECT_THAT(outcome.err, HasSubstr(told));
    EXPECT_EQ(std::count(outcome.err.begin(), outcome.err.end(), '\n'), 1) << outcome.err;
  }
}

TEST(Configuration, CanBeNamedOnTheCommandLine) {
  const TestHost host;
  host.configure("[agent]\nfoo = 1\n");
  const TestHost other;
  EXPECT_EQ(host.run({"names", "ZORVA_DNSSettingData", "--config", other.directory() / "agent.toml"}).exitCode, 0);
  expectRefused(host, {"show", "--config", "/nowhere/agent.toml"}, 2, "/nowhere/agent.toml");
}

TEST(TreeFile, ThatIsWrongIsReportedInOneLineWithItsPlace) {
  const TestHost host;
  for (const auto& [tree, told] : std::vector<std::pair<std::string, std::string>>{
           {"{\n\"system_name\": 5, \"nodes\": []}", "tree.json:2: system_name: "},
           {"{\n\n", "tree.json:2: "},
           {R"({"system_name": "h", "frob": 1, "nodes": []})", "tree.json:1: frob: "}}) {
    host.writeTree(tree);
    for (const char* command : {"show", "tree", "classes", "graph"}) {
      const Outcome outcome = host.run({command});
      EXPECT_EQ(outcome.exitCode, 2) << command << tree;
      EXPECT_THAT(outcome.err, HasSubstr(told));
      EXPECT_EQ(std::count(outcome.err.begin(), outcome.err.end(), '\n'), 1) << outcome.err;
    }
  }
}

TEST(Overlay, ThatIsWrongIsAWarningIfTheHostIsRead) {
  const TestHost host;
  host.directory().write("data/overlay.json", "{\n{");
  const Outcome outcome = host.run({"show"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_THAT(outcome.err, AllOf(StartsWith("zorvactl: warning: "), HasSubstr("overlay.json:2: ")));
}

TEST(StandardOutput, ThatIsFullIsAFailure) {
  const Outcome outcome = TestHost().run({"ei", "ZORVA_DNSProtocolEndPoint"}, OutputTo::FullDevice);
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_THAT(outcome.err, HasSubstr("cannot write to standard output: No space left on device"));
}

TEST(LogLevel, ShowsTheWayOfTheProviders) {
  EXPECT_THAT(TestHost().run({"ei", "ZORVA_DNSProtocolEndPoint"}).err, IsEmpty());
  EXPECT_THAT(TestHost().run({"ei", "ZORVA_DNSProtocolEndPoint", "--log-level", "3000"}).err,
              HasSubstr("DNSClient_EnumInstances"));
}

}  // namespace
}  // namespace zorva::cli
