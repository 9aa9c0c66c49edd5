#pragma once

// The subcommands of zorvactl. Each function registers one of them, or a family, with its words and options; what it
// does is in the source of the same name.

#include "cli/commands/CommandLine.h"

namespace zorva::cli {

/// Registers all of them.
void addCommands(CommandLine& line);

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
