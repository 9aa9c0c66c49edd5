#include "LineScanner.h"

#include <algorithm>
#include <array>
#include <cctype>
#include <charconv>
#include <cstdint>

namespace ZV::Test {

namespace {

struct TypeWord {
  const char* word;
  CMPIType type;
};

constexpr std::array kTypeWords{
    TypeWord{"string[]", CMPI_stringA}, TypeWord{"uint16[]", CMPI_uint16A}, TypeWord{"string", CMPI_string},
    TypeWord{"uint8", CMPI_uint8},      TypeWord{"uint16", CMPI_uint16},    TypeWord{"uint32", CMPI_uint32},
    TypeWord{"uint64", CMPI_uint64},    TypeWord{"boolean", CMPI_boolean},  TypeWord{"ref", CMPI_ref},
};

bool endsWord(char c) { return c == '\0' || std::isalnum(static_cast<unsigned char>(c)) == 0; }

}  // namespace

CaseError errorAt(const WrittenLine& line, const std::string& what) {
  const std::string place = line.inPhrase.number == 0 ? "" : "(by " + placeOf(line.inPhrase) + ") ";
  return CaseError(line.inCase, place + what);
}

void LineScanner::fail(const std::string& what) const {
  throw errorAt(line_, what + " at '" + line_.text.substr(at_) + "' in: " + line_.text);
}

void LineScanner::skipBlanks() {
  while (peek() == ' ') ++at_;
}

bool LineScanner::atEnd() {
  skipBlanks();
  return at_ == line_.text.size();
}

void LineScanner::expectEnd() {
  if (!atEnd()) fail("nothing more is understood");
}

bool LineScanner::take(std::string_view words) {
  skipBlanks();
  if (line_.text.compare(at_, words.size(), words) != 0) return false;
  const char after = at_ + words.size() < line_.text.size() ? line_.text[at_ + words.size()] : '\0';
  if (!endsWord(words.back()) && !endsWord(after)) return false;
  at_ += words.size();
  return true;
}

void LineScanner::expect(std::string_view words) {
  if (!take(words)) fail("'" + std::string(words) + "' is missing");
}

bool LineScanner::takeCharacter(char c) {
  skipBlanks();
  if (peek() != c) return false;
  ++at_;
  return true;
}

void LineScanner::expectCharacter(char c) {
  if (!takeCharacter(c)) fail(std::string("'") + c + "' is missing");
}

std::string LineScanner::word(const std::string& what) {
  skipBlanks();
  const std::size_t end = std::min(line_.text.find_first_of(" ,:", at_), line_.text.size());
  if (end == at_) fail(what + " is missing");
  const std::string taken = line_.text.substr(at_, end - at_);
  at_ = end;
  return taken;
}

unsigned int LineScanner::number(const std::string& what) {
  skipBlanks();
  unsigned int number = 0;
  const char* const start = line_.text.data() + at_;
  const auto [end, error] = std::from_chars(start, line_.text.data() + line_.text.size(), number);
  if (error != std::errc() || !endsWord(*end)) fail(what + " is no number");
  at_ += static_cast<std::size_t>(end - start);
  return number;
}

std::string LineScanner::quoted(const std::string& what) {
  if (!takeCharacter('"')) fail(what + " is missing, in quotes");
  std::string text;
  while (peek() != '"') {
    if (peek() == '\0') fail(what + " has no closing quote");
    if (peek() != '\\') {
      text += line_.text[at_++];
      continue;
    }
    ++at_;
    if (peek() != 'n' && peek() != 't' && peek() != '"' && peek() != '\\') fail("an unknown escape");
    text += peek() == 'n' ? '\n' : peek() == 't' ? '\t' : peek();
    ++at_;
  }
  ++at_;
  return text;
}

std::string LineScanner::wordOrQuoted(const std::string& what) {
  skipBlanks();
  return peek() == '"' ? quoted(what) : word(what);
}

std::vector<std::string> LineScanner::quotedList(const std::string& what) {
  std::vector<std::string> texts;
  expectCharacter('{');
  if (takeCharacter('}')) return texts;
  do {
    texts.push_back(quoted(what));
  } while (takeCharacter(','));
  expectCharacter('}');
  return texts;
}

Value LineScanner::element(CMPIType type) {
  if (take("null")) return null(type);
  for (const TypeWord& word : kTypeWords) {  // an element may be of another type than its list
    if (take(word.word)) return element(word.type);
  }
  switch (type) {
    case CMPI_string:
      return Test::text(quoted("a text"));
    case CMPI_ref: {
      expectCharacter('(');
      Value reference = ref(path());
      expectCharacter(')');
      return reference;
    }
    case CMPI_boolean:
      if (take("true")) return boolean(true);
      expect("false");
      return boolean(false);
    default:
      return {type, CMPI_goodValue, std::uint64_t{number("the value")}};
  }
}

std::vector<Value> LineScanner::elements(CMPIType type) {
  std::vector<Value> all;
  expectCharacter('{');
  if (takeCharacter('}')) return all;
  do {
    all.push_back(element(type));
  } while (takeCharacter(','));
  expectCharacter('}');
  return all;
}

Value LineScanner::value() {
  if (take("null")) return null(CMPI_null);
  for (const TypeWord& word : kTypeWords) {
    if (!take(word.word)) continue;
    if (take("null")) return null(word.type);
    if ((word.type & CMPI_ARRAY) == 0) return element(word.type);
    return list(word.type, elements(static_cast<CMPIType>(word.type & ~CMPI_ARRAY)));
  }
  fail("a value is missing, with its type before it");
}

Value LineScanner::keyValue() {
  skipBlanks();
  if (peek() == '(') return element(CMPI_ref);
  return peek() == '"' ? Test::text(quoted("a key's value")) : value();
}

Path LineScanner::path() {
  Path path("");
  if (take("//")) {
    const std::size_t end = line_.text.find('/', at_);
    if (end == std::string::npos) fail("a host has no namespace after it");
    path.host = line_.text.substr(at_, end - at_);
    at_ = end + 1;
  }
  skipBlanks();
  const std::size_t classEnd = std::min(line_.text.find_first_of(".,) ", at_), line_.text.size());
  const std::size_t colon = line_.text.find(':', at_);
  if (colon < classEnd) {
    path.nameSpace = line_.text.substr(at_, colon - at_);
    at_ = colon + 1;
  }
  path.className = line_.text.substr(at_, classEnd - at_);
  if (path.className.empty()) fail("a class is missing");
  at_ = classEnd;
  if (peek() != '.') return path;
  do {
    ++at_;
    const std::size_t equals = line_.text.find('=', at_);
    if (equals == std::string::npos) fail("a key has no '='");
    const std::string name = line_.text.substr(at_, equals - at_);
    at_ = equals + 1;
    path = path.key(name, keyValue());
  } while (peek() == ',' && at_ + 1 < line_.text.size() && line_.text[at_ + 1] != ' ');
  return path;
}

}  // namespace ZV::Test
