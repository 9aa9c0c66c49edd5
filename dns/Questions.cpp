#include "dns/Questions.h"

#include <poll.h>
#include <sys/random.h>
#include <sys/socket.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstring>
#include <system_error>

#include "util/FileDescriptor.h"

namespace zorva::dns {

namespace {

using Clock = std::chrono::steady_clock;

constexpr std::size_t kAtOnce = 256;

/// An id that nobody who does not see the query can guess.
std::uint16_t randomId() {
  std::uint16_t id = 0;
  if (::getrandom(&id, sizeof id, 0) != sizeof id) throw std::system_error(errno, std::generic_category(), "getrandom");
  return id;
}

/// One inquiry on its way. The socket is connected, so that the kernel drops packets from other addresses, and says
/// that nothing listens there.
class Exchange {
 public:
  Exchange(const Inquiry& inquiry, Answer& answer) : inquiry_(inquiry), answer_(answer), id_(randomId()) { send(); }

  bool isOpen() const noexcept { return static_cast<bool>(socket_); }
  int descriptor() const noexcept { return socket_.get(); }
  Clock::time_point sent() const noexcept { return sent_; }

  /// Reads what has arrived; bounded, because more may arrive all the time.
  void receive() {
    constexpr int kMostPackets = 64;
    for (int i = 0; i < kMostPackets && isOpen(); ++i) {
      const ssize_t size = ::recv(socket_.get(), buffer().data(), buffer().size(), MSG_DONTWAIT);
      if (size < 0 && (errno == EAGAIN || errno == EINTR)) return;
      if (size < 0) return fail();
      read({buffer().data(), static_cast<std::size_t>(size)});
    }
  }

  void close() { socket_.reset(); }

 private:
  static std::array<char, kLongestMessage>& buffer() {
    static thread_local std::array<char, kLongestMessage> shared;
    return shared;
  }

  void send() {
    sent_ = Clock::now();
    const auto address = socketAddress(inquiry_.server);
    if (!address) return fail("this host has no interface " + inquiry_.server.zone);
    socket_ = util::FileDescriptor(::socket(inquiry_.server.family, SOCK_DGRAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0));
    const std::string query = encodeQuery(id_, inquiry_.question);
    const auto* target = reinterpret_cast<const sockaddr*>(&address->storage);
    if (!socket_ || ::connect(socket_.get(), target, address->size) != 0 ||
        ::send(socket_.get(), query.data(), query.size(), MSG_NOSIGNAL) < 0) {
      fail();
    }
  }

  void fail() { fail(std::generic_category().message(errno)); }
  void fail(const std::string& problem) {
    answer_.kind = Answer::Kind::Unreachable;
    answer_.problem = problem;
    close();
  }

  void read(std::string_view message) {
    const auto response = decodeResponse(message, id_, inquiry_.question);
    if (response) {
      answer_.kind = Answer::Kind::Response;
      answer_.response = *response;
      answer_.problem.clear();
      answer_.time = std::chrono::duration_cast<std::chrono::microseconds>(Clock::now() - sent_);
      return close();
    }
    // A good response may still come.
    if (response.error().isForeign) return;
    answer_.kind = Answer::Kind::Malformed;
    answer_.problem = response.error().what;
  }

  const Inquiry& inquiry_;
  Answer& answer_;
  const std::uint16_t id_;
  util::FileDescriptor socket_;
  Clock::time_point sent_;
};

/// Until the last has its answer or its time is over.
void waitFor(std::vector<Exchange>& exchanges, std::chrono::milliseconds timeout) {
  std::vector<pollfd> polled;
  std::vector<Exchange*> open;
  while (true) {
    polled.clear();
    open.clear();
    const Clock::time_point now = Clock::now();
    Clock::time_point end = now + timeout;
    for (Exchange& each : exchanges) {
      if (each.isOpen() && each.sent() + timeout <= now) each.close();
      if (!each.isOpen()) continue;
      polled.push_back({each.descriptor(), POLLIN, 0});
      open.push_back(&each);
      end = std::min(end, each.sent() + timeout);
    }
    if (open.empty()) return;
    // One millisecond more, because the wait is cut to whole ones.
    const auto left = std::chrono::duration_cast<std::chrono::milliseconds>(end - now).count() + 1;
    if (::poll(polled.data(), polled.size(), static_cast<int>(left)) < 0 && errno != EINTR) {
      throw std::system_error(errno, std::generic_category(), "poll");
    }
    for (std::size_t i = 0; i < open.size(); ++i) {
      if (polled[i].revents != 0) open[i]->receive();
    }
  }
}

}  // namespace

std::vector<Answer> ask(const std::vector<Inquiry>& inquiries, std::chrono::milliseconds timeout) {
  std::vector<Answer> answers(inquiries.size());
  for (std::size_t from = 0; from < inquiries.size(); from += kAtOnce) {
    const std::size_t end = std::min(from + kAtOnce, inquiries.size());
    std::vector<Exchange> exchanges;
    exchanges.reserve(end - from);
    for (std::size_t i = from; i < end; ++i) exchanges.emplace_back(inquiries[i], answers[i]);
    waitFor(exchanges, timeout);
  }
  return answers;
}

}  // namespace zorva::dns
