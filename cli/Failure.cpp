#include "cli/Failure.h"

#include "cli/Text.h"

namespace zorva::cli {

Failure operationFailure(std::string_view operation, const broker::Status& status, std::string hint) {
  std::string text =
      printable(operation) + ": " + std::string(broker::statusName(status.rc)) + " (" + std::to_string(status.rc) + ")";
  if (!status.message.empty()) text += ": " + printable(status.message);
  return {ExitCode::Failed, text, std::move(hint)};
}

void requireDone(std::string_view operation, const broker::Status& status) {
  if (!status.ok()) throw operationFailure(operation, status);
}

}  // namespace zorva::cli
