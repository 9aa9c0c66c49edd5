#include "http/Log.h"

#include <atomic>
#include <chrono>
#include <mutex>

#include "agent/Agent.h"
#include "agent/interface/ZALogger.h"

namespace zorva::http {

namespace {

using Clock = std::chrono::steady_clock;

constexpr const char* kCategory = "Zorvagent.Server";
constexpr int kLinesInASecond = 50;

std::atomic<int> threshold{static_cast<int>(Level::Warning)};

void writeLine(int level, const std::string& text, const char* function, const char* file, int line) {
  static const std::string category = kCategory;
  ZALog::ZALogger::logLevelMessage(function, file, line, category, level, nullptr, 0, 0, text);
}

/// Counts lines second by second.
class Flood {
 public:
  /// Whether this line may be written. `missed` is the number of lines dropped before it, reported once.
  bool admits(Clock::time_point now, int& missed) {
    const std::lock_guard lock(mutex_);
    missed = 0;
    if (now - begin_ >= std::chrono::seconds(1)) {
      missed = count_ > kLinesInASecond ? count_ - kLinesInASecond : 0;
      begin_ = now;
      count_ = 0;
    }
    return ++count_ <= kLinesInASecond;
  }

 private:
  std::mutex mutex_;
  Clock::time_point begin_ = Clock::now();
  int count_ = 0;
};

}  // namespace

bool isLogged(Level level) noexcept { return static_cast<int>(level) >= threshold.load(std::memory_order_relaxed); }

void setLogLevel(int level) {
  threshold = level;
  zorva::agent::setLogLevel(zorva::agent::LogStream::Log, level);
}

void logLine(Level level, const std::string& text, const char* function, const char* file, int line) noexcept try {
  if (isLogged(level)) writeLine(static_cast<int>(level), text, function, file, line);
} catch (...) {
  // The line is lost, like any line that cannot be written.
}

void logClientLine(Level level, const std::string& text, const char* function, const char* file, int line) noexcept
    try {
  static Flood flood;
  if (!isLogged(level)) return;
  int missed = 0;
  const bool admitted = flood.admits(Clock::now(), missed);
  if (missed > 0) {
    writeLine(static_cast<int>(level), std::to_string(missed) + " lines about clients were left out before this one",
              function, file, line);
  }
  if (admitted) writeLine(static_cast<int>(level), text, function, file, line);
} catch (...) {
  // The line is lost, like any line that cannot be written.
}

}  // namespace zorva::http
