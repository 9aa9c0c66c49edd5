#pragma once

// Requests to a service processor over HTTPS, with libcurl. Everything that comes from there is bounded.

#include <atomic>
#include <chrono>
#include <functional>
#include <memory>
#include <stdexcept>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "util/NotCopied.h"

namespace zorva::bmc {

/// The service processor could not be asked or changed. what() is one line for a person, without control characters and
/// without a secret. Thrown by everything in this folder that talks to it; caught at the end of a reading or a request.
class Failed : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

using Clock = std::chrono::steady_clock;

/// How its certificate is checked.
struct Trust {
  std::string caFile;       ///< authorities; empty: the system's
  std::string fingerprint;  ///< SHA-256, 64 lower-case digits; not empty: nothing else is checked
  /// What the fingerprint is by now. Asked when a certificate has another one, before anything is sent; throws Failed
  /// if that is not known. Set: only fingerprints are checked.
  std::function<std::string()> currentFingerprint{};
};

struct Request {
  const char* method = "GET";
  std::string path;                 ///< with its query
  std::vector<std::string> fields;  ///< lines like "If-Match: *"
  std::string body;
};

struct Reply {
  long status = 0;
  std::vector<std::pair<std::string, std::string>> fields;  ///< header fields, with names as received
  std::string body;

  /// The value of the last field of that name, in any case; empty if there is none.
  std::string_view field(std::string_view name) const noexcept;
};

/// The limits of one reply.
inline constexpr std::size_t kLargestBody = std::size_t{4} << 20;
inline constexpr std::size_t kLargestHead = std::size_t{64} << 10;

/// One server, over a connection that is kept open. TLS 1.2 at least; the certificate is always checked, a fingerprint
/// in the handshake of the very connection, before anything is sent on it. No proxy, no redirection. Used by one
/// thread.
class Https : util::NotCopied {
 public:
  /// The URL has neither path nor login.
  Https(std::string url, Trust trust);
  ~Https();

  const std::string& url() const { return url_; }

  /// Requests end at that moment; those in progress end soon after `isCancelled` becomes true.
  void setDeadline(Clock::time_point deadline) { deadline_ = deadline; }
  void setCancel(const std::atomic<bool>* isCancelled) { isCancelled_ = isCancelled; }

  /// Throws Failed if there is no whole reply in time, it is too large, or the certificate is not trusted.
  Reply send(const Request& request);

 private:
  struct Transfer;
  void place(Transfer& transfer, const Request& request);
  void placeTrust(Transfer& transfer);
  bool isTrusted(Transfer& transfer, const std::string& fingerprint);
  [[noreturn]] void fail(const Transfer& transfer, int code) const;

  const std::string url_;
  Trust trust_;
  Clock::time_point deadline_ = Clock::time_point::max();
  const std::atomic<bool>* isCancelled_ = nullptr;
  std::string checked_;  ///< the ends of the connection whose fingerprint was right
  void* easy_ = nullptr;
};

}  // namespace zorva::bmc
