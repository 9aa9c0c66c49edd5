// show, classes.

#include <string>

#include "cli/commands/Commands.h"
#include "cli/commands/ViewJson.h"
#include "cli/output/Console.h"
#include "cli/output/ResultWriter.h"
#include "cli/output/Text.h"
#include "cli/session/HostView.h"
#include "cli/session/Session.h"

namespace zorva::cli {

namespace {

struct CountOptions {
  bool all = false;  ///< whatever time it takes
};

std::string orDash(const std::string& text) { return text.empty() ? "-" : text; }

Style styleOfState(const EndpointRow& row) {
  // CIM_EnabledLogicalElement.EnabledState: 2 Enabled, 3 Disabled.
  if (row.stateNumber == 2) return Style::Good;
  return row.stateNumber == 3 ? Style::Bad : Style::Warning;
}

/// A part of the view; without rows it says why there are none.
void writeSection(const std::string& heading, const Table& table, const std::string& whenEmpty, bool couldAsk,
                  const Layout& layout) {
  write(styled(heading, Style::Heading, layout) + "\n");
  write(table.empty() ? (couldAsk ? "  " + whenEmpty : std::string("  -")) + "\n" : table.text(layout));
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

Style styleOfSource(SettingSource source) {
  if (source == SettingSource::File) return Style::Good;
  return source == SettingSource::Set ? Style::Warning : Style::Faint;
}

Table settingTable(const std::vector<SettingRow>& rows, bool hasSources) {
  std::vector<std::string> headings{"INTERFACE", "SETTING", "VALUE"};
  if (hasSources) headings.emplace_back("FROM");
  Table table(headings, 2);
  const std::string* before = nullptr;
  for (const SettingRow& row : rows) {
    const bool isSame = before != nullptr && *before == row.interface;
    std::vector<Cell> cells{isSame ? "" : orDash(row.interface), row.setting, orDash(joined(row.values, " "))};
    if (hasSources) cells.emplace_back(sourceName(row.source), styleOfSource(row.source));
    table.add(std::move(cells));
    before = &row.interface;
  }
  return table;
}

Table classTable(const std::vector<ClassRow>& rows) {
  const bool hasProviders = !rows.empty() && !rows.front().provider.empty();
  std::vector<std::string> headings{"CLASS", "INSTANCES"};
  if (hasProviders) headings.insert(headings.end(), {"PROVIDER", "LIBRARY"});
  Table table(headings, 2);
  for (const ClassRow& row : rows) {
    std::vector<Cell> cells{row.name, row.count ? Cell(std::to_string(*row.count)) : Cell("-", Style::Faint)};
    if (hasProviders) cells.insert(cells.end(), {row.provider, row.library});
    table.add(std::move(cells));
  }
  return table;
}

void tellUncounted(const std::vector<ClassRow>& rows) {
  if (isUncounted(rows))
    tellNote("the associations of so many objects are not counted; --all counts them, which takes long");
}

HostView viewOf(Session& session, bool countsAll) {
  Progress progress;
  return readHostView(session, progress, countsAll);
}

std::vector<ClassRow> classesOf(Session& session, bool countsAll) {
  Progress progress;
  return readClassRows(session, progress, countsAll);
}

void showHost(const Globals& globals, const CountOptions& options) {
  requireFormat(globals.output, {OutputFormat::Table, OutputFormat::Json}, "show");
  Session session(globals);
  const HostView view = viewOf(session, options.all);
  tellUncounted(view.classes);
  if (globals.output == OutputFormat::Json) {
    write(hostViewJson(view) + "\n");
    return;
  }
  const Layout& layout = session.layout();
  write("DNS client configuration of " + styled(printable(view.systemName), Style::Heading, layout) + "\n\n");
  writeSection("Endpoints", endpointTable(view), "none: this host has no network interface besides loopback",
               view.couldAsk(kEndpointClass), layout);
  writeSection("Servers, in search order", serverTable(view), "none configured", view.couldAsk(kServerClass), layout);
  writeSection("Settings of each interface", settingTable(view.interfaceSettings, view.hasSources), "none",
               view.couldAsk(kSettingClass), layout);
  writeSection("Settings of the host", settingTable(view.hostSettings, view.hasSources), "none",
               view.couldAsk(kGeneralSettingClass), layout);
  writeSection("Classes", classTable(view.classes), "none", true, layout);
  for (const Problem& problem : view.problems) tellWarning(problemText(problem));
}

void listClasses(const Globals& globals, const CountOptions& options) {
  requireFormat(globals.output, {OutputFormat::Table, OutputFormat::Json}, "classes");
  Session session(globals);
  const std::vector<ClassRow> rows = classesOf(session, options.all);
  tellUncounted(rows);
  if (globals.output == OutputFormat::Json) {
    write(classRowsJson(rows) + "\n");
    return;
  }
  write(classTable(rows).text(session.layout()));
  for (const Problem& problem : problemsOf(rows)) tellWarning(problemText(problem));
}

void registerCounting(Subcommand& subcommand, void (*command)(const Globals& globals, const CountOptions& options)) {
  const auto options = std::make_shared<CountOptions>();
  subcommand.writes({OutputFormat::Table, OutputFormat::Json})
      .flag("--all", "Count the associations of a host with very many interfaces, too; takes long", options->all)
      .runs<CountOptions>(command, options);
}

}  // namespace

void addShowCommand(CommandLine& line) {
  Subcommand show = line.add("show", "The endpoints, servers and settings of this host at a glance");
  show.examples(
      "  zorvactl show\n"
      "  zorvactl show --output json\n"
      "  zorvactl show --url http://localhost:5988/root/cimv2");
  registerCounting(show, showHost);
}

void addClassesCommand(CommandLine& line) {
  Subcommand classes = line.add("classes", "The classes with their providers and instance counts");
  classes.examples("  zorvactl classes");
  registerCounting(classes, listClasses);
}

}  // namespace zorva::cli
