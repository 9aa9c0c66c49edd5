#pragma once

// Asks the DNS servers of the host at an interval, so that a scrape never has to wait for one.

#include <chrono>
#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include "agent/tree/TreeSnapshot.h"
#include "metrics/Exposition.h"
#include "util/NotCopied.h"

namespace zorva::metrics {

/// Of one look at each server more are left out.
inline constexpr std::size_t kMostChecked = 64;

/// The servers of the host's interfaces and of its resolver, with their ports where they have other than the usual one,
/// each once. Those of service processors are left out: this host need not reach them.
std::vector<std::string> serversToAsk(const agent::TreeSnapshot& tree);

class DnsChecks : util::NotCopied {
 public:
  using Look = std::function<std::shared_ptr<const agent::TreeSnapshot>()>;

  /// How long a server may take to answer.
  static constexpr std::chrono::milliseconds kPatience{2000};

  /// Asks nobody until it has an interval. `look` is called on a thread of this object; what it throws ends one round.
  explicit DnsChecks(Look look);
  ~DnsChecks();

  /// From now on it asks at once and then at this interval; 0: no more, and the answers are forgotten.
  void setInterval(std::chrono::seconds interval);

  /// The answers of the latest round, and when that was. Never waits for a server.
  void write(Exposition& out) const;

 private:
  struct State;
  static void run(State& state);

  std::unique_ptr<State> state_;
};

}  // namespace zorva::metrics
