#pragma once

// A command as its command line declares it, and the manual page that is made of that and of prose. So help, page and
// parser agree.

#include <string>
#include <string_view>
#include <vector>

#include "manual/Page.h"

namespace zorva::manual {

struct DeclaredOption {
  std::string name;   ///< "--output", or of an argument "PATH"
  std::string brief;  ///< "-o", or empty
  std::string value;  ///< "FORMAT"; empty: it takes none
  std::string meaning;
  bool isRequired = false;
  bool isRepeatable = false;

  bool operator==(const DeclaredOption&) const = default;
};

struct Command {
  std::string call;  ///< "zorvactl dns set"
  std::string summary;
  std::vector<std::string> aliases;
  std::vector<DeclaredOption> arguments;
  std::vector<DeclaredOption> options;
  std::vector<Command> commands;
  std::string examples;  ///< a line each, with a comment after two blanks or more; a line may go on after "\"
  std::vector<std::string> outputs;  ///< the formats of --output, if there are several

  /// "set".
  std::string name() const { return call.substr(call.rfind(' ') + 1); }
};

/// The page of a command with all below it. Prose as sectionsOf() reads it: its items in OPTIONS, ARGUMENTS and
/// COMMANDS are added to those of the command, to which their terms must belong. Throws std::logic_error if one does
/// not.
Page commandPage(const Command& command, std::string_view prose);

}  // namespace zorva::manual
