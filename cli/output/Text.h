#pragma once

// Text for a terminal. Interface names, DNS names and provider messages come from elsewhere and may contain any bytes;
// a terminal must not get control characters from them.

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

#include "util/Text.h"

namespace zorva::cli {

/// `text` with unprintable characters made visible: \n, \t, \x1B for control characters and for bytes that are not
/// UTF-8, \u202E for characters that change the direction or the lines of the following text. The result is well-formed
/// UTF-8 for any bytes.
std::string printable(std::string_view text);

/// The columns of a printable text on a terminal: two for East Asian wide characters, none for combining ones.
std::size_t displayWidth(std::string_view text);

/// Cuts a printable text into lines of at most `width` columns, at blanks if possible. One line at least; a character
/// wider than `width` has its own line. `width` 0 means no limit.
std::vector<std::string> wrapped(std::string_view text, std::size_t width);

/// A printable text in at most `width` columns: a wider one is cut and ends in an ellipsis. `width` 0 means no limit.
std::string cutTo(std::string_view text, std::size_t width);

/// The first of these printable texts, as many as fit in `width` columns with blanks between them and "and 3 more" at
/// the end. Where not even the first fits: "4 in all", and a single one is cut. `width` 0 means no limit.
std::string firstOf(const std::vector<std::string>& texts, std::size_t width);

/// `text` for a document that must be UTF-8: an invalid byte becomes the character U+10EE00 plus the byte, as in the
/// agent's own documents.
std::string asUtf8(std::string_view text);

using util::joined;

/// What to do about a word that is none of the known ones: "did you mean eth0?" if one of them is near, else this.
std::string nearestOr(std::string_view word, const std::vector<std::string>& known, const std::string& otherwise);

/// "1 instance", "2 instances".
std::string counted(std::size_t count, std::string_view noun);

}  // namespace zorva::cli
