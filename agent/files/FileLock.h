// Locks among processes, by way of files.
#pragma once

#include <sys/types.h>

#include <chrono>
#include <string>

#include "util/FileDescriptor.h"

namespace zorva::agent {

// A lock among processes, and among threads, by way of a file of its own that is never removed. Each object has its own
// open file. Held until the object ends.
class FileLock {
 public:
  enum class Mode { Shared, Exclusive };
  using Deadline = std::chrono::steady_clock::time_point;

  // Ten seconds from now: nobody who holds a lock needs longer.
  static Deadline usualDeadline();

  // Opens the file, or makes it, and waits for the exclusive lock until the usual deadline. Throws std::runtime_error,
  // with one line, where it cannot be had.
  explicit FileLock(const std::string& path);

  // Locks a file that is open. An exclusive lock may need one that is open for writing.
  FileLock(util::FileDescriptor file, const std::string& path, Mode mode, Deadline deadline);

  ~FileLock();
  FileLock(const FileLock&) = delete;
  FileLock& operator=(const FileLock&) = delete;

  int descriptor() const { return file_.get(); }

 private:
  util::FileDescriptor file_;
};

// Opens a lock's file for reading and writing, or makes it with these rights. errno says why there is none.
util::FileDescriptor openLockFile(const std::string& path, mode_t rights);

}  // namespace zorva::agent
