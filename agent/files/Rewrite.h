#pragma once

// Checks whether an interface file is complete after a rewrite in place.

#include <string_view>

namespace zorva::agent {

enum class Rewrite {
  Whole,     ///< every line is there, unchanged or with a new value
  CutShort,  ///< the writer stopped in the middle
  Foreign,   ///< something else was written
};

/// Classifies a rewrite by the text before it and the current text. A rewrite takes the lines of the old text in order,
/// those longer than 511 bytes as several. It replaces each line that contains one of the changeable keys by
/// "KEY=value".
Rewrite compareRewrite(std::string_view before, std::string_view now);

}  // namespace zorva::agent
