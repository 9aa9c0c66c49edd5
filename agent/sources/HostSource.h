#pragma once

// The tree of the host that the agent runs on.

#include <string>

#include "agent/files/FileWatch.h"
#include "agent/sources/DnsOwners.h"
#include "agent/sources/HostNames.h"
#include "agent/sources/Netlink.h"
#include "agent/tree/TreeSource.h"
#include "util/FileDescriptor.h"
#include "util/ReadFile.h"

namespace zorva::agent {

struct HostSourceOptions {
  bool includeLoopback = false;
  std::string root;                           ///< put before the path of each file that is read; for tests
  int comparisons = FileWatch::kComparisons;  ///< comparisons of files before they are watched
};

/// Interfaces with state and addresses from the kernel; names from the kernel, /etc/hosts and resolv.conf. DNS servers
/// and domains of each interface come from their owner (DnsOwners). If no owner names any for any interface, every
/// interface has the lists that programs use: those that the C library reads from /etc/resolv.conf. If that file names
/// only the stub resolver of systemd-resolved, the servers are those that the stub resolver asks. The tree is that of
/// the network namespace, the UTS namespace and the message bus of the thread that asks first.
///
/// If /etc/resolv.conf cannot be read for a reason that may pass, the nodes have no such lists. Only its first 64 KiB
/// are read.
class HostSource : public TreeSource {
 public:
  explicit HostSource(HostSourceOptions options = {});

  bool changed() override;

  /// Throws std::runtime_error, with one line, if the kernel cannot be queried.
  std::shared_ptr<const TreeSnapshot> read() override;

  void addWakers(Wakers& wakers) override;

  void reopen() override;

 private:
  /// The content of the files.
  struct Resolver {
    bool known = false;
    ResolvConf conf;
    StringList servers;  ///< with those that a local stub resolver asks, in its place
    std::string hosts;
  };

  /// The lists that every interface has where no owner has any; null where they are not known.
  struct CommonLists {
    SharedStrings servers;
    SharedStrings search;
  };

  void startWatching();
  util::FileText readLines(const std::string& path);
  std::string linesOf(const std::string& path);
  Resolver readResolver();
  static CommonLists commonLists(const Resolver& resolver);
  void setSystem(TreeBuilder& builder, std::size_t node, const Resolver& resolver) const;
  static void setLink(TreeBuilder& builder, std::size_t node, const Link& link, AddressList addresses);
  void setDns(TreeBuilder& builder, std::size_t node, const Link& link, const CommonLists* common) const;
  std::string product();

  HostSourceOptions options_;
  std::string resolvConf_;
  std::string stubResolvConf_;  ///< the file with the servers that a local stub resolver asks
  std::string hosts_;

  LinkMonitor monitor_;
  LinkReader reader_;
  DnsOwners owners_;
  FileWatch watch_;
  bool watching_ = false;
  bool filesMoved_ = true;             ///< the ways to the files must be followed again
  bool unread_ = false;                ///< a file could not be read for a temporary reason
  util::FileDescriptor nodeNameFile_;  ///< the kernel reports changes of the host's name there
  std::string nodeName_;
  std::string product_;  ///< empty until it is read
};

}  // namespace zorva::agent
