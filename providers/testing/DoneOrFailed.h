// The end of every reading operation of the setting data.
#pragma once

#include <gtest/gtest.h>

#include "ProviderCall.h"

namespace ZV::Test {

inline bool calledDone(const Outcome& outcome) { return outcome.calls.count("returnDone") == 1; }

// Either returnDone and an exit line, or neither; then the last log line is an error.
inline void expectDoneOrFailed(const Outcome& outcome) {
  EXPECT_TRUE(outcome.markedEntry());
  EXPECT_EQ(calledDone(outcome), outcome.markedExit()) << outcome;
  EXPECT_NE(calledDone(outcome), outcome.lines.back().level == 6000) << outcome;
}

}  // namespace ZV::Test
