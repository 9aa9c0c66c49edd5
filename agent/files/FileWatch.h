// Tells when one of a few files may have changed, by inotify.
#pragma once

#include <string>
#include <vector>

#include "agent/files/FileDescriptor.h"

namespace zorvagent {

// Watches each file itself and every directory that the way to it leads through, along symbolic links, so that a file
// that comes, goes, or is replaced by a rename anywhere on the way is noticed. Where something cannot be watched, every
// question is answered with yes: the caller then reads more often than it need, and never too seldom. Belongs to one
// thread at a time.
class FileWatch {
 public:
  // Watches these files and no others from now on, and forgets what was reported before. What is read after this
  // returns is either as it stays or will be reported as changed.
  void watch(const std::vector<std::string>& paths);

  // Whether something happened to a watched file since watch or the last question. Never blocks.
  bool changed();

 private:
  // A name in a watched directory, or a watched file itself, which has no name.
  struct Place {
    int descriptor;
    std::string name;
  };

  void watchWay(const std::string& path);
  bool add(const std::string& path, unsigned int mask, const std::string& name);
  bool concerns(int descriptor, const char* name) const;

  FileDescriptor inotify_;
  std::vector<Place> places_;
  bool blind_ = true;  // something could not be watched, or nothing has been yet
};

}  // namespace zorvagent
