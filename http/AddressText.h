#pragma once

#include <sys/socket.h>

#include <string>

namespace zorva::http {

/// "192.0.2.1:80" or "[2001:db8::1]:80".
std::string addressText(const sockaddr_storage& address);

}  // namespace zorva::http
