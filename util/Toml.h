#pragma once

// Reads configurations in TOML 1.0. Every key is checked, and an error names its place.

#include <climits>
#include <cstdint>
#include <initializer_list>
#include <memory>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "util/NotCopied.h"

namespace zorva::util {

/// what() says what is wrong.
class TomlError : public std::runtime_error {
 public:
  TomlError(int line, std::string key, const std::string& problem)
      : std::runtime_error(problem), line_(line), key_(std::move(key)) {}

  int line() const { return line_; }               ///< from 1; 0 is unknown
  const std::string& key() const { return key_; }  ///< "table.key"; empty if the error is not about a key

 private:
  int line_;
  std::string key_;
};

class TomlDocument : util::NotCopied {
 public:
  /// Throws TomlError for text that is no TOML.
  explicit TomlDocument(const std::string& text);
  ~TomlDocument();

  /// Throws TomlError for anything at the top but tables and keys of these names; it suggests the nearest of them.
  void refuseAllBut(std::initializer_list<std::string_view> names) const;

 private:
  friend class TomlTable;
  struct Parsed;
  std::unique_ptr<Parsed> parsed_;
};

/// One table of a document, which must outlive it. A function that takes a value leaves the variable unchanged if the
/// table, or the key in it, does not exist. All throw TomlError.
class TomlTable : util::NotCopied {
 public:
  TomlTable(const TomlDocument& document, std::string name);
  ~TomlTable();

  void take(const char* key, std::string& value);
  void take(const char* key, std::optional<std::string>& value);
  void take(const char* key, bool& value);
  void take(const char* key, int& value);
  void take(const char* key, int& value, int least, int most);

  /// A list of texts that is not empty; `expected` describes it in the error.
  void take(const char* key, std::optional<std::vector<std::string>>& value, const char* expected);

  /// Refuses the keys that were not taken, and suggests the nearest of those that were.
  void finish() const;

  [[noreturn]] void fail(const char* key, const std::string& problem) const;

 private:
  struct Node;
  Node find(const char* key);
  std::string textOf(Node node, const char* key) const;
  std::int64_t numberOf(Node node, const char* key, const std::string& expected) const;

  const std::string name_;
  struct Table;
  std::unique_ptr<Table> table_;  ///< null if the document has none of that name
  std::vector<std::string_view> known_;
};

/// A path that is not absolute is taken from the directory of the file that names it. The empty path stays empty.
std::string pathFrom(const std::string& file, const std::string& path);

}  // namespace zorva::util
