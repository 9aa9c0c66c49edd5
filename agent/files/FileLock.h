// Locks among processes, by way of files.
#pragma once

#include <string>

#include "agent/files/FileDescriptor.h"

namespace zorvagent {

// An exclusive lock among processes, and among threads, by way of a file of its own that is never removed. Held until
// the object ends.
class FileLock {
 public:
  // Waits for the lock, ten seconds at most. Throws std::runtime_error, with one line, where it cannot be had.
  explicit FileLock(const std::string& path);
  ~FileLock();
  FileLock(const FileLock&) = delete;
  FileLock& operator=(const FileLock&) = delete;

 private:
  FileDescriptor file_;
};

}  // namespace zorvagent
