#pragma once

// The sockets on which the server waits for clients. Plain HTTP is for this host only: loopback addresses (127.0.0.0/8
// and ::1) and a Unix socket. HTTPS may listen on any address.

#include <sys/stat.h>

#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "http/Door.h"
#include "util/FileDescriptor.h"
#include "util/NotCopied.h"

namespace zorva::http {

/// One listening address as text: "127.0.0.1", "::1".
using Addresses = std::vector<std::string>;

/// The file of a Unix socket; removed at the end of this object, unless another file has replaced it.
class SocketFile : util::NotCopied {
 public:
  explicit SocketFile(std::string path);
  ~SocketFile();

 private:
  const std::string path_;
  struct stat made_ {};
};

/// One listening socket, non-blocking and close-on-exec.
struct Listener {
  util::FileDescriptor socket;
  std::string url;  ///< "http://127.0.0.1:5988", "https://[::]:5989", "unix:/run/zorvacimd/cim.sock"
  Door door = Door::Http;
  bool isLocal = true;  ///< only processes of this host reach it
  std::unique_ptr<SocketFile> file = nullptr;
};

/// Refuses what is no address, and for Door::Http what is not a loopback address. Throws std::invalid_argument with a
/// sentence that names the address.
void checkAddresses(const Addresses& addresses, Door door = Door::Http);

/// Listens on these addresses, all on the same port; port 0 chooses a free one. Without addresses it listens on
/// 127.0.0.1 and ::1; if the host lacks one of them, on the other only. Throws std::runtime_error with a sentence.
std::vector<Listener> listenOn(const std::optional<Addresses>& addresses, int port, Door door = Door::Http);

/// Listens on a Unix socket that every user may connect to. A file of a server that has died is replaced. Throws
/// std::runtime_error with a sentence, also if a server listens there.
Listener listenOnUnix(const std::string& path);

/// Sockets that this process was started with (descriptors 3 and up, sd_listen_fds(3)).
struct Inherited {
  int count = 0;
  std::vector<std::string> names;  ///< in the same order; may be shorter
};

/// Takes them over. A socket speaks HTTPS if its name is "https" or its port is `tlsPort`. Throws std::runtime_error if
/// one of them does not listen, or speaks plain HTTP and its address is not a loopback address.
std::vector<Listener> adoptListeners(const Inherited& inherited, std::optional<int> tlsPort);

}  // namespace zorva::http
