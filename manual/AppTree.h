#pragma once

// What a CLI11 command line declares, as the manual needs it.

#include <functional>
#include <string>

#include "manual/Command.h"

namespace CLI {
class App;
class Option;
}  // namespace CLI

namespace zorva::manual {

/// The command with all below it but hidden ones. complete() adds what CLI11 does not know.
Command commandOf(const CLI::App& app, const std::function<void(const CLI::App&, Command&)>& complete = {});

}  // namespace zorva::manual
