// Whether an interface file that was rewritten in place is whole.
#pragma once

#include <string_view>

namespace zorva::agent {

enum class Rewrite {
  Whole,     // every line is there, as it was or with a new value
  CutShort,  // the writer got to a point in the middle, and no further
  Foreign,   // something else was written
};

// Tells what a rewrite has come to, from the text before it and the text that is there now. A rewrite takes the lines
// of the old text in order, those longer than 511 bytes as several, and puts "KEY=value" in the place of each that
// holds one of the keys that can be changed.
Rewrite compareRewrite(std::string_view before, std::string_view now);

}  // namespace zorva::agent
