#include "agent/apply/Writers.h"

namespace zorva::agent {

std::unique_ptr<DnsWriter> makeWriter(const std::string& owner, BusCalls& bus, const std::string& root) {
  if (owner == "NetworkManager") return makeNetworkManagerWriter(bus);
  if (owner == "systemd-resolved") return makeResolvedWriter(bus);
  if (owner == "systemd-networkd") return makeNetworkdWriter(bus, root);
  if (owner == "/etc/resolv.conf") return makeResolvConfWriter(root);
  return nullptr;
}

}  // namespace zorva::agent
