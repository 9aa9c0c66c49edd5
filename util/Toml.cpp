#include "util/Toml.h"

#include <algorithm>
#include <cstdint>
#include <filesystem>
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

const TomlSection* sectionNamed(TomlSections sections, std::string_view name) {
  const auto found =
      std::find_if(sections.begin(), sections.end(), [&](const auto& each) { return each.name == name; });
  return found == sections.end() ? nullptr : &*found;
}

/// The words of a key as an error lists them: "read", "operate" or "none".
std::string alternatives(std::string_view words) {
  std::string text;
  for (std::size_t from = 0; from <= words.size();) {
    const std::size_t end = std::min(words.find('|', from), words.size());
    const bool isLast = end == words.size();
    if (from > 0) text += isLast ? " or " : ", ";
    text.append(1, '"').append(words.substr(from, end - from)).append(1, '"');
    from = end + 1;
  }
  return text;
}

bool isAmong(std::string_view words, std::string_view word) {
  const std::string all = "|" + std::string(words) + "|";
  return word.find('|') == std::string_view::npos && all.find("|" + std::string(word) + "|") != std::string::npos;
}

}  // namespace

struct TomlDocument::Parsed {
  toml::table table;
  TomlSections sections = {};
};

TomlDocument::TomlDocument(const std::string& text) {
  toml::parse_result result = toml::parse(text);
  if (!result) throw TomlError(lineOf(result.error().source()), {}, std::string(result.error().description()));
  parsed_ = std::make_unique<Parsed>(Parsed{std::move(result).table()});
}

TomlDocument::TomlDocument(const std::string& text, TomlSections sections) : TomlDocument(text) {
  parsed_->sections = sections;
  for (const auto& [key, node] : parsed_->table) {
    if (sectionNamed(sections, key.str()) != nullptr) continue;
    std::vector<std::string> names;
    for (const TomlSection& section : sections) names.emplace_back(section.name);
    throw TomlError(lineOf(key.source()), std::string(key.str()),
                    "is not a known table or key" + suggestion(key.str(), names));
  }
}

TomlDocument::~TomlDocument() = default;

struct TomlTable::Table {
  const toml::table& keys;
};

struct TomlTable::Node {
  const toml::node* node;
};

TomlTable::TomlTable(const TomlDocument& document, std::string name)
    : name_(std::move(name)), sections_(document.parsed_->sections) {
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
  const toml::node* node = find(key).node;
  if (node == nullptr) return;
  const TomlKey& known = keyNamed(key);
  const bool isAny = known.least == TomlKey().least && known.most == TomlKey().most;
  const std::string range = " from " + std::to_string(known.least) + " to " + std::to_string(known.most);
  if (!node->is_integer()) fail(key, "expected a whole number" + (isAny ? std::string() : range));
  const std::int64_t number = node->ref<std::int64_t>();
  if (number < known.least || number > known.most) fail(key, isAny ? "is out of range" : "must be" + range);
  value = static_cast<int>(number);
}

void TomlTable::take(const char* key, std::optional<std::vector<std::string>>& value) {
  const toml::node* node = find(key).node;
  if (node == nullptr) return;
  const toml::array* array = node->as_array();
  if (array == nullptr || array->empty()) {
    const std::string example(keyNamed(key).example);
    fail(key, "expected a list of texts" + (example.empty() ? example : " such as " + example));
  }
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
  keyNamed(key);
  known_.emplace_back(key);
  return {table_ == nullptr ? nullptr : table_->keys.get(key)};
}

const TomlKey& TomlTable::keyNamed(std::string_view key) const {
  static constexpr TomlKey kAny;
  if (sections_.empty()) return kAny;
  if (const TomlSection* section = sectionNamed(sections_, name_); section != nullptr) {
    for (const TomlKey& each : section->keys) {
      if (each.name == key) return each;
    }
  }
  throw std::logic_error("no key is declared as " + name_ + '.' + std::string(key));
}

std::string TomlTable::textOf(Node node, const char* key) const {
  if (!node.node->is_string()) fail(key, "expected a text in quotes");
  const std::string& text = node.node->ref<std::string>();
  if (text.find('\0') != std::string::npos) fail(key, "must not hold a NUL");
  const std::string_view words = keyNamed(key).words;
  if (!words.empty() && !isAmong(words, text)) fail(key, "must be " + alternatives(words));
  return text;
}

std::string pathFrom(const std::string& file, const std::string& path) {
  if (path.empty() || path.starts_with('/')) return path;
  return (std::filesystem::absolute(file).parent_path() / path).string();
}

}  // namespace zorva::util
