// Places where another world can be put under the agent: a tree, a configuration, a sink for the log, a hook that makes
// calls fail. Nothing here is needed for normal work, and nothing here does anything until it is used.
#pragma once

#include <memory>

#include "agent/config/Config.h"
#include "agent/interface/AgentApi.h"
#include "agent/log/LogSink.h"
#include "agent/tree/TreeSource.h"

namespace zorva::agent {

// Reads the tree from this source from now on, in place of the configured one; null goes back to that. Snapshots that
// cursors stand in stay theirs. The overlay of the data directory holds over it as over any source. Thread-safe.
ZORVA_AGENT_API void setTreeSource(std::shared_ptr<TreeSource> source);

// Takes this configuration in place of any file, unchecked. Thread-safe.
ZORVA_AGENT_API void setConfig(const Config& config);

// The calls of ZV::Instrumentation.
enum class TreeCall {
  Construct,
  Copy,  // copy construction and copy assignment
  SelectByType,
  SelectByPath,
  Test,  // operator bool
  Advance,
  GetText,
  GetNumber,
  GetList,
  SetText,
  SetList,
  GetPathToParent,
  GetDescription,
};

// Asked at the beginning of each such call; what it throws, of whatever type, leaves the call before that has done
// anything. Called from any thread that uses a cursor.
class TreeCallHook {
 public:
  virtual ~TreeCallHook() = default;
  virtual void before(TreeCall call) = 0;
};

// Asks the hook at every call of a cursor, until null is given. The hook stays the caller's. Thread-safe.
ZORVA_AGENT_API void setTreeCallHook(TreeCallHook* hook);

// Forgets everything that this process knows: configuration, source, snapshot, sinks, hook, and that a program has
// asked for exceptions. The next call starts as in
// a new process. Cursors that exist stay valid.
ZORVA_AGENT_API void reset();

}  // namespace zorva::agent
