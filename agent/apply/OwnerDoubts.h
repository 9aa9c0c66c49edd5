#pragma once

// Owners of DNS settings that may have an interface and do not say so at present, as while they are restarted.

#include <optional>
#include <string>
#include <utility>

#include "agent/apply/BusCalls.h"
#include "agent/apply/DnsWriter.h"
#include "agent/sources/Netlink.h"

namespace zorva::agent {

/// Why it is not certain that an owner does not have a link.
struct OwnerDoubt {
  enum class Kind {
    Starting,  ///< or stopping: it is worth waiting for
    Unclear,   ///< the same, but if that stays for a while, the link is not its own
    Stopped,   ///< and it comes back when the host restarts
  };
  Kind kind;
  Refusal refusal;  ///< for the case that this stays
};

/// Belongs to one thread.
class OwnerDoubts {
 public:
  /// Keeps the bus by reference. root is put before the path of each file; for tests.
  OwnerDoubts(BusCalls& bus, std::string root) : bus_(bus), root_(std::move(root)) {}

  /// About an owner who named no server or domain of a link and no profile or file for it when it was asked last. runs
  /// is whether it was on the bus then. Nothing where the link is not its own.
  std::optional<OwnerDoubt> about(const std::string& owner, const Link& link, bool runs);

 private:
  using Kind = OwnerDoubt::Kind;

  std::optional<OwnerDoubt> aboutAbsent(const std::string& owner, const Link& link);
  std::optional<Kind> aboutNetworkManager(const Link& link);
  std::optional<Kind> aboutNetworkd(const Link& link);
  bool hasRun(const std::string& owner, const Link& link) const;

  BusCalls& bus_;
  std::string root_;
};

}  // namespace zorva::agent
