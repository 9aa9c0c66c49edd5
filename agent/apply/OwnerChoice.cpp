#include "agent/apply/OwnerChoice.h"

#include <linux/if.h>

#include <chrono>
#include <thread>

#include "agent/sources/BusNames.h"

namespace zorva::agent {
OwnerChoice::OwnerChoice(BusCalls& bus, const std::string& root) : bus_(bus), owners_(root) {}

void OwnerChoice::look(const std::vector<Link>& links) {
  constexpr std::chrono::seconds kLongest{10};
  constexpr std::chrono::milliseconds kPause{20};
  const auto deadline = std::chrono::steady_clock::now() + kLongest;
  links_ = links;
  owners_.look(links_);
  while (!owners_.whoIsLate().empty() && std::chrono::steady_clock::now() < deadline) {
    std::this_thread::sleep_for(kPause);
    owners_.look(links_);
  }
}

Expected<ChosenOwner, Refusal> OwnerChoice::choose(const Link& link) {
  if ((link.flags & IFF_LOOPBACK) != 0) {
    return unexpected(link.name + " is the loopback interface, which has no DNS settings of its own");
  }
  if (const std::string late = owners_.whoIsLate(); !late.empty()) {
    return unexpected(late + " does not answer, so who owns the DNS settings of " + link.name +
                      " is not known; try again when it does, or stop it");
  }
  const DnsFacts facts = owners_.factsOf(link);
  if (!facts.owner.empty()) return ChosenOwner{facts.owner, facts.profile};
  if (const auto managed = refuseUnmanaged(link); !managed) return unexpected(managed.error());
  if (owners_.hostFacts() != nullptr) return ChosenOwner{"systemd-resolved", {}};
  if (!owners_.speakForAny(links_)) return ChosenOwner{"/etc/resolv.conf", {}};
  return unexpected(link.name +
                    " has no owner of DNS settings, while others do, and /etc/resolv.conf is that of the "
                    "whole host; let NetworkManager or systemd-networkd manage " +
                    link.name);
}

// NetworkManager has every link as a device. One that it does not manage is left to whoever set it up.
Expected<void, Refusal> OwnerChoice::refuseUnmanaged(const Link& link) {
  std::string device;
  const auto found = bus_.call(
      {kNetworkManagerService, kNetworkManagerPath, kNetworkManagerService, "GetDeviceByIpIface"},
      [&link](sd_bus_message* message) { return ::sd_bus_message_append(message, "s", link.name.c_str()); },
      [&device](BusReader& reader) { device = reader.text(); });
  if (!found) return {};
  bool managed = false;
  const auto asked = bus_.call(
      {kNetworkManagerService, device, kBusProperties, "Get"},
      [](sd_bus_message* message) { return ::sd_bus_message_append(message, "ss", kNetworkManagerDevice, "Managed"); },
      [&managed](BusReader& reader) { reader.ifVariant("b", [&] { managed = reader.flag(); }); });
  if (!asked) return unexpected("NetworkManager: " + asked.error());
  if (managed) {
    return unexpected(link.name +
                      " has no active profile of NetworkManager; 'nmcli connection add type ethernet ifname " +
                      link.name + "' makes one, and 'nmcli device connect " + link.name + "' uses it");
  }
  return unexpected(link.name + " is unmanaged by NetworkManager; 'nmcli device set " + link.name +
                    " managed yes' lets it manage the interface");
}

std::vector<std::string> OwnerChoice::othersWith(const ChosenOwner& owner, const Link& link) const {
  std::vector<std::string> others;
  for (const Link& other : links_) {
    const DnsFacts facts = owners_.factsOf(other);
    if (other.index != link.index && facts.owner == owner.name && facts.profile == owner.profile) {
      others.push_back(other.name);
    }
  }
  return others;
}

}  // namespace zorva::agent
