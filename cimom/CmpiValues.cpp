#include "cimom/CmpiValues.h"

#include <cmpimacs.h>

#include "cmpi/support/CmpiSupport.h"

namespace zorva::cimom {

namespace {

using broker::ObjectPath;
using broker::Scalar;
using broker::Value;

CMPIType typeOf(schema::Type type) noexcept {
  switch (type) {
    case schema::Type::Boolean:
      return CMPI_boolean;
    case schema::Type::Uint8:
      return CMPI_uint8;
    case schema::Type::Uint16:
      return CMPI_uint16;
    case schema::Type::Uint32:
      return CMPI_uint32;
    case schema::Type::Uint64:
      return CMPI_uint64;
    case schema::Type::Reference:
      return CMPI_ref;
    default:
      return CMPI_chars;
  }
}

CMPIValue numberOf(std::uint64_t number, CMPIType type) noexcept {
  CMPIValue value{};
  if (type == CMPI_uint8) {
    value.uint8 = static_cast<CMPIUint8>(number);
  } else if (type == CMPI_uint16) {
    value.uint16 = static_cast<CMPIUint16>(number);
  } else if (type == CMPI_uint32) {
    value.uint32 = static_cast<CMPIUint32>(number);
  } else {
    value.uint64 = number;
  }
  return value;
}

/// `store(value, type)` with what a plain value is in CMPI. Texts are handed over as they are.
template <typename Store>
void storeScalar(const CMPIBroker* broker, const Scalar& scalar, CMPIType type, Store&& store) {
  CMPIValue value{};
  if (const auto* text = std::get_if<std::string>(&scalar)) {
    // A value of the type CMPI_chars is the text itself.
    store(reinterpret_cast<const CMPIValue*>(text->c_str()), type);
    return;
  }
  if (const auto* flag = std::get_if<bool>(&scalar)) value.boolean = static_cast<CMPIBoolean>(*flag);
  if (const auto* number = std::get_if<std::uint64_t>(&scalar)) value = numberOf(*number, type);
  if (const auto* path = std::get_if<broker::Boxed<ObjectPath>>(&scalar)) value.ref = makePath(broker, **path);
  store(&value, type);
}

template <typename Store>
void storeValue(const CMPIBroker* broker, const Value& plain, Store&& store) {
  const CMPIType type = typeOf(plain.type);
  if (!plain.isArray) {
    storeScalar(broker, plain.scalar, type, store);
    return;
  }
  CMPIValue value{};
  value.array = cmpi::newArray(broker, static_cast<CMPICount>(plain.elements.size()), type, nullptr);
  if (value.array == nullptr) return;
  CMPICount at = 0;
  for (const Scalar& element : plain.elements) {
    storeScalar(broker, element, type, [&](const CMPIValue* one, CMPIType oneType) {
      value.array->ft->setElementAt(value.array, at, one, oneType);
    });
    ++at;
  }
  store(&value, static_cast<CMPIType>(type | CMPI_ARRAY));
}

Value keyOf(const CMPIData& data) {
  if ((data.state & CMPI_nullValue) != 0) return Value::null(schema::Type::String);
  switch (data.type) {
    case CMPI_string:
      return Value::text(cmpi::textOf(data.value.string, nullptr));
    case CMPI_chars:
      return Value::text(data.value.chars == nullptr ? "" : data.value.chars);
    case CMPI_ref:
      return Value::reference(readPath(data.value.ref));
    case CMPI_boolean:
      return Value::boolean(data.value.boolean != 0);
    case CMPI_uint8:
      return Value::unsignedNumber(data.value.uint8, schema::Type::Uint8);
    case CMPI_uint16:
      return Value::unsignedNumber(data.value.uint16, schema::Type::Uint16);
    case CMPI_uint32:
      return Value::unsignedNumber(data.value.uint32, schema::Type::Uint32);
    case CMPI_uint64:
      return Value::unsignedNumber(data.value.uint64, schema::Type::Uint64);
    default:
      return Value::null(schema::Type::String);
  }
}

}  // namespace

CMPIObjectPath* makePath(const CMPIBroker* broker, const ObjectPath& path) {
  CMPIStatus status{CMPI_RC_OK, nullptr};
  CMPIObjectPath* const object = cmpi::newPath(broker, path.nameSpace, path.className.c_str(), &status);
  if (object == nullptr || status.rc != CMPI_RC_OK) return nullptr;
  if (!path.host.empty()) CMSetHostname(object, path.host.c_str());
  for (const broker::NamedValue& key : path.keys) {
    storeValue(broker, key.value, [&](const CMPIValue* value, CMPIType type) {
      object->ft->addKey(object, key.name.c_str(), value, type);
    });
  }
  return object;
}

CMPIInstance* makeInstance(const CMPIBroker* broker, const broker::Instance& instance) {
  CMPIStatus status{CMPI_RC_OK, nullptr};
  const CMPIObjectPath* const path = makePath(broker, instance.path);
  CMPIInstance* const object = path == nullptr ? nullptr : cmpi::newInstance(broker, path, &status);
  if (object == nullptr || status.rc != CMPI_RC_OK) return nullptr;
  for (const broker::Property& property : instance.properties) {
    storeValue(broker, property.value, [&](const CMPIValue* value, CMPIType type) {
      object->ft->setProperty(object, property.name.c_str(), value, type);
    });
  }
  return object;
}

ObjectPath readPath(const CMPIObjectPath* path) {
  ObjectPath plain;
  if (path == nullptr) return plain;
  plain.host = cmpi::textOf(CMGetHostname(path, nullptr), nullptr);
  plain.nameSpace = cmpi::nameSpaceOf(path, nullptr);
  plain.className = cmpi::classNameOf(path, nullptr);
  const CMPICount count = cmpi::keyCountOf(path, nullptr);
  for (CMPICount i = 0; i < count; ++i) {
    CMPIString* name = nullptr;
    const CMPIData data = CMGetKeyAt(path, i, &name, nullptr);
    plain.keys.push_back({cmpi::textOf(name, nullptr), keyOf(data)});
  }
  return plain;
}

}  // namespace zorva::cimom
