#pragma once

#include <cstdint>
#include <string>
#include <string_view>

#include "schema/Declarations.h"

// The words of a MOF text (DSP0004 Annex A). Private to the reader.

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
  std::string_view lexeme;  ///< as it stands in the text
  std::string string;       ///< of a String: its characters, escapes resolved
  Scalar number;            ///< of an Integer, a Real or a Character

  bool is(char mark) const noexcept { return kind == TokenKind::Mark && lexeme[0] == mark; }
  /// The word in any case; MOF's keywords are words like any other where no keyword can stand.
  bool isWord(std::string_view word) const noexcept;
  /// For "found ..." in an error: short and printable.
  std::string describe() const;
};

/// Thrown inside the reader; parseMof turns it into a value.
struct MofFailure {
  SchemaError error;
};

/// Cuts a text into tokens, one at a time. Throws MofFailure at bytes that begin no token or break one off.
class MofLexer {
 public:
  /// Both views must outlive the lexer.
  MofLexer(std::string_view text, std::string_view file);

  /// The token at hand; End at the end of the text, again and again.
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
  /// Appends one character of a string or of a character literal, an escape resolved, and steps over it.
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
