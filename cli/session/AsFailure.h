#pragma once

#include <stdexcept>

#include "agent/config/Config.h"
#include "cli/output/Failure.h"
#include "cli/output/Text.h"

namespace zorva::cli {

/// Runs the work and converts the agent's exceptions to Failure: a wrong file is wrong usage, everything else a
/// failure.
template <typename Work>
auto asFailure(Work work) {
  try {
    return work();
  } catch (const zorva::agent::ConfigError& error) {
    throw Failure(ExitCode::WrongUsage, error.what());
  } catch (const Failure&) {
    throw;
  } catch (const std::runtime_error& error) {
    throw Failure(ExitCode::Failed, printable(error.what()));
  }
}

}  // namespace zorva::cli
