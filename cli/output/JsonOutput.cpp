#include "cli/output/JsonOutput.h"

#include "broker/objects/PathText.h"
#include "cli/output/JsonDocument.h"
#include "cli/output/Text.h"
#include "cli/output/ValueText.h"

namespace zorva::cli {

namespace {

Json ofScalar(const broker::Scalar& scalar) {
  if (const auto* value = std::get_if<bool>(&scalar)) return *value;
  if (const auto* value = std::get_if<std::uint64_t>(&scalar)) return *value;
  if (const auto* value = std::get_if<std::int64_t>(&scalar)) return *value;
  if (const auto* value = std::get_if<double>(&scalar)) return *value;
  if (const auto* value = std::get_if<char16_t>(&scalar)) return static_cast<unsigned>(*value);
  if (std::holds_alternative<std::monostate>(scalar)) return nullptr;
  if (const auto* value = std::get_if<broker::Boxed<broker::ObjectPath>>(&scalar)) {
    return asUtf8(broker::pathText(**value));
  }
  return asUtf8(scalarText(scalar));
}

Json ofValue(const broker::Value& value) {
  if (value.isNull) return nullptr;
  if (!value.isArray) return ofScalar(value.scalar);
  Json list = Json::array();
  for (const broker::Scalar& element : value.elements) list.push_back(ofScalar(element));
  return list;
}

/// The word that the class has for a number, or for each of several; null where it has none.
Json wordsOf(const broker::Property& property) {
  if (property.declaration == nullptr || property.value.isNull) return nullptr;
  const auto wordOf = [&property](const broker::Scalar& scalar) {
    const auto word = scalarWord(scalar, *property.declaration);
    return word ? Json(asUtf8(*word)) : Json(nullptr);
  };
  if (!property.value.isArray) return wordOf(property.value.scalar);
  Json words = Json::array();
  bool hasOne = false;
  for (const broker::Scalar& element : property.value.elements) {
    words.push_back(wordOf(element));
    hasOne = hasOne || !words.back().is_null();
  }
  return hasOne ? words : Json(nullptr);
}

Json ofInstance(const broker::Instance& instance) {
  Json json;
  json["class"] = instance.path.className;
  json["path"] = asUtf8(broker::pathText(instance.path));
  json["properties"] = Json::object();
  for (const broker::Property& property : instance.properties) {
    json["properties"][property.name] = ofValue(property.value);
  }
  json["words"] = Json::object();
  for (const broker::Property& property : instance.properties) {
    if (Json words = wordsOf(property); !words.is_null()) json["words"][property.name] = std::move(words);
  }
  return json;
}

}  // namespace

std::string instanceDocument(const broker::Instance& instance) { return documentText(ofInstance(instance)); }

std::string instanceJson(const broker::Instance& instance, std::size_t depth) {
  const std::string text = ofInstance(instance).dump(2);
  std::string shifted;
  for (const char c : text) {
    shifted += c;
    if (c == '\n') shifted.append(depth, ' ');
  }
  return shifted;
}

std::string pathJson(const broker::ObjectPath& path) { return Json(asUtf8(broker::pathText(path))).dump(); }

std::string methodResultJson(const broker::MethodResult& result) {
  Json json;
  json["return_value"] = ofValue(result.returnValue);
  json["output"] = Json::object();
  for (const broker::NamedValue& output : result.output) json["output"][output.name] = ofValue(output.value);
  return documentText(json);
}

std::string methodCallJson(const broker::ObjectPath& path, const std::string& method,
                           const std::vector<broker::NamedValue>& input) {
  Json json;
  json["path"] = asUtf8(broker::pathText(path));
  json["method"] = method;
  json["input"] = Json::object();
  for (const broker::NamedValue& each : input) json["input"][each.name] = ofValue(each.value);
  return documentText(json);
}

std::string textsJson(const std::vector<std::string>& texts) { return documentText(jsonOfTexts(texts)); }

}  // namespace zorva::cli
