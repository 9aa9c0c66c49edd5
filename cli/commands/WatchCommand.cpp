// watch.

#include <poll.h>
#include <unistd.h>

#include <algorithm>
#include <charconv>
#include <cstdint>

#include "agent/HostWatch.h"
#include "cli/commands/Commands.h"
#include "cli/operations/RemoteOperations.h"
#include "cli/output/Console.h"
#include "cli/output/JsonDocument.h"
#include "cli/output/Text.h"
#include "cli/session/Session.h"

namespace zorva::cli {

namespace {

struct WatchOptions {
  std::vector<std::string> names;
  bool json = false;
  std::string count;  ///< empty: no end
};

std::uint64_t countOf(const WatchOptions& options) {
  if (options.count.empty()) return UINT64_MAX;
  std::uint64_t count = 0;
  const char* end = options.count.data() + options.count.size();
  const auto [read, error] = std::from_chars(options.count.data(), end, count);
  if (error == std::errc() && read == end && count > 0) return count;
  throw Failure(ExitCode::WrongUsage,
                "--count takes a whole number of at least 1, and not '" + printable(options.count) + "'");
}

std::string textOf(const Json& value) {
  if (value.is_string()) return value.get<std::string>();
  if (value.is_null()) return "-";
  if (value.is_object()) return value.value("address", "?") + "/" + std::to_string(value.value("prefix_length", 0));
  if (!value.is_array()) return value.dump();
  std::vector<std::string> texts;
  for (const Json& each : value) texts.push_back(textOf(each));
  return texts.empty() ? "-" : joined(texts, ", ");
}

/// Writes the changes that are asked for.
class Report {
 public:
  Report(const Globals& globals, const WatchOptions& options)
      : names_(options.names), isJson_(options.json || globals.output == OutputFormat::Json), left_(countOf(options)) {}

  /// A line of the form of agent::jsonLine(), with or without its line feed; empty ones are passed over. False: it was
  /// the last one that is wanted.
  bool take(std::string_view line) {
    if (line.find_first_not_of(" \r\n") == std::string_view::npos) return begin();
    const Json change = Json::parse(line, nullptr, false);
    if (!change.is_object() || !change.contains("property") || !change.contains("interface")) {
      throw Failure(ExitCode::Failed, "what came is no change: " + printable(line.substr(0, 200)));
    }
    const std::string interface = textOf(change["interface"]);
    if (!names_.empty() && std::find(names_.begin(), names_.end(), interface) == names_.end()) return true;
    write(isJson_ ? change.dump() + "\n" : textLine(change, interface));
    flushOutput();
    return --left_ > 0;
  }

  /// From now on changes are reported.
  bool begin() {
    if (!std::exchange(hasBegun_, true)) tellNote("watching; each change is a line");
    return true;
  }

 private:
  static std::string textLine(const Json& change, const std::string& interface) {
    const auto part = [&](const char* name) { return printable(textOf(change.value(name, Json()))); };
    return part("time") + "  " + printable(interface) + "  " + part("property") + "  " + part("old") + " -> " +
           part("new") + "  (" + part("by") + ")\n";
  }

  const std::vector<std::string>& names_;
  const bool isJson_;
  std::uint64_t left_;
  bool hasBegun_ = false;
};

/// Until the reader of the output is gone.
void watchThisHost(Report& report) {
  zorva::agent::HostWatch watch;
  report.begin();
  std::vector<pollfd> output{{STDOUT_FILENO, 0, 0}};
  while (output.front().revents == 0) {
    watch.wait(output);
    for (const zorva::agent::HostChange& change : watch.changes()) {
      if (!report.take(zorva::agent::jsonLine(change))) return;
    }
  }
}

void watchHost(const Globals& globals, const WatchOptions& options) {
  Report report(globals, options);
  const Session session(globals);
  if (!session.isRemote()) return asFailure([&] { watchThisHost(report); });
  bool isOver = false;
  followChanges(*globals.server, [&](std::string_view line) {
    isOver = !report.take(line);
    return !isOver;
  });
  if (!isOver) throw Failure(ExitCode::Failed, globals.server->url.shown() + " has ended the report of changes");
}

}  // namespace

void addWatchCommand(CommandLine& line) {
  const auto options = std::make_shared<WatchOptions>();
  line.add("watch", "Each change of the host's DNS settings, as it happens")
      .writesJson()
      .examples(
          "  zorvactl watch\n"
          "  zorvactl watch eth0 eth1                      only of these interfaces\n"
          "  zorvactl watch --json                         a JSON object for each change, on a line\n"
          "  zorvactl watch --count 1 eth0                 wait for one change\n"
          "  zorvactl watch --url https://admin@host1      the changes of another host")
      .flag("--json", "Write each change as a JSON object on one line, as --output json does", options->json)
      .option("--count", "N", "End after that many changes", options->count)
      .words("NAME", "Only the changes of these interfaces", Many::Any, options->names, "INTERFACE")
      .runs<WatchOptions>(watchHost, options);
}

}  // namespace zorva::cli
