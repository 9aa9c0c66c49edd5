#pragma once

// The format of every line that the library writes to the agent's logger.

#include <ZALogger.h>

#include <cstdio>
#include <cstring>
#include <string>
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

// The four formatters. Each returns its own buffer, one for each thread. A line is valid until the same formatter runs
// again on its thread. Null text prints as "(null)".

inline const char* trace(const char* text, const char* file, unsigned int line, MessageType type) {
  static thread_local char messageBuffer[kMessageBufferSize];
  std::memset(messageBuffer, 0, sizeof messageBuffer);
  if (type == MSG_METHOD) {
    std::snprintf(messageBuffer, sizeof messageBuffer, "METHOD: %s() was invoked in %s [Line: %d]", text, file, line);
  } else if (type == MSG_MESSAGE) {
    std::snprintf(messageBuffer, sizeof messageBuffer, "MESSAGE [File: %s, Line: %d]: %s", file, line, text);
  } else if (type == MSG_EXITING) {
    std::snprintf(messageBuffer, sizeof messageBuffer, "EXITING: %s() in %s [Line: %d]", text, file, line);
  } else {
    std::snprintf(messageBuffer, sizeof messageBuffer, "ENTERING: %s() in %s [Line: %d]", text, file, line);
  }
  return messageBuffer;
}

inline const char* tracepara(const char* text, const char* file, unsigned int line, const char* parameters,
                             MessageType type) {
  static thread_local char messageBuffer[kMessageBufferSize];
  std::memset(messageBuffer, 0, sizeof messageBuffer);
  if (type == MSG_METHOD) {
    std::snprintf(messageBuffer, sizeof messageBuffer, "METHOD: %s() was invoked in %s [Line: %d],Parameters List: %s",
                  text, file, line, parameters);
  } else if (type == MSG_MESSAGE) {
    std::snprintf(messageBuffer, sizeof messageBuffer, "MESSAGE [File: %s, Line: %d]: %s,Parameters List: %s", file,
                  line, text, parameters);
  } else if (type == MSG_EXITING) {
    std::snprintf(messageBuffer, sizeof messageBuffer, "EXITING: %s() in %s [Line: %d],Parameters List: %s", text, file,
                  line, parameters);
  } else {
    std::snprintf(messageBuffer, sizeof messageBuffer, "ENTERING: %s() in %s [Line: %d],Parameters List: %s", text,
                  file, line, parameters);
  }
  return messageBuffer;
}

inline const char* trace(const char* name, const char* file, unsigned int line, unsigned int value) {
  static thread_local char messageBuffer[kMessageBufferSize];
  std::memset(messageBuffer, 0, sizeof messageBuffer);
  std::snprintf(messageBuffer, sizeof messageBuffer, "VARIABLE: '%s' has Value '%d' at line %d in %s", name, value,
                line, file);
  return messageBuffer;
}

inline const char* trace(const char* name, const char* file, unsigned int line, const char* value) {
  static thread_local char messageBuffer[kMessageBufferSize];
  std::memset(messageBuffer, 0, sizeof messageBuffer);
  std::snprintf(messageBuffer, sizeof messageBuffer, "VARIABLE: '%s' has Value '%s' at line %d in %s", name, value,
                line, file);
  return messageBuffer;
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
