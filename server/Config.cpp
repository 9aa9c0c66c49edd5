#include "server/Config.h"

#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <cstdint>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <string_view>
#include <utility>

#define TOML_HEADER_ONLY 1
#define TOML_EXCEPTIONS 0
#define TOML_ENABLE_FORMATTERS 0
#include <toml++/toml.h>

namespace zorva::server {

using zorva::agent::ConfigError;

namespace {

constexpr const char* kDefaultFile = "/etc/zorvagent/zorvacimd.toml";
constexpr std::size_t kLargestFile = std::size_t{256} << 10;
constexpr int kLongestSeconds = 24 * 60 * 60;

int lineOf(const toml::source_region& region) { return static_cast<int>(region.begin.line); }

/// Reads one table: takes the known keys, then refuses the rest.
class TableReader {
 public:
  TableReader(const std::string& file, const toml::table& document, std::string name)
      : file_(file), name_(std::move(name)) {
    const toml::node* node = document.get(name_);
    if (node == nullptr) return;
    table_ = node->as_table();
    if (table_ == nullptr) throw ConfigError(file_, lineOf(node->source()), name_, "expected a table");
  }

  void take(const char* key, std::string& value) {
    if (const toml::node* node = find(key)) value = textOf(*node, key);
  }

  void take(const char* key, bool& value) {
    const toml::node* node = find(key);
    if (node == nullptr) return;
    if (!node->is_boolean()) fail(key, "expected true or false");
    value = node->ref<bool>();
  }

  void take(const char* key, int& value, int least, int most) {
    const toml::node* node = find(key);
    if (node == nullptr) return;
    const std::string range = "from " + std::to_string(least) + " to " + std::to_string(most);
    if (!node->is_integer()) fail(key, "expected a whole number " + range);
    const std::int64_t number = node->ref<std::int64_t>();
    if (number < least || number > most) fail(key, "must be " + range);
    value = static_cast<int>(number);
  }

  void take(const char* key, std::size_t& value, int least, int most, std::size_t unit = 1) {
    int number = static_cast<int>(value / unit);
    take(key, number, least, most);
    value = static_cast<std::size_t>(number) * unit;
  }

  void take(const char* key, std::chrono::milliseconds& value) {
    int seconds = static_cast<int>(std::chrono::duration_cast<std::chrono::seconds>(value).count());
    take(key, seconds, 1, kLongestSeconds);
    value = std::chrono::seconds(seconds);
  }

  void take(const char* key, std::optional<http::Addresses>& value) {
    const toml::node* node = find(key);
    if (node == nullptr) return;
    const toml::array* array = node->as_array();
    if (array == nullptr || array->empty()) fail(key, "expected a list of addresses such as [\"127.0.0.1\"]");
    value.emplace();
    for (const toml::node& element : *array) value->push_back(textOf(element, key));
  }

  /// Refuses the keys that were not taken.
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

  std::string textOf(const toml::node& node, const char* key) const {
    if (!node.is_string()) fail(key, "expected a text in quotes");
    const std::string& text = node.ref<std::string>();
    if (text.find('\0') != std::string::npos) fail(key, "must not hold a NUL");
    return text;
  }

  const std::string& file_;
  const std::string name_;
  const toml::table* table_ = nullptr;
  std::vector<std::string_view> known_;
};

std::string absolutePath(const std::string& configFile, const std::string& path) {
  if (path.empty() || path.starts_with('/')) return path;
  return (std::filesystem::absolute(configFile).parent_path() / path).string();
}

void readListen(Config& config, const toml::table& document) {
  TableReader listen(config.file, document, "listen");
  listen.take("addresses", config.addresses);
  listen.take("port", config.port, 0, 65535);
  listen.finish();
}

void readLimits(Config& config, const toml::table& document) {
  constexpr std::size_t kKibibyte = 1024;
  constexpr std::size_t kMebibyte = 1024 * 1024;
  http::HttpLimits& limits = config.limits;
  TableReader table(config.file, document, "limits");
  table.take("body_kib", limits.bodyBytes, 1, 1024 * 1024, kKibibyte);
  table.take("bodies_mib", limits.bodiesBytes, 1, 16 * 1024, kMebibyte);
  table.take("header_kib", limits.headerBytes, 4, 1024, kKibibyte);
  table.take("nesting", config.nesting, 16, 1000);
  table.take("connections", limits.connections, 1, 100'000);
  table.take("requests", limits.requests, 1, 10'000);
  table.take("workers", limits.workers, 1, 1000);
  table.take("arrival_seconds", limits.arrival);
  table.take("idle_seconds", limits.idle);
  table.take("provider_seconds", limits.provider);
  table.take("client_seconds", limits.client);
  table.take("drain_seconds", limits.drain);
  table.finish();
}

void readHttp(Config& config, const toml::table& document) {
  TableReader http(config.file, document, "http");
  http.take("threads", config.threads, 1, 64);
  http.take("gzip", config.limits.gzip);
  http.finish();
}

void readPull(Config& config, const toml::table& document) {
  TableReader pull(config.file, document, "pull");
  pull.take("contexts", config.pullContexts, 0, 10'000);
  pull.take("client_contexts", config.pullClientContexts, 1, 10'000);
  pull.take("default_seconds", config.pullSeconds, 1, kLongestSeconds);
  pull.take("longest_seconds", config.pullLongestSeconds, 1, kLongestSeconds);
  pull.take("memory_mib", config.pullMebibytes, 1, 16 * 1024);
  if (config.pullSeconds > config.pullLongestSeconds) {
    pull.fail("default_seconds", "must not be more than pull.longest_seconds");
  }
  pull.finish();
}

void readAgent(Config& config, const toml::table& document) {
  TableReader agent(config.file, document, "agent");
  agent.take("config", config.agentConfig);
  agent.take("provider_dir", config.providerDirectory);
  agent.finish();
  config.agentConfig = absolutePath(config.file, config.agentConfig);
  config.providerDirectory = absolutePath(config.file, config.providerDirectory);
}

void readLog(Config& config, const toml::table& document) {
  TableReader log(config.file, document, "log");
  log.take("level", config.logLevel, 0, 100'000);
  std::string target;
  log.take("target", target);
  log.finish();
  if (target.empty()) return;
  const bool isWord = target == "stderr" || target == "syslog" || target == "off";
  config.logTarget = isWord ? target : absolutePath(config.file, target);
}

void refuseUnknownTables(const Config& config, const toml::table& document) {
  constexpr std::string_view kKnown[] = {"listen", "limits", "http", "pull", "agent", "log"};
  for (const auto& [key, node] : document) {
    if (std::find(std::begin(kKnown), std::end(kKnown), key.str()) != std::end(kKnown)) continue;
    throw ConfigError(config.file, lineOf(key.source()), std::string(key.str()), "is not a known table or key");
  }
}

/// A directory or a device is not a configuration, and reading a FIFO would wait for ever.
std::string contentsOf(const std::string& path) {
  std::error_code error;
  const std::filesystem::file_status status = std::filesystem::status(path, error);
  if (!std::filesystem::exists(status)) throw ConfigError(path, 0, {}, "cannot be read: there is no such file");
  if (!std::filesystem::is_regular_file(status)) throw ConfigError(path, 0, {}, "cannot be read: it is no file");
  errno = 0;
  std::ifstream file(path, std::ios::binary);
  if (!file) throw ConfigError(path, 0, {}, std::string("cannot be read: ") + std::strerror(errno));
  std::string text(kLargestFile + 1, '\0');
  file.read(text.data(), static_cast<std::streamsize>(text.size()));
  text.resize(static_cast<std::size_t>(file.gcount()));
  if (text.size() > kLargestFile) throw ConfigError(path, 0, {}, "is larger than 256 KiB");
  return text;
}

}  // namespace

Config readConfig(const std::string& path) {
  const std::string text = contentsOf(path);
  const toml::parse_result parsed = toml::parse(text, path);
  if (!parsed) {
    throw ConfigError(path, lineOf(parsed.error().source()), {}, std::string(parsed.error().description()));
  }
  const toml::table& document = parsed.table();
  Config config;
  config.file = path;
  refuseUnknownTables(config, document);
  readListen(config, document);
  readLimits(config, document);
  readHttp(config, document);
  readPull(config, document);
  readAgent(config, document);
  readLog(config, document);
  return config;
}

Config readDefaultConfig() {
  const bool absent = ::access(kDefaultFile, F_OK) != 0 && errno == ENOENT;
  return absent ? Config() : readConfig(kDefaultFile);
}

}  // namespace zorva::server
