// The hosts that requests are made on, and all that lasts on them from one request to the next.
#pragma once

#include <map>
#include <string>

#include "RecordingBroker.h"
#include "World.h"

namespace ZV::Test {

enum class Tree { Empty, OneInterface, ThreeInterfaces };
inline constexpr Tree kAllTrees[] = {Tree::Empty, Tree::OneInterface, Tree::ThreeInterfaces};
const char* nameOf(Tree tree);

// A host without interfaces; one with one; one with three, of which one is the service processor's, two have a file and
// the one without has a value that was set through the agent. Installed at once, as a World is, and looked at so often
// that the agent has gone over from comparing the file of set values to being told of its changes.
class Host {
 public:
  explicit Host(Tree tree);

  // The objects of this host that other providers serve.
  void serveOthers(RecordingBroker& broker) const;

  // Every file of the data directory with its bytes: the interfaces' files, and the values that were set. The lock
  // file, which is empty and stays, is left out.
  std::map<std::string, std::string> files() const;
  const std::map<std::string, std::string>& filesAtFirst() const { return filesAtFirst_; }
  // Makes the files what they were at first; nothing is touched where they are.
  void restore();
  // Has the agent read the values that were set once more, at its next look: their file is written anew as it is.
  void touch() const;

 private:
  World world_;
  std::map<std::string, std::string> filesAtFirst_;
};

}  // namespace ZV::Test
