// One of the four instance providers on a world that a test fills and installs.
#pragma once

#include <string>
#include <vector>

#include "Matchers.h"
#include "Providers.h"
#include "RecordingBroker.h"
#include "RecordingLogger.h"
#include "World.h"

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
  // What GetInstance gives: one instance or none.
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
