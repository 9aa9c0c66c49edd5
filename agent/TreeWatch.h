#pragma once

// Sleeps until the host changes.

#include <poll.h>

#include <chrono>
#include <memory>
#include <optional>
#include <vector>

#include "agent/interface/AgentApi.h"
#include "agent/tree/TreeSnapshot.h"

namespace zorva::agent {

/// Reads the tree by itself: it has its own sockets and watches and never waits for others in this process that read
/// it. Belongs to one thread at a time, and to one process.
class ZORVA_AGENT_API TreeWatch {
 public:
  /// With the current configuration, which does not change later. Throws ConfigError if that is wrong.
  TreeWatch();
  ~TreeWatch();
  TreeWatch(const TreeWatch&) = delete;
  TreeWatch& operator=(const TreeWatch&) = delete;

  /// The tree as it is now, with the values of the overlay. The same object as before if nothing has changed. Throws as
  /// currentTree() does.
  std::shared_ptr<const TreeSnapshot> tree();

  /// Sleeps in the kernel until tree() may be another one, one of `others` is ready, whose revents are then set, or
  /// that time is over. A burst of reports wakes it a few times only.
  void wait(std::vector<pollfd>& others, std::optional<std::chrono::milliseconds> longest = std::nullopt);

 private:
  struct State;
  std::unique_ptr<State> state_;
};

}  // namespace zorva::agent
