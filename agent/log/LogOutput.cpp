#include "agent/log/LogOutput.h"

#include <fcntl.h>
#include <pthread.h>
#include <sys/stat.h>
#include <syslog.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <limits>
#include <memory>
#include <mutex>
#include <stdexcept>

#include "agent/config/CurrentConfig.h"
#include "util/Escape.h"
#include "util/FileDescriptor.h"
#include "util/ReadFile.h"

#define FMT_HEADER_ONLY
#define SPDLOG_NO_THREAD_ID
#include <spdlog/logger.h>
#include <spdlog/pattern_formatter.h>
#include <spdlog/sinks/base_sink.h>
#include <spdlog/sinks/syslog_sink.h>

namespace zorva::agent {

constinit std::atomic<int> logThreshold{std::numeric_limits<int>::min()};
constinit std::atomic<int> traceThreshold{std::numeric_limits<int>::min()};

namespace {

constexpr int kEverything = std::numeric_limits<int>::min();
constexpr int kNothing = std::numeric_limits<int>::max();

std::atomic<int>& thresholdOf(LogStream stream) { return stream == LogStream::Log ? logThreshold : traceThreshold; }

// Writes each line with one call, so that lines of several processes in one file do not mix.
class DescriptorSink : public spdlog::sinks::base_sink<spdlog::details::null_mutex> {
 public:
  explicit DescriptorSink(int borrowed) : descriptor_(borrowed) {}
  explicit DescriptorSink(util::FileDescriptor owned) : owned_(std::move(owned)), descriptor_(owned_.get()) {}

 protected:
  void sink_it_(const spdlog::details::log_msg& message) override {
    spdlog::memory_buf_t line;
    formatter_->format(message, line);
    const char* rest = line.data();
    for (std::size_t left = line.size(); left > 0;) {
      const ssize_t written = ::write(descriptor_, rest, left);
      if (written < 0 && errno == EINTR) continue;
      if (written <= 0) return;
      rest += written;
      left -= static_cast<std::size_t>(written);
    }
  }
  void flush_() override {}

 private:
  util::FileDescriptor owned_;
  int descriptor_;
};

// Opens a file for appending. A FIFO or a socket could block or end the process later.
util::FileDescriptor openLogFile(const std::string& path) {
  constexpr mode_t kMode = 0640;
  util::FileDescriptor file(
      ::open(path.c_str(), O_WRONLY | O_APPEND | O_CREAT | O_CLOEXEC | O_NOCTTY | O_NONBLOCK, kMode));
  struct stat status {};
  const int error = !file || ::fstat(file.get(), &status) != 0           ? errno
                    : S_ISREG(status.st_mode) || S_ISCHR(status.st_mode) ? 0
                                                                         : EINVAL;
  if (error != 0) throw std::runtime_error(path + ": cannot be opened as a log: " + util::fileErrorText(error));
  return file;
}

using Logger = std::unique_ptr<spdlog::logger>;

// Null for "off".
Logger makeLogger(const std::string& target) {
  if (target == "off") return nullptr;
  spdlog::sink_ptr sink;
  if (target == "stderr") {
    sink = std::make_shared<DescriptorSink>(STDERR_FILENO);
  } else if (target == "syslog") {
    sink = std::make_shared<spdlog::sinks::syslog_sink_st>(std::string(), 0, LOG_DAEMON, false);
  } else {
    sink = std::make_shared<DescriptorSink>(openLogFile(target));
  }
  auto logger = std::make_unique<spdlog::logger>("zorvagent", std::move(sink));
  logger->set_pattern("%Y-%m-%dT%H:%M:%S.%e%z %v");
  logger->set_level(spdlog::level::trace);
  logger->set_error_handler([](const std::string&) {});  // a line that cannot be written is lost
  return logger;
}

// The syslog severity of a level.
spdlog::level::level_enum severity(int level) {
  if (level >= util::kLevelError) return spdlog::level::err;
  return level >= util::kLevelDetail ? spdlog::level::info : spdlog::level::debug;
}

void appendText(std::string& line, const char* text) {
  if (text != nullptr) util::appendEscaped(line, text);
}

std::string composeLine(const LogCall& call) {
  std::string line = std::to_string(call.level);
  line += ' ';
  util::appendEscaped(line, call.category);
  line += ' ';
  appendText(line, call.function);
  line += ' ';
  appendText(line, call.file);
  line += ':';
  line += std::to_string(call.line);
  line += ' ';
  util::appendEscaped(line, call.message);
  return line;
}

struct Stream {
  int level = kNothing;
  Logger logger;
  bool isSyslog = false;
};

std::atomic<bool> mayTellSyslog{true};

constinit std::mutex outputMutex;

class Output {
 public:
  // The handler that is registered first locks last at a fork: a line takes the log's lock, then the configuration's.
  Output() {
    CurrentConfig::instance();
    const auto unlock = [] { outputMutex.unlock(); };
    ::pthread_atfork([] { outputMutex.lock(); }, unlock, unlock);
  }

  ~Output() {
    // A line that arrives while the process ends is dropped.
    logThreshold = kNothing;
    traceThreshold = kNothing;
  }

  void write(const LogCall& call) {
    if (sink_ != nullptr) return sink_->record(call);
    writeToTarget(call);
  }

  void writeOwn(const LogCall& call) {
    if (sink_ != nullptr) return sink_->recordOwn(call.level, call.message);
    writeToTarget(call);
  }

  bool errorsGoToSyslog() {
    configure();
    const Stream& log = streamOf(LogStream::Log);
    return sink_ == nullptr && log.isSyslog && log.level <= util::kLevelError;
  }

  void setSink(LogSink* sink) {
    sink_ = sink;
    publishThresholds();
  }

  void setLevel(LogStream stream, int level) {
    configure();
    streamOf(stream).level = level;
    publishThresholds();
  }

  void setTarget(LogStream stream, const std::string& target) {
    configure();
    streamOf(stream).logger = makeLogger(target);
    streamOf(stream).isSyslog = target == "syslog";
    publishThresholds();
  }

  void reset() {
    sink_ = nullptr;
    configured_ = false;
    streams_ = {};
    publishThresholds();
  }

 private:
  Stream& streamOf(LogStream stream) { return streams_[stream == LogStream::Log ? 0 : 1]; }

  void writeToTarget(const LogCall& call) {
    configure();
    const Stream& stream = streamOf(call.stream);
    if (stream.logger != nullptr && call.level >= stream.level) {
      stream.logger->log(severity(call.level), composeLine(call));
    }
  }

  void configure() {
    if (configured_) return;
    configured_ = true;
    const Config& config = CurrentConfig::instance().get();
    streams_[0] = open(config.logLevel, config.logTarget);
    streams_[1] = open(config.traceLevel, config.traceTarget);
    publishThresholds();
  }

  static Stream open(int level, const std::string& target) {
    try {
      return {level, makeLogger(target), target == "syslog"};
    } catch (const std::runtime_error& error) {
      const std::string problem = std::string(error.what()) + "; its lines are lost";
      tellSyslog(problem);
      const std::string line = "zorvagent: " + problem + "\n";
      [[maybe_unused]] const ssize_t written = ::write(STDERR_FILENO, line.data(), line.size());
      return {};
    }
  }

  // A sink takes every line; and before the configuration is read it is not known which lines to drop.
  void publishThresholds() {
    for (const LogStream stream : {LogStream::Log, LogStream::Trace}) {
      const Stream& settings = streamOf(stream);
      const int level = settings.logger == nullptr ? kNothing : settings.level;
      thresholdOf(stream) = sink_ != nullptr || !configured_ ? kEverything : level;
    }
  }

  LogSink* sink_ = nullptr;
  bool configured_ = false;
  std::array<Stream, 2> streams_;
};

Output& output() {
  static Output instance;
  return instance;
}

}  // namespace

void writeLine(const LogCall& call) noexcept try {
  const std::lock_guard lock(outputMutex);
  output().write(call);
} catch (...) {
  // The line is lost, like any line that cannot be written.
}

void logOwn(int level, const char* function, const char* file, int line, const std::string& message) noexcept try {
  const std::string category = "Zorvagent.Agent";
  const LogCall call{LogStream::Log, function, file, line, category, level, nullptr, 0, 0, message};
  if (isDropped(call.stream, level)) return;
  const std::lock_guard lock(outputMutex);
  output().writeOwn(call);
} catch (...) {
  // The line is lost, like any line that cannot be written.
}

void setStreamLevel(LogStream stream, int level) {
  const std::lock_guard lock(outputMutex);
  output().setLevel(stream, level);
}

void setStreamTarget(LogStream stream, const std::string& target) {
  const std::lock_guard lock(outputMutex);
  output().setTarget(stream, target);
}

void setLogSink(LogSink* sink) {
  const std::lock_guard lock(outputMutex);
  output().setSink(sink);
}

bool errorsGoToSyslog() {
  const std::lock_guard lock(outputMutex);
  return output().errorsGoToSyslog();
}

void tellSyslog(const std::string& problem) {
  if (mayTellSyslog) ::syslog(LOG_DAEMON | LOG_ERR, "zorvagent: %s", problem.c_str());
}

void neverTellSyslog() { mayTellSyslog = false; }

void resetLog() {
  const std::lock_guard lock(outputMutex);
  mayTellSyslog = true;
  output().reset();
}

void watchForksOfLog() {
  const std::lock_guard lock(outputMutex);
  output();
}

}  // namespace zorva::agent
