#pragma once

// The output of a command that is one of several, for several hosts, so that it can be put together with theirs.

#include <string>
#include <utility>
#include <vector>

#include "cli/output/Table.h"
#include "util/NotCopied.h"

namespace zorva::cli {

/// While it lives, what this thread writes and tells (Console.h) goes here.
class Capture : util::NotCopied {
 public:
  Capture();
  ~Capture();

  /// That of this thread; null: there is none.
  static Capture* current() noexcept;

  std::string text;                                        ///< for standard output
  std::vector<Table> tables;                               ///< of writeTable()
  std::vector<std::pair<std::string, std::string>> lines;  ///< for standard error: the kind of the line, and its text
};

}  // namespace zorva::cli
