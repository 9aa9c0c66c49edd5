#include "agent/config/Config.h"

#include <stdlib.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>

#include "util/InstalledPlaces.h"
#include "util/Names.h"
#include "util/ReadFile.h"
#include "util/Toml.h"

namespace zorva::agent {
namespace {

constexpr std::size_t kLargestFile = std::size_t{256} << 10;

void readAgent(Config& config, const util::TomlDocument& document) {
  util::TomlTable agent(document, "agent");
  agent.take("data_dir", config.dataDir);
  if (config.dataDir.empty()) agent.fail("data_dir", "must not be empty");
  config.dataDir = util::pathFrom(config.file, config.dataDir);
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

void readTree(Config& config, const util::TomlDocument& document) {
  util::TomlTable tree(document, "tree");
  tree.take("source", config.source);
  tree.take("file", config.treeFile);
  if (config.source == "file" && config.treeFile.empty()) {
    tree.fail("source", "\"file\" needs tree.file as well");
  }
  if (!config.treeFile.empty()) config.treeFile = util::pathFrom(config.file, config.treeFile);
  tree.take("include_loopback", config.includeLoopback);

  std::string apply = "overlay";
  tree.take("apply", apply);
  config.appliesToHost = apply == "host";
  if (config.appliesToHost && config.source != "host") tree.fail("apply", "\"host\" needs source = \"host\" as well");
  tree.finish();
}

void readTarget(util::TomlTable& log, const Config& config, const char* key, std::string& target) {
  log.take(key, target);
  if (target.empty()) log.fail(key, "expected \"stderr\", \"syslog\", \"off\" or a path");
  if (target != "stderr" && target != "syslog" && target != "off") target = util::pathFrom(config.file, target);
}

void readLog(Config& config, const util::TomlDocument& document) {
  util::TomlTable log(document, "log");
  log.take("level", config.logLevel);
  readTarget(log, config, "target", config.logTarget);
  log.take("trace_level", config.traceLevel);
  readTarget(log, config, "trace_target", config.traceTarget);
  log.finish();
}

// A fingerprint as programs print it, with or without colons and blanks.
std::string settledFingerprint(const std::string& text) {
  std::string digits;
  for (const char c : text) {
    if (c != ':' && c != ' ') digits += util::lowerAscii(c);
  }
  return digits;
}

void readBmc(BmcConfig& bmc, const Config& config, const util::TomlDocument& document) {
  constexpr std::size_t kDigits = 64;
  constexpr std::string_view kScheme = "https://";
  util::TomlTable table(document, "bmc");
  table.take("url", bmc.url);
  if (!bmc.url.empty() && (!bmc.url.starts_with(kScheme) || bmc.url.size() == kScheme.size())) {
    table.fail("url", "expected https://HOST or https://HOST:PORT");
  }
  if (bmc.url.find('@') != std::string::npos) table.fail("url", "must not hold a login; user and password_file do");
  if (bmc.url.ends_with('/')) bmc.url.pop_back();
  if (bmc.url.find_first_of("/?#\\ ", kScheme.size()) != std::string::npos) table.fail("url", "must not hold a path");
  table.take("user", bmc.user);
  table.take("password_file", bmc.passwordFile);
  if (!bmc.url.empty() && bmc.user.empty()) table.fail("url", "needs user and password_file as well");
  if (bmc.user.empty() != bmc.passwordFile.empty()) table.fail("user", "and password_file need each other");
  table.take("ca_file", bmc.caFile);
  table.take("fingerprint", bmc.fingerprint);
  bmc.fingerprint = settledFingerprint(bmc.fingerprint);
  const bool isHex = bmc.fingerprint.find_first_not_of("0123456789abcdef") == std::string::npos;
  if (!bmc.fingerprint.empty() && (!isHex || bmc.fingerprint.size() != kDigits)) {
    table.fail("fingerprint", "expected the SHA-256 of a certificate: 64 hexadecimal digits");
  }
  if (!bmc.fingerprint.empty() && !bmc.caFile.empty()) table.fail("fingerprint", "and ca_file exclude each other");
  table.take("interval", bmc.interval);
  if (config.source == "host") bmc.file = kDefaultBmcFile;
  table.take("file", bmc.file);
  for (std::string* path : {&bmc.passwordFile, &bmc.caFile, &bmc.file}) {
    if (!path->empty()) *path = util::pathFrom(config.file, *path);
  }
  table.finish();
}

Config parseConfig(const std::string& path, const std::string& text) try {
  const util::TomlDocument document(text, configKeys());
  Config config;
  config.file = path;
  readAgent(config, document);
  readTree(config, document);
  readLog(config, document);
  readBmc(config.bmc, config, document);
  return config;
} catch (const util::TomlError& error) {
  throw ConfigError(path, error.line(), error.key(), error.what());
}

}  // namespace

Config readConfig(const std::string& path) {
  const util::FileText file = util::readFile(path, kLargestFile);
  if (file.error != 0) throw ConfigError(path, 0, {}, "cannot be read: " + util::fileErrorText(file.error));
  if (file.truncated) throw ConfigError(path, 0, {}, "is larger than 256 KiB");
  return parseConfig(path, file.text);
}

Config readDefaultConfig() {
  // A set-user-id program does not use the environment.
  const char* named = ::secure_getenv("ZORVAGENT_CONFIG");
  if (named != nullptr && *named != '\0') return readConfig(named);
  const std::string file = util::installedPlaces().config + "agent.toml";
  const bool absent = ::access(file.c_str(), F_OK) != 0 && errno == ENOENT;
  return absent ? parseConfig({}, {}) : readConfig(file);
}

}  // namespace zorva::agent
