#include "dns/testing/UdpServer.h"

#include <arpa/inet.h>
#include <fcntl.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <stdexcept>
#include <utility>

namespace zorva::dns::testing {

UdpServer::UdpServer(const std::string& address, std::uint16_t port, Reply reply)
    : socket_(::socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0)), stop_{-1, -1}, port_(port) {
  sockaddr_in own{};
  own.sin_family = AF_INET;
  own.sin_port = htons(port);
  socklen_t size = sizeof own;
  if (::inet_pton(AF_INET, address.c_str(), &own.sin_addr) != 1 || ::pipe2(stop_, O_CLOEXEC) != 0 ||
      ::bind(socket_, reinterpret_cast<const sockaddr*>(&own), size) != 0 ||
      ::getsockname(socket_, reinterpret_cast<sockaddr*>(&own), &size) != 0) {
    throw std::runtime_error("no UDP server on " + address);
  }
  port_ = ntohs(own.sin_port);
  thread_ = std::thread([this, reply = std::move(reply)] { serve(reply); });
}

UdpServer::~UdpServer() {
  ::close(stop_[1]);
  thread_.join();
  ::close(stop_[0]);
  ::close(socket_);
}

void UdpServer::serve(const Reply& reply) {
  const int elsewhere = ::socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0);
  while (true) {
    pollfd polled[] = {{socket_, POLLIN, 0}, {stop_[0], POLLIN, 0}};
    ::poll(polled, 2, -1);
    if (polled[1].revents != 0) break;
    char buffer[4096];
    sockaddr_in from{};
    socklen_t size = sizeof from;
    const ssize_t count = ::recvfrom(socket_, buffer, sizeof buffer, 0, reinterpret_cast<sockaddr*>(&from), &size);
    if (count < 0) continue;
    ++queries_;
    for (const Packet& packet : reply({buffer, static_cast<std::size_t>(count)})) {
      ::sendto(packet.isFromElsewhere ? elsewhere : socket_, packet.bytes.data(), packet.bytes.size(), 0,
               reinterpret_cast<const sockaddr*>(&from), size);
    }
  }
  ::close(elsewhere);
}

std::string UdpServer::response(const std::string& query, unsigned code) {
  std::string message = query;
  message[2] = static_cast<char>(0x81);
  message[3] = static_cast<char>(0x80U | code);
  if (code != 0) return message;
  message[7] = 1;
  const std::string type = query.substr(query.size() - 4, 2);
  // A pointer to the question's name, the type, the class, a time to live, and four bytes of data.
  return message + std::string("\xC0\x0C", 2) + type + std::string("\0\1\0\0\0\x3C\0\4\1\2\3\4", 12);
}

UdpServer::Reply UdpServer::answering(unsigned code) {
  return [code](const std::string& query) { return std::vector<Packet>{{response(query, code)}}; };
}

}  // namespace zorva::dns::testing
