#pragma once

#include <unistd.h>

#include <cstring>
#include <string>
#include <utility>
#include <vector>

#include "util/NotCopied.h"

namespace zorva::agent::testing {

/// The words of a command.
inline std::vector<std::string> commandOf(const std::string& program, const std::vector<std::string>& arguments) {
  std::vector<std::string> words{program};
  words.insert(words.end(), arguments.begin(), arguments.end());
  return words;
}

/// A program with its arguments and its environment, to be executed in a child process. Everything is made before
/// fork(): a child that was forked beside other threads must not allocate, because the sanitizers' allocator may stay
/// locked in it for ever.
class Program : util::NotCopied {
 public:
  using Environment = std::vector<std::pair<std::string, std::string>>;

  /// The first word is the program: a path, or a name that is looked up in PATH. With variables, its environment is
  /// what this process has now, and these; without, it is what the child has when it calls exec().
  explicit Program(std::vector<std::string> words, const Environment& environment = {}) : words_(std::move(words)) {
    for (std::string& word : words_) arguments_.push_back(word.data());
    arguments_.push_back(nullptr);
    if (environment.empty()) return;
    for (const auto& [name, value] : environment) variables_.push_back(name + "=" + value);
    for (std::string& variable : variables_) environment_.push_back(variable.data());
    for (char** each = ::environ; *each != nullptr; ++each) {
      if (!isReplaced(*each)) environment_.push_back(*each);
    }
    environment_.push_back(nullptr);
  }

  /// Replaces this process, whose output goes to these descriptors; ends it with 127 if that fails. Allocates nothing.
  [[noreturn]] void exec(int out, int err) const {
    ::dup2(out, STDOUT_FILENO);
    ::dup2(err, STDERR_FILENO);
    ::execvpe(arguments_.front(), arguments_.data(), environment_.empty() ? ::environ : environment_.data());
    ::_exit(127);
  }

 private:
  bool isReplaced(const char* variable) const {
    for (const std::string& each : variables_) {
      if (std::strncmp(variable, each.c_str(), each.find('=') + 1) == 0) return true;
    }
    return false;
  }

  std::vector<std::string> words_;
  std::vector<std::string> variables_;
  std::vector<char*> arguments_;
  std::vector<char*> environment_;
};

}  // namespace zorva::agent::testing
