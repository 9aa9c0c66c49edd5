#pragma once

// A host of its own for one test, with the real daemons that own DNS settings.

#include <sys/types.h>

#include <functional>
#include <map>
#include <string>
#include <vector>

#include "util/NotCopied.h"

namespace zorva::agent::testing {

/// Whether the kernel lets this process make private hosts. That needs root, namespaces and overlayfs.
bool canMakePrivateHosts();

/// Runs the work as process 1 of its own network, mount, process, host name and IPC namespaces, in a child process. The
/// root is a copy-on-write view of this machine's: whatever the work writes is gone at the end, and so is every process
/// that it started. /run is empty, the loopback interface is up. True where the work returned true.
bool runOnPrivateHost(const std::function<bool()>& work);

/// The same with the daemons' packages unpacked into the root. They are fetched once for a build folder; throws
/// std::runtime_error where that fails.
bool runOnHostWithDaemons(const std::function<bool()>& work);

/// The output of a shell command on a private host. Throws std::runtime_error, with the output, where the command
/// fails.
std::string outputOf(const std::string& command);

/// Writes a file on a private host, and the directories on the way to it. An old file or link is replaced.
void writeFile(const std::string& path, const std::string& text);

/// The daemons of a private host. Their output is in /run/log/<name>.
class Daemons : util::NotCopied {
 public:
  /// Starts the message bus.
  Daemons();
  ~Daemons();

  /// "dbus-daemon", "systemd-resolved", "systemd-networkd" or "NetworkManager". Returns when it can be asked; throws
  /// std::runtime_error, with its output, where that takes over ten seconds.
  void start(const std::string& name);
  /// Returns when its process is gone.
  void stop(const std::string& name);
  /// It stays there and does nothing until it is thawed.
  void freeze(const std::string& name);
  void thaw(const std::string& name);

 private:
  void send(const std::string& name, int signal);

  std::map<std::string, pid_t> processes_;
};

}  // namespace zorva::agent::testing
