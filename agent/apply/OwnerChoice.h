#pragma once

// Through whom the DNS settings of an interface are changed.

#include <optional>
#include <string>
#include <vector>

#include "agent/apply/BusCalls.h"
#include "agent/apply/DnsWriter.h"
#include "agent/apply/OwnerDoubts.h"
#include "agent/sources/DnsOwners.h"

namespace zorva::agent {

struct ChosenOwner {
  std::string name;     ///< as the tree names it
  std::string profile;  ///< the owner's profile or file
  bool speaks = false;  ///< it names a server or a domain
};

/// Asks the owners themselves, so that one that is busy is not passed over: a change would go to another one, and be
/// lost when the busy one speaks again. Belongs to one thread.
class OwnerChoice {
 public:
  /// Keeps the bus by reference. root is put before the path of each file; for tests.
  OwnerChoice(BusCalls& bus, const std::string& root);

  /// Asks the owners anew, and waits for them, 10 s at most. links are those that the kernel has.
  void look(const std::vector<Link>& links);

  /// Who names the link's servers or manages it. Otherwise systemd-resolved, where it runs; otherwise /etc/resolv.conf,
  /// where no owner speaks for any link.
  Expected<ChosenOwner, Refusal> choose(const Link& link);

  /// Why choose() may be wrong at present: an owner that comes before the one that it names may have the link.
  std::optional<OwnerDoubt> doubtAbout(const Link& link);

  /// The other links that have this file or profile of an owner's too.
  std::vector<std::string> othersWith(const ChosenOwner& owner, const Link& link) const;

 private:
  Expected<void, Refusal> refuseUnmanaged(const Link& link);

  BusCalls& bus_;
  DnsOwners owners_;
  OwnerDoubts doubts_;
  std::vector<Link> links_;
};

}  // namespace zorva::agent
