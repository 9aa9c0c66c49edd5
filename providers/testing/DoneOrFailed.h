// What every read operation of the setting data looks like when it has ended.
#pragma once

#include <gtest/gtest.h>

#include "ProviderCall.h"

namespace ZV::Test {

inline bool calledDone(const Outcome& outcome) { return outcome.calls.count("returnDone") == 1; }

// Either done and marked as left, or neither, and then an error is the last that is heard of it.
inline void expectDoneOrFailed(const Outcome& outcome) {
  EXPECT_TRUE(outcome.markedEntry());
  EXPECT_EQ(calledDone(outcome), outcome.markedExit()) << outcome;
  EXPECT_NE(calledDone(outcome), outcome.lines.back().level == 6000) << outcome;
}

}  // namespace ZV::Test
