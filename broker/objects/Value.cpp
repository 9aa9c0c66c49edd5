#include "broker/objects/Value.h"

#include <algorithm>

namespace zorva::broker {

namespace {

Value scalarOf(schema::Type type, Scalar scalar) {
  Value value;
  value.type = type;
  value.isNull = false;
  value.scalar = std::move(scalar);
  return value;
}

}  // namespace

Value Value::null(schema::Type type, bool array) {
  Value value;
  value.type = type;
  value.isArray = array;
  return value;
}

Value Value::text(std::string text) { return scalarOf(schema::Type::String, std::move(text)); }

Value Value::boolean(bool value) { return scalarOf(schema::Type::Boolean, value); }

Value Value::unsignedNumber(std::uint64_t number, schema::Type type) { return scalarOf(type, number); }

Value Value::signedNumber(std::int64_t number, schema::Type type) { return scalarOf(type, number); }

Value Value::reference(ObjectPath path) {
  return scalarOf(schema::Type::Reference, Boxed<ObjectPath>(std::move(path)));
}

Value Value::array(schema::Type type, std::vector<Scalar> elements) {
  Value value = null(type, true);
  value.isNull = false;
  value.elements = std::move(elements);
  return value;
}

Value Value::textArray(const std::vector<std::string>& texts) {
  return array(schema::Type::String, std::vector<Scalar>(texts.begin(), texts.end()));
}

std::string_view Value::asText() const noexcept {
  const auto* text = std::get_if<std::string>(&scalar);
  return text != nullptr ? std::string_view(*text) : std::string_view();
}

const Value* ObjectPath::key(std::string_view name) const noexcept {
  const auto found =
      std::find_if(keys.begin(), keys.end(), [name](const NamedValue& key) { return util::sameName(key.name, name); });
  return found != keys.end() ? &found->value : nullptr;
}

namespace {

bool isEmpty(const Scalar& scalar) noexcept {
  const auto* text = std::get_if<std::string>(&scalar);
  return text != nullptr ? text->empty() : std::holds_alternative<std::monostate>(scalar);
}

/// The elements that count; a value that is no list has itself as its only element.
std::vector<const Scalar*> contentOf(const Value& value) {
  std::vector<const Scalar*> content;
  if (value.isNull) return content;
  if (!value.isArray && !isEmpty(value.scalar)) content.push_back(&value.scalar);
  for (const Scalar& element : value.elements) {
    if (!isEmpty(element)) content.push_back(&element);
  }
  return content;
}

}  // namespace

bool hasSameEffect(const Value& a, const Value& b) {
  const std::vector<const Scalar*> one = contentOf(a);
  const std::vector<const Scalar*> other = contentOf(b);
  if (a.isArray != b.isArray && !one.empty()) return false;
  return std::equal(one.begin(), one.end(), other.begin(), other.end(),
                    [](const Scalar* x, const Scalar* y) { return *x == *y; });
}

const Value* Instance::property(std::string_view name) const noexcept {
  const auto found = std::find_if(properties.begin(), properties.end(),
                                  [name](const Property& property) { return util::sameName(property.name, name); });
  return found != properties.end() ? &found->value : nullptr;
}

std::string_view statusName(int rc) noexcept {
  switch (rc) {
    case 0:
      return "CIM_ERR_SUCCESS";
    case 1:
      return "CIM_ERR_FAILED";
    case 2:
      return "CIM_ERR_ACCESS_DENIED";
    case 3:
      return "CIM_ERR_INVALID_NAMESPACE";
    case 4:
      return "CIM_ERR_INVALID_PARAMETER";
    case 5:
      return "CIM_ERR_INVALID_CLASS";
    case 6:
      return "CIM_ERR_NOT_FOUND";
    case 7:
      return "CIM_ERR_NOT_SUPPORTED";
    case 8:
      return "CIM_ERR_CLASS_HAS_CHILDREN";
    case 9:
      return "CIM_ERR_CLASS_HAS_INSTANCES";
    case 10:
      return "CIM_ERR_INVALID_SUPERCLASS";
    case 11:
      return "CIM_ERR_ALREADY_EXISTS";
    case 12:
      return "CIM_ERR_NO_SUCH_PROPERTY";
    case 13:
      return "CIM_ERR_TYPE_MISMATCH";
    case 14:
      return "CIM_ERR_QUERY_LANGUAGE_NOT_SUPPORTED";
    case 15:
      return "CIM_ERR_INVALID_QUERY";
    case 16:
      return "CIM_ERR_METHOD_NOT_AVAILABLE";
    case 17:
      return "CIM_ERR_METHOD_NOT_FOUND";
    case 50:
      return "CMPI_RC_DO_NOT_UNLOAD";
    case 51:
      return "CMPI_RC_NEVER_UNLOAD";
    case 60:
      return "CMPI_RC_ERR_INVALID_HANDLE";
    case 61:
      return "CMPI_RC_ERR_INVALID_DATA_TYPE";
    case 100:
      return "CMPI_RC_ERROR_SYSTEM";
    case 200:
      return "CMPI_RC_ERROR";
    default:
      return "an unknown status code";
  }
}

}  // namespace zorva::broker
