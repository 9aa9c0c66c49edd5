// dns: the servers of an interface.

#include <arpa/inet.h>
#include <netinet/in.h>

#include "cli/commands/Commands.h"
#include "cli/commands/SettingList.h"
#include "cli/session/Assignments.h"

namespace zorva::cli {

namespace {

/// An address in a form that is equal for all its spellings.
struct Address {
  int family = AF_UNSPEC;  ///< AF_UNSPEC: the text is no address
  std::string bytes;
  std::string zone;  ///< what follows "%" after an IPv6 address

  bool operator==(const Address&) const = default;
};

/// An address for inet_pton; an IPv6 one may have a zone.
Address addressOf(const std::string& text) {
  const std::string address = text.substr(0, text.find('%'));
  const bool hasZone = address.size() < text.size();
  in6_addr bytes{};
  if (!hasZone && ::inet_pton(AF_INET, address.c_str(), &bytes) == 1) {
    return {AF_INET, {reinterpret_cast<const char*>(&bytes), sizeof(in_addr)}, {}};
  }
  if (::inet_pton(AF_INET6, address.c_str(), &bytes) != 1 || text.back() == '%' ||
      text.find(' ') != std::string::npos) {
    return {};
  }
  const char* from = reinterpret_cast<const char*>(&bytes);
  if (IN6_IS_ADDR_V4MAPPED(&bytes)) return {AF_INET, {from + sizeof(in6_addr) - sizeof(in_addr), sizeof(in_addr)}, {}};
  return {AF_INET6, {from, sizeof(in6_addr)}, hasZone ? text.substr(address.size() + 1) : std::string()};
}

bool isMulticast(const Address& address) {
  const auto first = static_cast<unsigned char>(address.bytes.front());
  return address.family == AF_INET ? (first & 0xF0U) == 0xE0U : first == 0xFFU;
}

bool isUnspecified(const Address& address) { return address.bytes.find_first_not_of('\0') == std::string::npos; }

void requireServer(const std::string& text) {
  requirePlainText("SERVER", text);
  const Address address = addressOf(text);
  if (address.family == AF_UNSPEC) {
    throw refused(text, "is no IP address", "a server is given by its address: 192.0.2.53 or 2001:db8::53");
  }
  if (isMulticast(address)) throw refused(text, "is a multicast address; no server has one");
  if (isUnspecified(address)) throw refused(text, "is the unspecified address; no server has it");
}

bool sameServer(const std::string& a, const std::string& b) {
  const Address address = addressOf(a);
  return a == b || (address.family != AF_UNSPEC && address == addressOf(b));
}

constexpr ListSetting kServers{"DNSServerAddresses", "server",  "SERVER", "An IP address", true,
                               requireServer,        sameServer};

}  // namespace

void addDnsCommands(CommandLine& line) {
  Subcommand dns = line.add("dns", "The DNS servers of an interface");
  dns.writesJson().examples("  zorvactl dns set eth0 192.0.2.53 2001:db8::53\n  zorvactl dns add eth0 192.0.2.54");
  addShow(dns, kServers).examples("  zorvactl dns show eth0");
  addChange(dns, kServers, "set", "Replace them; none at all empties the list", Many::Any, setList)
      .examples(
          "  zorvactl dns set eth0 192.0.2.53 2001:db8::53\n"
          "  zorvactl dns set eth0                         none at all");
  addChange(dns, kServers, "add", "Add servers after the others", Many::Some, addToList)
      .examples("  zorvactl dns add eth0 192.0.2.54");
  addChange(dns, kServers, "remove", "Remove servers", Many::Some, removeFromList)
      .examples("  zorvactl dns remove eth0 192.0.2.54");
}

}  // namespace zorva::cli
