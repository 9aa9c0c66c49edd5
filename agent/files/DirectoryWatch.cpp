#include "agent/files/DirectoryWatch.h"

#include <sys/inotify.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstddef>
#include <cstdint>
#include <cstring>

namespace zorva::agent {

bool DirectoryWatch::watch(const std::string& directory) {
  if (inotify_) return true;
  constexpr std::uint32_t kEvents = IN_CREATE | IN_DELETE | IN_MOVED_FROM | IN_MOVED_TO | IN_CLOSE_WRITE | IN_ATTRIB |
                                    IN_DELETE_SELF | IN_MOVE_SELF | IN_ONLYDIR;
  util::FileDescriptor inotify(::inotify_init1(IN_NONBLOCK | IN_CLOEXEC));
  if (!inotify || ::inotify_add_watch(inotify.get(), directory.c_str(), kEvents) < 0) return false;
  inotify_ = std::move(inotify);
  return true;
}

bool DirectoryWatch::changed() {
  alignas(inotify_event) std::array<char, 8192> buffer;
  bool changed = false;
  bool isGone = false;
  while (inotify_) {
    const ssize_t got = ::read(inotify_.get(), buffer.data(), buffer.size());
    if (got < 0 && errno == EINTR) continue;
    if (got <= 0) break;
    changed = true;
    for (std::size_t place = 0; place < static_cast<std::size_t>(got);) {
      inotify_event event;
      std::memcpy(&event, buffer.data() + place, sizeof event);
      if ((event.mask & (IN_DELETE_SELF | IN_MOVE_SELF | IN_IGNORED)) != 0) isGone = true;
      place += sizeof event + event.len;
    }
  }
  if (isGone) inotify_.reset();
  return changed;
}

}  // namespace zorva::agent
