// ifcfg init, ifcfg show.
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <iterator>

#include "agent/Agent.h"
#include "cli/commands/Commands.h"
#include "cli/output/Failure.h"
#include "cli/output/JsonOutput.h"
#include "cli/output/ResultWriter.h"
#include "cli/output/Text.h"
#include "cli/session/Session.h"
#include "cli/session/SettingFile.h"

namespace zorva::cli {

namespace {

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

/// A fresh installation has no data directory yet. One of another name that is missing is more likely misspelt.
void makeDefaultDirectory() {
  const std::string directory = zorva::agent::dataDirectory();
  if (directory != zorva::agent::kDefaultDataDir || ::geteuid() != 0) return;
  if (::mkdir(directory.c_str(), 0755) == 0 || errno == EEXIST) return;
  throw Failure(ExitCode::Failed, directory + ": cannot be made: " + std::strerror(errno));
}

}  // namespace

void initInterfaceFile(const Arguments& arguments) {
  requireFormat(arguments.output, {OutputFormat::Table, OutputFormat::Json}, "ifcfg init");
  requireLocal(arguments, "ifcfg init");
  Session session(arguments);
  const auto tree = session.tree();
  const SettingFile file(arguments.target);
  const std::vector<SettingLine> lines = settingsOfHost(interfaceNode(*tree, arguments.target));
  if (!arguments.dryRun) {
    makeDefaultDirectory();
    const Session::Changing alone(session);
    file.write(lines, arguments.force);
  }
  if (arguments.output == OutputFormat::Json) {
    write(settingFileJson(file.path(), lines) + "\n");
    return;
  }
  write((arguments.dryRun ? "would write " : "") + printable(file.path()) + "\n" +
        settingTable(lines, session.layout()));
}

void showInterfaceFile(const Arguments& arguments) {
  requireFormat(arguments.output, {OutputFormat::Table, OutputFormat::Json}, "ifcfg show");
  requireLocal(arguments, "ifcfg show");
  const Session session(arguments);
  const SettingFile file(arguments.target);
  const std::vector<SettingLine> lines = file.read();
  if (arguments.output == OutputFormat::Json) {
    write(settingFileJson(file.path(), lines) + "\n");
    return;
  }
  write(printable(file.path()) + "\n" + settingTable(lines, session.layout()));
}

}  // namespace zorva::cli
