#pragma once

#include <stdexcept>
#include <string>
#include <string_view>
#include <utility>

#include "broker/objects/Value.h"

// How a command ends when it cannot do what it was asked.

namespace zorva::cli {

/// What the process gives back to the shell.
enum class ExitCode { Done = 0, Failed = 1, WrongUsage = 2 };

/// Thrown to end a command. what() names what went wrong and where; `hint` says what to do next and may be empty. Both
/// are shown as they stand, line feeds included: texts from elsewhere go through printable() first.
class Failure : public std::runtime_error {
 public:
  Failure(ExitCode exitCode, const std::string& message, std::string hint = {})
      : std::runtime_error(message), exitCode_(exitCode), hint_(std::move(hint)) {}

  ExitCode exitCode() const noexcept { return exitCode_; }
  const std::string& hint() const noexcept { return hint_; }

 private:
  ExitCode exitCode_;
  std::string hint_;
};

/// "CIM_ERR_NOT_FOUND (6): no such instance": the code with its name, and the text of who answered, made printable.
std::string statusText(const broker::Status& status);

/// The failure of a CIM operation: what was tried, the code with its name, the provider's or broker's text.
Failure operationFailure(std::string_view operation, const broker::Status& status, std::string hint = {});

/// Throws operationFailure where the status is one.
void requireDone(std::string_view operation, const broker::Status& status);

}  // namespace zorva::cli
