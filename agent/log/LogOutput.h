#pragma once

// Writes lines to their targets.

#include <atomic>
#include <string>

#include "agent/log/LogSink.h"
#include "util/LogLevels.h"

namespace zorva::agent {

/// The level below which a stream drops lines. It is very low at first, so that the first line reads the configuration.
extern std::atomic<int> logThreshold;
extern std::atomic<int> traceThreshold;

inline bool isDropped(LogStream stream, int level) {
  const auto& threshold = stream == LogStream::Log ? logThreshold : traceThreshold;
  return level < threshold.load(std::memory_order_relaxed);
}

/// Writes a line to the stream's target. Never throws.
void writeLine(const LogCall& call) noexcept;

/// Writes one of the agent's own lines to the log, under the category "Zorvagent.Agent". Never throws.
void logOwn(int level, const char* function, const char* file, int line, const std::string& message) noexcept;

#define ZORVAGENT_LOG_ERROR(message) \
  zorva::agent::logOwn(zorva::util::kLevelError, static_cast<const char*>(__func__), __FILE__, __LINE__, (message))

/// Change a stream at run time. The target is "stderr", "syslog", "off" or the path of a file that is appended to.
/// Throws std::runtime_error, with the reason, if that cannot be opened; the target is then unchanged.
void setStreamLevel(LogStream stream, int level);
void setStreamTarget(LogStream stream, const std::string& target);

/// Whether the log's lines of errors go to syslog, because the configuration says so.
bool errorsGoToSyslog();

/// A line to syslog, whatever the log's target: in a server's process standard error is often closed. Not after
/// neverTellSyslog(), for programs whose user sees the error.
void tellSyslog(const std::string& problem);
void neverTellSyslog();

/// Drops the sink and all settings; the next line reads the configuration again.
void resetLog();

/// From now on a fork waits until no line is being written. The first line does the same.
void watchForksOfLog();

}  // namespace zorva::agent
