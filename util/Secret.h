#pragma once

// A text that is wiped from memory at its end.

#include <string.h>

#include <string>
#include <string_view>

#include "util/NotCopied.h"

namespace zorva::util {

class Secret : NotCopied {
 public:
  /// Takes the text over and wipes the given one.
  explicit Secret(std::string& text) : text_(text) { wipe(text); }
  ~Secret() { wipe(text_); }

  const std::string& text() const noexcept { return text_; }

  /// Overwrites the text and empties it. What it has left in memory while it grew is not reached: reserve() before.
  static void wipe(std::string& text) {
    ::explicit_bzero(text.data(), text.size());
    text.clear();
  }

 private:
  std::string text_;
};

}  // namespace zorva::util
