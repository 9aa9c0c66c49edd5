#pragma once

// Brings a change to the host after it was stored, where the agent's configuration says so ([tree] apply = "host").
// Safe on any thread.

#include <string>

#include "agent/apply/Apply.h"
#include "broker/objects/Value.h"

namespace zorva::frontend {

/// Whether the caller holds the lock of the data directory already.
enum class SettingsLockIs { Free, Held };

/// What became of a stored change on the host.
struct HostEffect {
  broker::Status status;  ///< CIM_ERR_FAILED: the host does not have it; with the reason
  std::string done;       ///< "eth0: applied by NetworkManager, profile lan"; empty where nothing had to be done
};

/// Brings the settings of the changed instance's interface to the host. As root this process does it. Any other user
/// waits, 15 s at most, for the service that runs 'zorvactl apply' after each change of the data directory; with the
/// lock held it does not wait, since that service needs the lock. Nothing has to be done where the configuration leaves
/// the host alone, for a class whose instances are not applied, and where the host has the settings already.
HostEffect applyToHost(const broker::ObjectPath& changed, SettingsLockIs lock);

/// "NetworkManager, profile lan", "systemd-networkd, /etc/systemd/network/lan.network", "/etc/resolv.conf".
std::string ownerText(const zorva::agent::ApplyResult& result);

}  // namespace zorva::frontend
