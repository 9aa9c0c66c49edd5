#pragma once

// A list that is far longer than any buffer.

#include <string>
#include <vector>

namespace ZV::Test {

/// A hundred thousand texts, and all of them with a blank after each, as an interface file has them.
struct ManyTexts {
  explicit ManyTexts(const std::string& prefix) {
    for (int i = 0; i < 100000; ++i) {
      texts.push_back(prefix + std::to_string(i));
      line += texts.back() + " ";
    }
  }

  std::vector<std::string> texts;
  std::string line;
};

}  // namespace ZV::Test
