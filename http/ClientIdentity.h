#pragma once

#include <sys/socket.h>

#include <string>

namespace zorva::http {

/// Who is at the other end of a connection, for limits that hold for each client: "user 1000" for a process of this
/// host, by the owner of its socket; the address without the port for all others. A process can choose its port and its
/// loopback address, so neither tells clients of one host apart. Where the kernel does not say who owns the socket, all
/// loopback addresses are one client: "this host".
std::string clientOf(int socket, const sockaddr_storage& peer);

}  // namespace zorva::http
