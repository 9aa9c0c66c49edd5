#include "util/ReplaceFile.h"

#include <fcntl.h>
#include <sys/xattr.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <system_error>
#include <utility>

#include "util/FileError.h"
#include "util/NotCopied.h"

namespace zorva::util {
namespace {

void writeAndSync(const FileDescriptor& file, std::string_view text, const std::string& path) {
  if (!writeAll(file, text)) throwFileError(path, "cannot be written");
  if (::fsync(file.get()) != 0) throwFileError(path, "cannot be synced");
}

// Removes the temporary file if the function is left early.
class TemporaryFile : util::NotCopied {
 public:
  explicit TemporaryFile(std::string path) : path_(std::move(path)) {}
  ~TemporaryFile() {
    if (!path_.empty()) ::unlink(path_.c_str());
  }

  const std::string& path() const { return path_; }
  void keep() { path_.clear(); }

 private:
  std::string path_;
};

// The owner first: changing it removes rights.
void giveRights(const FileDescriptor& file, const struct stat& like) {
  (void)!::fchown(file.get(), like.st_uid, like.st_gid);
  ::fchmod(file.get(), like.st_mode & 0777U);
}

// With a new file's own SELinux label, programs might not read it in this place.
void giveLabel(const FileDescriptor& file, const std::string& like) {
  constexpr const char* kLabel = "security.selinux";
  std::array<char, 4096> label{};
  const ssize_t length = ::getxattr(like.c_str(), kLabel, label.data(), label.size());
  if (length > 0) (void)!::fsetxattr(file.get(), kLabel, label.data(), static_cast<std::size_t>(length), 0);
}

}  // namespace

std::string replaceFile(const std::string& directory, const std::string& name, const std::string& text,
                        const struct stat* like) {
  const std::string target = directory + name;
  TemporaryFile temporary(target + ".new");
  {
    const FileDescriptor file(::open(temporary.path().c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC | O_NOFOLLOW,
                                     like == nullptr ? rightsIn(directory) : S_IRUSR | S_IWUSR));
    if (!file) throwFileError(temporary.path(), "cannot be opened");
    if (like != nullptr) {
      giveRights(file, *like);
      giveLabel(file, target);
    } else {
      giveToOwnerOfDirectory(file, temporary.path());
    }
    writeAndSync(file, text, temporary.path());
  }
  if (::rename(temporary.path().c_str(), target.c_str()) != 0) throwFileError(target, "cannot be replaced");
  temporary.keep();
  if (syncDirectory(directory)) return {};
  return directory + ": cannot be synced: " + std::generic_category().message(errno);
}

void overwriteFile(const std::string& path, const std::string& text) {
  const FileDescriptor file(::open(path.c_str(), O_WRONLY | O_TRUNC | O_CLOEXEC | O_NONBLOCK | O_NOCTTY));
  if (!file) throwFileError(path, "cannot be opened");
  writeAndSync(file, text, path);
}

mode_t rightsIn(const std::string& directory) {
  struct stat status {};
  if (::stat(directory.c_str(), &status) != 0) return S_IRUSR | S_IWUSR;
  mode_t rights = S_IRUSR | S_IWUSR;
  if ((status.st_mode & S_IXGRP) != 0) rights |= S_IRGRP;
  if ((status.st_mode & S_IXOTH) != 0) rights |= S_IROTH;
  return rights;
}

void giveToOwnerOfDirectory(const FileDescriptor& file, const std::string& path) {
  if (::geteuid() != 0) return;
  const std::size_t slash = path.rfind('/');
  const std::string directory = slash == std::string::npos ? "." : path.substr(0, slash + 1);
  struct stat owner {};
  struct stat own {};
  if (::stat(directory.c_str(), &owner) != 0 || ::fstat(file.get(), &own) != 0) return;
  if (own.st_uid == owner.st_uid && own.st_gid == owner.st_gid) return;
  (void)!::fchown(file.get(), owner.st_uid, owner.st_gid);
}

bool writeAll(const FileDescriptor& file, std::string_view text) {
  while (!text.empty()) {
    const ssize_t written = ::write(file.get(), text.data(), text.size());
    if (written < 0 && errno == EINTR) continue;
    if (written < 0) return false;
    text.remove_prefix(static_cast<std::size_t>(written));
  }
  return true;
}

bool syncDirectory(const std::string& directory) {
  const FileDescriptor folder(::open(directory.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
  return folder && ::fsync(folder.get()) == 0;
}

bool syncFile(const std::string& path) {
  const FileDescriptor file(::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK | O_NOCTTY));
  return file && ::fsync(file.get()) == 0;
}

}  // namespace zorva::util
