#include "agent/apply/OwnerChoice.h"

#include <linux/if.h>

#include <chrono>
#include <thread>

#include "agent/apply/NetworkManagerDevice.h"

namespace zorva::agent {
namespace {

bool isLoopback(const Link& link) { return (link.flags & IFF_LOOPBACK) != 0; }

}  // namespace

OwnerChoice::OwnerChoice(BusCalls& bus, const std::string& root) : bus_(bus), owners_(root), doubts_(bus, root) {}

void OwnerChoice::look(const std::vector<Link>& links) {
  constexpr std::chrono::seconds kLongest{10};
  constexpr std::chrono::milliseconds kPause{20};
  const auto deadline = std::chrono::steady_clock::now() + kLongest;
  links_ = links;
  owners_.reopen();
  owners_.look(links_);
  while (!owners_.whoIsLate().empty() && std::chrono::steady_clock::now() < deadline) {
    std::this_thread::sleep_for(kPause);
    owners_.look(links_);
  }
}

Expected<ChosenOwner, Refusal> OwnerChoice::choose(const Link& link) {
  if (isLoopback(link)) {
    return unexpected(link.name +
                      " is the loopback interface, which has no DNS settings of its own; name another one, 'zorvactl "
                      "show --all' lists them");
  }
  if (const std::string late = owners_.whoIsLate(); !late.empty()) {
    return unexpected(late + " does not answer, so who owns the DNS settings of " + link.name +
                      " is not known; try again when it does, or stop it");
  }
  const DnsFacts facts = owners_.factsOf(link);
  if (!facts.owner.empty()) return ChosenOwner{facts.owner, facts.profile, facts.saysAnything()};
  if (const auto managed = refuseUnmanaged(link); !managed) return unexpected(managed.error());
  if (owners_.hostFacts() != nullptr) return ChosenOwner{"systemd-resolved", {}, false};
  if (!owners_.speakForAny(links_)) return ChosenOwner{"/etc/resolv.conf", {}, false};
  return unexpected(link.name +
                    " has no owner of DNS settings, while others do, and /etc/resolv.conf is that of the "
                    "whole host; let NetworkManager or systemd-networkd manage " +
                    link.name);
}

// In the order of docs/host.md.
std::optional<OwnerDoubt> OwnerChoice::doubtAbout(const Link& link) {
  if (isLoopback(link) || !owners_.whoIsLate().empty()) return std::nullopt;  // which choose() refuses
  std::string chosen = owners_.factsOf(link).owner;
  if (chosen.empty() && owners_.hostFacts() != nullptr) chosen = "systemd-resolved";
  for (const char* owner : {"NetworkManager", "systemd-networkd", "systemd-resolved"}) {
    if (chosen == owner) break;
    if (auto doubt = doubts_.about(owner, link, owners_.runs(owner))) return doubt;
  }
  return std::nullopt;
}

// NetworkManager has every link as a device. One that it does not manage is left to whoever set it up.
Expected<void, Refusal> OwnerChoice::refuseUnmanaged(const Link& link) {
  const auto device = readDevice(bus_, link.name);
  if (!device) return {};
  if (device->isManaged) {
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
