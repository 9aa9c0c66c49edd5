#pragma once

// What manual pages say of zorvactl beyond what its command line declares: texts, in the form that
// manual::sectionsOf() reads.

#include <span>
#include <string_view>

namespace zorva::cli {

struct Prose {
  std::string_view command;  ///< "show"; empty: of the program
  std::string_view text;
};

/// Of each command that help lists.
std::span<const Prose> allProse();

/// Empty if there is none.
std::string_view proseOf(std::string_view command);

/// Of agent.toml.
extern const std::string_view kAgentConfigProse;

}  // namespace zorva::cli
