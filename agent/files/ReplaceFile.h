// Changes a file so that nobody ever sees half of it.
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

// Puts a file with that text in the place of directory + name, by way of a synced temporary file beside it. One writer
// at a time: the caller holds a lock. Throws std::runtime_error, with one line; the old file then stays as it was.
void replaceFile(const std::string& directory, const std::string& name, const std::string& text);

}  // namespace zorvagent
