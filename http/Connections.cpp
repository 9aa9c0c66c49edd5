#include "http/Connections.h"

#include <poll.h>
#include <sys/socket.h>

#include <algorithm>
#include <utility>

#include "http/Log.h"

namespace zorva::http {

namespace {

using std::chrono::milliseconds;

constexpr milliseconds kBeforeLook{500};

std::uint64_t nowMilliseconds() {
  const auto now = std::chrono::steady_clock::now().time_since_epoch();
  return static_cast<std::uint64_t>(std::chrono::duration_cast<milliseconds>(now).count());
}

std::string seconds(milliseconds time) {
  const auto tenths = time.count() / 100;
  return std::to_string(tenths / 10) + (tenths % 10 == 0 ? "" : "." + std::to_string(tenths % 10)) + " s";
}

/// Why a connection in that phase must end; empty if it need not.
std::string overdue(Phase phase, milliseconds time, const HttpLimits& limits) {
  switch (phase) {
    case Phase::Idle:
      return time > limits.idle ? "sent no request for " + seconds(limits.idle) : "";
    case Phase::Arriving:
      return time > limits.arrival ? "its request did not arrive within " + seconds(limits.arrival) : "";
    case Phase::Sending:
      return time > limits.client ? "took nothing of its response for " + seconds(limits.client) : "";
    case Phase::Working:
      break;
  }
  return {};
}

/// If a connection ends together with its last bytes, the HTTP library is not notified again and waits for more.
bool hasHungUp(int socket) {
  pollfd look{socket, POLLRDHUP, 0};
  return ::poll(&look, 1, 0) > 0;
}

}  // namespace

Connection::Connection(int socket, std::string peer, std::string client, access::Origin origin)
    : peer_(std::move(peer)), client_(std::move(client)), origin_(std::move(origin)), state_(0), socket_(socket) {
  enter(Phase::Arriving);
}

void Connection::enter(Phase phase) noexcept {
  state_.store(nowMilliseconds() << 2 | static_cast<std::uint64_t>(phase), std::memory_order_relaxed);
}

milliseconds Connection::inPhase() const noexcept {
  const std::uint64_t since = state_.load(std::memory_order_relaxed) >> 2;
  const std::uint64_t now = nowMilliseconds();
  return milliseconds(now > since ? now - since : 0);
}

std::shared_ptr<Connection> Connections::add(int socket, std::string peer, std::string client, access::Origin origin) {
  auto connection = std::make_shared<Connection>(socket, std::move(peer), std::move(client), std::move(origin));
  const std::lock_guard lock(mutex_);
  connection->place_ = connections_.size();
  connections_.push_back(connection);
  return connection;
}

std::shared_ptr<Connection> Connections::find(int socket) const {
  const std::lock_guard lock(mutex_);
  // Searched from the end: the connection was added a moment ago.
  const auto found = std::find_if(connections_.rbegin(), connections_.rend(),
                                  [&](const auto& each) { return each->socket_ == socket; });
  return found == connections_.rend() ? nullptr : *found;
}

void Connections::remove(Connection& connection) {
  const std::lock_guard lock(mutex_);
  if (connection.socket_ == -1) return;
  connection.socket_ = -1;
  if (connection.isCut_) --cut_;
  const std::size_t place = connection.place_;
  connections_.back()->place_ = place;
  std::swap(connections_[place], connections_.back());
  connections_.pop_back();
}

std::size_t Connections::count() const {
  const std::lock_guard lock(mutex_);
  return connections_.size() - cut_;
}

std::size_t Connections::countIn(Phase phase) const {
  const std::lock_guard lock(mutex_);
  return static_cast<std::size_t>(std::count_if(connections_.begin(), connections_.end(), [&](const auto& each) {
    return !each->isCut_ && each->phase() == phase;
  }));
}

void Connections::sweep(const HttpLimits& limits) {
  const std::lock_guard lock(mutex_);
  const std::uint64_t now = nowMilliseconds();
  for (const auto& each : connections_) {
    const std::uint64_t state = each->state_.load(std::memory_order_relaxed);
    const std::uint64_t since = state >> 2;
    const auto time = milliseconds(now > since ? now - since : 0);
    const auto phase = static_cast<Phase>(state & 3);
    const std::string why = overdue(phase, time, limits);
    if (!why.empty()) {
      cutLocked(*each, why);
    } else if ((phase == Phase::Idle || phase == Phase::Arriving) && time > kBeforeLook && hasHungUp(each->socket_)) {
      cutLocked(*each, {});
    }
  }
}

bool Connections::cutIdlest() {
  const std::lock_guard lock(mutex_);
  Connection* idlest = nullptr;
  for (const auto& each : connections_) {
    const Phase phase = each->phase();
    if (each->isCut_ || (phase != Phase::Idle && phase != Phase::Arriving)) continue;
    const auto rank = [](const Connection& one) { return std::pair(!one.isProven(), one.inPhase()); };
    if (idlest == nullptr || rank(*each) > rank(*idlest)) idlest = each.get();
  }
  if (idlest == nullptr) return false;
  cutLocked(*idlest, "gave way to another, since all connections are taken");
  return true;
}

void Connections::cutSlowestBody() {
  const std::lock_guard lock(mutex_);
  Connection* slowest = nullptr;
  for (const auto& each : connections_) {
    if (each->isCut_ || each->phase() != Phase::Arriving || each->held() == 0) continue;
    if (slowest == nullptr || each->inPhase() > slowest->inPhase()) slowest = each.get();
  }
  if (slowest != nullptr) cutLocked(*slowest, "gave way to others, since unfinished requests take too much memory");
}

void Connections::cut(Connection& connection, const std::string& why) {
  const std::lock_guard lock(mutex_);
  cutLocked(connection, why);
}

void Connections::cutLocked(Connection& connection, const std::string& why) {
  if (connection.isCut_ || connection.socket_ == -1) return;
  connection.isCut_ = true;
  ++cut_;
  ::shutdown(connection.socket_, SHUT_RDWR);
  if (why.empty()) return;
  ZORVA_LOG_CLIENT(Warning, connection.peer() + ": " + why + "; cut off");
}

}  // namespace zorva::http
