#include "agent/locale/Utf8.h"

namespace zorva::agent {
namespace {

unsigned int byteAt(std::string_view text, std::size_t place) { return static_cast<unsigned char>(text[place]); }

constexpr Utf8Character kNoCharacter{0, 1, false};

}  // namespace

Utf8Character decodeUtf8(std::string_view text, std::size_t place) {
  const unsigned int first = byteAt(text, place);
  if (first < 0x80) return {static_cast<char32_t>(first), 1, true};

  std::size_t length = 0;
  char32_t character = 0;
  char32_t smallest = 0;  // below it the form is overlong
  if ((first & 0xE0) == 0xC0) {
    length = 2, character = first & 0x1F, smallest = 0x80;
  } else if ((first & 0xF0) == 0xE0) {
    length = 3, character = first & 0x0F, smallest = 0x800;
  } else if ((first & 0xF8) == 0xF0) {
    length = 4, character = first & 0x07, smallest = 0x10000;
  } else {
    return kNoCharacter;
  }
  if (text.size() - place < length) return kNoCharacter;
  for (std::size_t i = 1; i < length; ++i) {
    const unsigned int next = byteAt(text, place + i);
    if ((next & 0xC0) != 0x80) return kNoCharacter;
    character = (character << 6) | (next & 0x3F);
  }
  const bool surrogate = character >= 0xD800 && character <= 0xDFFF;
  if (character < smallest || character > 0x10FFFF || surrogate) return kNoCharacter;
  return {character, length, true};
}

void appendUtf8(std::string& text, char32_t character) {
  const auto append = [&text](char32_t byte) { text += static_cast<char>(static_cast<unsigned char>(byte)); };
  if (character < 0x80) {
    append(character);
  } else if (character < 0x800) {
    append(0xC0 | (character >> 6));
    append(0x80 | (character & 0x3F));
  } else if (character < 0x10000) {
    append(0xE0 | (character >> 12));
    append(0x80 | ((character >> 6) & 0x3F));
    append(0x80 | (character & 0x3F));
  } else {
    append(0xF0 | (character >> 18));
    append(0x80 | ((character >> 12) & 0x3F));
    append(0x80 | ((character >> 6) & 0x3F));
    append(0x80 | (character & 0x3F));
  }
}

}  // namespace zorva::agent
