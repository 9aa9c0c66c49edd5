#pragma once

// Where a client comes from: what is known of its connection before any request.

#include <sys/types.h>

#include <cstdint>
#include <optional>
#include <string>

namespace zorva::access {

/// A client certificate whose chain ends at a certificate authority that the server trusts.
struct Certificate {
  std::string subject;      ///< the distinguished name (RFC 4514)
  std::string fingerprint;  ///< SHA-256 of the DER form: 64 lower-case hexadecimal digits
};

struct Origin {
  enum class Way : std::uint8_t { Loopback, Network, UnixSocket };

  Way way = Way::Loopback;
  bool isEncrypted = false;
  std::string address;             ///< without the port; empty for a Unix socket
  std::optional<uid_t> localUser;  ///< of the process at the other end of a Unix socket
  std::optional<Certificate> certificate;
};

}  // namespace zorva::access
