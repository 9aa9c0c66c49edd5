#pragma once

// The objects of the recording broker, and the functions that their tables share.

#include <cmpift.h>

#include <cstddef>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "tests/support/CimValues.h"
#include "tests/support/RecordingBroker.h"

namespace ZV::Test {

/// The part of every object besides its CMPI face. The face's hdl points at this, and is null in an object that was
/// made without a handle; the table finds the object by the face itself, which is a base of it.
struct BrokerObject {
  virtual ~BrokerObject() = default;
  RecordingBroker* broker = nullptr;
  std::string label;
};

struct PathObject : BrokerObject, CMPIObjectPath {
  Path path;
};

struct InstanceObject : BrokerObject, CMPIInstance {
  Instance instance;
  bool isFiltered = false;                             ///< setPropertyFilter gave a list
  std::vector<std::string> wanted;                     ///< the list
  std::optional<std::vector<std::string>> filterKeys;  ///< its key list
};

struct StringObject : BrokerObject, CMPIString {
  std::string text;
};

struct ArrayObject : BrokerObject, CMPIArray {
  CMPIType elementType = CMPI_null;
  std::vector<Value> elements;
};

struct EnumerationObject : BrokerObject, CMPIEnumeration {
  std::vector<Value> elements;
  std::size_t next = 0;
};

struct ResultObject : BrokerObject, CMPIResult {
  Results results;
};

struct ContextObject : BrokerObject, CMPIContext {
  std::vector<NamedValue> entries;
};

struct ArgsObject : BrokerObject, CMPIArgs {
  std::vector<NamedValue> arguments;
};

struct DateTimeObject : BrokerObject, CMPIDateTime {
  std::string text;  ///< 25 characters in the format of DSP0004
};

/// The tables of the objects, shared by all recording brokers.
struct ObjectTables {
  static CMPIObjectPathFT path;
  static CMPIInstanceFT instance;
  static CMPIStringFT string;
  static CMPIArrayFT array;
  static CMPIEnumerationFT enumeration;
  static CMPIResultFT result;
  static CMPIContextFT context;
  static CMPIArgsFT args;
  static CMPIDateTimeFT dateTime;

  /// Convert values from and to the CMPI form. A value comes in as tables take it: a pointer to the variable that has
  /// it, but for CMPI_chars the text itself. It goes out with texts as CMPI_string.
  static Value valueOf(const CMPIValue* value, CMPIType type);
  static CMPIData dataOf(RecordingBroker* broker, const Value& value);
  /// The value as a call line shows it: a path or an instance by its name, all else by content.
  static std::string argument(const CMPIValue* value, CMPIType type);

  /// The object of a face; null if it is null or another broker's.
  static PathObject* own(const CMPIObjectPath* face);
  static InstanceObject* own(const CMPIInstance* face);
  static StringObject* own(const CMPIString* face);
  static ArrayObject* own(const CMPIArray* face);
  static ResultObject* own(const CMPIResult* face);
  static ContextObject* own(const CMPIContext* face);
  static ArgsObject* own(const CMPIArgs* face);
  static DateTimeObject* own(const CMPIDateTime* face);

  /// The content of an object, read through its own table if it is another broker's.
  static Path pathOf(const CMPIObjectPath* face);
  static Instance instanceOf(const CMPIInstance* face);
  static std::string textOf(const CMPIString* face);

  /// An object's name in a call line; "null" for none, and a special word if its handle is null.
  static std::string nameOf(const CMPIObjectPath* face);
  static std::string nameOf(const CMPIInstance* face);
  static std::string nameOf(const CMPIContext* face);

  static Path pathOfInstance(const InstanceObject& object);
};

/// One call to an object or to the broker. Its constructor records it; its members end it, with a failure if the test
/// asked for one.
struct Call {
  /// A call of an object's slot.
  template <typename Object>
  Call(const Object* object, const char* name, const std::string& arguments)
      : Call(object->broker, name, object->label + (object->hdl == nullptr ? "(no handle)." : ".") + name, arguments) {
    hasHandle = object->hdl != nullptr;
  }
  /// A call of a slot that is shown without an object.
  Call(RecordingBroker* recorder, const char* name, const std::string& shownName, const std::string& arguments);

  /// Whether the call does nothing: it fails by an rc alone, or the handle is null.
  bool refused() const { return !hasHandle || failure.has_value(); }
  /// Ends a call that returns a status: the failure's status if it is refused, else the argument.
  CMPIStatus status(CMPIrc rc = CMPI_RC_OK) const;
  /// End calls that return something and write a status. make makes the object; it is not called if null is returned.
  template <typename Maker>
  auto give(const Maker& make, CMPIStatus* rc) const -> decltype(make());
  /// Returns what another provider serves, with the failures that the test asked for.
  template <typename Maker>
  auto giveServed(const ServedClass& served, const Maker& make, CMPIStatus* rc) const -> decltype(make());
  /// Returns null with a status, even if another failure was asked for.
  std::nullptr_t giveNull(CMPIStatus* rc, CMPIrc code) const;
  /// added is added to the state of a value that is not null.
  CMPIData giveData(const Value& value, CMPIStatus* rc, CMPIValueState added = CMPI_goodValue) const;
  CMPIData giveMissing(const Missing& missing, CMPIStatus* rc) const;
  template <typename Number>
  Number giveNumber(Number number, CMPIStatus* rc) const;
  const char* giveText(const char* text, CMPIStatus* rc) const;

  RecordingBroker* broker;
  std::string line;
  bool hasHandle = true;
  std::optional<Mode> failure;

 private:
  bool setsRc() const { return failure == Mode::SetRc || failure == Mode::RcAndNull; }
  bool givesNull() const { return failure == Mode::ReturnNull || failure == Mode::RcAndNull; }
  void report(CMPIStatus* rc, CMPIrc code) const;
  CMPIStatus made(CMPIrc code) const;
};

template <typename Maker>
auto Call::give(const Maker& make, CMPIStatus* rc) const -> decltype(make()) {
  report(rc, CMPI_RC_OK);
  if (!hasHandle || givesNull()) return nullptr;
  auto* object = make();
  if (failure == Mode::NullHandle) object->hdl = nullptr;
  return object;
}

template <typename Maker>
auto Call::giveServed(const ServedClass& served, const Maker& make, CMPIStatus* rc) const -> decltype(make()) {
  if (served.throws) throw InjectedFailure("the provider that serves the class threw");
  auto* object =
      served.nullEnumeration || (served.rc != CMPI_RC_OK && served.instances.empty()) ? nullptr : give(make, rc);
  report(rc, served.rc);
  return object;
}

template <typename Number>
Number Call::giveNumber(Number number, CMPIStatus* rc) const {
  report(rc, CMPI_RC_OK);
  return !hasHandle || givesNull() || failure == Mode::NullHandle ? Number{} : number;
}

}  // namespace ZV::Test
