#pragma once

// The kernel's network interfaces and addresses over rtnetlink(7).

#include <libmnl/libmnl.h>

#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "agent/tree/Node.h"

namespace zorva::agent {

/// An open netlink socket, close-on-exec.
using NetlinkSocket = std::unique_ptr<mnl_socket, decltype(&mnl_socket_close)>;

struct Link {
  int index = 0;
  unsigned int flags = 0;      ///< IFF_UP and the like
  unsigned int operState = 0;  ///< RFC 2863, as in linux/if.h
  std::string name;            ///< up to 15 bytes, almost any
};

struct LinkAddress {
  int index = 0;  ///< of the link
  InterfaceAddress address;
};

struct LinkTable {
  std::vector<Link> links;             ///< in the kernel's order
  std::vector<LinkAddress> addresses;  ///< in the kernel's order: all of IPv4 before all of IPv6
};

/// Receives change events. It belongs to the network namespace and the process in which it was opened.
class LinkMonitor {
 public:
  LinkMonitor();

  /// Subscribes to the kernel's changes from now on. False if there is no socket; then every check returns true.
  bool open();

  /// Whether there was an event since the last check, or events may have been lost. Never blocks.
  bool changed();

  /// Readable when there is an event; -1 if there is no socket.
  int descriptor() const { return socket_ == nullptr ? -1 : ::mnl_socket_get_fd(socket_.get()); }

 private:
  NetlinkSocket socket_;
};

/// Requests the kernel's tables. A dump that was interrupted by a change is repeated. If changes keep coming, the last
/// one is used, because the changes are reported and the next check will read again.
class LinkReader {
 public:
  LinkReader();

  /// Throws std::runtime_error, with one line, if the kernel cannot be queried.
  LinkTable read();

  /// Closes the socket; the next read opens another.
  void close();

 private:
  enum class DumpResult { Complete, Interrupted };
  using Handler = std::function<void(const nlmsghdr*)>;

  void open();
  void dump(unsigned short type, const Handler& handle, const std::function<void()>& startAgain);
  void request(unsigned short type);
  DumpResult receive(const Handler& handle);

  NetlinkSocket socket_;
  std::vector<char> buffer_;
  unsigned int sequence_ = 0;
};

/// The origin of an address; flags are those of IFA_FLAGS, protocol that of IFA_PROTO or 0.
AddressOrigin originOf(const InterfaceAddress& address, unsigned int flags, unsigned int protocol);

}  // namespace zorva::agent
