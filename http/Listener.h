#pragma once

// The sockets on which the server waits for clients. The server does not authenticate clients, so it listens only on
// loopback addresses: 127.0.0.0/8 and ::1.

#include <optional>
#include <string>
#include <vector>

#include "util/FileDescriptor.h"

namespace zorva::http {

/// One listening address as text: "127.0.0.1", "::1".
using Addresses = std::vector<std::string>;

/// One listening socket, non-blocking and close-on-exec.
struct Listener {
  util::FileDescriptor socket;
  std::string url;  ///< "http://127.0.0.1:5988"
};

/// Refuses an address that is not a loopback address. Throws std::invalid_argument with a sentence that names the
/// address.
void checkAddresses(const Addresses& addresses);

/// Listens on these addresses, all on the same port; port 0 chooses a free one. Without addresses it listens on
/// 127.0.0.1 and ::1; if the host lacks one of them, on the other only. Throws std::runtime_error with a sentence.
std::vector<Listener> listenOn(const std::optional<Addresses>& addresses, int port);

/// Takes over sockets that this process was started with (descriptors 3 and up, sd_listen_fds(3)). Throws
/// std::runtime_error if one of them does not listen, or its address is not a loopback address.
std::vector<Listener> adoptListeners(int count);

}  // namespace zorva::http
