#pragma once

// JSON documents (RFC 8259) of bounded size, with the line of every value.

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "agent/config/Config.h"

namespace zorva::agent {

/// A value of a document. Texts are the agent's bytes. A byte that is not UTF-8 is written in the document as a
/// character of a private plane, U+10EE00 plus the byte, and so are the bytes of such a character, so that any bytes
/// are read back exactly.
struct JsonValue {
  enum class Kind { Null, Boolean, Number, OtherNumber, Text, List, Object };

  Kind kind = Kind::Null;
  int line = 0;  ///< its line, from 1; 0 for a value that was not read
  bool boolean = false;
  std::uint64_t number = 0;  ///< a whole number of at least 0; any other number is OtherNumber
  std::string text;
  std::vector<JsonValue> items;   ///< the elements of a list, or the members' values of an object
  std::vector<std::string> keys;  ///< of an object: keys[i] names items[i]; each name once

  static JsonValue ofText(std::string text);
  static JsonValue ofNumber(std::uint64_t number);
  static JsonValue ofBoolean(bool boolean);
  static JsonValue ofTexts(const std::vector<std::string>& texts);
  static JsonValue list();
  static JsonValue object();

  /// Adds a member to an object, or an element to a list.
  void add(std::string key, JsonValue value);
  void add(JsonValue value);

  /// The member of that name, or null.
  const JsonValue* find(std::string_view key) const;
};

/// The limits of a document, in bytes, in values, and in nested lists and objects. Some thirty thousand interfaces fit.
/// With a hostile document the agent uses less than a quarter of a gigabyte.
inline constexpr std::size_t kLargestJson = std::size_t{64} << 20;
inline constexpr std::size_t kMostJsonValues = 1000000;
inline constexpr std::size_t kDeepestJson = 32;

/// Reads a document; name is its name in errors. Throws ConfigError if it is not JSON, too large or too deep, has more
/// values, or if an object has a name twice.
JsonValue parseJson(const std::string& text, const std::string& name, std::size_t mostValues = kMostJsonValues);

/// Reads the document in a file. Throws ConfigError as parseJson does, and if the file cannot be read.
JsonValue readJsonFile(const std::string& path);

/// The document as text, indented by two blanks, with a line feed at its end.
std::string formatJson(const JsonValue& value);

/// The same on one line, without a line feed.
std::string formatJsonLine(const JsonValue& value);

}  // namespace zorva::agent
