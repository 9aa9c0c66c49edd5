#include "http/Reception.h"

#include <sys/epoll.h>
#include <sys/ioctl.h>

#include <array>
#include <cerrno>
#include <cstring>
#include <stdexcept>
#include <string>
#include <utility>

#include "http/AddressText.h"
#include "http/Log.h"

namespace zorva::http {

namespace {

constexpr std::size_t kMostDropped = std::size_t{256} << 10;

/// The first byte of a TLS record that begins a handshake (RFC 8446 5.1). No request of HTTP begins with it.
constexpr unsigned char kTlsHandshake = 0x16;

/// A request begins with a letter, or with empty lines (RFC 9112 2.2). Other bytes are left to the TLS library.
bool beginsRequest(unsigned char byte) {
  return (byte >= 'A' && byte <= 'Z') || (byte >= 'a' && byte <= 'z') || byte == '\r' || byte == '\n';
}

bool isWrong(Door door, unsigned char byte) { return door == Door::Http ? byte == kTlsHandshake : beginsRequest(byte); }

/// Type, version and length of a TLS record (RFC 8446 5.1).
using RecordHead = std::array<unsigned char, 5>;
constexpr std::size_t kLongestRecord = std::size_t{16} << 10;

/// How many bytes the client has to send before its handshake can go on. 0: none; the TLS library has to look at them.
std::size_t neededForHandshake(const RecordHead& head, std::size_t got) {
  if (head[0] != kTlsHandshake) return 0;
  if (got < head.size()) return head.size();
  const std::size_t length = std::size_t{head[3]} << 8U | head[4];
  return length <= kLongestRecord ? head.size() + length : 0;
}

bool hasBytes(int socket, std::size_t count) {
  int there = 0;
  return ::ioctl(socket, FIONREAD, &there) != 0 || static_cast<std::size_t>(there) >= count;
}

/// The socket counts as readable when so many bytes are there, or the client has ended.
void wakeAt(int socket, std::size_t bytes) {
  const int count = static_cast<int>(bytes);
  ::setsockopt(socket, SOL_SOCKET, SO_RCVLOWAT, &count, sizeof count);
}

std::string localAddress(int socket) {
  sockaddr_storage local{};
  socklen_t size = sizeof local;
  if (::getsockname(socket, reinterpret_cast<sockaddr*>(&local), &size) != 0) return "localhost";
  return addressText(unmapped(local));
}

}  // namespace

// A TLS client gets the same kind of answer. No alert of TLS says "no TLS here": each would send people to look for
// versions or ciphers. After a text TLS clients say that the other side does not speak TLS, which is the matter, and
// who looks at the bytes reads the sentence.
std::string answerToWrongProtocol(Door door, std::string_view address) {
  const std::string at(address);
  const std::string text = door == Door::Https ? "This port speaks HTTPS: use https://" + at + "/\n"
                                               : "This port speaks HTTP without TLS: use http://" + at + "/\n";
  return "HTTP/1.1 400 Bad Request\r\nContent-Type: text/plain; charset=utf-8\r\nContent-Length: " +
         std::to_string(text.size()) + "\r\nConnection: close\r\n\r\n" + text;
}

Reception::Reception(Connections& connections, Admit admit)
    : connections_(connections), admit_(std::move(admit)), epoll_(::epoll_create1(EPOLL_CLOEXEC)) {
  if (!epoll_) throw std::runtime_error(std::string("cannot wait for connections: ") + std::strerror(errno));
}

Reception::~Reception() {
  for (auto& [descriptor, newcomer] : waiting_) end(newcomer);
}

void Reception::add(Newcomer newcomer) {
  switch (lookAt(newcomer)) {
    case Result::Admitted:
      return;
    case Result::Ended:
      return end(newcomer);
    case Result::Waits:
      break;
  }
  const int descriptor = newcomer.socket.get();
  epoll_event wait{};
  wait.events = EPOLLIN | EPOLLRDHUP;
  wait.data.fd = descriptor;
  if (::epoll_ctl(epoll_.get(), EPOLL_CTL_ADD, descriptor, &wait) != 0) return end(newcomer);
  newcomer.isWatched = true;
  waiting_.emplace(descriptor, std::move(newcomer));
}

void Reception::look() {
  std::array<epoll_event, 64> events{};
  const int count = ::epoll_wait(epoll_.get(), events.data(), static_cast<int>(events.size()), 0);
  for (int i = 0; i < count; ++i) {
    const auto found = waiting_.find(events.at(static_cast<std::size_t>(i)).data.fd);
    if (found == waiting_.end()) continue;
    if ((events.at(static_cast<std::size_t>(i)).events & (EPOLLRDHUP | EPOLLHUP | EPOLLERR)) != 0) {
      found->second.hasEnded = true;
    }
    const Result result = lookAt(found->second);
    if (result == Result::Waits) continue;
    if (result == Result::Ended) end(found->second);
    waiting_.erase(found);
  }
}

Reception::Result Reception::lookAt(Newcomer& newcomer) {
  if (newcomer.isAnswered) return drop(newcomer);
  const int descriptor = newcomer.socket.get();
  RecordHead head{};
  const ssize_t got = ::recv(descriptor, head.data(), head.size(), MSG_PEEK | MSG_DONTWAIT);
  if (got < 0 && (errno == EAGAIN || errno == EWOULDBLOCK || errno == EINTR)) return Result::Waits;
  if (got <= 0) return Result::Ended;
  if (isWrong(newcomer.door, head[0])) {
    answer(newcomer);
    return drop(newcomer);
  }
  const std::size_t needed = newcomer.door == Door::Https ? neededForHandshake(head, static_cast<std::size_t>(got)) : 0;
  if (needed == 0 || hasBytes(descriptor, needed)) return admit(newcomer);
  if (newcomer.hasEnded) return Result::Ended;
  // Woken too early: the kernel has no room for more, so the bytes must be taken.
  if (newcomer.awaited == needed) return admit(newcomer);
  wakeAt(descriptor, needed);
  newcomer.awaited = needed;
  return Result::Waits;
}

Reception::Result Reception::admit(Newcomer& newcomer) {
  const int descriptor = newcomer.socket.get();
  if (newcomer.isWatched) ::epoll_ctl(epoll_.get(), EPOLL_CTL_DEL, descriptor, nullptr);
  if (newcomer.awaited != 0) wakeAt(descriptor, 1);
  admit_(std::move(newcomer));
  return Result::Admitted;
}

void Reception::answer(Newcomer& newcomer) {
  const int descriptor = newcomer.socket.get();
  ZORVA_LOG_CLIENT(Warning, newcomer.connection->peer() + (newcomer.door == Door::Https
                                                               ? ": speaks HTTP without TLS on the port of HTTPS"
                                                               : ": speaks TLS on the port of plain HTTP"));
  const std::string text = answerToWrongProtocol(newcomer.door, localAddress(descriptor));
  ::send(descriptor, text.data(), text.size(), MSG_NOSIGNAL | MSG_DONTWAIT);
  ::shutdown(descriptor, SHUT_WR);
  newcomer.isAnswered = true;
}

/// If the socket were closed while there is something to read, the client might lose the answer.
Reception::Result Reception::drop(Newcomer& newcomer) const {
  std::array<char, 16384> bytes{};
  while (newcomer.dropped < kMostDropped) {
    const ssize_t got = ::recv(newcomer.socket.get(), bytes.data(), bytes.size(), MSG_DONTWAIT);
    if (got < 0 && (errno == EAGAIN || errno == EWOULDBLOCK || errno == EINTR)) return Result::Waits;
    if (got <= 0) break;
    newcomer.dropped += static_cast<std::size_t>(got);
  }
  return Result::Ended;
}

void Reception::end(Newcomer& newcomer) {
  connections_.remove(*newcomer.connection);
  newcomer.socket.reset();
}

}  // namespace zorva::http
