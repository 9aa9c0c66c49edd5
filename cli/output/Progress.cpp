#include "cli/output/Progress.h"

#include <sys/ioctl.h>
#include <unistd.h>

#include <utility>

#include "cli/output/Capture.h"

namespace zorva::cli {

namespace {

constexpr std::chrono::milliseconds kPatience{500};
constexpr std::chrono::milliseconds kBetween{100};
constexpr std::size_t kUsualWidth = 80;

std::mutex currentMutex;
Progress* current = nullptr;
bool isNever = false;

void writeToTerminal(const std::string& text) { (void)!::write(STDERR_FILENO, text.data(), text.size()); }

std::size_t widthOfTerminal() {
  winsize size{};
  return ::ioctl(STDERR_FILENO, TIOCGWINSZ, &size) == 0 && size.ws_col > 0 ? size.ws_col : kUsualWidth;
}

}  // namespace

void Progress::neverShow() { isNever = true; }

Progress::Progress() {
  if (isNever || Capture::current() != nullptr || ::isatty(STDERR_FILENO) == 0) return;
  {
    const std::lock_guard lock(currentMutex);
    current = this;
  }
  thread_ = std::thread([this] { run(); });
}

Progress::~Progress() {
  if (!thread_.joinable()) return;
  {
    const std::lock_guard lock(currentMutex);
    current = nullptr;
  }
  {
    const std::lock_guard lock(mutex_);
    isOver_ = true;
  }
  ends_.notify_one();
  thread_.join();
}

void Progress::step(std::string what) {
  const std::lock_guard lock(mutex_);
  what_ = std::move(what);
}

void Progress::makeRoom() {
  const std::lock_guard lock(currentMutex);
  if (current == nullptr) return;
  const std::lock_guard lineLock(current->mutex_);
  current->clear();
  current->what_.clear();
}

void Progress::run() {
  std::unique_lock lock(mutex_);
  const auto isOver = [this] { return isOver_; };
  for (auto wait = kPatience; !ends_.wait_for(lock, wait, isOver); wait = kBetween) {
    if (what_ != shown_) show();
  }
  clear();
}

void Progress::show() {
  clear();
  if (what_.empty()) return;
  // A wrapped line could not be erased.
  writeToTerminal((what_ + " ...").substr(0, widthOfTerminal() - 1));
  shown_ = what_;
}

void Progress::clear() {
  if (!shown_.empty()) writeToTerminal("\r\033[K");
  shown_.clear();
}

}  // namespace zorva::cli
