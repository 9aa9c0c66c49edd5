#pragma once

// Logins that were verified a short while ago, so that a hash is computed once and not for each request. Passwords are
// not kept: an entry is found by the HMAC of name and password, with a key that only this process has. Thread-safe.

#include <array>
#include <chrono>
#include <cstddef>
#include <functional>
#include <mutex>
#include <string>

#include "access/BasicLogin.h"
#include "access/FailedLogins.h"
#include "access/RecentTable.h"
#include "access/Role.h"

namespace zorva::access {

class RememberedLogins {
 public:
  static constexpr std::chrono::minutes kFresh{5};
  /// For so long an entry says that the login was right once. It must be verified again, but even while others guess
  /// passwords from the same address.
  static constexpr std::chrono::minutes kKnown{60};
  static constexpr std::size_t kMost = 4096;

  /// Throws std::runtime_error if the system gives no random bytes.
  RememberedLogins();

  using Key = std::string;
  Key keyOf(const BasicLogin& login) const;

  struct Found {
    ClientPtr client = nullptr;  ///< null: verify the login
    bool isKnown = false;        ///< it was right once
  };
  Found find(const Key& key, Clock::time_point now);

  void put(const Key& key, ClientPtr client, Clock::time_point now);

  /// Forgets logins by the names of their users.
  void forgetIf(const std::function<bool(const std::string& user)>& isMeant);

 private:
  struct Entry {
    ClientPtr client;
    Clock::time_point verified;
  };

  std::array<unsigned char, 32> secret_{};
  std::mutex mutex_;
  RecentTable<Key, Entry> entries_{kMost};
};

}  // namespace zorva::access
