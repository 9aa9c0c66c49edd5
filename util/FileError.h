#pragma once

// Throws the failure of a system call on a file.

#include <cerrno>
#include <stdexcept>
#include <string>
#include <system_error>

namespace zorva::util {

/// Throws std::runtime_error with one line: the path, what failed, and what errno means.
[[noreturn]] inline void throwFileError(const std::string& path, const char* what) {
  throw std::runtime_error(path + ": " + what + ": " + std::generic_category().message(errno));
}

}  // namespace zorva::util
