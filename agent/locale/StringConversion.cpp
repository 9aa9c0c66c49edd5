#include "agent/interface/StringConversion.h"

#include <string_view>

#include "util/Text.h"
#include "util/Utf8.h"

namespace ZV {
namespace {

// A byte that is not UTF-8 becomes a lone low surrogate, which no UTF-8 text decodes to.
constexpr char32_t kByteBase = 0xDC00;

bool isByte(char32_t character) { return character >= kByteBase + 0x80 && character <= kByteBase + 0xFF; }

bool isScalar(char32_t character) { return character <= 0x10FFFF && (character < 0xD800 || character > 0xDFFF); }

constexpr char32_t kFirstBeyondAscii = 0x80;

bool isAscii(char byte) { return static_cast<unsigned char>(byte) < kFirstBeyondAscii; }

constexpr char32_t kReplacement = 0xFFFD;

}  // namespace

std::wstring make_wstring(const std::string& text) {
  std::wstring wide;
  wide.reserve(text.size());
  for (std::size_t place = 0; place < text.size();) {
    if (isAscii(text[place])) {
      wide += static_cast<wchar_t>(text[place++]);
      continue;
    }
    const std::string_view rest = std::string_view(text).substr(place);
    const std::size_t length = zorva::util::utf8Length(rest);
    const char32_t byte = kByteBase + static_cast<unsigned char>(text[place]);
    wide += static_cast<wchar_t>(length == 0 ? byte : zorva::util::utf8Decode(rest));
    place += length == 0 ? 1 : length;
  }
  return wide;
}

std::wstring make_wstring(const char* text) {
  return text == nullptr ? std::wstring() : make_wstring(std::string(text));
}

std::string make_string(const std::wstring& text) {
  std::string narrow;
  narrow.reserve(text.size());
  for (const wchar_t wide : text) {
    const auto character = static_cast<char32_t>(wide);
    if (character < kFirstBeyondAscii) {
      narrow += static_cast<char>(character);
    } else if (isByte(character)) {
      narrow += static_cast<char>(static_cast<unsigned char>(character - kByteBase));
    } else {
      zorva::util::utf8Append(narrow, isScalar(character) ? character : kReplacement);
    }
  }
  return narrow;
}

std::string stripSpaces(const std::string& text) { return std::string(zorva::util::trimmed(text)); }

}  // namespace ZV
