#pragma once

// What the owners of DNS settings on a private host say.

#include <chrono>
#include <string>
#include <thread>
#include <vector>

#include "agent/sources/DnsOwners.h"
#include "agent/sources/Netlink.h"
#include "agent/testing/NetworkNamespace.h"
#include "agent/testing/PrivateHost.h"

namespace zorva::agent::testing {

/// Two cables, eth0 to far0 and tun1 to far1, all of them up.
inline void makeCables() {
  Interfaces interfaces;
  interfaces.addPair("eth0", "far0");
  interfaces.addPair("tun1", "far1");
  for (const char* name : {"eth0", "far0", "tun1", "far1"}) interfaces.setUp(name, true);
}

/// Asks the owners again at each look, as a cursor does.
class Observer {
 public:
  const DnsFacts& operator[](const std::string& name) {
    links_ = reader_.read().links;
    if (owners_.changed() || !looked_) owners_.look(links_);
    looked_ = true;
    for (const Link& link : links_) {
      if (link.name == name) facts_ = owners_.factsOf(link);
    }
    return facts_;
  }

  /// As when the kernel or a file has reported a change.
  void lookAgain() { looked_ = false; }

  DnsOwners& owners() { return owners_; }

 private:
  DnsOwners owners_{""};
  LinkReader reader_;
  std::vector<Link> links_;
  DnsFacts facts_;
  bool looked_ = false;
};

/// far0 gives leases to eth0, with a server and a domain.
inline void makeLeases(Daemons& daemons) {
  writeFile("/etc/systemd/network/10-far.network",
            "[Match]\nName=far0\n[Network]\nAddress=192.0.2.1/24\nDHCPServer=yes\n"
            "[DHCPServer]\nDNS=192.0.2.53\nSendOption=15:string:lease.example\n");
  daemons.start("systemd-networkd");
}

/// Looks until that holds, for at most thirty seconds.
template <typename Condition>
bool soon(Condition holds) {
  for (int turn = 0; turn < 1500; ++turn) {
    if (holds()) return true;
    std::this_thread::sleep_for(std::chrono::milliseconds(20));
  }
  return false;
}

}  // namespace zorva::agent::testing
