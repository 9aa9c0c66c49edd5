#include "cli/commands/HostsRun.h"

#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <thread>

#include "cli/output/Capture.h"
#include "cli/output/Console.h"
#include "cli/output/Failure.h"
#include "cli/output/JsonDocument.h"
#include "cli/output/Progress.h"
#include "cli/output/Terminal.h"
#include "cli/output/Text.h"
#include "cli/session/LocalServer.h"
#include "cli/session/Servers.h"

namespace zorva::cli {

namespace {

constexpr std::size_t kAtOnce = 32;
constexpr std::chrono::seconds kReadPatience{10};
/// A change may wait for the owner of an interface, and cutting it off leaves open whether it was made.
constexpr std::chrono::seconds kChangePatience{60};

struct HostOutcome {
  std::string label;
  std::string text;
  std::vector<Table> tables;
  std::vector<std::pair<std::string, std::string>> lines;
  std::optional<Failure> failure;
};

/// One host's turn, on any thread.
void runOne(const Globals& globals, const Command& command, HostOutcome& outcome) {
  Capture capture;
  try {
    command(globals);
  } catch (const Failure& failure) {
    outcome.failure = failure;
  } catch (const std::exception& error) {
    outcome.failure = Failure(ExitCode::Failed, printable(error.what()));
  }
  outcome.text = std::move(capture.text);
  outcome.tables = std::move(capture.tables);
  outcome.lines = std::move(capture.lines);
}

std::vector<HostOutcome> runAll(const Globals& globals, const std::vector<Server>& servers, const Command& command) {
  const std::vector<std::string> labels = labelsOf(servers);
  std::vector<HostOutcome> outcomes(servers.size());
  Progress progress;
  std::atomic<std::size_t> next{0};
  std::atomic<std::size_t> done{0};
  const auto work = [&] {
    for (std::size_t i = next++; i < servers.size(); i = next++) {
      Globals one = globals;
      one.server = servers[i];
      one.isOneOfMany = true;
      outcomes[i].label = labels[i];
      runOne(one, command, outcomes[i]);
      progress.step("asking " + counted(servers.size(), "host") + ", " + std::to_string(++done) + " answered");
    }
  };
  std::vector<std::thread> threads;
  for (std::size_t i = 0; i < std::min(servers.size(), kAtOnce); ++i) threads.emplace_back(work);
  for (std::thread& each : threads) each.join();
  return outcomes;
}

/// The tables of all hosts as one each, in the order in which the command writes them.
void writeTables(const std::vector<HostOutcome>& outcomes) {
  std::vector<Table> all;
  for (const HostOutcome& outcome : outcomes) {
    all.resize(std::max(all.size(), outcome.tables.size()));
    for (std::size_t i = 0; i < outcome.tables.size(); ++i) {
      all[i].append(outcome.tables[i], "HOST", outcome.label);
    }
  }
  bool isFirst = true;
  for (const Table& table : all) {
    if (table.empty()) continue;
    write((isFirst ? "" : "\n") + table.text(Layout::ofStandardOutput()));
    isFirst = false;
  }
}

/// An object for each result: "host" and "result".
void writeJson(const std::vector<HostOutcome>& outcomes) {
  Json rows = Json::array();
  for (const HostOutcome& outcome : outcomes) {
    // A failed command may have left a document that is not whole.
    Json document = Json::parse(outcome.text, nullptr, false);
    if (document.is_discarded()) continue;
    document.erase("version");
    Json results = document.contains("results") ? document["results"] : Json::array({document});
    for (Json& result : results) rows.push_back({{"host", asUtf8(outcome.label)}, {"result", std::move(result)}});
  }
  write(documentText(rows) + "\n");
}

/// What each host told, and its failure; each next step once. Returns the number of failed hosts.
std::size_t tellOutcomes(const std::vector<HostOutcome>& outcomes) {
  std::size_t failed = 0;
  std::vector<std::string> hints;
  for (const HostOutcome& outcome : outcomes) {
    const std::string who = printable(outcome.label) + ": ";
    for (const auto& [kind, line] : outcome.lines) tell(kind.c_str(), who + line);
    if (!outcome.failure) continue;
    ++failed;
    tellError(who + outcome.failure->what());
    const std::string& hint = outcome.failure->hint();
    if (!hint.empty() && std::find(hints.begin(), hints.end(), hint) == hints.end()) hints.push_back(hint);
  }
  for (const std::string& hint : hints) tellError(hint);
  return failed;
}

bool isUsage(const HostOutcome& outcome) {
  return outcome.failure && outcome.failure->exitCode() == ExitCode::WrongUsage;
}

/// Writes and tells all. Throws Failure if a host failed; its message ends in `consequence`.
void report(const Globals& globals, const std::vector<HostOutcome>& outcomes, const std::string& consequence = {}) {
  if (globals.output == OutputFormat::Json) {
    writeJson(outcomes);
  } else {
    writeTables(outcomes);
  }
  const std::size_t failed = tellOutcomes(outcomes);
  if (failed == 0) return;
  throw Failure(std::all_of(outcomes.begin(), outcomes.end(), isUsage) ? ExitCode::WrongUsage : ExitCode::Failed,
                std::to_string(failed) + " of " + counted(outcomes.size(), "host") + " failed" + consequence,
                consequence.empty() ? "" : "--yes changes it on the others");
}

/// Shows what the change would do, and throws Failure unless the person at the terminal agrees to it, or where it
/// cannot be done on all hosts.
void requireAgreement(const Globals& globals, const std::vector<Server>& servers, const Command& command) {
  Globals shown = globals;
  shown.dryRun = true;
  report(shown, runAll(shown, servers, command), globals.dryRun ? "" : "; nothing was changed");
  if (globals.dryRun) return;
  flushOutput();
  const bool hasPerson = ::isatty(STDIN_FILENO) != 0 && !globals.quiet;
  const auto answer = hasPerson
                          ? askTerminal("change this on " + counted(servers.size(), "host") + "? [y/N]: ", Echo::Shown)
                          : std::nullopt;
  if (answer && (*answer == "y" || *answer == "yes")) return;
  throw Failure(ExitCode::Failed,
                "nothing was changed: this is what would change on " + counted(servers.size(), "host"),
                "--yes changes it");
}

void requireGathering(const Globals& globals, const std::string& name, CommandNature nature) {
  if (!nature.gathers) {
    throw Failure(ExitCode::WrongUsage, name + " asks one host, and several are named",
                  "name one of them: --url https://USER@HOST");
  }
  if (globals.output != OutputFormat::Table && globals.output != OutputFormat::Json) {
    throw Failure(ExitCode::WrongUsage,
                  std::string("the results of several hosts cannot be written as ") + formatName(globals.output),
                  "it writes table, json");
  }
}

void runOnMany(const Globals& globals, std::vector<Server> servers, CommandNature nature, const Command& command) {
  for (Server& each : servers) {
    if (!each.patience) each.patience = nature.changes ? kChangePatience : kReadPatience;
  }
  if (nature.changes && (!globals.servers.yes || globals.dryRun)) {
    requireAgreement(globals, servers, command);
    if (globals.dryRun) return;
  }
  report(globals, runAll(globals, servers, command));
}

}  // namespace

void runOnHosts(const Globals& globals, const std::string& name, CommandNature nature, const Command& command) {
  std::vector<Server> servers = serversOf(globals.servers);
  if (globals.servers.many()) requireGathering(globals, name, nature);
  readPasswords(servers, globals.servers);
  if (globals.servers.many()) return runOnMany(globals, std::move(servers), nature, command);
  Globals one = globals;
  if (!servers.empty()) {
    one.server = std::move(servers.front());
  } else if (nature.gathers) {
    one.server = serverInstead(globals, nature.changes && !globals.dryRun ? Need::Change : Need::Read);
  }
  command(one);
}

}  // namespace zorva::cli
