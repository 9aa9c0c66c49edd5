#include "http/Listener.h"

#include <arpa/inet.h>
#include <fcntl.h>
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <optional>
#include <stdexcept>
#include <system_error>
#include <utility>

#include "http/AddressText.h"
#include "http/Log.h"

namespace zorva::http {

namespace {

constexpr int kFirstInherited = 3;
constexpr int kPortTries = 20;

std::string errorText(int error) { return std::generic_category().message(error); }

/// The address and port in the kernel's form; nothing if the text is no address.
std::optional<sockaddr_storage> parse(const std::string& text, int port) {
  sockaddr_storage storage{};
  in_addr v4{};
  in6_addr v6{};
  if (::inet_pton(AF_INET, text.c_str(), &v4) == 1) {
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_addr = v4;
    address.sin_port = htons(static_cast<std::uint16_t>(port));
    std::memcpy(&storage, &address, sizeof address);
    return storage;
  }
  if (::inet_pton(AF_INET6, text.c_str(), &v6) == 1) {
    sockaddr_in6 address{};
    address.sin6_family = AF_INET6;
    address.sin6_addr = v6;
    address.sin6_port = htons(static_cast<std::uint16_t>(port));
    std::memcpy(&storage, &address, sizeof address);
    return storage;
  }
  return std::nullopt;
}

bool isLoopback(const sockaddr_storage& address) {
  if (address.ss_family == AF_INET) {
    sockaddr_in v4{};
    std::memcpy(&v4, &address, sizeof v4);
    return (ntohl(v4.sin_addr.s_addr) >> 24) == 127;
  }
  sockaddr_in6 v6{};
  std::memcpy(&v6, &address, sizeof v6);
  return address.ss_family == AF_INET6 && IN6_IS_ADDR_LOOPBACK(&v6.sin6_addr);
}

sockaddr_storage parseLoopback(const std::string& text, int port) {
  const auto address = parse(text, port);
  if (!address.has_value()) {
    throw std::invalid_argument("'" + text + "' is no address to listen on; give one such as 127.0.0.1 or ::1");
  }
  if (!isLoopback(*address)) {
    throw std::invalid_argument("'" + text +
                                "' is no loopback address: this server does not ask who its clients are, "
                                "so it listens on 127.0.0.1 and ::1 only");
  }
  return *address;
}

socklen_t sizeOf(const sockaddr_storage& address) {
  return address.ss_family == AF_INET6 ? sizeof(sockaddr_in6) : sizeof(sockaddr_in);
}

sockaddr_storage nameOf(int socket) {
  sockaddr_storage address{};
  socklen_t size = sizeof address;
  if (::getsockname(socket, reinterpret_cast<sockaddr*>(&address), &size) != 0) address = {};
  return address;
}

int portOf(const sockaddr_storage& address) {
  sockaddr_in v4{};
  std::memcpy(&v4, &address, sizeof v4);  // the port is at the same offset in both families
  return ntohs(v4.sin_port);
}

/// Listens on one address. On a failure the descriptor is empty and errno has the reason.
Listener listenOnOne(const sockaddr_storage& address) {
  Listener listener;
  const int socket = ::socket(address.ss_family, SOCK_STREAM | SOCK_NONBLOCK | SOCK_CLOEXEC, 0);
  if (socket < 0) return listener;
  util::FileDescriptor owned(socket);
  const int on = 1;
  ::setsockopt(socket, SOL_SOCKET, SO_REUSEADDR, &on, sizeof on);
  if (address.ss_family == AF_INET6) ::setsockopt(socket, IPPROTO_IPV6, IPV6_V6ONLY, &on, sizeof on);
  if (::bind(socket, reinterpret_cast<const sockaddr*>(&address), sizeOf(address)) != 0) return listener;
  if (::listen(socket, SOMAXCONN) != 0) return listener;
  listener.socket = std::move(owned);
  listener.url = "http://" + addressText(nameOf(socket));
  return listener;
}

/// One try at all addresses. Empty if a port that was chosen for the first is in use at another.
std::vector<Listener> listenOnce(const Addresses& addresses, int port, bool mayLack) {
  std::vector<Listener> listeners;
  int chosen = port;
  for (const std::string& text : addresses) {
    Listener listener = listenOnOne(parseLoopback(text, chosen));
    if (!listener.socket) {
      const int error = errno;
      if (mayLack && (error == EADDRNOTAVAIL || error == EAFNOSUPPORT)) continue;
      if (port == 0 && chosen != 0 && error == EADDRINUSE) return {};
      throw std::runtime_error("cannot listen on " + text + " port " + std::to_string(chosen) + ": " +
                               errorText(error));
    }
    chosen = portOf(nameOf(listener.socket.get()));
    listeners.push_back(std::move(listener));
  }
  if (listeners.empty()) throw std::runtime_error("this host has no loopback address to listen on");
  return listeners;
}

}  // namespace

void checkAddresses(const Addresses& addresses) {
  for (const std::string& text : addresses) parseLoopback(text, 0);
}

std::vector<Listener> listenOn(const std::optional<Addresses>& addresses, int port) {
  const Addresses wanted = addresses.value_or(Addresses{"127.0.0.1", "::1"});
  for (int i = 0; i < kPortTries; ++i) {
    std::vector<Listener> listeners = listenOnce(wanted, port, !addresses.has_value());
    if (!listeners.empty()) return listeners;
  }
  throw std::runtime_error("no port is free on all addresses");
}

std::vector<Listener> adoptListeners(int count) {
  std::vector<Listener> listeners;
  for (int descriptor = kFirstInherited; descriptor < kFirstInherited + count; ++descriptor) {
    Listener listener{util::FileDescriptor(descriptor), {}};
    const std::string name = "the socket that was handed over as descriptor " + std::to_string(descriptor);
    int listens = 0;
    socklen_t size = sizeof listens;
    const int rc = ::getsockopt(descriptor, SOL_SOCKET, SO_ACCEPTCONN, &listens, &size);
    if (rc != 0 || listens == 0) throw std::runtime_error(name + " does not listen");
    const sockaddr_storage address = nameOf(descriptor);
    if (!isLoopback(address)) {
      throw std::runtime_error(name +
                               " listens elsewhere than on a loopback address, and this server does not ask who "
                               "its clients are");
    }
    ::fcntl(descriptor, F_SETFD, FD_CLOEXEC);
    ::fcntl(descriptor, F_SETFL, ::fcntl(descriptor, F_GETFL) | O_NONBLOCK);
    listener.url = "http://" + addressText(address);
    listeners.push_back(std::move(listener));
  }
  return listeners;
}

}  // namespace zorva::http
