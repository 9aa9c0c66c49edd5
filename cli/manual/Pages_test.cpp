#include "cli/manual/Pages.h"

#include "agent/config/Config.h"
#include "cli/commands/Commands.h"
#include "cli/manual/Prose.h"
#include "cli/testing/Running.h"
#include "manual/testing/ConfigFiles.h"

namespace zorva::cli {
namespace {

manual::Command program() {
  CommandLine line;
  addCommands(line);
  return line.description();
}

void expectAllOf(const manual::Command& command, const std::string& page) {
  for (const manual::DeclaredOption& each : command.arguments) EXPECT_THAT(page, HasSubstr(each.name)) << command.call;
  for (const manual::DeclaredOption& each : command.options) {
    if (each.name != "--help") {
      EXPECT_THAT(page, HasSubstr("\n    " + (each.brief.empty() ? "" : each.brief + ", ") + each.name))
          << command.call;
    }
  }
  for (const manual::Command& each : command.commands) {
    EXPECT_THAT(page, HasSubstr("    " + each.name())) << command.call;
    expectAllOf(each, page);
  }
}

TEST(ManualPages, HaveEveryCommandOptionAndArgument) {
  const manual::Command all = program();
  EXPECT_GT(all.commands.size(), 20U);
  const std::string page = manual::textOf(pageOf(all), 80);
  for (const manual::DeclaredOption& each : all.options) {
    EXPECT_TRUE(each.name == "--help" || page.find(each.name) != std::string::npos) << each.name;
  }
  for (const manual::Command& each : all.commands) {
    EXPECT_THAT(page, HasSubstr("\n    " + each.name()));
    expectAllOf(each, manual::textOf(pageOf(each), 80));
  }
}

TEST(ManualPages, DescribeEveryCommandAndNoOther) {
  std::vector<std::string> commands = {""};
  for (const manual::Command& each : program().commands) commands.push_back(each.name());
  std::vector<std::string> described;
  for (const Prose& each : allProse()) described.emplace_back(each.command);
  EXPECT_THAT(described, testing::UnorderedElementsAreArray(commands));
}

TEST(ManualPages, AreOneForEachCommandAndForTheConfiguration) {
  std::vector<std::string> names;
  for (const manual::Page& each : manualPages(program())) names.push_back(manual::fileNameOf(each));
  EXPECT_THAT(names, testing::IsSupersetOf({"zorvactl.1", "zorvactl-show.1", "zorvactl-dns.1", "agent.toml.5"}));
}

TEST(ManualPages, HelpPrintsThePageOfACommandByEachOfItsNames) {
  const TestHost host;
  const std::string page = shown(host, {"help", "enumerate"});
  EXPECT_THAT(page, AllOf(StartsWith("zorvactl-enumerate - "), HasSubstr("zorvactl enumerate [--property PROPERTY]")));
  EXPECT_EQ(shown(host, {"help", "ei"}), page);
  EXPECT_EQ(shown(host, {"help", "dns", "set"}), shown(host, {"help", "dns"}));
  EXPECT_THAT(shown(host, {"help"}), HasSubstr("SEVERAL HOSTS"));
  EXPECT_THAT(shown(host, {"help", "agent.toml"}), HasSubstr("    data_dir (path)\n"));
  expectRefused(host, {"help", "shwo"}, 2, "zorvactl has no command 'shwo'");
}

TEST(AgentConfiguration, OfThePackageHasEveryKeyWithItsDefault) {
  const zorva::agent::testing::TemporaryDirectory directory;
  const std::string sample = manual::sampleOf(agentConfigFile());
  const auto read = [&directory](const std::string& text) {
    return zorva::agent::readConfig(directory.write("agent.toml", text));
  };
  EXPECT_EQ(read(manual::testing::uncommented(sample)), read(""));
  EXPECT_TRUE(read(sample).appliesToHost) << "what the installed file sets";
  const std::string page = manual::textOf(manual::configPage(agentConfigFile()), 80);
  for (const util::TomlSection& section : zorva::agent::configKeys()) {
    EXPECT_THAT(page, HasSubstr("\n[" + std::string(section.name) + "]\n"));
    for (const util::TomlKey& key : section.keys) EXPECT_THAT(page, HasSubstr("\n    " + std::string(key.name) + " ("));
  }
}

}  // namespace
}  // namespace zorva::cli
