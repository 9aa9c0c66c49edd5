#include "broker/objects/PathText.h"

#include <algorithm>
#include <charconv>
#include <system_error>

#include "util/Names.h"
#include "util/Utf8.h"

namespace zorva::broker {

namespace {

bool isLetter(char c) noexcept { return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z'); }
bool isDigit(char c) noexcept { return c >= '0' && c <= '9'; }
// CIM names may contain any character of the Basic Multilingual Plane from U+0080 on (DSP0004 5.1.2.1).
bool startsName(char c) noexcept { return isLetter(c) || c == '_' || static_cast<unsigned char>(c) >= 0x80; }
bool continuesName(char c) noexcept { return startsName(c) || isDigit(c); }

int hexDigit(char c) noexcept {
  if (isDigit(c)) return c - '0';
  if (c >= 'a' && c <= 'f') return c - 'a' + 10;
  if (c >= 'A' && c <= 'F') return c - 'A' + 10;
  return -1;
}

class Reader {
 public:
  explicit Reader(std::string_view text) : text_(text) {}

  Expected<ObjectPath, PathTextError> read() {
    if (text_.size() > kMaxPathText) {
      return unexpected(PathTextError{kMaxPathText, "the path is " + std::to_string(text_.size()) +
                                                        " bytes long; at most " + std::to_string(kMaxPathText) +
                                                        " are read"});
    }
    ObjectPath path;
    if (readHost(path) && readNameSpace(path) && readName("a class name", path.className) && readKeys(path)) {
      return path;
    }
    return unexpected(std::move(error_));
  }

 private:
  bool atEnd() const noexcept { return position_ == text_.size(); }
  char peek() const noexcept { return atEnd() ? '\0' : text_[position_]; }

  std::string found() const {
    if (atEnd()) return "the end of the text";
    const auto c = static_cast<unsigned char>(text_[position_]);
    if (c < 0x20 || c >= 0x7F) return "a byte of value " + std::to_string(c);
    return std::string("'") + text_[position_] + "'";
  }

  bool fail(std::string message) { return failAt(position_, std::move(message)); }
  bool failAt(std::size_t position, std::string message) {
    error_ = {position, std::move(message)};
    return false;
  }
  bool expected(std::string_view what) { return fail("expected " + std::string(what) + ", found " + found()); }

  // "//host/": the host ends at the next slash.
  bool readHost(ObjectPath& path) {
    if (text_.substr(0, 2) != "//") return true;
    const std::size_t slash = text_.find('/', 2);
    if (slash == std::string_view::npos) {
      position_ = text_.size();
      return expected("'/' after the host's name");
    }
    position_ = 2;
    if (slash == 2) return expected("the host's name");
    path.host = text_.substr(2, slash - 2);
    position_ = slash + 1;
    return true;
  }

  // "root/cimv2:": there is a namespace if a colon comes before the first character that can only follow the class
  // name.
  bool readNameSpace(ObjectPath& path) {
    const std::size_t colon = text_.find_first_of(":.=\"", position_);
    if (colon == std::string_view::npos || text_[colon] != ':') {
      if (path.host.empty()) return true;
      return colon == std::string_view::npos ? fail("expected a namespace and ':' after the host's name")
                                             : fail("expected a namespace and ':' before the class name");
    }
    const std::string_view nameSpace = text_.substr(position_, colon - position_);
    const auto bad = std::find_if(nameSpace.begin(), nameSpace.end(),
                                  [](char c) { return !continuesName(c) && c != '/' && c != '-'; });
    if (bad != nameSpace.end()) {
      position_ += static_cast<std::size_t>(bad - nameSpace.begin());
      return expected("a namespace of names and '/'");
    }
    if (nameSpace.empty()) return expected("a namespace");
    path.nameSpace = nameSpace;
    position_ = colon + 1;
    return true;
  }

  bool readName(std::string_view what, std::string& name) {
    if (atEnd() || !startsName(peek())) return expected(what);
    const std::size_t start = position_;
    while (!atEnd() && continuesName(peek())) ++position_;
    name = text_.substr(start, position_ - start);
    return true;
  }

  bool readKeys(ObjectPath& path) {
    if (atEnd()) return true;
    if (peek() != '.') return expected("'.' and a key, or the end of the text");
    do {
      ++position_;
      const std::size_t start = position_;
      NamedValue key;
      if (!readName("a key's name", key.name)) return false;
      if (path.key(key.name) != nullptr) return failAt(start, "the key " + key.name + " is there already");
      // Each key is compared with all keys before it, so the cost is quadratic. No real path has this many keys.
      if (path.keys.size() >= 256) return failAt(start, "more than 256 keys");
      if (peek() != '=' || atEnd()) return expected("'=' after the key's name");
      ++position_;
      if (!readValue(key.value)) return false;
      path.keys.push_back(std::move(key));
    } while (peek() == ',' && !atEnd());
    return atEnd() || expected("',' and a further key, or the end of the text");
  }

  bool readValue(Value& value) {
    if (peek() == '"') return readText(value);
    if (isLetter(peek())) return readBoolean(value);
    if (isDigit(peek()) || peek() == '-' || peek() == '+' || peek() == '.') return readNumber(value);
    return expected("a value (a text in quotes, a number, TRUE or FALSE)");
  }

  bool readText(Value& value) {
    const std::size_t opening = position_;
    std::string text;
    ++position_;
    while (peek() != '"' || atEnd()) {
      if (atEnd()) return failAt(opening, "the quotes that open here are not closed");
      if (peek() == '\\') {
        if (!readEscape(text)) return false;
      } else {
        text += text_[position_++];
      }
    }
    ++position_;
    value = Value::text(std::move(text));
    return true;
  }

  bool readEscape(std::string& text) {
    const std::size_t start = position_++;
    constexpr std::string_view kEscapes = "\"\\'ntrbf";
    constexpr std::string_view kMeanings = "\"\\'\n\t\r\b\f";
    const std::size_t which = atEnd() ? std::string_view::npos : kEscapes.find(peek());
    if (which != std::string_view::npos) {
      text += kMeanings[which];
      ++position_;
      return true;
    }
    if (atEnd() || (peek() != 'x' && peek() != 'X')) {
      return expected("one of \" \\ ' n t r b f x after the backslash");
    }
    ++position_;
    unsigned code = 0;
    int digits = 0;
    for (; digits < 4 && !atEnd() && hexDigit(peek()) >= 0; ++digits) {
      code = code * 16 + static_cast<unsigned>(hexDigit(text_[position_++]));
    }
    if (digits == 0) return expected("one to four hexadecimal digits after \\x");
    if (code == 0 || (code >= 0xD800 && code <= 0xDFFF)) return failAt(start, "this \\x names no character");
    util::utf8Append(text, code);
    return true;
  }

  bool readBoolean(Value& value) {
    const std::size_t start = position_;
    while (!atEnd() && continuesName(peek())) ++position_;
    const std::string_view word = text_.substr(start, position_ - start);
    if (util::sameName(word, "true") || util::sameName(word, "false")) {
      value = Value::boolean(util::sameName(word, "true"));
      return true;
    }
    position_ = start;
    return fail("expected a value (a text in quotes, a number, TRUE or FALSE), found '" +
                std::string(word.substr(0, 40)) + "'; a text needs quotes");
  }

  bool readNumber(Value& value) {
    const std::size_t start = position_;
    while (!atEnd() && (isDigit(peek()) || isLetter(peek()) || peek() == '-' || peek() == '+' || peek() == '.')) {
      ++position_;
    }
    std::string_view word = text_.substr(start, position_ - start);
    if (word.front() == '+') word.remove_prefix(1);
    if (parseWhole(word, value)) return true;
    position_ = start;
    return fail("expected a number of at most 64 bits, found '" + std::string(word.substr(0, 40)) + "'");
  }

  static bool parseWhole(std::string_view word, Value& value) {
    std::uint64_t natural = 0;
    std::int64_t integer = 0;
    double real = 0;
    const char* end = word.data() + word.size();
    const auto reads = [&](auto& number) {
      const auto result = std::from_chars(word.data(), end, number);
      return result.ec == std::errc() && result.ptr == end;
    };
    if (reads(natural)) {
      value = Value::unsignedNumber(natural);
    } else if (reads(integer)) {
      value = Value::signedNumber(integer);
    } else if (word.find('.') != std::string_view::npos && reads(real)) {
      value = Value::null(schema::Type::Real64);
      value.isNull = false;
      value.scalar = real;
    } else {
      return false;
    }
    return true;
  }

  std::string_view text_;
  std::size_t position_ = 0;
  PathTextError error_;
};

std::string realText(double number) {
  char buffer[40];
  const auto result = std::to_chars(buffer, buffer + sizeof buffer, number);
  std::string text(buffer, result.ptr);
  // Without a point the reader takes it for an integer, or refuses it if it has an exponent.
  if (text.find('.') == std::string::npos && text.find_first_of("in") == std::string::npos) {
    text.insert(std::min(text.find('e'), text.size()), ".0");
  }
  return text;
}

struct ScalarText {
  std::string operator()(std::monostate) const { return "NULL"; }
  std::string operator()(bool value) const { return value ? "TRUE" : "FALSE"; }
  std::string operator()(std::uint64_t number) const { return std::to_string(number); }
  std::string operator()(std::int64_t number) const { return std::to_string(number); }
  std::string operator()(double number) const { return realText(number); }
  std::string operator()(char16_t code) const {
    std::string text;
    util::utf8Append(text, code);
    return quotedText(text);
  }
  std::string operator()(const std::string& text) const { return quotedText(text); }
  std::string operator()(const Boxed<ObjectPath>& path) const { return quotedText(pathText(*path)); }
  std::string operator()(const Boxed<Instance>& instance) const { return quotedText(pathText(instance->path)); }
};

}  // namespace

Expected<ObjectPath, PathTextError> parsePathText(std::string_view text) { return Reader(text).read(); }

std::string pathText(const ObjectPath& path) {
  std::string text;
  // A host is written only before a namespace: the syntax has no other place for it.
  if (!path.host.empty() && !path.nameSpace.empty()) text += "//" + path.host + "/";
  if (!path.nameSpace.empty()) text += path.nameSpace + ":";
  text += path.className;
  char separator = '.';
  for (const NamedValue& key : path.keys) {
    text += separator + key.name + "=" + std::visit(ScalarText(), key.value.scalar);
    separator = ',';
  }
  return text;
}

std::string literalText(const Value& value) {
  if (value.isNull) return "NULL";
  if (!value.isArray) return std::visit(ScalarText(), value.scalar);
  std::string text = "{";
  for (const Scalar& element : value.elements) {
    text += (text.size() > 1 ? ", " : "") + std::visit(ScalarText(), element);
  }
  return text + "}";
}

std::string quotedText(std::string_view text) {
  std::string quoted = "\"";
  for (const char c : text) {
    switch (c) {
      case '"':
        quoted += "\\\"";
        break;
      case '\\':
        quoted += "\\\\";
        break;
      case '\n':
        quoted += "\\n";
        break;
      case '\t':
        quoted += "\\t";
        break;
      case '\r':
        quoted += "\\r";
        break;
      case '\b':
        quoted += "\\b";
        break;
      case '\f':
        quoted += "\\f";
        break;
      default:
        quoted += c;
    }
  }
  return quoted + "\"";
}

}  // namespace zorva::broker
