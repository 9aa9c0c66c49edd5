#pragma once

// The certificate that a server showed in a TLS handshake of libcurl. Private to operations/.

#include <optional>
#include <string>

#include "cli/operations/Curl.h"

namespace zorva::cli {

struct ServerCertificate {
  std::string fingerprint;  ///< SHA-256 of the DER form: 64 lower-case hexadecimal digits
  std::string subject;
  std::string from;   ///< the first moment at which it is valid
  std::string until;  ///< the last one
};

/// The certificate of the handshake of this transfer, which must collect them (CURLOPT_CERTINFO); nothing: it made
/// none, because the connection was there already. Throws Failure if its fingerprint cannot be made.
std::optional<ServerCertificate> certificateOf(const Curl& curl);

/// Lines for a person, each after a line feed: subject, validity and fingerprint.
std::string describe(const ServerCertificate& certificate);

}  // namespace zorva::cli
