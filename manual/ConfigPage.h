#pragma once

// A configuration file as a manual page, and as the sample that is installed. Both are made of the keys that its reader
// takes.

#include <string>
#include <string_view>

#include "manual/Page.h"
#include "util/TomlKeys.h"

namespace zorva::manual {

struct ConfigFile {
  std::string_view name;     ///< "agent.toml"
  std::string_view summary;  ///< of its page
  std::string_view opening;  ///< the first lines of the sample, without marks
  std::string_view prose;    ///< further sections of the page, as sectionsOf() reads them
  util::TomlSections sections;
};

Page configPage(const ConfigFile& file);

/// Every key, commented out with its default (or with an example, where there is none), but for those that the
/// installed file sets. The comment of a key is above it; a key has no blank after its "#", a comment has one.
std::string sampleOf(const ConfigFile& file);

}  // namespace zorva::manual
