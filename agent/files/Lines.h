// Texts of lines and words, as configuration files have them.
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace zorva::agent {

// Takes the first line off the text, without its end, LF or CRLF.
std::string_view takeLine(std::string_view& text);

// The words of a line, which blanks and tabs part, up to a word that begins with "#" or ";".
std::vector<std::string> wordsOf(std::string_view line);

}  // namespace zorva::agent
