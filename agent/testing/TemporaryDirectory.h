#pragma once

// A temporary directory for one test.

#include <sys/types.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdio>
#include <exception>
#include <string>

#include "util/NotCopied.h"

namespace zorva::agent::testing {

/// Made in the system's temporary directory, and removed with its contents by the destructor.
class TemporaryDirectory : util::NotCopied {
 public:
  TemporaryDirectory();
  /// In a directory of the caller's choice, if that exists.
  explicit TemporaryDirectory(const std::string& where);
  ~TemporaryDirectory();

  /// Ends in a slash.
  const std::string& path() const { return path_; }

  /// The path of that name in it.
  std::string operator/(const std::string& name) const { return path_ + name; }

  /// Writes a file, and the directories on the way to it; returns its path.
  std::string write(const std::string& name, const std::string& text) const;

  /// Makes a symbolic link, and the directories on the way to it.
  void link(const std::string& target, const std::string& name) const;

 private:
  std::string path_;
};

/// The content of the file, or empty text.
std::string contentsOf(const std::string& path);

/// Starts the work in a child process. The work returns whether it succeeded; an exception counts as failure. Do not
/// call this while the process has other threads: the sanitizers' allocator may stay locked for ever in a child that
/// was forked beside one.
template <typename Work>
pid_t startChild(Work work);

/// Waits for the child's end and returns whether it succeeded. False if it was ended by a signal.
inline bool succeeded(pid_t child);

/// Starts the work and waits for it.
template <typename Work>
bool succeedsInChild(Work work) {
  return succeeded(startChild(work));
}

}  // namespace zorva::agent::testing

template <typename Work>
pid_t zorva::agent::testing::startChild(Work work) {
  const pid_t child = ::fork();
  if (child == 0) {
    bool good = false;
    try {
      good = work();
    } catch (const std::exception& error) {
      std::fprintf(stderr, "in the child: %s\n", error.what());
    }
    std::fflush(nullptr);
    ::_exit(good ? 0 : 1);
  }
  return child;
}

bool zorva::agent::testing::succeeded(pid_t child) {
  int status = 0;
  return child > 0 && ::waitpid(child, &status, 0) == child && WIFEXITED(status) && WEXITSTATUS(status) == 0;
}
