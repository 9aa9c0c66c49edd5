#pragma once

// Changes the DNS settings of one interface through the program or file that owns them.

#include <string>

#include "agent/tree/Node.h"  // StringList
#include "util/Expected.h"

namespace zorva::agent {

/// The settings that are brought to an owner.
struct DnsSettings {
  StringList servers;   ///< unicast addresses, in search order; a link-local one has the interface as its zone
  StringList suffixes;  ///< the search list, of DNS names; the domain of the interface is its first
  bool operator==(const DnsSettings&) const = default;
};

/// Which interface, and what its owner is known to have for it.
struct DnsTarget {
  std::string interface;
  int index = 0;              ///< of the link in the kernel
  std::string profile;        ///< the owner's profile or file, as the tree shows it
  StringList serversInFull;   ///< as in DnsFacts: an address that stays keeps its port and name
  StringList routingDomains;  ///< stay as they are
  std::string zone = {};      ///< the name of the link, which link-local servers have
};

/// Why an owner was not changed: one line that names the owner and the next step of a person.
using Refusal = std::string;

/// One for each owner. Calls wait for the owner, 10 s at most each; for a service processor 75 s. Belongs to one
/// thread.
class DnsWriter {
 public:
  virtual ~DnsWriter() = default;

  /// The same settings in the order, and with the duplicates left out, in which this owner would show them after
  /// write().
  virtual DnsSettings asHeld(const DnsSettings& settings) const = 0;

  /// What a person should know before these settings are written; empty for nothing. Refused where it is known before
  /// that they cannot be written.
  virtual Expected<std::string, Refusal> warningBefore(const DnsTarget&, const DnsSettings&) { return std::string(); }

  /// All that restore() needs to bring back what the owner has now: a JSON text that only this class reads.
  virtual Expected<std::string, Refusal> save(const DnsTarget& target) = 0;

  /// Makes these the settings of the interface, in place of those set by hand and those learned; persistently if the
  /// owner can. On failure the owner has what it had before.
  virtual Expected<void, Refusal> write(const DnsTarget& target, const DnsSettings& settings) = 0;

  /// Called once where the owner does not show the settings a while after write() or restore(): does what else there
  /// is.
  virtual Expected<void, Refusal> insist(const DnsTarget&) { return {}; }

  /// Brings back what save() found, or what is learned (DHCP) where nothing was set by hand. Safe to repeat.
  virtual Expected<void, Refusal> restore(const DnsTarget& target, const std::string& saved) = 0;

  /// What a person should know after a change that worked ("it is gone when the host restarts"); empty for nothing.
  virtual std::string note() const { return {}; }
};

}  // namespace zorva::agent
