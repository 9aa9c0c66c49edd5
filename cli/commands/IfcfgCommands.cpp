// ifcfg init, ifcfg show.

#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <iterator>

#include "agent/Agent.h"
#include "cli/commands/Commands.h"
#include "cli/commands/ViewJson.h"
#include "cli/output/Console.h"
#include "cli/output/Failure.h"
#include "cli/output/ResultWriter.h"
#include "cli/output/Text.h"
#include "cli/session/Session.h"
#include "cli/session/SettingFile.h"

namespace zorva::cli {

namespace {

struct InitOptions {
  std::string interface;
  bool force = false;
  bool dryRun = false;
};

std::string settingTable(const std::vector<SettingLine>& lines, const Layout& layout) {
  Table table({}, 2);
  for (const SettingLine& line : lines) table.add({line.key, line.value});
  for (const char* key : kSettingKeys) {
    const bool isThere =
        std::any_of(lines.begin(), lines.end(), [key](const SettingLine& line) { return line.key == key; });
    if (!isThere) table.add({key, Cell("(no such line: counts as empty, and cannot be changed)", Style::Warning)});
  }
  return table.text(layout);
}

/// A fresh installation has no data directory yet. A missing one with another name is probably misspelt.
void makeDefaultDirectory() {
  const std::string directory = zorva::agent::dataDirectory();
  if (directory != zorva::agent::kDefaultDataDir || ::geteuid() != 0) return;
  if (::mkdir(directory.c_str(), 0755) == 0 || errno == EEXIST) return;
  throw Failure(ExitCode::Failed, directory + ": cannot be made: " + std::strerror(errno));
}

void initInterfaceFile(const Globals& globals, const InitOptions& options) {
  requireFormat(globals.output, {OutputFormat::Table, OutputFormat::Json}, "ifcfg init");
  requireLocal(globals, "ifcfg init");
  Session session(globals);
  const auto tree = session.tree();
  const SettingFile file(options.interface);
  const std::vector<SettingLine> lines = settingsOfHost(interfaceNode(*tree, options.interface));
  if (!options.dryRun) {
    makeDefaultDirectory();
    const Session::Changing alone(session);
    file.write(lines, options.force);
  }
  if (globals.output == OutputFormat::Json) {
    write(settingFileJson(file.path(), lines) + "\n");
    return;
  }
  write((options.dryRun ? "would write " : "") + printable(file.path()) + "\n" + settingTable(lines, session.layout()));
}

void showInterfaceFile(const Globals& globals, const std::string& interface) {
  requireFormat(globals.output, {OutputFormat::Table, OutputFormat::Json}, "ifcfg show");
  requireLocal(globals, "ifcfg show");
  const Session session(globals);
  const SettingFile file(interface);
  const std::vector<SettingLine> lines = file.read();
  if (globals.output == OutputFormat::Json) {
    write(settingFileJson(file.path(), lines) + "\n");
    return;
  }
  write(printable(file.path()) + "\n" + settingTable(lines, session.layout()));
}

}  // namespace

void addIfcfgCommands(CommandLine& line) {
  Subcommand ifcfg = line.add("ifcfg", "The file of an interface's settings");
  ifcfg.writes({OutputFormat::Table, OutputFormat::Json})
      .examples("  zorvactl ifcfg init eth0\n  zorvactl ifcfg show eth0");

  const auto options = std::make_shared<InitOptions>();
  ifcfg.add("init", "Write it, with what the host says now")
      .writes({OutputFormat::Table, OutputFormat::Json})
      .examples(
          "  zorvactl ifcfg init eth0 --dry-run            what it would write\n"
          "  zorvactl ifcfg init eth0 --force              puts a new file in the old one's place")
      .word("INTERFACE", "The interface's name", options->interface)
      .flag("--dry-run", "Show what would be done, and do nothing", options->dryRun)
      .flag("--force", "Replace a file that is there", options->force)
      .runs<InitOptions>(initInterfaceFile, options);

  const auto interface = std::make_shared<std::string>();
  ifcfg.add("show", "Show it")
      .writes({OutputFormat::Table, OutputFormat::Json})
      .examples("  zorvactl ifcfg show eth0")
      .word("INTERFACE", "The interface's name", *interface)
      .runs<std::string>(showInterfaceFile, interface);
}

}  // namespace zorva::cli
