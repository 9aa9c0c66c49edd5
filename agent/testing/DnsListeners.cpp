#include "agent/testing/DnsListeners.h"

#include <arpa/inet.h>
#include <poll.h>
#include <sys/socket.h>

#include <algorithm>
#include <array>
#include <stdexcept>

#include "agent/testing/TemporaryDirectory.h"

namespace zorva::agent::testing {
namespace {

void addNew(std::vector<std::string>& list, const std::string& value) {
  if (std::find(list.begin(), list.end(), value) == list.end()) list.push_back(value);
}

}  // namespace

DnsListeners::DnsListeners(const std::vector<std::string>& addresses, unsigned char code)
    : addresses_(addresses), code_(code) {
  constexpr std::uint16_t kPort = 53;
  for (const std::string& address : addresses) {
    util::FileDescriptor socket(::socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0));
    sockaddr_in place{};
    place.sin_family = AF_INET;
    place.sin_port = htons(kPort);
    ::inet_pton(AF_INET, address.c_str(), &place.sin_addr);
    if (::bind(socket.get(), reinterpret_cast<sockaddr*>(&place), sizeof place) != 0) {
      throw std::runtime_error("cannot listen on " + address);
    }
    sockets_.push_back(std::move(socket));
  }
}

void DnsListeners::lookUp(const std::string& name) {
  const pid_t child = startChild([&name] {
    ::execlp("getent", "getent", "ahosts", name.c_str(), static_cast<char*>(nullptr));
    return false;
  });
  while (::waitpid(child, nullptr, WNOHANG) == 0) answer();
}

void DnsListeners::answer() {
  constexpr int kMilliseconds = 10;
  std::vector<pollfd> waits;
  for (const util::FileDescriptor& socket : sockets_) waits.push_back({socket.get(), POLLIN, 0});
  ::poll(waits.data(), waits.size(), kMilliseconds);
  for (std::size_t i = 0; i < waits.size(); ++i) {
    if ((waits[i].revents & POLLIN) != 0) answer(i);
  }
}

void DnsListeners::answer(std::size_t server) {
  constexpr std::size_t kHeader = 12;
  constexpr unsigned char kIsAnswer = 0x80;
  std::array<unsigned char, 512> message{};
  sockaddr_in from{};
  socklen_t size = sizeof from;
  const int socket = sockets_[server].get();
  auto* peer = reinterpret_cast<sockaddr*>(&from);
  const ssize_t got = ::recvfrom(socket, message.data(), message.size(), 0, peer, &size);
  if (got <= static_cast<ssize_t>(kHeader)) return;
  std::string name;
  for (std::size_t at = kHeader; message[at] != 0; at += message[at] + 1U) {
    const auto* label = reinterpret_cast<const char*>(&message[at + 1]);
    name += std::string(name.empty() ? "" : ".") + std::string(label, message[at]);
  }
  addNew(asked, addresses_[server]);
  addNew(names, name);
  message[2] |= kIsAnswer;
  message[3] = code_;
  ::sendto(socket, message.data(), static_cast<std::size_t>(got), 0, peer, size);
}

}  // namespace zorva::agent::testing
