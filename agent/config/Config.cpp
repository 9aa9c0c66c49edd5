#include "agent/config/Config.h"

#include <stdlib.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdint>
#include <filesystem>
#include <limits>
#include <string_view>
#include <utility>
#include <vector>

#include "agent/files/ReadFile.h"

#define TOML_HEADER_ONLY 1
#define TOML_EXCEPTIONS 0
#define TOML_ENABLE_FORMATTERS 0
#include <toml++/toml.h>

namespace zorva::agent {
namespace {

constexpr const char* kDefaultFile = "/etc/zorvagent/agent.toml";
constexpr std::size_t kLargestFile = std::size_t{256} << 10;

int lineOf(const toml::source_region& region) { return static_cast<int>(region.begin.line); }

// Reads one table: takes the keys that are asked for, then refuses what is left.
class TableReader {
 public:
  TableReader(const std::string& file, const toml::table& parent, std::string name)
      : file_(file), name_(std::move(name)) {
    const toml::node* node = parent.get(name_);
    if (node == nullptr) return;
    table_ = node->as_table();
    if (table_ == nullptr) throw ConfigError(file_, lineOf(node->source()), name_, "expected a table");
  }

  void take(const char* key, std::string& value) {
    const toml::node* node = find(key);
    if (node == nullptr) return;
    if (!node->is_string()) fail(key, "expected a text in quotes");
    value = node->ref<std::string>();
    if (value.find('\0') != std::string::npos) fail(key, "must not hold a NUL");
  }

  void take(const char* key, bool& value) {
    const toml::node* node = find(key);
    if (node == nullptr) return;
    if (!node->is_boolean()) fail(key, "expected true or false");
    value = node->ref<bool>();
  }

  void take(const char* key, int& value) {
    const toml::node* node = find(key);
    if (node == nullptr) return;
    if (!node->is_integer()) fail(key, "expected a whole number");
    const std::int64_t number = node->ref<std::int64_t>();
    if (number < std::numeric_limits<int>::min() || number > std::numeric_limits<int>::max()) {
      fail(key, "is out of range");
    }
    value = static_cast<int>(number);
  }

  // Refuses the keys that nothing has taken.
  void finish() const {
    if (table_ == nullptr) return;
    for (const auto& [key, node] : *table_) {
      if (std::find(known_.begin(), known_.end(), key.str()) != known_.end()) continue;
      throw ConfigError(file_, lineOf(key.source()), name_ + '.' + std::string(key.str()), "is not a known key");
    }
  }

  [[noreturn]] void fail(const char* key, const std::string& problem) const {
    const toml::node* node = table_ == nullptr ? nullptr : table_->get(key);
    throw ConfigError(file_, node == nullptr ? 0 : lineOf(node->source()), name_ + '.' + key, problem);
  }

 private:
  const toml::node* find(const char* key) {
    known_.push_back(key);
    return table_ == nullptr ? nullptr : table_->get(key);
  }

  const std::string& file_;
  const std::string name_;
  const toml::table* table_ = nullptr;
  std::vector<std::string_view> known_;
};

std::string absolutePath(const std::string& configFile, const std::string& path) {
  if (path.starts_with('/')) return path;
  return (std::filesystem::absolute(configFile).parent_path() / path).string();
}

void readAgent(Config& config, const toml::table& document) {
  TableReader agent(config.file, document, "agent");
  agent.take("data_dir", config.dataDir);
  if (config.dataDir.empty()) agent.fail("data_dir", "must not be empty");
  config.dataDir = absolutePath(config.file, config.dataDir);
  if (!config.dataDir.ends_with('/')) config.dataDir += '/';

  agent.take("system_name", config.systemName);
  const auto isControl = [](char c) { return static_cast<unsigned char>(c) < 0x20 || c == 0x7F; };
  if (std::any_of(config.systemName.begin(), config.systemName.end(), isControl)) {
    agent.fail("system_name", "must not hold control characters");
  }

  agent.take("language", config.language);
  const auto isLanguage = [](char c) {
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') || c == '-' || c == '_';
  };
  if (config.language.empty() || !std::all_of(config.language.begin(), config.language.end(), isLanguage)) {
    agent.fail("language", "expected a language such as \"en\"");
  }
  agent.finish();
}

void readTree(Config& config, const toml::table& document) {
  TableReader tree(config.file, document, "tree");
  tree.take("source", config.source);
  if (config.source != "host" && config.source != "file") tree.fail("source", "expected \"host\" or \"file\"");
  tree.take("file", config.treeFile);
  if (config.source == "file" && config.treeFile.empty()) {
    tree.fail("source", "\"file\" needs tree.file as well");
  }
  if (!config.treeFile.empty()) config.treeFile = absolutePath(config.file, config.treeFile);
  tree.take("include_loopback", config.includeLoopback);

  std::string apply = "overlay";
  tree.take("apply", apply);
  if (apply == "host") tree.fail("apply", "\"host\" is not offered by this version; use \"overlay\"");
  if (apply != "overlay") tree.fail("apply", "expected \"overlay\" or \"host\"");
  tree.finish();
}

void readTarget(TableReader& log, const Config& config, const char* key, std::string& target) {
  log.take(key, target);
  if (target.empty()) log.fail(key, "expected \"stderr\", \"syslog\", \"off\" or a path");
  if (target != "stderr" && target != "syslog" && target != "off") target = absolutePath(config.file, target);
}

void readLog(Config& config, const toml::table& document) {
  TableReader log(config.file, document, "log");
  log.take("level", config.logLevel);
  readTarget(log, config, "target", config.logTarget);
  log.take("trace_level", config.traceLevel);
  readTarget(log, config, "trace_target", config.traceTarget);
  log.finish();
}

void refuseUnknownTables(const Config& config, const toml::table& document) {
  for (const auto& [key, node] : document) {
    if (key == "agent" || key == "tree" || key == "log") continue;
    throw ConfigError(config.file, lineOf(key.source()), std::string(key.str()), "is not a known table or key");
  }
}

Config parseConfig(const std::string& path, const std::string& text) {
  const toml::parse_result parsed = toml::parse(text, path);
  if (!parsed) {
    throw ConfigError(path, lineOf(parsed.error().source()), {}, std::string(parsed.error().description()));
  }
  Config config;
  config.file = path;
  refuseUnknownTables(config, parsed.table());
  readAgent(config, parsed.table());
  readTree(config, parsed.table());
  readLog(config, parsed.table());
  return config;
}

}  // namespace

Config readConfig(const std::string& path) {
  const FileText file = readFile(path, kLargestFile);
  if (file.error != 0) throw ConfigError(path, 0, {}, "cannot be read: " + fileErrorText(file.error));
  if (file.truncated) throw ConfigError(path, 0, {}, "is larger than 256 KiB");
  return parseConfig(path, file.text);
}

Config readDefaultConfig() {
  // Not from the environment of a set-user-id program.
  const char* named = ::secure_getenv("ZORVAGENT_CONFIG");
  if (named != nullptr && *named != '\0') return readConfig(named);
  const bool absent = ::access(kDefaultFile, F_OK) != 0 && errno == ENOENT;
  return absent ? Config() : readConfig(kDefaultFile);
}

}  // namespace zorva::agent
