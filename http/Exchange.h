#pragma once

#include <cstdint>
#include <functional>
#include <stdexcept>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

// What passes between the HTTP side of the server and its CIM side: a request that arrived whole, and the place where
// its response goes piece by piece (DSP0200 1.4).

namespace zorva::http {

/// HTTP header fields in the order in which they came; names in any case.
using HeaderList = std::vector<std::pair<std::string, std::string>>;

/// A request as HTTP delivered it, its transfer and content codings undone.
struct HttpRequest {
  std::string method;  ///< POST or M-POST
  std::string path;
  HeaderList headers;
  std::string body;
  bool takesTrailers = false;  ///< the client said TE: trailers
  std::string client = {};     ///< who sent it, for what is limited by client
  std::string peer = {};       ///< the client's address and port
};

/// Thrown by ResponseSink::write when the client has gone: nobody waits for the rest.
class ClientGone : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

class ResponseSink;

/// Writes the answer to a request that is given up, for the reason `why`. It holds what it needs of the request.
using LateAnswer = std::function<void(const std::string& why, ResponseSink& sink)>;

/// Takes the response to one request. Used by one thread at a time.
class ResponseSink {
 public:
  virtual ~ResponseSink() = default;

  /// The HTTP status and the header fields of the response; once, before anything else. Content-Type comes with
  /// `headers`; what belongs to HTTP itself (Date, Content-Length, Transfer-Encoding, Connection) does not.
  virtual void begin(int status, const HeaderList& headers) = 0;

  /// A further piece of the body. Blocks while too much of the response is unsent. Throws ClientGone.
  virtual void write(std::string_view text) = 0;

  /// After begin: the operation failed, with a CIM status code, although its response has begun. It is told in trailers
  /// to a client that takes them; else the connection is closed before the body is complete. Nothing is written after.
  virtual void fail(std::uint32_t cimStatus, std::string_view description) = 0;

  /// Before begin: what answers should the work be given up. It runs on the thread that gives up, so it must be quick:
  /// in no case does it read the body again. Without one the answer is an HTTP status.
  virtual void setLateAnswer(LateAnswer) {}

  /// False: nobody waits for the response any more, and the work may end. For work that would not notice otherwise.
  virtual bool isWanted() const { return true; }

  /// True once begin was called.
  virtual bool begun() const = 0;
};

}  // namespace zorva::http
