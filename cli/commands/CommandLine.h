#pragma once

// The command line: the subcommands register themselves with their words and options, which then are read from argv.
// Help, completion and the errors of wrong usage are made of what is registered.

#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "cli/commands/HostsRun.h"
#include "cli/session/Globals.h"
#include "manual/Command.h"
#include "util/NotCopied.h"

namespace CLI {
class App;
class Option;
}  // namespace CLI

namespace zorva::cli {

/// The text to print instead of running a command: help, the version, or the error of the command line.
struct Telling {
  std::string text;
  bool isError = false;
  std::string hint = {};  ///< of an error: what to do next
};

/// The possible words at a place of the command line.
struct Completion {
  std::vector<std::string> words;                    ///< subcommands, options, or the values of an option
  std::map<std::string, std::string> meanings = {};  ///< of some of them
  /// Other possible words: "CLASS", "PATH", "INTERFACE", "OLD" (an interface that is gone), "METHOD", "PROPERTY",
  /// "ROLE", "FILE", "DIR", "COMMAND", and with a "=" after them "PROPERTY=" and "PARAMETER="; there is no list of
  /// others.
  std::string kind = {};
};

/// How many words may be given at the last place: any number; at least one; one.
enum class Many { Any, Some, One };

class CommandLine;

/// A subcommand while it is registered. What it reads into must live as long as the command line.
class Subcommand {
 public:
  /// A subcommand under this one, which then needs one.
  Subcommand add(const std::string& name, const std::string& description);

  Subcommand& alias(const std::string& name);

  /// Neither help nor completion mention it.
  Subcommand& hidden();

  /// How it is called, a line each, for its help.
  Subcommand& examples(std::string_view lines);

  /// The formats that its help and completion list; without this, and for one format, help lists none. The command
  /// does not run with another.
  Subcommand& writes(std::vector<OutputFormat> formats);
  Subcommand& writesJson() { return writes({OutputFormat::Table, OutputFormat::Json}); }

  /// The same for a command that refuses other formats itself.
  Subcommand& offers(std::vector<OutputFormat> formats);

  /// It has instances as results, in the formats of those and on demand with some properties alone; or names.
  Subcommand& readsInstances(std::vector<std::string>& properties);
  Subcommand& readsNames() { return offers({OutputFormat::Table, OutputFormat::Json}); }

  /// It reads or writes files of this host: the command does not run with a server.
  Subcommand& local();

  /// It may change something on the host that is asked.
  Subcommand& changes();

  /// Its results on several hosts can be put together: it writes only results, as one JSON document and, where
  /// Layout::rowsAlone is set, as tables with headings.
  Subcommand& gathers();

  /// A required positional word: "PATH". Its name says how it is completed.
  Subcommand& word(const std::string& name, const std::string& description, std::string& into);
  Subcommand& interface(std::string& into) { return word("INTERFACE", "The interface's name", into); }
  Subcommand& optionalWord(const std::string& name, const std::string& description, std::string& into);

  /// The words at the last place. `kind` says what completes them, where `name` does not.
  Subcommand& words(const std::string& name, const std::string& description, Many many, std::vector<std::string>& into,
                    const std::string& kind = {});

  /// A word that must be one of these.
  Subcommand& choice(const std::string& name, const std::string& description, std::vector<std::string> choices,
                     std::string& into);

  /// An option with a value of this kind: "--role".
  Subcommand& option(const std::string& name, const std::string& kind, const std::string& description,
                     std::string& into);

  /// An option that may be given several times.
  Subcommand& repeatable(const std::string& name, const std::string& kind, const std::string& description,
                         std::vector<std::string>& into);

  Subcommand& flag(const std::string& name, const std::string& description, bool& into);
  /// --dry-run, which sets Globals::dryRun.
  Subcommand& dryRun(const char* description = "Show what would be done, and do nothing");

  /// The command of this subcommand.
  Subcommand& runs(Command command);

  /// The same with the subcommand's own options, which the command line keeps alive.
  template <typename Options>
  Subcommand& runs(void (*command)(const Globals&, const Options&), std::shared_ptr<const Options> options) {
    return runs([command, options = std::move(options)](const Globals& globals) { command(globals, *options); });
  }

 private:
  friend class CommandLine;
  Subcommand(CommandLine& line, CLI::App& app) : line_(line), app_(app) {}

  CommandLine& line_;
  CLI::App& app_;
};

class CommandLine : util::NotCopied {
 public:
  CommandLine();
  ~CommandLine();

  /// Registers a subcommand. Help lists them in this order.
  Subcommand add(const std::string& name, const std::string& description);

  /// Reads the words; call it once, after all subcommands are registered. Nothing: a command is to be run.
  std::optional<Telling> read(int argc, const char* const* argv);

  const Globals& globals() const noexcept;

  /// Runs the command that was read. Throws what that throws, and Failure (wrong usage) if it does not write the format
  /// that is asked for, or cannot use the server that is given.
  void run() const;

  /// What is registered, without what is hidden.
  manual::Command description() const;

  /// The possible words after these words.
  Completion completionAfter(const std::vector<std::string>& words) const;

 private:
  friend class Subcommand;
  struct Registered;
  std::unique_ptr<Registered> registered_;
};

}  // namespace zorva::cli
