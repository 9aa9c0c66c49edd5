#include "util/ReadFile.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <system_error>

#include "util/FileDescriptor.h"

namespace zorva::util {
namespace {

constexpr std::size_t kFirstRoom = 4096;

FileText failure(int error) {
  FileText result;
  result.error = error;
  return result;
}

}  // namespace

FileText readFile(const std::string& path, std::size_t limit) {
  FileText result;
  // With a NUL in it, the path would be cut there and name another file.
  if (path.find('\0') != std::string::npos) return failure(ENOENT);
  const FileDescriptor file(::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK | O_NOCTTY));
  struct stat status {};
  if (!file || ::fstat(file.get(), &status) != 0) return failure(errno);
  if (!S_ISREG(status.st_mode)) return failure(EINVAL);
  result.owner = status.st_uid;
  result.mode = status.st_mode & 07777U;

  // The size from fstat is only a guess: for the files of /proc and /sys it is 0.
  const auto told = static_cast<std::size_t>(std::max<off_t>(status.st_size, 0));
  std::size_t used = 0;
  std::size_t room = std::min(limit, std::max(told, kFirstRoom)) + 1;
  for (;;) {
    result.text.resize(room);
    const ssize_t got = ::read(file.get(), result.text.data() + used, room - used);
    if (got < 0 && errno == EINTR) continue;
    if (got < 0) return failure(errno);
    used += static_cast<std::size_t>(got);
    if (got == 0 || used > limit) break;
    if (used == room) room = std::min(limit + 1, room * 2);
  }
  result.truncated = used > limit;
  result.text.resize(std::min(used, limit));
  return result;
}

bool mayPass(int error) {
  return error == EMFILE || error == ENFILE || error == ENOMEM || error == EIO || error == ESTALE;
}

std::string fileErrorText(int error) {
  if (error == EINVAL) return "not a regular file";
  return std::generic_category().message(error);
}

}  // namespace zorva::util
