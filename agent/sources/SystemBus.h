#pragma once

// The system's message bus (D-Bus), by sd-bus of libsystemd.

#include <systemd/sd-bus.h>

#include <chrono>
#include <cstdint>
#include <exception>
#include <functional>
#include <list>
#include <memory>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "util/FileDescriptor.h"

namespace zorva::agent {

/// A message has other contents than its sender promises.
class BusError : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

struct DropBusMessage {
  void operator()(sd_bus_message* message) const { ::sd_bus_message_unref(message); }
};
using BusMessage = std::unique_ptr<sd_bus_message, DropBusMessage>;

/// Reads the values of a message one after another. Throws BusError where a value is of another type than asked for.
class BusReader {
 public:
  explicit BusReader(sd_bus_message* message) : message_(message) {}

  std::string text();  ///< a string, an object path or a signature
  bool flag();
  std::int32_t signedNumber();
  std::uint32_t number();
  std::uint16_t port();
  std::vector<unsigned char> bytes();

  /// Passes over one value.
  void skip();

  /// Appends one value, of whatever type, to a message that is being written. Negative where that fails.
  int copyTo(sd_bus_message* other) { return ::sd_bus_message_copy(other, message_, 0); }

  /// Reads an array: calls each for every element, which must read it whole.
  template <typename Each>
  void forEach(const char* contents, Each each) {
    enter(SD_BUS_TYPE_ARRAY, contents);
    while (!atEnd()) each();
    leave();
  }

  /// The same for an array of structures or of dictionary entries; contents are those of one.
  template <typename Each>
  void forEachStructure(const std::string& contents, Each each) {
    forEachIn(SD_BUS_TYPE_STRUCT, '(' + contents + ')', contents, each);
  }
  template <typename Each>
  void forEachEntry(const std::string& contents, Each each) {
    forEachIn(SD_BUS_TYPE_DICT_ENTRY, '{' + contents + '}', contents, each);
  }

  /// Reads a structure of these contents: calls read, which must read it whole.
  template <typename Read>
  void structure(const char* contents, Read read) {
    enter(SD_BUS_TYPE_STRUCT, contents);
    read();
    leave();
  }

  /// Reads a dictionary of properties: calls each with the name; each reads the value by ifVariant or leaves it alone.
  template <typename Each>
  void forEachProperty(Each each) {
    forEachEntry("sv", [&] {
      const std::string name = text();
      variantIsRead_ = false;
      each(name);
      if (!variantIsRead_) skip();
    });
  }

  /// Calls read where the value that comes next is a variant of that type.
  template <typename Read>
  void ifVariant(const char* contents, Read read) {
    if (!holdsVariant(contents)) return;
    enter(SD_BUS_TYPE_VARIANT, contents);
    read();
    leave();
    variantIsRead_ = true;
  }
  void ifText(std::string& value) {
    ifVariant("s", [&] { value = text(); });
  }
  void ifPath(std::string& value) {
    ifVariant("o", [&] { value = text(); });
  }

 private:
  void enter(char type, const char* contents);
  void leave();
  bool atEnd();
  bool holdsVariant(const char* contents);

  template <typename Each>
  void forEachIn(char type, const std::string& element, const std::string& contents, Each each) {
    forEach(element.c_str(), [&] {
      enter(type, contents.c_str());
      each();
      leave();
    });
  }

  sd_bus_message* message_;
  bool variantIsRead_ = false;
};

/// A connection to the bus. Nothing waits but wait(). Belongs to one thread at a time and to one process: a forked one
/// calls close() first.
class SystemBus {
 public:
  /// Gets the message; of a call that failed, null and the error's name.
  using Handler = std::function<void(sd_bus_message* message, const std::string& error)>;

  /// What a handler is kept in: it is not called any more once this is gone.
  class Subscription;
  struct DropSubscription {
    void operator()(Subscription* subscription) const;
  };
  using Handle = std::unique_ptr<Subscription, DropSubscription>;

  struct Method {
    std::string destination;
    std::string path;
    std::string interface;
    std::string member;
  };

  explicit SystemBus(std::string socketPath) : socketPath_(std::move(socketPath)) {}
  ~SystemBus() { close(); }
  SystemBus(const SystemBus&) = delete;
  SystemBus& operator=(const SystemBus&) = delete;

  /// Connects, unless it is connected. False where there is no bus at present. The bus's own answer comes later: what
  /// is sent before it waits its turn.
  bool open();
  bool isOpen() const { return bus_ != nullptr; }

  /// Whether the last attempt to connect found a socket that nobody answers on.
  bool wasRefused() const { return refused_; }

  /// Handles of this connection must be gone before.
  void close();

  /// Asks the bus for the signals of a match rule.
  Handle listen(const std::string& rule, Handler handler);

  /// Calls a method with texts as arguments; never starts a service for it. The answer may come at any later time.
  Handle call(const Method& method, const std::vector<std::string>& arguments, Handler handler);

  /// Calls the handlers of what has arrived. False where the connection is broken; close() is what remains then. What a
  /// handler throws comes out here.
  bool handleArrived();

  /// What to wait for in poll(2), unless there is more to do at once.
  int descriptor() const { return descriptor_; }
  short events() const;
  bool hasMore() const { return hasMore_; }

  /// Waits until something has arrived, at most so long.
  void wait(std::chrono::microseconds longest);

 private:
  static int handleMessage(sd_bus_message* message, void* subscription, sd_bus_error* error);
  static int ignoreAnswer(sd_bus_message* message, void* subscription, sd_bus_error* error);
  bool hasArrived() const;

  std::string socketPath_;
  sd_bus* bus_ = nullptr;
  int descriptor_ = -1;
  bool refused_ = false;
  bool hasMore_ = true;  ///< to do, whether or not anything arrives
  std::exception_ptr thrown_;
};

/// The owner of a signal or an answer.
std::string senderOf(sd_bus_message* message);

/// Connects to a socket in the file system without waiting. None, with errno, if that fails.
util::FileDescriptor connectToSocket(const std::string& path);

}  // namespace zorva::agent
