#include "agent/files/FileLock.h"

#include <fcntl.h>
#include <sys/file.h>

#include <cerrno>
#include <stdexcept>
#include <thread>
#include <utility>

#include "util/FileError.h"
#include "util/ReplaceFile.h"

namespace zorva::agent {
namespace {

constexpr mode_t kLockMode = 0600;
constexpr std::chrono::seconds kLongestWait{10};
constexpr std::chrono::microseconds kPause{500};

util::FileDescriptor opened(const std::string& path) {
  util::FileDescriptor file = openLockFile(path, kLockMode);
  if (!file) util::throwFileError(path, "cannot be opened");
  return file;
}

}  // namespace

util::FileDescriptor openLockFile(const std::string& path, mode_t rights) {
  util::FileDescriptor file(::open(path.c_str(), O_RDWR | O_CREAT | O_CLOEXEC | O_NOFOLLOW | O_NONBLOCK, rights));
  if (file) util::giveToOwnerOfDirectory(file, path);
  return file;
}

FileLock::Deadline FileLock::usualDeadline() { return std::chrono::steady_clock::now() + kLongestWait; }

FileLock::FileLock(const std::string& path) : FileLock(opened(path), path, Mode::Exclusive, usualDeadline()) {}

FileLock::FileLock(util::FileDescriptor file, const std::string& path, Mode mode, Deadline deadline)
    : file_(std::move(file)) {
  const int operation = (mode == Mode::Exclusive ? LOCK_EX : LOCK_SH) | LOCK_NB;
  while (::flock(file_.get(), operation) != 0) {
    if (errno != EWOULDBLOCK && errno != EINTR) util::throwFileError(path, "cannot be locked");
    if (std::chrono::steady_clock::now() > deadline) {
      throw std::runtime_error(path + ": another process has held the lock for too long");
    }
    std::this_thread::sleep_for(kPause);
  }
}

// A process that was forked in the meantime has the descriptor too; closing only ours would leave the lock held.
FileLock::~FileLock() { ::flock(file_.get(), LOCK_UN); }

}  // namespace zorva::agent
