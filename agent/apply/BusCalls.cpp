#include "agent/apply/BusCalls.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstring>
#include <string_view>
#include <utility>

#include "util/Escape.h"

namespace zorva::agent {
namespace {

using std::chrono::duration_cast;
using std::chrono::microseconds;
using std::chrono::steady_clock;

constexpr std::size_t kLongestText = 400;  // of a daemon, in a line

class BusFailure {
 public:
  BusFailure() = default;
  ~BusFailure() { ::sd_bus_error_free(&error_); }
  BusFailure(const BusFailure&) = delete;
  BusFailure& operator=(const BusFailure&) = delete;

  sd_bus_error* address() { return &error_; }
  std::string_view name() const { return error_.name == nullptr ? "" : error_.name; }
  std::string_view text() const { return error_.message == nullptr ? name() : error_.message; }

 private:
  sd_bus_error error_{};
};

microseconds leftUntil(steady_clock::time_point deadline) {
  return std::max(duration_cast<microseconds>(deadline - steady_clock::now()), microseconds(0));
}

std::string lateAnswer(const std::string& who) { return who + " does not answer in time"; }

// The daemons' words for: this needs rights that the caller does not have.
bool isLackOfRights(std::string_view name) {
  constexpr std::array<std::string_view, 5> kEnds{".AccessDenied", ".InteractiveAuthorizationRequired",
                                                  ".PermissionDenied", ".NotAuthorized", ".AuthFailed"};
  return std::any_of(kEnds.begin(), kEnds.end(), [&](std::string_view end) { return name.ends_with(end); });
}

std::string problemOf(const BusFailure& failure, int result, const SystemBus::Method& method) {
  constexpr std::array<std::string_view, 2> kAbsent{"org.freedesktop.DBus.Error.ServiceUnknown",
                                                    "org.freedesktop.DBus.Error.NameHasNoOwner"};
  const bool late = result == -ETIMEDOUT || failure.name().ends_with(".NoReply");
  if (late) return lateAnswer(method.destination);
  if (std::find(kAbsent.begin(), kAbsent.end(), failure.name()) != kAbsent.end()) {
    return method.destination + " does not run";
  }
  std::string text;
  util::appendEscaped(text, failure.text().empty() ? std::strerror(-result) : failure.text().substr(0, kLongestText));
  std::string problem = method.member + " is refused: " + text;
  if (isLackOfRights(failure.name())) problem += "; run this as root";
  return problem;
}

// Whether nothing can be called over the connection any more.
bool isLost(int result) {
  return result == -ECONNRESET || result == -ENOTCONN || result == -EPIPE || result == -ECHILD || result == -ESHUTDOWN;
}

}  // namespace

BusCalls::BusCalls(std::string socketPath, std::chrono::milliseconds longestCall)
    : socketPath_(std::move(socketPath)), longestCall_(longestCall) {}

BusCalls::~BusCalls() { close(); }

void BusCalls::close() {
  if (bus_ == nullptr) return;
  ::sd_bus_close(bus_);
  bus_ = ::sd_bus_unref(bus_);
}

// A bus that does not answer would be waited for much longer than a call.
Expected<void, std::string> BusCalls::open(Deadline deadline) {
  if (bus_ != nullptr && ::sd_bus_is_open(bus_) > 0) return {};
  close();
  util::FileDescriptor socket = connectToSocket(socketPath_);
  if (!socket) return unexpected(socketPath_ + ": the message bus cannot be reached: " + std::strerror(errno));
  int result = ::sd_bus_new(&bus_);
  if (result >= 0) result = ::sd_bus_set_fd(bus_, socket.get(), socket.get());
  if (result >= 0) {
    (void)socket.release();
    result = ::sd_bus_set_bus_client(bus_, 1);
  }
  if (result >= 0) result = ::sd_bus_start(bus_);
  while (result >= 0 && ::sd_bus_is_ready(bus_) == 0) {
    const microseconds left = leftUntil(deadline);
    if (left.count() == 0) result = -ETIMEDOUT;
    if (result >= 0) result = ::sd_bus_process(bus_, nullptr);
    if (result == 0) result = ::sd_bus_wait(bus_, static_cast<std::uint64_t>(left.count()));
  }
  if (result >= 0) return {};
  close();
  if (result == -ETIMEDOUT) return unexpected(lateAnswer("the message bus"));
  return unexpected(socketPath_ + ": the message bus cannot be reached: " + std::strerror(-result));
}

Expected<void, std::string> BusCalls::call(const SystemBus::Method& method, const Fill& fill,
                                           const std::function<void(BusReader&)>& read) {
  const Deadline deadline = steady_clock::now() + longestCall_;
  if (auto opened = open(deadline); !opened) return opened;
  sd_bus_message* made = nullptr;
  int result = ::sd_bus_message_new_method_call(bus_, &made, method.destination.c_str(), method.path.c_str(),
                                                method.interface.c_str(), method.member.c_str());
  const BusMessage question(made);
  if (result >= 0) result = ::sd_bus_message_set_auto_start(made, 0);
  if (result >= 0 && fill) result = fill(made);
  if (result < 0) return unexpected(method.member + " cannot be called: " + std::strerror(-result));
  try {
    const BusMessage answer = answerOf(made, method, deadline);
    BusReader reader(answer.get());
    if (read) read(reader);
    return {};
  } catch (const BusError& error) {
    return unexpected(std::string(error.what()));
  }
}

// Throws BusError where there is none.
BusMessage BusCalls::answerOf(sd_bus_message* question, const SystemBus::Method& method, Deadline deadline) {
  // 0 would be the usual timeout.
  const auto left = static_cast<std::uint64_t>(std::max(leftUntil(deadline), microseconds(1)).count());
  BusFailure failure;
  sd_bus_message* answer = nullptr;
  const int result = ::sd_bus_call(bus_, question, left, failure.address(), &answer);
  if (result >= 0) return BusMessage(answer);
  if (isLost(result)) close();
  throw BusError(problemOf(failure, result, method));
}

}  // namespace zorva::agent
