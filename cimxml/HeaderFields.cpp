#include "cimxml/HeaderFields.h"

#include <charconv>

#include "util/Utf8.h"

namespace zorva::cimxml {

namespace {

bool isPlain(char c) noexcept {
  return (c >= '0' && c <= '9') || (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') ||
         std::string_view("-._~/:").find(c) != std::string_view::npos;
}

/// The byte of a "%41" at the beginning of `text`; nothing if "%" lacks its two digits.
std::optional<char> escapedByte(std::string_view text) noexcept {
  if (text.size() < 3) return std::nullopt;
  unsigned byte = 0;
  const char* const digits = text.data() + 1;
  if (std::from_chars(digits, digits + 2, byte, 16).ptr != digits + 2) return std::nullopt;
  return static_cast<char>(byte);
}

struct Decoded {
  std::string text;
  bool isWhole = true;  ///< each "%" has its two digits
};

Decoded decode(std::string_view value) {
  Decoded decoded;
  while (!value.empty()) {
    const bool isPercent = value.front() == '%';
    const std::optional<char> byte = isPercent ? escapedByte(value) : std::nullopt;
    if (isPercent && !byte) decoded.isWhole = false;
    decoded.text += byte.value_or(value.front());
    value.remove_prefix(byte ? 3 : 1);
  }
  return decoded;
}

}  // namespace

std::string fieldValue(std::string_view text) {
  constexpr char kDigits[] = "0123456789ABCDEF";
  std::string out;
  for (const char c : text) {
    const auto byte = static_cast<unsigned char>(c);
    if (isPlain(c)) {
      out += c;
    } else {
      out += {'%', kDigits[byte >> 4U], kDigits[byte & 15U]};
    }
  }
  return out;
}

std::string fieldText(std::string_view value) { return decode(value).text; }

std::optional<std::string> strictFieldText(std::string_view value) {
  Decoded decoded = decode(value);
  if (!decoded.isWhole || !util::isUtf8(decoded.text)) return std::nullopt;
  return std::move(decoded.text);
}

}  // namespace zorva::cimxml
