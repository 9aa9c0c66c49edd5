#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <vector>

#include "agent/config/Config.h"
#include "http/HttpLimits.h"
#include "http/Listener.h"

// The configuration of zorvacimd: a TOML 1.0 file, and what the command line puts in its place.

namespace zorva::server {

struct Config {
  std::string file;  ///< what it was read from; empty for the built-in defaults

  // [listen]
  /// Absent: 127.0.0.1 and ::1, of which the host may lack one.
  std::optional<http::Addresses> addresses;
  int port = 5988;  ///< 0: one that is free

  // [limits]
  http::HttpLimits limits;
  int nesting = 128;  ///< the most elements, one within another, in a request

  // [http]
  int threads = 2;  ///< that do the input and output; not those that wait for providers

  // [pull]
  int pullContexts = 100;        ///< enumerations that are open at once
  int pullClientContexts = 25;   ///< of these, of one client
  int pullSeconds = 60;          ///< how long one stays open unasked where the client says nothing
  int pullLongestSeconds = 600;  ///< the longest that a client may ask for
  int pullMebibytes = 64;        ///< what all of them hold

  // [agent]
  std::string agentConfig;        ///< the agent's own configuration; empty: where the agent looks for it
  std::string providerDirectory;  ///< empty: beside the program

  // [log]
  int logLevel = 5000;                   ///< lines below it are dropped
  std::optional<std::string> logTarget;  ///< absent: the agent's own
};

/// Reads and checks a configuration. Paths that are not absolute are taken from the directory of the file. Throws
/// zorva::agent::ConfigError, which names file, line and key, for whatever is wrong, a file that cannot be read
/// included.
Config readConfig(const std::string& path);

/// The configuration where none is named: /etc/zorvagent/zorvacimd.toml, or the built-in defaults where that is not
/// there. Throws as readConfig does.
Config readDefaultConfig();

}  // namespace zorva::server
