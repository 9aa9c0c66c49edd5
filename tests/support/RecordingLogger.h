// Takes every line that goes to the agent's logger, and tells what kind of line it is.
#pragma once

#include <cstddef>
#include <mutex>
#include <optional>
#include <ostream>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "agent/log/LogSink.h"

namespace ZV::Test {

enum class LineKind { Banner, Entering, Exiting, Method, Message, Variable, Other };

// One call of the logger.
struct LogLine {
  zorva::agent::LogStream stream = zorva::agent::LogStream::Log;
  std::string function;
  std::string file;
  int line = 0;
  std::string category;
  int level = 0;
  bool reservedAreEmpty = true;  // the three reserved arguments were null, 0 and 0
  std::string text;
  std::size_t place = 0;  // among all calls and log lines of the process

  // What the text says, taken apart by the forms that the library writes.
  LineKind kind() const;
  std::string subject() const;     // the function, the message's text, or the variable's name; else the whole text
  std::string value() const;       // of a variable
  std::string parameters() const;  // of a line with a parameter list, addresses as ADDR
  std::string toldFile() const;    // the file in the text; empty where it names none
  int toldLine() const;            // the line in the text; 0 where it names none

  // The line without what changes from build to build and run to run, as a test compares it:
  //   4000 banner
  //   4000 ENTERING DNSClient_EnumInstances
  //   3000 EXITING getDNSClientInstances, dnsClientMap=ADDR
  //   4000 VARIABLE nodeString = Computer
  //   6000 MESSAGE No ObjectPath Found
  std::string brief() const;
  // The same with the category in front.
  std::string briefWithCategory() const;
};

std::ostream& operator<<(std::ostream& out, const LogLine& line);

// The text with each address 0x... replaced by ADDR.
std::string withoutAddresses(std::string_view text);

// A line went to one stream and not, with the same arguments, to the other.
class BrokenPair : public std::logic_error {
 public:
  using std::logic_error::logic_error;
};

// Lines that were written as log pairs: first to the log, then the same to the trace.
class LogLines : public std::vector<LogLine> {
 public:
  using std::vector<LogLine>::vector;

  // One line for each pair, that of the log. Throws BrokenPair where a line has no partner, where a partner differs, or
  // where a reserved argument was given.
  LogLines pairs() const;

  std::vector<std::string> briefs() const;
  std::vector<std::string> briefsWithCategory() const;
  // What the lines of a level say: the texts of messages, the functions of entering and exiting lines.
  std::vector<std::string> texts(int level) const;
  std::vector<std::string> errors() const { return texts(6000); }
  LogLines ofCategory(std::string_view category) const;
  LogLines ofFunction(std::string_view function) const;
  LogLines ofKind(LineKind kind) const;

  // Whether a function's entering or exiting line is there, with that file where one is given.
  bool entered(std::string_view function, std::string_view file = {}) const;
  bool exited(std::string_view function, std::string_view file = {}) const;

 private:
  bool has(LineKind kind, std::string_view function, std::string_view file) const;
};

// Takes the agent's log from its construction to its end; one at a time. Safe from several threads.
class RecordingLogger : private zorva::agent::LogSink {
 public:
  RecordingLogger();
  ~RecordingLogger() override;
  RecordingLogger(const RecordingLogger&) = delete;
  RecordingLogger& operator=(const RecordingLogger&) = delete;

  // The one that records now, or null.
  static RecordingLogger* active();
  // Takes the log again, after the agent has forgotten its sink.
  void resume();

  LogLines lines() const;
  LogLines pairs() const { return lines().pairs(); }
  std::size_t size() const;
  LogLines linesSince(std::size_t size) const;
  std::vector<std::string> ownLines() const;  // the agent's own
  void clear();

 private:
  void record(const zorva::agent::LogCall& call) override;
  void recordOwn(int level, const std::string& message) override;

  mutable std::mutex mutex_;
  LogLines lines_;
  std::vector<std::string> ownLines_;
};

}  // namespace ZV::Test
