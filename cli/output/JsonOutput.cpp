#include "cli/output/JsonOutput.h"

#include <nlohmann/json.hpp>

#include "broker/objects/PathText.h"
#include "cli/output/Text.h"
#include "cli/output/ValueText.h"

namespace zorva::cli {

namespace {

using Json = nlohmann::ordered_json;

std::string dumped(const Json& json) { return json.dump(2); }

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

Json ofTexts(const std::vector<std::string>& texts) {
  Json list = Json::array();
  for (const std::string& text : texts) list.push_back(asUtf8(text));
  return list;
}

}  // namespace

std::string instanceJson(const broker::Instance& instance, std::size_t depth) {
  Json json;
  json["class"] = instance.path.className;
  json["path"] = asUtf8(broker::pathText(instance.path));
  json["properties"] = Json::object();
  for (const broker::Property& property : instance.properties) {
    json["properties"][property.name] = ofValue(property.value);
  }
  const std::string text = dumped(json);
  std::string shifted;
  for (const char c : text) {
    shifted += c;
    if (c == '\n') shifted.append(depth, ' ');
  }
  return shifted;
}

std::string pathJson(const broker::ObjectPath& path) { return dumped(asUtf8(broker::pathText(path))); }

std::string methodResultJson(const broker::MethodResult& result) {
  Json json;
  json["return_value"] = ofValue(result.returnValue);
  json["output"] = Json::object();
  for (const broker::NamedValue& output : result.output) json["output"][output.name] = ofValue(output.value);
  return dumped(json);
}

std::string methodCallJson(const broker::ObjectPath& path, const std::string& method,
                           const std::vector<broker::NamedValue>& input) {
  Json json;
  json["path"] = asUtf8(broker::pathText(path));
  json["method"] = method;
  json["input"] = Json::object();
  for (const broker::NamedValue& each : input) json["input"][each.name] = ofValue(each.value);
  return dumped(json);
}

std::string textsJson(const std::vector<std::string>& texts) { return dumped(ofTexts(texts)); }

}  // namespace zorva::cli
