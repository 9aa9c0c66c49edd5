#pragma once

// Reads configurations in TOML 1.0. Every key is checked, and an error names its place.

#include <memory>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "util/NotCopied.h"
#include "util/TomlKeys.h"

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
  /// Any key may be taken from it. Throws TomlError for text that is no TOML.
  explicit TomlDocument(const std::string& text);

  /// A document of these tables and keys alone. Throws TomlError for text that is no TOML, and for anything else at the
  /// top.
  TomlDocument(const std::string& text, TomlSections sections);

  ~TomlDocument();

 private:
  friend class TomlTable;
  struct Parsed;
  std::unique_ptr<Parsed> parsed_;
};

/// One table of a document, which must outlive it. A function that takes a value leaves the variable unchanged if the
/// table, or the key in it, does not exist. A value must be among the words and within the range of its key. All throw
/// TomlError, and std::logic_error for a key that the document's tables do not have.
class TomlTable : util::NotCopied {
 public:
  TomlTable(const TomlDocument& document, std::string name);
  ~TomlTable();

  void take(const char* key, std::string& value);
  void take(const char* key, std::optional<std::string>& value);
  void take(const char* key, bool& value);
  void take(const char* key, int& value);

  /// A list of texts that is not empty.
  void take(const char* key, std::optional<std::vector<std::string>>& value);

  /// Refuses the keys that were not taken, and suggests the nearest of those that were.
  void finish() const;

  [[noreturn]] void fail(const char* key, const std::string& problem) const;

 private:
  struct Node;
  Node find(const char* key);
  const TomlKey& keyNamed(std::string_view key) const;
  std::string textOf(Node node, const char* key) const;

  const std::string name_;
  const TomlSections sections_;
  struct Table;
  std::unique_ptr<Table> table_;  ///< null if the document has none of that name
  std::vector<std::string_view> known_;
};

/// A path that is not absolute is taken from the directory of the file that names it. The empty path stays empty.
std::string pathFrom(const std::string& file, const std::string& path);

}  // namespace zorva::util
