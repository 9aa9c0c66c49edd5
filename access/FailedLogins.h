#pragma once

// Slows down whoever guesses passwords. Each failed login of an address doubles the time for which further logins of
// that address are refused: from 250 ms to 8 s. An address is forgotten after ten minutes without a failure. A login
// that succeeds does not help: the owner of one login could else guess the passwords of others. Thread-safe.

#include <chrono>
#include <cstddef>
#include <mutex>
#include <string>

#include "access/Origin.h"
#include "access/RecentTable.h"

namespace zorva::access {

using Clock = std::chrono::steady_clock;

/// What counts as one client: an IPv4 address, the /64 of an IPv6 address, all loopback addresses together (a process
/// can choose among them), or a local user.
std::string clientGroup(const Origin& origin);

class FailedLogins {
 public:
  static constexpr std::size_t kMostClients = 4096;

  /// For how long logins of that client are refused from now on; 0: they are not.
  std::chrono::milliseconds remaining(const std::string& client, Clock::time_point now);

  struct Failure {
    std::size_t count;  ///< of this client, with this one
    std::chrono::milliseconds delay;
  };
  Failure add(const std::string& client, Clock::time_point now);

 private:
  struct Entry {
    std::size_t count = 0;
    Clock::time_point last;
    Clock::time_point until;
  };

  std::mutex mutex_;
  RecentTable<std::string, Entry> entries_{kMostClients};
};

}  // namespace zorva::access
