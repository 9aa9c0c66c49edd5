#pragma once

// An object of a daemon on the system's bus, to be read and changed by calls that wait.

#include <cstdint>
#include <functional>
#include <string>
#include <vector>

#include "agent/apply/BusCalls.h"
#include "agent/sources/SystemBus.h"

namespace zorva::agent {

/// Writes values to a message one after another. The first failure is kept; nothing is written after it.
class BusWriter {
 public:
  explicit BusWriter(sd_bus_message* message) : message_(message) {}

  void text(const std::string& value) { basic(SD_BUS_TYPE_STRING, value.c_str()); }
  void flag(bool value);
  void signedNumber(std::int32_t value) { basic(SD_BUS_TYPE_INT32, &value); }
  void number(std::uint32_t value) { basic(SD_BUS_TYPE_UINT32, &value); }
  void longNumber(std::uint64_t value) { basic(SD_BUS_TYPE_UINT64, &value); }
  void port(std::uint16_t value) { basic(SD_BUS_TYPE_UINT16, &value); }
  void bytes(const std::vector<unsigned char>& value);

  /// The value that a reader comes to next, of whatever type.
  void copy(BusReader& reader) { keep(reader.copyTo(message_)); }

  /// Writes what fill writes into an array, a structure, an entry of a dictionary or a variant of these contents.
  template <typename Fill>
  void array(const char* contents, Fill fill) {
    in(SD_BUS_TYPE_ARRAY, contents, fill);
  }
  template <typename Fill>
  void structure(const char* contents, Fill fill) {
    in(SD_BUS_TYPE_STRUCT, contents, fill);
  }
  template <typename Fill>
  void entry(const char* contents, Fill fill) {
    in(SD_BUS_TYPE_DICT_ENTRY, contents, fill);
  }
  template <typename Fill>
  void variant(const char* contents, Fill fill) {
    in(SD_BUS_TYPE_VARIANT, contents, fill);
  }

  /// Negative after a failure.
  int result() const { return result_; }

 private:
  void keep(int result);
  void basic(char type, const void* value);

  template <typename Fill>
  void in(char type, const char* contents, Fill fill) {
    if (result_ >= 0) keep(::sd_bus_message_open_container(message_, type, contents));
    if (result_ < 0) return;
    fill();
    if (result_ >= 0) keep(::sd_bus_message_close_container(message_));
  }

  sd_bus_message* message_;
  int result_ = 0;
};

/// Errors are those of BusCalls::call().
class BusObject {
 public:
  BusObject(BusCalls& bus, std::string daemon, std::string path)
      : bus_(&bus), daemon_(std::move(daemon)), path_(std::move(path)) {}

  using Fill = std::function<void(BusWriter&)>;
  using Read = std::function<void(BusReader&)>;
  Expected<void, std::string> call(const std::string& interface, const std::string& member, const Fill& fill = {},
                                   const Read& read = {}) const;

  /// Calls each with the name of every property of an interface; each reads the value as in BusReader::forEachProperty.
  using Each = std::function<void(BusReader& reader, const std::string& name)>;
  Expected<void, std::string> readProperties(const std::string& interface, const Each& each) const;

 private:
  BusCalls* bus_;
  std::string daemon_;
  std::string path_;
};

}  // namespace zorva::agent
