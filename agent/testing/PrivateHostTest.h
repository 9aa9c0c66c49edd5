#pragma once

// Tests on a private host.

#include <gtest/gtest.h>

#include "agent/testing/PrivateHost.h"

namespace zorva::agent::testing {

/// True where the work returns true on a private host and no expectation fails in it.
inline bool succeedsOnPrivateHost(const std::function<bool()>& work) {
  return runOnPrivateHost([&] { return work() && !::testing::Test::HasFailure(); });
}
inline bool succeedsOnHostWithDaemons(const std::function<bool()>& work) {
  return runOnHostWithDaemons([&] { return work() && !::testing::Test::HasFailure(); });
}

#define ZORVAGENT_NEEDS_PRIVATE_HOST()                                                                          \
  if (!zorva::agent::testing::canMakePrivateHosts()) {                                                          \
    GTEST_SKIP() << "this needs root, and a kernel or container that permits new namespaces with an overlayfs"; \
  }                                                                                                             \
  static_assert(true, "a semicolon ends it")

/// Tests of which every one needs private hosts.
class PrivateHostTest : public ::testing::Test {
 protected:
  void SetUp() override { ZORVAGENT_NEEDS_PRIVATE_HOST(); }
};

}  // namespace zorva::agent::testing
