#pragma once

// Blanks around texts.

#include <string_view>

namespace zorva::util {

inline constexpr std::string_view kBlanksAndTabs = " \t";
inline constexpr std::string_view kWhiteSpace = " \t\r\n";  ///< as XML has it

/// The text without those characters at its end.
constexpr std::string_view trimmedEnd(std::string_view text, std::string_view blanks = kBlanksAndTabs) noexcept {
  return text.substr(0, text.find_last_not_of(blanks) + 1);
}

/// The text without those characters at both ends.
constexpr std::string_view trimmed(std::string_view text, std::string_view blanks = kBlanksAndTabs) noexcept {
  text = trimmedEnd(text, blanks);
  return text.empty() ? text : text.substr(text.find_first_not_of(blanks));
}

}  // namespace zorva::util
