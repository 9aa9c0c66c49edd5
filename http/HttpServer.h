#pragma once

#include <sys/socket.h>

#include <chrono>
#include <functional>
#include <memory>
#include <string>

#include "http/Exchange.h"
#include "http/HttpLimits.h"

// HTTP/1.1 (RFC 9112) in front of whatever answers requests: it takes connections over, reads requests whole, hands
// them to worker threads and sends what these write, with back-pressure, limits and an end to every wait.
//
// Input and output are libmicrohttpd's, in threads of its own that never wait for a provider.

namespace zorva::http {

class HttpServer {
 public:
  /// Answers a request; called on worker threads, on many at once.
  using Handler = std::function<void(const HttpRequest&, ResponseSink&)>;

  /// A request whose handler does not return in time gets the late answer that the handler has set, on the thread that
  /// sweeps; without one, a status of 500 with a sentence. `page` is the text that GET of "/" gives. Throws
  /// std::runtime_error where the threads cannot be started.
  HttpServer(const HttpLimits& limits, int threads, Handler handler, std::string page = {});

  /// Ends all connections, and waits for handlers that have not returned.
  ~HttpServer();
  HttpServer(const HttpServer&) = delete;
  HttpServer& operator=(const HttpServer&) = delete;

  /// Takes a connected stream socket over, non-blocking and close-on-exec, and closes it in the end. Where there are as
  /// many connections as may be, the idlest gives way; where none is idle, this one is closed.
  void take(int socket, const sockaddr_storage& peer, socklen_t peerSize);

  /// What holds for requests from now on; the size of headers stays what it was.
  void setLimits(const HttpLimits& limits);

  /// Cuts off what is overdue. To be called some times in a second while isBusy().
  void sweep();

  /// Whether there is any connection or request.
  bool isBusy() const;

  /// How many requests have been taken so far.
  std::size_t requestsTaken() const;

  /// Whether a request is in work or its response on the way.
  bool hasWork() const;

  /// Ends: what is in work gets HttpLimits::drain to be done, then it is given up. Returns false where handlers have
  /// not returned even so; then neither this object nor what they use may be destroyed.
  bool stop();

 private:
  class Core;
  std::unique_ptr<Core> core_;
};

}  // namespace zorva::http
