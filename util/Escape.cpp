#include "util/Escape.h"

#include "util/Utf8.h"

namespace zorva::util {
namespace {

bool isPlain(char c) { return c >= 0x20 && c < 0x7F; }

void appendByte(std::string& line, char byte) {
  constexpr char kDigits[] = "0123456789abcdef";
  const auto value = static_cast<unsigned char>(byte);
  line += "\\x";
  line += kDigits[value >> 4];
  line += kDigits[value & 0x0F];
}

void appendSpecial(std::string& line, std::string_view character) {
  switch (character.front()) {
    case '\n':
      line += "\\n";
      return;
    case '\r':
      line += "\\r";
      return;
    case '\t':
      line += "\\t";
      return;
    default:
      for (const char byte : character) appendByte(line, byte);
  }
}

}  // namespace

void appendEscaped(std::string& line, std::string_view text) {
  for (std::size_t place = 0; place < text.size();) {
    std::size_t plain = place;
    while (plain < text.size() && isPlain(text[plain])) ++plain;
    line.append(text, place, plain - place);
    place = plain;
    if (place == text.size()) return;

    const std::size_t length = utf8Length(text.substr(place));
    const std::string_view bytes = text.substr(place, length == 0 ? 1 : length);
    if (length != 0 && utf8Decode(bytes) >= 0xA0) {
      line += bytes;
    } else {
      appendSpecial(line, bytes);
    }
    place += bytes.size();
  }
}

}  // namespace zorva::util
