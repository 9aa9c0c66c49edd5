// overlay show, overlay clear.

#include <algorithm>
#include <optional>

#include "agent/Agent.h"
#include "cli/commands/Commands.h"
#include "cli/commands/ViewJson.h"
#include "cli/output/Console.h"
#include "cli/output/Failure.h"
#include "cli/output/Text.h"
#include "cli/output/TreeText.h"
#include "cli/session/Session.h"

namespace zorva::cli {

namespace {

void showOverlay(const Globals& globals) {
  const Session session(globals);
  const std::vector<zorva::agent::OverlayEntry> entries = asFailure([] { return zorva::agent::overlayEntries(); });
  std::vector<OverlayRow> rows;
  for (const zorva::agent::OverlayEntry& entry : entries) {
    rows.push_back(
        {entry.path, entry.propertyName, valueTexts(entry.value), !std::holds_alternative<std::string>(entry.value)});
  }
  if (globals.output == OutputFormat::Json) {
    write(overlayJson(rows) + "\n");
    return;
  }
  if (rows.empty()) {
    tellNote("no value is set; all come from the host itself");
    return;
  }
  Table table({"NODE", "PROPERTY", "VALUE"});
  for (const OverlayRow& row : rows) table.add({row.path, row.property, joined(row.values, ", ")});
  write(table.text(session.layout()));
}

void clearOverlay(const Globals& globals, const std::string& name) {
  const Session session(globals);
  const auto interface = name.empty() ? std::nullopt : std::optional(name);
  const std::size_t cleared = asFailure([&interface] { return zorva::agent::clearOverlay(interface); });
  if (cleared == 0 && interface) {
    throw Failure(ExitCode::Failed, "no value is set for " + printable(*interface),
                  "zorvactl overlay show lists those that are");
  }
  write(globals.output == OutputFormat::Json ? countJson("cleared", cleared) + "\n"
                                             : counted(cleared, "value") + " taken back\n");
}

}  // namespace

void addOverlayCommands(CommandLine& line) {
  Subcommand overlay = line.add("overlay", "Values that were set and replace the host's own");
  overlay.writesJson().examples("  zorvactl overlay show\n  zorvactl overlay clear eth0");

  overlay.add("show", "Show them").writesJson().local().examples("  zorvactl overlay show").runs(showOverlay);

  const auto interface = std::make_shared<std::string>();
  overlay.add("clear", "Take them back")
      .writesJson()
      .local()
      .examples(
          "  zorvactl overlay clear eth0\n"
          "  zorvactl overlay clear                        of all interfaces")
      .optionalWord("INTERFACE", "Of this interface alone", *interface)
      .runs<std::string>(clearOverlay, interface);
}

}  // namespace zorva::cli
