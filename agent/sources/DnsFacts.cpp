#include "agent/sources/DnsFacts.h"

#include <algorithm>
#include <cstdint>

#include "agent/tree/IpAddress.h"
#include "util/Utf8.h"

namespace zorva::agent {
namespace {

constexpr std::size_t kLongestName = 253;
constexpr std::size_t kLongestLabel = 63;
constexpr std::size_t kLongestText = 255;

// C0, DEL and C1 are not shown, and neither is what is no UTF-8.
bool isShown(std::string_view text, std::uint32_t firstShown) {
  constexpr std::uint32_t kDelete = 0x7F;
  constexpr std::uint32_t kLastControl = 0x9F;
  while (!text.empty()) {
    const std::size_t length = util::utf8Length(text);
    if (length == 0) return false;
    const std::uint32_t character = util::utf8Decode(text);
    if (character < firstShown || (character >= kDelete && character <= kLastControl)) return false;
    text.remove_prefix(length);
  }
  return true;
}

std::string inBrackets(const std::string& address) {
  return address.find(':') == std::string::npos ? address : '[' + address + ']';
}

void addOnce(StringList& list, const std::string& value) {
  if (std::find(list.begin(), list.end(), value) == list.end()) list.push_back(value);
}

}  // namespace

bool isDomain(std::string_view name) {
  if (name == ".") return true;
  if (name.ends_with('.')) name.remove_suffix(1);
  if (name.empty() || name.starts_with('~') || name.size() > kLongestName || !isShown(name, '!')) return false;
  while (!name.empty()) {
    const std::size_t label = std::min(name.find('.'), name.size());
    if (label == 0 || label > kLongestLabel || label + 1 == name.size()) return false;
    name.remove_prefix(std::min(label + 1, name.size()));
  }
  return true;
}

bool isShownText(std::string_view text) { return text.size() <= kLongestText && isShown(text, ' '); }

void DnsFactsBuilder::addServer(const std::vector<unsigned char>& address, const std::string& interface,
                                unsigned int port, const std::string& name) {
  std::string text = textOfAddress(address);
  if (text.empty()) return leaveOut("a server's address is of no known family");
  if (facts_.servers.size() >= kMostDnsValues) return leaveOut("a server is beyond the 256th");
  if (!name.empty() && !isDomain(name)) return leaveOut("server " + text + " has a name that is none");
  if (isIPv6LinkLocal(text) && !interface.empty()) text += '%' + interface;
  const bool first = facts_.serversInFull.empty();
  if ((port != 0 || !name.empty()) && first) facts_.serversInFull = facts_.servers;
  facts_.servers.push_back(text);
  if (port == 0 && name.empty() && first) return;
  if (port != 0) text = inBrackets(text) + ':' + std::to_string(port);
  if (!name.empty()) text += '#' + name;
  facts_.serversInFull.push_back(text);
}

void DnsFactsBuilder::addServer(const std::string& address, const std::string& interface) {
  addServer(bytesOfAddress(address), interface);
}

void DnsFactsBuilder::addDomain(const std::string& domain) {
  const bool routingOnly = domain.starts_with('~');
  addDomain(routingOnly ? domain.substr(1) : domain, routingOnly);
}

void DnsFactsBuilder::addDomain(const std::string& domain, bool routingOnly) {
  if (!isDomain(domain)) return leaveOut("a domain is no name");
  StringList& list = routingOnly ? facts_.routingDomains : facts_.suffixes;
  if (list.size() >= kMostDnsValues) return leaveOut("a domain is beyond the 256th");
  if (routingOnly || domain != ".") addOnce(list, domain);
}

void DnsFactsBuilder::setProfile(const std::string& name) {
  if (!isShownText(name)) return leaveOut("the name of a profile has control characters or is too long");
  facts_.profile = name;
}

void DnsFactsBuilder::leaveOut(const std::string& problem) { problem_ = problem + ", and is left out"; }

}  // namespace zorva::agent
