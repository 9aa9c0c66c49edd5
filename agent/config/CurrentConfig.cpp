#include "agent/config/CurrentConfig.h"

#include <pthread.h>

#include <utility>

namespace zorva::agent {

CurrentConfig& CurrentConfig::instance() {
  static CurrentConfig config;
  return config;
}

// A thread that is inside while another one forks would leave its lock held in the child for ever. The C library
// forgets these functions when the library is unloaded. What is registered first is locked last: the configuration is
// the innermost of the agent's locks.
CurrentConfig::CurrentConfig() {
  const auto unlock = [] { instance().mutex_.unlock(); };
  ::pthread_atfork([] { instance().mutex_.lock(); }, unlock, unlock);
}

const CurrentConfig::Loaded& CurrentConfig::loaded() {
  const Loaded* loaded = loaded_.load(std::memory_order_acquire);
  if (loaded != nullptr) return *loaded;
  const std::lock_guard lock(mutex_);
  loaded = loaded_.load(std::memory_order_relaxed);
  if (loaded != nullptr) return *loaded;
  Loaded fresh;
  try {
    fresh.config = readDefaultConfig();
  } catch (const ConfigError& error) {
    fresh.error = error;
  }
  configs_.push_back(std::move(fresh));
  loaded_.store(&configs_.back(), std::memory_order_release);
  return configs_.back();
}

void CurrentConfig::check() {
  const Loaded& now = loaded();
  if (now.error.has_value()) throw ConfigError(*now.error);
}

void CurrentConfig::use(const Config& config) {
  const std::lock_guard lock(mutex_);
  configs_.push_back({config, std::nullopt});
  loaded_.store(&configs_.back(), std::memory_order_release);
}

}  // namespace zorva::agent
