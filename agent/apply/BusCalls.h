#pragma once

// Calls that change something at a daemon on the system's bus, and wait for its answer.

#include <systemd/sd-bus.h>

#include <chrono>
#include <functional>
#include <string>

#include "agent/sources/SystemBus.h"
#include "util/Expected.h"

namespace zorva::agent {

/// A connection for calls that wait, 10 s at most each. It is made at the first call, and again after it was lost.
/// Belongs to one thread.
class BusCalls {
 public:
  explicit BusCalls(std::string socketPath, std::chrono::milliseconds longestCall = std::chrono::seconds(10));
  ~BusCalls();
  BusCalls(const BusCalls&) = delete;
  BusCalls& operator=(const BusCalls&) = delete;

  /// Fills the arguments of a call; a negative return value (of sd_bus_message_append…) is an error.
  using Fill = std::function<int(sd_bus_message* message)>;

  /// Calls a method and hands the answer to read. Never starts a daemon for it. The error is one line: the daemon's
  /// text, or why it could not be asked; "…; run this as root" where the daemon refuses for lack of rights.
  Expected<void, std::string> call(const SystemBus::Method& method, const Fill& fill = {},
                                   const std::function<void(BusReader&)>& read = {});

 private:
  using Deadline = std::chrono::steady_clock::time_point;

  Expected<void, std::string> open(Deadline deadline);
  BusMessage answerOf(sd_bus_message* question, const SystemBus::Method& method, Deadline deadline);
  void close();

  std::string socketPath_;
  std::chrono::milliseconds longestCall_;
  sd_bus* bus_ = nullptr;
};

}  // namespace zorva::agent
