#pragma once

// The tree of the host that the agent runs on.

#include <string>

#include "agent/files/FileWatch.h"
#include "agent/sources/HostNames.h"
#include "agent/sources/Netlink.h"
#include "agent/tree/TreeSource.h"
#include "util/ReadFile.h"

namespace zorva::agent {

struct HostSourceOptions {
  bool includeLoopback = false;
  std::string root;                           ///< put before the path of each file that is read; for tests
  int comparisons = FileWatch::kComparisons;  ///< comparisons of files before they are watched
};

/// Interfaces with state and addresses from the kernel; names from the kernel, /etc/hosts and resolv.conf; DNS servers
/// and search domains from /etc/resolv.conf, the same for every interface. The tree is that of the network namespace
/// and UTS namespace of the thread that asks first.
///
/// If /etc/resolv.conf cannot be read, or is no regular file, the nodes have no servers and no suffixes. If it can be
/// read and names none, they have empty lists. Only its first 64 KiB are read.
class HostSource : public TreeSource {
 public:
  explicit HostSource(HostSourceOptions options = {});

  bool changed() override;

  /// Throws std::runtime_error, with one line, if the kernel cannot be queried.
  std::shared_ptr<const TreeSnapshot> read() override;

  void reopen() override;

 private:
  /// The content of the files.
  struct Resolver {
    SharedStrings servers;  ///< null: not known
    SharedStrings search;
    HostNames names;
  };

  void startWatching();
  util::FileText readLines(const std::string& path);
  std::string linesOf(const std::string& path);
  Resolver readResolver();
  std::string product();

  HostSourceOptions options_;
  std::string resolvConf_;
  std::string stubResolvConf_;  ///< lists the servers of a local stub
  std::string hosts_;

  LinkMonitor monitor_;
  LinkReader reader_;
  FileWatch watch_;
  bool watching_ = false;
  bool filesMoved_ = true;  ///< the ways to the files must be followed again
  bool unread_ = false;     ///< a file could not be read for a temporary reason
  std::string nodeName_;
  std::string product_;  ///< empty until it is read
};

}  // namespace zorva::agent
