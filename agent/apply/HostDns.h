#pragma once

// The DNS settings of the host as the tree shows them, and the writers that change them.

#include <chrono>
#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <unordered_map>
#include <vector>

#include "agent/apply/AppliedState.h"
#include "agent/apply/BusCalls.h"
#include "agent/apply/DnsWriter.h"
#include "agent/apply/OwnerChoice.h"
#include "agent/sources/Netlink.h"
#include "agent/tree/TreeSnapshot.h"

namespace zorva::agent {

inline constexpr const char* kResolvConfOwner = "/etc/resolv.conf";

/// An interface of the host or of its service processor, or a name that is none.
struct HostInterface {
  std::string name;  ///< of a service processor's the path, since its name need not be the only one
  std::string path;  ///< of its node in the tree; empty where it has none
  Link link;         ///< index 0 where the kernel has none
  bool isOfBmc = false;
  std::string settingsName;  ///< names its file of settings; empty: a file of that name is of the host's interface

  bool exists() const { return isOfBmc || link.index != 0; }
};

/// Belongs to one thread.
class HostDns {
 public:
  /// The tree of the host, without the values of the overlay, as it is now.
  using Look = std::function<std::shared_ptr<const TreeSnapshot>()>;

  /// bmcFile is what zorva-bmc keeps; its socket is beside it.
  HostDns(Look look, std::string bmcFile);

  /// Reads the tree and asks the owners. To be called before all else; what the owners say is as of this call.
  void look();

  /// Those of the tree, in its order.
  std::vector<HostInterface> interfaces() const;
  /// Those of that name. A service processor's also have their path and "BMC%NAME" for names, and their own name unless
  /// the host has an interface of that name.
  std::vector<HostInterface> named(const std::string& name) const;
  /// The first of them.
  HostInterface interface(const std::string& name) const;

  /// Looks again while an owner starts or stops that may have the interface, for 10 s at most in the life of this.
  Expected<ChosenOwner, Refusal> ownerOf(const HostInterface& interface);

  /// The other interfaces that would be changed as well.
  std::vector<std::string> othersWith(const ChosenOwner& owner, const HostInterface& interface) const;

  /// Null where this owner cannot be changed.
  DnsWriter* writerOf(const std::string& owner);

  DnsTarget targetFor(const HostInterface& interface, const std::string& profile) const;

  /// What the tree shows of the interface as this owner's; nothing where the tree has its lists from another one.
  ShownDns shown(const HostInterface& interface, const std::string& owner) const;

  /// The domain of an interface whose owner names none.
  std::string ownDomain() const;

  /// Reads the tree until it shows these lists as the owner's. False where it does not for five seconds. The owner is
  /// asked to insist once meanwhile.
  bool waitUntilShown(const DnsTarget& target, const std::string& owner, const DnsSettings& lists);

 private:
  bool mayLookAgain();
  bool isInTree(const ChosenOwner& owner, const HostInterface& interface) const;
  HostInterface interfaceOf(const std::string& name, const std::string& path) const;
  HostInterface interfaceOfBmc(const Node& node, const std::string& name) const;
  Expected<ChosenOwner, Refusal> ownerOfBmc(const HostInterface& interface) const;
  const Node* nodeOf(const HostInterface& interface) const;

  Look look_;
  std::string bmcFile_;
  BusCalls bus_;
  OwnerChoice choice_;
  LinkReader reader_;
  std::shared_ptr<const TreeSnapshot> tree_;
  std::unordered_map<std::string, Link> links_;  ///< by name
  std::map<std::string, std::unique_ptr<DnsWriter>> writers_;
  std::optional<std::chrono::steady_clock::time_point> looksUntil_;  ///< for an owner that starts or stops
};

/// Whether two lists are the same, names in any case.
bool sameLists(const DnsSettings& left, const DnsSettings& right);

}  // namespace zorva::agent
