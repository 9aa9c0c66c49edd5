#pragma once

// Runs a command on the host, or on each of the hosts, that the command line names.

#include <functional>

#include "cli/session/Globals.h"

namespace zorva::cli {

/// What a command does, as far as the hosts matter on which it may run.
struct CommandNature {
  bool changes = false;  ///< it may change something on the host that is asked
  bool gathers = false;  ///< its results on several hosts can be put together
};

/// Executes a subcommand and writes to standard output. Throws Failure if it fails.
using Command = std::function<void(const Globals& globals)>;

/// Runs the command, in this process or with the server of the globals. With several servers it is run with each of
/// them, 32 at once, and the results become one table or one JSON document in which each row names its host. What fails
/// is told for each host at the end, and then Failure is thrown. A change on several hosts is only shown, unless the
/// options or the person at the terminal agree to it. `name` is the command's, for messages.
void runOnHosts(const Globals& globals, const std::string& name, CommandNature nature, const Command& command);

}  // namespace zorva::cli
