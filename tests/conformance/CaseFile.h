#pragma once

// Files of cases: the required effect of a request to a provider, in words that a person can read. README.md describes
// the format. Reading is strict: an unknown line is an error that names the file and the line.

#include <map>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

namespace ZV::Test {

/// A line without its indent, and its place in the file.
struct SourceLine {
  std::string text;
  std::string file;
  int number = 0;
};

std::string placeOf(const SourceLine& line);  ///< "DNSClientProvider.cases:12"

/// An error in a file of cases. The text begins with the place.
class CaseError : public std::runtime_error {
 public:
  CaseError(const SourceLine& line, const std::string& what);
};

/// A line after all phrases are replaced: its place in the case, and the phrase that it comes from.
struct WrittenLine {
  std::string text;
  SourceLine inCase;
  SourceLine inPhrase;  ///< without a number if the line is in the case itself
};

std::string placeOf(const WrittenLine& line);

/// Named abbreviations. A phrase is a line with places to fill, "endpoint <path> is <name>", and the lines that replace
/// it. Two phrases that match one line are an error, and so are phrases that contain themselves.
class Phrases {
 public:
  /// line is the pattern. Throws CaseError if the pattern exists already, or could also be a call or a log line.
  void add(const SourceLine& pattern, std::vector<SourceLine> body);

  /// Replaces each line that is a phrase by the phrase's lines, until no phrase is left.
  std::vector<WrittenLine> writeOut(const std::vector<SourceLine>& lines) const;

 private:
  struct Phrase {
    SourceLine pattern;
    std::vector<std::string> literals;  ///< the text around the places: one more than there are names
    std::vector<std::string> names;
    std::vector<SourceLine> body;
  };
  using Filled = std::map<std::string, std::string>;

  const Phrase* find(const SourceLine& line, Filled& filled) const;
  void writeOut(const SourceLine& line, const WrittenLine& as, int depth, std::vector<WrittenLine>& out) const;

  std::vector<Phrase> phrases_;
};

/// One case, with its lines as written in the file.
struct Case {
  SourceLine title;
  std::vector<SourceLine> shows;    ///< reads that the case lists, besides the calls that make or change something
  std::vector<SourceLine> world;    ///< the host
  std::vector<SourceLine> broker;   ///< the objects of other providers, and the calls that fail
  std::vector<SourceLine> request;  ///< the operation, on the first line, and its arguments
  std::vector<SourceLine> happens;  ///< calls and log lines in order
  std::vector<SourceLine> gives;    ///< the results; if left out, `happens` has all of them
  std::vector<SourceLine> changes;  ///< files and properties of nodes that differ afterwards
  std::vector<SourceLine> ends;     ///< one line: status, and what is missing at the end

  std::string testName() const;  ///< the title as one word, "NamesComeSorted"
};

struct CaseFile {
  std::string provider;           ///< the exported prefix of its create functions
  std::string association;        ///< its class, if it serves an association; the default in requests
  std::vector<SourceLine> shows;  ///< for cases that have no list of their own
  Phrases phrases;                ///< those of this file and those that existed before
  std::vector<Case> cases;
};

/// Whether a line is a call or a log line, and no phrase.
bool isPlainStep(std::string_view line);

/// Reads phrases alone, or a whole file. name is the file's name in errors. Both throw CaseError.
void readPhrases(const std::string& text, const std::string& name, Phrases& phrases);
CaseFile readCases(const std::string& text, const std::string& name, const Phrases& shared);

}  // namespace ZV::Test
