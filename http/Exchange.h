#pragma once

// The interface between the server's HTTP side and its CIM side: a complete request, and a sink that takes the response
// piece by piece (DSP0200 1.4).

#include <cstdint>
#include <functional>
#include <stdexcept>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "access/Role.h"

namespace zorva::http {

/// HTTP header fields in the order in which they came; names in any case.
using HeaderList = std::vector<std::pair<std::string, std::string>>;

/// A request with its transfer and content codings decoded.
struct HttpRequest {
  std::string method;  ///< POST or M-POST
  std::string path;
  HeaderList headers;
  std::string body;
  bool takesTrailers = false;  ///< the client said TE: trailers
  std::string client = {};     ///< the client, for limits per client
  std::string peer = {};       ///< the client's address and port
  access::ClientPtr who = {};  ///< who it is and what it may do; null: nobody asked
};

/// Thrown by ResponseSink::write if the client has closed the connection: nothing reads the rest.
class ClientGone : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

class ResponseSink;

/// Writes the response of a request that is abandoned, for the reason `why`. It owns what it needs of the request.
using LateAnswer = std::function<void(const std::string& why, ResponseSink& sink)>;

/// Takes the response to one request. Used by one thread at a time.
class ResponseSink {
 public:
  virtual ~ResponseSink() = default;

  /// The HTTP status and the header fields of the response; call it once, before anything else. `headers` contains
  /// Content-Type, but not the fields that belong to HTTP itself (Date, Content-Length, Transfer-Encoding, Connection).
  virtual void begin(int status, const HeaderList& headers) = 0;

  /// Another piece of the body. Blocks while too much of the response is unsent. Throws ClientGone.
  virtual void write(std::string_view text) = 0;

  /// Call it after begin if the operation failed, with a CIM status code. The failure is reported in trailers to a
  /// client that accepts them; else the connection is closed before the body is complete. Write nothing afterwards.
  virtual void fail(std::uint32_t cimStatus, std::string_view description) = 0;

  /// Call it before begin to set the response for the case that the request is abandoned. The function runs on the
  /// thread that abandons the request, so it must be quick and must not read the body again. Without it the response is
  /// an HTTP status.
  virtual void setLateAnswer(LateAnswer) {}

  /// False if the client no longer waits for the response and the work may end. For work that would not notice
  /// otherwise.
  virtual bool isWanted() const { return true; }

  /// True once begin was called.
  virtual bool begun() const = 0;
};

/// A response that goes on until its client or the server ends it. Thread-safe.
class Stream {
 public:
  virtual ~Stream() = default;

  /// The header fields of the response, Content-Type among them; call it once, first.
  virtual void beginStream(const HeaderList& headers) = 0;

  /// Sends more of it. Never waits. False: it is over, because the client is gone or does not read what came before.
  virtual bool offer(std::string_view text) = 0;

  /// Ends it.
  virtual void end() = 0;
};

}  // namespace zorva::http
