#include "dns/ServerAddress.h"

#include <arpa/inet.h>
#include <net/if.h>

#include <algorithm>
#include <charconv>
#include <cstring>

namespace zorva::dns {

namespace {

std::optional<std::uint16_t> portOf(std::string_view text) {
  std::uint16_t port = 0;
  const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), port);
  if (error != std::errc() || end != text.data() + text.size() || port == 0) return std::nullopt;
  return port;
}

bool parseAddress(std::string_view text, ServerAddress& server) {
  const std::size_t percent = text.find('%');
  const std::string address(text.substr(0, percent));
  if (percent != std::string_view::npos) {
    server.zone = text.substr(percent + 1);
    if (server.zone.empty()) return false;
  }
  server.family = address.find(':') == std::string::npos ? AF_INET : AF_INET6;
  if (server.family == AF_INET && !server.zone.empty()) return false;
  return address.find('\0') == std::string::npos && ::inet_pton(server.family, address.c_str(), &server.bytes) == 1;
}

/// Splits "ADDRESS:PORT" or "[ADDRESS]:PORT". Without a port the address is the whole text.
bool splitPort(std::string_view text, std::string_view& address, std::string_view& port) {
  address = text;
  if (text.starts_with('[')) {
    const std::size_t end = text.find(']');
    if (end == std::string_view::npos) return false;
    address = text.substr(1, end - 1);
    port = text.substr(end + 1);
    if (!port.empty() && !port.starts_with(':')) return false;
  } else if (const std::size_t colon = text.find(':'); colon != std::string_view::npos && colon == text.rfind(':')) {
    address = text.substr(0, colon);
    port = text.substr(colon);
  }
  return true;
}

std::uint32_t scopeOf(const std::string& zone) {
  if (const unsigned index = ::if_nametoindex(zone.c_str())) return index;
  std::uint32_t number = 0;
  const auto [end, error] = std::from_chars(zone.data(), zone.data() + zone.size(), number);
  return error == std::errc() && end == zone.data() + zone.size() ? number : 0;
}

std::optional<std::string> addressAlone(const std::string& text) {
  auto server = parseServer(text);
  if (!server) return std::nullopt;
  server->port = kUsualPort;
  return server->text();
}

}  // namespace

std::string ServerAddress::text() const {
  char address[INET6_ADDRSTRLEN] = "";
  ::inet_ntop(family, &bytes, address, sizeof address);
  std::string whole = address + (zone.empty() ? std::string() : "%" + zone);
  if (port == kUsualPort) return whole;
  return (family == AF_INET6 ? "[" + whole + "]" : whole) + ":" + std::to_string(port);
}

std::optional<ServerAddress> parseServer(std::string_view text) {
  std::string_view address;
  std::string_view port;
  ServerAddress server;
  if (!splitPort(text.substr(0, text.find('#')), address, port)) return std::nullopt;
  if (!port.empty()) {
    const auto number = portOf(port.substr(1));
    if (!number) return std::nullopt;
    server.port = *number;
  }
  if (!parseAddress(address, server)) return std::nullopt;
  return server;
}

std::optional<SocketAddress> socketAddress(const ServerAddress& server) {
  SocketAddress made;
  if (server.family == AF_INET) {
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_port = htons(server.port);
    std::memcpy(&address.sin_addr, &server.bytes, sizeof address.sin_addr);
    std::memcpy(&made.storage, &address, sizeof address);
    made.size = sizeof address;
    return made;
  }
  sockaddr_in6 address{};
  address.sin6_family = AF_INET6;
  address.sin6_port = htons(server.port);
  address.sin6_addr = server.bytes;
  if (!server.zone.empty()) {
    address.sin6_scope_id = scopeOf(server.zone);
    if (address.sin6_scope_id == 0) return std::nullopt;
  }
  std::memcpy(&made.storage, &address, sizeof address);
  made.size = sizeof address;
  return made;
}

std::vector<std::string> withPorts(const std::vector<std::string>& servers, const std::vector<std::string>& inFull) {
  std::vector<std::string> texts = servers;
  for (std::size_t i = 0; i < std::min(servers.size(), inFull.size()); ++i) {
    const auto address = addressAlone(inFull[i]);
    if (address && address == addressAlone(servers[i])) texts[i] = inFull[i];
  }
  return texts;
}

}  // namespace zorva::dns
