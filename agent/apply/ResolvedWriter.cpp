// Changes what systemd-resolved has for a link.

#include <sys/socket.h>

#include <algorithm>
#include <utility>

#include "agent/apply/BusObject.h"
#include "agent/apply/SettingsText.h"
#include "agent/apply/Writers.h"
#include "agent/sources/BusNames.h"
#include "agent/tree/IpAddress.h"
#include "util/Names.h"

namespace zorva::agent {
namespace {

using Done = Expected<void, std::string>;

struct Server {
  std::string address;
  std::uint16_t port = 0;  ///< 0 is the usual one
  std::string name;        ///< for DNS over TLS

  bool isPlain() const { return port == 0 && name.empty(); }
};

struct Domain {
  std::string name;
  bool routingOnly = false;
};

struct LinkDns {
  std::vector<Server> servers;
  std::vector<Domain> domains;
};

std::vector<Server> readServers(BusReader& reader) {
  std::vector<Server> servers;
  reader.forEachStructure("iayqs", [&] {
    reader.signedNumber();  // the family, which the address's length tells as well
    const std::string address = textOfAddress(reader.bytes());
    const std::uint16_t port = reader.port();
    servers.push_back({address, port, reader.text()});
  });
  return servers;
}

std::vector<Domain> readDomains(BusReader& reader) {
  std::vector<Domain> domains;
  reader.forEachStructure("sb", [&] {
    std::string name = reader.text();
    domains.push_back({std::move(name), reader.flag()});
  });
  return domains;
}

bool holdsName(const StringList& names, const std::string& name) {
  return std::any_of(names.begin(), names.end(), [&](const std::string& other) { return util::sameName(other, name); });
}

// In place of an older list: each server that it had keeps its port and name, and its routing-only domains stay.
LinkDns changed(const LinkDns& present, const DnsSettings& wanted) {
  LinkDns result;
  for (const std::string& server : wanted.servers) {
    const std::string address = withoutZone(server);
    const auto known = std::find_if(present.servers.begin(), present.servers.end(),
                                    [&](const Server& other) { return other.address == address; });
    result.servers.push_back(known == present.servers.end() ? Server{address, 0, ""} : *known);
  }
  for (const std::string& suffix : wanted.suffixes) result.domains.push_back({suffix, false});
  for (const Domain& domain : present.domains) {
    if (domain.routingOnly && !holdsName(wanted.suffixes, domain.name)) result.domains.push_back(domain);
  }
  return result;
}

void writeServer(BusWriter& arguments, const Server& server, bool inFull) {
  const std::vector<unsigned char> bytes = bytesOfAddress(server.address);
  arguments.structure(inFull ? "iayqs" : "iay", [&] {
    arguments.signedNumber(isIPv4Address(server.address) ? AF_INET : AF_INET6);
    arguments.bytes(bytes);
    if (!inFull) return;
    arguments.port(server.port);
    arguments.text(server.name);
  });
}

void writeDomain(BusWriter& arguments, const Domain& domain) {
  arguments.structure("sb", [&] {
    arguments.text(domain.name);
    arguments.flag(domain.routingOnly);
  });
}

// Whether one of these names is in the other list with other small and large letters.
bool respells(const std::vector<Domain>& domains, const std::vector<Domain>& others) {
  return std::any_of(domains.begin(), domains.end(), [&](const Domain& domain) {
    return std::any_of(others.begin(), others.end(), [&](const Domain& other) {
      return util::sameName(domain.name, other.name) && domain.name != other.name;
    });
  });
}

Done orRefusal(const DnsTarget& target, const Done& done) {
  if (done) return done;
  const std::string shown = inOneLine(target.interface);
  return unexpected(shown + ": systemd-resolved does not take the settings: " + done.error() + "; 'resolvectl status " +
                    shown + "' shows what it has, 'networkctl status " + shown + "' who configures the link");
}

class ResolvedWriter : public DnsWriter {
 public:
  explicit ResolvedWriter(BusCalls& bus) : bus_(bus), manager_(bus, kResolvedService, kResolvedPath) {}

  DnsSettings asHeld(const DnsSettings& settings) const override;
  Expected<std::string, Refusal> save(const DnsTarget& target) override;
  Expected<void, Refusal> write(const DnsTarget& target, const DnsSettings& settings) override;
  Expected<void, Refusal> restore(const DnsTarget& target, const std::string& saved) override;
  /// It keeps the settings of links in /run, also over a restart of its own.
  std::string note() const override {
    return "gone when the link goes or the host restarts: systemd-resolved has no file for it";
  }

 private:
  Expected<LinkDns, Refusal> read(const DnsTarget& target) const;
  Done setServers(int link, const std::vector<Server>& servers) const;
  Done setDomains(int link, const std::vector<Domain>& domains) const;
  Done set(int link, const LinkDns& present, const LinkDns& wanted) const;

  BusCalls& bus_;
  BusObject manager_;
};

Expected<LinkDns, Refusal> ResolvedWriter::read(const DnsTarget& target) const {
  LinkDns dns;
  std::string path;
  Done done = manager_.call(
      kResolvedManager, "GetLink", [&](BusWriter& arguments) { arguments.signedNumber(target.index); },
      [&](BusReader& answer) { path = answer.text(); });
  if (done) {
    done = BusObject(bus_, kResolvedService, path)
               .readProperties(kResolvedLink, [&](BusReader& reader, const std::string& name) {
                 if (name == "DNSEx") reader.ifVariant("a(iayqs)", [&] { dns.servers = readServers(reader); });
                 if (name == "Domains") reader.ifVariant("a(sb)", [&] { dns.domains = readDomains(reader); });
               });
  }
  if (done) return dns;
  return unexpected(inOneLine(target.interface) + ": systemd-resolved cannot be asked: " + done.error() +
                    "; see 'systemctl status systemd-resolved'");
}

// Versions before 246 know no ports and names.
Done ResolvedWriter::setServers(int link, const std::vector<Server>& servers) const {
  const bool inFull =
      !std::all_of(servers.begin(), servers.end(), [](const Server& server) { return server.isPlain(); });
  return manager_.call(kResolvedManager, inFull ? "SetLinkDNSEx" : "SetLinkDNS", [&](BusWriter& arguments) {
    arguments.signedNumber(link);
    arguments.array(inFull ? "(iayqs)" : "(iay)", [&] {
      for (const Server& server : servers) writeServer(arguments, server, inFull);
    });
  });
}

Done ResolvedWriter::setDomains(int link, const std::vector<Domain>& domains) const {
  return manager_.call(kResolvedManager, "SetLinkDomains", [&](BusWriter& arguments) {
    arguments.signedNumber(link);
    arguments.array("(sb)", [&] {
      for (const Domain& domain : domains) writeDomain(arguments, domain);
    });
  });
}

// A domain that it has in another spelling would keep that.
Done ResolvedWriter::set(int link, const LinkDns& present, const LinkDns& wanted) const {
  Done done = setServers(link, wanted.servers);
  if (!done) return done;
  if (respells(wanted.domains, present.domains)) done = setDomains(link, {});
  if (done) done = setDomains(link, wanted.domains);
  if (done) return done;
  // As before, as far as it takes calls at all.
  (void)setServers(link, present.servers);
  (void)setDomains(link, present.domains);
  return done;
}

DnsSettings ResolvedWriter::asHeld(const DnsSettings& settings) const {
  DnsSettings held;
  for (const std::string& server : settings.servers) addOnce(held.servers, canonicalServer(server));
  for (const std::string& suffix : settings.suffixes) {
    const std::string name = withoutFinalDot(suffix);
    if (!holdsName(held.suffixes, name)) held.suffixes.push_back(name);
  }
  return held;
}

Expected<std::string, Refusal> ResolvedWriter::save(const DnsTarget& target) {
  const auto dns = read(target);
  if (!dns) return unexpected(dns.error());
  JsonValue servers = JsonValue::list();
  for (const Server& server : dns->servers) {
    JsonValue value = JsonValue::object();
    value.add("address", JsonValue::ofText(server.address));
    value.add("port", JsonValue::ofNumber(server.port));
    value.add("name", JsonValue::ofText(server.name));
    servers.add(std::move(value));
  }
  StringList domains;
  for (const Domain& domain : dns->domains) domains.push_back((domain.routingOnly ? "~" : "") + domain.name);
  JsonValue state = JsonValue::object();
  state.add("servers", std::move(servers));
  state.add("domains", JsonValue::ofTexts(domains));
  return formatJson(state);
}

Expected<void, Refusal> ResolvedWriter::write(const DnsTarget& target, const DnsSettings& settings) {
  if (Refusal reason = foreignZone(target.interface, settings.servers); !reason.empty()) return unexpected(reason);
  const auto present = read(target);
  if (!present) return unexpected(present.error());
  return orRefusal(target, set(target.index, *present, changed(*present, asHeld(settings))));
}

// The link is not reverted: that would also undo the modes that a person has set.
Expected<void, Refusal> ResolvedWriter::restore(const DnsTarget& target, const std::string& saved) {
  const auto state = stateIn(saved);
  if (!state) return unexpected(inOneLine(target.interface) + ": " + state.error());
  const auto present = read(target);
  if (!present) return unexpected(present.error());
  LinkDns before;
  if (const JsonValue* servers = state->find("servers"); servers != nullptr) {
    for (const JsonValue& server : servers->items) {
      const auto port = static_cast<std::uint16_t>(numberIn(server, "port"));
      before.servers.push_back({textIn(server, "address"), port, textIn(server, "name")});
    }
  }
  for (const std::string& domain : textsIn(*state, "domains")) {
    const bool routingOnly = domain.starts_with('~');
    before.domains.push_back({routingOnly ? domain.substr(1) : domain, routingOnly});
  }
  return orRefusal(target, set(target.index, *present, before));
}

}  // namespace

std::unique_ptr<DnsWriter> makeResolvedWriter(BusCalls& bus) { return std::make_unique<ResolvedWriter>(bus); }

}  // namespace zorva::agent
