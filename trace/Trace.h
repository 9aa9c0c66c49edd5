#pragma once

// The format of every line that the library writes to the agent's logger.

#include <ZALogger.h>

#include <algorithm>
#include <charconv>
#include <cstddef>
#include <cstring>
#include <iterator>
#include <limits>
#include <string>
#include <string_view>
#include <tuple>
#include <type_traits>

#include "util/LogLevels.h"

namespace ZV {

/// Selects the format of a line. A value that is not listed gives the entering format.
enum MessageType : int { MSG_ENTERING = 0, MSG_EXITING = 1, MSG_METHOD = 2, MSG_MESSAGE = 3 };

/// The levels that the library writes at. The library tests no level: the logger drops lines.
enum LogLevel : int {
  LOG_LEVEL_FLOW = zorva::util::kLevelFlow,
  LOG_LEVEL_DETAIL = zorva::util::kLevelDetail,
  LOG_LEVEL_ERROR = zorva::util::kLevelError,
};

/// A longer line is truncated.
constexpr std::size_t kMessageBufferSize = 512;

/// A line and its size. The bytes after the line are zero.
struct LineBuffer {
  char text[kMessageBufferSize];
  std::size_t size;
};

/// Composes a line in a buffer. The line always has its end; what is too long for it is left out.
class LineWriter {
 public:
  explicit LineWriter(LineBuffer& buffer)
      : buffer_(buffer), at_(buffer.text), end_(buffer.text + kMessageBufferSize - 1) {}

  /// Returns the line.
  template <typename... Pieces>
  const char* write(const Pieces&... pieces) {
    (append(pieces), ...);
    clearRestOfLastLine();
    return buffer_.text;
  }

 private:
  void clearRestOfLastLine() {
    const auto size = static_cast<std::size_t>(at_ - buffer_.text);
    if (size < buffer_.size) std::memset(at_, 0, buffer_.size - size);
    buffer_.size = size;
  }

  void append(std::string_view text) {
    const std::size_t size = std::min(text.size(), static_cast<std::size_t>(end_ - at_));
    // Not memcpy: the compiler knows that it is short, and makes an instruction of it that takes longer to begin than
    // a call of memmove takes to end.
    std::memmove(at_, text.data(), size);
    at_ += size;
  }
  /// A literal: its size is known when it is compiled.
  template <std::size_t Size>
  void append(const char (&text)[Size]) {
    if (static_cast<std::size_t>(end_ - at_) < Size - 1) return append(std::string_view(text, Size - 1));
    std::memcpy(at_, text, Size - 1);
    at_ += Size - 1;
  }

  void append(const char* const& text) {
    append(text == nullptr ? std::string_view("(null)") : std::string_view(text));
  }

  /// Signed, because the lines show a number so. A number that does not fit is cut off like a text.
  void append(unsigned int number) {
    const auto shown = static_cast<int>(number);
    if (const auto written = std::to_chars(at_, end_, shown); written.ec == std::errc()) {
      at_ = written.ptr;
      return;
    }
    char digits[std::numeric_limits<int>::digits10 + 2];
    const auto end = std::to_chars(std::begin(digits), std::end(digits), shown).ptr;
    append(std::string_view(std::begin(digits), static_cast<std::size_t>(end - digits)));
  }

  LineBuffer& buffer_;
  char* at_;
  char* const end_;
};

// The four formatters. Each returns its own buffer, one for each thread. A line is valid until the same formatter runs
// again on its thread. Null text prints as "(null)".

inline const char* trace(const char* text, const char* file, unsigned int line, MessageType type) {
  static thread_local LineBuffer messageBuffer;
  LineWriter writer(messageBuffer);
  if (type == MSG_METHOD) {
    return writer.write("METHOD: ", text, "() was invoked in ", file, " [Line: ", line, "]");
  }
  if (type == MSG_MESSAGE) {
    return writer.write("MESSAGE [File: ", file, ", Line: ", line, "]: ", text);
  }
  if (type == MSG_EXITING) {
    return writer.write("EXITING: ", text, "() in ", file, " [Line: ", line, "]");
  }
  return writer.write("ENTERING: ", text, "() in ", file, " [Line: ", line, "]");
}

inline const char* tracepara(const char* text, const char* file, unsigned int line, const char* parameters,
                             MessageType type) {
  static thread_local LineBuffer messageBuffer;
  constexpr char kParameters[] = ",Parameters List: ";
  LineWriter writer(messageBuffer);
  if (type == MSG_METHOD) {
    return writer.write("METHOD: ", text, "() was invoked in ", file, " [Line: ", line, "]", kParameters, parameters);
  }
  if (type == MSG_MESSAGE) {
    return writer.write("MESSAGE [File: ", file, ", Line: ", line, "]: ", text, kParameters, parameters);
  }
  if (type == MSG_EXITING) {
    return writer.write("EXITING: ", text, "() in ", file, " [Line: ", line, "]", kParameters, parameters);
  }
  return writer.write("ENTERING: ", text, "() in ", file, " [Line: ", line, "]", kParameters, parameters);
}

inline const char* trace(const char* name, const char* file, unsigned int line, unsigned int value) {
  static thread_local LineBuffer messageBuffer;
  return LineWriter(messageBuffer).write("VARIABLE: '", name, "' has Value '", value, "' at line ", line, " in ", file);
}

inline const char* trace(const char* name, const char* file, unsigned int line, const char* value) {
  static thread_local LineBuffer messageBuffer;
  return LineWriter(messageBuffer).write("VARIABLE: '", name, "' has Value '", value, "' at line ", line, " in ", file);
}

/// A statement's place in its source. The default argument of a function is the place of the statement that calls it.
struct Place {
  const char* file;
  unsigned int line;
  static constexpr Place here(const char* file = __builtin_FILE(), unsigned int line = __builtin_LINE()) {
    return {file, line};
  }
};

/// The function that a line names, and its source file and line.
struct LogSite {
  const char* function;
  const char* file;
  unsigned int line;
};
#define ZV_HERE ZV_HERE_IN(static_cast<const char*>(__func__))
/// For a lambda: its own name would replace the function's.
#define ZV_HERE_IN(function) (::ZV::LogSite{function, __FILE__, __LINE__})

/// A log pair: the same line to the log and then to the trace. format is called for each of the two.
template <typename Format>
void logPair(const std::string& logger, const LogSite& site, int level, Format format) {
  {
    ZALog::ZAMessageBuffer buffer;
    ZALog::ZALogger::logLevelMessage(site.function, site.file, static_cast<int>(site.line), logger, level, nullptr, 0,
                                     0, buffer.str(buffer << format()));
  }
  {
    ZALog::ZAMessageBuffer buffer;
    ZALog::ZALogger::traceLevelMessage(site.function, site.file, static_cast<int>(site.line), logger, level, nullptr, 0,
                                       0, buffer.str(buffer << format()));
  }
}

inline void logMessage(const std::string& logger, const LogSite& site, LogLevel level, const char* text) {
  logPair(logger, site, level, [&] { return trace(text, site.file, site.line, MSG_MESSAGE); });
}

inline void logError(const std::string& logger, const LogSite& site, const char* text) {
  logMessage(logger, site, LOG_LEVEL_ERROR, text);
}

inline void logVariable(const std::string& logger, const LogSite& site, const char* name, const std::string& value) {
  logPair(logger, site, LOG_LEVEL_DETAIL, [&] { return trace(name, site.file, site.line, value.c_str()); });
}

inline void logVariable(const std::string& logger, const LogSite& site, const char* name, unsigned int value) {
  logPair(logger, site, LOG_LEVEL_DETAIL, [&] { return trace(name, site.file, site.line, value); });
}

/// One label or value of a parameter list: text unchanged, a bool as the stream prints it, anything else as its
/// address.
template <typename T>
void appendParameter(ZALog::ZAMessageBuffer& buffer, const T& labelOrValue) {
  if constexpr (std::is_same_v<T, bool>) {
    static_cast<std::ostream&>(buffer) << labelOrValue;
  } else if constexpr (std::is_convertible_v<T, const char*>) {
    buffer << static_cast<const char*>(labelOrValue);
  } else {
    using ZALog::operator<<;
    buffer << labelOrValue;
  }
}

/// A line with a parameter list, labels and values alternating: logEntry(logger, ZV_HERE, " broker=", broker, " ref=",
/// ref).
template <typename... LabelsAndValues>
void logWithParameters(const std::string& logger, const LogSite& site, MessageType type,
                       const LabelsAndValues&... labelsAndValues) {
  logPair(logger, site, LOG_LEVEL_FLOW, [&] {
    ZALog::ZAMessageBuffer parameters;
    (appendParameter(parameters, labelsAndValues), ...);
    return tracepara(site.function, site.file, site.line, parameters.str(parameters).c_str(), type);
  });
}

template <typename... LabelsAndValues>
void logEntry(const std::string& logger, const LogSite& site, const LabelsAndValues&... labelsAndValues) {
  logWithParameters(logger, site, MSG_ENTERING, labelsAndValues...);
}

template <typename... LabelsAndValues>
void logExit(const std::string& logger, const LogSite& site, const LabelsAndValues&... labelsAndValues) {
  logWithParameters(logger, site, MSG_EXITING, labelsAndValues...);
}

/// Writes the entry line of a function when it is constructed, and the exit line with the same parameters when exit()
/// is called.
template <typename... LabelsAndValues>
class FlowLog {
 public:
  FlowLog(const std::string& logger, const LogSite& site, const LabelsAndValues&... labelsAndValues)
      : logger_(logger), function_(site.function), labelsAndValues_(labelsAndValues...) {
    logEntry(logger, site, labelsAndValues...);
  }

  void exit(const Place& place = Place::here()) const {
    const LogSite site = {function_, place.file, place.line};
    std::apply([&](const auto&... values) { logExit(logger_, site, values...); }, labelsAndValues_);
  }

 private:
  const std::string& logger_;
  const char* function_;
  std::tuple<LabelsAndValues...> labelsAndValues_;
};
template <typename... LabelsAndValues>
FlowLog(const std::string&, const LogSite&, LabelsAndValues...) -> FlowLog<LabelsAndValues...>;

inline constexpr const char* kBanner = "==============================================================================";
static_assert(std::char_traits<char>::length(kBanner) == 78);

/// Frame a provider operation in the log. The text of the lines names the operation; the place that the logger gets is
/// in this header.
inline void markProviderEntry(const std::string& logger, const char* function, const char* file, unsigned int line) {
  logPair(logger, ZV_HERE, LOG_LEVEL_DETAIL, [] { return kBanner; });
  logPair(logger, ZV_HERE, LOG_LEVEL_DETAIL, [&] { return trace(function, file, line, MSG_ENTERING); });
}

inline void markProviderExit(const std::string& logger, const char* function, const char* file, unsigned int line) {
  logPair(logger, ZV_HERE, LOG_LEVEL_DETAIL, [&] { return trace(function, file, line, MSG_EXITING); });
  logPair(logger, ZV_HERE, LOG_LEVEL_DETAIL, [] { return kBanner; });
}

#define ZV_PROVIDER_ENTRY(logger) \
  ::ZV::markProviderEntry(logger, static_cast<const char*>(__func__), __FILE__, __LINE__)
#define ZV_PROVIDER_EXIT(logger) ::ZV::markProviderExit(logger, static_cast<const char*>(__func__), __FILE__, __LINE__)

}  // namespace ZV
