#include "server/Config.h"

#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <filesystem>
#include <utility>

#include "util/InstalledPlaces.h"
#include "util/ReadFile.h"
#include "util/Toml.h"

namespace zorva::server {

using zorva::agent::ConfigError;

namespace {

constexpr std::size_t kLargestFile = std::size_t{256} << 10;

/// A size in units of so many bytes.
void takeSize(util::TomlTable& table, const char* key, std::size_t& value, std::size_t unit) {
  int number = static_cast<int>(value / unit);
  table.take(key, number);
  value = static_cast<std::size_t>(number) * unit;
}

void takeSeconds(util::TomlTable& table, const char* key, std::chrono::milliseconds& value) {
  int seconds = static_cast<int>(std::chrono::duration_cast<std::chrono::seconds>(value).count());
  table.take(key, seconds);
  value = std::chrono::seconds(seconds);
}

void readListen(Config& config, const util::TomlDocument& document) {
  util::TomlTable listen(document, "listen");
  listen.take("addresses", config.addresses);
  listen.take("port", config.port);
  listen.take("socket", config.socket);
  if (config.socket.has_value()) config.socket = util::pathFrom(config.file, *config.socket);
  std::optional<std::vector<std::string>> names;
  listen.take("names", names);
  config.names = names.value_or(config.names);
  listen.finish();
}

void readTls(Config& config, const util::TomlDocument& document) {
  util::TomlTable tls(document, "tls");
  http::TlsFiles& files = config.tls;
  tls.take("certificate", files.certificate);
  tls.take("key", files.key);
  tls.take("client_ca", files.clientCa);
  tls.take("addresses", config.tlsAddresses);
  tls.take("port", config.tlsPort);
  tls.finish();
  if (files.certificate.empty() && !files.key.empty()) tls.fail("key", "needs tls.certificate");
  if (files.certificate.empty() && !files.clientCa.empty()) tls.fail("client_ca", "needs tls.certificate and tls.key");
  if (files.certificate.empty() && config.tlsAddresses) tls.fail("addresses", "needs tls.certificate and tls.key");
  if (!files.certificate.empty() && files.key.empty()) tls.fail("certificate", "needs tls.key");
  for (std::string* each : {&files.certificate, &files.key, &files.clientCa})
    *each = util::pathFrom(config.file, *each);
}

void readLimits(Config& config, const util::TomlDocument& document) {
  constexpr std::size_t kKibibyte = 1024;
  constexpr std::size_t kMebibyte = kKibibyte * 1024;
  http::HttpLimits& limits = config.limits;
  util::TomlTable table(document, "limits");
  takeSize(table, "body_kib", limits.bodyBytes, kKibibyte);
  takeSize(table, "bodies_mib", limits.bodiesBytes, kMebibyte);
  takeSize(table, "header_kib", limits.headerBytes, kKibibyte);
  table.take("nesting", config.nesting);
  takeSize(table, "connections", limits.connections, 1);
  takeSize(table, "requests", limits.requests, 1);
  takeSize(table, "workers", limits.workers, 1);
  takeSeconds(table, "arrival_seconds", limits.arrival);
  takeSeconds(table, "idle_seconds", limits.idle);
  takeSeconds(table, "provider_seconds", limits.provider);
  takeSeconds(table, "client_seconds", limits.client);
  takeSeconds(table, "drain_seconds", limits.drain);
  table.finish();
}

void readHttp(Config& config, const util::TomlDocument& document) {
  util::TomlTable http(document, "http");
  http.take("threads", config.threads);
  http.take("gzip", config.limits.gzip);
  http.take("console", config.hasConsole);
  http.finish();
}

void readPull(Config& config, const util::TomlDocument& document) {
  util::TomlTable pull(document, "pull");
  pull.take("contexts", config.pullContexts);
  pull.take("client_contexts", config.pullClientContexts);
  pull.take("default_seconds", config.pullSeconds);
  pull.take("longest_seconds", config.pullLongestSeconds);
  pull.take("memory_mib", config.pullMebibytes);
  if (config.pullSeconds > config.pullLongestSeconds) {
    pull.fail("default_seconds", "must not be more than pull.longest_seconds");
  }
  pull.finish();
}

void readAgent(Config& config, const util::TomlDocument& document) {
  util::TomlTable agent(document, "agent");
  agent.take("config", config.agentConfig);
  agent.take("provider_dir", config.providerDirectory);
  agent.finish();
  config.agentConfig = util::pathFrom(config.file, config.agentConfig);
  config.providerDirectory = util::pathFrom(config.file, config.providerDirectory);
}

void readAudit(Config& config, const util::TomlDocument& document) {
  util::TomlTable audit(document, "audit");
  audit.take("file", config.auditFile);
  audit.finish();
  config.auditFile = util::pathFrom(config.file, config.auditFile);
}

/// A key whose value is the word of a role.
void takeRole(util::TomlTable& table, const char* key, access::Role& role) {
  std::string word(access::wordOf(role));
  table.take(key, word);
  role = access::roleOf(word).value();
}

void readAccess(Config& config, const util::TomlDocument& document) {
  util::TomlTable table(document, "access");
  table.take("users", config.access.usersFile);
  takeRole(table, "anonymous", config.access.anonymous);
  table.take("group", config.access.group);
  takeRole(table, "socket", config.access.otherLocal);
  table.finish();
  config.access.usersFile = util::pathFrom(config.file, config.access.usersFile);
}

void readMetrics(Config& config, const util::TomlDocument& document) {
  util::TomlTable metrics(document, "metrics");
  metrics.take("check_interval", config.checkSeconds);
  metrics.finish();
}

void readWatch(Config& config, const util::TomlDocument& document) {
  util::TomlTable watch(document, "watch");
  watch.take("clients", config.watchers);
  watch.finish();
}

void readLog(Config& config, const util::TomlDocument& document) {
  util::TomlTable log(document, "log");
  log.take("level", config.logLevel);
  std::string target;
  log.take("target", target);
  log.finish();
  if (target.empty()) return;
  const bool isWord = target == "stderr" || target == "syslog" || target == "off";
  config.logTarget = isWord ? target : util::pathFrom(config.file, target);
}

/// A directory or a device is not a configuration, and reading a FIFO would wait for ever.
std::string contentsOf(const std::string& path) {
  std::error_code error;
  const std::filesystem::file_status status = std::filesystem::status(path, error);
  if (!std::filesystem::exists(status)) throw ConfigError(path, 0, {}, "cannot be read: there is no such file");
  if (!std::filesystem::is_regular_file(status)) throw ConfigError(path, 0, {}, "cannot be read: it is no file");
  util::FileText file = util::readFile(path, kLargestFile);
  if (file.error != 0) throw ConfigError(path, 0, {}, "cannot be read: " + util::fileErrorText(file.error));
  if (file.truncated) throw ConfigError(path, 0, {}, "is larger than 256 KiB");
  return std::move(file.text);
}

Config parseConfig(const std::string& path, const std::string& text) try {
  const util::TomlDocument document(text, configKeys());
  Config config;
  config.file = path;
  readListen(config, document);
  readTls(config, document);
  readLimits(config, document);
  readHttp(config, document);
  readPull(config, document);
  readAgent(config, document);
  readAccess(config, document);
  readAudit(config, document);
  readMetrics(config, document);
  readWatch(config, document);
  readLog(config, document);
  return config;
} catch (const util::TomlError& error) {
  throw ConfigError(path, error.line(), error.key(), error.what());
}

}  // namespace

Config readConfig(const std::string& path) { return parseConfig(path, contentsOf(path)); }

Config readDefaultConfig() {
  const std::string file = util::installedPlaces().config + "zorvacimd.toml";
  const bool absent = ::access(file.c_str(), F_OK) != 0 && errno == ENOENT;
  return absent ? Config() : readConfig(file);
}

}  // namespace zorva::server
