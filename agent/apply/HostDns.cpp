#include "agent/apply/HostDns.h"

#include <algorithm>
#include <thread>
#include <utility>

#include "agent/apply/Writers.h"
#include "agent/sources/HostNames.h"
#include "util/HostName.h"
#include "util/Names.h"
#include "util/ReadFile.h"

namespace zorva::agent {
namespace {

using namespace ZV::NodeLexicon;
using std::chrono::steady_clock;

constexpr const char* kRoot = "";  // of all paths
constexpr const char* kBusSocket = "/run/dbus/system_bus_socket";
constexpr std::size_t kLargestHosts = std::size_t{64} << 10;

bool sameNames(const StringList& left, const StringList& right) {
  return std::equal(left.begin(), left.end(), right.begin(), right.end(), util::sameName);
}

}  // namespace

bool sameLists(const DnsSettings& left, const DnsSettings& right) {
  return sameNames(left.servers, right.servers) && sameNames(left.suffixes, right.suffixes);
}

HostDns::HostDns(Look look, std::string bmcFile)
    : look_(std::move(look)), bmcFile_(std::move(bmcFile)), bus_(kBusSocket), choice_(bus_, kRoot) {}

void HostDns::look() {
  const std::vector<Link> links = reader_.read().links;
  links_.clear();
  for (const Link& link : links) links_[link.name] = link;
  choice_.look(links);
  tree_ = look_();
}

bool HostDns::mayLookAgain() {
  constexpr std::chrono::seconds kLongest{10};
  constexpr std::chrono::milliseconds kPause{50};
  if (!looksUntil_) looksUntil_ = steady_clock::now() + kLongest;
  if (steady_clock::now() >= *looksUntil_) return false;
  std::this_thread::sleep_for(kPause);
  look();
  return true;
}

// The tree is read after the owners are asked, and one of them may have ended in between.
bool HostDns::isInTree(const ChosenOwner& owner, const HostInterface& interface) const {
  const Node* node = nodeOf(interface);
  return !owner.speaks || node == nullptr || node->textOrEmpty(kDnsOwner) == owner.name;
}

Expected<ChosenOwner, Refusal> HostDns::ownerOfBmc(const HostInterface& interface) const {
  const Node* node = nodeOf(interface);
  if (node == nullptr || node->textOrEmpty(kDnsOwner) != kBmcOwner) {
    return unexpected(interface.name + " is not kept by zorva-bmc, so it cannot be changed");
  }
  return ChosenOwner{kBmcOwner, node->textOrEmpty(kDnsProfile), true};
}

Expected<ChosenOwner, Refusal> HostDns::ownerOf(const HostInterface& interface) {
  if (interface.isOfBmc) return ownerOfBmc(interface);
  for (;;) {
    auto owner = choice_.choose(interface.link);
    const auto doubt = choice_.doubtAbout(interface.link);
    if (!doubt && (!owner || isInTree(*owner, interface))) return owner;
    if (doubt && doubt->kind == OwnerDoubt::Kind::Stopped) return unexpected(doubt->refusal);
    if (mayLookAgain()) continue;
    if (doubt && doubt->kind == OwnerDoubt::Kind::Starting) return unexpected(doubt->refusal);
    if (doubt) return owner;
    return unexpected(owner->name + " answers too late to change " + interface.name + "; try again when it does not");
  }
}

HostInterface HostDns::interfaceOf(const std::string& name, const std::string& path) const {
  const auto link = links_.find(name);
  return {name, path, link == links_.end() ? Link() : link->second, false, name};
}

HostInterface HostDns::interfaceOfBmc(const Node& node, const std::string& name) const {
  return {node.path(), node.path(), {}, true, links_.contains(name) ? std::string() : name};
}

std::vector<HostInterface> HostDns::interfaces() const {
  std::vector<HostInterface> interfaces;
  for (const Node& node : tree_->nodes()) {
    if (node.type() != NodeType::NetworkIPConfig) continue;
    const std::string& name = node.textOrEmpty(PROP_NAME);
    const bool isOfBmc = tree_->parent(tree_->parent(node)).isServiceProcessor();
    interfaces.push_back(isOfBmc ? interfaceOfBmc(node, name) : interfaceOf(name, node.path()));
  }
  return interfaces;
}

std::vector<HostInterface> HostDns::named(const std::string& name) const {
  std::vector<HostInterface> found;
  for (HostInterface& interface : interfaces()) {
    const Node& node = *nodeOf(interface);
    const bool isOfBmc =
        interface.isOfBmc && node.textOrEmpty(PROP_NAME) == (name.starts_with("BMC%") ? name.substr(4) : "");
    if (interface.name == name || interface.settingsName == name || isOfBmc) found.push_back(std::move(interface));
  }
  return found;
}

// The tree may lack the loopback interface.
HostInterface HostDns::interface(const std::string& name) const {
  const std::vector<HostInterface> found = named(name);
  return found.empty() ? interfaceOf(name, {}) : found.front();
}

std::vector<std::string> HostDns::othersWith(const ChosenOwner& owner, const HostInterface& interface) const {
  return choice_.othersWith(owner, interface.link);
}

DnsWriter* HostDns::writerOf(const std::string& owner) {
  std::unique_ptr<DnsWriter>& writer = writers_[owner];
  if (writer == nullptr) {
    writer = owner == kBmcOwner ? makeBmcWriter(bmcFile_) : makeWriter(owner, bus_, kRoot);
  }
  return writer.get();
}

const Node* HostDns::nodeOf(const HostInterface& interface) const {
  return interface.path.empty() ? nullptr : tree_->find(interface.path);
}

DnsTarget HostDns::targetFor(const HostInterface& interface, const std::string& profile) const {
  DnsTarget target{interface.name, interface.link.index, profile, {}, {}, interface.name};
  const Node* node = nodeOf(interface);
  if (node == nullptr) return target;
  target.zone = node->textOrEmpty(PROP_NAME);
  target.serversInFull = node->listOrEmpty(kDnsServersInFull);
  target.routingDomains = node->listOrEmpty(kDnsRoutingDomains);
  return target;
}

ShownDns HostDns::shown(const HostInterface& interface, const std::string& owner) const {
  ShownDns shown;
  const Node* node = nodeOf(interface);
  if (node == nullptr || node->textOrEmpty(kDnsOwner) != owner) {
    if (owner != kResolvConfOwner) shown.domain = ownDomain();
    return shown;
  }
  shown.lists = {node->listOrEmpty(PROP_DNS_SERVER_ADDRESSES), node->listOrEmpty(PROP_DNS_SUFFIXES)};
  if (owner != kResolvConfOwner) {
    shown.domain = node->textOrEmpty(PROP_DOMAIN_NAME);
    return shown;
  }
  // The servers that the C library passes over are in the file as well.
  const StringList more = tree_->systemOf(*node).listOrEmpty(kResolverNotAsked);
  shown.lists.servers.insert(shown.lists.servers.end(), more.begin(), more.end());
  return shown;
}

std::string HostDns::ownDomain() const {
  const util::FileText hosts = util::readFile("/etc/hosts", kLargestHosts);
  return findHostNames(util::kernelHostName(), hosts.text, {}).domain;
}

bool HostDns::waitUntilShown(const DnsTarget& target, const std::string& owner, const DnsSettings& lists) {
  constexpr std::chrono::seconds kLongest{5};
  constexpr std::chrono::seconds kUntilInsisting{1};
  constexpr std::chrono::milliseconds kPause{20};
  const auto start = steady_clock::now();
  const HostInterface interface = this->interface(target.interface);
  bool insisted = false;
  for (;;) {
    tree_ = look_();
    if (sameLists(shown(interface, owner).lists, lists)) return true;
    const auto waited = steady_clock::now() - start;
    if (waited > kLongest) return false;
    if (waited > kUntilInsisting && !insisted) {
      insisted = true;
      if (const auto done = writerOf(owner)->insist(target); !done) return false;
    }
    std::this_thread::sleep_for(kPause);
  }
}

}  // namespace zorva::agent
