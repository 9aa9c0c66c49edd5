#include "util/Utf8.h"

#include <utf8.h>

#include <iterator>

namespace zorva::util {

std::size_t utf8Length(std::string_view text) noexcept {
  if (text.empty()) return 0;
  const auto lead = static_cast<unsigned char>(text[0]);
  if (lead < 0x80) return 1;
  const std::size_t length = lead >= 0xF0 ? 4 : lead >= 0xE0 ? 3 : 2;
  return text.size() >= length && isUtf8(text.substr(0, length)) ? length : 0;
}

std::uint32_t utf8Decode(std::string_view text) noexcept { return utf8::unchecked::peek_next(text.begin()); }

bool isUtf8(std::string_view text) noexcept { return utf8::is_valid(text.begin(), text.end()); }

void utf8Append(std::string& out, std::uint32_t code) { utf8::unchecked::append(code, std::back_inserter(out)); }

std::size_t utf8Cut(std::string_view text, std::size_t most) noexcept {
  if (most >= text.size()) return text.size();
  while (most > 0 && (static_cast<unsigned char>(text[most]) & 0xC0U) == 0x80) --most;
  return most;
}

}  // namespace zorva::util
