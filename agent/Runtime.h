#pragma once

// The state of the agent in this process: source, overlay, latest snapshot.

#include <sys/types.h>

#include <atomic>
#include <memory>
#include <mutex>
#include <optional>
#include <string>

#include "agent/config/Config.h"
#include "agent/tree/Overlay.h"
#include "agent/tree/TreeSnapshot.h"
#include "agent/tree/TreeSource.h"

namespace zorva::agent {

/// The source that a configuration names. comparisons: of files, before they are watched.
std::shared_ptr<TreeSource> makeSource(const Config& config, int comparisons = FileWatch::kComparisons);

/// One for the process, made at its first use, destroyed when the library is unloaded. Thread-safe. A fork waits until
/// no thread is inside, so that the child gets a consistent state.
class Runtime {
 public:
  static Runtime& instance();

  /// Uses this configuration, and drops the source and the snapshot of another one.
  void useConfig(const Config& config);

  /// The current tree: checks for changes and reads again if there are any. Throws the source's exceptions, after they
  /// are logged, or a ConfigError.
  std::shared_ptr<const TreeSnapshot> look();

  /// The tree of the source alone, without the values of the overlay. Throws as look() does.
  std::shared_ptr<const TreeSnapshot> lookAtSource();

  /// The tree as of the last check; checks if there was none.
  std::shared_ptr<const TreeSnapshot> latest();

  /// The same two for a cursor. They throw only if the program has asked for exceptions. Otherwise they return null if
  /// the tree cannot be read, with a line to the log whenever the reason is a new one, and the first one to syslog.
  std::shared_ptr<const TreeSnapshot> lookForCursor();
  std::shared_ptr<const TreeSnapshot> latestForCursor();
  void askForExceptions();

  /// The system's name. Throws only std::bad_alloc.
  std::string systemName();

  /// Stores a value of the node at that path in the overlay. With [tree] apply = "host" and the rights of root, the
  /// interface is applied to the host as well. False, with the reason in the log, if either fails.
  bool store(const std::string& path, PropertyNumber property, const PropertyValue& value);

  /// The overlay of the configured data directory. Throws ConfigError. The caller must announce a change with
  /// overlayHasChanged().
  Overlay overlay();
  void overlayHasChanged();

  void setSource(std::shared_ptr<TreeSource> source);
  void reset();

 private:
  Runtime();

  std::shared_ptr<const TreeSnapshot> lookAndRead();
  static bool reachesHost(const std::string& interface);
  void reportOnce(const std::string& problem);
  void followFork();
  void forgetTree();
  void holdStill();
  void goOn();

  std::atomic<bool> throws_ = false;

  std::mutex lookMutex_;  ///< guards everything from here to latestMutex_
  pid_t process_;         ///< the process that owns the sockets and watches
  std::shared_ptr<TreeSource> source_;
  bool sourceIsGiven_ = false;  ///< not from the configuration
  std::optional<OverlayReader> overlay_;
  std::shared_ptr<const TreeSnapshot> sourceTree_;  ///< null: must be read again
  bool overlayStale_ = true;
  bool latestStale_ = true;
  pid_t reportedIn_ = 0;           ///< the process that the next two are about
  std::string reported_;           ///< the problem of the last check for a cursor; empty if there was none
  bool syslogIsInformed_ = false;  ///< syslog has the first problem

  std::mutex latestMutex_;  ///< may be taken while lookMutex_ is held, never the other way round
  std::shared_ptr<const TreeSnapshot> latest_;
};

}  // namespace zorva::agent
