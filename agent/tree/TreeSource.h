// Where a tree comes from.
#pragma once

#include <memory>

#include "agent/tree/TreeSnapshot.h"

namespace zorva::agent {

// The agent calls a source from one thread at a time. What a source throws, beyond std::bad_alloc, should be derived
// from std::exception with a what() of one line that tells what could not be read and why: it reaches the caller of
// selectNode as it is.
class TreeSource {
 public:
  virtual ~TreeSource() = default;

  // Whether what read() would give may differ from what it gave last. Never blocks. True before the first read, and
  // where the source cannot tell.
  virtual bool changed() = 0;

  // The tree as it is now; never null.
  virtual std::shared_ptr<const TreeSnapshot> read() = 0;

  // Called in a process that was forked from one that used this source: what the two would share, a socket with reports
  // that are handed out only once, is closed here and opened anew.
  virtual void reopen() {}
};

// A source whose tree is put into it.
class FixedSource : public TreeSource {
 public:
  explicit FixedSource(std::shared_ptr<const TreeSnapshot> tree) : tree_(std::move(tree)) {}
  bool changed() override { return false; }
  std::shared_ptr<const TreeSnapshot> read() override { return tree_; }

 private:
  std::shared_ptr<const TreeSnapshot> tree_;
};

}  // namespace zorva::agent
