#pragma once

// How a command ends if it fails.

#include <stdexcept>
#include <string>
#include <string_view>
#include <utility>

#include "broker/objects/Value.h"

namespace zorva::cli {

/// The exit status of the process.
enum class ExitCode { Done = 0, Failed = 1, WrongUsage = 2 };

/// Thrown to end a command. what() names the error and its place; `hint` says what to do next and may be empty. Both
/// are shown unchanged, line feeds included: texts from elsewhere must go through printable() first.
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

/// "CIM_ERR_NOT_FOUND (6): no such instance": the code with its name, and the text of the provider or server, made
/// printable.
std::string statusText(const broker::Status& status);

/// The failure of a CIM operation: the operation, the code with its name, the provider's or broker's text.
Failure operationFailure(std::string_view operation, const broker::Status& status, std::string hint = {});

/// Throws operationFailure if the status is a failure.
void requireDone(std::string_view operation, const broker::Status& status);

}  // namespace zorva::cli
