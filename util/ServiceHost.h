#pragma once

// The names and addresses of the host that the server runs on.

#include <string>
#include <string_view>

namespace zorva::util {

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
