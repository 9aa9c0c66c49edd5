#pragma once

// Records every line that goes to the agent's logger, and its kind.

#include <cstddef>
#include <mutex>
#include <optional>
#include <ostream>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "agent/log/LogSink.h"
#include "util/NotCopied.h"

namespace ZV::Test {

enum class LineKind { Banner, Entering, Exiting, Method, Message, Variable, Other };

/// One call of the logger.
struct LogLine {
  zorva::agent::LogStream stream = zorva::agent::LogStream::Log;
  std::string function;
  std::string file;
  int line = 0;
  std::string category;
  int level = 0;
  bool reservedAreEmpty = true;  ///< the three reserved arguments were null, 0 and 0
  std::string text;
  std::size_t place = 0;  ///< among all calls and log lines of the process

  /// The parts of the text, in the formats that the library writes.
  LineKind kind() const;
  std::string subject() const;     ///< the function, the message's text, or the variable's name; else the whole text
  std::string value() const;       ///< of a variable
  std::string parameters() const;  ///< of a line with a parameter list, addresses as ADDR
  std::string fileInText() const;  ///< the file in the text; empty if it names none
  int lineInText() const;          ///< the line in the text; 0 if it names none

  /// The line for comparison in a test, without the parts that change from build to build and run to run:
  ///   4000 banner
  ///   4000 ENTERING DNSClient_EnumInstances
  ///   3000 EXITING getDNSClientInstances, dnsClientMap=ADDR
  ///   4000 VARIABLE nodeString = Computer
  ///   6000 MESSAGE No ObjectPath Found
  std::string brief() const;
  /// The same with the category in front.
  std::string briefWithCategory() const;
};

std::ostream& operator<<(std::ostream& out, const LogLine& line);

/// The text with each address 0x... replaced by ADDR.
std::string withoutAddresses(std::string_view text);

/// A line was written to one stream but not, with the same arguments, to the other.
class BrokenPair : public std::logic_error {
 public:
  using std::logic_error::logic_error;
};

/// Lines that were written as log pairs: first to the log, then the same to the trace.
class LogLines : public std::vector<LogLine> {
 public:
  using std::vector<LogLine>::vector;

  /// One line for each pair, that of the log. Throws BrokenPair if a line has no partner, if a partner differs, or if a
  /// reserved argument was given.
  LogLines pairs() const;

  std::vector<std::string> briefs() const;
  std::vector<std::string> briefsWithCategory() const;
  /// The content of the lines of a level: the texts of messages, the functions of entering and exiting lines.
  std::vector<std::string> texts(int level) const;
  std::vector<std::string> errors() const { return texts(6000); }
  LogLines ofCategory(std::string_view category) const;
  LogLines ofFunction(std::string_view function) const;
  LogLines ofKind(LineKind kind) const;

  /// Whether a function's entering or exiting line is there, with that file if one is given.
  bool entered(std::string_view function, std::string_view file = {}) const;
  bool exited(std::string_view function, std::string_view file = {}) const;

 private:
  bool has(LineKind kind, std::string_view function, std::string_view file) const;
};

/// Receives the agent's log from construction to destruction; one at a time. Safe from several threads.
class RecordingLogger : private zorva::agent::LogSink, zorva::util::NotCopied {
 public:
  RecordingLogger();
  ~RecordingLogger() override;

  /// The active one, or null.
  static RecordingLogger* active();
  /// Receives the log again, after the agent has dropped its sink.
  void resume();

  LogLines lines() const;
  LogLines pairs() const { return lines().pairs(); }
  std::size_t size() const;
  LogLines linesSince(std::size_t size) const;
  std::vector<std::string> ownLines() const;  ///< the agent's own lines
  void clear();

 private:
  void record(const zorva::agent::LogCall& call) override;
  void recordOwn(int level, const std::string& message) override;

  mutable std::mutex mutex_;
  LogLines lines_;
  std::vector<std::string> ownLines_;
};

}  // namespace ZV::Test
