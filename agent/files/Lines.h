#pragma once

// Splits configuration files into lines and words.

#include <string>
#include <string_view>
#include <vector>

namespace zorva::agent {

/// Removes the first line from the text and returns it without its end, LF or CRLF.
std::string_view takeLine(std::string_view& text);

/// The words of a line, separated by blanks and tabs, up to a word that begins with "#" or ";".
std::vector<std::string> wordsOf(std::string_view line);

}  // namespace zorva::agent
