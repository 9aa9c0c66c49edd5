#pragma once

// New connections, until their first byte shows whether the client speaks what the port speaks. A client that does not
// gets a sentence. A client of TLS stays here until the first record of its handshake is there as a whole: clients that
// send it byte by byte wake no thread. All functions are called on one thread, which never waits here; the table of
// connections limits how many connections there are and for how long.

#include <sys/socket.h>

#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <string_view>
#include <unordered_map>

#include "http/Connections.h"
#include "http/Door.h"
#include "util/FileDescriptor.h"
#include "util/NotCopied.h"

namespace zorva::http {

/// A connection that the HTTP library does not have yet.
struct Newcomer {
  util::FileDescriptor socket;
  sockaddr_storage peer{};
  socklen_t peerSize = 0;
  Door door = Door::Http;
  std::shared_ptr<Connection> connection;
  bool isWatched = false;   ///< by Reception's epoll
  bool hasEnded = false;    ///< the client sends nothing more
  std::size_t awaited = 0;  ///< bytes of the handshake's first record, if it is awaited
  bool isAnswered = false;  ///< it spoke the wrong protocol, and has been told so
  std::size_t dropped = 0;  ///< bytes that it sent since
};

class Reception : util::NotCopied {
 public:
  using Admit = std::function<void(Newcomer&&)>;

  /// `admit` takes connections whose client speaks the right protocol. Throws std::runtime_error.
  Reception(Connections& connections, Admit admit);
  ~Reception();

  /// Readable when look() has something to do.
  int descriptor() const noexcept { return epoll_.get(); }

  /// Admits the connection, at once if its first bytes are there.
  void add(Newcomer newcomer);

  /// Looks at the connections that have sent something or ended.
  void look();

 private:
  enum class Result : std::uint8_t { Waits, Admitted, Ended };
  Result lookAt(Newcomer& newcomer);
  Result admit(Newcomer& newcomer);
  void answer(Newcomer& newcomer);
  Result drop(Newcomer& newcomer) const;
  void end(Newcomer& newcomer);

  Connections& connections_;
  const Admit admit_;
  util::FileDescriptor epoll_;
  std::unordered_map<int, Newcomer> waiting_;
};

/// The answer to a client that speaks HTTP on a port of HTTPS, or TLS on one of HTTP. `address` is that of the port,
/// such as "192.0.2.1:5989".
std::string answerToWrongProtocol(Door door, std::string_view address);

}  // namespace zorva::http
