#include "server/Systemd.h"

#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <algorithm>
#include <charconv>
#include <cstddef>
#include <cstdlib>
#include <cstring>
#include <string>
#include <string_view>
#include <vector>

#include "util/FileDescriptor.h"

namespace zorva::server {

namespace {

constexpr int kMostSockets = 64;

/// The value as a number; -1 if it is none.
long number(const char* text) {
  if (text == nullptr) return -1;
  long value = -1;
  const char* const end = text + std::strlen(text);
  const auto [rest, error] = std::from_chars(text, end, value);
  return error == std::errc() && rest == end ? value : -1;
}

/// The texts between colons.
std::vector<std::string> parts(const char* text) {
  std::vector<std::string> found;
  for (std::string_view rest = text == nullptr ? "" : text; !rest.empty();) {
    const std::size_t colon = std::min(rest.find(':'), rest.size());
    found.emplace_back(rest.substr(0, colon));
    rest.remove_prefix(std::min(colon + 1, rest.size()));
  }
  return found;
}

}  // namespace

void notifyServiceManager(std::string_view state) {
  const char* path = std::getenv("NOTIFY_SOCKET");
  if (path == nullptr || (*path != '/' && *path != '@')) return;
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  const std::size_t size = std::strlen(path);
  if (size >= sizeof address.sun_path) return;
  std::memcpy(address.sun_path, path, size);
  if (*path == '@') address.sun_path[0] = '\0';  // the abstract namespace: not a file

  const util::FileDescriptor socket(::socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0));
  if (!socket) return;
  const auto addressSize = static_cast<socklen_t>(offsetof(sockaddr_un, sun_path) + size);
  ::sendto(socket.get(), state.data(), state.size(), MSG_NOSIGNAL, reinterpret_cast<const sockaddr*>(&address),
           addressSize);
}

http::Inherited inheritedSockets() {
  http::Inherited inherited;
  if (number(std::getenv("LISTEN_PID")) == static_cast<long>(::getpid())) {
    const long count = number(std::getenv("LISTEN_FDS"));
    inherited.count = static_cast<int>(std::clamp(count, 0L, static_cast<long>(kMostSockets)));
    inherited.names = parts(std::getenv("LISTEN_FDNAMES"));
  }
  for (const char* name : {"LISTEN_PID", "LISTEN_FDS", "LISTEN_FDNAMES"}) ::unsetenv(name);
  return inherited;
}

}  // namespace zorva::server
