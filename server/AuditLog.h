#pragma once

// Writes the audit's lines: into a file of their own, or into the server's log.

#include <condition_variable>
#include <cstddef>
#include <deque>
#include <functional>
#include <memory>
#include <string>
#include <thread>

#include "access/Audit.h"
#include "util/FileDescriptor.h"
#include "util/NotCopied.h"

namespace zorva::server {

class AuditLog : util::NotCopied {
 public:
  /// Writes one line, which has no line end. May wait. Throws on a failure.
  using Writer = std::function<void(const std::string& line)>;

  /// How many lines wait for the writer at most.
  static constexpr std::size_t kMostWaiting = 4096;

  /// How many refusals are written in a second at most.
  static constexpr int kMostRefusals = 50;

  /// Starts a thread that writes.
  explicit AuditLog(Writer writer);

  /// Writes what waits, and ends the thread. What is not written within two seconds is lost.
  ~AuditLog();

  /// Takes a record and never waits for the disk. If too many lines wait, or too many refusals come, it is left out,
  /// and a line says how many were left out there. Thread-safe.
  void take(const access::AuditRecord& record) noexcept;

  /// From now on lines go there. Thread-safe.
  void setWriter(Writer writer);

 private:
  struct State;
  static void run(const std::shared_ptr<State>& state);

  std::shared_ptr<State> state_;
  std::thread thread_;
};

/// Appends to a file, each line with its time (RFC 3339, UTC) before it. The file is made with mode 0640 if there is
/// none. Throws std::runtime_error, with the reason, if it cannot be opened; a symbolic link and what is no regular
/// file are refused.
AuditLog::Writer auditFile(const std::string& path);

/// Writes to the server's log, whose lines have a time already.
AuditLog::Writer auditInLog();

}  // namespace zorva::server
