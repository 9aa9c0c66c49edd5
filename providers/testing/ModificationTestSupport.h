#pragma once

#include <unistd.h>

#include "providers/testing/InstanceTest.h"

namespace ZV::Test {

/// A modification closes its result and marks no exit, also where it failed with a code of its own.
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
