#include "schema/MofLexer.h"

#include <charconv>
#include <cstring>
#include <limits>
#include <optional>

#include "util/Names.h"
#include "util/Utf8.h"

namespace zorva::schema {

namespace {

constexpr bool isDigit(char c) noexcept { return c >= '0' && c <= '9'; }
constexpr bool isLetter(char c) noexcept { return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || c == '_'; }
constexpr bool isBeyondAscii(char c) noexcept { return static_cast<unsigned char>(c) >= 0x80; }
constexpr bool isBlank(char c) noexcept { return c == ' ' || c == '\t' || c == '\r' || c == '\f' || c == '\v'; }

int hexDigit(char c) noexcept {
  if (isDigit(c)) return c - '0';
  const char small = util::lowerAscii(c);
  return small >= 'a' && small <= 'f' ? small - 'a' + 10 : -1;
}

std::string byteName(char c) {
  constexpr char digits[] = "0123456789abcdef";
  const auto byte = static_cast<unsigned char>(c);
  return std::string("byte 0x") + digits[byte >> 4U] + digits[byte & 15U];
}

// The whole number of a lexeme without sign: hexadecimal, binary, octal or decimal. `ok` false: it is no number;
// `large`: it does not fit in 64 bits.
struct WholeNumber {
  std::uint64_t value = 0;
  bool ok = false;
  bool large = false;
};

WholeNumber wholeNumber(std::string_view digits) {
  int base = 10;
  if (digits.size() > 2 && digits[0] == '0' && util::lowerAscii(digits[1]) == 'x') {
    base = 16;
    digits.remove_prefix(2);
  } else if (digits.size() > 1 && util::lowerAscii(digits.back()) == 'b') {
    base = 2;
    digits.remove_suffix(1);
  } else if (digits.size() > 1 && digits[0] == '0') {
    base = 8;
  }
  WholeNumber number;
  const char* end = digits.data() + digits.size();
  const auto [stop, error] = std::from_chars(digits.data(), end, number.value, base);
  number.large = error == std::errc::result_out_of_range;
  number.ok = error == std::errc() && stop == end;
  return number;
}

// The number with its sign; nothing if a negative one does not fit in 64 bits.
std::optional<Scalar> withSign(std::uint64_t value, bool negative) {
  if (!negative) return Scalar(value);
  constexpr std::uint64_t lowest = std::uint64_t{1} << 63U;
  if (value > lowest) return std::nullopt;
  return Scalar(value == lowest ? std::numeric_limits<std::int64_t>::min() : -static_cast<std::int64_t>(value));
}

// [digits] "." digits [exponent], without sign. from_chars accepts more (a point at the end, "inf"), so the syntax is
// checked first.
bool looksReal(std::string_view text) noexcept {
  const std::size_t point = text.find('.');
  if (point == std::string_view::npos || point + 1 >= text.size() || !isDigit(text[point + 1])) return false;
  for (std::size_t i = 0; i < point; ++i) {
    if (!isDigit(text[i])) return false;
  }
  return true;
}

}  // namespace

bool Token::isWord(std::string_view word) const noexcept {
  return kind == TokenKind::Identifier && util::sameName(lexeme, word);
}

std::string Token::describe() const {
  if (kind == TokenKind::End) return "the end of the text";
  constexpr std::size_t longest = 40;
  const std::string_view part =
      lexeme.substr(0, lexeme.size() > longest ? util::utf8Cut(lexeme, longest) : lexeme.size());
  std::string shown(part);
  if (part.size() < lexeme.size()) shown += "...";
  return kind == TokenKind::String || kind == TokenKind::Character ? shown : "'" + shown + "'";
}

MofLexer::MofLexer(std::string_view text, std::string_view file) : text_(text), file_(file) {
  if (text_.starts_with("\xEF\xBB\xBF")) at_ = lineStart_ = 3;
  advance();
}

void MofLexer::fail(Place place, std::string message) const {
  throw MofFailure{SchemaError{std::string(file_), place.line, place.column, std::move(message)}};
}

Place MofLexer::here() const noexcept { return {line_, static_cast<std::uint32_t>(at_ - lineStart_ + 1)}; }

void MofLexer::newLine() noexcept {
  ++at_;
  ++line_;
  lineStart_ = at_;
}

void MofLexer::advance() {
  skipBlanksAndComments();
  token_.place = here();
  token_.lexeme = {};
  if (at_ == text_.size()) {
    token_.kind = TokenKind::End;
    return;
  }
  const char c = text_[at_];
  if (isLetter(c) || isBeyondAscii(c) || c == '$') {
    readWord();
  } else if (std::string_view("{}[](),;:=").find(c) != std::string_view::npos) {
    token_.kind = TokenKind::Mark;
    token_.lexeme = text_.substr(at_++, 1);
  } else if (c == '"') {
    readString();
  } else if (c == '\'') {
    readCharacter();
  } else if (isDigit(c) || c == '+' || c == '-' || c == '.') {
    readNumber();
  } else if (c == '#') {
    readPragma();
  } else {
    fail(token_.place, "expected a word, a value or a mark, found " +
                           (c > ' ' && c < 127 ? "'" + std::string(1, c) + "'" : byteName(c)));
  }
}

void MofLexer::skipBlanksAndComments() {
  while (at_ < text_.size()) {
    const char c = text_[at_];
    if (c == '\n') {
      newLine();
    } else if (isBlank(c)) {
      ++at_;
    } else if (c == '/' && text_.substr(at_ + 1, 1) == "/") {
      const std::size_t end = text_.find('\n', at_);
      at_ = end == std::string_view::npos ? text_.size() : end;
    } else if (c == '/' && text_.substr(at_ + 1, 1) == "*") {
      skipLongComment();
    } else {
      return;
    }
  }
}

void MofLexer::skipLongComment() {
  const Place begin = here();
  at_ += 2;
  while (text_.substr(at_, 2) != "*/") {
    if (at_ >= text_.size()) fail(begin, "expected '*/' that closes this comment, found the end of the text");
    if (text_[at_] == '\n') {
      newLine();
    } else {
      ++at_;
    }
  }
  at_ += 2;
}

std::size_t MofLexer::utf8LengthHere() const {
  const std::size_t length = util::utf8Length(text_.substr(at_));
  if (length == 0) fail(here(), "expected UTF-8, found " + byteName(text_[at_]));
  return length;
}

void MofLexer::readWord() {
  const std::size_t begin = at_;
  token_.kind = text_[at_] == '$' ? TokenKind::Alias : TokenKind::Identifier;
  if (token_.kind == TokenKind::Alias) {
    ++at_;
    if (at_ == text_.size() || !(isLetter(text_[at_]) || isBeyondAscii(text_[at_]))) {
      fail(token_.place, "expected the name of an alias after '$'");
    }
  }
  while (at_ < text_.size()) {
    const char c = text_[at_];
    if (isLetter(c) || isDigit(c)) {
      ++at_;
    } else if (isBeyondAscii(c)) {
      at_ += utf8LengthHere();
    } else {
      break;
    }
  }
  token_.lexeme = text_.substr(begin, at_ - begin);
}

void MofLexer::readPragma() {
  const std::size_t begin = at_;
  ++at_;
  while (at_ < text_.size() && (isLetter(text_[at_]) || isDigit(text_[at_]))) ++at_;
  token_.kind = TokenKind::Pragma;
  token_.lexeme = text_.substr(begin, at_ - begin);
  if (!util::sameName(token_.lexeme, "#pragma")) fail(token_.place, "expected '#pragma', found " + token_.describe());
}

void MofLexer::readString() {
  const std::size_t begin = at_;
  token_.kind = TokenKind::String;
  token_.string.clear();
  ++at_;
  for (;;) {
    // The plain characters of a piece are copied at once.
    const std::size_t plain = at_;
    while (at_ < text_.size() && text_[at_] >= ' ' && text_[at_] < 127 && text_[at_] != '"' && text_[at_] != '\\')
      ++at_;
    token_.string.append(text_.substr(plain, at_ - plain));
    if (at_ == text_.size() || text_[at_] == '\n') {
      fail(token_.place, "expected '\"' that closes this text before the end of the line");
    }
    if (text_[at_] == '"') break;
    readCharacterInto(token_.string, '"');
  }
  ++at_;
  token_.lexeme = text_.substr(begin, at_ - begin);
}

void MofLexer::readCharacter() {
  const std::size_t begin = at_;
  token_.kind = TokenKind::Character;
  ++at_;
  std::string one;
  if (at_ < text_.size() && text_[at_] != '\n' && text_[at_] != '\'') readCharacterInto(one, '\'');
  if (one.empty() || at_ == text_.size() || text_[at_] != '\'') {
    fail(token_.place, "expected one character between single quotes");
  }
  ++at_;
  const std::uint32_t code = util::utf8Decode(one);
  if (code > 0xFFFF) fail(token_.place, "expected a character that 16 bits can hold");
  token_.number = static_cast<char16_t>(code);
  token_.lexeme = text_.substr(begin, at_ - begin);
}

void MofLexer::readCharacterInto(std::string& out, char quote) {
  const char c = text_[at_];
  if (c == '\\') {
    readEscapeInto(out);
    return;
  }
  if ((c >= 0 && c < ' ' && c != '\t') || c == 127) {
    fail(here(), std::string("expected '") + quote + "' or a printable character, found " + byteName(c));
  }
  const std::size_t length = utf8LengthHere();
  out.append(text_.substr(at_, length));
  at_ += length;
}

void MofLexer::readEscapeInto(std::string& out) {
  const Place place = here();
  ++at_;
  const char c = at_ < text_.size() ? text_[at_] : '\n';
  constexpr std::string_view letters = "btnfr\"'\\";
  constexpr std::string_view meanings = "\b\t\n\f\r\"'\\";
  if (const std::size_t which = letters.find(c); which != std::string_view::npos) {
    out.push_back(meanings[which]);
    ++at_;
    return;
  }
  if (c != 'x' && c != 'X') fail(place, "expected one of b t n f r \" ' \\ x after '\\'");
  ++at_;
  std::uint32_t code = 0;
  int digits = 0;
  for (; digits < 4 && at_ < text_.size() && hexDigit(text_[at_]) >= 0; ++digits, ++at_) {
    code = code * 16 + static_cast<std::uint32_t>(hexDigit(text_[at_]));
  }
  if (digits == 0) fail(place, "expected one to four hexadecimal digits after '\\x'");
  if (code == 0 || (code >= 0xD800 && code <= 0xDFFF)) fail(place, "expected a character, found an escape for none");
  util::utf8Append(out, code);
}

void MofLexer::readNumber() {
  const std::size_t begin = at_;
  const bool negative = text_[at_] == '-';
  if (negative || text_[at_] == '+') ++at_;
  const std::size_t digits = at_;
  const bool hexadecimal = at_ + 1 < text_.size() && util::lowerAscii(text_[at_ + 1]) == 'x';
  while (at_ < text_.size()) {
    const char c = text_[at_];
    const bool exponentSign =
        (c == '+' || c == '-') && !hexadecimal && at_ > digits && util::lowerAscii(text_[at_ - 1]) == 'e';
    if (!isDigit(c) && !isLetter(c) && c != '.' && !exponentSign) break;
    ++at_;
  }
  token_.lexeme = text_.substr(begin, at_ - begin);
  const std::string_view unsignedPart = text_.substr(digits, at_ - digits);
  if (looksReal(unsignedPart)) {
    token_.kind = TokenKind::Real;
    double value = 0;
    const char* end = unsignedPart.data() + unsignedPart.size();
    const auto [stop, error] = std::from_chars(unsignedPart.data(), end, value);
    if (error != std::errc() || stop != end) fail(token_.place, "expected a number, found " + token_.describe());
    token_.number = negative ? -value : value;
    return;
  }
  token_.kind = TokenKind::Integer;
  const WholeNumber number = wholeNumber(unsignedPart);
  const std::optional<Scalar> signedNumber = withSign(number.value, negative);
  if (number.large || (number.ok && !signedNumber)) {
    fail(token_.place, "expected a number of at most 64 bits, found " + token_.describe());
  }
  if (!number.ok) fail(token_.place, "expected a number, found " + token_.describe());
  token_.number = *signedNumber;
}

}  // namespace zorva::schema
