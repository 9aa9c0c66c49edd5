#pragma once

#include <optional>
#include <string>
#include <variant>

#include "server/Config.h"

// The arguments of zorvacimd.

namespace zorva::server {

struct CommandLine {
  std::string configFile;  ///< empty: the usual place
  std::optional<http::Addresses> addresses;
  std::optional<int> port;
  std::optional<int> logLevel;
  std::string agentConfig;
  std::string providerDirectory;
  bool checkConfig = false;  ///< read the configuration, tell whether it is good, and end
  bool greet = false;        ///< tell on standard output how to ask this server something
};

/// What is to be printed instead of serving.
struct Telling {
  std::string text;
  bool isError = false;
};

std::variant<CommandLine, Telling> readCommandLine(int argc, const char* const* argv);

/// The configuration that the command line asks for: its file with the command line's own values in it. Throws
/// zorva::agent::ConfigError, std::invalid_argument for an address that this server does not listen on.
Config configOf(const CommandLine& commandLine);

}  // namespace zorva::server
