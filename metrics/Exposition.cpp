#include "metrics/Exposition.h"

#include <charconv>
#include <cmath>

#include "util/Utf8.h"

namespace zorva::metrics {

namespace {

constexpr std::string_view kReplacement = "\xEF\xBF\xBD";  // U+FFFD

const char* wordOf(Type type) noexcept {
  switch (type) {
    case Type::Counter:
      return "counter";
    case Type::Histogram:
      return "histogram";
    case Type::Gauge:
      break;
  }
  return "gauge";
}

void appendCharacter(std::string& out, std::string_view character) {
  if (character == "\n") {
    out += "\\n";
  } else {
    if (character == "\"" || character == "\\") out += '\\';
    out += character;
  }
}

/// A byte that is not UTF-8 becomes the replacement character.
void appendLabelValue(std::string& out, std::string_view value) {
  const std::size_t end = out.size() + Exposition::kLongestLabel;
  while (!value.empty()) {
    const std::size_t length = util::utf8Length(value);
    const std::string_view character = length == 0 ? kReplacement : value.substr(0, length);
    if (out.size() + character.size() > end) return;
    appendCharacter(out, character);
    value.remove_prefix(length == 0 ? 1 : length);
  }
}

void appendNumber(std::string& out, double value) {
  if (std::isnan(value)) {
    out += "NaN";
  } else if (std::isinf(value)) {
    out += value < 0 ? "-Inf" : "+Inf";
  } else {
    char digits[32];
    out.append(digits, std::to_chars(digits, digits + sizeof digits, value).ptr);
  }
}

}  // namespace

void Exposition::family(std::string_view name, Type type, std::string_view help) {
  name_ = name;
  type_ = type;
  help_ = help;
  isBegun_ = false;
}

void Exposition::beginFamily() {
  if (isBegun_) return;
  isBegun_ = true;
  text_ += "# HELP " + name_ + " " + help_ + "\n# TYPE " + name_ + " " + wordOf(type_) + "\n";
}

void Exposition::sample(Labels labels, double value) { sample({}, labels, value); }

void Exposition::sample(std::string_view suffix, Labels labels, double value) {
  beginFamily();
  text_ += name_;
  text_ += suffix;
  char before = '{';
  for (const auto& [name, labelValue] : labels) {
    text_ += before;
    text_ += name;
    text_ += "=\"";
    appendLabelValue(text_, labelValue);
    text_ += '"';
    before = ',';
  }
  if (before == ',') text_ += '}';
  text_ += ' ';
  appendNumber(text_, value);
  text_ += '\n';
}

void Exposition::single(std::string_view name, Type type, std::string_view help, double value) {
  family(name, type, help);
  sample({}, value);
}

void Exposition::append(const Exposition& other) { text_ += other.text_; }

}  // namespace zorva::metrics
