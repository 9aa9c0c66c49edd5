#pragma once

// A program on the bus of a private host that takes a daemon's name and answers what it is told to.

#include <sys/types.h>
#include <systemd/sd-bus.h>

#include <functional>
#include <string>

#include "util/NotCopied.h"

namespace zorva::agent::testing {

class FakeDaemon : util::NotCopied {
 public:
  /// Fills the answer to a call of that method; whatever it returns below 0 makes the answer an error.
  using Answer = std::function<int(sd_bus_message* answer, const std::string& method)>;

  /// Runs in a process of its own. Returns when it has the name; throws std::runtime_error where it cannot.
  FakeDaemon(const std::string& busName, const Answer& answer);
  ~FakeDaemon();

 private:
  pid_t process_;
};

}  // namespace zorva::agent::testing
