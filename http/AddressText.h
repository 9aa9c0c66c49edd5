#pragma once

#include <sys/socket.h>

#include <string>

namespace zorva::http {

/// "192.0.2.1:80" or "[2001:db8::1]:80"; "a Unix socket".
std::string addressText(const sockaddr_storage& address);

/// "192.0.2.1" or "2001:db8::1"; empty for a Unix socket.
std::string hostText(const sockaddr_storage& address);

/// An IPv4 address that is written as IPv6 ("::ffff:192.0.2.1") becomes plain IPv4; others stay.
sockaddr_storage unmapped(const sockaddr_storage& address);

/// 127.0.0.0/8 or ::1.
bool isLoopback(const sockaddr_storage& address);

}  // namespace zorva::http
