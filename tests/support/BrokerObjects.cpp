#include "tests/support/BrokerObjects.h"

#include <array>

namespace ZV::Test {

namespace {

template <typename Object, typename Face, typename Table>
Object* objectOfFace(const Face* face, const Table& table) {
  if (face == nullptr || face->ft != &table) return nullptr;
  return static_cast<Object*>(const_cast<Face*>(face));
}

template <typename Object>
std::string nameOfOwn(const Object* object, const void* face) {
  if (face == nullptr) return "null";
  if (object == nullptr) return "another broker's object";
  return object->label + (object->hdl == nullptr ? "(no handle)" : "");
}

// The value that a pointer points to, which is only as large as its type.
template <typename Number>
Number readAs(const CMPIValue* value) {
  return *reinterpret_cast<const Number*>(value);
}

Value::Content numberOf(const CMPIValue* value, CMPIType type) {
  switch (type) {
    case CMPI_boolean:
      return std::uint64_t{readAs<CMPIBoolean>(value)};
    case CMPI_char16:
      return std::uint64_t{readAs<CMPIChar16>(value)};
    case CMPI_uint8:
      return std::uint64_t{readAs<CMPIUint8>(value)};
    case CMPI_uint16:
      return std::uint64_t{readAs<CMPIUint16>(value)};
    case CMPI_uint32:
      return std::uint64_t{readAs<CMPIUint32>(value)};
    case CMPI_uint64:
      return std::uint64_t{readAs<CMPIUint64>(value)};
    case CMPI_sint8:
      return std::int64_t{readAs<CMPISint8>(value)};
    case CMPI_sint16:
      return std::int64_t{readAs<CMPISint16>(value)};
    case CMPI_sint32:
      return std::int64_t{readAs<CMPISint32>(value)};
    case CMPI_sint64:
      return std::int64_t{readAs<CMPISint64>(value)};
    case CMPI_real32:
      return double{readAs<CMPIReal32>(value)};
    case CMPI_real64:
      return readAs<CMPIReal64>(value);
    default:
      return std::monostate();
  }
}

Value::Content arrayOf(const CMPIArray* face) {
  if (face == nullptr || face->hdl == nullptr) return std::monostate();
  if (const ArrayObject* object = ObjectTables::own(face)) return object->elements;
  std::vector<Value> elements;
  const CMPICount size = face->ft->getSize(face, nullptr);
  for (CMPICount i = 0; i < size; ++i) {
    const CMPIData data = face->ft->getElementAt(face, i, nullptr);
    elements.push_back(data.state != CMPI_goodValue ? null(data.type) : ObjectTables::valueOf(&data.value, data.type));
  }
  return elements;
}

Value::Content objectOf(const CMPIValue* value, CMPIType type) {
  if (type == CMPI_string) {
    const auto* face = readAs<CMPIString*>(value);
    if (face != nullptr && face->hdl != nullptr) return ObjectTables::textOf(face);
  } else if (type == CMPI_ref) {
    const auto* face = readAs<CMPIObjectPath*>(value);
    if (face != nullptr && face->hdl != nullptr) return std::make_shared<const Path>(ObjectTables::pathOf(face));
  } else if (type == CMPI_instance) {
    const auto* face = readAs<CMPIInstance*>(value);
    if (face != nullptr && face->hdl != nullptr) {
      return std::make_shared<const Instance>(ObjectTables::instanceOf(face));
    }
  } else if (type == CMPI_dateTime) {
    const DateTimeObject* own = ObjectTables::own(readAs<CMPIDateTime*>(value));
    if (own != nullptr && own->hdl != nullptr) return own->text;
  }
  return std::monostate();
}

void fillNumber(CMPIData& data, const Value& value) {
  switch (value.type) {
    case CMPI_boolean:
      data.value.boolean = static_cast<CMPIBoolean>(value.number() != 0);
      break;
    case CMPI_char16:
      data.value.char16 = static_cast<CMPIChar16>(value.number());
      break;
    case CMPI_uint8:
      data.value.uint8 = static_cast<CMPIUint8>(value.number());
      break;
    case CMPI_uint16:
      data.value.uint16 = static_cast<CMPIUint16>(value.number());
      break;
    case CMPI_uint32:
      data.value.uint32 = static_cast<CMPIUint32>(value.number());
      break;
    case CMPI_uint64:
      data.value.uint64 = value.number();
      break;
    case CMPI_sint8:
      data.value.sint8 = static_cast<CMPISint8>(value.number());
      break;
    case CMPI_sint16:
      data.value.sint16 = static_cast<CMPISint16>(value.number());
      break;
    case CMPI_sint32:
      data.value.sint32 = static_cast<CMPISint32>(value.number());
      break;
    case CMPI_sint64:
      data.value.sint64 = static_cast<CMPISint64>(value.number());
      break;
    case CMPI_real32:
      data.value.real32 = static_cast<CMPIReal32>(std::get<double>(value.content));
      break;
    case CMPI_real64:
      data.value.real64 = std::get<double>(value.content);
      break;
    default:
      break;
  }
}

// Removes the handle of the object in the data. False if the data contain none.
bool dropHandle(CMPIData& data) {
  if ((data.state & CMPI_nullValue) != 0) return false;
  if ((data.type & CMPI_ARRAY) != 0) {
    data.value.array->hdl = nullptr;
  } else if (data.type == CMPI_string) {
    data.value.string->hdl = nullptr;
  } else if (data.type == CMPI_ref) {
    data.value.ref->hdl = nullptr;
  } else if (data.type == CMPI_instance) {
    data.value.inst->hdl = nullptr;
  } else if (data.type == CMPI_dateTime) {
    data.value.dateTime->hdl = nullptr;
  } else {
    return false;
  }
  return true;
}

}  // namespace

PathObject* ObjectTables::own(const CMPIObjectPath* face) { return objectOfFace<PathObject>(face, path); }
InstanceObject* ObjectTables::own(const CMPIInstance* face) { return objectOfFace<InstanceObject>(face, instance); }
StringObject* ObjectTables::own(const CMPIString* face) { return objectOfFace<StringObject>(face, string); }
ArrayObject* ObjectTables::own(const CMPIArray* face) { return objectOfFace<ArrayObject>(face, array); }
ResultObject* ObjectTables::own(const CMPIResult* face) { return objectOfFace<ResultObject>(face, result); }
ContextObject* ObjectTables::own(const CMPIContext* face) { return objectOfFace<ContextObject>(face, context); }
ArgsObject* ObjectTables::own(const CMPIArgs* face) { return objectOfFace<ArgsObject>(face, args); }
DateTimeObject* ObjectTables::own(const CMPIDateTime* face) { return objectOfFace<DateTimeObject>(face, dateTime); }

std::string ObjectTables::nameOf(const CMPIObjectPath* face) { return nameOfOwn(own(face), face); }
std::string ObjectTables::nameOf(const CMPIInstance* face) { return nameOfOwn(own(face), face); }
std::string ObjectTables::nameOf(const CMPIContext* face) { return nameOfOwn(own(face), face); }

std::string ObjectTables::textOf(const CMPIString* face) {
  if (face == nullptr || face->hdl == nullptr) return {};
  if (const StringObject* object = own(face)) return object->text;
  const char* text = face->ft->getCharPtr(face, nullptr);
  return text == nullptr ? std::string() : text;
}

Path ObjectTables::pathOf(const CMPIObjectPath* face) {
  if (face == nullptr || face->hdl == nullptr) return {};
  if (const PathObject* object = own(face)) return object->path;
  Path copy;
  copy.nameSpace = textOf(face->ft->getNameSpace(face, nullptr));
  copy.host = textOf(face->ft->getHostname(face, nullptr));
  copy.className = textOf(face->ft->getClassName(face, nullptr));
  const CMPICount count = face->ft->getKeyCount(face, nullptr);
  for (CMPICount i = 0; i < count; ++i) {
    CMPIString* name = nullptr;
    const CMPIData data = face->ft->getKeyAt(face, i, &name, nullptr);
    copy.keys.emplace_back(textOf(name), valueOf(&data.value, data.type));
  }
  return copy;
}

Instance ObjectTables::instanceOf(const CMPIInstance* face) {
  if (face == nullptr || face->hdl == nullptr) return {};
  Instance copy;
  if (const InstanceObject* object = own(face)) {
    copy = object->instance;
    copy.path = pathOfInstance(*object);
    return copy;
  }
  copy.path = pathOf(face->ft->getObjectPath(face, nullptr));
  const CMPICount count = face->ft->getPropertyCount(face, nullptr);
  for (CMPICount i = 0; i < count; ++i) {
    CMPIString* name = nullptr;
    const CMPIData data = face->ft->getPropertyAt(face, i, &name, nullptr);
    const bool isNull = (data.state & CMPI_nullValue) != 0;
    copy.properties.emplace_back(textOf(name), isNull ? null(data.type) : valueOf(&data.value, data.type));
  }
  return copy;
}

Path ObjectTables::pathOfInstance(const InstanceObject& object) {
  Path made = object.instance.path;
  const auto& names = object.filterKeys.has_value() ? *object.filterKeys : object.broker->keysOfClass(made.className);
  for (const std::string& name : names) {
    const Value* value = findValue(object.instance.properties, name);
    if (value == nullptr) continue;
    Value key = *value;
    key.type = key.type == CMPI_chars ? static_cast<CMPIType>(CMPI_string) : key.type;
    putValue(made.keys, name, std::move(key));
  }
  return made;
}

Value ObjectTables::valueOf(const CMPIValue* value, CMPIType type) {
  if (value == nullptr) return null(type);
  Value copy{type, CMPI_goodValue, std::monostate()};
  if (type == CMPI_chars) {
    copy.content = std::string(reinterpret_cast<const char*>(value));
  } else if ((type & CMPI_ARRAY) != 0) {
    copy.content = arrayOf(readAs<CMPIArray*>(value));
  } else if ((type & CMPI_ENC) != 0) {
    copy.content = objectOf(value, type);
  } else {
    copy.content = numberOf(value, type);
  }
  if (copy.isNull()) copy.state = CMPI_nullValue;
  return copy;
}

CMPIData ObjectTables::dataOf(RecordingBroker* broker, const Value& value) {
  CMPIData data{};
  data.type = value.type == CMPI_chars ? static_cast<CMPIType>(CMPI_string) : value.type;
  data.state = value.state;
  if (const auto* text = std::get_if<std::string>(&value.content)) {
    if (value.type == CMPI_dateTime) {
      data.value.dateTime = broker->addDateTime(*text);
    } else {
      data.value.string = broker->addString(*text);
    }
  } else if (const auto* elements = std::get_if<std::vector<Value>>(&value.content)) {
    const auto simple = static_cast<CMPIType>(value.type & ~CMPI_ARRAY);
    data.value.array = broker->addArray(simple, *elements);
  } else if (const auto* target = std::get_if<std::shared_ptr<const Path>>(&value.content)) {
    data.value.ref = broker->addPath(**target);
  } else if (const auto* inner = std::get_if<std::shared_ptr<const Instance>>(&value.content)) {
    data.value.inst = broker->addInstance(**inner);
  } else if (!value.isNull()) {
    fillNumber(data, value);
  }
  return data;
}

std::string ObjectTables::argument(const CMPIValue* value, CMPIType type) {
  if (value != nullptr && type == CMPI_ref) return "ref " + nameOf(readAs<CMPIObjectPath*>(value));
  if (value != nullptr && type == CMPI_instance) return "instance " + nameOf(readAs<CMPIInstance*>(value));
  const Value copy = valueOf(value, type);
  return copy.isNull() ? nameOfType(type) + " null" : describe(copy);
}

Call::Call(RecordingBroker* recorder, const char* name, const std::string& shownName, const std::string& arguments)
    : broker(recorder) {
  failure = broker->record(name, broker->keepsLines ? shownName + "(" + arguments + ")" : std::string());
}

CMPIStatus Call::made(CMPIrc code) const {
  if (!hasHandle) return {CMPI_RC_ERR_INVALID_HANDLE, nullptr};
  if (!setsRc()) return {code, nullptr};
  return {CMPI_RC_ERR_FAILED, broker->addString("the broker failed as it was asked to")};
}

CMPIStatus Call::status(CMPIrc rc) const {
  if (!hasHandle || !failure.has_value()) return made(rc);
  return {CMPI_RC_ERR_FAILED, broker->addString("the broker failed as it was asked to")};
}

void Call::report(CMPIStatus* rc, CMPIrc code) const {
  if (rc != nullptr) *rc = made(code);
}

std::nullptr_t Call::giveNull(CMPIStatus* rc, CMPIrc code) const {
  report(rc, code);
  return nullptr;
}

CMPIData Call::giveData(const Value& value, CMPIStatus* rc, CMPIValueState added) const {
  report(rc, CMPI_RC_OK);
  CMPIData data{};
  data.type = value.type;
  data.state = CMPI_nullValue;
  if (!hasHandle || givesNull()) return data;
  data = ObjectTables::dataOf(broker, value);
  if (failure == Mode::NullHandle && !dropHandle(data)) {
    data.value = {};
    data.state = CMPI_nullValue;
  }
  if (!value.isNull()) data.state = static_cast<CMPIValueState>(data.state | added);
  return data;
}

CMPIData Call::giveMissing(const Missing& missing, CMPIStatus* rc) const {
  report(rc, missing.rc);
  CMPIData data{};
  data.state = missing.state;
  return data;
}

const char* Call::giveText(const char* text, CMPIStatus* rc) const {
  report(rc, CMPI_RC_OK);
  return !hasHandle || givesNull() || failure == Mode::NullHandle ? nullptr : text;
}

}  // namespace ZV::Test
