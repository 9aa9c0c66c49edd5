#pragma once

#include <sys/socket.h>

#include <string>

#include "access/Origin.h"

namespace zorva::http {

/// The client of a connection, for limits per client. For a process of this host: "user 1000", the owner of its socket,
/// or of the process that connected to a Unix socket.
/// For all others: the address without the port. A process can choose its port and its loopback address, so these do
/// not tell the clients of one host apart. If the kernel does not report the socket's owner, all loopback addresses are
/// one client: "this host".
std::string clientOf(int socket, const sockaddr_storage& peer);

/// Where a connection comes from. `peer` is an unmapped() address.
access::Origin originOf(int socket, const sockaddr_storage& peer, bool isEncrypted);

/// The other end of a connection for log lines: its address and port, or "process 4711" at a Unix socket.
std::string peerText(int socket, const sockaddr_storage& peer);

}  // namespace zorva::http
