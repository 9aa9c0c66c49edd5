#pragma once

#include <string>

// The server's lines in the agent's log, which is where the providers of the process write theirs. Thread-safe; nothing
// here throws.

namespace zorva::http {

/// On the scale of the agent's levels.
enum class Level : int {
  Request = 4500,  ///< a line for each request; what the providers tell about their work lies below
  Change = 5000,   ///< who has changed what
  Warning = 5000,  ///< requests that were refused, clients that were cut off, providers that do not return
  Error = 6000,    ///< what keeps the server itself from its work
};

void logLine(Level level, const std::string& text, const char* function, const char* file, int line) noexcept;

/// The same for what a client can bring about: only so many lines come through in a second, and one tells how many did
/// not. Nobody fills the disk with bad requests.
void logClientLine(Level level, const std::string& text, const char* function, const char* file, int line) noexcept;

/// Whether lines of that level are written at all, so that nobody composes them in vain.
bool isLogged(Level level) noexcept;
void setLogLevel(int level);

#define ZORVA_LOG(level, text) \
  ::zorva::http::logLine(::zorva::http::Level::level, (text), static_cast<const char*>(__func__), __FILE__, __LINE__)
#define ZORVA_LOG_CLIENT(level, text)                                                                             \
  ::zorva::http::logClientLine(::zorva::http::Level::level, (text), static_cast<const char*>(__func__), __FILE__, \
                               __LINE__)

}  // namespace zorva::http
