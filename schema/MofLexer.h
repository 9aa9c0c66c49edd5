#pragma once

// The tokens of a MOF text (DSP0004 Annex A). Private to the reader.

#include <cstdint>
#include <string>
#include <string_view>

#include "schema/Declarations.h"

namespace zorva::schema {

enum class TokenKind : std::uint8_t {
  End,
  Identifier,
  Alias,   ///< $name
  Pragma,  ///< #pragma
  String,  ///< one pair of quotes; the parser joins neighbours
  Character,
  Integer,
  Real,
  Mark,  ///< one of { } [ ] ( ) , ; : =
};

struct Token {
  TokenKind kind = TokenKind::End;
  Place place;
  std::string_view lexeme;  ///< exactly as in the text
  std::string string;       ///< of a String: its characters, escapes resolved
  Scalar number;            ///< of an Integer, a Real or a Character

  bool is(char mark) const noexcept { return kind == TokenKind::Mark && lexeme[0] == mark; }
  /// The word in any case; a MOF keyword is a word like any other where no keyword is possible.
  bool isWord(std::string_view word) const noexcept;
  /// For "found ..." in an error: short and printable.
  std::string describe() const;
};

/// Thrown inside the reader; parseMof turns it into a value.
struct MofFailure {
  SchemaError error;
};

/// Splits a text into tokens, one at a time. Throws MofFailure at bytes that begin no token or break one off.
class MofLexer {
 public:
  /// Both views must outlive the lexer.
  MofLexer(std::string_view text, std::string_view file);

  /// The current token; End at the end of the text, also if called again.
  const Token& token() const noexcept { return token_; }
  Token& token() noexcept { return token_; }

  void advance();

  [[noreturn]] void fail(Place place, std::string message) const;
  std::string_view file() const noexcept { return file_; }

 private:
  void skipBlanksAndComments();
  void skipLongComment();
  void newLine() noexcept;
  Place here() const noexcept;
  void readWord();
  void readPragma();
  void readString();
  void readCharacter();
  void readNumber();
  /// Appends one character of a string or of a character literal, with escapes resolved, and moves past it.
  void readCharacterInto(std::string& out, char quote);
  void readEscapeInto(std::string& out);
  std::size_t utf8LengthHere() const;

  std::string_view text_;
  std::string_view file_;
  std::size_t at_ = 0;
  std::uint32_t line_ = 1;
  std::size_t lineStart_ = 0;
  Token token_;
};

}  // namespace zorva::schema
