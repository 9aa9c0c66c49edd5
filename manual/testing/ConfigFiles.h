#pragma once

// For tests of a configuration's reader: files made of its keys.

#include <algorithm>
#include <string>
#include <string_view>
#include <utility>

#include "util/TomlKeys.h"

namespace zorva::manual::testing {

/// A sample file with every key of it in effect, and without those that it sets itself.
inline std::string uncommented(std::string_view sample) {
  std::string out;
  while (!sample.empty()) {
    std::string_view line = sample.substr(0, sample.find('\n'));
    sample.remove_prefix(std::min(line.size() + 1, sample.size()));
    const bool isKey = line.size() > 1 && line[0] == '#' && line[1] != ' ';
    if (isKey) line.remove_prefix(1);
    if (isKey || line.starts_with("[")) out.append(line).append("\n");
  }
  return out;
}

/// A file in which every key has its example, but for one: {table, key}.
inline std::string examplesWithout(util::TomlSections sections, std::pair<std::string_view, std::string_view> left) {
  std::string out;
  for (const util::TomlSection& section : sections) {
    out.append("[").append(section.name).append("]\n");
    for (const util::TomlKey& key : section.keys) {
      if (std::pair(section.name, key.name) == left) continue;
      out.append(key.name).append(" = ").append(key.example).append("\n");
    }
  }
  return out;
}

}  // namespace zorva::manual::testing
