#include "cmpi/support/CmpiSupport.h"

#include <vector>

#include "tests/support/Matchers.h"
#include "tests/support/RecordingBroker.h"

namespace ZV::Test {
namespace {

using namespace zorva::cmpi;

// A factory function may return null, or an object without a handle: then it is not used.
class CmpiSupport : public ::testing::Test {
 protected:
  CMPIObjectPath* path(const char* className) { return broker_.make(Path(className)); }
  CMPIObjectPath* withoutHandle() {
    CMPIObjectPath* broken = path("ZORVA_X");
    broken->hdl = nullptr;
    return broken;
  }

  RecordingBroker broker_;
};

TEST_F(CmpiSupport, AReferenceKeyNeedsBothPaths) {
  addReferenceKey(path("ZORVA_X"), "Dependent", nullptr);
  addReferenceKey(path("ZORVA_X"), "Dependent", withoutHandle());
  addReferenceKey(nullptr, "Dependent", path("ZORVA_Y"));
  addReferenceKey(withoutHandle(), "Dependent", path("ZORVA_Y"));
  EXPECT_THAT(broker_.calls(), IsEmpty());
}

TEST_F(CmpiSupport, ATextKeyNeedsItsPath) {
  addTextKey(nullptr, "Name", "eth0");
  addTextKey(withoutHandle(), "Name", "eth0");
  EXPECT_THAT(broker_.calls(), IsEmpty());
}

TEST_F(CmpiSupport, AReferencePropertyNeedsItsInstanceAndItsPath) {
  CMPIInstance* instance = broker_.make(Instance("ZORVA_X"));
  setReference(instance, "Dependent", nullptr);
  setReference(instance, "Dependent", withoutHandle());
  setReference(nullptr, "Dependent", path("ZORVA_Y"));
  instance->hdl = nullptr;
  setReference(instance, "Dependent", path("ZORVA_Y"));
  EXPECT_THAT(broker_.calls(), IsEmpty());
}

TEST_F(CmpiSupport, ElementsAreCountedInSixteenBits) {
  const std::vector<char> elements(65536 + 2);
  EXPECT_EQ(count16(elements), 2);
  EXPECT_EQ(counted16(elements).size(), 2U);
}

}  // namespace
}  // namespace ZV::Test
