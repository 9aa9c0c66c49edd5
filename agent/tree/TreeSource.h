#pragma once

// The source of a tree.

#include <poll.h>

#include <algorithm>
#include <chrono>
#include <memory>
#include <optional>
#include <vector>

#include "agent/tree/TreeSnapshot.h"

namespace zorva::agent {

/// How often a thread looks that sleeps, for what the kernel cannot report.
inline constexpr std::chrono::seconds kLooksForTheUnreported{2};

/// What wakes a thread that sleeps until a source may have changed.
struct Wakers {
  std::vector<pollfd> descriptors;                    ///< valid until the source is used again
  std::optional<std::chrono::milliseconds> deadline;  ///< look again then, because of what no descriptor reports

  void add(int descriptor, short events = POLLIN) {
    if (descriptor >= 0) descriptors.push_back({descriptor, events, 0});
  }
  /// -1: nothing reports what this is about.
  void addOrLook(int descriptor) { descriptor >= 0 ? add(descriptor) : addDeadline(kLooksForTheUnreported); }
  void addDeadline(std::chrono::milliseconds time) { deadline = std::min(time, deadline.value_or(time)); }
};

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

  /// Adds what wakes a thread when changed() may be true. Called after changed() was false.
  virtual void addWakers(Wakers& wakers) { wakers.addDeadline(kLooksForTheUnreported); }

  /// Called in a process that was forked from one that used this source. Resources that the two would share, such as a
  /// socket whose events are delivered only once, are closed here and opened again.
  virtual void reopen() {}
};

}  // namespace zorva::agent
