#include "server/Log.h"

#include <atomic>
#include <chrono>
#include <mutex>

#include "agent/Agent.h"
#include "agent/interface/ZALogger.h"

namespace zorva::server {

namespace {

using Clock = std::chrono::steady_clock;

constexpr const char* kCategory = "Zorvagent.Server";
constexpr int kLinesInASecond = 50;

std::atomic<int> threshold{static_cast<int>(Level::Warning)};

void writeLine(int level, const std::string& text, const char* function, const char* file, int line) {
  static const std::string category = kCategory;
  ZALog::ZALogger::logLevelMessage(function, file, line, category, level, nullptr, 0, 0, text);
}

int numberOf(broker::LogLevel level) {
  constexpr int kLevels[] = {3000, 4000, 5000, 6000};
  return kLevels[static_cast<std::size_t>(level)];
}

/// Counts lines second by second.
class Flood {
 public:
  /// Whether this line may be written. `missed` is how many before it could not, told once.
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
  zorvagent::setLogLevel(zorvagent::LogStream::Log, level);
}

void logLine(Level level, const std::string& text, const char* function, const char* file, int line) noexcept try {
  if (isLogged(level)) writeLine(static_cast<int>(level), text, function, file, line);
} catch (...) {
  // Lost, as a line that cannot be written.
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
  // Lost, as a line that cannot be written.
}

void logServiceLine(broker::LogLevel level, std::string_view text) noexcept try {
  logClientLine(static_cast<Level>(numberOf(level)), std::string(text), "service", __FILE__, __LINE__);
} catch (...) {
  // Lost, as a line that cannot be written.
}

void logChange(const std::string& line) noexcept { logLine(Level::Change, line, "service", __FILE__, __LINE__); }

void logBrokerLine(broker::LogLevel level, std::string_view text) noexcept try {
  const int number = numberOf(level);
  if (number >= threshold.load(std::memory_order_relaxed)) {
    writeLine(number, std::string(text), "broker", __FILE__, __LINE__);
  }
} catch (...) {
  // Lost, as a line that cannot be written.
}

}  // namespace zorva::server
