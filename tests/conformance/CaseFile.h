// Files of cases: what a request to a provider has to bring about, in words that a person can read. README.md tells how
// a file is written. Reading is strict: what is not understood is an error that names the file and the line.
#pragma once

#include <map>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

namespace ZV::Test {

// A line without its indent, and where it stands.
struct SourceLine {
  std::string text;
  std::string file;
  int number = 0;
};

std::string placeOf(const SourceLine& line);  // "DNSClientProvider.cases:12"

// A file of cases says what nobody understands. The text begins with the place.
class CaseError : public std::runtime_error {
 public:
  CaseError(const SourceLine& line, const std::string& what);
};

// A line as it counts, after all phrases are written out: where it stands in a case, and in which phrase.
struct WrittenLine {
  std::string text;
  SourceLine inCase;
  SourceLine inPhrase;  // without a number where the case has the line itself
};

std::string placeOf(const WrittenLine& line);

// Named abbreviations. A phrase is a line with places to fill, "endpoint <path> is <name>", and the lines that it
// stands for. Two phrases that fit one line are an error, and so are phrases that stand for themselves.
class Phrases {
 public:
  // The line holds the pattern. Throws CaseError where the pattern is there already, or cannot be told from a line that
  // stands for itself.
  void add(const SourceLine& pattern, std::vector<SourceLine> body);

  // Replaces each line that is a phrase by what it stands for, down to lines that are none.
  std::vector<WrittenLine> writeOut(const std::vector<SourceLine>& lines) const;

 private:
  struct Phrase {
    SourceLine pattern;
    std::vector<std::string> literals;  // around the places: one more than there are names
    std::vector<std::string> names;
    std::vector<SourceLine> body;
  };
  using Filled = std::map<std::string, std::string>;

  const Phrase* find(const SourceLine& line, Filled& filled) const;
  void writeOut(const SourceLine& line, const WrittenLine& as, int depth, std::vector<WrittenLine>& out) const;

  std::vector<Phrase> phrases_;
};

// One case, with its lines as they stand in the file.
struct Case {
  SourceLine title;
  std::vector<SourceLine> shows;    // reads that its story tells, besides the calls that make or change something
  std::vector<SourceLine> world;    // the host
  std::vector<SourceLine> broker;   // what other providers serve, and which calls fail
  std::vector<SourceLine> request;  // what the provider is asked; the first line is the operation
  std::vector<SourceLine> happens;  // calls and log lines, in the order in which they happen
  std::vector<SourceLine> gives;    // what the client gets; the story has all of it where this is left out
  std::vector<SourceLine> changes;  // files and properties of nodes that differ afterwards
  std::vector<SourceLine> ends;     // one line: status, and what was left open

  std::string testName() const;  // the title as one word, "NamesComeSorted"
};

struct CaseFile {
  std::string provider;     // the exported prefix of its create functions
  std::string association;  // its class, where it serves an association; what requests ask by where they name none
  std::vector<SourceLine> shows;  // for cases that do not say
  Phrases phrases;                // those of this file and those that were there before
  std::vector<Case> cases;
};

// Whether a line of a story stands for itself, as a call or a line of the log, and is no phrase.
bool isPlainStep(std::string_view line);

// Reads phrases alone, or a whole file. name is what errors call the file. Both throw CaseError.
void readPhrases(const std::string& text, const std::string& name, Phrases& phrases);
CaseFile readCases(const std::string& text, const std::string& name, const Phrases& shared);

}  // namespace ZV::Test
