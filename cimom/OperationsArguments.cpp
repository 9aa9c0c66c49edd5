#include "cimom/OperationsArguments.h"

#include <cmpidt.h>

#include <charconv>

#include "util/Names.h"

namespace zorva::cimom {

namespace {

const cimxml::ParameterValue kNone;

bool isNone(const cimxml::ParameterValue* value) noexcept { return std::holds_alternative<std::monostate>(*value); }

}  // namespace

const cimxml::ParameterValue* Arguments::take(std::string_view name) {
  for (std::size_t i = 0; i < call_.parameters.size(); ++i) {
    if (!util::sameName(call_.parameters[i].name, name)) continue;
    taken_[i] = true;
    return &call_.parameters[i].value;
  }
  return &kNone;
}

void Arguments::refuse(std::string_view name, std::string_view wanted) {
  if (problem_.empty()) problem_ = call_.name + ": the parameter " + std::string(name) + " " + std::string(wanted);
}

bool Arguments::boolean(std::string_view name, bool otherwise) {
  const cimxml::ParameterValue* value = take(name);
  if (isNone(value)) return otherwise;
  const auto* text = std::get_if<std::string>(value);
  if (text != nullptr && util::sameName(*text, "true")) return true;
  if (text != nullptr && util::sameName(*text, "false")) return false;
  refuse(name, "must be TRUE or FALSE");
  return otherwise;
}

std::optional<std::uint64_t> Arguments::number(std::string_view name) {
  const cimxml::ParameterValue* value = take(name);
  if (isNone(value)) return std::nullopt;
  std::uint32_t number = 0;
  if (const auto* text = std::get_if<std::string>(value)) {
    const char* const end = text->data() + text->size();
    const auto result = std::from_chars(text->data(), end, number);
    if (result.ec == std::errc() && result.ptr == end) return number;
  }
  refuse(name, "must be a uint32");
  return std::nullopt;
}

std::optional<std::string> Arguments::text(std::string_view name) {
  const cimxml::ParameterValue* value = take(name);
  if (isNone(value)) return std::nullopt;
  if (const auto* text = std::get_if<std::string>(value)) return *text;
  refuse(name, "must be a text");
  return std::nullopt;
}

std::optional<std::vector<std::string>> Arguments::names(std::string_view name) {
  const cimxml::ParameterValue* value = take(name);
  if (isNone(value)) return std::nullopt;
  std::vector<std::string> names;
  if (const auto* list = std::get_if<cimxml::TextList>(value)) {
    for (const std::optional<std::string>& one : *list) {
      if (one) names.push_back(*one);
    }
    return names;
  }
  refuse(name, "must be an array of texts");
  return std::nullopt;
}

std::string Arguments::className(std::string_view name) {
  const cimxml::ParameterValue* value = take(name);
  if (isNone(value)) return {};
  if (const auto* known = std::get_if<cimxml::ClassName>(value)) return known->name;
  // Some clients send the name as a plain text.
  if (const auto* text = std::get_if<std::string>(value)) return *text;
  refuse(name, "must be the name of a class");
  return {};
}

std::string Arguments::requiredText(std::string_view name) {
  std::optional<std::string> given = text(name);
  if (!given) refuse(name, "is missing");
  return std::move(given).value_or("");
}

std::string Arguments::requiredClassName(std::string_view name) {
  std::string given = className(name);
  if (given.empty()) refuse(name, "is missing");
  return given;
}

broker::ObjectPath Arguments::requiredPath(std::string_view name) {
  const cimxml::ParameterValue* value = take(name);
  if (const auto* path = std::get_if<broker::ObjectPath>(value)) return *path;
  refuse(name, isNone(value) ? "is missing" : "must be the name of an instance");
  return {};
}

broker::Instance Arguments::requiredInstance(std::string_view name) {
  const cimxml::ParameterValue* value = take(name);
  if (const auto* instance = std::get_if<broker::Instance>(value)) return *instance;
  refuse(name, isNone(value) ? "is missing" : "must be an instance");
  return {};
}

broker::ObjectPath Arguments::requiredObject(std::string_view name, bool& isClass) {
  const cimxml::ParameterValue* value = take(name);
  isClass = std::holds_alternative<cimxml::ClassName>(*value);
  if (const auto* known = std::get_if<cimxml::ClassName>(value)) return {"", "", known->name, {}};
  if (const auto* path = std::get_if<broker::ObjectPath>(value)) return *path;
  refuse(name, isNone(value) ? "is missing" : "must be the name of an instance or a class");
  return {};
}

broker::Value Arguments::value(std::string_view name) {
  const cimxml::ParameterValue* value = take(name);
  if (isNone(value)) return broker::Value::null(schema::Type::String);
  if (const auto* text = std::get_if<std::string>(value)) return broker::Value::text(*text);
  if (const auto* path = std::get_if<broker::ObjectPath>(value)) return broker::Value::reference(*path);
  if (const auto* list = std::get_if<cimxml::TextList>(value)) {
    std::vector<broker::Scalar> elements;
    for (const std::optional<std::string>& one : *list) {
      elements.push_back(one ? broker::Scalar(*one) : broker::Scalar());
    }
    return broker::Value::array(schema::Type::String, std::move(elements));
  }
  refuse(name, "must be a value");
  return broker::Value::null(schema::Type::String);
}

broker::Status Arguments::status() const {
  if (!problem_.empty()) return {CMPI_RC_ERR_INVALID_PARAMETER, problem_};
  for (std::size_t i = 0; i < taken_.size(); ++i) {
    if (taken_[i]) continue;
    return {CMPI_RC_ERR_INVALID_PARAMETER, call_.name + " has no parameter " + call_.parameters[i].name};
  }
  return {};
}

}  // namespace zorva::cimom
