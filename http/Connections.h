#pragma once

// The table of connections, with the phase of each one and its start. It serves to find and cut off slow and silent
// clients. Thread-safe.

#include <atomic>
#include <chrono>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <mutex>
#include <string>
#include <utility>
#include <vector>

#include "access/Origin.h"
#include "http/HttpLimits.h"

namespace zorva::http {

enum class Phase : std::uint8_t {
  Idle,      ///< between requests
  Arriving,  ///< a request is coming in
  Working,   ///< a provider works on it
  Sending,   ///< its response is being sent; the time is that of the last piece
};

/// One connection. `socket` belongs to the HTTP library, which closes it; here it is only shut down.
class Connection {
 public:
  Connection(int socket, std::string peer, std::string client, access::Origin origin = {});

  const std::string& peer() const noexcept { return peer_; }

  /// The client of the connection: see clientOf().
  const std::string& client() const noexcept { return client_; }

  const access::Origin& origin() const noexcept { return origin_; }

  /// What the first request finds out of the client's certificate. Used by the connection's event thread before any
  /// other thread sees the origin.
  void setCertificate(access::Certificate certificate) { origin_.certificate = std::move(certificate); }

  /// The value of the header Host that was found to name this host. Used by the connection's event thread.
  std::string knownHost;

  /// Enters a phase, or notes that something happened in it. A phase and its time are always read together.
  void enter(Phase phase) noexcept;

  Phase phase() const noexcept { return static_cast<Phase>(state_.load(std::memory_order_relaxed) & 3); }
  std::chrono::milliseconds inPhase() const noexcept;

  /// The client got a response: such a client is cut off last to make room.
  void prove() noexcept { proven_.store(true, std::memory_order_relaxed); }
  bool isProven() const noexcept { return proven_.load(std::memory_order_relaxed); }

  /// How much of an arriving body is held.
  void hold(std::size_t bytes) noexcept { held_.store(bytes, std::memory_order_relaxed); }
  std::size_t held() const noexcept { return held_.load(std::memory_order_relaxed); }

 private:
  friend class Connections;
  const std::string peer_;
  const std::string client_;
  access::Origin origin_;
  std::atomic<std::uint64_t> state_;  ///< milliseconds of the steady clock, times four, and the phase
  std::atomic<bool> proven_ = false;
  std::atomic<std::size_t> held_ = 0;
  /// Under the table's lock.
  int socket_;          ///< -1: closed
  bool isCut_ = false;  ///< shut down; the HTTP library is about to close it
  std::size_t place_ = 0;
};

class Connections {
 public:
  /// Call it before the socket is passed to the HTTP library.
  std::shared_ptr<Connection> add(int socket, std::string peer, std::string client, access::Origin origin = {});

  /// The connection with that open socket.
  std::shared_ptr<Connection> find(int socket) const;

  /// Call it before the socket is closed: the socket is not used afterwards.
  void remove(Connection& connection);

  /// The connections that are not cut off.
  std::size_t count() const;

  /// The connections in a phase.
  std::size_t countIn(Phase phase) const;

  /// Cuts off connections that have exceeded the limits, or whose end was not noticed.
  void sweep(const HttpLimits& limits);

  /// Cuts off one connection that is idle or sends its request, to make room: first those that never got a response, of
  /// these the one that is in its phase for longest. False if every connection has a request in work.
  bool cutIdlest();

  /// Cuts off the connection that has held part of a body for longest.
  void cutSlowestBody();

  /// Shuts a connection down, so that the HTTP library ends it as if the client had closed it.
  void cut(Connection& connection, const std::string& why);

 private:
  /// Logs nothing if the reason is empty.
  void cutLocked(Connection& connection, const std::string& why);

  mutable std::mutex mutex_;
  std::vector<std::shared_ptr<Connection>> connections_;
  std::size_t cut_ = 0;
};

}  // namespace zorva::http
