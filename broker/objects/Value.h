#pragma once

// The broker's input and output as plain values: texts in UTF-8, numbers, object paths, instances. They own all that
// they hold and refer to nothing in a provider or a request. Their only pointers are into the class repository, which
// outlives them. No locking: a const value may be read by any number of threads.

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>
#include <utility>
#include <variant>
#include <vector>

#include "schema/ClassRepository.h"

namespace zorva::broker {

struct ObjectPath;
struct Instance;

/// A T on the heap that is copied, compared and moved like the T itself. It lets a value contain its own kind. Never
/// empty, except after a move; then it may only be assigned to or destroyed.
template <typename T>
class Boxed {
 public:
  Boxed() : value_(std::make_unique<T>()) {}
  Boxed(T value) : value_(std::make_unique<T>(std::move(value))) {}  // NOLINT(google-explicit-constructor)
  Boxed(const Boxed& other) : value_(std::make_unique<T>(*other.value_)) {}
  Boxed(Boxed&&) noexcept = default;
  Boxed& operator=(const Boxed& other) {
    if (this != &other) value_ = std::make_unique<T>(*other.value_);
    return *this;
  }
  Boxed& operator=(Boxed&&) noexcept = default;
  ~Boxed() = default;

  T& operator*() noexcept { return *value_; }
  const T& operator*() const noexcept { return *value_; }
  T* operator->() noexcept { return value_.get(); }
  const T* operator->() const noexcept { return value_.get(); }
  bool operator==(const Boxed& other) const { return *value_ == *other.value_; }

 private:
  std::unique_ptr<T> value_;
};

/// One value without its type: std::monostate is null; unsigned types hold std::uint64_t, signed ones std::int64_t,
/// both real types double; strings and date-times (25 characters, DSP0004 5.2.4) std::string; a reference an
/// ObjectPath; an embedded object (declared as a string) an Instance.
using Scalar = std::variant<std::monostate, bool, std::uint64_t, std::int64_t, double, char16_t, std::string,
                            Boxed<ObjectPath>, Boxed<Instance>>;

/// A value with its CIM type.
struct Value {
  schema::Type type = schema::Type::String;
  bool isArray = false;
  bool isNull = true;            ///< no value at all; of an array: no array, which is not the empty one
  Scalar scalar;                 ///< where isArray is false
  std::vector<Scalar> elements;  ///< where isArray is true; a null element is std::monostate

  static Value null(schema::Type type, bool array = false);
  static Value text(std::string text);
  static Value boolean(bool value);
  static Value unsignedNumber(std::uint64_t number, schema::Type type = schema::Type::Uint64);
  static Value signedNumber(std::int64_t number, schema::Type type = schema::Type::Sint64);
  static Value reference(ObjectPath path);
  static Value array(schema::Type type, std::vector<Scalar> elements);
  static Value textArray(const std::vector<std::string>& texts);

  /// The text of a string or date-time; empty for all else.
  std::string_view asText() const noexcept;

  bool operator==(const Value&) const = default;
};

/// True if the two are the same once they are set: null, the empty text and the list without texts are equal, and
/// elements without text do not count. A setting cannot store such differences.
bool hasSameEffect(const Value& a, const Value& b);

/// A value with its name: a key of a path, or a parameter of a method.
struct NamedValue {
  std::string name;
  Value value;

  bool operator==(const NamedValue&) const = default;
};

/// The name of an instance. An empty text means that the part is not given.
struct ObjectPath {
  std::string host;
  std::string nameSpace;
  std::string className;
  std::vector<NamedValue> keys;

  /// The value of a key, its name in any case; null if the path has no such key.
  const Value* key(std::string_view name) const noexcept;

  bool operator==(const ObjectPath&) const = default;
};

/// A property of an instance.
struct Property {
  std::string name;
  Value value;
  const schema::ClassProperty* declaration = nullptr;  ///< set in results of the broker; not needed in its arguments

  bool operator==(const Property& other) const { return name == other.name && value == other.value; }
};

/// An instance. In results of the broker it has every property of its class, except those that a property list leaves
/// out: first the properties that were set, in the order in which they were set, then the others as null.
struct Instance {
  ObjectPath path;  ///< its class and, in results of the broker, its name
  std::vector<Property> properties;
  const schema::Class* declaration = nullptr;  ///< set in results of the broker

  /// The value of a property, its name in any case; null if the instance has no such property.
  const Value* property(std::string_view name) const noexcept;

  bool operator==(const Instance& other) const { return path == other.path && properties == other.properties; }
};

/// How an operation ended.
struct Status {
  int rc = 0;           ///< 0, a CIM status code (DSP0200 5.2.4: 1 to 17), or a CMPI code that CIM lacks (50 and above)
  std::string message;  ///< for a person; may be empty

  bool ok() const noexcept { return rc == 0; }
};

/// The name of a status code as the standards spell it ("CIM_ERR_NOT_FOUND", "CMPI_RC_ERR_INVALID_HANDLE").
std::string_view statusName(int rc) noexcept;

}  // namespace zorva::broker
