#pragma once

// Makes the host and the broker that a case describes.

#include <cstddef>
#include <string>
#include <vector>

#include "CaseFile.h"
#include "tests/support/RecordingBroker.h"
#include "tests/support/World.h"

namespace ZV::Test {

/// The lines of a world, and installs it.
void furnish(World& world, const std::vector<WrittenLine>& lines);

/// One call that must fail: of the broker, or of a cursor in the tree.
struct Failure {
  WrittenLine line;
  std::string call;  ///< the slot; empty for a call of the tree
  zorva::agent::TreeCall treeCall = zorva::agent::TreeCall::Construct;
  std::size_t n = 0;  ///< the n-th call of its kind in the request, or 0 for each
  Mode mode = Mode::ReturnNull;
  Thrown thrown = Thrown::StdException;

  bool isOfTree() const { return call.empty(); }
};

/// Reads the lines of a broker: sets up its objects and answers, and returns the calls that must fail.
std::vector<Failure> furnish(RecordingBroker& broker, const std::vector<WrittenLine>& lines);

}  // namespace ZV::Test
