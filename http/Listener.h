#pragma once

#include <optional>
#include <string>
#include <vector>

// The sockets on which the server waits for clients. This server asks nobody who they are, so it listens on loopback
// addresses and on no other: 127.0.0.0/8 and ::1.

namespace zorva::http {

/// One listening address as text: "127.0.0.1", "::1".
using Addresses = std::vector<std::string>;

/// A file descriptor, closed at the end.
class Descriptor {
 public:
  Descriptor() = default;
  explicit Descriptor(int descriptor) : descriptor_(descriptor) {}
  ~Descriptor();
  Descriptor(Descriptor&& other) noexcept : descriptor_(other.release()) {}
  Descriptor& operator=(Descriptor&& other) noexcept;

  int get() const noexcept { return descriptor_; }
  int release() noexcept;
  explicit operator bool() const noexcept { return descriptor_ >= 0; }

 private:
  int descriptor_ = -1;
};

/// One listening socket, non-blocking and close-on-exec.
struct Listener {
  Descriptor socket;
  std::string url;  ///< "http://127.0.0.1:5988"
};

/// Refuses what is no loopback address. Throws std::invalid_argument with a sentence that names the address.
void checkAddresses(const Addresses& addresses);

/// Listens on these addresses, all on the same port; port 0 chooses one. Where no addresses are given, on 127.0.0.1 and
/// ::1, and a host without one of them gets by with the other. Throws std::runtime_error with a sentence.
std::vector<Listener> listenOn(const std::optional<Addresses>& addresses, int port);

/// Takes over sockets that this process was started with (descriptors 3 and up, sd_listen_fds(3)). Throws
/// std::runtime_error where one of them does not listen, or listens elsewhere than on loopback.
std::vector<Listener> adoptListeners(int count);

}  // namespace zorva::http
