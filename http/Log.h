#pragma once

// The server's lines in the agent's log, to which the providers of the process write too. Thread-safe; nothing here
// throws.

#include <string>

#include "util/LogLevels.h"

namespace zorva::http {

/// On the scale of the agent's levels.
enum class Level : int {
  Request = 4500,                ///< a line for each request; the providers' lines about their work have lower levels
  Change = util::kLevelWarning,  ///< which client changed what
  Warning =
      util::kLevelWarning,    ///< requests that were refused, clients that were cut off, providers that do not return
  Error = util::kLevelError,  ///< errors of the server itself
};

void logLine(Level level, const std::string& text, const char* function, const char* file, int line) noexcept;

/// The same for events that a client can cause. Only a limited number of lines is written per second, and one line
/// reports how many were dropped, so bad requests cannot fill the disk.
void logClientLine(Level level, const std::string& text, const char* function, const char* file, int line) noexcept;

/// Whether lines of that level are written at all. If not, do not compose them.
bool isLogged(Level level) noexcept;
void setLogLevel(int level);

#define ZORVA_LOG(level, text) \
  ::zorva::http::logLine(::zorva::http::Level::level, (text), static_cast<const char*>(__func__), __FILE__, __LINE__)
#define ZORVA_LOG_CLIENT(level, text)                                                                             \
  ::zorva::http::logClientLine(::zorva::http::Level::level, (text), static_cast<const char*>(__func__), __FILE__, \
                               __LINE__)

}  // namespace zorva::http
