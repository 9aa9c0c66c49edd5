#include "cli/output/Text.h"

#include <algorithm>
#include <clocale>
#include <cstdint>
#include <cstdio>
#include <cwchar>

#include "util/Nearest.h"
#include "util/Utf8.h"

namespace zorva::cli {

namespace {

/// Characters that control a terminal instead of being shown: C0 and C1 controls, and those that change the direction
/// of the text or break its line.
bool steersTerminal(std::uint32_t code) noexcept {
  return code < 0x20 || (code >= 0x7F && code < 0xA0) || code == 0x061C || (code >= 0x200B && code <= 0x200F) ||
         (code >= 0x2028 && code <= 0x202E) || (code >= 0x2060 && code <= 0x206F) || code == 0xFEFF ||
         (code >= 0xFFF9 && code <= 0xFFFB) || (code >= 0xE0000 && code <= 0xE007F);
}

void appendEscape(std::string& out, std::uint32_t code) {
  switch (code) {
    case '\n':
      out += "\\n";
      return;
    case '\t':
      out += "\\t";
      return;
    case '\r':
      out += "\\r";
      return;
    default:
      break;
  }
  char escape[16];
  std::snprintf(escape, sizeof escape, code < 0x80 ? "\\x%02X" : "\\u%04X", static_cast<unsigned>(code));
  out += escape;
}

/// The C library's table of widths, which only a UTF-8 locale has.
std::size_t characterWidth(std::uint32_t code) {
  if (code < 0x80) return 1;
  static const locale_t utf8 = ::newlocale(LC_CTYPE_MASK, "C.UTF-8", nullptr);
  if (utf8 == nullptr) return 1;
  const locale_t before = ::uselocale(utf8);
  const int width = ::wcwidth(static_cast<wchar_t>(code));
  ::uselocale(before);
  return width < 0 ? 1 : static_cast<std::size_t>(width);
}

/// The end of the longest piece of `text` that takes at most `width` columns, and at least one character.
std::size_t pieceEnd(std::string_view text, std::size_t width) {
  std::size_t columns = 0;
  std::size_t at = 0;
  while (at < text.size()) {
    const std::size_t length = util::utf8Length(text.substr(at));
    const std::size_t bytes = length == 0 ? 1 : length;
    columns += length == 0 ? 1 : characterWidth(util::utf8Decode(text.substr(at)));
    if (columns > width && at > 0) break;
    at += bytes;
  }
  return at;
}

/// How many bytes at the beginning are characters of one column that are shown as they are. Most texts have no others.
std::size_t plainLength(std::string_view text) noexcept {
  const auto isPlain = [](char byte) { return byte >= 0x20 && byte < 0x7F; };
  return static_cast<std::size_t>(std::find_if_not(text.begin(), text.end(), isPlain) - text.begin());
}

std::string moreText(std::size_t count) { return " and " + std::to_string(count) + " more"; }

}  // namespace

std::string printable(std::string_view text) {
  std::string out;
  out.reserve(text.size());
  while (true) {
    const std::size_t plain = plainLength(text);
    out += text.substr(0, plain);
    text.remove_prefix(plain);
    if (text.empty()) return out;
    const std::size_t length = util::utf8Length(text);
    if (length == 0) {
      char escape[8];
      std::snprintf(escape, sizeof escape, "\\x%02X", static_cast<unsigned>(static_cast<unsigned char>(text[0])));
      out += escape;
      text.remove_prefix(1);
      continue;
    }
    const std::uint32_t code = util::utf8Decode(text);
    if (steersTerminal(code)) {
      appendEscape(out, code);
    } else {
      out += text.substr(0, length);
    }
    text.remove_prefix(length);
  }
}

std::size_t displayWidth(std::string_view text) {
  std::size_t columns = 0;
  while (true) {
    const std::size_t plain = plainLength(text);
    columns += plain;
    text.remove_prefix(plain);
    if (text.empty()) return columns;
    const std::size_t length = util::utf8Length(text);
    columns += length == 0 ? 1 : characterWidth(util::utf8Decode(text));
    text.remove_prefix(length == 0 ? 1 : length);
  }
}

std::vector<std::string> wrapped(std::string_view text, std::size_t width) {
  std::vector<std::string> lines;
  if (width == 0 || displayWidth(text) <= width) return {std::string(text)};
  while (!text.empty()) {
    std::size_t end = pieceEnd(text, width);
    std::size_t next = end;
    if (end < text.size() && text[end] == ' ') {
      next = end + 1;
    } else if (const std::size_t blank = text.substr(0, end).rfind(' ');
               end < text.size() && blank != std::string_view::npos && blank > 0) {
      end = blank;
      next = blank + 1;
    }
    lines.emplace_back(text.substr(0, end));
    text.remove_prefix(next);
  }
  return lines;
}

std::string cutTo(std::string_view text, std::size_t width) {
  if (width == 0 || displayWidth(text) <= width) return std::string(text);
  // A first character that is wider than the room leaves nothing of the text.
  const std::string_view piece = text.substr(0, width == 1 ? 0 : pieceEnd(text, width - 1));
  return std::string(displayWidth(piece) < width ? piece : std::string_view()) + "\u2026";
}

std::string firstOf(const std::vector<std::string>& texts, std::size_t width) {
  std::size_t used = 0;
  std::size_t fitting = 0;  // the longest beginning of the list that leaves room for the rest's number
  for (std::size_t i = 0; i < texts.size(); ++i) {
    used += displayWidth(texts[i]) + (i == 0 ? 0 : 1);
    if (width != 0 && used > width) break;
    const std::size_t left = texts.size() - i - 1;
    if (left == 0) return joined(texts, " ");
    if (width == 0 || used + moreText(left).size() <= width) fitting = i + 1;
  }
  if (fitting > 0) {
    const auto end = texts.begin() + static_cast<std::ptrdiff_t>(fitting);
    return joined({texts.begin(), end}, " ") + moreText(texts.size() - fitting);
  }
  if (texts.size() == 1) return cutTo(texts.front(), width);
  return texts.empty() ? std::string() : cutTo(std::to_string(texts.size()) + " in all", width);
}

std::string asUtf8(std::string_view text) {
  std::string out;
  out.reserve(text.size());
  while (!text.empty()) {
    const std::size_t length = util::utf8Length(text);
    if (length > 0) {
      out += text.substr(0, length);
      text.remove_prefix(length);
      continue;
    }
    util::utf8Append(out, 0x10EE00U + static_cast<unsigned char>(text[0]));
    text.remove_prefix(1);
  }
  return out;
}

std::string nearestOr(std::string_view word, const std::vector<std::string>& known, const std::string& otherwise) {
  const std::string question = util::didYouMean(word, known);
  return question.empty() ? otherwise : printable(question);
}

std::string counted(std::size_t count, std::string_view noun) {
  return std::to_string(count) + " " + std::string(noun) + (count == 1 ? "" : "s");
}

}  // namespace zorva::cli
