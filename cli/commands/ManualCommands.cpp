// help, and the hidden command that writes the manual pages.

#include <algorithm>

#include "cli/commands/Commands.h"
#include "cli/manual/Pages.h"
#include "cli/output/Console.h"
#include "cli/output/Failure.h"
#include "cli/output/Text.h"

namespace zorva::cli {

namespace {

constexpr std::size_t kWidth = 80;
constexpr std::size_t kWidestText = 120;

/// The command of these words, by its name or an alias. Null: none.
const manual::Command* commandAt(const manual::Command& program, const std::vector<std::string>& words) {
  const manual::Command* at = &program;
  for (const std::string& word : words) {
    const auto found = std::find_if(at->commands.begin(), at->commands.end(), [&](const manual::Command& each) {
      const auto& aliases = each.aliases;
      return each.name() == word || std::find(aliases.begin(), aliases.end(), word) != aliases.end();
    });
    if (found == at->commands.end()) return nullptr;
    at = &*found;
  }
  return at;
}

void showHelp(const manual::Command& program, std::vector<std::string> words) {
  const std::size_t terminal = Layout::ofStandardOutput().width;
  const std::size_t width = terminal == 0 ? kWidth : std::min(terminal, kWidestText);
  if (words == std::vector<std::string>{"agent.toml"}) {
    write(manual::textOf(manual::configPage(agentConfigFile()), width));
    return;
  }
  if (commandAt(program, words) == nullptr) {
    throw Failure(ExitCode::WrongUsage, "zorvactl has no command '" + printable(joined(words, " ")) + "'",
                  "zorvactl --help lists them");
  }
  // The commands below one are on its page.
  words.resize(std::min<std::size_t>(words.size(), 1));
  write(manual::textOf(pageOf(*commandAt(program, words)), width));
}

/// All that is installed of it: the pages as man(1) looks for them, below the directory, and beside them the
/// configuration and the completion scripts.
void writeManual(const manual::Command& program, const std::string& directory) {
  for (const manual::Page& each : manualPages(program)) manual::writePage(directory, each, ZORVA_VERSION);
  const manual::ConfigFile config = agentConfigFile();
  manual::writeFile(directory + "/" + std::string(config.name), manual::sampleOf(config));
  for (const std::string shell : {"bash", "zsh", "fish"}) {
    manual::writeFile(std::string(directory).append("/completion/").append(shell), completionScript(shell));
  }
}

}  // namespace

void addManualCommands(CommandLine& line) {
  const auto words = std::make_shared<std::vector<std::string>>();
  line.add("help", "The manual page of a command")
      .examples(
          "  zorvactl help apply\n"
          "  zorvactl help agent.toml                      the keys of the agent's configuration")
      .words("COMMAND", "The command", Many::Any, *words)
      .runs([&line, words](const Globals&) { showHelp(line.description(), *words); });

  // For the build only.
  const auto directory = std::make_shared<std::string>();
  line.add("manual", "").hidden().word("DIRECTORY", "", *directory).runs([&line, directory](const Globals&) {
    writeManual(line.description(), *directory);
  });
}

}  // namespace zorva::cli
