#pragma once

#include <functional>
#include <optional>
#include <string>
#include <variant>
#include <vector>

// The command line, read.

namespace zorva::cli {

enum class OutputFormat { Table, Json, Mof, Xml, Dot, Svg };

/// The option's word for a format: "json".
const char* formatName(OutputFormat format) noexcept;

/// What the command line says. Which of the fields count depends on the subcommand.
struct Arguments {
  OutputFormat output = OutputFormat::Table;
  std::string config;             ///< the agent's configuration; empty: as the environment says
  std::optional<int> logLevel;    ///< lines below it are dropped; absent: as the configuration says
  std::string providerDirectory;  ///< empty: beside this program
  std::string url;                ///< of the CIM server to ask; empty: the providers, in this process

  std::string target;               ///< a class, an object path, an interface, a shell
  std::string method;               ///< of invoke
  std::vector<std::string> values;  ///< name=value pairs, servers, suffixes

  std::string associationClass;
  std::string resultClass;
  std::string role;
  std::string resultRole;

  std::vector<std::string> properties;  ///< of those wanted; empty: all
  bool all = false;                     ///< whatever time it takes
  bool only = false;
  bool force = false;
  bool dryRun = false;
};

/// A subcommand: does what the arguments say, writes to standard output. Throws Failure where it cannot.
using Command = std::function<void(const Arguments& arguments)>;

/// What is to be done: run a command with these arguments.
struct Invocation {
  Arguments arguments;
  Command command;
};

/// What is to be told instead: help, the version, or why the command line is wrong.
struct Telling {
  std::string text;
  bool isError = false;
  std::string hint = {};  ///< of an error: what to do next
};

/// Reads the command line. The only part of the program that knows the options.
std::variant<Invocation, Telling> readArguments(int argc, const char* const* argv);

/// What can stand at a place of the command line.
struct Completion {
  std::vector<std::string> words;  ///< subcommands, options, or the values of an option
  /// What else can: "CLASS", "PATH", "INTERFACE", "METHOD", "PROPERTY", "ROLE", and with a "=" behind them "PROPERTY="
  /// and "PARAMETER="; of others there is no list.
  std::string kind;
};

/// What can stand behind these words.
Completion completionBehind(const std::vector<std::string>& words);

}  // namespace zorva::cli
