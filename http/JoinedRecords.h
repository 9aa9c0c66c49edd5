#pragma once

// Sends the head of a response together with its body, where TLS would send them one after the other: libmicrohttpd
// writes each of them as a record of its own. For one connection; not thread-safe.

#include <gnutls/gnutls.h>
#include <sys/types.h>

#include <cstddef>
#include <string>

#include "util/NotCopied.h"

namespace zorva::http {

class JoinedRecords : util::NotCopied {
 public:
  /// For a socket that does not block.
  explicit JoinedRecords(int socket) : socket_(socket) {}

  /// Takes over what the session sends; it has its socket already. The object must outlive the session.
  void attach(gnutls_session_t session);

  /// The next record waits for the one after it. Call it only where one follows at once.
  void joinNextTwo() { waits_ = true; }

  /// Sends a record, or keeps it for the next one. The number of its bytes that were taken; -1 with errno if none was,
  /// EAGAIN: come again with the same record when the socket takes more.
  ssize_t send(const void* data, std::size_t size);

 private:
  const int socket_;
  bool waits_ = false;
  std::string held_;  ///< what was taken from the session and not sent yet
};

}  // namespace zorva::http
