#include "cli/session/Assignments.h"

#include <algorithm>
#include <charconv>

#include "cli/output/Failure.h"
#include "cli/output/Text.h"
#include "cli/session/Paths.h"
#include "util/Names.h"
#include "util/Utf8.h"

namespace zorva::cli {

namespace {

constexpr std::size_t kShownText = 60;

/// The text for an error, at most one line.
std::string quoted(std::string_view text) {
  const bool isLong = text.size() > kShownText;
  return "'" + printable(text.substr(0, isLong ? util::utf8Cut(text, kShownText) : text.size())) +
         (isLong ? "...'" : "'");
}

Failure wrongValue(const TypedName& declared, std::string_view text, const std::string& why) {
  return {ExitCode::WrongUsage, declared.name + "=" + quoted(text) + ": " + why};
}

template <typename Number>
broker::Scalar parseNumber(const TypedName& declared, std::string_view text) {
  const bool isNegative = text.starts_with('-');
  std::string digits(text.substr(isNegative ? 1 : 0));
  const bool isHex = digits.starts_with("0x") || digits.starts_with("0X");
  if (isHex) digits.erase(0, 2);
  if (digits.starts_with('-')) digits.clear();  // a second sign; the empty text is no number
  if (isNegative) digits.insert(digits.begin(), '-');
  Number number = 0;
  const char* const end = digits.data() + digits.size();
  const auto read = std::from_chars(digits.data(), end, number, isHex ? 16 : 10);
  if (read.ec == std::errc::result_out_of_range) {
    throw wrongValue(declared, text, "does not fit in " + std::string(schema::typeName(declared.type)));
  }
  if (read.ec != std::errc() || read.ptr != end) {
    throw wrongValue(declared, text, "a " + std::string(schema::typeName(declared.type)) + " is wanted");
  }
  return number;
}

broker::Scalar parseReal(const TypedName& declared, std::string_view text) {
  double number = 0;
  const auto read = std::from_chars(text.data(), text.data() + text.size(), number);
  if (read.ec != std::errc() || read.ptr != text.data() + text.size()) {
    throw wrongValue(declared, text, "a number is wanted");
  }
  return number;
}

broker::Scalar parseBoolean(const TypedName& declared, std::string_view text) {
  for (const bool value : {true, false}) {
    if (util::sameName(text, value ? "true" : "false")) return value;
  }
  throw wrongValue(declared, text, "true or false is wanted");
}

broker::Scalar parseCharacter(const TypedName& declared, std::string_view text) {
  const std::size_t length = util::utf8Length(text);
  if (length == 0 || length != text.size() || length > 3) throw wrongValue(declared, text, "one character is wanted");
  return static_cast<char16_t>(util::utf8Decode(text));
}

/// Checks that the value fits in its type.
void requireFitting(const TypedName& declared, std::string_view text, const broker::Scalar& scalar) {
  schema::Value value;
  if (const auto* number = std::get_if<std::uint64_t>(&scalar)) value = schema::Value::of(*number);
  if (const auto* number = std::get_if<std::int64_t>(&scalar)) value = schema::Value::of(*number);
  if (const auto* string = std::get_if<std::string>(&scalar)) value = schema::Value::of(*string);
  if (const auto problem = schema::fitValue(value, declared.type, false)) throw wrongValue(declared, text, *problem);
}

broker::Scalar parseScalar(const TypedName& declared, const std::string& text) {
  requirePlainText(declared.name, text);
  if (declared.type == schema::Type::Boolean) return parseBoolean(declared, text);
  if (declared.type == schema::Type::Char16) return parseCharacter(declared, text);
  if (declared.type == schema::Type::Reference) return broker::Boxed<broker::ObjectPath>(readPath(text));
  if (schema::isReal(declared.type)) return parseReal(declared, text);
  broker::Scalar scalar = text;
  if (schema::isUnsigned(declared.type)) scalar = parseNumber<std::uint64_t>(declared, text);
  if (schema::isSigned(declared.type)) scalar = parseNumber<std::int64_t>(declared, text);
  requireFitting(declared, text, scalar);
  return scalar;
}

}  // namespace

void requirePlainText(std::string_view what, std::string_view text) {
  for (std::size_t at = 0; at < text.size();) {
    const std::size_t length = util::utf8Length(text.substr(at));
    const std::uint32_t code = length == 0 ? 0 : util::utf8Decode(text.substr(at));
    if (length == 0 || code < 0x20 || (code >= 0x7F && code < 0xA0)) {
      throw Failure(ExitCode::WrongUsage, printable(what) + "=" + quoted(text) + ": byte " + std::to_string(at + 1) +
                                              (length == 0 ? " is no UTF-8" : " is a control character"));
    }
    at += length;
  }
}

broker::Value parseValue(const TypedName& declared, const std::vector<std::string>& texts) {
  const bool isOne = texts.size() == 1;
  if (isOne && texts.front() == "null") return broker::Value::null(declared.type, declared.isArray);
  if (declared.isArray) {
    std::vector<broker::Scalar> elements;
    if (isOne && texts.front().empty()) return broker::Value::array(declared.type, {});
    for (const std::string& text : texts) elements.push_back(parseScalar(declared, text));
    return broker::Value::array(declared.type, std::move(elements));
  }
  if (!isOne) {
    throw Failure(ExitCode::WrongUsage, declared.name + " is given " + std::to_string(texts.size()) +
                                            " times and takes one value; only an array takes several");
  }
  broker::Value value = broker::Value::null(declared.type);
  value.isNull = false;
  value.scalar = parseScalar(declared, texts.front());
  return value;
}

std::vector<Assignment> parseAssignments(const std::vector<std::string>& words) {
  std::vector<Assignment> assignments;
  for (const std::string& word : words) {
    const std::size_t equals = word.find('=');
    if (equals == std::string::npos || equals == 0) {
      throw Failure(ExitCode::WrongUsage, quoted(word) + " is no assignment",
                    "write NAME=VALUE; NAME= for the empty value, NAME=null for none at all");
    }
    const std::string name = word.substr(0, equals);
    auto same = std::find_if(assignments.begin(), assignments.end(),
                             [&name](const Assignment& other) { return util::sameName(other.name, name); });
    if (same == assignments.end()) same = assignments.insert(assignments.end(), {name, {}});
    same->texts.push_back(word.substr(equals + 1));
  }
  return assignments;
}

}  // namespace zorva::cli
