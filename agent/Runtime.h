// The state of the agent in this process: source, overlay, latest snapshot.
#pragma once

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

// One for the process, made when it is first asked for, ended when the library is unloaded. Thread-safe. A fork waits
// until nobody is inside, so that the child finds it whole.
class Runtime {
 public:
  static Runtime& instance();

  // Takes this configuration, and lets go of the source and the snapshot that came from another.
  void useConfig(const Config& config);

  // The tree as it is now: looks for changes and reads again where there are any. Throws what the source throws, after
  // it has been logged, or a ConfigError.
  std::shared_ptr<const TreeSnapshot> look();

  // The tree as it was at the last look; looks where there was none.
  std::shared_ptr<const TreeSnapshot> latest();

  // The same two for a cursor, which throw only where a program has asked for exceptions. Otherwise null where the tree
  // cannot be read, with a line to the log whenever the reason is another one, and the first one to syslog.
  std::shared_ptr<const TreeSnapshot> lookForCursor();
  std::shared_ptr<const TreeSnapshot> latestForCursor();
  void askForExceptions() { throws_ = true; }

  // The system's name. Never throws but std::bad_alloc.
  std::string systemName();

  // Stores a value of the node at that path in the overlay. False, with the reason in the log, where that fails.
  bool store(const std::string& path, PropertyNumber property, const PropertyValue& value);

  // The overlay of the configured data directory. Throws ConfigError. Who changes it tells of that.
  Overlay overlay();
  void overlayHasChanged();

  void setSource(std::shared_ptr<TreeSource> source);
  void reset();

 private:
  Runtime();

  std::shared_ptr<const TreeSnapshot> lookAndRead();
  void reportOnce(const std::string& problem);
  void followFork();
  void forgetTree();
  void holdStill();
  void goOn();

  std::atomic<bool> throws_ = false;

  std::mutex lookMutex_;  // over everything from here to latestMutex_
  pid_t process_;         // whose sockets and watches these are
  std::shared_ptr<TreeSource> source_;
  bool sourceIsGiven_ = false;  // it does not come from the configuration
  std::optional<OverlayReader> overlay_;
  std::shared_ptr<const TreeSnapshot> sourceTree_;  // null: to be read again
  bool overlayStale_ = true;
  bool latestStale_ = true;
  std::string reported_;           // the problem of the last look for a cursor; empty where it went well
  bool syslogIsInformed_ = false;  // of the first one

  std::mutex latestMutex_;  // taken within lookMutex_, never the other way round
  std::shared_ptr<const TreeSnapshot> latest_;
};

}  // namespace zorva::agent
