#pragma once

// The names and addresses of the host that the server runs on.

#include <string>
#include <string_view>
#include <vector>

namespace zorva::util {

/// "h" of "h", "h:5988" and "h.:5988"; "::1" of "[::1]:5988" and "::1".
std::string_view withoutPort(std::string_view text) noexcept;

/// True for an address as text that is a loopback address or that of an interface of this host.
bool isOwnAddress(std::string_view text);

/// The addresses of the interfaces of this host that others can use, without those of a link (fe80::), each once.
std::vector<std::string> ownAddresses();

/// The kernel's name of this host, the same without its domain, "localhost", and the names that the hosts file gives
/// together with the kernel's name to an address of this host. Queries no name server.
std::vector<std::string> ownNames(const std::string& hostsFile = "/etc/hosts");

class ServiceHost {
 public:
  /// `name` is the host name in responses; empty: the kernel's host name.
  explicit ServiceHost(std::string name);

  const std::string& name() const noexcept { return name_; }

  /// True for a name or an address of this host, with or without a port: "localhost", its name with or without a
  /// domain, an address of one of its interfaces, or `hostHeader`, the name that the client used to connect. Queries no
  /// name server. Safe on any thread.
  bool isThis(std::string_view text, std::string_view hostHeader) const;

 private:
  std::string name_;
};

}  // namespace zorva::util
