// apply, confirm, revert.

#include <algorithm>
#include <chrono>

#include "agent/Agent.h"
#include "agent/SettingsLock.h"
#include "agent/apply/Apply.h"
#include "cli/commands/Commands.h"
#include "cli/commands/ViewJson.h"
#include "cli/output/Console.h"
#include "cli/output/Failure.h"
#include "cli/output/Text.h"
#include "cli/session/Session.h"
#include "cli/session/Trial.h"
#include "frontend/HostApply.h"

namespace zorva::cli {

namespace {

using zorva::agent::ApplyResult;
using zorva::agent::PropertyChange;

struct ApplyCommandOptions {
  std::vector<std::string> interfaces;
  bool all = false;
  bool automatic = false;
  std::string confirm;  ///< seconds; empty: no trial
};

/// What the command is about, in the words of its output.
struct Wording {
  const char* command;    ///< "apply"
  const char* done;       ///< "applied"
  const char* nothing;    ///< "the host has these settings already"
  const char* noneAtAll;  ///< "there are no settings to apply"
};
constexpr Wording kApplyWords{"apply", "applied", "the host has these settings already",
                              "there are no settings to apply; 'zorvactl ifcfg init' and 'zorvactl dns set' make some"};
constexpr Wording kRevertWords{"revert", "reverted", "nothing was changed here", "nothing was ever applied"};

std::string valuesText(const std::vector<std::string>& values) {
  return values.empty() ? "(none)" : joined(values, " ");
}

void addResult(Table& table, const ApplyResult& result, const Wording& words) {
  if (!result.problem.empty()) return;
  if (result.changes.empty()) table.add({result.interface, words.nothing});
  std::string interface = result.interface;
  for (const PropertyChange& change : result.changes) {
    table.add({interface, change.property, valuesText(change.before), "->", valuesText(change.after)});
    interface.clear();
  }
}

void writeTable(const Session& session, const std::vector<ApplyResult>& results, const Wording& words, bool isDryRun) {
  Table table;
  for (const ApplyResult& result : results) addResult(table, result, words);
  write(table.text(session.layout()));
  for (const ApplyResult& result : results) {
    if (!result.problem.empty()) continue;
    if (!isDryRun && !result.changes.empty())
      write(printable(result.interface) + ": " + words.done + " by " + printable(frontend::ownerText(result)) + "\n");
    if (!result.note.empty()) tellNote(printable(result.interface + ": " + result.note));
  }
}

void writeResults(const Session& session, const Globals& globals, const std::vector<ApplyResult>& results,
                  const Wording& words, bool isDryRun) {
  if (globals.output == OutputFormat::Json) {
    write(applyResultsJson(results) + "\n");
  } else if (results.empty()) {
    tellNote(words.noneAtAll);
  } else {
    writeTable(session, results, words, isDryRun);
  }
}

/// Throws Failure that names what was not done, if there is any.
void requireNoProblem(const std::vector<ApplyResult>& results, const Wording& words, bool isDryRun) {
  std::string problems;
  for (const ApplyResult& result : results) {
    if (result.problem.empty()) continue;
    problems += (problems.empty() ? "" : "\n") + printable(result.interface) +
                (isDryRun ? " could not be " : " was not ") + words.done + ": " + printable(result.problem);
  }
  if (!problems.empty()) throw Failure(ExitCode::Failed, problems);
}

bool changedAny(const std::vector<ApplyResult>& results) {
  return std::any_of(results.begin(), results.end(),
                     [](const ApplyResult& result) { return result.problem.empty() && !result.changes.empty(); });
}

std::chrono::seconds secondsOf(const std::string& text) {
  constexpr long kLongest = 3600;
  const bool isNumber = !text.empty() && text.size() <= 4 && text.find_first_not_of("0123456789") == std::string::npos;
  const long seconds = isNumber ? std::stol(text) : 0;
  if (seconds >= 1 && seconds <= kLongest) return std::chrono::seconds(seconds);
  throw Failure(ExitCode::WrongUsage,
                "--confirm needs a number of seconds from 1 to 3600, not '" + printable(text) + "'",
                "zorvactl apply --confirm 60");
}

void requireSelection(const ApplyCommandOptions& options, const Wording& words, bool needsOne) {
  if (options.all && !options.interfaces.empty()) {
    throw Failure(ExitCode::WrongUsage, std::string("zorvactl ") + words.command + " takes names or --all, not both");
  }
  if (needsOne && !options.all && options.interfaces.empty()) {
    throw Failure(ExitCode::WrongUsage,
                  std::string("zorvactl ") + words.command + " needs names of interfaces, or --all");
  }
}

/// The result of the work, during which no other program changes the stored settings. The lines of the agent's log are
/// left out: each problem is in the results.
template <typename Work>
auto whileSettingsStay(Session& session, Work work) {
  const Session::Quiet quiet(session);
  return asFailure([&] {
    const zorva::agent::SettingsLock lock(zorva::agent::dataDirectory(), zorva::agent::Access::Read);
    return work();
  });
}

std::vector<ApplyResult> applyOnce(Session& session, const Globals& globals, const ApplyCommandOptions& options,
                                   std::optional<std::chrono::seconds> trial = std::nullopt) {
  return whileSettingsStay(session, [&] {
    return zorva::agent::applySettings(options.interfaces, {globals.dryRun, options.automatic, trial});
  });
}

/// The service is not started again by what changes while it runs.
std::vector<ApplyResult> applyUntilNothingChanges(Session& session, const Globals& globals,
                                                  const ApplyCommandOptions& options) {
  constexpr int kMostTurns = 10;
  std::vector<ApplyResult> all = applyOnce(session, globals, options);
  std::vector<ApplyResult> results = all;
  for (int turn = 1; turn < kMostTurns && changedAny(results); ++turn) {
    results = applyOnce(session, globals, options);
    if (changedAny(results)) all.insert(all.end(), results.begin(), results.end());
  }
  return all;
}

void takeBack(Session& session, const char* why) {
  requireNoProblem(whileSettingsStay(session, [] { return zorva::agent::endTrial(); }), {"apply", "taken back", "", ""},
                   false);
  throw Failure(ExitCode::Failed, std::string(why) + ": the settings were taken back",
                "the values that were to be applied are still stored; 'zorvactl apply' tries them again");
}

void awaitVerdict(Session& session, const ApplyCommandOptions& options, std::chrono::seconds longest) {
  flushOutput();
  switch (asFailure([&] { return waitForVerdict(longest); })) {
    case Verdict::Confirmed:
      tellNote("confirmed; the settings stay");
      return;
    case Verdict::TimeIsUp:
      takeBack(session, "nobody confirmed in time");
      return;
    case Verdict::EndedElsewhere:
      break;
  }
  const auto left = asFailure([&] {
    return zorva::agent::applySettings(options.interfaces, {true, false, std::nullopt});
  });
  if (changedAny(left)) throw Failure(ExitCode::Failed, "another process took the settings back");
  tellNote("confirmed elsewhere; the settings stay");
}

void applyOnTrial(Session& session, const Globals& globals, const ApplyCommandOptions& options) {
  const std::chrono::seconds longest = secondsOf(options.confirm);
  const TrialGuard guard(globals);
  const std::vector<ApplyResult> results = applyOnce(session, globals, options, longest);
  writeResults(session, globals, results, kApplyWords, false);
  if (changedAny(results)) awaitVerdict(session, options, longest);
  requireNoProblem(results, kApplyWords, false);
}

void apply(const Globals& globals, const ApplyCommandOptions& options) {
  requireSelection(options, kApplyWords, false);
  Session session(globals);
  if (options.automatic && !zorva::agent::currentConfig().appliesToHost) return;
  if (!options.confirm.empty() && !globals.dryRun) return applyOnTrial(session, globals, options);
  const std::vector<ApplyResult> results =
      options.automatic ? applyUntilNothingChanges(session, globals, options) : applyOnce(session, globals, options);
  writeResults(session, globals, results, kApplyWords, globals.dryRun);
  requireNoProblem(results, kApplyWords, globals.dryRun);
}

void revert(const Globals& globals, const ApplyCommandOptions& options) {
  requireSelection(options, kRevertWords, true);
  Session session(globals);
  const std::vector<ApplyResult> results = whileSettingsStay(session, [&] {
    return zorva::agent::revertSettings(options.interfaces, {globals.dryRun, false, std::nullopt});
  });
  writeResults(session, globals, results, kRevertWords, globals.dryRun);
  requireNoProblem(results, kRevertWords, globals.dryRun);
}

void confirm(const Globals& globals) {
  const Session session(globals);
  asFailure([] {
    if (!zorva::agent::pendingTrial()) {
      throw Failure(ExitCode::Failed, "no settings are on trial",
                    "they were taken back already, or 'zorvactl apply --confirm SECONDS' was not run");
    }
    zorva::agent::confirmTrial();
  });
  write("the settings stay\n");
}

}  // namespace

void addApplyCommands(CommandLine& line) {
  const auto options = std::make_shared<ApplyCommandOptions>();
  line.add("apply", "Bring the stored settings to the host, through the owner of each interface")
      .writesJson()
      .local()
      .examples(
          "  zorvactl apply --dry-run                      what would change\n"
          "  zorvactl apply eth0\n"
          "  zorvactl apply --confirm 60                   taken back unless confirmed in a minute")
      .flag("--all", "Of all interfaces that have any, as without a name", options->all)
      .dryRun()
      .flag("--automatic",
            "As the service does: nothing unless the configuration says apply = \"host\", and not what was "
            "taken back",
            options->automatic)
      .option("--confirm", "SECONDS", "Take everything back unless it is confirmed in this time", options->confirm)
      .words("INTERFACE", "Of these interfaces", Many::Any, options->interfaces)
      .runs<ApplyCommandOptions>(apply, options);
  line.add("confirm", "Keep the settings that 'apply --confirm' has on trial")
      .writes({OutputFormat::Table})
      .local()
      .examples("  zorvactl confirm")
      .runs(confirm);
  const auto reverting = std::make_shared<ApplyCommandOptions>();
  line.add("revert", "Give the host back what it had before the first apply")
      .writesJson()
      .local()
      .examples("  zorvactl revert eth0\n  zorvactl revert --all --dry-run")
      .flag("--all", "Of all interfaces that were ever changed", reverting->all)
      .dryRun()
      .words("INTERFACE", "Of these interfaces", Many::Any, reverting->interfaces)
      .runs<ApplyCommandOptions>(revert, reverting);
  line.add("guard-trial", "Take the settings on trial back when standard input ends").hidden().runs(guardTrial);
}

}  // namespace zorva::cli
