#pragma once

#include <unistd.h>

#include "providers/testing/InstanceTest.h"

namespace ZV::Test {

/// A modification closes its result and logs no exit, even if it failed with its own code.
inline void expectDoneWithoutExit(const Outcome& outcome) {
  EXPECT_TRUE(outcome.markedEntry());
  EXPECT_EQ(1U, outcome.calls.count("returnDone"));
  EXPECT_FALSE(outcome.markedExit());
}

/// Ends a test that waits; the providers never do.
class Deadline {
 public:
  Deadline() { ::alarm(20); }
  ~Deadline() { ::alarm(0); }
};

}  // namespace ZV::Test
