#pragma once

// For tests: zorva-bmc as a process.

#include <sys/types.h>

#include <string>

#include "bmc/testing/TestRedfish.h"
#include "util/NotCopied.h"

namespace zorva::bmc::testing {

/// Its standard error is in a file. It has read once, or tried for 30 s, when the constructor returns.
class RunningBmc : util::NotCopied {
 public:
  RunningBmc(const TestRedfish& redfish, const std::string& config);
  ~RunningBmc() { stop(); }

  /// Ends it and returns its status, as of waitpid().
  int stop();

  std::string inProc(const std::string& name) const;
  std::string log() const;
  const std::string& socket() const { return socket_; }

 private:
  std::string log_;
  std::string socket_;
  pid_t process_ = -1;
};

}  // namespace zorva::bmc::testing
