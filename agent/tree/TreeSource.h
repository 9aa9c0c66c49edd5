#pragma once

// The source of a tree.

#include <memory>

#include "agent/tree/TreeSnapshot.h"

namespace zorva::agent {

/// The agent calls a source from one thread at a time. Exceptions of a source, other than std::bad_alloc, should be
/// derived from std::exception with a what() of one line that says what could not be read and why: the caller of
/// selectNode gets them unchanged.
class TreeSource {
 public:
  virtual ~TreeSource() = default;

  /// Whether the next read() may differ from the last one. Never blocks. True before the first read, and if the source
  /// cannot know.
  virtual bool changed() = 0;

  /// The current tree; never null.
  virtual std::shared_ptr<const TreeSnapshot> read() = 0;

  /// Called in a process that was forked from one that used this source. Resources that the two would share, such as a
  /// socket whose events are delivered only once, are closed here and opened again.
  virtual void reopen() {}
};

}  // namespace zorva::agent
