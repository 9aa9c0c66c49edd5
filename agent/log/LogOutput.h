// Where lines go.
#pragma once

#include <atomic>
#include <string>

#include "agent/log/LogSink.h"
#include "util/LogLevels.h"

namespace zorva::agent {

// The level below which a stream drops lines. Starts so low that the first line goes on to the place where the
// configuration is asked.
extern std::atomic<int> logThreshold;
extern std::atomic<int> traceThreshold;

inline bool isDropped(LogStream stream, int level) {
  const auto& threshold = stream == LogStream::Log ? logThreshold : traceThreshold;
  return level < threshold.load(std::memory_order_relaxed);
}

// Writes a line to the stream's target. Never throws.
void writeLine(const LogCall& call) noexcept;

// Writes a line of the agent's own to the log, under the category "Zorvagent.Agent". Never throws.
void logOwn(int level, const char* function, const char* file, int line, const std::string& message) noexcept;

#define ZORVAGENT_LOG_ERROR(message) \
  zorva::agent::logOwn(zorva::util::kLevelError, static_cast<const char*>(__func__), __FILE__, __LINE__, (message))

// Change a stream at run time. The target is "stderr", "syslog", "off" or the path of a file that is appended to;
// std::runtime_error, with the reason, where that cannot be opened, and the target stays.
void setStreamLevel(LogStream stream, int level);
void setStreamTarget(LogStream stream, const std::string& target);

// Forgets the sink and all settings; the next line asks the configuration again.
void resetLog();

// From now on a fork waits until no line is being written. The first line does the same.
void watchForksOfLog();

}  // namespace zorva::agent
