#pragma once

// The agent's configuration.

#include <stdexcept>
#include <string>

#include "agent/interface/AgentApi.h"
#include "util/InstalledPlaces.h"
#include "util/LogLevels.h"
#include "util/TomlKeys.h"

namespace zorva::agent {

/// An error in a file that a person wrote: the configuration, or the JSON document of a tree. what() is one line,
/// "FILE:LINE: KEY: what is wrong", without the parts that are not known.
class ZORVA_AGENT_API ConfigError : public std::runtime_error {
 public:
  /// line counts from 1, 0 is unknown; key and file may be empty. Control characters in them come out escaped in
  /// what().
  ConfigError(const std::string& file, int line, const std::string& key, const std::string& problem);
  ~ConfigError() override;

  const std::string& file() const { return file_; }
  int line() const { return line_; }
  const std::string& key() const { return key_; }
  const std::string& problem() const { return problem_; }

 private:
  std::string file_;
  int line_;
  std::string key_;
  std::string problem_;
};

/// [bmc]: the service processor that zorva-bmc asks.
struct BmcConfig {
  std::string url;           ///< "https://HOST[:PORT]"; empty: the one that the firmware names
  std::string user;          ///< of the login; empty only together with the next
  std::string passwordFile;  ///< whose first line is the password
  std::string caFile;        ///< with the authorities that its certificate is checked against; empty: the system's
  std::string fingerprint;   ///< SHA-256 of its certificate: 64 lower-case hexadecimal digits; empty: not compared
  int interval = 60;         ///< seconds from one reading to the next
  std::string file;          ///< what was read; empty: no service processor is in the tree

  bool operator==(const BmcConfig&) const = default;
};

/// The default place of what zorva-bmc read.
inline constexpr const char* kDefaultBmcFile = "/run/zorvagent/bmc.json";

/// Relative paths start at the directory of the configuration's file.
struct Config {
  std::string file;  ///< the file; empty for the built-in defaults

  /// [agent]
  std::string dataDir = util::installedPlaces().data;  ///< ends in a slash
  std::string systemName;                              ///< empty: the name from the tree's source
  std::string language = "en";

  /// [tree]
  std::string source = "host";  ///< or "file"
  std::string treeFile;         ///< the JSON document of source "file"
  bool includeLoopback = false;
  bool appliesToHost = false;  ///< apply = "host": what is set is brought to the host, not only to the overlay

  /// [log]
  int logLevel = util::kLevelError;  ///< lines below it are dropped
  std::string logTarget = "stderr";
  int traceLevel = util::kLevelError;
  std::string traceTarget = "off";

  BmcConfig bmc;

  bool operator==(const Config&) const = default;
};

/// The tables and keys of the file.
ZORVA_AGENT_API util::TomlSections configKeys();

/// Reads and checks a configuration (TOML 1.0). Throws ConfigError for whatever is wrong with it, a file that cannot be
/// read included. Thread-safe.
ZORVA_AGENT_API Config readConfig(const std::string& path);

/// The configuration that the environment selects: the file that ZORVAGENT_CONFIG names, else
/// agent.toml of this installation (/etc/zorvagent/agent.toml), else, if that does not exist, the built-in defaults.
/// Throws as readConfig does.
ZORVA_AGENT_API Config readDefaultConfig();

}  // namespace zorva::agent
