#pragma once

// A separate network for one test, and interfaces in it.

#include <libmnl/libmnl.h>

#include <memory>
#include <string>

namespace zorva::agent::testing {

/// Moves the calling process, which should be a child made for that, into a new and empty network namespace, with a
/// user namespace around it if necessary. False if the kernel does not permit it.
bool enterNewNetwork();

/// Whether enterNewNetwork would work; tried in a child process.
bool canMakeNetworks();

/// Makes and changes interfaces in the network namespace of the calling thread. Throws std::runtime_error if the kernel
/// refuses.
class Interfaces {
 public:
  Interfaces();

  /// A group is a number by which links are removed together, which is much faster than one by one; 0 is none.
  void addBridge(const std::string& name, unsigned int group = 0);
  /// Two ends of a cable: each has carrier while the other one is up.
  void addPair(const std::string& name, const std::string& other);
  void remove(const std::string& name);
  void removeGroup(unsigned int group);
  void rename(const std::string& from, const std::string& to);
  void setUp(const std::string& name, bool up);
  /// flags are those of IFA_FLAGS; validSeconds 0 means for ever.
  void addAddress(const std::string& name, const std::string& address, unsigned char prefixLength,
                  unsigned int flags = 0, unsigned int validSeconds = 0);

 private:
  void send(nlmsghdr* message, const char* what);

  std::unique_ptr<mnl_socket, int (*)(mnl_socket*)> socket_;
};

#define ZORVAGENT_NEEDS_NETWORK_NAMESPACE()                                                                      \
  if (!zorva::agent::testing::canMakeNetworks()) {                                                               \
    GTEST_SKIP() << "this kernel or container permits no new network namespace, which this test makes links in"; \
  }                                                                                                              \
  static_assert(true, "a semicolon ends it")

}  // namespace zorva::agent::testing
