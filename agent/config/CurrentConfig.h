#pragma once

// The configuration of this process.

#include <atomic>
#include <deque>
#include <mutex>
#include <optional>

#include "agent/config/Config.h"

namespace zorva::agent {

/// One for the process, made at its first use, destroyed when the library is unloaded. Thread-safe. A fork waits until
/// no thread is inside, so that the child gets a consistent state.
class CurrentConfig {
 public:
  static CurrentConfig& instance();

  /// The configuration, read at its first use; the built-in defaults if it is wrong. The result is valid until the
  /// library is unloaded.
  const Config& get() { return loaded().config; }

  /// Whether the configuration is wrong, and the defaults are used.
  bool isWrong() { return loaded().error.has_value(); }

  /// Throws the ConfigError of a wrong configuration.
  void check();

  /// Uses this configuration from now on.
  void use(const Config& config);

  /// The next question reads it again.
  void forget() { loaded_.store(nullptr, std::memory_order_release); }

 private:
  struct Loaded {
    Config config;
    std::optional<ConfigError> error;
  };

  CurrentConfig();

  const Loaded& loaded();

  std::mutex mutex_;
  std::deque<Loaded> configs_;  ///< the last one is current; earlier ones stay because callers point at them
  std::atomic<const Loaded*> loaded_ = nullptr;
};

}  // namespace zorva::agent
