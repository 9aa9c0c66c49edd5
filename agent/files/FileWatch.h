// Tells when one of a few files may have changed.
#pragma once

#include <sys/stat.h>

#include <string>
#include <vector>

#include "util/FileDescriptor.h"

namespace zorva::agent {

// At first it compares what the kernel says of each file; after many questions it goes over to inotify, with which a
// question costs a third. (To begin with inotify would cost a short-lived program dear: when a process with watches
// ends, the kernel keeps it waiting for some twenty milliseconds.)
//
// By inotify each file itself is watched and every directory that the way to it leads through, along symbolic links, so
// that a file that comes, goes, or is replaced by a rename anywhere on the way is noticed. Where something cannot be
// watched, every question is answered with yes: the caller then reads more often than it need, and never too seldom.
//
// Belongs to one thread at a time, and to one process: a forked one assigns a new watch.
class FileWatch {
 public:
  static constexpr int kComparisons = 1000;

  // comparisons is the number of questions before it goes over to inotify.
  explicit FileWatch(int comparisons = kComparisons) : comparisonsLeft_(comparisons) {}

  // Watches these files and no others from now on, and forgets what was noticed before. What is read after this returns
  // is either as it stays or will be noticed as changed.
  void watch(const std::vector<std::string>& paths);

  // Whether something may have happened to a watched file since watch was called. Never blocks. After a yes the caller
  // calls watch again, reads again, and then asks again.
  bool changed();

 private:
  // What tells one state of a file from another. Nobody can set a file's ctime.
  struct State {
    std::string path;
    int error = 0;
    struct stat status {};
    bool mayHideChanges = false;  // changed so lately that a change yet to come could bear the same time
  };

  // A name in a watched directory, or a watched file itself, which has no name.
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
  bool watching_ = false;      // watch has been called
  std::vector<State> states_;  // while it compares

  util::FileDescriptor inotify_;  // kept once it is open: to close it takes long
  std::vector<Place> places_;
  bool blind_ = false;  // something cannot be watched
};

}  // namespace zorva::agent
