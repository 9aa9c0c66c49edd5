#pragma once

// The keys of a configuration, as data: the reader, the sample file and the manual page are all made of them, so that
// no key is undocumented. All texts are static.

#include <limits>
#include <span>
#include <string_view>

namespace zorva::util {

enum class TomlType { Text, Path, Number, Switch, Texts };

struct TomlKey {
  std::string_view name = {};
  TomlType type = TomlType::Text;
  std::string_view standard = {};  ///< what counts without the key, as TOML; empty: no value is the same as none
  std::string_view example = {};   ///< another value, as TOML
  std::string_view meaning = {};   ///< sentences, in the markup of manual/Markup.h
  std::string_view words = {};     ///< of a text: the only values, "read|none"; empty: any
  int least = std::numeric_limits<int>::min();  ///< of a number
  int most = std::numeric_limits<int>::max();
  std::string_view installed = {};  ///< what the installed file sets it to, as TOML; empty: it does not set it
};

/// A table of a configuration, which TOML calls by the name in brackets.
struct TomlSection {
  std::string_view name = {};
  std::string_view meaning = {};
  std::span<const TomlKey> keys = {};
};

using TomlSections = std::span<const TomlSection>;

}  // namespace zorva::util
