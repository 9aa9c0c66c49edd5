#pragma once

// For tests: an HTTP server on free ports of 127.0.0.1, with a thread that accepts and sweeps.

#include <poll.h>
#include <sys/socket.h>

#include <atomic>
#include <cstddef>
#include <iterator>
#include <memory>
#include <string>
#include <thread>
#include <utility>
#include <vector>

#include "http/HttpServer.h"
#include "http/Listener.h"
#include "util/NotCopied.h"

namespace zorva::http::testing {

class Server : util::NotCopied {
 public:
  /// With an identity it speaks HTTPS as well.
  explicit Server(HttpServer::Handler handler, const HttpLimits& limits = {}, Pages pages = {},
                  std::shared_ptr<access::Gate> gate = std::make_shared<access::OpenGate>(access::Role::Operate),
                  const std::shared_ptr<const TlsIdentity>& tls = nullptr)
      : listeners_(listenOn(Addresses{"127.0.0.1"}, 0)),
        server_(limits, 2, std::move(handler), std::move(pages), std::move(gate)) {
    if (tls != nullptr) {
      listeners_.push_back(std::move(listenOn(Addresses{"127.0.0.1"}, 0, Door::Https).front()));
      server_.setTls(tls);
    }
    thread_ = std::thread([this] { run(); });
  }
  ~Server() {
    ending_ = true;
    thread_.join();
  }

  int port() const { return portOf(listeners_.front()); }
  int tlsPort() const { return portOf(listeners_.back()); }
  HttpServer& http() { return server_; }

 private:
  static int portOf(const Listener& listener) { return std::stoi(listener.url.substr(listener.url.rfind(':') + 1)); }

  void run() {
    std::vector<pollfd> waits{{server_.newcomers(), POLLIN, 0}};
    for (const Listener& each : listeners_) waits.push_back({each.socket.get(), POLLIN, 0});
    while (!ending_) {
      ::poll(waits.data(), waits.size(), 20);
      server_.look();
      for (const Listener& each : listeners_) acceptFrom(each);
      server_.sweep();
    }
  }

  void acceptFrom(const Listener& listener) {
    for (;;) {
      sockaddr_storage peer{};
      socklen_t size = sizeof peer;
      const int socket =
          ::accept4(listener.socket.get(), reinterpret_cast<sockaddr*>(&peer), &size, SOCK_NONBLOCK | SOCK_CLOEXEC);
      if (socket < 0) return;
      server_.take(socket, peer, size, listener.door);
    }
  }

  std::vector<Listener> listeners_;
  HttpServer server_;
  std::atomic<bool> ending_ = false;
  std::thread thread_;
};

}  // namespace zorva::http::testing
