#include "agent/interface/ZALogger.h"

#include "agent/log/LogOutput.h"

namespace ZALog {

using zorva::agent::isDropped;
using zorva::agent::LogStream;

void ZALogger::logLevelMessage(const char* function, const char* file, int line, const std::string& category, int level,
                               char* reserved1, int reserved2, int reserved3, const std::string& message) {
  if (isDropped(LogStream::Log, level)) return;
  zorva::agent::writeLine(
      {LogStream::Log, function, file, line, category, level, reserved1, reserved2, reserved3, message});
}

void ZALogger::traceLevelMessage(const char* function, const char* file, int line, const std::string& category,
                                 int level, char* reserved1, int reserved2, int reserved3, const std::string& message) {
  if (isDropped(LogStream::Trace, level)) return;
  zorva::agent::writeLine(
      {LogStream::Trace, function, file, line, category, level, reserved1, reserved2, reserved3, message});
}

}  // namespace ZALog
