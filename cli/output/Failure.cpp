#include "cli/output/Failure.h"

#include "cli/output/Text.h"

namespace zorva::cli {

std::string statusText(const broker::Status& status) {
  std::string text = std::string(broker::statusName(status.rc)) + " (" + std::to_string(status.rc) + ")";
  if (!status.message.empty()) text += ": " + printable(status.message);
  return text;
}

Failure operationFailure(std::string_view operation, const broker::Status& status, std::string hint) {
  return {ExitCode::Failed, printable(operation) + ": " + statusText(status), std::move(hint)};
}

void requireDone(std::string_view operation, const broker::Status& status) {
  if (!status.ok()) throw operationFailure(operation, status);
}

}  // namespace zorva::cli
