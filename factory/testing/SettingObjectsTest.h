#pragma once

// Shared by the tests of the objects of the two setting classes.

#include <memory>
#include <string>
#include <utility>

#include "tests/support/Matchers.h"
#include "tests/support/ProviderCall.h"
#include "tests/support/World.h"

namespace ZV::Test {

/// Makes instances from the first setting of Data that a walk of the host finds.
template <typename Data>
class SettingObjectsTest : public ::testing::Test {
 protected:
  using Make = CMPIInstance* (*)(const CMPIBroker*, const CMPIObjectPath*, Data, const char**, bool, CMPIStatus*);

  SettingObjectsTest(const char* className, Make makeInstance)
      : ref_(broker_.make(Path(className), "ref")), makeInstance_(makeInstance) {
    world_->nic("eth0", usualNic()).install();
  }

  /// A host without anything in the place of the one with a usual interface.
  World& newWorld() {
    world_.reset();
    world_ = std::make_unique<World>();
    return *world_;
  }
  CMPIInstance* make(PropertyList properties = nullptr, bool isObjPath = false) {
    Data data;
    EXPECT_TRUE(static_cast<bool>(data));
    logger_.clear();
    return makeInstance_(broker_.cmpi(), ref_, data, properties.cmpi(), isObjPath, &status_);
  }
  Instance made(PropertyList properties = nullptr, bool isObjPath = false) {
    return RecordingBroker::read(make(std::move(properties), isObjPath));
  }
  std::vector<std::string> errors() const { return logger_.pairs().ofCategory("Zorvagent.DNSObjFactory").errors(); }

  std::unique_ptr<World> world_ = std::make_unique<World>();
  RecordingLogger logger_;
  RecordingBroker broker_;
  CMPIObjectPath* ref_;
  CMPIStatus status_ = {CMPI_RC_OK, nullptr};

 private:
  Make makeInstance_;
};

}  // namespace ZV::Test
