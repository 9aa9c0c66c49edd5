// overlay show, overlay clear.
#include <algorithm>
#include <optional>

#include "agent/Agent.h"
#include "cli/commands/Commands.h"
#include "cli/output/Failure.h"
#include "cli/output/JsonOutput.h"
#include "cli/output/ResultWriter.h"
#include "cli/output/Text.h"
#include "cli/output/TreeText.h"
#include "cli/session/Session.h"

namespace zorva::cli {

void showOverlay(const Arguments& arguments) {
  requireFormat(arguments.output, {OutputFormat::Table, OutputFormat::Json}, "overlay show");
  requireLocal(arguments, "overlay show");
  const Session session(arguments);
  const std::vector<zorva::agent::OverlayEntry> entries = asFailure([] { return zorva::agent::overlayEntries(); });
  std::vector<OverlayRow> rows;
  for (const zorva::agent::OverlayEntry& entry : entries) {
    rows.push_back(
        {entry.path, entry.propertyName, valueTexts(entry.value), !std::holds_alternative<std::string>(entry.value)});
  }
  if (arguments.output == OutputFormat::Json) {
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

void clearOverlay(const Arguments& arguments) {
  requireFormat(arguments.output, {OutputFormat::Table}, "overlay clear");
  requireLocal(arguments, "overlay clear");
  const Session session(arguments);
  const auto interface = arguments.target.empty() ? std::nullopt : std::optional(arguments.target);
  const std::size_t cleared = asFailure([&interface] { return zorva::agent::clearOverlay(interface); });
  if (cleared == 0 && interface) {
    throw Failure(ExitCode::Failed, "no value is set for " + printable(*interface),
                  "zorvactl overlay show lists those that are");
  }
  write(counted(cleared, "value") + " taken back\n");
}

}  // namespace zorva::cli
