#pragma once

// The arguments of zorvacimd.

#include <optional>
#include <string>
#include <variant>

#include "server/Config.h"

namespace zorva::server {

struct CommandLine {
  std::string configFile;  ///< empty: the default path
  std::optional<http::Addresses> addresses;
  std::optional<int> port;
  std::optional<int> logLevel;
  std::optional<std::string> anonymous;  ///< the word of a role
  std::string agentConfig;
  std::string providerDirectory;
  std::string addedProviders;
  bool checkConfig = false;      ///< read the configuration, report whether it is valid, and end
  bool makeCertificate = false;  ///< write a self-signed certificate, and end
  bool greet = false;            ///< print on standard output how to send this server a request
  std::string manualDirectory;   ///< write the manual there, and end; empty: serve
};

/// A text to print instead of serving.
struct Telling {
  std::string text;
  bool isError = false;
};

std::variant<CommandLine, Telling> readCommandLine(int argc, const char* const* argv);

/// The configuration file of the command line, with the command line's own values instead of the file's. Throws
/// zorva::agent::ConfigError, or std::invalid_argument for an address that this server does not listen on.
Config configOf(const CommandLine& commandLine);

}  // namespace zorva::server
