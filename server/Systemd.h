#pragma once

// The messages between a service manager and this process: the protocols of sd_notify(3) and sd_listen_fds(3). They are
// a datagram and two environment variables. Their library would load five others at every start.

#include <string_view>

#include "http/Listener.h"

namespace zorva::server {

/// Sends the service manager, if there is one, lines such as "READY=1". Failures are ignored.
void notifyServiceManager(std::string_view state);

/// The listening sockets that the service manager has passed on. Removes the variables from the environment, so that no
/// child takes the sockets for its own.
http::Inherited inheritedSockets();

}  // namespace zorva::server
