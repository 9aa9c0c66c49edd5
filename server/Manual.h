#pragma once

// The manual pages of zorvacimd, and the sample of its configuration.

#include <string>

#include "manual/Command.h"
#include "manual/ConfigPage.h"

namespace zorva::server {

manual::ConfigFile serverConfigFile();

/// zorvacimd(8).
manual::Page serverPage(const manual::Command& program);

/// Writes the pages below the directory, as man(1) looks for them, and the sample of the configuration beside them.
/// Throws std::runtime_error.
void writeManual(const std::string& directory, const manual::Command& program);

}  // namespace zorva::server
