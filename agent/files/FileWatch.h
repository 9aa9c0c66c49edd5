#pragma once

// Detects that one of a few files may have changed.

#include <sys/stat.h>

#include <string>
#include <vector>

#include "util/FileDescriptor.h"

namespace zorva::agent {

/// At first it compares the kernel's data of each file. After many checks it switches to inotify, with which a check
/// costs a third. (Inotify from the start would be expensive for a short-lived program: when a process with watches
/// ends, the kernel makes it wait for some twenty milliseconds.)
///
/// With inotify, each file itself is watched and every directory on the way to it, along symbolic links. So it notices
/// a file that is added, removed, or replaced by a rename anywhere on the way. If something cannot be watched, every
/// check returns true: the caller then reads more often than necessary, but never too seldom.
///
/// Belongs to one thread at a time, and to one process: a forked one assigns a new watch.
class FileWatch {
 public:
  static constexpr int kComparisons = 1000;

  /// comparisons is the number of checks before it switches to inotify.
  explicit FileWatch(int comparisons = kComparisons) : comparisonsLeft_(comparisons) {}

  /// Watches only these files from now on, and drops earlier events. Data that is read after this returns is either
  /// current or will be noticed as changed.
  void watch(const std::vector<std::string>& paths);

  /// Whether a watched file may have changed since watch was called. Never blocks. If so, the caller calls watch again,
  /// reads again, and then checks again.
  bool changed();

  /// A descriptor that is readable when changed() may be true. -1 if nothing reports that: while it compares, and if
  /// something cannot be watched.
  int descriptor() const { return comparisonsLeft_ > 0 || blind_ ? -1 : inotify_.get(); }

 private:
  /// The data that identify a state of a file. A file's ctime cannot be set.
  struct State {
    std::string path;
    int error = 0;
    struct stat status {};
    bool mayHideChanges = false;  ///< changed so recently that a later change could have the same time
  };

  /// A name in a watched directory, or a watched file itself, which has no name.
  struct Place {
    int descriptor;
    std::string name;
  };

  static State stateOf(const std::string& path);
  bool differs(const State& before) const;
  void startInotify(const std::vector<std::string>& paths);
  bool readReports();
  void watchWay(const std::string& path);
  bool add(const std::string& path, unsigned int mask, const std::string& name);
  void removeAllBut(const std::vector<Place>& kept, const std::vector<Place>& old);
  bool concerns(int descriptor, const char* name) const;

  int comparisonsLeft_;
  bool watching_ = false;      ///< watch has been called
  std::vector<State> states_;  ///< while it compares

  util::FileDescriptor inotify_;  ///< kept once it is open: to close it takes long
  std::vector<Place> places_;
  bool blind_ = false;  ///< something cannot be watched
};

}  // namespace zorva::agent
