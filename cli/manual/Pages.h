#pragma once

// The manual pages of zorvactl, of its commands and of agent.toml.

#include <string>
#include <vector>

#include "manual/Command.h"
#include "manual/ConfigPage.h"

namespace zorva::cli {

manual::ConfigFile agentConfigFile();

/// The page of the program, or of one of its commands.
manual::Page pageOf(const manual::Command& command);

/// All of them.
std::vector<manual::Page> manualPages(const manual::Command& program);

}  // namespace zorva::cli
