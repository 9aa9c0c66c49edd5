#include "server/AuditLog.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <cstdio>
#include <ctime>
#include <memory>
#include <stdexcept>
#include <utility>

#include "http/Log.h"
#include "util/ReadFile.h"
#include "util/TimeText.h"

namespace zorva::server {

namespace {

constexpr std::chrono::seconds kForTheRest{2};

std::string missing(std::size_t count) {
  return std::to_string(count) + " lines of the audit were left out here: too many came at once";
}

void writeAll(int file, std::string_view text) {
  while (!text.empty()) {
    const ssize_t written = ::write(file, text.data(), text.size());
    if (written < 0 && errno == EINTR) continue;
    if (written < 0) throw std::runtime_error(util::fileErrorText(errno));
    text.remove_prefix(static_cast<std::size_t>(written));
  }
}

}  // namespace

/// Shared with the thread, which may be stuck in its writer when the object goes.
struct AuditLog::State {
  std::mutex mutex;
  std::condition_variable changed;
  std::deque<std::string> lines;
  std::size_t leftOut = 0;
  std::chrono::steady_clock::time_point second{};
  int refusals = 0;  ///< in this second
  bool ends = false;
  bool isDone = false;
  std::shared_ptr<const Writer> writer;

  bool isFlood(std::chrono::steady_clock::time_point now) {
    if (now - second >= std::chrono::seconds(1)) {
      second = now;
      refusals = 0;
    }
    return ++refusals > kMostRefusals;
  }
};

AuditLog::AuditLog(Writer writer) : state_(std::make_shared<State>()) {
  state_->writer = std::make_shared<const Writer>(std::move(writer));
  thread_ = std::thread([state = state_] { run(state); });
}

AuditLog::~AuditLog() {
  std::unique_lock lock(state_->mutex);
  state_->ends = true;
  state_->changed.notify_all();
  const bool done = state_->changed.wait_for(lock, kForTheRest, [this] { return state_->isDone; });
  lock.unlock();
  if (done) {
    thread_.join();
  } else {
    thread_.detach();
  }
}

void AuditLog::take(const access::AuditRecord& record) noexcept try {
  std::string line = access::auditLine(record);
  const std::lock_guard lock(state_->mutex);
  if (state_->lines.size() >= kMostWaiting || (record.isRefusal && state_->isFlood(std::chrono::steady_clock::now()))) {
    ++state_->leftOut;
    return;
  }
  if (state_->leftOut > 0) state_->lines.push_back(missing(std::exchange(state_->leftOut, 0)));
  state_->lines.push_back(std::move(line));
  state_->changed.notify_all();
} catch (...) {
  // There is no memory for the line.
}

void AuditLog::setWriter(Writer writer) {
  auto fresh = std::make_shared<const Writer>(std::move(writer));
  const std::lock_guard lock(state_->mutex);
  state_->writer = std::move(fresh);
}

void AuditLog::run(const std::shared_ptr<State>& state) {
  std::unique_lock lock(state->mutex);
  for (;;) {
    state->changed.wait(lock, [&] { return state->ends || !state->lines.empty(); });
    if (state->lines.empty()) break;
    std::string line = std::move(state->lines.front());
    state->lines.pop_front();
    if (state->lines.empty() && state->leftOut > 0) {
      state->lines.push_back(missing(std::exchange(state->leftOut, 0)));
    }
    const std::shared_ptr<const Writer> writer = state->writer;
    lock.unlock();
    try {
      (*writer)(line);
    } catch (const std::exception& error) {
      ZORVA_LOG_CLIENT(Error, std::string("a line of the audit is lost: ") + error.what());
    }
    lock.lock();
  }
  state->isDone = true;
  state->changed.notify_all();
}

AuditLog::Writer auditFile(const std::string& path) {
  constexpr int kFlags = O_WRONLY | O_APPEND | O_CREAT | O_CLOEXEC | O_NOFOLLOW | O_NONBLOCK;
  constexpr mode_t kMode = 0640;
  auto file = std::make_shared<util::FileDescriptor>(::open(path.c_str(), kFlags, kMode));
  if (!*file) throw std::runtime_error(path + ": " + util::fileErrorText(errno));
  struct stat about {};
  if (::fstat(file->get(), &about) != 0 || !S_ISREG(about.st_mode)) {
    throw std::runtime_error(path + ": the audit's lines need a regular file");
  }
  return [file](const std::string& line) {
    writeAll(file->get(), util::utcText(std::chrono::system_clock::now()) + " " + line + "\n");
  };
}

AuditLog::Writer auditInLog() {
  return [](const std::string& line) { http::logLine(http::Level::Change, line, "audit", __FILE__, __LINE__); };
}

}  // namespace zorva::server
