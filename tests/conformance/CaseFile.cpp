#include "CaseFile.h"

#include <algorithm>
#include <cctype>
#include <cstddef>
#include <optional>
#include <set>
#include <sstream>
#include <utility>

namespace ZV::Test {

namespace {

constexpr int kDeepestPhrase = 12;

std::string trimmed(std::string_view text) {
  const std::size_t first = text.find_first_not_of(' ');
  if (first == std::string_view::npos) return {};
  return std::string(text.substr(first, text.find_last_not_of(' ') - first + 1));
}

bool startsWith(std::string_view text, std::string_view start) { return text.substr(0, start.size()) == start; }

bool isWordCharacter(char c) { return std::isalnum(static_cast<unsigned char>(c)) != 0; }

}  // namespace

std::string placeOf(const SourceLine& line) { return line.file + ":" + std::to_string(line.number); }

CaseError::CaseError(const SourceLine& line, const std::string& what)
    : std::runtime_error(placeOf(line) + ": " + what) {}

std::string placeOf(const WrittenLine& line) {
  const std::string place = placeOf(line.inCase);
  return line.inPhrase.number == 0 ? place : place + " (by " + placeOf(line.inPhrase) + ")";
}

// A call is OBJECT.name(...) or name(...), in one word before the parenthesis.
bool isPlainStep(std::string_view line) {
  if (startsWith(line, "log ")) return true;
  const std::size_t open = line.find('(');
  if (open == 0 || open == std::string_view::npos) return false;
  const std::string_view callee = line.substr(0, open);
  const bool isCallee =
      std::all_of(callee.begin(), callee.end(), [](char c) { return isWordCharacter(c) || c == '.'; });
  return isCallee && line.find(')') != std::string_view::npos;
}

void Phrases::add(const SourceLine& pattern, std::vector<SourceLine> body) {
  if (pattern.text.empty()) throw CaseError(pattern, "a phrase has no words");
  if (body.empty()) throw CaseError(pattern, "the phrase has no lines");
  if (isPlainStep(pattern.text)) throw CaseError(pattern, "a phrase cannot look like a call or a line of the log");
  Phrase phrase{pattern, {}, {}, std::move(body)};
  std::size_t from = 0;
  for (std::size_t open = pattern.text.find('<'); open != std::string::npos; open = pattern.text.find('<', from)) {
    const std::size_t close = pattern.text.find('>', open);
    if (close == std::string::npos) throw CaseError(pattern, "a place in the phrase has no '>'");
    if (open == from && open != 0) throw CaseError(pattern, "two places of the phrase touch");
    phrase.literals.push_back(pattern.text.substr(from, open - from));
    phrase.names.push_back(pattern.text.substr(open, close - open + 1));
    from = close + 1;
  }
  phrase.literals.push_back(pattern.text.substr(from));
  for (const Phrase& other : phrases_) {
    if (other.literals == phrase.literals) {
      throw CaseError(pattern, "the phrase is already at " + placeOf(other.pattern));
    }
  }
  phrases_.push_back(std::move(phrase));
}

namespace {

// The end of the text in quotes or braces that begins at from; npos if it has none.
std::size_t endOfBracketed(const std::string& text, std::size_t from) {
  int depth = 0;
  bool isQuoted = false;
  for (std::size_t i = from; i < text.size(); ++i) {
    const char c = text[i];
    if (isQuoted && c == '\\') {
      ++i;
    } else if (c == '"') {
      isQuoted = !isQuoted;
    } else if (!isQuoted && c == '{') {
      ++depth;
    } else if (!isQuoted && c == '}') {
      --depth;
    }
    if (!isQuoted && depth == 0) return i + 1;
  }
  return std::string::npos;
}

// The end of a place that begins at from and has the given words after it. A place is one word, or a text in quotes or
// braces. npos if nothing fits.
std::size_t endOfPlace(const std::string& text, std::size_t from, const std::string& after) {
  if (from >= text.size()) return std::string::npos;
  if (text[from] == '"' || text[from] == '{') {
    const std::size_t end = endOfBracketed(text, from);
    return end != std::string::npos && text.compare(end, after.size(), after) == 0 ? end : std::string::npos;
  }
  const std::size_t end = text.find(after, from + 1);
  return end != std::string::npos && text.find(' ', from) < end ? std::string::npos : end;
}

// Fills the places of a pattern from the left; none is empty. A place at the end takes all the rest.
bool fits(const std::vector<std::string>& literals, const std::vector<std::string>& names, const std::string& text,
          std::map<std::string, std::string>& filled) {
  if (!startsWith(text, literals.front())) return false;
  std::size_t from = literals.front().size();
  for (std::size_t i = 0; i < names.size(); ++i) {
    const std::string& after = literals[i + 1];
    const std::size_t end = !after.empty() ? endOfPlace(text, from, after) : text.size();
    if (end == std::string::npos || end <= from) return false;
    filled[names[i]] = text.substr(from, end - from);
    from = end + after.size();
  }
  return from == text.size();
}

std::string filledIn(std::string text, const std::map<std::string, std::string>& filled) {
  std::string result;
  for (std::size_t i = 0; i < text.size();) {
    const std::size_t close = text[i] == '<' ? text.find('>', i) : std::string::npos;
    const auto found = close == std::string::npos ? filled.end() : filled.find(text.substr(i, close - i + 1));
    if (found == filled.end()) {
      result += text[i++];
    } else {
      result += found->second;
      i = close + 1;
    }
  }
  return result;
}

}  // namespace

const Phrases::Phrase* Phrases::find(const SourceLine& line, Filled& filled) const {
  const Phrase* found = nullptr;
  for (const Phrase& phrase : phrases_) {
    Filled places;
    if (!fits(phrase.literals, phrase.names, line.text, places)) continue;
    if (found != nullptr) {
      throw CaseError(line, "two phrases fit: " + placeOf(found->pattern) + " and " + placeOf(phrase.pattern));
    }
    found = &phrase;
    filled = std::move(places);
  }
  return found;
}

void Phrases::writeOut(const SourceLine& line, const WrittenLine& as, int depth, std::vector<WrittenLine>& out) const {
  Filled filled;
  const Phrase* phrase = isPlainStep(line.text) ? nullptr : find(line, filled);
  if (phrase == nullptr) {
    out.push_back(as);
    return;
  }
  if (depth == kDeepestPhrase) throw CaseError(as.inCase, "phrases contain one another without an end");
  for (const SourceLine& inner : phrase->body) {
    SourceLine next = inner;
    next.text = filledIn(inner.text, filled);
    writeOut(next, {next.text, as.inCase, inner}, depth + 1, out);
  }
}

std::vector<WrittenLine> Phrases::writeOut(const std::vector<SourceLine>& lines) const {
  std::vector<WrittenLine> out;
  for (const SourceLine& line : lines) writeOut(line, {line.text, line, {}}, 0, out);
  return out;
}

std::string Case::testName() const {
  std::string name;
  bool startsWord = true;
  for (const char c : title.text) {
    if (!isWordCharacter(c)) {
      startsWord = true;
      continue;
    }
    name += startsWord ? static_cast<char>(std::toupper(static_cast<unsigned char>(c))) : c;
    startsWord = false;
  }
  return name;
}

namespace {

// Reads a file line by line: headings begin at the margin, the lines that belong to them are indented.
class Reader {
 public:
  Reader(const std::string& text, std::string name) : in_(text), name_(std::move(name)) { advance(); }

  bool atEnd() const { return !heading_.has_value(); }

  // The next heading, a word that ends in a colon, and the text after it.
  struct Section {
    std::string word;
    SourceLine rest;
    std::vector<SourceLine> body;
  };
  Section next() {
    Section section;
    const std::size_t colon = heading_->text.find(':');
    if (colon == std::string::npos) throw CaseError(*heading_, "a heading has no colon: " + heading_->text);
    section.word = heading_->text.substr(0, colon);
    section.rest = {trimmed(heading_->text.substr(colon + 1)), heading_->file, heading_->number};
    section.body = std::move(body_);
    advance();
    return section;
  }

 private:
  // Comments and empty lines are dropped everywhere.
  void advance() {
    heading_ = std::exchange(ahead_, std::nullopt);
    body_.clear();
    std::string line;
    while (std::getline(in_, line)) {
      ++number_;
      const SourceLine source{trimmed(line), name_, number_};
      if (line.find('\t') != std::string::npos) throw CaseError(source, "a tab; write \\t in a text");
      if (source.text.empty() || source.text.front() == '#') continue;
      const bool isHeading = line.front() != ' ';
      if (!isHeading && !heading_.has_value()) throw CaseError(source, "an indented line without a heading before it");
      if (!isHeading) {
        body_.push_back(source);
      } else if (!heading_.has_value()) {
        heading_ = source;
      } else {
        ahead_ = source;
        return;
      }
    }
  }

  std::istringstream in_;
  std::string name_;
  int number_ = 0;
  std::optional<SourceLine> heading_;
  std::optional<SourceLine> ahead_;
  std::vector<SourceLine> body_;
};

// The text after the colon counts as the first line.
std::vector<SourceLine> allLines(const Reader::Section& section) {
  std::vector<SourceLine> lines;
  if (!section.rest.text.empty()) lines.push_back(section.rest);
  lines.insert(lines.end(), section.body.begin(), section.body.end());
  return lines;
}

std::vector<SourceLine>* partOf(Case& one, const std::string& word) {
  if (word == "shows") return &one.shows;
  if (word == "world") return &one.world;
  if (word == "broker") return &one.broker;
  if (word == "request") return &one.request;
  if (word == "happens") return &one.happens;
  if (word == "gives") return &one.gives;
  if (word == "changes") return &one.changes;
  if (word == "ends") return &one.ends;
  return nullptr;
}

void checkWhole(const Case& one) {
  if (one.request.empty()) throw CaseError(one.title, "the case has no request");
  if (one.happens.empty()) throw CaseError(one.title, "the case does not say what happens");
  if (one.ends.size() != 1) throw CaseError(one.title, "the case does not say in one line how the request ends");
}

void addSection(const Reader::Section& section, CaseFile& file, std::set<std::string>& names) {
  if (section.word == "case") {
    if (!section.body.empty()) throw CaseError(section.body.front(), "a title is one line");
    Case one;
    one.title = section.rest;
    if (!names.insert(one.testName()).second) throw CaseError(section.rest, "a case of this title is there already");
    if (one.testName().empty()) throw CaseError(section.rest, "a case has no title");
    file.cases.push_back(std::move(one));
    return;
  }
  if (file.cases.empty()) {
    if (section.word == "provider") {
      file.provider = section.rest.text;
    } else if (section.word == "association") {
      file.association = section.rest.text;
    } else if (section.word == "shows") {
      file.shows = allLines(section);
    } else {
      throw CaseError(section.rest, "unknown heading '" + section.word + "' before the first case");
    }
    return;
  }
  std::vector<SourceLine>* part = partOf(file.cases.back(), section.word);
  if (part == nullptr) throw CaseError(section.rest, "unknown heading '" + section.word + "'");
  if (!part->empty()) throw CaseError(section.rest, "the case has a part '" + section.word + "' already");
  *part = allLines(section);
  if (part->empty()) throw CaseError(section.rest, "the part '" + section.word + "' is empty");
}

}  // namespace

void readPhrases(const std::string& text, const std::string& name, Phrases& phrases) {
  for (Reader reader(text, name); !reader.atEnd();) {
    const Reader::Section section = reader.next();
    if (section.word != "phrase") throw CaseError(section.rest, "unknown heading '" + section.word + "'");
    phrases.add(section.rest, section.body);
  }
}

CaseFile readCases(const std::string& text, const std::string& name, const Phrases& shared) {
  CaseFile file;
  file.phrases = shared;
  std::set<std::string> names;
  for (Reader reader(text, name); !reader.atEnd();) {
    const Reader::Section section = reader.next();
    if (section.word == "phrase") {
      file.phrases.add(section.rest, section.body);
    } else {
      addSection(section, file, names);
    }
  }
  if (file.provider.empty()) throw CaseError({{}, name, 1}, "the file does not name its provider");
  for (const Case& one : file.cases) checkWhole(one);
  return file;
}

}  // namespace ZV::Test
