#include "broker/objects/Convert.h"

#include <charconv>
#include <system_error>

#include "broker/objects/Data.h"
#include "broker/objects/Numbers.h"
#include "broker/objects/PathText.h"
#include "util/NotCopied.h"

namespace zorva::broker {

namespace {

// How deep references and embedded instances may be nested.
constexpr int kDeepest = 16;

void assignText(Scalar& scalar, std::string_view text) {
  if (auto* held = std::get_if<std::string>(&scalar)) {
    held->assign(text);
  } else {
    scalar.emplace<std::string>(text);
  }
}

template <typename T>
T& held(Scalar& scalar) {
  if (auto* boxed = std::get_if<Boxed<T>>(&scalar)) return **boxed;
  return *scalar.emplace<Boxed<T>>();
}

void fillScalar(const CMPIData& data, Scalar& scalar) {
  if (data.state != CMPI_goodValue) {
    scalar = std::monostate();
  } else if (data.type == CMPI_string) {
    assignText(scalar, own<StringObject>(data.value.string)->view());
  } else if (isUnsignedType(data.type)) {
    scalar = unsignedOf(data);
  } else if (data.type == CMPI_boolean) {
    scalar = data.value.boolean != 0;
  } else if (data.type == CMPI_ref) {
    fillPath(*own<PathObject>(data.value.ref), held<ObjectPath>(scalar));
  } else if (data.type == CMPI_dateTime) {
    assignText(scalar, own<DateTimeObject>(data.value.dateTime)->text->view());
  } else if (isSignedType(data.type)) {
    scalar = signedOf(data);
  } else if (data.type == CMPI_real32) {
    scalar = static_cast<double>(data.value.real32);
  } else if (data.type == CMPI_real64) {
    scalar = data.value.real64;
  } else if (data.type == CMPI_char16) {
    scalar = static_cast<char16_t>(data.value.char16);
  } else {
    fillInstance(*own<InstanceObject>(data.value.inst), {}, held<Instance>(scalar));
  }
}

}  // namespace

schema::Type schemaType(CMPIType type) noexcept {
  switch (type) {
    case CMPI_boolean:
      return schema::Type::Boolean;
    case CMPI_char16:
      return schema::Type::Char16;
    case CMPI_real32:
      return schema::Type::Real32;
    case CMPI_real64:
      return schema::Type::Real64;
    case CMPI_uint8:
      return schema::Type::Uint8;
    case CMPI_uint16:
      return schema::Type::Uint16;
    case CMPI_uint32:
      return schema::Type::Uint32;
    case CMPI_uint64:
      return schema::Type::Uint64;
    case CMPI_sint8:
      return schema::Type::Sint8;
    case CMPI_sint16:
      return schema::Type::Sint16;
    case CMPI_sint32:
      return schema::Type::Sint32;
    case CMPI_sint64:
      return schema::Type::Sint64;
    case CMPI_ref:
      return schema::Type::Reference;
    case CMPI_dateTime:
      return schema::Type::DateTime;
    default:
      return schema::Type::String;
  }
}

void fillValue(const CMPIData& data, Value& value) {
  value.isArray = (data.type & CMPI_ARRAY) != 0;
  value.type = schemaType(static_cast<CMPIType>(data.type & ~CMPI_ARRAY));
  value.isNull = data.state != CMPI_goodValue;
  if (!value.isArray) {
    value.elements.clear();
    fillScalar(data, value.scalar);
    return;
  }
  value.scalar = std::monostate();
  const ArrayObject* array = value.isNull ? nullptr : own<ArrayObject>(data.value.array);
  value.elements.resize(array != nullptr ? array->count : 0);
  for (std::size_t i = 0; i < value.elements.size(); ++i) fillScalar(array->elements[i], value.elements[i]);
}

void fillPath(const PathObject& object, ObjectPath& path) {
  path.host.assign(object.host->view());
  path.nameSpace.assign(object.nameSpace->view());
  path.className.assign(object.className->view());
  path.keys.resize(object.keys.size());
  for (std::uint32_t i = 0; i < object.keys.size(); ++i) {
    path.keys[i].name.assign(object.keys[i].name->view());
    fillValue(object.keys[i].data, path.keys[i].value);
  }
}

namespace {

void fillInstancePath(const InstanceObject& object, ObjectPath& path) {
  path.host.assign(object.host->view());
  path.nameSpace.assign(object.nameSpace->view());
  path.className.assign(object.info->name());
  std::size_t count = 0;
  const auto add = [&](std::string_view name, const CMPIData& data) {
    if (count == path.keys.size()) path.keys.emplace_back();
    path.keys[count].name.assign(name);
    fillValue(data, path.keys[count].value);
    ++count;
  };
  if (object.looseKeys != nullptr) {
    for (const EntryList::Entry& key : *object.looseKeys) add(key.name->view(), key.data);
  }
  for (const PropertyInfo* key : object.info->keys()) {
    if (const InstanceObject::Slot* slot = object.find(*key)) add(key->name->view(), slot->data);
  }
  path.keys.resize(count);
}

}  // namespace

namespace {

/// True if it was that property already, as in the instance that was filled before.
bool declare(const PropertyInfo& property, Property& filled) {
  if (filled.declaration == property.declared) return true;
  filled.name.assign(property.name->view());
  filled.declaration = property.declared;
  return false;
}

/// Makes the property at `place` null. Often the same property was there in the instance before; then nothing else
/// changes.
void fillNull(const PropertyInfo& property, std::size_t place, Instance& instance) {
  if (place == instance.properties.size()) instance.properties.emplace_back();
  Property& filled = instance.properties[place];
  if (!declare(property, filled) || !filled.value.isNull) fillValue(nullData(property.type), filled.value);
}

}  // namespace

void fillInstance(const InstanceObject& object, const PropertyMask& wanted, Instance& instance) {
  fillInstancePath(object, instance.path);
  instance.declaration = &object.info->declared();
  std::size_t count = 0;
  for (std::uint32_t i = 0; i < object.count; ++i) {
    const InstanceObject::Slot& slot = object.slots[i];
    if (!wanted.has(*slot.property)) continue;
    if (count == instance.properties.size()) instance.properties.emplace_back();
    Property& property = instance.properties[count++];
    declare(*slot.property, property);
    fillValue(slot.data, property.value);
  }
  for (const PropertyInfo& property : object.info->properties()) {
    if (wanted.has(property) && object.find(property) == nullptr) fillNull(property, count++, instance);
  }
  instance.properties.resize(count);
}

DeclaredType declaredType(const PropertyInfo& property) noexcept {
  return {property.declared->type, property.declared->isArray, property.takesInstance};
}

DeclaredType declaredType(const schema::Parameter& parameter) noexcept {
  return {parameter.type, parameter.isArray,
          schema::findQualifier(parameter.qualifiers, "EmbeddedInstance") != nullptr ||
              schema::hasQualifier(parameter.qualifiers, "EmbeddedObject")};
}

namespace {

/// Makes one scalar of a declared type. Each `operator()` gives the message of a failure, empty on success.
class ScalarMaker {
 public:
  ScalarMaker(Arena& arena, const DeclaredType& declared, CMPIData& data, int depth)
      : arena_(arena), declared_(declared), data_(data), depth_(depth) {
    data_ = nullData(cmpiType(declared.type, false), CMPI_goodValue);
  }

  std::string operator()(std::monostate) {
    data_.state = CMPI_nullValue;
    return {};
  }

  std::string operator()(bool value) {
    if (data_.type != CMPI_boolean) return mismatch(value ? "TRUE" : "FALSE");
    data_.value.boolean = value ? 1 : 0;
    return {};
  }

  std::string operator()(std::uint64_t number) {
    if (isRealType(data_.type)) return (*this)(static_cast<double>(number));
    const bool fits = isSignedType(data_.type)
                          ? number <= INT64_MAX && placeSigned(data_, static_cast<std::int64_t>(number))
                          : placeUnsigned(data_, number);
    return fits ? std::string() : mismatch(std::to_string(number));
  }

  std::string operator()(std::int64_t number) {
    if (isRealType(data_.type)) return (*this)(static_cast<double>(number));
    const bool fits = isUnsignedType(data_.type)
                          ? number >= 0 && placeUnsigned(data_, static_cast<std::uint64_t>(number))
                          : placeSigned(data_, number);
    return fits ? std::string() : mismatch(std::to_string(number));
  }

  std::string operator()(double number) {
    return placeReal(data_, number) ? std::string() : mismatch(std::to_string(number));
  }

  std::string operator()(char16_t code) {
    if (data_.type != CMPI_char16) return mismatch("a character");
    data_.value.char16 = code;
    return {};
  }

  std::string operator()(const std::string& text) {
    if (data_.type == CMPI_string) {
      data_.value.string = StringObject::make(arena_, text);
      return {};
    }
    if (data_.type == CMPI_dateTime) {
      data_.value.dateTime = DateTimeObject::make(arena_, text);
      return data_.value.dateTime != nullptr ? std::string() : mismatch(quotedText(text));
    }
    if (data_.type == CMPI_ref) return reference(text);
    return untyped(text);
  }

  std::string operator()(const Boxed<ObjectPath>& path) {
    if (data_.type != CMPI_ref) return mismatch("a reference");
    if (depth_ >= kDeepest) return "references nested deeper than " + std::to_string(kDeepest);
    PathObject* object = nullptr;
    const Status status = makeReference(*path, object);
    data_.value.ref = object;
    return status.message;
  }

  std::string operator()(const Boxed<Instance>& instance) {
    if (!declared_.takesInstance) return mismatch("an embedded instance");
    if (depth_ >= kDeepest) return "instances nested deeper than " + std::to_string(kDeepest);
    PathObject* name = nullptr;
    Status status = makePath(arena_, instance->path, true, name);
    InstanceObject* object = nullptr;
    if (status.ok()) status = makeInstance(arena_, *name, *instance, object);
    data_.type = CMPI_instance;
    data_.value.inst = object;
    return status.ok() ? std::string() : status.message;
  }

 private:
  std::string mismatch(std::string_view found) const {
    return std::string(found.substr(0, 80)) + " is no " + std::string(schema::typeName(declared_.type));
  }

  Status makeReference(const ObjectPath& path, PathObject*& object);

  /// A text given for a reference.
  std::string reference(const std::string& text) {
    auto path = parsePathText(text);
    if (!path) {
      return "no object path: at byte " + std::to_string(path.error().position) + ", " + path.error().message;
    }
    return (*this)(Boxed<ObjectPath>(std::move(*path)));
  }

  /// A text given for a number, a boolean or a character.
  std::string untyped(const std::string& text) {
    if (data_.type == CMPI_boolean) {
      if (util::sameName(text, "true") || util::sameName(text, "false")) return (*this)(util::sameName(text, "true"));
      return mismatch(quotedText(text));
    }
    if (data_.type == CMPI_char16) {
      if (text.size() == 1) return (*this)(static_cast<char16_t>(static_cast<unsigned char>(text[0])));
      return mismatch(quotedText(text));
    }
    std::uint64_t natural = 0;
    std::int64_t integer = 0;
    double real = 0;
    if (reads(text, natural)) return (*this)(natural);
    if (reads(text, integer)) return (*this)(integer);
    if (isRealType(data_.type) && reads(text, real)) return (*this)(real);
    return mismatch(quotedText(text));
  }

  template <typename Number>
  static bool reads(const std::string& text, Number& number) {
    const char* begin = text.data() + (!text.empty() && text[0] == '+' ? 1 : 0);
    const char* end = text.data() + text.size();
    const auto result = std::from_chars(begin, end, number);
    return result.ec == std::errc() && result.ptr == end;
  }

  Arena& arena_;
  const DeclaredType& declared_;
  CMPIData& data_;
  const int depth_;
};

thread_local int nesting = 0;

class Nesting : util::NotCopied {
 public:
  Nesting() noexcept { ++nesting; }
  ~Nesting() { --nesting; }
};

Status ScalarMaker::makeReference(const ObjectPath& path, PathObject*& object) {
  // The target of a reference may have a class that this schema lacks, so the class is not checked.
  return makePath(arena_, path, false, object);
}

Status mismatched(std::string_view what, const std::string& message) {
  return {CMPI_RC_ERR_TYPE_MISMATCH, std::string(what) + ": " + message};
}

}  // namespace

Status makeData(Arena& arena, const DeclaredType& declared, const Value& value, std::string_view what, CMPIData& data) {
  data = nullData(cmpiType(declared.type, declared.isArray));
  if (value.isNull) return {};
  if (value.isArray != declared.isArray) {
    return mismatched(
        what, declared.isArray ? "one value where an array is declared" : "an array where one value is declared");
  }
  const Nesting level;
  if (!declared.isArray) {
    const std::string message = std::visit(ScalarMaker(arena, declared, data, nesting), value.scalar);
    return message.empty() ? Status() : mismatched(what, message);
  }
  const CMPIType type = cmpiType(declared.type, false);
  auto* array = arena.make<ArrayObject>(arena, type, static_cast<CMPICount>(value.elements.size()));
  for (std::size_t i = 0; i < value.elements.size(); ++i) {
    CMPIData& element = array->elements[i];
    const std::string message = std::visit(ScalarMaker(arena, declared, element, nesting), value.elements[i]);
    if (!message.empty()) return mismatched(what, "element " + std::to_string(i) + ": " + message);
    if (element.type == CMPI_instance) array->type = CMPI_instance;
  }
  data.type = static_cast<CMPIType>(array->type | CMPI_ARRAY);
  data.state = CMPI_goodValue;
  data.value.array = array;
  return {};
}

Status makeData(Arena& arena, const Value& value, std::string_view what, CMPIData& data) {
  return makeData(arena, {value.type, value.isArray, true}, value, what, data);
}

namespace {

Status addKnownKeys(Arena& arena, const ObjectPath& path, PathObject& object) {
  for (const NamedValue& key : path.keys) {
    const PropertyInfo* known = object.info->find(key.name);
    if (known == nullptr || (!known->isKey && !object.info->keys().empty())) {
      return {CMPI_RC_ERR_INVALID_PARAMETER, object.info->name() + " has no key " + key.name};
    }
  }
  // Clients may order keys in any way; providers see the schema's order.
  object.keys.reserve(arena, static_cast<std::uint32_t>(path.keys.size()));
  for (const PropertyInfo& property : object.info->properties()) {
    const Value* value = path.key(property.declared->name);
    if (value == nullptr) continue;
    CMPIData data;
    Status status =
        makeData(arena, declaredType(property), *value, object.info->name() + "." + property.declared->name, data);
    if (!status.ok()) return {CMPI_RC_ERR_INVALID_PARAMETER, std::move(status.message)};
    object.keys.append(arena, property.name, data);
    if (object.keys.size() == path.keys.size()) break;
  }
  return {};
}

}  // namespace

Status makePath(Arena& arena, const ObjectPath& path, bool classMustExist, PathObject*& object) {
  object = PathObject::make(arena, path.nameSpace, path.className);
  object->setHost(path.host);
  if (object->info != nullptr) return addKnownKeys(arena, path, *object);
  if (classMustExist) return {CMPI_RC_ERR_INVALID_CLASS, "there is no class " + quotedText(path.className)};
  for (const NamedValue& key : path.keys) {
    CMPIData data;
    Status status = makeData(arena, key.value, key.name, data);
    if (!status.ok()) return status;
    object->keys.set(arena, intern(arena, key.name), data);
  }
  return {};
}

Status makeInstance(Arena& arena, const PathObject& path, const Instance& instance, InstanceObject*& object) {
  object = InstanceObject::make(arena, path);
  for (const Property& property : instance.properties) {
    const PropertyInfo* known = path.info->find(property.name);
    if (known == nullptr) {
      return {CMPI_RC_ERR_NO_SUCH_PROPERTY, path.info->name() + " has no property " + property.name};
    }
    CMPIData data;
    Status status =
        makeData(arena, declaredType(*known), property.value, path.info->name() + "." + known->declared->name, data);
    if (!status.ok()) return status;
    object->set(*known, data);
  }
  return {};
}

}  // namespace zorva::broker
