#include "agent/tree/Json.h"

#include <algorithm>
#include <iterator>
#include <memory>
#include <nlohmann/json.hpp>
#include <utility>

#include "util/ReadFile.h"
#include "util/Utf8.h"

namespace zorva::agent {
namespace {

constexpr char32_t kByteBase = 0x10EE00;

bool isByte(char32_t character) { return character >= kByteBase + 0x80 && character <= kByteBase + 0xFF; }

// A byte that is not UTF-8 becomes a character of a private plane, and so do the bytes of such a character.
std::string bytesToJson(std::string_view bytes) {
  std::string text;
  text.reserve(bytes.size());
  while (!bytes.empty()) {
    const std::size_t length = util::utf8Length(bytes);
    if (length != 0 && !isByte(util::utf8Decode(bytes))) {
      text += bytes.substr(0, length);
      bytes.remove_prefix(length);
    } else {
      util::utf8Append(text, kByteBase + static_cast<unsigned char>(bytes.front()));
      bytes.remove_prefix(1);
    }
  }
  return text;
}

std::string jsonToBytes(std::string_view text) {
  constexpr char kLeadOfPrivatePlane = '\xF4';
  if (text.find(kLeadOfPrivatePlane) == std::string_view::npos) return std::string(text);
  std::string bytes;
  bytes.reserve(text.size());
  while (!text.empty()) {
    const std::size_t length = util::utf8Length(text);
    if (length != 0 && isByte(util::utf8Decode(text))) {
      bytes += static_cast<char>(static_cast<unsigned char>(util::utf8Decode(text) - kByteBase));
    } else {
      bytes += text.substr(0, length == 0 ? 1 : length);
    }
    text.remove_prefix(length == 0 ? 1 : length);
  }
  return bytes;
}

// Passes the text to the parser and counts lines up to the last character that the parser read. That is the end of the
// current token, or for a number the character after it, which may be a line feed but is itself still on the line.
class LineCounter {
 public:
  using iterator_category = std::input_iterator_tag;
  using value_type = char;
  using difference_type = std::ptrdiff_t;
  using pointer = const char*;
  using reference = const char&;

  LineCounter(const char* place, int& line) : place_(place), line_(&line) {}
  reference operator*() const { return *place_; }
  LineCounter& operator++() {
    if (afterLineFeed_) ++*line_;
    afterLineFeed_ = *place_ == '\n';
    ++place_;
    return *this;
  }
  bool operator==(const LineCounter& other) const { return place_ == other.place_; }

 private:
  const char* place_;
  int* line_;
  bool afterLineFeed_ = false;
};

// Builds the value while the parser runs. The parser itself needs no stack for nested values.
class Builder final : public nlohmann::json_sax<nlohmann::json> {
 public:
  /// The line is that of the current event.
  Builder(const std::string& name, const int& line, std::size_t mostValues)
      : name_(name), line_(line), mostValues_(mostValues) {}

  JsonValue take() { return std::move(root_); }

  // The parser continues while the callbacks return true.
  bool null() override {
    place(JsonValue::Kind::Null);
    return true;
  }
  bool boolean(bool value) override {
    place(JsonValue::Kind::Boolean).boolean = value;
    return true;
  }
  bool number_integer(number_integer_t) override {
    place(JsonValue::Kind::OtherNumber);
    return true;
  }
  bool number_unsigned(number_unsigned_t value) override {
    place(JsonValue::Kind::Number).number = value;
    return true;
  }
  bool number_float(number_float_t, const string_t&) override {
    place(JsonValue::Kind::OtherNumber);
    return true;
  }
  bool string(string_t& value) override {
    place(JsonValue::Kind::Text).text = jsonToBytes(value);
    return true;
  }
  bool binary(binary_t&) override { return false; }  // JSON has none

  bool start_object(std::size_t) override { return open(JsonValue::Kind::Object); }
  bool key(string_t& value) override {
    open_.back()->keys.push_back(jsonToBytes(value));
    return true;
  }
  bool end_object() override {
    refuseRepeatedKeys(*open_.back());
    open_.pop_back();
    return true;
  }
  bool start_array(std::size_t) override { return open(JsonValue::Kind::List); }
  bool end_array() override {
    open_.pop_back();
    return true;
  }

  bool parse_error(std::size_t, const std::string&, const nlohmann::detail::exception& error) override {
    // "[json.exception.parse_error.101] parse error at line 1, column 2: what is wrong"
    const std::string text = error.what();
    const std::size_t place = text.find(": ");
    throw ConfigError(name_, line_, {}, place == std::string::npos ? text : text.substr(place + 2));
  }

 private:
  JsonValue& place(JsonValue::Kind kind) {
    JsonValue& value = open_.empty() ? root_ : open_.back()->items.emplace_back();
    value.kind = kind;
    value.line = line_;
    if (++values_ > mostValues_) {
      throw ConfigError(name_, value.line, {}, "has more than " + std::to_string(mostValues_) + " values");
    }
    return value;
  }

  bool open(JsonValue::Kind kind) {
    JsonValue& value = place(kind);
    if (open_.size() == kDeepestJson) {
      throw ConfigError(name_, value.line, {},
                        "lists and objects are nested more than " + std::to_string(kDeepestJson) + " deep");
    }
    open_.push_back(&value);
    return true;
  }

  void refuseRepeatedKeys(const JsonValue& object) const {
    std::vector<std::string_view> keys(object.keys.begin(), object.keys.end());
    std::sort(keys.begin(), keys.end());
    const auto repeated = std::adjacent_find(keys.begin(), keys.end());
    if (repeated != keys.end()) {
      throw ConfigError(name_, object.line, std::string(*repeated), "is given twice in one object");
    }
  }

  const std::string& name_;
  const int& line_;
  std::size_t mostValues_;
  std::size_t values_ = 0;
  JsonValue root_;
  // The lists and objects that are open. A pointer into items stays valid, because only the innermost one grows.
  std::vector<JsonValue*> open_;
};

constexpr std::size_t kIndent = 2;
constexpr std::size_t kOneLine = static_cast<std::size_t>(-1);  // for a depth

void format(std::string& text, const JsonValue& value, std::size_t depth);

void startLine(std::string& text, std::size_t depth) {
  if (depth == kOneLine) return;
  text += '\n';
  text.append(depth * kIndent, ' ');
}

std::string quoted(const std::string& bytes) { return nlohmann::json(bytesToJson(bytes)).dump(); }

// The elements of a list or the members of an object, each on its own line.
void formatItems(std::string& text, const JsonValue& value, std::size_t depth) {
  const std::size_t deeper = depth == kOneLine ? kOneLine : depth + 1;
  for (std::size_t i = 0; i < value.items.size(); ++i) {
    if (i != 0) text += ',';
    startLine(text, deeper);
    if (!value.keys.empty()) text += quoted(value.keys[i]) + (depth == kOneLine ? ":" : ": ");
    format(text, value.items[i], deeper);
  }
  if (!value.items.empty()) startLine(text, depth);
}

void format(std::string& text, const JsonValue& value, std::size_t depth) {
  switch (value.kind) {
    case JsonValue::Kind::Boolean:
      text += value.boolean ? "true" : "false";
      return;
    case JsonValue::Kind::Number:
      text += std::to_string(value.number);
      return;
    case JsonValue::Kind::Text:
      text += quoted(value.text);
      return;
    case JsonValue::Kind::List:
    case JsonValue::Kind::Object: {
      const bool isList = value.kind == JsonValue::Kind::List;
      text += isList ? '[' : '{';
      formatItems(text, value, depth);
      text += isList ? ']' : '}';
      return;
    }
    default:
      text += "null";  // never reached: the agent's values have no such kinds
  }
}

}  // namespace

JsonValue JsonValue::ofText(std::string text) {
  JsonValue value;
  value.kind = Kind::Text;
  value.text = std::move(text);
  return value;
}

JsonValue JsonValue::ofNumber(std::uint64_t number) {
  JsonValue value;
  value.kind = Kind::Number;
  value.number = number;
  return value;
}

JsonValue JsonValue::ofBoolean(bool boolean) {
  JsonValue value;
  value.kind = Kind::Boolean;
  value.boolean = boolean;
  return value;
}

JsonValue JsonValue::ofTexts(const std::vector<std::string>& texts) {
  JsonValue value = list();
  for (const std::string& text : texts) value.add(ofText(text));
  return value;
}

JsonValue JsonValue::list() {
  JsonValue value;
  value.kind = Kind::List;
  return value;
}

JsonValue JsonValue::object() {
  JsonValue value;
  value.kind = Kind::Object;
  return value;
}

void JsonValue::add(std::string key, JsonValue value) {
  keys.push_back(std::move(key));
  items.push_back(std::move(value));
}

void JsonValue::add(JsonValue value) { items.push_back(std::move(value)); }

const JsonValue* JsonValue::find(std::string_view key) const {
  const auto found = std::find(keys.begin(), keys.end(), key);
  return found == keys.end() ? nullptr : &items[static_cast<std::size_t>(found - keys.begin())];
}

JsonValue parseJson(const std::string& text, const std::string& name, std::size_t mostValues) {
  if (text.size() > kLargestJson) throw ConfigError(name, 0, {}, "is larger than 64 MiB");
  int line = 1;
  Builder builder(name, line, mostValues);
  nlohmann::json::sax_parse(LineCounter(text.data(), line), LineCounter(text.data() + text.size(), line), &builder);
  return builder.take();
}

JsonValue readJsonFile(const std::string& path) {
  const util::FileText file = util::readFile(path, kLargestJson);
  if (file.error != 0) throw ConfigError(path, 0, {}, "cannot be read: " + util::fileErrorText(file.error));
  if (file.truncated) throw ConfigError(path, 0, {}, "is larger than 64 MiB");
  return parseJson(file.text, path);
}

std::string formatJsonLine(const JsonValue& value) {
  std::string text;
  format(text, value, kOneLine);
  return text;
}

std::string formatJson(const JsonValue& value) {
  std::string text;
  format(text, value, 0);
  return text + '\n';
}

}  // namespace zorva::agent
