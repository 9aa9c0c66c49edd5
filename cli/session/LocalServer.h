#pragma once

// The server of this host, for users who may not change its settings themselves.

#include <optional>
#include <string>

#include "cli/operations/Server.h"
#include "cli/session/Globals.h"

namespace zorva::cli {

/// The server through which a change goes: nothing for root and for who may write to the data directory, and where no
/// server answers at the usual socket. A note tells that it is used. It is not used where the command line or the
/// environment names a configuration: the server may have another one, and so another host's settings.
std::optional<Server> serverInstead(const Globals& globals);

/// What a user may do who may not write to the data directory; empty if that is not the reason.
std::string hintForUnprivileged();

}  // namespace zorva::cli
