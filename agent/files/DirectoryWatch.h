#pragma once

// Detects that the entries of one directory, or the files in it, may have changed.

#include <string>

#include "agent/interface/AgentApi.h"
#include "util/FileDescriptor.h"

namespace zorva::agent {

/// With inotify, for a thread that sleeps until something happens. Belongs to one thread at a time and to one process.
class ZORVA_AGENT_API DirectoryWatch {
 public:
  /// Watches this directory from now on, unless it does already. False if it cannot be watched, for example because it
  /// does not exist.
  bool watch(const std::string& directory);

  /// Whether there was a report since the last call. Never blocks. After the directory itself was removed, the next
  /// watch() watches its successor.
  bool changed();

  /// Readable when changed() may be true; -1 if nothing is watched.
  int descriptor() const { return inotify_.get(); }

 private:
  util::FileDescriptor inotify_;
};

}  // namespace zorva::agent
