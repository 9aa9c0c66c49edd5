#pragma once

// Splits a line of a case into words, numbers, texts in quotes, values and object paths, in the notation of the
// recording broker. Anything else is a CaseError.

#include <cstddef>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "CaseFile.h"
#include "tests/support/CimValues.h"

namespace ZV::Test {

class LineScanner {
 public:
  explicit LineScanner(WrittenLine line) : line_(std::move(line)) {}

  bool atEnd();
  void expectEnd();
  /// Takes the words if they come next and end there.
  bool take(std::string_view words);
  void expect(std::string_view words);

  std::string word(const std::string& what);  ///< up to a blank, a comma or a colon
  unsigned int number(const std::string& what);
  std::string quoted(const std::string& what);                   ///< "a\nb", with \n, \t, \" and \\ as in C
  std::string wordOrQuoted(const std::string& what);             ///< a name that has no blanks needs no quotes
  std::vector<std::string> quotedList(const std::string& what);  ///< {"a", "b"}
  Value value();  ///< string "a", uint16 3, string[] {"a", null}, boolean true, ref (PATH), null
  Path path();    ///< ///< host/root/cimv2:CLASS.Key="a",Other=(PATH); without a namespace root/cimv2

  [[noreturn]] void fail(const std::string& what) const;

 private:
  void skipBlanks();
  char peek() const { return at_ < line_.text.size() ? line_.text[at_] : '\0'; }
  bool takeCharacter(char c);
  void expectCharacter(char c);
  std::vector<Value> elements(CMPIType type);
  Value element(CMPIType type);
  Value keyValue();

  WrittenLine line_;
  std::size_t at_ = 0;
};

/// Adds the line's place in the case to an error.
CaseError errorAt(const WrittenLine& line, const std::string& what);

}  // namespace ZV::Test
