#include "cimxml/XmlText.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <cmath>
#include <cstdint>
#include <cstring>

#include "util/Utf8.h"

namespace zorva::cimxml {

namespace {

constexpr std::string_view kReplacement = "\xEF\xBF\xBD";

/// Whether XML 1.0 (2.2) allows the character.
bool isXmlCharacter(std::uint32_t code) noexcept {
  return code == '\t' || code == '\n' || code == '\r' || (code >= 0x20 && code != 0xFFFE && code != 0xFFFF);
}

/// Bytes that have no meaning in XML and are one character each.
constexpr std::array<bool, 256> kPlain = [] {
  std::array<bool, 256> plain{};
  for (std::size_t byte = 0x20; byte < 0x7F; ++byte) plain[byte] = true;
  for (const char special : std::string_view("&<>\"")) plain[static_cast<unsigned char>(special)] = false;
  return plain;
}();

/// The replacement of a character that must be escaped.
std::string_view standIn(char character) noexcept {
  switch (character) {
    case '&':
      return "&amp;";
    case '<':
      return "&lt;";
    case '>':
      return "&gt;";
    case '"':
      return "&quot;";
    // A reader would turn these into blanks in an attribute, and a carriage return into a line feed anywhere.
    case '\t':
      return "&#9;";
    case '\n':
      return "&#10;";
    case '\r':
      return "&#13;";
    case '\x7F':
      return "\x7F";
    default:
      return kReplacement;
  }
}

using Word = std::uint64_t;

template <typename Unsigned>
Unsigned load(const char* bytes) noexcept {
  Unsigned value = 0;
  std::memcpy(&value, bytes, sizeof value);
  return value;
}

/// Whether all eight bytes are plain.
bool isPlainWord(Word word) noexcept {
  constexpr Word kOnes = 0x0101010101010101;
  constexpr Word kHighs = 0x8080808080808080;
  // Sets the high bit of each byte that is 0. Borrows may set others, but only in a word that has such a byte.
  const auto zeros = [](Word each) { return (each - kOnes) & ~each; };
  const Word low = word - kOnes * 0x20;     // borrows from below 0x20
  const Word high = word | (word + kOnes);  // 0x7F and above
  const Word special =
      zeros(word ^ kOnes * '&') | zeros(word ^ kOnes * '<') | zeros(word ^ kOnes * '>') | zeros(word ^ kOnes * '"');
  return ((low | high | special) & kHighs) == 0;
}

/// How many bytes at the beginning of `text` are plain, tested in words of eight: most texts are plain. The last word
/// may overlap the one before.
std::size_t plainWords(std::string_view text) noexcept {
  const std::size_t size = text.size();
  const char* const bytes = text.data();
  if (size < sizeof(std::uint32_t)) return 0;
  if (size < sizeof(Word)) {
    const auto end = load<std::uint32_t>(bytes + size - sizeof(std::uint32_t));
    return isPlainWord(load<std::uint32_t>(bytes) | Word{end} << 32) ? size : 0;
  }
  std::size_t done = 0;
  for (; size - done >= sizeof(Word); done += sizeof(Word)) {
    if (!isPlainWord(load<Word>(bytes + done))) return done;
  }
  return isPlainWord(load<Word>(bytes + size - sizeof(Word))) ? size : done;
}

template <typename Number>
void appendNumber(std::string& out, Number value) {
  char text[32];
  out.append(text, std::to_chars(text, text + sizeof text, value).ptr);
}

}  // namespace

void appendAttribute(std::string& out, std::string_view name, std::string_view value) {
  out += ' ';
  out += name;
  out += "=\"";
  appendEscaped(out, value);
  out += '"';
}

void appendEscaped(std::string& out, std::string_view text) {
  // Nearly all text is plain: it is copied in runs, and only the characters between the runs are tested one by one.
  std::size_t begin = 0;
  std::size_t i = plainWords(text);
  while (i < text.size()) {
    const auto byte = static_cast<unsigned char>(text[i]);
    if (kPlain[byte]) {
      ++i;
      continue;
    }
    const std::string_view rest = text.substr(i);
    const std::size_t length = byte < 0x80 ? 1 : util::utf8Length(rest);
    if (byte >= 0x80 && length > 0 && isXmlCharacter(util::utf8Decode(rest))) {
      i += length;
      continue;
    }
    out.append(text, begin, i - begin);
    out += standIn(text[i]);
    i += length == 0 ? 1 : length;
    begin = i;
  }
  out.append(text, begin, text.size() - begin);
}

void PlainContent::operator()(std::uint64_t value) const { appendNumber(out, value); }

void PlainContent::operator()(std::int64_t value) const { appendNumber(out, value); }

void PlainContent::operator()(double value) const {
  if (!std::isfinite(value)) {
    out += std::isnan(value) ? "NaN" : value > 0 ? "INF" : "-INF";
    return;
  }
  const std::size_t begin = out.size();
  appendNumber(out, value);
  if (out.find('.', begin) == std::string::npos) out.insert(std::min(out.find('e', begin), out.size()), ".0");
}

void PlainContent::operator()(char16_t value) const {
  // A lone half of a surrogate pair is no character.
  if (value >= 0xD800 && value <= 0xDFFF) {
    out += kReplacement;
    return;
  }
  std::string text;
  util::utf8Append(text, value);
  appendEscaped(out, text);
}

}  // namespace zorva::cimxml
