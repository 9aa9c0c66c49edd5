#include "agent/sources/DnsOwners.h"

#include <algorithm>
#include <utility>

#include "agent/log/LogOutput.h"

namespace zorva::agent {
namespace {

using Clock = std::chrono::steady_clock;

bool speaks(const DnsFacts* facts) { return facts != nullptr && facts->saysAnything(); }

// What systemd-resolved alone knows. It knows it of every link, whoever named the servers.
void takeModes(DnsFacts& facts, const DnsFacts& resolved) {
  facts.defaultRoute = resolved.defaultRoute;
  facts.dnsOverTls = resolved.dnsOverTls;
  facts.dnssec = resolved.dnssec;
  facts.llmnr = resolved.llmnr;
  facts.multicastDns = resolved.multicastDns;
}

void takeOwner(DnsFacts& facts, const DnsFacts& owner) {
  facts.owner = owner.owner;
  facts.profile = owner.profile;
  facts.origin = owner.origin;
}

}  // namespace

DnsOwners::DnsOwners(const std::string& root)
    : socket_(root + "/run/dbus/system_bus_socket"),
      bus_(socket_),
      resolved_(root),
      networkd_(root),
      all_{&networkManager_, &resolved_, &networkd_} {}

DnsOwners::~DnsOwners() { disconnect(); }

void DnsOwners::connect() {
  if (bus_.isOpen()) return;
  lastTry_ = Clock::now();
  if (!bus_.open()) return;
  for (DnsOwner* owner : all_) owner->connect(bus_);
}

void DnsOwners::disconnect() {
  for (DnsOwner* owner : all_) owner->disconnect();
  bus_.close();
}

void DnsOwners::addWakers(Wakers& wakers) {
  if (!bus_.isOpen()) {
    // Nothing reports when somebody listens on the socket.
    if (bus_.wasRefused()) wakers.addDeadline(kLooksForTheUnreported);
    return;
  }
  wakers.add(bus_.descriptor(), bus_.events());
  if (bus_.hasMore()) wakers.addDeadline(std::chrono::milliseconds(0));
  for (DnsOwner* owner : all_) owner->addWakers(wakers);
}

void DnsOwners::reopen() { disconnect(); }

void DnsOwners::handleArrived() {
  try {
    if (bus_.handleArrived()) return;
  } catch (const BusError& error) {
    ZORVAGENT_LOG_ERROR(std::string("the message bus: ") + error.what());
  }
  disconnect();
  lost_ = true;
}

// A socket that nobody listens on yet: nothing reports when that changes.
bool DnsOwners::canConnectNow() {
  constexpr std::chrono::seconds kBetweenTries{1};
  if (!bus_.wasRefused() || Clock::now() - lastTry_ < kBetweenTries) return false;
  connect();
  return bus_.isOpen();
}

bool DnsOwners::changed() {
  if (!bus_.isOpen()) return lost_ || canConnectNow();
  handleArrived();
  if (lost_) return true;
  // Each is asked every time, so that none piles up reports.
  bool changed = false;
  for (DnsOwner* owner : all_) changed = owner->changed() || changed;
  return changed;
}

bool DnsOwners::isSettled() const {
  return std::all_of(all_.begin(), all_.end(), [](const DnsOwner* owner) { return owner->isSettled(); });
}

// Of those for whom it is false.
std::string DnsOwners::namesOf(bool (DnsOwner::*holds)() const) const {
  std::string names;
  for (const DnsOwner* owner : all_) {
    if ((owner->*holds)()) continue;
    const std::string name = owner->nameIsKnown() ? owner->name() : "the message bus";
    if (names.find(name) == std::string::npos) names += (names.empty() ? "" : ", ") + name;
  }
  return names;
}

std::string DnsOwners::whoIsLate() const { return bus_.isOpen() ? namesOf(&DnsOwner::hasSaidAll) : std::string(); }

void DnsOwners::giveUpWaiting() {
  const std::string late = namesOf(&DnsOwner::isSettled);
  for (DnsOwner* owner : all_) {
    if (!owner->isSettled()) owner->giveUpWaiting();
  }
  ZORVAGENT_LOG_ERROR("no answer within " + std::to_string(kLongestWait.count()) + " ms from " + late +
                      "; what was known before holds until it comes");
}

void DnsOwners::look(const std::vector<Link>& links) {
  const Clock::time_point deadline = Clock::now() + kLongestWait;
  lost_ = false;
  connect();
  while (bus_.isOpen()) {
    handleArrived();
    if (!bus_.isOpen()) break;
    for (DnsOwner* owner : all_) owner->askWhereStale(links);
    if (isSettled()) break;
    const auto left = std::chrono::duration_cast<std::chrono::microseconds>(deadline - Clock::now());
    if (left.count() <= 0) {
      giveUpWaiting();
      break;
    }
    bus_.wait(left);
  }
  for (DnsOwner* owner : all_) owner->acceptChanges();
}

bool DnsOwners::runs(const std::string& owner) const {
  return std::any_of(all_.begin(), all_.end(),
                     [&](const DnsOwner* other) { return other->name() == owner && other->runs(); });
}

DnsFacts DnsOwners::factsOf(const Link& link) const {
  const DnsFacts* manager = networkManager_.factsOf(link);
  const DnsFacts* resolved = resolved_.factsOf(link);
  const DnsFacts* networkd = networkd_.factsOf(link);
  DnsFacts facts;
  for (const DnsFacts* owner : {manager, resolved, networkd}) {
    if (!speaks(owner)) continue;
    facts = *owner;
    break;
  }
  // systemd-networkd hands what it knows of a link to systemd-resolved; a change must go to where it comes from.
  if (!speaks(manager) && speaks(resolved) && speaks(networkd)) takeOwner(facts, *networkd);
  if (facts.owner.empty() && manager != nullptr) takeOwner(facts, *manager);
  if (facts.owner.empty() && networkd != nullptr) takeOwner(facts, *networkd);
  if (resolved != nullptr) takeModes(facts, *resolved);
  return facts;
}

bool DnsOwners::speakForAny(const std::vector<Link>& links) const {
  return std::any_of(links.begin(), links.end(), [this](const Link& link) {
    return speaks(networkManager_.factsOf(link)) || speaks(resolved_.factsOf(link)) || speaks(networkd_.factsOf(link));
  });
}

}  // namespace zorva::agent
