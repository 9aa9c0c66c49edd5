#pragma once

#include <atomic>
#include <chrono>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

#include "http/HttpLimits.h"

// Who is connected, what each connection is busy with and since when: the table by which slow and silent clients are
// found and cut off. Thread-safe.

namespace zorva::http {

enum class Phase : std::uint8_t {
  Idle,      ///< between requests
  Arriving,  ///< a request is coming in
  Working,   ///< it is with a provider
  Sending,   ///< its response goes out; the time is that of the last piece
};

/// One connection. `socket` belongs to the HTTP library, which closes it; here it is only shut down.
class Connection {
 public:
  Connection(int socket, std::string peer, std::string client);

  const std::string& peer() const noexcept { return peer_; }

  /// Whose connection it is: see clientOf().
  const std::string& client() const noexcept { return client_; }

  /// Enters a phase, or tells that something happened in it. A phase and its time are always read together.
  void enter(Phase phase) noexcept;

  Phase phase() const noexcept { return static_cast<Phase>(state_.load(std::memory_order_relaxed) & 3); }
  std::chrono::milliseconds inPhase() const noexcept;

  /// It has had a request answered: such a client gives way last.
  void prove() noexcept { proven_.store(true, std::memory_order_relaxed); }
  bool isProven() const noexcept { return proven_.load(std::memory_order_relaxed); }

  /// How much of an arriving body is held.
  void hold(std::size_t bytes) noexcept { held_.store(bytes, std::memory_order_relaxed); }
  std::size_t held() const noexcept { return held_.load(std::memory_order_relaxed); }

 private:
  friend class Connections;
  const std::string peer_;
  const std::string client_;
  std::atomic<std::uint64_t> state_;  ///< milliseconds of the steady clock, times four, and the phase
  std::atomic<bool> proven_ = false;
  std::atomic<std::size_t> held_ = 0;
  // Under the table's lock.
  int socket_;          ///< -1: closed
  bool isCut_ = false;  ///< shut down; the HTTP library is about to close it
  std::size_t place_ = 0;
};

class Connections {
 public:
  /// Before the socket is handed to the HTTP library.
  void add(int socket, std::string peer, std::string client);

  /// The one that was added for a socket, which is open.
  std::shared_ptr<Connection> find(int socket) const;

  /// Before the socket is closed: it is not touched afterwards.
  void remove(Connection& connection);

  /// Those that are not cut.
  std::size_t count() const;

  /// Those in a phase.
  std::size_t countIn(Phase phase) const;

  /// Cuts off who has taken longer than the limits allow, and who has gone unnoticed.
  void sweep(const HttpLimits& limits);

  /// Cuts off one that waits or sends its request, to make room: first one that has never had an answer, of those the
  /// one that has been at it for longest. False where every connection has a request in work.
  bool cutIdlest();

  /// Cuts off the one that holds part of a body for longest.
  void cutSlowestBody();

  /// Shuts a connection down, so that the HTTP library ends it as if the client had gone.
  void cut(Connection& connection, const std::string& why);

 private:
  /// Without a reason, nothing is logged.
  void cutLocked(Connection& connection, const std::string& why);

  mutable std::mutex mutex_;
  std::vector<std::shared_ptr<Connection>> connections_;
  std::size_t cut_ = 0;
};

}  // namespace zorva::http
