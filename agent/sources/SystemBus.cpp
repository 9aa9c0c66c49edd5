#include "agent/sources/SystemBus.h"

#include <poll.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <utility>

namespace zorva::agent {
namespace {

// Handled at one look; the rest stays for the next one.
constexpr int kMostMessages = 4096;

[[noreturn]] void fail(const char* what, int result) {
  throw BusError(std::string(what) + " cannot be read: " + std::strerror(-result));
}

template <typename Number>
Number basic(sd_bus_message* message, char type) {
  Number number{};
  const int result = ::sd_bus_message_read_basic(message, type, &number);
  if (result <= 0) fail("a value", result);
  return number;
}

}  // namespace

std::string BusReader::text() {
  char type = 0;
  const int result = ::sd_bus_message_peek_type(message_, &type, nullptr);
  if (result <= 0) fail("a text", result);
  if (type != SD_BUS_TYPE_STRING && type != SD_BUS_TYPE_OBJECT_PATH && type != SD_BUS_TYPE_SIGNATURE) {
    fail("a text", -EBADMSG);
  }
  return basic<const char*>(message_, type);
}

bool BusReader::flag() { return basic<int>(message_, SD_BUS_TYPE_BOOLEAN) != 0; }

std::int32_t BusReader::signedNumber() { return basic<std::int32_t>(message_, SD_BUS_TYPE_INT32); }

std::uint32_t BusReader::number() { return basic<std::uint32_t>(message_, SD_BUS_TYPE_UINT32); }

std::uint16_t BusReader::port() { return basic<std::uint16_t>(message_, SD_BUS_TYPE_UINT16); }

std::vector<unsigned char> BusReader::bytes() {
  const void* begin = nullptr;
  std::size_t size = 0;
  const int result = ::sd_bus_message_read_array(message_, SD_BUS_TYPE_BYTE, &begin, &size);
  if (result < 0) fail("an address", result);
  const auto* first = static_cast<const unsigned char*>(begin);
  return size == 0 ? std::vector<unsigned char>() : std::vector<unsigned char>(first, first + size);
}

void BusReader::skip() {
  const int result = ::sd_bus_message_skip(message_, nullptr);
  if (result < 0) fail("a value", result);
}

void BusReader::enter(char type, const char* contents) {
  const int result = ::sd_bus_message_enter_container(message_, type, contents);
  if (result <= 0) fail(contents, result);
}

void BusReader::leave() {
  const int result = ::sd_bus_message_exit_container(message_);
  if (result < 0) fail("a container", result);
}

bool BusReader::atEnd() {
  const int result = ::sd_bus_message_at_end(message_, 0);
  if (result < 0) fail("an array", result);
  return result > 0;
}

bool BusReader::holdsVariant(const char* contents) {
  char type = 0;
  const char* held = nullptr;
  const int result = ::sd_bus_message_peek_type(message_, &type, &held);
  if (result < 0) fail("a variant", result);
  return type == SD_BUS_TYPE_VARIANT && held != nullptr && std::strcmp(held, contents) == 0;
}

class SystemBus::Subscription {
 public:
  Subscription(SystemBus& owner, Handler called) : bus(&owner), handler(std::move(called)) {}
  ~Subscription() { ::sd_bus_slot_unref(slot); }
  Subscription(const Subscription&) = delete;
  Subscription& operator=(const Subscription&) = delete;

  SystemBus* bus;
  Handler handler;
  sd_bus_slot* slot = nullptr;
};

void SystemBus::DropSubscription::operator()(Subscription* subscription) const { delete subscription; }

bool SystemBus::open() {
  if (bus_ != nullptr) return true;
  util::FileDescriptor socket = connectToSocket(socketPath_);
  refused_ = !socket && (errno == ECONNREFUSED || errno == EAGAIN);
  if (!socket || ::sd_bus_new(&bus_) < 0) return false;
  hasMore_ = true;
  if (::sd_bus_set_fd(bus_, socket.get(), socket.get()) >= 0) {
    descriptor_ = socket.release();
    if (::sd_bus_set_bus_client(bus_, 1) >= 0 && ::sd_bus_start(bus_) >= 0) return true;
  }
  close();
  return false;
}

// In a forked process sd-bus leaves the connection alone and closes the descriptor, which is what is wanted.
void SystemBus::close() {
  if (bus_ == nullptr) return;
  ::sd_bus_close(bus_);
  bus_ = ::sd_bus_unref(bus_);
  descriptor_ = -1;
}

SystemBus::Handle SystemBus::listen(const std::string& rule, Handler handler) {
  Handle handle(new Subscription(*this, std::move(handler)));
  ::sd_bus_add_match_async(bus_, &handle->slot, rule.c_str(), &SystemBus::handleMessage, &SystemBus::ignoreAnswer,
                           handle.get());
  hasMore_ = true;
  return handle;
}

SystemBus::Handle SystemBus::call(const Method& method, const std::vector<std::string>& arguments, Handler handler) {
  Handle handle(new Subscription(*this, std::move(handler)));
  sd_bus_message* made = nullptr;
  int result = ::sd_bus_message_new_method_call(bus_, &made, method.destination.c_str(), method.path.c_str(),
                                                method.interface.c_str(), method.member.c_str());
  const BusMessage message(made);
  if (result >= 0) result = ::sd_bus_message_set_auto_start(made, 0);
  for (const std::string& argument : arguments) {
    if (result >= 0) result = ::sd_bus_message_append_basic(made, SD_BUS_TYPE_STRING, argument.c_str());
  }
  constexpr std::uint64_t kForEver = UINT64_MAX;
  if (result >= 0) {
    result = ::sd_bus_call_async(bus_, &handle->slot, made, &SystemBus::handleMessage, handle.get(), kForEver);
  }
  hasMore_ = true;
  if (result < 0) throw BusError(method.member + " cannot be called: " + std::strerror(-result));
  return handle;
}

// No exception may pass through sd-bus, which is C.
int SystemBus::handleMessage(sd_bus_message* message, void* subscription, sd_bus_error*) {
  auto& [bus, handler, slot] = *static_cast<Subscription*>(subscription);
  try {
    const sd_bus_error* error = ::sd_bus_message_get_error(message);
    if (error != nullptr) {
      handler(nullptr, error->name == nullptr ? "" : error->name);
    } else {
      handler(message, {});
    }
  } catch (...) {
    bus->thrown_ = std::current_exception();
  }
  return 0;
}

// Without the signals of a rule that the bus refuses the rest still works.
int SystemBus::ignoreAnswer(sd_bus_message*, void*, sd_bus_error*) { return 0; }

bool SystemBus::hasArrived() const {
  char ignored = 0;
  return ::recv(descriptor_, &ignored, sizeof ignored, MSG_PEEK | MSG_DONTWAIT) >= 0 ||
         (errno != EAGAIN && errno != EWOULDBLOCK);
}

bool SystemBus::handleArrived() {
  if (!hasMore_ && !hasArrived()) return true;
  int result = 1;
  for (int messages = 0; result > 0 && messages < kMostMessages; ++messages) {
    result = ::sd_bus_process(bus_, nullptr);
    if (thrown_ != nullptr) std::rethrow_exception(std::exchange(thrown_, nullptr));
  }
  hasMore_ = result > 0 || (::sd_bus_get_events(bus_) & POLLOUT) != 0;
  return result >= 0;
}

short SystemBus::events() const { return static_cast<short>(::sd_bus_get_events(bus_)); }

void SystemBus::wait(std::chrono::microseconds longest) {
  ::sd_bus_wait(bus_, static_cast<std::uint64_t>(longest.count()));
}

util::FileDescriptor connectToSocket(const std::string& path) {
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  errno = ENAMETOOLONG;
  if (path.size() >= sizeof address.sun_path) return {};
  path.copy(address.sun_path, path.size());
  util::FileDescriptor socket(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0));
  if (!socket || ::connect(socket.get(), reinterpret_cast<const sockaddr*>(&address), sizeof address) == 0) {
    return socket;
  }
  const int error = errno;
  socket.reset();
  errno = error;
  return {};
}

std::string senderOf(sd_bus_message* message) {
  const char* sender = ::sd_bus_message_get_sender(message);
  return sender == nullptr ? "" : sender;
}

}  // namespace zorva::agent
