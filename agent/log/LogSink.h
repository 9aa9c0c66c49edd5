#pragma once

// The two streams of lines, and a sink that takes them instead of the configured targets.

#include <string>

#include "agent/interface/AgentApi.h"

namespace zorva::agent {

enum class LogStream { Log, Trace };

/// One call of ZALog::ZALogger, with its arguments as they came.
struct LogCall {
  LogStream stream;
  const char* function;
  const char* file;
  int line;
  const std::string& category;
  int level;
  const char* reserved1;
  int reserved2;
  int reserved3;
  const std::string& message;
};

/// Called under the log's lock: one call at a time, from any thread. It must not log itself. Its exceptions are
/// ignored.
class LogSink {
 public:
  virtual ~LogSink() = default;

  /// A call of the logger, whatever its level.
  virtual void record(const LogCall& call) = 0;

  /// One of the agent's own lines, which did not come through ZALogger.
  virtual void recordOwn(int /*level*/, const std::string& /*message*/) {}
};

/// Passes every call of the logger to the sink and writes no line to the targets, until null is given. The caller keeps
/// ownership of the sink, which must live until then. Thread-safe.
ZORVA_AGENT_API void setLogSink(LogSink* sink);

}  // namespace zorva::agent
