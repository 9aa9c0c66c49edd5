// check.

#include <cstdio>

#include "cli/commands/CheckText.h"
#include "cli/commands/Commands.h"
#include "cli/commands/ViewJson.h"
#include "cli/output/Console.h"
#include "cli/output/Text.h"
#include "cli/session/HostView.h"
#include "cli/session/Session.h"
#include "dns/ServerCheck.h"

namespace zorva::cli {

namespace {

struct CheckOptions {
  std::vector<std::string> interfaces;
  std::string name;  ///< empty: the root
};

dns::Question questionOf(const CheckOptions& options) {
  if (options.name.empty()) return {};
  if (!dns::isName(options.name)) {
    throw Failure(ExitCode::WrongUsage, "'" + printable(options.name) + "' is no name that can be asked for",
                  "a name has labels of 1 to 63 characters with dots between them, and 253 in all");
  }
  return {options.name, dns::Type::A};
}

std::string timeText(const dns::CheckedServer& server) {
  if (server.answer.kind != dns::Answer::Kind::Response) return "-";
  char text[32];
  std::snprintf(text, sizeof text, "%.1f ms", static_cast<double>(server.answer.time.count()) / 1000);
  return text;
}

const char* resolvesText(const dns::CheckedSuffix& suffix) {
  if (!suffix.resolves) return "not known";
  return *suffix.resolves ? "resolves" : "does not resolve";
}

std::vector<dns::Asker> askersOf(const HostView& view, bool asksHost) {
  std::vector<dns::Asker> askers;
  for (const InterfaceRow& row : view.interfaces) {
    askers.push_back({row.name, dns::withPorts(row.servers, row.facts.serversInFull), {}, row.suffixes});
  }
  if (!asksHost) return askers;
  const HostRow& host = view.host;
  askers.push_back({"host", host.resolverServers, host.resolverNotAsked, host.resolverSearch});
  if (!host.servers.empty()) {
    askers.push_back({host.facts.owner, dns::withPorts(host.servers, host.facts.serversInFull), {}, host.ownSuffixes});
  }
  return askers;
}

void writeResult(const dns::CheckResult& result, const Layout& layout) {
  Table servers({"SERVER", "TIME", "ANSWER", "USED BY"});
  servers.keepRowsOnOneLine({{3, 12}, {2, 20}, {0, 15}});
  for (const dns::CheckedServer& server : result.servers) {
    servers.add({server.server, timeText(server), Cell(server.answerText(), server.isGood() ? Style::Good : Style::Bad),
                 Cell::list(server.usedBy)});
  }
  write(servers.text(layout));
  if (!result.suffixes.empty()) {
    Table suffixes({"SUFFIX", "ANSWER", "USED BY"});
    suffixes.keepRowsOnOneLine({{2, 12}, {0, 20}});
    for (const dns::CheckedSuffix& suffix : result.suffixes) {
      const Style style = suffix.resolves ? (*suffix.resolves ? Style::Good : Style::Bad) : Style::Warning;
      suffixes.add({suffix.suffix, Cell(resolvesText(suffix), style), Cell::list(suffix.usedBy)});
    }
    write("\n" + suffixes.text(layout));
  }
  if (!result.problems.empty()) write("\n");
  for (const dns::CheckProblem& problem : result.problems) {
    for (const std::string& line : wrapped(checkProblemText(problem), layout.width)) write(line + "\n");
  }
}

dns::CheckResult resultOf(Session& session, const CheckOptions& options) {
  const dns::Question question = questionOf(options);
  Progress progress;
  HostView view = readHostView(session, progress);
  for (const Problem& problem : view.problems) throw Failure(ExitCode::Failed, problemText(problem));
  if (!options.interfaces.empty()) keepOnly(view, options.interfaces);
  progress.step("asking the servers");
  return dns::checkServers(askersOf(view, options.interfaces.empty()), view.host.resolverServers, question);
}

void checkHost(const Globals& globals, const CheckOptions& options) {
  if (globals.server) {
    throw Failure(ExitCode::WrongUsage,
                  "zorvactl check asks the DNS servers from this host, and not from that of a URL",
                  "run it on that host without --url, or see what its servers answer to it: zorvactl ei "
                  "ZORVA_DNSServerCheck --url URL");
  }
  Session session(globals);
  const dns::CheckResult result = resultOf(session, options);
  if (globals.output == OutputFormat::Json) {
    write(checkJson(result) + "\n");
  } else if (!result.servers.empty()) {
    writeResult(result, session.layout());
  }
  if (result.servers.empty()) throw Failure(ExitCode::Failed, "there is no DNS server to ask");
  if (!result.problems.empty()) {
    throw Failure(ExitCode::Failed, counted(result.problems.size(), "problem") +
                                        ", the first: " + checkProblemText(result.problems.front()));
  }
}

}  // namespace

void addCheckCommand(CommandLine& line) {
  const auto options = std::make_shared<CheckOptions>();
  line.add("check", "Ask each DNS server, and look for settings that nothing uses")
      .writesJson()
      .examples(
          "  zorvactl check\n"
          "  zorvactl check eth0                           the servers of one interface\n"
          "  zorvactl check --name www.example.org         ask for this name, and not for the root")
      .option("--name", "NAME", "Ask for the address of this name, and not for the root", options->name)
      .words("INTERFACE", "Only the servers of these, and not those of the host", Many::Any, options->interfaces)
      .runs<CheckOptions>(checkHost, options);
}

}  // namespace zorva::cli
