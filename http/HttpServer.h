#pragma once

// HTTP/1.1 (RFC 9112) for a handler that answers requests: it accepts connections, reads whole requests, gives them to
// worker threads and sends their responses, with back-pressure, limits, and a time limit for every wait.
//
// libmicrohttpd does the input and output in its own threads, which never wait for a provider.

#include <sys/socket.h>

#include <chrono>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "access/Audit.h"
#include "access/Gate.h"
#include "http/Door.h"
#include "http/Exchange.h"
#include "http/HttpLimits.h"
#include "http/Pages.h"
#include "http/TlsIdentity.h"
#include "util/NotCopied.h"

namespace zorva::http {

/// A request whose response was sent, or that was a stream.
struct RequestEnd {
  int status = 0;
  bool isForPage = false;
  bool isStream = false;
  bool isLate = false;  ///< its handler did not return in time
  std::chrono::microseconds time{};
};

/// Called on event threads, so it must not wait.
using RequestHook = std::function<void(const RequestEnd&)>;

class HttpServer : util::NotCopied {
 public:
  /// Answers a request; called on worker threads, on several at once.
  using Handler = std::function<void(const HttpRequest&, ResponseSink&)>;

  /// A request whose handler does not return in time gets the late answer that the handler has set, on the thread that
  /// sweeps; without one, status 500 with a sentence. `pages` answer GET and HEAD. `gate` says who a client is. Throws
  /// std::runtime_error if the threads cannot be started.
  HttpServer(const HttpLimits& limits, int threads, Handler handler, Pages pages = {},
             std::shared_ptr<access::Gate> gate = std::make_shared<access::OpenGate>(access::Role::Operate));

  /// Ends all connections, and waits for handlers that have not returned.
  ~HttpServer();

  /// Takes over a connected stream socket, non-blocking and close-on-exec, and closes it in the end. If the limit on
  /// connections is reached, the connection that is idle for longest is cut off; if none is idle, the new one is
  /// closed. Door::Https needs setTls(). Call take(), look() and setTls() on one thread.
  void take(int socket, const sockaddr_storage& peer, socklen_t peerSize, Door door = Door::Http);

  /// A descriptor that is readable when look() has something to do: a new connection has sent its first byte.
  int newcomers() const;
  void look();

  /// The certificate, key and authorities of new connections. Open connections keep theirs. Throws std::runtime_error
  /// if the threads cannot be started.
  void setTls(std::shared_ptr<const TlsIdentity> identity);

  /// Further names of this host that the header Host may have.
  void setHostNames(const std::vector<std::string>& names);

  /// Takes a record of each request that is refused because of who its client is, which then has no line in the log.
  /// Call it before take().
  void setAudit(access::AuditHook audit);

  /// Takes the end of each request. Call it before take().
  void setRequestHook(RequestHook hook);

  /// The limits for requests from now on; the size of headers does not change.
  void setLimits(const HttpLimits& limits);

  /// Cuts off overdue connections and requests. Call it several times a second while isBusy().
  void sweep();

  /// Whether there is any connection or request. Streams do not count.
  bool isBusy() const;

  /// How many streams there are. While there is any, call sweep() every few seconds.
  std::size_t streams() const;

  std::size_t connections() const;
  std::size_t requestsInWork() const;

  /// How many requests have been taken so far.
  std::size_t requestsTaken() const;

  /// Whether a request is in work or its response on the way.
  bool hasWork() const;

  /// Ends the server. Requests in work get HttpLimits::drain to finish, then they are abandoned. Returns false if
  /// handlers have not returned even then; in that case neither this object nor what they use may be destroyed.
  bool stop();

 private:
  class Core;
  std::unique_ptr<Core> core_;
};

}  // namespace zorva::http
