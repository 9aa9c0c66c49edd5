#include "providers/Results.h"

#include "tests/support/Matchers.h"
#include "tests/support/RecordingBroker.h"
#include "tests/support/World.h"

namespace ZV::Test {
namespace {

class ResultsOfAnOperation : public ::testing::Test {
 protected:
  // An association of two named ends.
  CMPIInstance* association(const Path& left, const Path& right, const std::string& label) {
    broker.setKeysOfClass("ZORVA_X", {"Left", "Right"});
    return broker.make(Instance("ZORVA_X").with("Left", ref(left)).with("Right", ref(right)), label);
  }
  static Path end(const std::string& name) { return Path("ZORVA_E").key("Name", name.c_str()); }
  CMPIObjectPath* requested(const Path& left, const Path& right) {
    return broker.make(Path("ZORVA_X").key("Left", ref(left)).key("Right", ref(right)));
  }
  std::vector<std::string> returned() const { return broker.calls().only({"returnInstance", "returnObjectPath"}); }

  RecordingBroker broker;
  CMPIResult* result = broker.makeResult();
  CMPIStatus status{CMPI_RC_OK, nullptr};
  CMPIInstance* one = association(end("a"), end("b"), "one");
  CMPIInstance* two = association(end("a"), end("c"), "two");
};

TEST_F(ResultsOfAnOperation, GoOutInOrderNullOnesIncluded) {
  CMPIInstance* lost = broker.make(Instance("ZORVA_X"), "lost");
  lost->hdl = nullptr;
  returnAll(result, std::vector<CMPIInstance*>{two, nullptr, lost, one});
  EXPECT_THAT(returned(), ElementsAre("returnInstance(two)", "returnInstance(null)", "returnInstance(lost(no handle))",
                                      "returnInstance(one)"));
  broker.startOver();
  returnAll(result, std::vector<CMPIObjectPath*>{broker.make(end("a"), "a"), nullptr, broker.make(end("b"), "b")});
  EXPECT_THAT(returned(), ElementsAre("returnObjectPath(a)", "returnObjectPath(null)", "returnObjectPath(b)"));
}

TEST_F(ResultsOfAnOperation, NothingGivesNothingAndIsNotDone) {
  returnAll(result, std::vector<CMPIInstance*>());
  returnAll(result, std::vector<CMPIObjectPath*>());
  returnPathsOf(result, {}, &status);
  returnFirstEqual(result, requested(end("a"), end("b")), {}, true, &status);
  EXPECT_THAT(broker.calls(), IsEmpty());
}

TEST_F(ResultsOfAnOperation, RefusedOneDoesNotKeepTheOthersBack) {
  broker.failNext("returnInstance", Mode::SetRc);
  returnAll(result, std::vector<CMPIInstance*>{one, two});
  EXPECT_THAT(RecordingBroker::read(result).instances, testing::SizeIs(1));
}

TEST_F(ResultsOfAnOperation, AreCountedInSixteenBits) {
  broker.keepsLines = false;
  broker.startOver();
  returnAll(result, std::vector<CMPIInstance*>(65535, nullptr));
  EXPECT_EQ(65535U, broker.callCount());
  broker.startOver();
  returnAll(result, std::vector<CMPIInstance*>(65536, nullptr));
  EXPECT_EQ(0U, broker.callCount());
  returnAll(result, std::vector<CMPIObjectPath*>(65538, nullptr));
  EXPECT_EQ(2U, broker.callCount());
}

TEST_F(ResultsOfAnOperation, PathsOfInstancesGoOutInOrderAndLeaveTheLastCode) {
  broker.failNext("getObjectPath", Mode::RcAndNull);
  returnPathsOf(result, {one, nullptr, two}, &status);
  EXPECT_THAT(returned(), ElementsAre("returnObjectPath(null)", "returnObjectPath(null)", "returnObjectPath(OP1)"));
  EXPECT_EQ(CMPI_RC_OK, status.rc);
  EXPECT_EQ(end("c"), RecordingBroker::read(result).paths.at(0)["Right"].path());
  broker.failNext("getObjectPath", Mode::RcAndNull);
  returnPathsOf(result, {one}, &status);
  EXPECT_EQ(CMPI_RC_ERR_FAILED, status.rc);
}

TEST_F(ResultsOfAnOperation, OnlyTheFirstEqualInstanceIsReturned) {
  CMPIInstance* twin = association(end("a"), end("c"), "twin");
  returnFirstEqual(result, requested(end("a"), end("c")), {one, two, twin}, true, &status);
  EXPECT_THAT(returned(), ElementsAre("returnInstance(two)"));
  EXPECT_EQ(2U, broker.callsOf("getObjectPath"));
}

TEST_F(ResultsOfAnOperation, NoneEqualGivesNothing) {
  returnFirstEqual(result, requested(end("b"), end("a")), {one, two}, true, &status);
  returnFirstEqual(result, nullptr, {one, two}, true, &status);
  EXPECT_THAT(returned(), IsEmpty());
}

TEST_F(ResultsOfAnOperation, InstancesThatAreNullOrWithoutHandleOrPathAreSkipped) {
  CMPIInstance* lost = association(end("a"), end("c"), "lost");
  lost->hdl = nullptr;
  returnFirstEqual(result, requested(end("a"), end("c")), {nullptr, lost, two}, true, &status);
  EXPECT_THAT(returned(), ElementsAre("returnInstance(two)"));
  broker.startOver();
  broker.failNext("getObjectPath", Mode::ReturnNull);
  returnFirstEqual(result, requested(end("a"), end("c")), {two}, true, &status);
  EXPECT_THAT(returned(), IsEmpty());
}

TEST_F(ResultsOfAnOperation, ReferencesAreComparedAsPathsOnlyIfTheKeysAreReferences) {
  const Path withoutNameSpace = end("b").in("");  // means the namespace of the enclosing path
  returnFirstEqual(result, requested(end("a"), withoutNameSpace), {one}, false, &status);
  EXPECT_THAT(returned(), IsEmpty());
  returnFirstEqual(result, requested(end("a"), withoutNameSpace), {one}, true, &status);
  EXPECT_THAT(returned(), ElementsAre("returnInstance(one)"));
}

}  // namespace
}  // namespace ZV::Test
