#include "cli/output/ValueText.h"

#include <algorithm>
#include <charconv>
#include <limits>
#include <vector>

#include "broker/objects/PathText.h"
#include "schema/Schema.h"

namespace zorva::cli {

namespace {

struct ScalarText {
  std::string operator()(std::monostate) const { return {}; }
  std::string operator()(bool value) const { return value ? "TRUE" : "FALSE"; }
  std::string operator()(std::uint64_t value) const { return std::to_string(value); }
  std::string operator()(std::int64_t value) const { return std::to_string(value); }
  std::string operator()(double value) const {
    char text[32];
    const auto end = std::to_chars(text, text + sizeof text, value).ptr;
    return {text, end};
  }
  std::string operator()(char16_t value) const { return std::to_string(static_cast<unsigned>(value)); }
  std::string operator()(const std::string& value) const { return value; }
  std::string operator()(const broker::Boxed<broker::ObjectPath>& value) const { return shortPathText(*value); }
  std::string operator()(const broker::Boxed<broker::Instance>& value) const { return shortPathText(value->path); }
};

/// A bound of a ValueMap entry; `open` is the value of a missing one.
std::optional<std::int64_t> bound(std::string_view text, std::int64_t open) {
  if (text.empty()) return open;
  const bool isHex = text.starts_with("0x") || text.starts_with("0X");
  if (isHex) text.remove_prefix(2);
  std::int64_t number = 0;
  const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number, isHex ? 16 : 10);
  if (error != std::errc() || end != text.data() + text.size()) return std::nullopt;
  return number;
}

/// True if a ValueMap entry ("7", "11..32767", "0x8000..") contains the number; ".." alone contains all numbers that no
/// other entry has.
bool holds(std::string_view entry, std::int64_t number) {
  if (entry.empty() || entry == "..") return false;
  const std::size_t dots = entry.find("..");
  if (dots == std::string_view::npos) return bound(entry, number) == number;
  const auto low = bound(entry.substr(0, dots), std::numeric_limits<std::int64_t>::min());
  const auto high = bound(entry.substr(dots + 2), std::numeric_limits<std::int64_t>::max());
  return low && high && *low <= number && number <= *high;
}

const std::vector<schema::Scalar>* arrayQualifier(const schema::ClassProperty& declaration, std::string_view name) {
  const schema::Qualifier* qualifier = schema::findQualifier(declaration.qualifiers, name);
  return qualifier != nullptr && qualifier->value ? &qualifier->value->elements : nullptr;
}

std::optional<std::int64_t> wholeNumber(const broker::Scalar& scalar) {
  if (const auto* number = std::get_if<std::uint64_t>(&scalar);
      number != nullptr && *number <= static_cast<std::uint64_t>(std::numeric_limits<std::int64_t>::max())) {
    return static_cast<std::int64_t>(*number);
  }
  if (const auto* number = std::get_if<std::int64_t>(&scalar)) return *number;
  return std::nullopt;
}

std::string elementText(const broker::Scalar& scalar, const schema::ClassProperty* declaration) {
  std::string text = scalarText(scalar);
  if (declaration == nullptr) return text;
  if (const std::optional<std::string> word = scalarWord(scalar, *declaration)) text += " (" + *word + ")";
  return text;
}

}  // namespace

std::string scalarText(const broker::Scalar& scalar) { return std::visit(ScalarText(), scalar); }

std::optional<std::string> valueWord(const schema::ClassProperty& declaration, std::int64_t number) {
  const std::vector<schema::Scalar>* map = arrayQualifier(declaration, "ValueMap");
  const std::vector<schema::Scalar>* words = arrayQualifier(declaration, "Values");
  if (map == nullptr || words == nullptr) return std::nullopt;
  for (std::size_t i = 0; i < std::min(map->size(), words->size()); ++i) {
    const auto* entry = std::get_if<std::string>(&(*map)[i]);
    const auto* word = std::get_if<std::string>(&(*words)[i]);
    if (entry != nullptr && word != nullptr && holds(*entry, number)) return *word;
  }
  return std::nullopt;
}

std::optional<std::string> scalarWord(const broker::Scalar& scalar, const schema::ClassProperty& declaration) {
  const std::optional<std::int64_t> number = wholeNumber(scalar);
  return number ? valueWord(declaration, *number) : std::nullopt;
}

std::string valueText(const broker::Value& value, const schema::ClassProperty* declaration) {
  if (value.isNull) return "NULL";
  if (!value.isArray) return elementText(value.scalar, declaration);
  std::string text;
  for (const broker::Scalar& element : value.elements) {
    if (&element != &value.elements.front()) text += ", ";
    text += elementText(element, declaration);
  }
  return text;
}

std::string shortPathText(const broker::ObjectPath& path) {
  broker::ObjectPath shortened = path;
  shortened.host.clear();
  if (schema::sameNamespace(shortened.nameSpace, "root/cimv2")) shortened.nameSpace.clear();
  return broker::pathText(shortened);
}

std::string propertyText(const broker::Instance& instance, std::string_view property) {
  const broker::Value* value = instance.property(property);
  return value == nullptr || value->isNull ? std::string() : valueText(*value, nullptr);
}

std::vector<std::string> propertyTexts(const broker::Instance& instance, std::string_view property) {
  const broker::Value* value = instance.property(property);
  std::vector<std::string> texts;
  if (value == nullptr || value->isNull) return texts;
  if (!value->isArray) return {scalarText(value->scalar)};
  for (const broker::Scalar& element : value->elements) texts.push_back(scalarText(element));
  return texts;
}

}  // namespace zorva::cli
