#include "agent/files/FileLock.h"

#include <fcntl.h>
#include <sys/file.h>

#include <cerrno>
#include <chrono>
#include <stdexcept>
#include <thread>

#include "agent/files/FileError.h"

namespace zorvagent {
namespace {

constexpr mode_t kLockMode = 0600;
constexpr std::chrono::seconds kLongestWait{10};
constexpr std::chrono::microseconds kPause{500};

}  // namespace

FileLock::FileLock(const std::string& path)
    : file_(::open(path.c_str(), O_RDWR | O_CREAT | O_CLOEXEC | O_NOFOLLOW, kLockMode)) {
  if (!file_) throwFileError(path, "cannot be opened");
  const auto deadline = std::chrono::steady_clock::now() + kLongestWait;
  while (::flock(file_.get(), LOCK_EX | LOCK_NB) != 0) {
    if (errno != EWOULDBLOCK && errno != EINTR) throwFileError(path, "cannot be locked");
    if (std::chrono::steady_clock::now() > deadline) {
      throw std::runtime_error(path + ": another process has held the lock for ten seconds");
    }
    std::this_thread::sleep_for(kPause);
  }
}

// A process that was forked meanwhile has the descriptor too, and closing ours alone would leave the lock held.
FileLock::~FileLock() { ::flock(file_.get(), LOCK_UN); }

}  // namespace zorvagent
