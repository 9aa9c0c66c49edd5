// show, classes.
#include <string>

#include "cli/Commands.h"
#include "cli/HostView.h"
#include "cli/JsonOutput.h"
#include "cli/ResultWriter.h"
#include "cli/Session.h"
#include "cli/Text.h"

namespace zorva::cli {

namespace {

std::string orDash(const std::string& text) { return text.empty() ? "-" : text; }

Style styleOfState(const EndpointRow& row) {
  // CIM_EnabledLogicalElement.EnabledState: 2 Enabled, 3 Disabled.
  if (row.stateNumber == 2) return Style::Good;
  return row.stateNumber == 3 ? Style::Bad : Style::Warning;
}

void writeSection(const std::string& heading, const Table& table, const std::string& whenEmpty, const Layout& layout) {
  write(styled(heading, Style::Heading, layout) + "\n");
  write(table.empty() ? "  " + whenEmpty + "\n" : table.text(layout));
  write("\n");
}

Table endpointTable(const HostView& view) {
  Table table({"NAME", "STATE", "HOST NAME", "DOMAIN", "SUFFIXES", "SYSTEM"}, 2);
  for (const EndpointRow& row : view.endpoints) {
    table.add({orDash(row.name), Cell(orDash(row.state), styleOfState(row)), orDash(row.hostName),
               orDash(row.domainName), orDash(joined(row.suffixes, " ")), orDash(row.system)});
  }
  return table;
}

Table serverTable(const HostView& view) {
  Table table({"ORDER", "ADDRESS"}, 2);
  for (const ServerRow& row : view.servers) table.add({std::to_string(row.order), row.address});
  return table;
}

Table settingTable(const std::vector<SettingRow>& rows) {
  Table table({"INTERFACE", "SETTING", "VALUE", "FROM"}, 2);
  const std::string* before = nullptr;
  for (const SettingRow& row : rows) {
    const bool isSame = before != nullptr && *before == row.interface;
    table.add({isSame ? "" : orDash(row.interface), row.setting, orDash(joined(row.values, " ")),
               Cell(sourceName(row.source), row.source == SettingSource::File ? Style::Good : Style::Faint)});
    before = &row.interface;
  }
  return table;
}

Table classTable(const std::vector<ClassRow>& rows) {
  Table table({"CLASS", "INSTANCES", "PROVIDER", "LIBRARY"}, 2);
  for (const ClassRow& row : rows) {
    table.add(
        {row.name, row.count ? Cell(std::to_string(*row.count)) : Cell("-", Style::Faint), row.provider, row.library});
  }
  return table;
}

}  // namespace

void showHost(const Arguments& arguments) {
  requireFormat(arguments.output, {OutputFormat::Table, OutputFormat::Json}, "show");
  Session session(arguments);
  const HostView view = readHostView(session);
  if (arguments.output == OutputFormat::Json) {
    write(hostViewJson(view) + "\n");
    return;
  }
  const Layout& layout = session.layout();
  write("DNS client configuration of " + styled(printable(view.systemName), Style::Heading, layout) + "\n\n");
  writeSection("Endpoints", endpointTable(view), "none: this host has no network interface besides loopback", layout);
  writeSection("Servers, in search order", serverTable(view), "none configured", layout);
  writeSection("Settings of each interface", settingTable(view.interfaceSettings), "none", layout);
  writeSection("Settings of the host", settingTable(view.hostSettings), "none", layout);
  writeSection("Classes", classTable(view.classes), "none", layout);
  for (const std::string& problem : view.problems) tellWarning(problem);
}

void listClasses(const Arguments& arguments) {
  requireFormat(arguments.output, {OutputFormat::Table, OutputFormat::Json}, "classes");
  Session session(arguments);
  const std::vector<ClassRow> rows = readClassRows(session);
  if (arguments.output == OutputFormat::Json) {
    write(classRowsJson(rows) + "\n");
    return;
  }
  write(classTable(rows).text(session.layout()));
  for (const ClassRow& row : rows) {
    if (!row.problem.empty()) tellWarning(row.problem);
  }
}

}  // namespace zorva::cli
