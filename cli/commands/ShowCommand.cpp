// show.

#include <algorithm>
#include <string>
#include <vector>

#include "cli/commands/Commands.h"
#include "cli/commands/ViewJson.h"
#include "cli/output/Console.h"
#include "cli/output/Text.h"
#include "cli/session/HostView.h"
#include "cli/session/Session.h"
#include "cli/session/SettingFiles.h"

namespace zorva::cli {

namespace {

struct ShowOptions {
  std::vector<std::string> names;
  bool all = false;  ///< also interfaces without DNS of their own
};

std::string orDash(const std::string& text) { return text.empty() ? "-" : text; }

Style styleOfState(const InterfaceRow& row) {
  // CIM_EnabledLogicalElement.EnabledState: 2 Enabled, 3 Disabled.
  if (row.stateNumber == 2) return Style::Good;
  return row.stateNumber == 3 ? Style::Bad : Style::Warning;
}

Style styleOfSource(SettingSource source) {
  if (source == SettingSource::File) return Style::Good;
  return source == SettingSource::Set ? Style::Warning : Style::Plain;
}

std::string labelOf(const InterfaceRow& row) { return orDash(row.name) + (row.isServiceProcessor ? " (BMC)" : ""); }

/// One line for each interface: the servers are cut last.
Table interfaceTable(const std::vector<const InterfaceRow*>& rows, bool hasSources) {
  std::vector<std::string> headings{"NAME", "STATE", "SERVERS", "DOMAIN", "SUFFIXES"};
  std::vector<Narrowing> narrowing{{4, 8}, {3, 11}, {2, 18}, {0, 12}};
  if (hasSources) {
    headings.emplace_back("FROM");
    narrowing.insert(narrowing.begin() + 1, {5, 16});
  }
  Table table(std::move(headings));
  table.keepRowsOnOneLine(std::move(narrowing));
  for (const InterfaceRow* row : rows) {
    std::vector<Cell> cells{labelOf(*row), Cell(orDash(row->state), styleOfState(*row)), Cell::list(row->servers),
                            orDash(row->domainName), Cell::list(row->suffixes)};
    if (hasSources) cells.emplace_back(orDash(row->from()), styleOfSource(row->source));
    table.add(std::move(cells));
  }
  return table;
}

void writeWrapped(const std::string& text, const Layout& layout) {
  for (const std::string& line : wrapped(printable(text), layout.width)) write(line + "\n");
}

std::vector<const InterfaceRow*> shownRows(const HostView& view, bool all) {
  std::vector<const InterfaceRow*> rows;
  for (const InterfaceRow& row : view.interfaces) {
    if (all || row.hasDns()) rows.push_back(&row);
  }
  if (!rows.empty()) return rows;
  for (const InterfaceRow& row : view.interfaces) rows.push_back(&row);
  return rows;
}

void writeInterfaces(const HostView& view, bool all, const Layout& layout) {
  const std::vector<const InterfaceRow*> rows = shownRows(view, all);
  if (rows.empty()) {
    const bool couldAsk = view.couldAsk(kEndpointClass);
    writeWrapped(couldAsk ? "no interface: this host has none besides loopback" : "-", layout);
    return;
  }
  write(interfaceTable(rows, view.hasSources).text(layout));
  const std::size_t left = view.interfaces.size() - rows.size();
  if (left == 1) writeWrapped("1 interface without DNS of its own is left out; --all shows it", layout);
  if (left > 1) {
    writeWrapped(std::to_string(left) + " interfaces without DNS of their own are left out; --all shows them", layout);
  }
}

void writeHost(const HostView& view, const Layout& layout) {
  const HostRow& host = view.host;
  Table table({}, 2);
  table.keepRowsOnOneLine({{1, 20}});
  const auto add = [&table](const std::string& label, const std::vector<std::string>& texts) {
    if (!texts.empty()) table.add({label, Cell::list(texts)});
  };
  write("\n" + styled("Host", Style::Heading, layout) + "\n");
  add("programs ask", host.resolverServers);
  add("never asked", host.resolverNotAsked);
  add("search list", host.resolverSearch);
  add("options", host.resolverOptions);
  add(orDash(host.facts.owner) + " asks", host.servers);
  table.add({"suffixes", view.couldAsk(kGeneralSettingClass) ? Cell::list(host.suffixes) : Cell("-")});
  write(table.text(layout));
  if (!host.place().empty()) writeWrapped("The suffixes are " + host.place() + ".", layout);
}

/// As of when the service processor's interfaces are.
void addReading(Table& table, const std::optional<BmcReading>& bmc) {
  if (!bmc) return;
  table.add({"read", Cell(bmc->text(), bmc->isUnknown ? Style::Bad : Style::Plain)});
  if (!bmc->problem.empty()) table.add({"problem", Cell(bmc->problem, Style::Warning)});
}

void writeBmc(const HostView& view, const Layout& layout) {
  if (!view.bmc) return;
  Table table({}, 2);
  addReading(table, view.bmc);
  write("\n" + styled("Service processor", Style::Heading, layout) + "\n" + table.text(layout));
}

Table settingTable(const std::vector<SettingRow>& rows, bool hasSources) {
  std::vector<std::string> headings{"SETTING", "VALUE"};
  if (hasSources) headings.insert(headings.begin() + 1, "FROM");
  Table table(std::move(headings), 2);
  for (const SettingRow& row : rows) {
    std::vector<Cell> cells{row.setting, orDash(joined(row.values, " "))};
    if (hasSources) cells.insert(cells.begin() + 1, Cell(sourceName(row.source), styleOfSource(row.source)));
    table.add(std::move(cells));
  }
  return table;
}

/// All of one interface, with everything in full.
void writeInterface(const InterfaceRow& row, const HostView& view, const Layout& layout) {
  const bool hasSources = view.hasSources;
  const OwnerFacts& facts = row.facts;
  Table table({}, 2);
  const auto addText = [&table](const char* label, const std::string& text) {
    if (!text.empty()) table.add({label, text});
  };
  const auto addList = [&table](const char* label, const std::vector<std::string>& texts) {
    for (std::size_t i = 0; i < texts.size(); ++i) table.add({i == 0 ? label : "", texts[i]});
  };
  const auto addOwnList = [&](const char* label, const std::vector<std::string>& texts) {
    addList(label, texts.empty() ? std::vector<std::string>{"-"} : texts);
  };
  write(styled(printable(labelOf(row)), Style::Heading, layout) + "\n");
  table.add({"state", Cell(orDash(row.state), styleOfState(row))});
  if (hasSources) table.add({"from", Cell(orDash(row.from()), styleOfSource(row.source))});
  addText("owner", facts.owner);
  addText("profile", facts.profile);
  addText("origin", facts.origin);
  addOwnList("servers", row.servers);
  addList("servers in full", facts.serversInFull);
  addList("servers of the host", row.hostServers);
  table.add({"domain", orDash(row.domainName)});
  addOwnList("suffixes", row.suffixes);
  addList("routing domains", facts.routingDomains);
  addText("default route", facts.defaultRoute);
  addText("DNS over TLS", facts.dnsOverTls);
  addText("DNSSEC", facts.dnssec);
  addText("LLMNR", facts.llmnr);
  addText("multicast DNS", facts.multicastDns);
  addText("host name", row.hostName);
  addText("system", row.system);
  if (row.isServiceProcessor) addReading(table, view.bmc);
  write(table.text(layout) + "\n" + settingTable(row.settings, hasSources).text(layout));
}

HostView viewOf(Session& session) {
  Progress progress;
  return readHostView(session, progress);
}

/// Rows, to be put together with those of other hosts.
void writeRows(const HostView& view, const ShowOptions& options, const Layout& layout) {
  std::vector<const InterfaceRow*> rows = shownRows(view, options.all || !options.names.empty());
  writeTable(interfaceTable(rows, true), layout);  // the same columns for each host
  if (!options.names.empty()) return;
  Table suffixes({"SUFFIXES OF THE HOST"});
  suffixes.keepRowsOnOneLine({});
  suffixes.add({view.couldAsk(kGeneralSettingClass) ? Cell::list(view.host.suffixes) : Cell("-")});
  writeTable(suffixes, layout);
}

void writeView(const HostView& view, const ShowOptions& options, const Layout& layout) {
  if (layout.rowsAlone) return writeRows(view, options, layout);
  if (!options.names.empty()) {
    for (const InterfaceRow& row : view.interfaces) {
      if (&row != &view.interfaces.front()) write("\n");
      writeInterface(row, view, layout);
    }
    return;
  }
  write("DNS client configuration of " + styled(printable(view.systemName), Style::Heading, layout) + "\n\n");
  writeInterfaces(view, options.all, layout);
  writeHost(view, layout);
  writeBmc(view, layout);
}

void showHost(const Globals& globals, const ShowOptions& options) {
  Session session(globals);
  HostView view = viewOf(session);
  if (!options.names.empty() && view.couldAsk(kEndpointClass)) keepOnly(view, options.names);
  if (globals.output == OutputFormat::Json) {
    write(hostViewJson(view) + "\n");
  } else {
    writeView(view, options, session.layout());
  }
  for (const Problem& problem : view.problems) tellWarning(problemText(problem));
  warnOfOrphans(session);
}

}  // namespace

void addShowCommand(CommandLine& line) {
  const auto options = std::make_shared<ShowOptions>();
  line.add("show", "The DNS servers and domains of each interface, and who says so")
      .writesJson()
      .gathers()
      .examples(
          "  zorvactl show\n"
          "  zorvactl show eth0                            all of one\n"
          "  zorvactl show --output json\n"
          "  zorvactl show --url https://admin@host1       what the server of another host says\n"
          "  zorvactl show --hosts hosts.txt --user admin  a row for each interface of each host")
      .flag("--all", "Show interfaces without DNS of their own as well", options->all)
      .words("NAME", "An interface; of each the whole is shown", Many::Any, options->names, "INTERFACE")
      .runs<ShowOptions>(showHost, options);
}

}  // namespace zorva::cli
