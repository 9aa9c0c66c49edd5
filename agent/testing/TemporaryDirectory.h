// A directory of its own for one test.
#pragma once

#include <sys/types.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdio>
#include <exception>
#include <string>

namespace zorva::agent::testing {

// Made under the system's temporary directory, removed with all that is in it at the end.
class TemporaryDirectory {
 public:
  TemporaryDirectory();
  // In a directory of the caller's choice, if that is there.
  explicit TemporaryDirectory(const std::string& where);
  ~TemporaryDirectory();
  TemporaryDirectory(const TemporaryDirectory&) = delete;
  TemporaryDirectory& operator=(const TemporaryDirectory&) = delete;

  // Ends in a slash.
  const std::string& path() const { return path_; }

  // The path of that name in it.
  std::string operator/(const std::string& name) const { return path_ + name; }

  // Writes a file, and the directories on the way to it; returns its path.
  std::string write(const std::string& name, const std::string& text) const;

  // Makes a symbolic link, and the directories on the way to it.
  void link(const std::string& target, const std::string& name) const;

 private:
  std::string path_;
};

// The whole file, or empty text.
std::string contentsOf(const std::string& path);

// Starts the work in a child process. The work tells by its return value whether it went well; an exception counts as
// no. Not to be called while the process has other threads: a child that was forked beside one may find the
// sanitizers' allocator locked for ever.
template <typename Work>
pid_t startChild(Work work);

// Waits for the child's end: whether it went well. False too where it was ended by a signal.
inline bool succeeded(pid_t child);

// Both.
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
