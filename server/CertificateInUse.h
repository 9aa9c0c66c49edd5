#pragma once

// The certificate that the server uses: read at the start and at a reload, and a line in the log before it expires.

#include <chrono>
#include <ctime>
#include <memory>
#include <optional>
#include <string>

#include "http/HttpServer.h"
#include "http/TlsIdentity.h"

namespace zorva::server {

/// What is to be said about the dates of a certificate: it has expired, is not valid yet, or expires within 30 days.
/// Nothing if all is well.
std::optional<std::string> expiryWarning(const http::TlsIdentity& identity, std::time_t now);

/// "2027-01-31"
std::string dateText(std::time_t time);

class CertificateInUse {
 public:
  /// Reads the files and gives them to the server. Throws std::runtime_error with a sentence.
  void use(const http::TlsFiles& files, http::HttpServer& server);

  /// The same again. If the files are not good, the server keeps what it has, and the log says why.
  void renew(const http::TlsFiles& files, http::HttpServer& server) noexcept;

  /// Once a day, a line in the log if the certificate expires soon.
  void lookAfter();

  bool exists() const noexcept { return identity_ != nullptr; }

 private:
  using Clock = std::chrono::steady_clock;

  std::shared_ptr<const http::TlsIdentity> identity_;
  Clock::time_point lookedAt_{};
};

}  // namespace zorva::server
