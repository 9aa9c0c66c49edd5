#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

namespace zorva::schema {

/// The number of bytes of the well-formed UTF-8 character (RFC 3629) at the begin of `text`; 0 where there is none.
constexpr std::size_t utf8Length(std::string_view text) noexcept {
  if (text.empty()) return 0;
  const auto byte = [&](std::size_t i) { return static_cast<unsigned char>(text[i]); };
  const unsigned char lead = byte(0);
  if (lead < 0x80) return 1;
  const std::size_t length = lead >= 0xF0 ? 4 : lead >= 0xE0 ? 3 : 2;
  if (lead < 0xC2 || lead > 0xF4 || text.size() < length) return 0;
  for (std::size_t i = 1; i < length; ++i) {
    if ((byte(i) & 0xC0U) != 0x80) return 0;
  }
  // Overlong forms, surrogates, and what lies beyond U+10FFFF.
  if ((lead == 0xE0 && byte(1) < 0xA0) || (lead == 0xED && byte(1) >= 0xA0)) return 0;
  if ((lead == 0xF0 && byte(1) < 0x90) || (lead == 0xF4 && byte(1) >= 0x90)) return 0;
  return length;
}

/// The character at the begin of `text`, which must be well-formed and not empty.
constexpr std::uint32_t utf8Decode(std::string_view text) noexcept {
  const std::size_t length = utf8Length(text);
  const auto lead = static_cast<unsigned char>(text[0]);
  if (length <= 1) return lead;
  std::uint32_t code = lead & (0xFFU >> (length + 1));
  for (std::size_t i = 1; i < length; ++i) code = (code << 6U) | (static_cast<unsigned char>(text[i]) & 0x3FU);
  return code;
}

/// Appends a character up to U+FFFF.
inline void utf8Append(std::string& out, std::uint32_t code) {
  const auto put = [&](std::uint32_t byte) { out.push_back(static_cast<char>(static_cast<unsigned char>(byte))); };
  if (code < 0x80) {
    put(code);
  } else if (code < 0x800) {
    put(0xC0U | (code >> 6U));
    put(0x80U | (code & 0x3FU));
  } else {
    put(0xE0U | (code >> 12U));
    put(0x80U | ((code >> 6U) & 0x3FU));
    put(0x80U | (code & 0x3FU));
  }
}

/// The largest length up to `most` at which well-formed `text` can be cut without breaking a character.
constexpr std::size_t utf8Cut(std::string_view text, std::size_t most) noexcept {
  if (most >= text.size()) return text.size();
  while (most > 0 && (static_cast<unsigned char>(text[most]) & 0xC0U) == 0x80) --most;
  return most;
}

}  // namespace zorva::schema
