#include "agent/files/FileWatch.h"

#include <limits.h>
#include <sys/inotify.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdint>
#include <cstring>
#include <string_view>

namespace zorvagent {
namespace {

// In a directory: names that come and go, and permissions that change, also its own end.
constexpr std::uint32_t kDirectoryEvents = IN_CREATE | IN_DELETE | IN_MOVED_FROM | IN_MOVED_TO | IN_ATTRIB |
                                           IN_DELETE_SELF | IN_MOVE_SELF | IN_ONLYDIR | IN_MASK_ADD;
// Of a file: its contents, also when they are written by way of another name of it.
constexpr std::uint32_t kFileEvents =
    IN_MODIFY | IN_CLOSE_WRITE | IN_ATTRIB | IN_DELETE_SELF | IN_MOVE_SELF | IN_DONT_FOLLOW | IN_MASK_ADD;

constexpr int kMostLinks = 40;   // as many as the kernel follows
constexpr int kMostReads = 256;  // of reports at one question; there are seldom more than one

// The target of a symbolic link, or empty text where there is none under that path.
std::string readLink(const std::string& path) {
  std::array<char, PATH_MAX> target;
  const ssize_t length = ::readlink(path.c_str(), target.data(), target.size());
  return length > 0 ? std::string(target.data(), static_cast<std::size_t>(length)) : std::string();
}

// Takes the first name off a path, and the slashes about it.
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
  places_.clear();
  blind_ = false;
  inotify_ = FileDescriptor(::inotify_init1(IN_NONBLOCK | IN_CLOEXEC));
  if (!inotify_) blind_ = true;
  for (const std::string& path : paths) {
    if (!blind_) watchWay(path);
  }
}

bool FileWatch::changed() {
  if (blind_) return true;
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
      // IN_Q_OVERFLOW: reports were lost. IN_IGNORED: what was watched is gone.
      if ((event.mask & (IN_Q_OVERFLOW | IN_IGNORED | IN_UNMOUNT)) != 0 || concerns(event.wd, name)) changed = true;
      place += sizeof event + event.len;
    }
  }
  return true;
}

// Each directory is watched before the name in it is looked up: what changes after the look is reported.
void FileWatch::watchWay(const std::string& path) {
  std::string directory = "/";
  std::string rest = path.starts_with('/') ? path : currentDirectory() + '/' + path;
  for (int links = 0; !rest.empty();) {
    const std::string name = takeName(rest);
    if (name.empty() || name == ".") continue;
    if (name == "..") {
      // The directory is free of links by now, so its parent is its path without the last name.
      if (directory.size() > 1) directory.erase(directory.rfind('/', directory.size() - 2) + 1);
      continue;
    }
    if (!add(directory, kDirectoryEvents, name)) return;
    const std::string here = directory + name;
    const std::string target = readLink(here);
    if (!target.empty()) {
      if (++links > kMostLinks) return;
      if (target.starts_with('/')) directory = "/";
      rest = target + '/' + rest;
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
    // What is not there yet is noticed by the directory before it.
    if (errno != ENOENT && errno != ENOTDIR && errno != ELOOP) blind_ = true;
    return false;
  }
  places_.push_back({descriptor, name});
  return true;
}

bool FileWatch::concerns(int descriptor, const char* name) const {
  // A report without a name is of the watched thing itself.
  return *name == '\0' || std::any_of(places_.begin(), places_.end(), [&](const Place& place) {
    return place.descriptor == descriptor && place.name == name;
  });
}

}  // namespace zorvagent
