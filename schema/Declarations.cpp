#include "schema/Declarations.h"

#include <array>
#include <cmath>
#include <limits>

#include "util/Names.h"

namespace zorva::schema {

namespace {

// In the order of Type.
constexpr std::array<std::string_view, 15> kTypeNames = {
    "boolean", "string", "datetime", "char16", "uint8",  "sint8",  "uint16", "sint16",
    "uint32",  "sint32", "uint64",   "sint64", "real32", "real64", "ref",
};

unsigned integerBits(Type type) noexcept {
  switch (type) {
    case Type::Uint8:
    case Type::Sint8:
      return 8;
    case Type::Uint16:
    case Type::Sint16:
      return 16;
    case Type::Uint32:
    case Type::Sint32:
      return 32;
    default:
      return 64;
  }
}

std::string describe(const Scalar& scalar) {
  if (const auto* b = std::get_if<bool>(&scalar)) return *b ? "true" : "false";
  if (const auto* u = std::get_if<std::uint64_t>(&scalar)) return std::to_string(*u);
  if (const auto* i = std::get_if<std::int64_t>(&scalar)) return std::to_string(*i);
  if (std::holds_alternative<double>(scalar)) return "a real number";
  if (std::holds_alternative<char16_t>(scalar)) return "a character";
  if (std::holds_alternative<std::string>(scalar)) return "a text";
  return "null";
}

bool fitUnsigned(const Scalar& scalar, Type type) {
  const auto* value = std::get_if<std::uint64_t>(&scalar);
  const unsigned bits = integerBits(type);
  return value != nullptr && (bits == 64 || *value >> bits == 0);
}

bool fitSigned(Scalar& scalar, Type type) {
  if (const auto* whole = std::get_if<std::uint64_t>(&scalar)) {
    if (*whole > static_cast<std::uint64_t>(std::numeric_limits<std::int64_t>::max())) return false;
    scalar = static_cast<std::int64_t>(*whole);
  }
  const auto* value = std::get_if<std::int64_t>(&scalar);
  if (value == nullptr) return false;
  const std::int64_t highest = std::numeric_limits<std::int64_t>::max() >> (64 - integerBits(type));
  return *value <= highest && *value >= -highest - 1;
}

bool fitReal(Scalar& scalar, Type type) {
  if (const auto* whole = std::get_if<std::uint64_t>(&scalar)) scalar = static_cast<double>(*whole);
  if (const auto* negative = std::get_if<std::int64_t>(&scalar)) scalar = static_cast<double>(*negative);
  const auto* value = std::get_if<double>(&scalar);
  return value != nullptr &&
         (type == Type::Real64 || std::abs(*value) <= static_cast<double>(std::numeric_limits<float>::max()));
}

bool fitScalar(Scalar& scalar, Type type) {
  if (std::holds_alternative<std::monostate>(scalar)) return true;
  if (isUnsigned(type)) return fitUnsigned(scalar, type);
  if (isSigned(type)) return fitSigned(scalar, type);
  if (isReal(type)) return fitReal(scalar, type);
  switch (type) {
    case Type::Boolean:
      return std::holds_alternative<bool>(scalar);
    case Type::Char16:
      return std::holds_alternative<char16_t>(scalar);
    case Type::DateTime:
      return std::holds_alternative<std::string>(scalar) && isDateTime(std::get<std::string>(scalar));
    default:
      return std::holds_alternative<std::string>(scalar);
  }
}

std::string misfit(const Scalar& scalar, Type type) {
  const bool number = std::holds_alternative<std::uint64_t>(scalar) || std::holds_alternative<std::int64_t>(scalar);
  if (number && (isUnsigned(type) || isSigned(type))) {
    return describe(scalar) + " does not fit in " + std::string(typeName(type));
  }
  if (type == Type::DateTime && std::holds_alternative<std::string>(scalar)) {
    return "\"" + std::get<std::string>(scalar).substr(0, 40) + "\" is no datetime";
  }
  return describe(scalar) + " is no value of type " + std::string(typeName(type));
}

bool isDigitOrStar(char c) noexcept { return (c >= '0' && c <= '9') || c == '*'; }

}  // namespace

std::string_view typeName(Type type) noexcept { return kTypeNames[static_cast<std::size_t>(type)]; }

std::optional<Type> typeFromName(std::string_view name) noexcept {
  for (std::size_t i = 0; i + 1 < kTypeNames.size(); ++i) {
    if (util::sameName(name, kTypeNames[i])) return static_cast<Type>(i);
  }
  return std::nullopt;
}

bool isUnsigned(Type type) noexcept {
  return type == Type::Uint8 || type == Type::Uint16 || type == Type::Uint32 || type == Type::Uint64;
}

bool isSigned(Type type) noexcept {
  return type == Type::Sint8 || type == Type::Sint16 || type == Type::Sint32 || type == Type::Sint64;
}

bool isReal(Type type) noexcept { return type == Type::Real32 || type == Type::Real64; }

Value Value::null(bool array) {
  Value value;
  value.isArray = array;
  return value;
}

Value Value::of(Scalar one) {
  Value value;
  value.isNull = std::holds_alternative<std::monostate>(one);
  value.scalar = std::move(one);
  return value;
}

Value Value::array(std::vector<Scalar> many) {
  Value value;
  value.isArray = true;
  value.isNull = false;
  value.elements = std::move(many);
  return value;
}

std::optional<std::string> fitValue(Value& value, Type type, bool isArray) {
  if (value.isNull) {
    value.isArray = isArray;
    return std::nullopt;
  }
  if (value.isArray != isArray) {
    return isArray ? "a single value is given where an array of " + std::string(typeName(type)) + " belongs"
                   : "an array is given where a single " + std::string(typeName(type)) + " belongs";
  }
  if (!isArray && !fitScalar(value.scalar, type)) return misfit(value.scalar, type);
  for (Scalar& element : value.elements) {
    if (!fitScalar(element, type)) return misfit(element, type);
  }
  return std::nullopt;
}

bool isDateTime(std::string_view text) noexcept {
  // yyyymmddhhmmss.mmmmmmsutc, or ddddddddhhmmss.mmmmmm:000 for an interval.
  if (text.size() != 25 || text[14] != '.') return false;
  for (std::size_t i = 0; i < 21; ++i) {
    if (i != 14 && !isDigitOrStar(text[i])) return false;
  }
  if (text[21] == ':') return text.substr(22) == "000";
  if (text[21] != '+' && text[21] != '-') return false;
  for (const char c : text.substr(22)) {
    if (!isDigitOrStar(c)) return false;
  }
  return true;
}

bool isTrue(const Value& value) noexcept {
  const auto* b = std::get_if<bool>(&value.scalar);
  return !value.isArray && b != nullptr && *b;
}

std::string_view textOf(const Value& value) noexcept {
  const auto* text = std::get_if<std::string>(&value.scalar);
  return value.isArray || text == nullptr ? std::string_view() : std::string_view(*text);
}

const Qualifier* findQualifier(const Qualifiers& qualifiers, std::string_view name) noexcept {
  for (const Qualifier& qualifier : qualifiers) {
    if (util::sameName(qualifier.name, name)) return &qualifier;
  }
  return nullptr;
}

bool hasQualifier(const Qualifiers& qualifiers, std::string_view name) noexcept {
  const Qualifier* qualifier = findQualifier(qualifiers, name);
  return qualifier != nullptr && (!qualifier->value || isTrue(*qualifier->value));
}

std::string SchemaError::text() const {
  std::string all;
  if (!file.empty()) all = file + ":";
  if (line != 0) all += std::to_string(line) + ":" + std::to_string(column) + ":";
  if (!all.empty()) all += " ";
  return all + message;
}

}  // namespace zorva::schema
