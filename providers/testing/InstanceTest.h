#pragma once

// One of the four instance providers on a world that a test fills and installs.

#include <string>
#include <vector>

#include "tests/support/Matchers.h"
#include "tests/support/Providers.h"
#include "tests/support/RecordingBroker.h"
#include "tests/support/RecordingLogger.h"
#include "tests/support/World.h"

namespace ZV::Test {

class InstanceTest : public ::testing::Test {
 protected:
  explicit InstanceTest(const std::string& prefix)
      : under(*findProvider(prefix)), provider(under.createInstanceMI, broker) {}

  Path classPath() const { return Path(under.className); }
  std::vector<Instance> instances(const PropertyList& properties = nullptr) {
    return provider.enumerateInstances(classPath(), properties).instances();
  }
  std::vector<Path> paths() { return provider.enumerateInstanceNames(classPath()).paths(); }
  /// The result of GetInstance: one instance or none.
  std::vector<Instance> found(const Path& path, const PropertyList& properties = nullptr) {
    return provider.getInstance(path, properties).instances();
  }

  const Provider& under;
  World world;
  RecordingLogger logger;
  RecordingBroker broker;
  InstanceProvider provider;
};

}  // namespace ZV::Test
