#include "tests/support/CimValues.h"

#include <strings.h>

#include <algorithm>
#include <array>
#include <cstdio>

namespace ZV::Test {

namespace {

constexpr std::size_t kLongestQuoted = 400;

struct TypeName {
  CMPIType type;
  const char* name;
};

constexpr std::array kTypeNames{
    TypeName{CMPI_null, "null"},         TypeName{CMPI_boolean, "boolean"},   TypeName{CMPI_char16, "char16"},
    TypeName{CMPI_real32, "real32"},     TypeName{CMPI_real64, "real64"},     TypeName{CMPI_uint8, "uint8"},
    TypeName{CMPI_uint16, "uint16"},     TypeName{CMPI_uint32, "uint32"},     TypeName{CMPI_uint64, "uint64"},
    TypeName{CMPI_sint8, "sint8"},       TypeName{CMPI_sint16, "sint16"},     TypeName{CMPI_sint32, "sint32"},
    TypeName{CMPI_sint64, "sint64"},     TypeName{CMPI_instance, "instance"}, TypeName{CMPI_ref, "ref"},
    TypeName{CMPI_args, "args"},         TypeName{CMPI_string, "string"},     TypeName{CMPI_chars, "chars"},
    TypeName{CMPI_dateTime, "dateTime"}, TypeName{CMPI_ptr, "ptr"},           TypeName{CMPI_charsptr, "charsptr"},
};

std::string describeContent(const Value& value);

std::string describeElements(const std::vector<Value>& elements) {
  std::string line = "{";
  for (std::size_t i = 0; i < elements.size(); ++i) line += (i == 0 ? "" : ", ") + describeContent(elements[i]);
  return line + "}";
}

std::string describeContent(const Value& value) {
  if (const auto* number = std::get_if<std::uint64_t>(&value.content)) {
    return value.type == CMPI_boolean ? (*number != 0 ? "true" : "false") : std::to_string(*number);
  }
  if (const auto* number = std::get_if<std::int64_t>(&value.content)) return std::to_string(*number);
  if (const auto* number = std::get_if<double>(&value.content)) return std::to_string(*number);
  if (const auto* text = std::get_if<std::string>(&value.content)) return inQuotes(*text);
  if (const auto* elements = std::get_if<std::vector<Value>>(&value.content)) return describeElements(*elements);
  if (const auto* path = std::get_if<std::shared_ptr<const Path>>(&value.content)) return describe(**path);
  if (const auto* inner = std::get_if<std::shared_ptr<const Instance>>(&value.content)) return describe(**inner);
  return "null";
}

Value made(CMPIType type, Value::Content content) { return {type, CMPI_goodValue, std::move(content)}; }

// The plain numbers of an array count as its element type, so that they print and compare like single values.
CMPIType elementTypeOf(CMPIType arrayType) {
  return static_cast<CMPIType>(arrayType & static_cast<CMPIType>(~static_cast<unsigned>(CMPI_ARRAY)));
}

}  // namespace

std::string Value::text() const {
  const auto* held = std::get_if<std::string>(&content);
  return held == nullptr ? std::string() : *held;
}

std::uint64_t Value::number() const {
  if (const auto* held = std::get_if<std::int64_t>(&content)) return static_cast<std::uint64_t>(*held);
  const auto* held = std::get_if<std::uint64_t>(&content);
  return held == nullptr ? 0 : *held;
}

std::vector<Value> Value::elements() const {
  const auto* held = std::get_if<std::vector<Value>>(&content);
  return held == nullptr ? std::vector<Value>() : *held;
}

std::vector<std::string> Value::texts() const {
  std::vector<std::string> all;
  for (const Value& element : elements()) all.push_back(element.text());
  return all;
}

Path Value::path() const {
  const auto* held = std::get_if<std::shared_ptr<const Path>>(&content);
  return held == nullptr ? Path() : **held;
}

bool sameName(std::string_view left, std::string_view right) {
  return left.size() == right.size() && strncasecmp(left.data(), right.data(), left.size()) == 0;
}

const Value* findValue(const std::vector<NamedValue>& values, std::string_view name) {
  const auto found = std::find_if(values.begin(), values.end(),
                                  [name](const NamedValue& value) { return sameName(value.first, name); });
  return found == values.end() ? nullptr : &found->second;
}

void putValue(std::vector<NamedValue>& values, std::string_view name, Value value) {
  const auto found =
      std::find_if(values.begin(), values.end(), [name](const NamedValue& held) { return sameName(held.first, name); });
  if (found == values.end()) {
    values.emplace_back(name, std::move(value));
  } else {
    found->second = std::move(value);
  }
}

Path::Path(std::string name, std::string space) : nameSpace(std::move(space)), className(std::move(name)) {}

Path Path::key(std::string_view name, Value value) const {
  Path longer = *this;
  putValue(longer.keys, name, std::move(value));
  return longer;
}

Path Path::key(std::string_view name, const char* content) const { return key(name, Test::text(content)); }

Path Path::on(std::string hostName) const {
  Path other = *this;
  other.host = std::move(hostName);
  return other;
}

Path Path::in(std::string space) const {
  Path other = *this;
  other.nameSpace = std::move(space);
  return other;
}

Value Path::operator[](std::string_view name) const {
  const Value* found = findValue(keys, name);
  return found == nullptr ? null() : *found;
}

Instance::Instance(std::string className, std::string space) : path(std::move(className), std::move(space)) {}

Instance Instance::with(std::string_view name, Value value) const {
  Instance larger = *this;
  putValue(larger.properties, name, std::move(value));
  return larger;
}

Instance Instance::with(std::string_view name, const char* content) const { return with(name, Test::text(content)); }

Value Instance::operator[](std::string_view name) const {
  const Value* found = findValue(properties, name);
  return found == nullptr ? null() : *found;
}

std::vector<std::string> Instance::names() const {
  std::vector<std::string> all;
  for (const NamedValue& property : properties) all.push_back(property.first);
  return all;
}

bool operator==(const Value& left, const Value& right) {
  if (left.type != right.type || left.state != right.state) return false;
  const auto* path = std::get_if<std::shared_ptr<const Path>>(&left.content);
  if (path != nullptr && left.content.index() == right.content.index()) return **path == right.path();
  const auto* inner = std::get_if<std::shared_ptr<const Instance>>(&left.content);
  const auto* other = std::get_if<std::shared_ptr<const Instance>>(&right.content);
  if (inner != nullptr && other != nullptr) return **inner == **other;
  return left.content == right.content;
}

bool operator==(const Path& left, const Path& right) {
  return left.host == right.host && left.nameSpace == right.nameSpace && left.className == right.className &&
         left.keys == right.keys;
}

bool operator==(const Instance& left, const Instance& right) {
  return left.path == right.path && left.properties == right.properties;
}

Value chars(std::string text) { return made(CMPI_chars, std::move(text)); }
Value text(std::string text) { return made(CMPI_string, std::move(text)); }
Value uint8(std::uint8_t number) { return made(CMPI_uint8, std::uint64_t{number}); }
Value uint16(std::uint16_t number) { return made(CMPI_uint16, std::uint64_t{number}); }
Value uint32(std::uint32_t number) { return made(CMPI_uint32, std::uint64_t{number}); }
Value uint64(std::uint64_t number) { return made(CMPI_uint64, number); }
Value sint32(std::int32_t number) { return made(CMPI_sint32, std::int64_t{number}); }
Value boolean(bool value) { return made(CMPI_boolean, std::uint64_t{value}); }
Value ref(Path path) { return made(CMPI_ref, std::make_shared<const Path>(std::move(path))); }

Value texts(std::vector<std::string> elements) {
  std::vector<Value> values;
  for (std::string& element : elements) values.push_back(text(std::move(element)));
  return made(CMPI_stringA, std::move(values));
}

Value uint16s(std::vector<std::uint16_t> elements) {
  std::vector<Value> values;
  for (const std::uint16_t element : elements) values.push_back(uint16(element));
  return made(CMPI_uint16A, std::move(values));
}

Value list(CMPIType arrayType, std::vector<Value> elements) { return made(arrayType, std::move(elements)); }

Value null(CMPIType type, CMPIValueState state) { return {type, state, std::monostate()}; }

std::string nameOfType(CMPIType type) {
  const bool isArray = (type & CMPI_ARRAY) != 0;
  const CMPIType simple = isArray ? elementTypeOf(type) : type;
  const auto* found = std::find_if(kTypeNames.begin(), kTypeNames.end(),
                                   [simple](const TypeName& entry) { return entry.type == simple; });
  const std::string name = found == kTypeNames.end() ? "type " + std::to_string(type) : found->name;
  return name + (isArray ? "[]" : "");
}

std::string inQuotes(std::string_view text) {
  std::string line = "\"";
  for (const char c : text.substr(0, kLongestQuoted)) {
    const auto byte = static_cast<unsigned char>(c);
    if (c == '\n') {
      line += "\\n";
    } else if (c == '\t') {
      line += "\\t";
    } else if (c == '"' || c == '\\') {
      line += {'\\', c};
    } else if (byte < 0x20 || byte == 0x7f) {
      std::array<char, 8> code{};
      std::snprintf(code.data(), code.size(), "\\x%02x", unsigned{byte});
      line += code.data();
    } else {
      line += c;
    }
  }
  line += "\"";
  return text.size() <= kLongestQuoted ? line : line + "... (" + std::to_string(text.size()) + " bytes)";
}

std::string inQuotesOrNull(const char* text) { return text == nullptr ? "null" : inQuotes(text); }

std::string listInQuotes(const char* const* names) {
  if (names == nullptr) return "null";
  std::string line = "{";
  for (std::size_t i = 0; names[i] != nullptr; ++i) line += (i == 0 ? "" : ", ") + inQuotes(names[i]);
  return line + "}";
}

std::string describe(const Value& value) {
  if (value.isNull()) return "null";
  return nameOfType(value.type) + " " + describeContent(value);
}

std::string describe(const Path& path) {
  std::string line = path.className;
  const char* separator = ".";
  for (const auto& [name, value] : path.keys) {
    const bool isPath = std::holds_alternative<std::shared_ptr<const Path>>(value.content);
    line += separator + name + "=" + (isPath ? "(" + describeContent(value) + ")" : describeContent(value));
    separator = ",";
  }
  return line;
}

std::string describeWhole(const Path& path) {
  return (path.host.empty() ? "" : "//" + path.host + "/") + path.nameSpace + ":" + describe(path);
}

std::string describe(const Instance& instance) {
  std::string lines = instance.path.className + "\n";
  for (const auto& [name, value] : instance.properties) lines += "  " + name + " = " + describe(value) + "\n";
  return lines;
}

std::ostream& operator<<(std::ostream& out, const Value& value) { return out << describe(value); }
std::ostream& operator<<(std::ostream& out, const Path& path) { return out << describeWhole(path); }
std::ostream& operator<<(std::ostream& out, const Instance& instance) { return out << describe(instance); }

}  // namespace ZV::Test
