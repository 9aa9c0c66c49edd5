#pragma once

// The hosts for the requests, and everything on them that lasts from one request to the next.

#include <map>
#include <string>

#include "tests/support/RecordingBroker.h"
#include "tests/support/World.h"

namespace ZV::Test {

enum class Tree { Empty, OneInterface, ThreeInterfaces };
inline constexpr Tree kAllTrees[] = {Tree::Empty, Tree::OneInterface, Tree::ThreeInterfaces};
const char* nameOf(Tree tree);

/// A host without interfaces; one with one; one with three, of which one is the service processor's, two have a file
/// and the one without has a value that was set through the agent. Installed at once, as a World is, and read so often
/// that the agent is notified of changes of the overlay file and no longer compares it.
class Host {
 public:
  explicit Host(Tree tree);

  /// The objects of this host that other providers serve.
  void serveOthers(RecordingBroker& broker) const;

  /// Every file of the data directory with its bytes: the interfaces' files, and the overlay. The lock file, which is
  /// empty and stays, is left out.
  std::map<std::string, std::string> files() const;
  const std::map<std::string, std::string>& filesAtFirst() const { return filesAtFirst_; }
  /// Restores the files to their first state; nothing is touched if they are unchanged.
  void restore();
  /// Makes the agent read the overlay again at its next look: its file is rewritten unchanged.
  void touch() const;

 private:
  World world_;
  std::map<std::string, std::string> filesAtFirst_;
};

}  // namespace ZV::Test
