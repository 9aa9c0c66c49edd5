#include "broker/objects/Qualifiers.h"

#include <algorithm>

#include "broker/objects/ClassTable.h"
#include "broker/objects/Data.h"
#include "broker/objects/Numbers.h"
#include "broker/objects/Scope.h"
#include "broker/objects/TableSupport.h"

namespace zorva::broker {

namespace {

struct ScalarPlacer {
  Arena& arena;
  CMPIData& data;

  void operator()(std::monostate) const { data.state = CMPI_nullValue; }
  void operator()(bool value) const { data.value.boolean = value ? 1 : 0; }
  void operator()(std::uint64_t number) const { placeUnsigned(data, number); }
  void operator()(std::int64_t number) const { placeSigned(data, number); }
  void operator()(double number) const { placeReal(data, number); }
  void operator()(char16_t code) const { data.value.char16 = code; }
  void operator()(const std::string& text) const {
    if (data.type == CMPI_dateTime) {
      data.value.dateTime = DateTimeObject::make(arena, text);
      if (data.value.dateTime == nullptr) data.state = CMPI_badValue | CMPI_nullValue;
    } else {
      data.type = CMPI_string;
      data.value.string = StringObject::make(arena, text);
    }
  }
};

CMPIData scalarData(Arena& arena, CMPIType type, const schema::Scalar& scalar) {
  CMPIData data = nullData(type, CMPI_goodValue);
  std::visit(ScalarPlacer{arena, data}, scalar);
  return data;
}

CMPIData valueData(Arena& arena, schema::Type type, const schema::Value& value) {
  if (value.isNull) return nullData(cmpiType(type, value.isArray));
  if (!value.isArray) return scalarData(arena, cmpiType(type, false), value.scalar);
  CMPIData data = nullData(cmpiType(type, true), CMPI_goodValue);
  auto* array = arena.make<ArrayObject>(arena, cmpiType(type, false), static_cast<CMPICount>(value.elements.size()));
  for (CMPICount i = 0; i < array->count; ++i) {
    array->elements[i] = scalarData(arena, array->type, value.elements[i]);
  }
  data.value.array = array;
  return data;
}

const schema::ClassMethod* findMethod(const PathObject& path, const char* method) noexcept {
  return path.info != nullptr && method != nullptr ? path.info->declared().findMethod(method) : nullptr;
}

}  // namespace

const schema::Qualifiers* classQualifiers(const PathObject& path) noexcept {
  return path.info != nullptr ? &path.info->declared().qualifiers() : nullptr;
}

const schema::Qualifiers* propertyQualifiers(const PathObject& path, const char* property) noexcept {
  const PropertyInfo* found = path.info != nullptr && property != nullptr ? path.info->find(property) : nullptr;
  return found != nullptr ? &found->declared->qualifiers : nullptr;
}

const schema::Qualifiers* methodQualifiers(const PathObject& path, const char* method) noexcept {
  const schema::ClassMethod* found = findMethod(path, method);
  return found != nullptr ? &found->qualifiers : nullptr;
}

const schema::Qualifiers* parameterQualifiers(const PathObject& path, const char* method,
                                              const char* parameter) noexcept {
  const schema::ClassMethod* owner = findMethod(path, method);
  if (owner == nullptr || parameter == nullptr) return nullptr;
  const auto found = std::find_if(owner->parameters.begin(), owner->parameters.end(),
                                  [&](const auto& candidate) { return util::sameName(candidate.name, parameter); });
  return found != owner->parameters.end() ? &found->qualifiers : nullptr;
}

CMPIData qualifierData(const PathObject& path, const schema::Qualifiers* qualifiers, const char* name,
                       CMPIStatus* status) {
  const schema::Qualifier* found =
      qualifiers != nullptr && name != nullptr ? schema::findQualifier(*qualifiers, name) : nullptr;
  const schema::QualifierType* type =
      found != nullptr ? path.arena->classes()->repository().findQualifierType(found->name) : nullptr;
  if (type == nullptr) {
    setStatus(status, CMPI_RC_ERR_NOT_FOUND);
    return nullData(CMPI_null, CMPI_notFound | CMPI_nullValue);
  }
  setStatus(status, CMPI_RC_OK);
  return valueData(*currentArena(path.arena), type->type, found->value ? *found->value : type->defaultValue);
}

}  // namespace zorva::broker
