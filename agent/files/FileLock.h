#pragma once

// Locks between processes, with files.

#include <sys/types.h>

#include <chrono>
#include <string>

#include "agent/interface/AgentApi.h"
#include "util/FileDescriptor.h"
#include "util/NotCopied.h"

namespace zorva::agent {

/// A lock between processes, and between threads, on its own file, which is never removed. Each object has its own open
/// file. Held until the object is destroyed.
class ZORVA_AGENT_API FileLock : util::NotCopied {
 public:
  enum class Mode { Shared, Exclusive };
  using Deadline = std::chrono::steady_clock::time_point;

  /// Ten seconds from now: no owner of a lock needs longer.
  static Deadline usualDeadline();

  /// Opens the file, or makes it, and waits for the exclusive lock until the usual deadline. Throws std::runtime_error,
  /// with one line, if the lock cannot be taken.
  explicit FileLock(const std::string& path);

  /// Locks an open file. An exclusive lock may need a file that is open for writing.
  FileLock(util::FileDescriptor file, const std::string& path, Mode mode, Deadline deadline);

  ~FileLock();

  int descriptor() const { return file_.get(); }

 private:
  util::FileDescriptor file_;
};

/// Opens a lock's file for reading and writing, or makes it with these rights; it belongs to the owner of the
/// directory. If that fails, errno has the reason.
util::FileDescriptor openLockFile(const std::string& path, mode_t rights);

}  // namespace zorva::agent
