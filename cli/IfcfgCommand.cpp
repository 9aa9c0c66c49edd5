// ifcfg init, ifcfg show.
#include <algorithm>
#include <iterator>

#include "cli/Commands.h"
#include "cli/JsonOutput.h"
#include "cli/ResultWriter.h"
#include "cli/Session.h"
#include "cli/SettingFile.h"
#include "cli/Text.h"

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

}  // namespace

void initInterfaceFile(const Arguments& arguments) {
  requireFormat(arguments.output, {OutputFormat::Table, OutputFormat::Json}, "ifcfg init");
  requireLocal(arguments, "ifcfg init");
  const Session session(arguments);
  const auto tree = session.tree();
  const SettingFile file(arguments.target);
  const std::vector<SettingLine> lines = settingsOfHost(interfaceNode(*tree, arguments.target));
  if (!arguments.dryRun) {
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
