#pragma once

// The known word that a misspelt one was probably meant to be.

#include <string>
#include <string_view>
#include <vector>

namespace zorva::util {

/// The candidate that the fewest edits make of the word (a character more, less or another, or two neighbours
/// exchanged), without regard to the case of ASCII letters; the first of several. Empty if none is near: more than a
/// third of the word's characters would have to be edited, at least one may. Words of more than 64 bytes are near none.
std::string nearest(std::string_view word, const std::vector<std::string>& candidates);

/// "did you mean eth0?"; empty if none is near.
std::string didYouMean(std::string_view word, const std::vector<std::string>& candidates);

}  // namespace zorva::util
