#include "cli/manual/Pages.h"

#include "agent/config/Config.h"
#include "cli/manual/Prose.h"

namespace zorva::cli {

namespace {

constexpr std::string_view kAgentConfigOpening =
    "The configuration of the agent, for zorvactl, zorvacimd and the providers in any other CIM server; agent.toml(5) "
    "explains it. Every key is optional. A key that is commented out has its default here. What is not known is an "
    "error, which zorvactl tree shows.";

/// Every page of a command names that of the program.
void addProgram(manual::Page& page) {
  const manual::Block own{manual::Block::Kind::Paragraph, "`zorvactl`(1) has the options that all commands take."};
  std::vector<manual::Block>& blocks = page.at("SEE ALSO").blocks;
  blocks.insert(blocks.begin(), own);
}

}  // namespace

manual::ConfigFile agentConfigFile() {
  return {"agent.toml", "the configuration of the agent for DNS client settings", kAgentConfigOpening,
          kAgentConfigProse, zorva::agent::configKeys()};
}

manual::Page pageOf(const manual::Command& command) {
  if (command.call != command.name()) {
    manual::Page page = manual::commandPage(command, proseOf(command.name()));
    addProgram(page);
    return page;
  }
  // The page of the program leaves options and examples of the commands to theirs.
  manual::Command program = command;
  for (manual::Command& each : program.commands) {
    each.options.clear();
    each.examples.clear();
    each.commands.clear();
  }
  manual::Page page = manual::commandPage(program, proseOf({}));
  page.summary = "show and change the DNS client configuration of this host as CIM objects";
  page.at("SYNOPSIS").blocks = {
      {manual::Block::Kind::Paragraph, "`zorvactl` [<OPTION>...] <COMMAND> [<OPTION>...] [<ARGUMENT>...]"}};
  return page;
}

std::vector<manual::Page> manualPages(const manual::Command& program) {
  std::vector<manual::Page> pages = {manual::configPage(agentConfigFile()), pageOf(program)};
  for (const manual::Command& each : program.commands) pages.push_back(pageOf(each));
  return pages;
}

}  // namespace zorva::cli
