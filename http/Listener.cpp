#include "http/Listener.h"

#include <arpa/inet.h>
#include <fcntl.h>
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
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

sockaddr_storage parseFor(Door door, const std::string& text, int port) {
  const auto address = parse(text, port);
  if (!address.has_value()) {
    throw std::invalid_argument("'" + text + "' is no address to listen on; give one such as 127.0.0.1 or ::1");
  }
  if (door == Door::Http && !isLoopback(*address)) {
    throw std::invalid_argument("'" + text +
                                "' is no loopback address: plain HTTP is for this host only, on 127.0.0.1 and ::1; "
                                "for other hosts set certificate, key and addresses in [tls]");
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

std::string urlOf(Door door, const sockaddr_storage& address) {
  return (door == Door::Https ? "https://" : "http://") + addressText(address);
}

/// Listens on one address. On a failure the descriptor is empty and errno has the reason.
Listener listenOnOne(const sockaddr_storage& address, Door door) {
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
  listener.url = urlOf(door, nameOf(socket));
  listener.door = door;
  listener.isLocal = isLoopback(address);
  return listener;
}

/// One try at all addresses. Empty if a port that was chosen for the first is in use at another.
std::vector<Listener> listenOnce(const Addresses& addresses, int port, Door door, bool mayLack) {
  std::vector<Listener> listeners;
  int chosen = port;
  for (const std::string& text : addresses) {
    Listener listener = listenOnOne(parseFor(door, text, chosen), door);
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

sockaddr_un unixAddress(const std::string& path) {
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  if (path.empty() || path.size() >= sizeof address.sun_path) {
    throw std::runtime_error("cannot listen on " + path + ": the path of a socket has at most " +
                             std::to_string(sizeof address.sun_path - 1) + " bytes");
  }
  std::memcpy(address.sun_path, path.data(), path.size());
  return address;
}

/// Removes the file of a server that has died. Throws if a server listens there, or the file is no socket.
void removeStale(const std::string& path, const sockaddr_un& address) {
  struct stat file {};
  if (::lstat(path.c_str(), &file) != 0) return;
  if (!S_ISSOCK(file.st_mode))
    throw std::runtime_error("cannot listen on " + path + ": there is a file, and no socket");
  const util::FileDescriptor probe(::socket(AF_UNIX, SOCK_STREAM | SOCK_NONBLOCK | SOCK_CLOEXEC, 0));
  const int rc = ::connect(probe.get(), reinterpret_cast<const sockaddr*>(&address), sizeof address);
  if (rc == 0 || errno != ECONNREFUSED) {
    throw std::runtime_error("cannot listen on " + path + ": another server listens there");
  }
  ::unlink(path.c_str());
}

/// The path of a Unix socket; the name of an abstract one with a leading '@'.
std::string pathOf(const sockaddr_storage& address) {
  sockaddr_un name{};
  std::memcpy(&name, &address, sizeof name);
  const bool isAbstract = name.sun_path[0] == '\0';
  const char* text = name.sun_path + (isAbstract ? 1 : 0);
  return (isAbstract ? "@" : "") + std::string(text, ::strnlen(text, sizeof name.sun_path - 1));
}

Listener adopt(int descriptor, const std::string& name, std::optional<int> tlsPort) {
  Listener listener{util::FileDescriptor(descriptor), {}};
  const std::string what = "the socket that was handed over as descriptor " + std::to_string(descriptor);
  int listens = 0;
  socklen_t size = sizeof listens;
  const int rc = ::getsockopt(descriptor, SOL_SOCKET, SO_ACCEPTCONN, &listens, &size);
  if (rc != 0 || listens == 0) throw std::runtime_error(what + " does not listen");
  const sockaddr_storage address = nameOf(descriptor);
  if (address.ss_family == AF_UNIX) {
    listener.url = "unix:" + pathOf(address);
  } else {
    if (name == "https" && !tlsPort.has_value()) {
      throw std::runtime_error(what + " is for HTTPS, but [tls] has no certificate");
    }
    listener.door = name == "https" || tlsPort == portOf(address) ? Door::Https : Door::Http;
    listener.isLocal = isLoopback(address);
    listener.url = urlOf(listener.door, address);
  }
  if (listener.door == Door::Http && !listener.isLocal) {
    throw std::runtime_error(what +
                             " listens elsewhere than on a loopback address, and plain HTTP is for this host only");
  }
  ::fcntl(descriptor, F_SETFD, FD_CLOEXEC);
  ::fcntl(descriptor, F_SETFL, ::fcntl(descriptor, F_GETFL) | O_NONBLOCK);
  return listener;
}

}  // namespace

SocketFile::SocketFile(std::string path) : path_(std::move(path)) { ::lstat(path_.c_str(), &made_); }

SocketFile::~SocketFile() {
  struct stat now {};
  // A new file may have the number of one that was removed.
  const bool isSame = ::lstat(path_.c_str(), &now) == 0 && now.st_dev == made_.st_dev && now.st_ino == made_.st_ino &&
                      now.st_mtim.tv_sec == made_.st_mtim.tv_sec && now.st_mtim.tv_nsec == made_.st_mtim.tv_nsec;
  if (isSame) ::unlink(path_.c_str());
}

void checkAddresses(const Addresses& addresses, Door door) {
  for (const std::string& text : addresses) parseFor(door, text, 0);
}

std::vector<Listener> listenOn(const std::optional<Addresses>& addresses, int port, Door door) {
  const Addresses wanted = addresses.value_or(Addresses{"127.0.0.1", "::1"});
  for (int i = 0; i < kPortTries; ++i) {
    std::vector<Listener> listeners = listenOnce(wanted, port, door, !addresses.has_value());
    if (!listeners.empty()) return listeners;
  }
  throw std::runtime_error("no port is free on all addresses");
}

Listener listenOnUnix(const std::string& path) {
  constexpr mode_t kForAll = 0666;
  const sockaddr_un address = unixAddress(path);
  removeStale(path, address);
  Listener listener;
  listener.socket = util::FileDescriptor(::socket(AF_UNIX, SOCK_STREAM | SOCK_NONBLOCK | SOCK_CLOEXEC, 0));
  const int socket = listener.socket.get();
  // Nobody can connect before listen(), so nobody sees other rights.
  if (::bind(socket, reinterpret_cast<const sockaddr*>(&address), sizeof address) != 0 ||
      ::chmod(path.c_str(), kForAll) != 0 || ::listen(socket, SOMAXCONN) != 0) {
    throw std::runtime_error("cannot listen on " + path + ": " + errorText(errno));
  }
  listener.url = "unix:" + path;
  listener.file = std::make_unique<SocketFile>(path);
  return listener;
}

std::vector<Listener> adoptListeners(const Inherited& inherited, std::optional<int> tlsPort) {
  std::vector<Listener> listeners;
  for (int i = 0; i < inherited.count; ++i) {
    const auto place = static_cast<std::size_t>(i);
    const std::string name = place < inherited.names.size() ? inherited.names[place] : std::string();
    listeners.push_back(adopt(kFirstInherited + i, name, tlsPort));
  }
  return listeners;
}

}  // namespace zorva::http
