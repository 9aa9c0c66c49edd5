#pragma once

// CIM values, object paths and instances as plain records: the input of tests to a provider, and its output. They
// contain no CMPI object, so they outlive their broker.

#include <cmpidt.h>

#include <cstdint>
#include <initializer_list>
#include <memory>
#include <optional>
#include <ostream>
#include <string>
#include <string_view>
#include <utility>
#include <variant>
#include <vector>

namespace ZV::Test {

struct Path;
struct Instance;

/// One value with its CMPI type. A value without content is null; a null array element is one, too. Numbers and
/// booleans have their full width.
struct Value {
  using Content = std::variant<std::monostate, std::uint64_t, std::int64_t, double, std::string, std::vector<Value>,
                               std::shared_ptr<const Path>, std::shared_ptr<const Instance>>;

  CMPIType type = CMPI_null;
  CMPIValueState state = CMPI_goodValue;  ///< a null value has CMPI_nullValue, or the state it was made with
  Content content;

  bool isNull() const { return std::holds_alternative<std::monostate>(content); }

  /// The content as one kind of C++ value. If it is of another kind: an empty text, 0, no elements, a path without
  /// class; so that a comparison in a test fails and nothing throws.
  std::string text() const;
  std::uint64_t number() const;
  std::vector<Value> elements() const;
  std::vector<std::string> texts() const;  ///< the elements as texts
  Path path() const;
};

using NamedValue = std::pair<std::string, Value>;

/// Names match without regard to case, as in CIM. Null if there is no such name.
const Value* findValue(const std::vector<NamedValue>& values, std::string_view name);
/// Replaces the value of that name, or appends it.
void putValue(std::vector<NamedValue>& values, std::string_view name, Value value);
bool sameName(std::string_view left, std::string_view right);

struct Path {
  std::string host;
  std::string nameSpace;
  std::string className;
  std::vector<NamedValue> keys;  ///< in the order in which they were added

  Path() = default;
  explicit Path(std::string name, std::string space = "root/cimv2");

  /// The same path with one more key, or with another value for it. A text becomes CMPI_string, as in servers.
  Path key(std::string_view name, Value value) const;
  Path key(std::string_view name, const char* text) const;
  Path on(std::string hostName) const;
  Path in(std::string space) const;

  /// The value of a key; null if the path lacks it.
  Value operator[](std::string_view name) const;
};

struct Instance {
  Path path;                           ///< class and namespace, and the keys that a client would see
  std::vector<NamedValue> properties;  ///< in the order in which they were first set

  Instance() = default;
  explicit Instance(std::string className, std::string space = "root/cimv2");

  /// The same instance with one more property, or with another value for it. A text becomes CMPI_string.
  Instance with(std::string_view name, Value value) const;
  Instance with(std::string_view name, const char* text) const;

  /// The value of a property; null if the instance lacks it.
  Value operator[](std::string_view name) const;
  bool has(std::string_view name) const { return findValue(properties, name) != nullptr; }
  std::vector<std::string> names() const;  ///< of the properties, in order
};

bool operator==(const Value& left, const Value& right);
bool operator==(const Path& left, const Path& right);
bool operator==(const Instance& left, const Instance& right);

/// Values by CMPI type.
Value chars(std::string text);  ///< CMPI_chars: the type with which a provider sets a text
Value text(std::string text);   ///< CMPI_string: the type that a broker returns
Value uint8(std::uint8_t number);
Value uint16(std::uint16_t number);
Value uint32(std::uint32_t number);
Value uint64(std::uint64_t number);
Value sint32(std::int32_t number);
Value boolean(bool value);
Value ref(Path path);
Value texts(std::vector<std::string> elements);  ///< CMPI_stringA
Value uint16s(std::vector<std::uint16_t> elements);
Value list(CMPIType arrayType, std::vector<Value> elements);
Value null(CMPIType type = CMPI_null, CMPIValueState state = CMPI_nullValue);

/// A value as `chars "eth0"`, `uint16 2`, `string[] {"a", null}`, `ref ZORVA_X.Name="eth0"`, `null`.
std::string describe(const Value& value);
/// A path as `ZORVA_X.Name="eth0",SystemName="host1"`, with keys in order and a reference in parentheses.
std::string describe(const Path& path);
/// The same with host and namespace in front: `//host1/root/cimv2:ZORVA_X.Name="eth0"`.
std::string describeWhole(const Path& path);
/// An instance as its class and one line `  Name = chars "eth0"` for each property, in order.
std::string describe(const Instance& instance);
std::string nameOfType(CMPIType type);

/// The text in double quotes with control characters, quotes and backslashes escaped; long texts are cut and their
/// length is written. Null is the word null.
std::string inQuotes(std::string_view text);
std::string inQuotesOrNull(const char* text);
/// A list of names that ends with a null, as `{"a", "b"}`; the word null for none.
std::string listInQuotes(const char* const* names);

std::ostream& operator<<(std::ostream& out, const Value& value);
std::ostream& operator<<(std::ostream& out, const Path& path);
std::ostream& operator<<(std::ostream& out, const Instance& instance);

}  // namespace ZV::Test
