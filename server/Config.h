#pragma once

// The configuration of zorvacimd: a TOML 1.0 file, and the command line's values, which replace the file's.

#include <cstddef>
#include <optional>
#include <string>
#include <vector>

#include "access/LoginGate.h"
#include "agent/config/Config.h"
#include "frontend/AddedProviders.h"
#include "http/HttpLimits.h"
#include "http/Listener.h"
#include "http/TlsIdentity.h"
#include "util/LogLevels.h"
#include "util/TomlKeys.h"

namespace zorva::server {

inline constexpr const char* kDefaultSocket = "/run/zorvacimd/cim.sock";

struct Config {
  std::string file;  ///< the file; empty for the built-in defaults

  // [listen]
  /// Absent: 127.0.0.1 and ::1; the host may lack one of them.
  std::optional<http::Addresses> addresses;
  int port = 5988;                    ///< 0: a free one
  std::optional<std::string> socket;  ///< a Unix socket; empty: none; absent: kDefaultSocket, where that can be made
  std::vector<std::string> names;     ///< further names of this host that clients may use

  // [tls]
  http::TlsFiles tls;  ///< without a certificate: no TLS
  std::optional<http::Addresses> tlsAddresses;
  int tlsPort = 5989;

  /// [limits]
  http::HttpLimits limits;
  int nesting = 128;  ///< the deepest nesting of elements in a request

  /// [http]
  int threads = 2;         ///< for input and output; other threads wait for providers
  bool hasConsole = true;  ///< a browser gets the page of console/

  /// [pull]
  int pullContexts = 100;        ///< enumerations that are open at once
  int pullClientContexts = 25;   ///< of these, of one client
  int pullSeconds = 60;          ///< how long an idle one is kept if the client gives no timeout
  int pullLongestSeconds = 600;  ///< the longest timeout that a client may request
  int pullMebibytes = 64;        ///< memory of all of them

  /// [agent]
  std::string agentConfig;        ///< the agent's own configuration file; empty: the agent's default
  std::string providerDirectory;  ///< empty: beside the program

  std::string addedProviders = frontend::usualProviders();  ///< a directory of further providers

  /// [access]
  access::LoginOptions access;

  /// [audit]
  std::string auditFile;  ///< empty: the audit's lines are in the log

  /// [metrics]
  int checkSeconds = 0;  ///< between two questions to each DNS server; 0: none is asked

  /// [watch]
  int watchers = 32;  ///< clients that watch at once

  /// [log]
  int logLevel = util::kLevelWarning;    ///< lines below it are dropped
  std::optional<std::string> logTarget;  ///< absent: the agent's default

  bool operator==(const Config&) const = default;
};

/// The tables and keys of the file.
util::TomlSections configKeys();

/// Reads and checks a configuration. Relative paths start at the directory of the file. Throws
/// zorva::agent::ConfigError, which names file, line and key, for every error, also for a file that cannot be read.
Config readConfig(const std::string& path);

/// The configuration if no file is named: zorvacimd.toml of this installation (/etc/zorvagent/zorvacimd.toml), or the
/// built-in defaults if it does not exist. Throws as readConfig does.
Config readDefaultConfig();

}  // namespace zorva::server
