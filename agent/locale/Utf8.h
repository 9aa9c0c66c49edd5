// UTF-8, one character at a time, for bytes that need not be any.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>

namespace zorva::agent {

struct Utf8Character {
  char32_t character = 0;
  std::size_t length = 0;  // in bytes; 1 for a byte that begins no well-formed character
  bool valid = false;
};

// The character that begins at that place, which must lie within the text. Well-formed is what RFC 3629 allows: no
// overlong forms, no surrogates, nothing past U+10FFFF.
Utf8Character decodeUtf8(std::string_view text, std::size_t place);

// Appends a character's UTF-8 form.
void appendUtf8(std::string& text, char32_t character);

}  // namespace zorva::agent
