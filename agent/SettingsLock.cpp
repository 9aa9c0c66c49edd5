#include "agent/SettingsLock.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <optional>
#include <stdexcept>
#include <utility>

#include "agent/files/FileLock.h"
#include "agent/files/Rewrite.h"
#include "agent/files/SettingFiles.h"
#include "agent/log/LogOutput.h"
#include "util/FileError.h"
#include "util/ReadFile.h"
#include "util/ReplaceFile.h"

namespace zorva::agent {
namespace {

constexpr const char* kLockName = "settings.lock";
constexpr const char* kTurnName = "settings.turn";
constexpr const char* kKeptName = "settings.before";
constexpr std::size_t kLargestFile = std::size_t{16} << 20U;
constexpr std::size_t kLongestName = 255;

// Only users who may put files into the directory may lock it: any other user could hold the lock for ever.
mode_t lockRights(const std::string& directory) {
  struct stat status {};
  if (::stat(directory.c_str(), &status) != 0) return 0600;
  const mode_t writers = status.st_mode & 0022;
  return 0600 | writers | writers << 1U;
}

util::FileDescriptor openForChange(const std::string& directory, const char* name) {
  const mode_t rights = lockRights(directory);
  util::FileDescriptor file = openLockFile(directory + name, rights);
  if (!file && errno == ENOENT) throw std::runtime_error(directory + ": there is no such data directory");
  if (!file) util::throwFileError(directory + name, "cannot be opened");
  struct stat status {};
  // Restores the rights that the process's umask removes from new files.
  if (::fstat(file.get(), &status) == 0 && (status.st_mode & 0666) != rights && status.st_uid == ::geteuid()) {
    ::fchmod(file.get(), rights);
  }
  return file;
}

// None if that file cannot be opened or made. Not for writing where it exists: closing such a file counts as a change
// of the directory for those who watch it.
util::FileDescriptor openForRead(const std::string& directory, const char* name) {
  util::FileDescriptor file(::open((directory + name).c_str(), O_RDONLY | O_CLOEXEC | O_NOFOLLOW | O_NONBLOCK));
  if (file || errno != ENOENT) return file;
  return openLockFile(directory + name, lockRights(directory));
}

std::string interfaceFile(const std::string& directory, const std::string& interface) {
  return directory + settingFileName(interface);
}

bool canBeAName(const std::string& interface) {
  return !interface.empty() && interface.size() <= kLongestName &&
         interface.find_first_of(std::string("/\0\n", 3)) == std::string::npos;
}

// Takes the turn, then the lock.
FileLock takeInTurn(util::FileDescriptor turn, util::FileDescriptor lock, const std::string& directory,
                    FileLock::Mode mode, FileLock::Deadline deadline) {
  std::optional<FileLock> myTurn;
  if (turn) myTurn.emplace(std::move(turn), directory + kTurnName, mode, deadline);
  return {std::move(lock), directory + kLockName, mode, deadline};
}

}  // namespace

class SettingsLock::Core {
 public:
  // Waits for the exclusive lock, and undoes another process's unfinished change.
  explicit Core(const std::string& directory, FileLock::Deadline deadline)
      : directory_(directory),
        lock_(takeInTurn(openForChange(directory, kTurnName), openForChange(directory, kLockName), directory,
                         FileLock::Mode::Exclusive, deadline)) {
    putBackWhatIsLeft();
  }

  // Waits for the shared lock.
  Core(const std::string& directory, util::FileDescriptor turn, util::FileDescriptor file, FileLock::Deadline deadline)
      : directory_(directory),
        lock_(takeInTurn(std::move(turn), std::move(file), directory, FileLock::Mode::Shared, deadline)) {}

  // Whether a process ended while it was changing the file of an interface.
  bool isSomethingLeft() const {
    struct stat status {};
    return ::fstat(lock_.descriptor(), &status) == 0 && status.st_size > 0;
  }

  void keepAside(const std::string& interface);
  std::string finish();

 private:
  void putBackWhatIsLeft();
  void putBack(const std::string& path, const std::string& text) const;
  std::string nameInLock() const;
  void writeNameIntoLock(const std::string& name) const;
  void forget();

  std::string directory_;
  FileLock lock_;
  std::string interface_;  // whose file is saved; empty: none
  std::string before_;     // the text of the saved file
};

std::string SettingsLock::Core::nameInLock() const {
  std::string name(kLongestName, '\0');
  const ssize_t got = ::pread(lock_.descriptor(), name.data(), name.size(), 0);
  name.resize(got > 0 ? static_cast<std::size_t>(got) : 0);
  return name;
}

void SettingsLock::Core::writeNameIntoLock(const std::string& name) const {
  const std::string path = directory_ + kLockName;
  const auto size = static_cast<ssize_t>(name.size());
  if (::pwrite(lock_.descriptor(), name.data(), name.size(), 0) != size || ::fdatasync(lock_.descriptor()) != 0) {
    const int error = errno;
    (void)!::ftruncate(lock_.descriptor(), 0);
    errno = error;
    util::throwFileError(path, "cannot be written");
  }
}

void SettingsLock::Core::forget() {
  (void)!::ftruncate(lock_.descriptor(), 0);
  ::unlink((directory_ + kKeptName).c_str());
  interface_.clear();
  before_.clear();
}

void SettingsLock::Core::keepAside(const std::string& interface) {
  putBackWhatIsLeft();
  if (!canBeAName(interface)) return;  // no file can have such a name
  const std::string path = interfaceFile(directory_, interface);
  util::FileText file = util::readFile(path, kLargestFile);
  if (file.truncated) throw std::runtime_error(path + ": is larger than 16 MiB, and is left as it is");
  if (util::mayPass(file.error))
    throw std::runtime_error(path + ": cannot be read: " + util::fileErrorText(file.error));
  if (file.error != 0) return;  // a file that cannot be read cannot be rewritten
  struct stat rights {};
  if (::stat(path.c_str(), &rights) != 0) util::throwFileError(path, "cannot be looked at");
  const std::string unsynced = util::replaceFile(directory_, kKeptName, file.text, &rights);
  if (!unsynced.empty()) ZORVAGENT_LOG_ERROR(unsynced);
  writeNameIntoLock(interface);
  interface_ = interface;
  before_ = std::move(file.text);
}

// In place, so that the file keeps its owner and its links. If a full disk prevents that, the saved file replaces it.
void SettingsLock::Core::putBack(const std::string& path, const std::string& text) const {
  try {
    util::overwriteFile(path, text);
  } catch (const std::exception&) {
    struct stat status {};
    const bool isLink = ::lstat(path.c_str(), &status) == 0 && S_ISLNK(status.st_mode);
    if (isLink || ::rename((directory_ + kKeptName).c_str(), path.c_str()) != 0) throw;
  }
}

std::string SettingsLock::Core::finish() {
  if (interface_.empty()) return {};
  const std::string path = interfaceFile(directory_, interface_);
  const util::FileText now = util::readFile(path, kLargestFile);
  const bool isCut = now.error == 0 && !now.truncated &&
                     (compareRewrite(before_, now.text) == Rewrite::CutShort || !util::syncFile(path));
  if (!isCut) {
    forget();
    return {};
  }
  try {
    putBack(path, before_);
    forget();
    return path + ": could not be written whole, and is as it was before; is the disk full?";
  } catch (const std::exception& error) {
    interface_.clear();
    return path + ": could not be written whole, nor put back; " + directory_ + kKeptName + " has what was in it (" +
           error.what() + ")";
  }
}

void SettingsLock::Core::putBackWhatIsLeft() {
  if (!isSomethingLeft()) return;
  const std::string interface = nameInLock();
  const std::string path = interfaceFile(directory_, interface);
  const util::FileText before = util::readFile(directory_ + kKeptName, kLargestFile);
  const util::FileText now = util::readFile(path, kLargestFile);
  const bool isCut = canBeAName(interface) && before.error == 0 && now.error == 0 && !now.truncated &&
                     compareRewrite(before.text, now.text) == Rewrite::CutShort;
  if (util::mayPass(before.error) || util::mayPass(now.error)) {
    throw std::runtime_error(path + ": a change of it broke off, and whether it is whole cannot be seen now");
  }
  if (isCut) {
    putBack(path, before.text);
    ZORVAGENT_LOG_ERROR(path + ": a change broke off in the middle; the file is as it was before");
  }
  forget();
}

SettingsLock::SettingsLock(const std::string& directory, Access access) {
  const FileLock::Deadline deadline = FileLock::usualDeadline();
  if (access == Access::Change) {
    core_ = std::make_unique<Core>(directory, deadline);
    return;
  }
  for (int attempt = 0;; ++attempt) {
    util::FileDescriptor lock = openForRead(directory, kLockName);
    if (!lock) return;
    core_ = std::make_unique<Core>(directory, openForRead(directory, kTurnName), std::move(lock), deadline);
    if (attempt == 1 || !core_->isSomethingLeft()) return;
    core_.reset();
    try {
      const Core exclusive(directory, deadline);
    } catch (const std::exception& error) {
      // If this process may not write, another one will do it.
      ZORVAGENT_LOG_ERROR(error.what());
    }
  }
}

SettingsLock::~SettingsLock() {
  if (core_ == nullptr) return;
  const std::string problem = core_->finish();
  if (!problem.empty()) ZORVAGENT_LOG_ERROR(problem);
}

void SettingsLock::keepAside(const std::string& interface) { core_->keepAside(interface); }

std::string SettingsLock::finish() { return core_ == nullptr ? std::string() : core_->finish(); }

}  // namespace zorva::agent
