#include "tests/support/RecordingLogger.h"

#include <algorithm>
#include <atomic>
#include <cstdlib>
#include <utility>

#include "tests/support/Places.h"

namespace ZV::Test {

namespace {

std::atomic<RecordingLogger*> activeLogger{nullptr};

const std::string kBannerLine(78, '=');
constexpr std::string_view kEntering = "ENTERING: ";
constexpr std::string_view kExiting = "EXITING: ";
constexpr std::string_view kMethod = "METHOD: ";
constexpr std::string_view kMessage = "MESSAGE [File: ";
constexpr std::string_view kVariable = "VARIABLE: '";
constexpr std::string_view kParameters = ",Parameters List: ";

bool startsWith(const std::string& text, std::string_view start) { return text.compare(0, start.size(), start) == 0; }

// The text between two marks: the first from the start, the second after it. If the second is empty or missing, the
// text to the end, because a long line may have been cut.
std::string between(const std::string& text, std::string_view before, std::string_view after) {
  const std::size_t start = text.find(before);
  if (start == std::string::npos) return {};
  const std::size_t from = start + before.size();
  const std::size_t end = after.empty() ? std::string::npos : text.find(after, from);
  return text.substr(from, end == std::string::npos ? std::string::npos : end - from);
}

// A variable's value may contain anything, so its end is searched from the line's end.
std::string variableValue(const std::string& text) {
  constexpr std::string_view kBefore = "' has Value '";
  const std::size_t start = text.find(kBefore);
  const std::size_t end = text.rfind("' at line ");
  if (start == std::string::npos) return {};
  const std::size_t from = start + kBefore.size();
  return text.substr(from, end == std::string::npos || end < from ? std::string::npos : end - from);
}

std::string messageText(const std::string& text) {
  const std::string whole = between(text, "]: ", "");
  return whole.substr(0, whole.find(kParameters));
}

bool isHexDigit(char c) { return (c >= '0' && c <= '9') || (c >= 'a' && c <= 'f'); }

const char* nameOf(LineKind kind) {
  static constexpr const char* kNames[] = {"banner", "ENTERING", "EXITING", "METHOD", "MESSAGE", "VARIABLE", "OTHER"};
  return kNames[static_cast<std::size_t>(kind)];
}

std::string describe(const LogLine& line) {
  return std::string(line.stream == zorva::agent::LogStream::Log ? "log" : "trace") + " " + std::to_string(line.level) +
         " " + line.category + " " + line.function + " " + line.file + ":" + std::to_string(line.line) + " " +
         line.text;
}

bool sameArguments(const LogLine& left, const LogLine& right) {
  return left.function == right.function && left.file == right.file && left.line == right.line &&
         left.category == right.category && left.level == right.level && left.text == right.text;
}

}  // namespace

std::string withoutAddresses(std::string_view text) {
  std::string plain;
  for (std::size_t i = 0; i < text.size();) {
    if (text.substr(i, 2) != "0x") {
      plain += text[i++];
      continue;
    }
    plain += "ADDR";
    i += 2;
    while (i < text.size() && isHexDigit(text[i])) ++i;
  }
  return plain;
}

LineKind LogLine::kind() const {
  if (text == kBannerLine) return LineKind::Banner;
  if (startsWith(text, kEntering)) return LineKind::Entering;
  if (startsWith(text, kExiting)) return LineKind::Exiting;
  if (startsWith(text, kMethod)) return LineKind::Method;
  if (startsWith(text, kMessage)) return LineKind::Message;
  if (startsWith(text, kVariable)) return LineKind::Variable;
  return LineKind::Other;
}

std::string LogLine::subject() const {
  switch (kind()) {
    case LineKind::Entering:
    case LineKind::Exiting:
    case LineKind::Method:
      return between(text, ": ", "()");
    case LineKind::Message:
      return messageText(text);
    case LineKind::Variable:
      return between(text, kVariable, "' has Value '");
    case LineKind::Banner:
    case LineKind::Other:
      break;
  }
  return text;
}

std::string LogLine::value() const { return kind() == LineKind::Variable ? variableValue(text) : std::string(); }

std::string LogLine::parameters() const {
  const LineKind form = kind();
  if (form == LineKind::Variable || form == LineKind::Banner || form == LineKind::Other) return {};
  return withoutAddresses(between(text, kParameters, ""));
}

std::string LogLine::fileInText() const {
  switch (kind()) {
    case LineKind::Entering:
    case LineKind::Exiting:
      return between(text, "() in ", " [Line: ");
    case LineKind::Method:
      return between(text, "invoked in ", " [Line: ");
    case LineKind::Message:
      return between(text, kMessage, ", Line: ");
    case LineKind::Variable: {
      const std::size_t in = text.rfind(" in ");
      return in == std::string::npos ? std::string() : text.substr(in + 4);
    }
    case LineKind::Banner:
    case LineKind::Other:
      break;
  }
  return {};
}

int LogLine::lineInText() const {
  const LineKind form = kind();
  if (form == LineKind::Banner || form == LineKind::Other) return 0;
  const std::string_view mark = form == LineKind::Variable ? "' at line " : "Line: ";
  const std::size_t found = form == LineKind::Variable ? text.rfind(mark) : text.find(mark);
  return found == std::string::npos ? 0 : std::atoi(text.c_str() + found + mark.size());
}

std::string LogLine::brief() const {
  const LineKind form = kind();
  std::string words = std::to_string(level) + " " + nameOf(form);
  if (form == LineKind::Banner) return words;
  words += " " + withoutAddresses(subject());
  if (form == LineKind::Variable) words += " = " + value();
  if (text.find(kParameters) != std::string::npos && form != LineKind::Variable) words += "," + parameters();
  return words;
}

std::string LogLine::briefWithCategory() const { return category + " " + brief(); }

std::ostream& operator<<(std::ostream& out, const LogLine& line) { return out << describe(line); }

LogLines LogLines::pairs() const {
  LogLines halves;
  for (std::size_t i = 0; i < size(); i += 2) {
    const LogLine& first = at(i);
    if (!first.reservedAreEmpty) throw BrokenPair("a reserved argument was given: " + describe(first));
    if (first.stream != zorva::agent::LogStream::Log) throw BrokenPair("nothing in the log before: " + describe(first));
    if (i + 1 == size()) throw BrokenPair("no trace after: " + describe(first));
    const LogLine& second = at(i + 1);
    if (second.stream != zorva::agent::LogStream::Trace || !second.reservedAreEmpty || !sameArguments(first, second)) {
      throw BrokenPair("the trace differs: " + describe(first) + "\n and then: " + describe(second));
    }
    halves.push_back(first);
  }
  return halves;
}

std::vector<std::string> LogLines::briefs() const {
  std::vector<std::string> all;
  for (const LogLine& line : *this) all.push_back(line.brief());
  return all;
}

std::vector<std::string> LogLines::briefsWithCategory() const {
  std::vector<std::string> all;
  for (const LogLine& line : *this) all.push_back(line.briefWithCategory());
  return all;
}

std::vector<std::string> LogLines::texts(int level) const {
  std::vector<std::string> all;
  for (const LogLine& line : *this) {
    if (line.level == level) all.push_back(line.subject());
  }
  return all;
}

LogLines LogLines::ofCategory(std::string_view category) const {
  LogLines some;
  std::copy_if(begin(), end(), std::back_inserter(some),
               [category](const LogLine& line) { return line.category == category; });
  return some;
}

LogLines LogLines::ofFunction(std::string_view function) const {
  LogLines some;
  std::copy_if(begin(), end(), std::back_inserter(some),
               [function](const LogLine& line) { return line.function == function; });
  return some;
}

LogLines LogLines::ofKind(LineKind kind) const {
  LogLines some;
  std::copy_if(begin(), end(), std::back_inserter(some), [kind](const LogLine& line) { return line.kind() == kind; });
  return some;
}

bool LogLines::has(LineKind kind, std::string_view function, std::string_view file) const {
  return std::any_of(begin(), end(), [&](const LogLine& line) {
    return line.kind() == kind && line.subject() == function && (file.empty() || line.fileInText() == file);
  });
}

bool LogLines::entered(std::string_view function, std::string_view file) const {
  return has(LineKind::Entering, function, file);
}

bool LogLines::exited(std::string_view function, std::string_view file) const {
  return has(LineKind::Exiting, function, file);
}

RecordingLogger::RecordingLogger() {
  activeLogger = this;
  resume();
}

RecordingLogger::~RecordingLogger() {
  activeLogger = nullptr;
  zorva::agent::setLogSink(nullptr);
}

RecordingLogger* RecordingLogger::active() { return activeLogger; }

void RecordingLogger::resume() { zorva::agent::setLogSink(this); }

LogLines RecordingLogger::lines() const { return linesSince(0); }

std::size_t RecordingLogger::size() const {
  const std::lock_guard lock(mutex_);
  return lines_.size();
}

LogLines RecordingLogger::linesSince(std::size_t size) const {
  const std::lock_guard lock(mutex_);
  return {lines_.begin() + static_cast<std::ptrdiff_t>(std::min(size, lines_.size())), lines_.end()};
}

std::vector<std::string> RecordingLogger::ownLines() const {
  const std::lock_guard lock(mutex_);
  return ownLines_;
}

void RecordingLogger::clear() {
  const std::lock_guard lock(mutex_);
  lines_.clear();
  ownLines_.clear();
}

void RecordingLogger::record(const zorva::agent::LogCall& call) {
  LogLine line;
  line.stream = call.stream;
  line.function = call.function == nullptr ? "" : call.function;
  line.file = call.file == nullptr ? "" : call.file;
  line.line = call.line;
  line.category = call.category;
  line.level = call.level;
  line.reservedAreEmpty = call.reserved1 == nullptr && call.reserved2 == 0 && call.reserved3 == 0;
  line.text = call.message;
  line.place = nextPlace();
  const std::lock_guard lock(mutex_);
  lines_.push_back(std::move(line));
}

void RecordingLogger::recordOwn(int level, const std::string& message) {
  const std::lock_guard lock(mutex_);
  ownLines_.push_back(std::to_string(level) + " " + message);
}

}  // namespace ZV::Test
