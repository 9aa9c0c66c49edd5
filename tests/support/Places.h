#pragma once

// The order of everything that is recorded: calls to a broker and log lines form one sequence.

#include <atomic>
#include <cstddef>

namespace ZV::Test {

inline std::size_t nextPlace() {
  static std::atomic<std::size_t> last{0};
  return ++last;
}

}  // namespace ZV::Test
