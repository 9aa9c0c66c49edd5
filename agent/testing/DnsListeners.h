#pragma once

// Name servers of a private host, which say whom the resolver asks.

#include <string>
#include <vector>

#include "util/FileDescriptor.h"

namespace zorva::agent::testing {

/// Servers that refuse every question with one code, and remember who was asked for what.
class DnsListeners {
 public:
  static constexpr unsigned char kServerFailure = 2;  ///< the next server is asked
  static constexpr unsigned char kNoSuchName = 3;     ///< the next suffix is tried

  /// Listens on port 53 of these IPv4 addresses. Throws std::runtime_error where that fails.
  DnsListeners(const std::vector<std::string>& addresses, unsigned char code);

  /// Looks a name up with getent, which asks the C library, and answers until that is done.
  void lookUp(const std::string& name);

  std::vector<std::string> asked;  ///< servers in the order in which they were asked first
  std::vector<std::string> names;  ///< that were asked for, likewise

 private:
  void answer();
  void answer(std::size_t server);

  std::vector<std::string> addresses_;
  unsigned char code_;
  std::vector<util::FileDescriptor> sockets_;
};

}  // namespace zorva::agent::testing
