#include "access/FailedLogins.h"

#include <arpa/inet.h>
#include <netinet/in.h>

#include <algorithm>
#include <cstring>

namespace zorva::access {

namespace {

using std::chrono::milliseconds;

constexpr milliseconds kFirstDelay{250};
constexpr std::size_t kMostDoublings = 5;
constexpr std::chrono::minutes kForgotten{10};

std::string textOfIpv6(const in6_addr& address) {
  char text[INET6_ADDRSTRLEN];
  return ::inet_ntop(AF_INET6, &address, text, sizeof text) == nullptr ? std::string() : std::string(text);
}

/// The network that one client usually has for itself.
std::string groupOfIpv6(in6_addr address) {
  constexpr std::size_t kPrefixBytes = 8;
  constexpr std::size_t kMappedBytes = 12;
  if (IN6_IS_ADDR_V4MAPPED(&address)) {
    char text[INET_ADDRSTRLEN];
    return ::inet_ntop(AF_INET, &address.s6_addr[kMappedBytes], text, sizeof text);
  }
  std::memset(&address.s6_addr[kPrefixBytes], 0, sizeof address.s6_addr - kPrefixBytes);
  return textOfIpv6(address) + "/64";
}

}  // namespace

std::string clientGroup(const Origin& origin) {
  if (origin.way == Origin::Way::UnixSocket) {
    return origin.localUser ? "uid " + std::to_string(*origin.localUser) : "a local user";
  }
  if (origin.way == Origin::Way::Loopback) return "loopback";
  const std::string address = origin.address.substr(0, origin.address.find('%'));
  in6_addr parsed{};
  return ::inet_pton(AF_INET6, address.c_str(), &parsed) == 1 ? groupOfIpv6(parsed) : address;
}

milliseconds FailedLogins::remaining(const std::string& client, Clock::time_point now) {
  const std::lock_guard lock(mutex_);
  const Entry* entry = entries_.find(client);
  if (entry == nullptr || entry->until <= now) return milliseconds(0);
  return std::chrono::ceil<milliseconds>(entry->until - now);
}

FailedLogins::Failure FailedLogins::add(const std::string& client, Clock::time_point now) {
  const std::lock_guard lock(mutex_);
  Entry entry;
  if (const Entry* old = entries_.find(client); old != nullptr && now - old->last < kForgotten) entry = *old;
  const milliseconds delay = kFirstDelay * (1U << std::min(entry.count, kMostDoublings));
  ++entry.count;
  entry.last = now;
  entry.until = now + delay;
  entries_.put(client, entry);
  return {entry.count, delay};
}

}  // namespace zorva::access
