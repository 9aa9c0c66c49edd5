#pragma once

// The sockets on which zorvacimd listens, and what people are told about them.

#include <string>
#include <vector>

#include "http/Listener.h"
#include "server/Config.h"

namespace zorva::server {

/// Refuses a configuration by which other hosts could reach the server and nobody could log in. Throws
/// std::invalid_argument, with a sentence that says what is missing.
void checkLogins(const Config& config, bool hasUsers);

/// The sockets that the service manager has passed on, or those of the configuration. If HTTPS is configured and none
/// of the sockets passed on speaks it, those of the configuration are opened beside them. Throws std::runtime_error or
/// std::invalid_argument with a sentence.
std::vector<http::Listener> openListeners(const Config& config, bool hasUsers);

/// The line that says where the server listens. With hints also how to send it a request.
std::string greetingOf(const std::vector<http::Listener>& listeners, bool withHints);

/// The text of "/" for clients that are no browsers, or where there is no console.
std::string pageOf(const std::vector<http::Listener>& listeners);

}  // namespace zorva::server
