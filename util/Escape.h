#pragma once

// Escapes text so that it stays on one line.

#include <string>
#include <string_view>

namespace zorva::util {

/// Appends a text and escapes everything that could disturb a terminal or a reader of lines: \n, \r and \t as these,
/// every other control character (C0, DEL and C1) and every byte that is not UTF-8 as \xNN for each of its bytes.
void appendEscaped(std::string& line, std::string_view text);

}  // namespace zorva::util
