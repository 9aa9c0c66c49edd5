#pragma once

// For tests of --url: the CIM server of this project on a test host, and a server that sends what a test says.

#include <sys/types.h>

#include <functional>
#include <mutex>
#include <optional>
#include <string>
#include <thread>
#include <vector>

#include "util/NotCopied.h"

namespace zorva::cli {

class TestHost;

/// zorvacimd, which serves a test host on its own port while this object lives.
class TestServer : util::NotCopied {
 public:
  /// With this configuration; without one, everybody on this host may change settings.
  explicit TestServer(const TestHost& host, const std::string& config = "[access]\nanonymous = \"operate\"\n");
  ~TestServer();

  /// "http://127.0.0.1:40000"; empty if it did not start.
  const std::string& url() const { return url_; }

  /// "https://127.0.0.1:40000", or with that user; empty if the configuration has no certificate.
  const std::string& tlsUrl() const { return tlsUrl_; }
  std::string tlsUrlOf(const std::string& user) const { return "https://" + user + "@" + tlsUrl_.substr(8); }

 private:
  pid_t process_ = -1;
  std::string url_;
  std::string tlsUrl_;
};

/// A server that sends what a test says. Each connection takes one request.
class ScriptedServer : util::NotCopied {
 public:
  /// Returns the whole text of the HTTP reply to a request; nothing: there are no more.
  using Answer = std::function<std::optional<std::string>(const std::string& request)>;
  explicit ScriptedServer(Answer answer);

  /// These replies, one for each request, independent of its text; none after the last of them.
  explicit ScriptedServer(std::vector<std::string> replies);
  ~ScriptedServer();

  std::string url() const;

  /// The requests so far, with their header fields.
  std::vector<std::string> requests() const;

  /// A reply with this body, and further header fields, each ended by CRLF.
  static std::string reply(const std::string& body, const std::string& status = "200 OK",
                           const std::string& fields = {});

  /// A reply with a CIM-XML response in it: the content of an IMETHODRESPONSE.
  static std::string cimReply(const std::string& content);

  /// The same as from servers that fail after they have begun: a complete document in chunks, and the failure in the
  /// trailers after it.
  static std::string failedReply(const std::string& content, const std::string& code, const std::string& description);

 private:
  void serve(const Answer& answer);

  int listener_;
  std::thread thread_;
  mutable std::mutex mutex_;
  std::vector<std::string> requests_;
};

}  // namespace zorva::cli
