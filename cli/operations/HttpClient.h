#pragma once

// POST over HTTP/1.1, plain, over TLS or over a Unix socket, with libcurl.

#include <chrono>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "cli/operations/Server.h"
#include "util/NotCopied.h"

namespace zorva::cli {

struct Curl;

struct HttpReply {
  long status = 0;
  std::vector<std::pair<std::string, std::string>> fields;  ///< header fields and trailers, with names as received
  std::string body;

  /// The value of the last field of that name, in any case; empty if there is none.
  std::string_view field(std::string_view name) const noexcept;
};

/// One server, over connections that are kept open. Used by one thread.
///
/// A certificate is checked by libcurl, against authorities and the name in the URL. A pinned one is checked here:
/// libcurl can pin a key, and not a certificate. It calls back when a connection is there, TLS included, and before
/// anything is sent on it. There the certificate of this very handshake is compared, so neither the login nor the
/// request can reach another server.
class HttpClient : util::NotCopied {
 public:
  /// Throws Failure if libcurl cannot be loaded, or a file that the server's trust names cannot be read.
  explicit HttpClient(const Server& server);
  ~HttpClient();

  /// Sends `body` and waits for the whole reply: ten seconds for the connection, two minutes for each further byte, and
  /// in all as long as the server's patience says. `fields` are lines like "CIMOperation: MethodCall". Does not follow
  /// redirections or use proxies. Throws Failure if the server's certificate is not trusted, no reply comes, it is
  /// incomplete, or is larger than 256 MiB.
  HttpReply post(const std::vector<std::string>& fields, const std::string& body);

  /// Asks for what is at that path of the server ("/watch"), and calls `take` with each line of the response, without
  /// its line feed, until the server ends it, or `take` returns false. It has no time limit but that for silence.
  /// Returns the whole reply if its status is not 200. Throws Failure as post does, and what `take` throws.
  HttpReply follow(const std::string& path, const std::function<bool(std::string_view line)>& take);

 private:
  struct Pin;
  void placeTrust();
  void placeLogin();
  void placeDeadline(Curl& curl) const;
  [[noreturn]] void fail(int code, const HttpReply& reply) const;
  [[noreturn]] void refuseCertificate(int code) const;
  [[noreturn]] void giveUp() const;

  const Server server_;
  const std::optional<std::chrono::steady_clock::time_point> deadline_;
  std::unique_ptr<Curl> curl_;
  std::unique_ptr<Pin> pin_;  ///< null: libcurl checks the certificate
};

}  // namespace zorva::cli
