#include "agent/sources/Resolved.h"

#include <algorithm>
#include <utility>

#include "agent/sources/BusNames.h"

namespace zorva::agent {
namespace {

constexpr int kHost = 0;  // in the place of a link's index
constexpr std::size_t kMostLinksWithoutDns = 256;

std::map<int, std::string> namesByIndex(const std::vector<Link>& links) {
  std::map<int, std::string> result;
  for (const Link& link : links) result.emplace(link.index, link.name);
  return result;
}

// sd-bus escapes the first character of a number in a path.
std::string pathOf(int index) {
  const std::string number = std::to_string(index);
  return std::string(kResolvedPath) + "/link/_3" + number;
}

void readMode(BusReader& reader, const std::string& name, DnsFacts& modes) {
  std::string* mode = nullptr;
  if (name == "DNSOverTLS") mode = &modes.dnsOverTls;
  if (name == "DNSSEC") mode = &modes.dnssec;
  if (name == "LLMNR") mode = &modes.llmnr;
  if (name == "MulticastDNS") mode = &modes.multicastDns;
  if (name == "DefaultRoute") reader.ifVariant("b", [&] { modes.defaultRoute = reader.flag(); });
  if (mode == nullptr) return;
  reader.ifText(*mode);
  if (!isShownText(*mode)) mode->clear();
}

}  // namespace

Resolved::Resolved(const std::string& root)
    : DnsOwner({"systemd-resolved",
                kResolvedService,
                {propertyChangesBelow(kResolvedPath)},
                root + "/run/systemd/resolve/netif"}) {}

bool Resolved::isConcernedBy(const std::vector<Link>& links) const { return namesByIndex(links) != links_; }

void Resolved::startAsking(const std::vector<Link>& links) {
  links_ = namesByIndex(links);
  said_.clear();
  ask(kResolvedPath, kBusProperties, "GetAll", {kResolvedManager}, [this](BusReader& reader) { readManager(reader); });
}

void Resolved::readManager(BusReader& reader) {
  reader.forEachProperty([&](const std::string& name) {
    if (name == "DNSEx") reader.ifVariant("a(iiayqs)", [&] { readServers(reader); });
    if (name == "Domains") reader.ifVariant("a(isb)", [&] { readDomains(reader); });
    readMode(reader, name, said_[kHost].modes);
  });
  std::size_t withoutDns = 0;
  for (const auto& [index, name] : links_) {
    if (said_.count(index) != 0 || ++withoutDns <= kMostLinksWithoutDns) askForLink(index);
  }
}

void Resolved::readServers(BusReader& reader) {
  reader.forEachStructure("iiayqs", [&] {
    const int index = reader.signedNumber();
    reader.signedNumber();  // the family, which the address's length tells as well
    Server server;
    server.address = reader.bytes();
    server.port = reader.port();
    server.name = reader.text();
    // Of links that have come since it was asked, it will be asked anew.
    if (index == kHost || links_.count(index) != 0) said_[index].servers.push_back(std::move(server));
  });
}

void Resolved::readDomains(BusReader& reader) {
  reader.forEachStructure("isb", [&] {
    const int index = reader.signedNumber();
    std::string name = reader.text();
    const bool routingOnly = reader.flag();
    if (index == kHost || links_.count(index) != 0) said_[index].domains.push_back({std::move(name), routingOnly});
  });
}

void Resolved::askForLink(int index) {
  ask(pathOf(index), kBusProperties, "GetAll", {kResolvedLink}, [this, index](BusReader& reader) {
    reader.forEachProperty([&](const std::string& name) { readMode(reader, name, said_[index].modes); });
  });
}

DnsFacts Resolved::factsFrom(const Said& said, const std::string& interface) {
  DnsFacts facts = said.modes;
  facts.owner = name();
  DnsFactsBuilder builder(facts);
  for (const Server& server : said.servers) builder.addServer(server.address, interface, server.port, server.name);
  for (const Domain& domain : said.domains) builder.addDomain(domain.name, domain.routingOnly);
  if (!facts.suffixes.empty()) facts.domain = facts.suffixes.front();
  reportWhatIsLeftOut(interface.empty() ? "the host" : interface, builder);
  return facts;
}

void Resolved::takeAnswers() {
  facts_.clear();
  for (const auto& [index, said] : std::exchange(said_, {})) {
    const auto link = links_.find(index);
    if (index == kHost || link != links_.end()) facts_[index] = factsFrom(said, index == kHost ? "" : link->second);
  }
}

void Resolved::forget() {
  links_.clear();
  said_.clear();
  facts_.clear();
}

const DnsFacts* Resolved::factsOf(const Link& link) const {
  const auto found = facts_.find(link.index);
  return found == facts_.end() ? nullptr : &found->second;
}

const DnsFacts* Resolved::hostFacts() const {
  const auto found = facts_.find(kHost);
  return found == facts_.end() ? nullptr : &found->second;
}

}  // namespace zorva::agent
