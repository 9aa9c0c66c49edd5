#pragma once

// The subcommands of zorvactl. Each function registers one of them, or a family, with its words and options; what it
// does is in the source of the same name.

#include <string>
#include <string_view>
#include <vector>

#include "cli/commands/CommandLine.h"

namespace zorva::cli {

/// Registers all of them.
void addCommands(CommandLine& line);

/// Registers the only one, or the only family, that these words name: most of the time that a small command takes would
/// be spent on the others. False, with nothing registered, if they name none or several. Then, and for help and errors,
/// all must be registered.
bool addNamedCommands(CommandLine& line, const std::vector<std::string_view>& words);

void addShowCommand(CommandLine& line);
void addCheckCommand(CommandLine& line);
void addWatchCommand(CommandLine& line);
void addTreeCommand(CommandLine& line);
void addClassesCommand(CommandLine& line);
void addGraphCommand(CommandLine& line);
void addReadCommands(CommandLine& line);
void addAssociationCommands(CommandLine& line);
void addModifyCommand(CommandLine& line);
void addInvokeCommand(CommandLine& line);
void addIfcfgCommands(CommandLine& line);
void addDnsCommands(CommandLine& line);
void addDomainCommand(CommandLine& line);
void addSuffixesCommands(CommandLine& line);
void addOverlayCommands(CommandLine& line);
void addApplyCommands(CommandLine& line);
void addUserCommands(CommandLine& line);
void addRegisterCommands(CommandLine& line);
void addCompletionCommands(CommandLine& line);
void addManualCommands(CommandLine& line);

/// The script for "bash", "zsh" or "fish".
std::string completionScript(const std::string& shell);

}  // namespace zorva::cli
