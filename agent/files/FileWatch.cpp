#include "agent/files/FileWatch.h"

#include <limits.h>
#include <sys/inotify.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdint>
#include <cstring>
#include <ctime>
#include <tuple>
#include <utility>

namespace zorva::agent {
namespace {

// Of a directory: names that are added or removed, changed permissions, also of the directory itself, and its removal.
constexpr std::uint32_t kDirectoryEvents = IN_CREATE | IN_DELETE | IN_MOVED_FROM | IN_MOVED_TO | IN_ATTRIB |
                                           IN_DELETE_SELF | IN_MOVE_SELF | IN_ONLYDIR | IN_MASK_ADD;
// Of a file: its contents, also if they are written under another name of the file.
constexpr std::uint32_t kFileEvents =
    IN_MODIFY | IN_CLOSE_WRITE | IN_ATTRIB | IN_DELETE_SELF | IN_MOVE_SELF | IN_DONT_FOLLOW | IN_MASK_ADD;

constexpr int kMostLinks = 40;   // as many as the kernel follows
constexpr int kMostReads = 256;  // of events at one check; usually there is one at most

// The target of a symbolic link, or empty text if there is none under that path.
std::string readLink(const std::string& path) {
  std::array<char, PATH_MAX> target;
  const ssize_t length = ::readlink(path.c_str(), target.data(), target.size());
  return length > 0 ? std::string(target.data(), static_cast<std::size_t>(length)) : std::string();
}

// Removes the first name of a path, and the slashes around it.
std::string takeName(std::string& path) {
  const std::size_t begin = std::min(path.find_first_not_of('/'), path.size());
  const std::size_t end = std::min(path.find('/', begin), path.size());
  std::string name = path.substr(begin, end - begin);
  path.erase(0, std::min(path.find_first_not_of('/', end), path.size()));
  return name;
}

std::string currentDirectory() {
  std::array<char, PATH_MAX> path;
  return ::getcwd(path.data(), path.size()) == nullptr ? "/" : path.data();
}

}  // namespace

void FileWatch::watch(const std::vector<std::string>& paths) {
  watching_ = true;
  states_.clear();
  if (comparisonsLeft_ <= 0) return startInotify(paths);
  for (const std::string& path : paths) states_.push_back(stateOf(path));
}

bool FileWatch::changed() {
  if (!watching_) return true;
  if (comparisonsLeft_ <= 0) return blind_ || readReports();
  // The last comparison always returns true, so that the caller reads again once inotify is active.
  if (--comparisonsLeft_ == 0) return true;
  return std::any_of(states_.begin(), states_.end(), [this](const State& state) { return differs(state); });
}

// A change gets the kernel's coarse time, which changes only every few milliseconds. A file that was changed in the
// same tick in which it is checked could be changed again in that tick without a visible difference.
FileWatch::State FileWatch::stateOf(const std::string& path) {
  State state;
  state.path = path;
  timespec now{};
  ::clock_gettime(CLOCK_REALTIME_COARSE, &now);
  if (::stat(path.c_str(), &state.status) != 0) {
    state.error = errno;
    state.status = {};
    return state;
  }
  const timespec& changed = state.status.st_ctim;
  state.mayHideChanges = std::tie(changed.tv_sec, changed.tv_nsec) >= std::tie(now.tv_sec, now.tv_nsec);
  return state;
}

bool FileWatch::differs(const State& before) const {
  if (before.mayHideChanges) return true;
  const State now = stateOf(before.path);
  const auto identity = [](const State& state) {
    const struct stat& status = state.status;
    return std::tuple(state.error, status.st_dev, status.st_ino, status.st_size, status.st_ctim.tv_sec,
                      status.st_ctim.tv_nsec);
  };
  return identity(now) != identity(before);
}

void FileWatch::startInotify(const std::vector<std::string>& paths) {
  const std::vector<Place> old = std::exchange(places_, {});
  blind_ = false;
  if (!inotify_) inotify_ = util::FileDescriptor(::inotify_init1(IN_NONBLOCK | IN_CLOEXEC));
  if (!inotify_) {
    blind_ = true;
    return;
  }
  readReports();
  for (const std::string& path : paths) watchWay(path);
  removeAllBut(places_, old);
}

// Removes watches that are not on the way to any file.
void FileWatch::removeAllBut(const std::vector<Place>& kept, const std::vector<Place>& old) {
  for (const Place& place : old) {
    const auto isSame = [&place](const Place& other) { return other.descriptor == place.descriptor; };
    if (std::none_of(kept.begin(), kept.end(), isSame)) ::inotify_rm_watch(inotify_.get(), place.descriptor);
  }
}

bool FileWatch::readReports() {
  alignas(inotify_event) std::array<char, 8192> buffer;
  bool changed = false;
  for (int reads = 0; reads < kMostReads; ++reads) {
    const ssize_t got = ::read(inotify_.get(), buffer.data(), buffer.size());
    if (got < 0 && errno == EINTR) continue;
    if (got < 0 && errno == EAGAIN) return changed;
    if (got <= 0) return true;
    for (std::size_t place = 0; place < static_cast<std::size_t>(got);) {
      inotify_event event;
      std::memcpy(&event, buffer.data() + place, sizeof event);
      const char* name = event.len == 0 ? "" : buffer.data() + place + sizeof event;
      // IN_Q_OVERFLOW: events were lost.
      if ((event.mask & IN_Q_OVERFLOW) != 0 || concerns(event.wd, name)) changed = true;
      place += sizeof event + event.len;
    }
  }
  return true;
}

// Each directory is watched before the name in it is looked up: a change after the look-up is reported.
void FileWatch::watchWay(const std::string& path) {
  std::string directory = "/";
  std::string rest = path.starts_with('/') ? path : currentDirectory() + '/' + path;
  for (int links = 0; !rest.empty();) {
    const std::string name = takeName(rest);
    if (name.empty() || name == ".") continue;
    if (name == "..") {
      // At this point the directory has no links in it, so its parent is its path without the last name.
      if (directory.size() > 1) directory.erase(directory.rfind('/', directory.size() - 2) + 1);
      continue;
    }
    if (!add(directory, kDirectoryEvents, name)) return;
    const std::string here = directory + name;
    const std::string target = readLink(here);
    if (!target.empty()) {
      if (++links > kMostLinks) return;
      if (target.starts_with('/')) directory = "/";
      rest.insert(0, target + '/');
    } else if (rest.empty()) {
      add(here, kFileEvents, {});
    } else {
      directory = here + '/';
    }
  }
}

bool FileWatch::add(const std::string& path, unsigned int mask, const std::string& name) {
  const int descriptor = ::inotify_add_watch(inotify_.get(), path.c_str(), mask);
  if (descriptor < 0) {
    // If a file does not exist yet, the watch of its directory reports it.
    if (errno != ENOENT && errno != ENOTDIR && errno != ELOOP) blind_ = true;
    return false;
  }
  places_.push_back({descriptor, name});
  return true;
}

// An event without a name is about the watched object itself, or says that it was removed.
bool FileWatch::concerns(int descriptor, const char* name) const {
  return std::any_of(places_.begin(), places_.end(), [&](const Place& place) {
    return place.descriptor == descriptor && (*name == '\0' || place.name == name);
  });
}

}  // namespace zorva::agent
