#pragma once

// The server's side of TLS: its certificate and key, and the authorities whose client certificates it asks for. An
// object never changes; a reload makes another one. Thread-safe.

#include <ctime>
#include <memory>
#include <optional>
#include <string>

#include "access/Origin.h"
#include "http/GnutlsHandles.h"
#include "util/NotCopied.h"

namespace zorva::http {

/// TLS 1.2 and 1.3 with forward secrecy and authenticated encryption only, in GnuTLS's words.
inline constexpr const char* kTlsPriorities =
    "NORMAL:-VERS-ALL:+VERS-TLS1.3:+VERS-TLS1.2:-KX-ALL:+ECDHE-ECDSA:+ECDHE-RSA:"
    "-CIPHER-ALL:+AES-128-GCM:+AES-256-GCM:+CHACHA20-POLY1305:-MAC-ALL:+AEAD:-SIGN-RSA-SHA1:-SIGN-ECDSA-SHA1";

/// Files in PEM.
struct TlsFiles {
  std::string certificate;  ///< with the chain, the server's own first
  std::string key;
  std::string clientCa;  ///< empty: no certificate is asked for

  bool operator==(const TlsFiles&) const = default;
};

/// What the certificate of a client says.
struct PeerCertificate {
  std::optional<access::Certificate> certificate;  ///< set if the client has one that is good
  std::string refusal;                             ///< a sentence if it has one that is not
};

class TlsIdentity : util::NotCopied {
 public:
  /// Reads the files. Throws std::runtime_error with a sentence that names the file: also for a key that does not
  /// belong to the certificate, and for a key's file that all users may read.
  static std::shared_ptr<const TlsIdentity> load(const TlsFiles& files);

  /// Makes a session that has not begun use this identity, which must outlive it. False if there is no memory.
  bool attach(gnutls_session_t session) const;

  /// Checks the chain, the dates and the purpose of the certificate that the client of a session has sent.
  PeerCertificate checkPeer(gnutls_session_t session) const;

  /// Whether the certificate is for that name or address.
  bool covers(const std::string& host) const;

  /// SHA-256 of the certificate's DER form: 64 lower-case hexadecimal digits.
  const std::string& fingerprint() const noexcept { return fingerprint_; }

  bool asksForCertificate() const noexcept { return asksForCertificate_; }
  std::time_t validFrom() const noexcept { return validFrom_; }
  std::time_t validUntil() const noexcept { return validUntil_; }

 private:
  TlsIdentity() = default;
  void readCertificate(const std::string& file);
  void readKey(const TlsFiles& files);
  void readAuthorities(const std::string& file);

  std::string chain_;  ///< in PEM
  TlsCredentials credentials_;
  X509Certificate own_;
  std::string fingerprint_;
  bool asksForCertificate_ = false;
  std::time_t validFrom_ = 0;
  std::time_t validUntil_ = 0;
};

/// The SHA-256 fingerprint of a certificate: 64 lower-case hexadecimal digits; empty if it cannot be computed.
std::string fingerprintOf(const X509Certificate& certificate);

}  // namespace zorva::http
