#include "util/ServiceHost.h"

#include <arpa/inet.h>
#include <ifaddrs.h>
#include <netinet/in.h>

#include <algorithm>
#include <cstring>
#include <memory>
#include <optional>
#include <vector>

#include "util/HostName.h"
#include "util/Names.h"
#include "util/ReadFile.h"

namespace zorva::util {

namespace {

std::string kernelName() {
  const std::string name = kernelHostName();
  return name.empty() ? "localhost" : name;
}

/// The bytes of an address; empty if the text is not an address.
std::string addressOf(std::string_view text) {
  const std::string copy(text.substr(0, INET6_ADDRSTRLEN));
  char bytes[sizeof(in6_addr)];
  if (inet_pton(AF_INET, copy.c_str(), bytes) == 1) return {bytes, sizeof(in_addr)};
  if (inet_pton(AF_INET6, copy.c_str(), bytes) == 1) return {bytes, sizeof(in6_addr)};
  return {};
}

std::string addressOf(const sockaddr* address) {
  if (address == nullptr) return {};
  if (address->sa_family == AF_INET) {
    const auto* v4 = reinterpret_cast<const sockaddr_in*>(address);
    return {reinterpret_cast<const char*>(&v4->sin_addr), sizeof v4->sin_addr};
  }
  if (address->sa_family == AF_INET6) {
    const auto* v6 = reinterpret_cast<const sockaddr_in6*>(address);
    return {reinterpret_cast<const char*>(&v6->sin6_addr), sizeof v6->sin6_addr};
  }
  return {};
}

/// The bytes of the addresses of all interfaces.
std::vector<std::string> interfaceAddresses() {
  std::vector<std::string> addresses;
  ifaddrs* list = nullptr;
  if (getifaddrs(&list) != 0) return addresses;
  const std::unique_ptr<ifaddrs, decltype(&freeifaddrs)> owner(list, freeifaddrs);
  for (const ifaddrs* one = list; one != nullptr; one = one->ifa_next) {
    std::string address = addressOf(one->ifa_addr);
    if (!address.empty()) addresses.push_back(std::move(address));
  }
  return addresses;
}

bool isOwn(const std::string& address) {
  if (address.size() == sizeof(in_addr) && address[0] == 127) return true;
  const std::vector<std::string> all = interfaceAddresses();
  return std::find(all.begin(), all.end(), address) != all.end();
}

bool isOfLink(const std::string& address) {
  return address.size() == sizeof(in6_addr) && address[0] == '\xFE' && (address[1] & '\xC0') == '\x80';
}

std::string textOf(const std::string& address) {
  char text[INET6_ADDRSTRLEN] = "";
  const int family = address.size() == sizeof(in_addr) ? AF_INET : AF_INET6;
  inet_ntop(family, address.data(), text, sizeof text);
  return text;
}

/// The words of a line of the hosts file; the first is the address.
std::vector<std::string_view> wordsOf(std::string_view line) {
  constexpr std::string_view kBlanks = " \t\r";
  line = line.substr(0, line.find('#'));
  std::vector<std::string_view> words;
  for (;;) {
    const std::size_t begin = std::min(line.find_first_not_of(kBlanks), line.size());
    const std::size_t end = std::min(line.find_first_of(kBlanks, begin), line.size());
    if (begin == end) return words;
    words.push_back(line.substr(begin, end - begin));
    line.remove_prefix(end);
  }
}

void addOnce(std::vector<std::string>& names, std::string_view name) {
  const bool isThere = std::any_of(names.begin(), names.end(), [&](const auto& each) { return sameName(each, name); });
  if (!isThere && !name.empty()) names.emplace_back(name);
}

std::string_view firstLabel(std::string_view name) noexcept { return name.substr(0, name.find('.')); }

/// True if the names are equal, or one is the other with a domain.
bool sameHost(std::string_view a, std::string_view b) noexcept {
  if (sameName(a, b)) return true;
  const bool aIsShort = a.find('.') == std::string_view::npos;
  const bool bIsShort = b.find('.') == std::string_view::npos;
  return aIsShort != bIsShort && sameName(firstLabel(a), firstLabel(b));
}

}  // namespace

std::string_view withoutPort(std::string_view text) noexcept {
  if (text.starts_with('[')) {
    const std::size_t end = text.find(']');
    return end == std::string_view::npos ? text : text.substr(1, end - 1);
  }
  const std::size_t colon = text.find(':');
  const bool isAddress = colon != std::string_view::npos && text.find(':', colon + 1) != std::string_view::npos;
  if (!isAddress) text = text.substr(0, colon);
  if (text.ends_with('.')) text.remove_suffix(1);
  return text;
}

bool isOwnAddress(std::string_view text) {
  const std::string address = addressOf(text);
  return !address.empty() && isOwn(address);
}

std::vector<std::string> ownAddresses() {
  std::vector<std::string> addresses;
  for (const std::string& each : interfaceAddresses()) {
    if (!isOfLink(each)) addOnce(addresses, textOf(each));
  }
  return addresses;
}

std::vector<std::string> ownNames(const std::string& hostsFile) {
  constexpr std::size_t kLargestFile = std::size_t{1} << 20;
  const std::string own = kernelName();
  std::vector<std::string> names;
  addOnce(names, own);
  addOnce(names, firstLabel(own));
  addOnce(names, "localhost");
  const std::string text = readFile(hostsFile, kLargestFile).text;
  for (std::size_t begin = 0; begin < text.size();) {
    const std::size_t end = std::min(text.find('\n', begin), text.size());
    const auto words = wordsOf(std::string_view(text).substr(begin, end - begin));
    begin = end + 1;
    const bool isNamed = std::any_of(words.begin(), words.end(), [&](auto word) { return sameName(word, own); });
    if (!isNamed || !isOwnAddress(words.front())) continue;
    for (std::size_t i = 1; i < words.size(); ++i) addOnce(names, words[i]);
  }
  return names;
}

ServiceHost::ServiceHost(std::string name) : name_(name.empty() ? kernelName() : std::move(name)) {}

bool ServiceHost::isThis(std::string_view text, std::string_view hostHeader) const {
  const std::string_view host = withoutPort(text);
  if (host.empty()) return false;
  if (const std::string address = addressOf(host); !address.empty()) return isOwn(address);
  return sameName(host, "localhost") || sameName(firstLabel(host), "localhost") ||
         sameName(host, withoutPort(hostHeader)) || sameHost(host, name_) || sameHost(host, kernelName());
}

}  // namespace zorva::util
