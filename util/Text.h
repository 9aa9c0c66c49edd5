#pragma once

// Blanks around texts, lists of texts, bytes as digits.

#include <string>
#include <string_view>
#include <vector>

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

/// The texts, with the separator between them.
inline std::string joined(const std::vector<std::string>& texts, std::string_view separator = ", ") {
  std::string out;
  for (const std::string& text : texts) {
    if (&text != &texts.front()) out += separator;
    out += text;
  }
  return out;
}

/// Bytes as hexadecimal digits, two lower-case ones each.
inline std::string hexOf(std::string_view bytes) {
  constexpr std::string_view kDigits = "0123456789abcdef";
  std::string text;
  for (const char byte : bytes) {
    text += kDigits[static_cast<unsigned char>(byte) >> 4U];
    text += kDigits[static_cast<unsigned char>(byte) & 15U];
  }
  return text;
}

}  // namespace zorva::util
