#pragma once

// The changes of the host's settings, one by one, as they happen.

#include <poll.h>

#include <chrono>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "agent/interface/AgentApi.h"
#include "agent/tree/Node.h"

namespace zorva::agent {

struct HostChange {
  std::chrono::system_clock::time_point time;  ///< when it was seen
  std::string system;                          ///< the name of the host, or of the node of a service processor
  std::string interface;                       ///< empty for what belongs to no interface
  /// As in the JSON tree; "ifcfg.DNSSERVERS" of a file of settings; "interface" if it came or went.
  std::string property;
  std::optional<PropertyValue> before;  ///< nothing: there was none
  std::optional<PropertyValue> after;   ///< nothing: there is none any more
  std::string by;                       ///< the owner of the value, "overlay.json", a file, "kernel"; empty: not known
};

/// A JSON object on one line, with a line feed: "version", "time", "system", "interface", "property", "old", "new",
/// "by". docs/json.md describes it.
ZORVA_AGENT_API std::string jsonLine(const HostChange& change);

/// Belongs to one thread at a time, and to one process.
class ZORVA_AGENT_API HostWatch {
 public:
  /// Changes count from now on. Throws as TreeWatch does.
  HostWatch();
  ~HostWatch();
  HostWatch(const HostWatch&) = delete;
  HostWatch& operator=(const HostWatch&) = delete;

  /// What has changed since the last call, in the order of the tree, and then in files of settings. Throws as
  /// currentTree() does; then a later call has what changed in between.
  std::vector<HostChange> changes();

  /// As TreeWatch::wait().
  void wait(std::vector<pollfd>& others, std::optional<std::chrono::milliseconds> longest = std::nullopt);

 private:
  struct State;
  std::unique_ptr<State> state_;
};

}  // namespace zorva::agent
