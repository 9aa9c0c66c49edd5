#pragma once

#include <memory>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "cli/operations/ServerUrl.h"

// POST over HTTP/1.1, by libcurl, which is loaded when a client is made: only --url needs it, and it is heavy.

namespace zorva::cli {

struct HttpReply {
  long status = 0;
  std::vector<std::pair<std::string, std::string>> fields;  ///< header fields and trailers, names as they came
  std::string body;

  /// The value of the last field of that name, in any case; empty where there is none.
  std::string_view field(std::string_view name) const noexcept;
};

/// One server, over connections that are kept open. Used by one thread.
class HttpClient {
 public:
  /// Throws Failure where libcurl cannot be loaded.
  explicit HttpClient(const ServerUrl& server);
  ~HttpClient();
  HttpClient(const HttpClient&) = delete;
  HttpClient& operator=(const HttpClient&) = delete;

  /// Sends `body` and waits for the whole reply: ten seconds for the connection, and while a byte comes at least every
  /// two minutes. `fields` are lines like "CIMOperation: MethodCall". Neither follows redirections nor uses proxies.
  /// Throws Failure where no reply comes, it is broken off, or is larger than 256 MiB.
  HttpReply post(const std::vector<std::string>& fields, const std::string& body);

 private:
  struct Curl;
  std::unique_ptr<Curl> curl_;
  ServerUrl server_;
};

}  // namespace zorva::cli
