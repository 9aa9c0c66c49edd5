#pragma once

// The CIM servers that the command line names.

#include <string>
#include <vector>

#include "cli/operations/Server.h"
#include "cli/session/ServerOptions.h"

namespace zorva::cli {

/// Those of --url and --hosts, each once, without passwords. Throws Failure (wrong usage) that says what is wrong, and
/// where in a file.
std::vector<Server> serversOf(const ServerOptions& options);

/// Gives each server with a user its password: of the file of the options, of $ZORVACTL_PASSWORD_FILE, or of the
/// terminal, which is asked once for each user. Throws Failure if there is none.
void readPasswords(std::vector<Server>& servers, const ServerOptions& options);

/// A short name for each, which no other of them has: the host, with the port and the namespace where that is needed.
std::vector<std::string> labelsOf(const std::vector<Server>& servers);

/// 64 lower-case hexadecimal digits. Throws Failure (wrong usage) if the text is no SHA-256; colons and blanks between
/// the digits, upper case and "sha256:" before them do not matter.
std::string readFingerprint(std::string_view text);

}  // namespace zorva::cli
