#include "agent/files/ReplaceFile.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <string_view>
#include <system_error>

#include "agent/files/FileDescriptor.h"
#include "agent/files/FileError.h"
#include "agent/log/LogOutput.h"

namespace zorva::agent {
namespace {

constexpr mode_t kFileMode = 0644;

void writeAll(const FileDescriptor& file, std::string_view text, const std::string& path) {
  while (!text.empty()) {
    const ssize_t written = ::write(file.get(), text.data(), text.size());
    if (written < 0 && errno == EINTR) continue;
    if (written < 0) throwFileError(path, "cannot be written");
    text.remove_prefix(static_cast<std::size_t>(written));
  }
}

// A directory entry is on the disk when its directory is. The new file is in its place by now either way.
void syncDirectory(const std::string& directory) {
  const FileDescriptor folder(::open(directory.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
  if (folder && ::fsync(folder.get()) == 0) return;
  ZORVAGENT_LOG_ERROR(directory + ": cannot be synced: " + std::generic_category().message(errno));
}

// Removes the temporary file where the way is left early.
class TemporaryFile {
 public:
  explicit TemporaryFile(std::string path) : path_(std::move(path)) {}
  ~TemporaryFile() {
    if (!path_.empty()) ::unlink(path_.c_str());
  }
  TemporaryFile(const TemporaryFile&) = delete;
  TemporaryFile& operator=(const TemporaryFile&) = delete;

  const std::string& path() const { return path_; }
  void keep() { path_.clear(); }

 private:
  std::string path_;
};

// The owner first: a change of it takes rights away.
void giveRights(const FileDescriptor& file, const struct stat& like) {
  (void)!::fchown(file.get(), like.st_uid, like.st_gid);
  ::fchmod(file.get(), like.st_mode & 0777U);
}

}  // namespace

void replaceFile(const std::string& directory, const std::string& name, const std::string& text,
                 const struct stat* like) {
  const std::string target = directory + name;
  TemporaryFile temporary(target + ".new");
  {
    const FileDescriptor file(::open(temporary.path().c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC | O_NOFOLLOW,
                                     like == nullptr ? kFileMode : S_IRUSR | S_IWUSR));
    if (!file) throwFileError(temporary.path(), "cannot be opened");
    if (like != nullptr) giveRights(file, *like);
    writeAll(file, text, temporary.path());
    if (::fsync(file.get()) != 0) throwFileError(temporary.path(), "cannot be synced");
  }
  if (::rename(temporary.path().c_str(), target.c_str()) != 0) throwFileError(target, "cannot be replaced");
  temporary.keep();
  syncDirectory(directory);
}

void overwriteFile(const std::string& path, const std::string& text) {
  const FileDescriptor file(::open(path.c_str(), O_WRONLY | O_TRUNC | O_CLOEXEC | O_NONBLOCK | O_NOCTTY));
  if (!file) throwFileError(path, "cannot be opened");
  writeAll(file, text, path);
  if (::fsync(file.get()) != 0) throwFileError(path, "cannot be synced");
}

bool syncFile(const std::string& path) {
  const FileDescriptor file(::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK | O_NOCTTY));
  return file && ::fsync(file.get()) == 0;
}

}  // namespace zorva::agent
