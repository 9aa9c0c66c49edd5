#include "util/Toml.h"

#include <algorithm>
#include <filesystem>
#include <limits>
#include <utility>

#include "util/Nearest.h"

#define TOML_HEADER_ONLY 1
#define TOML_EXCEPTIONS 0
#define TOML_ENABLE_FORMATTERS 0
#include <toml++/toml.h>

namespace zorva::util {
namespace {

int lineOf(const toml::source_region& region) { return static_cast<int>(region.begin.line); }

std::string suggestion(std::string_view word, const std::vector<std::string>& known) {
  const std::string question = didYouMean(word, known);
  return question.empty() ? question : "; " + question;
}

}  // namespace

struct TomlDocument::Parsed {
  toml::table table;
};

TomlDocument::TomlDocument(const std::string& text) {
  toml::parse_result result = toml::parse(text);
  if (!result) throw TomlError(lineOf(result.error().source()), {}, std::string(result.error().description()));
  parsed_ = std::make_unique<Parsed>(Parsed{std::move(result).table()});
}

TomlDocument::~TomlDocument() = default;

void TomlDocument::refuseAllBut(std::initializer_list<std::string_view> names) const {
  for (const auto& [key, node] : parsed_->table) {
    if (std::find(names.begin(), names.end(), key.str()) != names.end()) continue;
    throw TomlError(lineOf(key.source()), std::string(key.str()),
                    "is not a known table or key" + suggestion(key.str(), {names.begin(), names.end()}));
  }
}

struct TomlTable::Table {
  const toml::table& keys;
};

struct TomlTable::Node {
  const toml::node* node;
};

TomlTable::TomlTable(const TomlDocument& document, std::string name) : name_(std::move(name)) {
  const toml::node* node = document.parsed_->table.get(name_);
  if (node == nullptr) return;
  if (!node->is_table()) throw TomlError(lineOf(node->source()), name_, "expected a table");
  table_ = std::make_unique<Table>(Table{*node->as_table()});
}

TomlTable::~TomlTable() = default;

void TomlTable::take(const char* key, std::string& value) {
  if (const Node found = find(key); found.node != nullptr) value = textOf(found, key);
}

void TomlTable::take(const char* key, std::optional<std::string>& value) {
  if (const Node found = find(key); found.node != nullptr) value = textOf(found, key);
}

void TomlTable::take(const char* key, bool& value) {
  const toml::node* node = find(key).node;
  if (node == nullptr) return;
  if (!node->is_boolean()) fail(key, "expected true or false");
  value = node->ref<bool>();
}

void TomlTable::take(const char* key, int& value) {
  const Node found = find(key);
  if (found.node == nullptr) return;
  const std::int64_t number = numberOf(found, key, "expected a whole number");
  if (number < std::numeric_limits<int>::min() || number > std::numeric_limits<int>::max()) {
    fail(key, "is out of range");
  }
  value = static_cast<int>(number);
}

void TomlTable::take(const char* key, int& value, int least, int most) {
  const Node found = find(key);
  if (found.node == nullptr) return;
  const std::string range = "from " + std::to_string(least) + " to " + std::to_string(most);
  const std::int64_t number = numberOf(found, key, "expected a whole number " + range);
  if (number < least || number > most) fail(key, "must be " + range);
  value = static_cast<int>(number);
}

void TomlTable::take(const char* key, std::optional<std::vector<std::string>>& value, const char* expected) {
  const toml::node* node = find(key).node;
  if (node == nullptr) return;
  const toml::array* array = node->as_array();
  if (array == nullptr || array->empty()) fail(key, expected);
  value.emplace();
  for (const toml::node& element : *array) value->push_back(textOf({&element}, key));
}

void TomlTable::finish() const {
  if (table_ == nullptr) return;
  for (const auto& [key, node] : table_->keys) {
    if (std::find(known_.begin(), known_.end(), key.str()) != known_.end()) continue;
    throw TomlError(lineOf(key.source()), name_ + '.' + std::string(key.str()),
                    "is not a known key" + suggestion(key.str(), {known_.begin(), known_.end()}));
  }
}

void TomlTable::fail(const char* key, const std::string& problem) const {
  const toml::node* node = table_ == nullptr ? nullptr : table_->keys.get(key);
  throw TomlError(node == nullptr ? 0 : lineOf(node->source()), name_ + '.' + key, problem);
}

TomlTable::Node TomlTable::find(const char* key) {
  known_.emplace_back(key);
  return {table_ == nullptr ? nullptr : table_->keys.get(key)};
}

std::string TomlTable::textOf(Node node, const char* key) const {
  if (!node.node->is_string()) fail(key, "expected a text in quotes");
  const std::string& text = node.node->ref<std::string>();
  if (text.find('\0') != std::string::npos) fail(key, "must not hold a NUL");
  return text;
}

std::int64_t TomlTable::numberOf(Node node, const char* key, const std::string& expected) const {
  if (!node.node->is_integer()) fail(key, expected);
  return node.node->ref<std::int64_t>();
}

std::string pathFrom(const std::string& file, const std::string& path) {
  if (path.empty() || path.starts_with('/')) return path;
  return (std::filesystem::absolute(file).parent_path() / path).string();
}

}  // namespace zorva::util
