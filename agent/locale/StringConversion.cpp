#include "agent/interface/StringConversion.h"

#include "agent/locale/Utf8.h"

namespace ZV {
namespace {

// A byte that is no UTF-8 stands as a lone low surrogate, which no UTF-8 text decodes to.
constexpr char32_t kByteBase = 0xDC00;

bool isByte(char32_t character) { return character >= kByteBase + 0x80 && character <= kByteBase + 0xFF; }

bool isScalar(char32_t character) { return character <= 0x10FFFF && (character < 0xD800 || character > 0xDFFF); }

constexpr char32_t kReplacement = 0xFFFD;

}  // namespace

std::wstring make_wstring(const std::string& text) {
  std::wstring wide;
  wide.reserve(text.size());
  for (std::size_t place = 0; place < text.size();) {
    const auto [character, length, valid] = zorva::agent::decodeUtf8(text, place);
    const char32_t byte = kByteBase + static_cast<unsigned char>(text[place]);
    wide += static_cast<wchar_t>(valid ? character : byte);
    place += length;
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
    if (isByte(character)) {
      narrow += static_cast<char>(static_cast<unsigned char>(character - kByteBase));
    } else {
      zorva::agent::appendUtf8(narrow, isScalar(character) ? character : kReplacement);
    }
  }
  return narrow;
}

std::string stripSpaces(const std::string& text) {
  const std::size_t first = text.find_first_not_of(" \t");
  if (first == std::string::npos) return {};
  return text.substr(first, text.find_last_not_of(" \t") - first + 1);
}

}  // namespace ZV
