#pragma once

// The provider library as a server loads it, and a host that the agent of a loaded library reads.

#include <string>
#include <vector>

#include "agent/testing/TemporaryDirectory.h"
#include "tests/support/ProviderCall.h"
#include "util/NotCopied.h"

namespace ZV::Test {

/// A shared library, loaded by the constructor and unloaded by the destructor. mode is RTLD_LOCAL or RTLD_GLOBAL.
class Library : zorva::util::NotCopied {
 public:
  explicit Library(const std::string& path, int mode);
  ~Library();

  /// The library's own function of that name; throws std::runtime_error if it has none.
  template <typename Function>
  Function find(const std::string& name) const {
    return reinterpret_cast<Function>(address(name));
  }

 private:
  void* address(const std::string& name) const;

  void* handle_;
};

std::string providerLibraryPath();

/// One of the twelve providers, by the names that a server knows.
struct ProviderNames {
  const char* prefix;
  const char* className;
  bool isAssociation;
};
const std::vector<ProviderNames>& allProviderNames();

/// A host of two interfaces in a document, which the agent reads as long as this object lives.
class DocumentHost : zorva::util::NotCopied {
 public:
  DocumentHost();
  ~DocumentHost();

 private:
  zorva::agent::testing::TemporaryDirectory directory_;
};

/// The objects of that host that other providers serve.
void serveOthers(RecordingBroker& broker);

/// Requests everything from each of the twelve, and reports how each request ended and its results.
std::string askEverything(const Library& library, RecordingBroker& broker);

}  // namespace ZV::Test
