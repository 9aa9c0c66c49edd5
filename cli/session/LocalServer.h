#pragma once

// The server of this host, for users who may not change its settings themselves.

#include <optional>
#include <string>

#include "cli/operations/Server.h"
#include "cli/session/Globals.h"

namespace zorva::cli {

enum class Need { Read, Change };

/// The server through which a command goes that reads or changes settings: nothing for who may do that in the data
/// directory, as root may, and where no server answers at the usual socket. A note tells that it is used. It is not
/// used where the command line or the environment names a configuration: the server may have another one, and so
/// another host's settings. A warning tells if settings cannot be read at all.
std::optional<Server> serverInstead(const Globals& globals, Need need);

/// Whether this user may read what is stored in the data directory; if not, serverInstead has told so.
bool mayReadSettings();

/// What a user may do who may not write to the data directory; empty if that is not the reason.
std::string hintForUnprivileged();

}  // namespace zorva::cli
