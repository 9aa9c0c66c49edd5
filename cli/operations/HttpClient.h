#pragma once

// POST over HTTP/1.1, with libcurl. It is loaded when a client is made, because only --url needs it and loading is
// slow.

#include <memory>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "cli/operations/ServerUrl.h"
#include "util/NotCopied.h"

namespace zorva::cli {

struct HttpReply {
  long status = 0;
  std::vector<std::pair<std::string, std::string>> fields;  ///< header fields and trailers, with names as received
  std::string body;

  /// The value of the last field of that name, in any case; empty if there is none.
  std::string_view field(std::string_view name) const noexcept;
};

/// One server, over connections that are kept open. Used by one thread.
class HttpClient : util::NotCopied {
 public:
  /// Throws Failure if libcurl cannot be loaded.
  explicit HttpClient(const ServerUrl& server);
  ~HttpClient();

  /// Sends `body` and waits for the whole reply: ten seconds for the connection, and two minutes for each further byte.
  /// `fields` are lines like "CIMOperation: MethodCall". Does not follow redirections or use proxies. Throws Failure if
  /// no reply comes, it is incomplete, or is larger than 256 MiB.
  HttpReply post(const std::vector<std::string>& fields, const std::string& body);

 private:
  struct Curl;
  std::unique_ptr<Curl> curl_;
  ServerUrl server_;
};

}  // namespace zorva::cli
