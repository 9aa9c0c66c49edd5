#pragma once

#include <string>
#include <string_view>

// The names and addresses of the host that the server runs on.

namespace zorva::cimom {

class ServiceHost {
 public:
  /// `name` is what responses name this host; empty: what the kernel calls it.
  explicit ServiceHost(std::string name);

  const std::string& name() const noexcept { return name_; }

  /// True for a name or an address of this host, with or without a port: "localhost", its name with or without a
  /// domain, an address of one of its interfaces, or `hostHeader`, by which the client has reached it. Asks no name
  /// server. Safe on any thread.
  bool isThis(std::string_view text, std::string_view hostHeader) const;

 private:
  std::string name_;
};

}  // namespace zorva::cimom
