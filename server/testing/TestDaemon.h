#pragma once

// For tests: zorvacimd itself, on a host that is a tree in a file.

#include <sys/types.h>

#include <chrono>
#include <functional>
#include <string>
#include <utility>
#include <vector>

#include "agent/testing/TemporaryDirectory.h"
#include "http/Listener.h"
#include "util/FileDescriptor.h"
#include "util/NotCopied.h"

namespace zorva::server::testing {

/// The result of a run that ends by itself.
struct DaemonOutcome {
  int exitCode = -1;  ///< 128 and the number if a signal ended it
  std::string out;
  std::string err;
};

class TestDaemon : util::NotCopied {
 public:
  /// `config` is the text of zorvacimd.toml; the log is a file. Listens on port 0 of 127.0.0.1, unless `arguments` say
  /// otherwise. `prepare` runs in the child before the program. Waits until the server prints its address.
  explicit TestDaemon(const std::string& config = {}, std::vector<std::string> arguments = {},
                      const std::function<void()>& prepare = {});
  ~TestDaemon();

  int port() const { return port_; }
  /// The port of HTTPS; 0: none.
  int tlsPort() const { return tlsPort_; }
  pid_t process() const { return process_; }
  const zorva::agent::testing::TemporaryDirectory& directory() const { return directory_; }

  void signal(int number) const;

  /// Waits for it to end; -1 if it does not within that time.
  int exitCodeWithin(std::chrono::milliseconds most);

  std::string log() const;
  /// Waits until the log holds that text.
  bool logs(const std::string& text) const;

  void writeConfig(const std::string& config) const;

  /// Runs it with these arguments until it ends by itself.
  static DaemonOutcome run(const std::vector<std::string>& arguments);

 private:
  zorva::agent::testing::TemporaryDirectory directory_;
  pid_t process_ = -1;
  util::FileDescriptor out_;
  int port_ = 0;
  int tlsPort_ = 0;
};

/// A request that sets the domain of eth0.
std::string changeOfDomain();

}  // namespace zorva::server::testing
