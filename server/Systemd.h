#pragma once

#include <string_view>

// What a service manager and this process tell each other: the protocols of sd_notify(3) and sd_listen_fds(3), which
// are a datagram and two environment variables. Their library would bring five others into every start.

namespace zorva::server {

/// Tells the service manager, where there is one, lines such as "READY=1". Failures are of no consequence.
void notifyServiceManager(std::string_view state);

/// How many listening sockets the service manager has handed over, from descriptor 3 on. The environment is cleared of
/// it, so that no child takes them for its own.
int countOfInheritedSockets();

}  // namespace zorva::server
