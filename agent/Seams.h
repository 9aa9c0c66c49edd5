#pragma once

// Places where tests replace a part of the agent's surroundings: the tree, the configuration, the sink of the log, and
// a hook that makes calls fail. Normal work needs none of them, and none has an effect until it is used.

#include <memory>

#include "agent/config/Config.h"
#include "agent/interface/AgentApi.h"
#include "agent/log/LogSink.h"
#include "agent/tree/TreeSource.h"

namespace zorva::agent {

/// Reads the tree from this source from now on, instead of the configured one; null restores that. A cursor keeps its
/// snapshot alive. The overlay of the data directory applies to it as to any source. Thread-safe.
ZORVA_AGENT_API void setTreeSource(std::shared_ptr<TreeSource> source);

/// Uses this configuration instead of any file, unchecked. Thread-safe.
ZORVA_AGENT_API void setConfig(const Config& config);

/// The calls of ZV::Instrumentation.
enum class TreeCall {
  Construct,
  Copy,  ///< copy construction and copy assignment
  SelectByType,
  SelectByPath,
  Test,  ///< operator bool
  Advance,
  GetText,
  GetNumber,
  GetList,
  SetText,
  SetList,
  GetPathToParent,
  GetDescription,
};

/// Called at the beginning of each such call. If it throws, the call does nothing else and throws the same. Called from
/// any thread that uses a cursor.
class TreeCallHook {
 public:
  virtual ~TreeCallHook() = default;
  virtual void before(TreeCall call) = 0;
};

/// Calls the hook at every call of a cursor, until null is given. The caller keeps ownership of the hook. Thread-safe.
ZORVA_AGENT_API void setTreeCallHook(TreeCallHook* hook);

/// Resets the whole state of this process: configuration, source, snapshot, sinks, hook, and the request for
/// exceptions. The next call starts as in a new process. Existing cursors stay valid.
ZORVA_AGENT_API void reset();

}  // namespace zorva::agent
