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
  // The operation is on the path of an association of these ends.
  void request(const Path& left, const Path& right) {
    operation.ref = broker.make(Path("ZORVA_X").key("Left", ref(left)).key("Right", ref(right)));
  }
  std::vector<std::string> returned() const { return broker.calls().only({"returnInstance", "returnObjectPath"}); }

  RecordingBroker broker;
  CMPIResult* result = broker.makeResult();
  Operation operation = {.broker = broker.cmpi(), .result = result};
  CMPIInstance* one = association(end("a"), end("b"), "one");
  CMPIInstance* two = association(end("a"), end("c"), "two");
};

TEST_F(ResultsOfAnOperation, GoOutInOrderNullOnesIncluded) {
  CMPIInstance* lost = broker.make(Instance("ZORVA_X"), "lost");
  lost->hdl = nullptr;
  returnAll(operation, std::vector<CMPIInstance*>{two, nullptr, lost, one});
  EXPECT_THAT(returned(), ElementsAre("returnInstance(two)", "returnInstance(null)", "returnInstance(lost(no handle))",
                                      "returnInstance(one)"));
  broker.startOver();
  returnAll(operation, std::vector<CMPIObjectPath*>{broker.make(end("a"), "a"), nullptr, broker.make(end("b"), "b")});
  EXPECT_THAT(returned(), ElementsAre("returnObjectPath(a)", "returnObjectPath(null)", "returnObjectPath(b)"));
}

TEST_F(ResultsOfAnOperation, NothingGivesNothingAndIsNotDone) {
  returnAll(operation, std::vector<CMPIInstance*>());
  returnAll(operation, std::vector<CMPIObjectPath*>());
  returnPathsOf(operation, {});
  request(end("a"), end("b"));
  returnFirstEqual(operation, {}, true);
  EXPECT_THAT(broker.calls(), IsEmpty());
}

TEST_F(ResultsOfAnOperation, RefusedOneDoesNotKeepTheOthersBack) {
  broker.failNext("returnInstance", Mode::SetRc);
  returnAll(operation, std::vector<CMPIInstance*>{one, two});
  EXPECT_THAT(RecordingBroker::read(result).instances, testing::SizeIs(1));
}

TEST_F(ResultsOfAnOperation, AreCountedInSixteenBits) {
  broker.keepsLines = false;
  broker.startOver();
  returnAll(operation, std::vector<CMPIInstance*>(65535, nullptr));
  EXPECT_EQ(65535U, broker.callCount());
  broker.startOver();
  returnAll(operation, std::vector<CMPIInstance*>(65536, nullptr));
  EXPECT_EQ(0U, broker.callCount());
  returnAll(operation, std::vector<CMPIObjectPath*>(65538, nullptr));
  EXPECT_EQ(2U, broker.callCount());
}

TEST_F(ResultsOfAnOperation, PathsOfInstancesGoOutInOrderAndLeaveTheLastCode) {
  broker.failNext("getObjectPath", Mode::RcAndNull);
  returnPathsOf(operation, {one, nullptr, two});
  EXPECT_THAT(returned(), ElementsAre("returnObjectPath(null)", "returnObjectPath(null)", "returnObjectPath(OP1)"));
  EXPECT_EQ(CMPI_RC_OK, operation.status.rc);
  EXPECT_EQ(end("c"), RecordingBroker::read(result).paths.at(0)["Right"].path());
  broker.failNext("getObjectPath", Mode::RcAndNull);
  returnPathsOf(operation, {one});
  EXPECT_EQ(CMPI_RC_ERR_FAILED, operation.status.rc);
}

TEST_F(ResultsOfAnOperation, OnlyTheFirstEqualInstanceIsReturned) {
  CMPIInstance* twin = association(end("a"), end("c"), "twin");
  request(end("a"), end("c"));
  returnFirstEqual(operation, {one, two, twin}, true);
  EXPECT_THAT(returned(), ElementsAre("returnInstance(two)"));
  EXPECT_EQ(2U, broker.callsOf("getObjectPath"));
}

TEST_F(ResultsOfAnOperation, NoneEqualGivesNothing) {
  request(end("b"), end("a"));
  returnFirstEqual(operation, {one, two}, true);
  operation.ref = nullptr;
  returnFirstEqual(operation, {one, two}, true);
  EXPECT_THAT(returned(), IsEmpty());
}

TEST_F(ResultsOfAnOperation, InstancesThatAreNullOrWithoutHandleOrPathAreSkipped) {
  CMPIInstance* lost = association(end("a"), end("c"), "lost");
  lost->hdl = nullptr;
  request(end("a"), end("c"));
  returnFirstEqual(operation, {nullptr, lost, two}, true);
  EXPECT_THAT(returned(), ElementsAre("returnInstance(two)"));
  broker.startOver();
  broker.failNext("getObjectPath", Mode::ReturnNull);
  request(end("a"), end("c"));
  returnFirstEqual(operation, {two}, true);
  EXPECT_THAT(returned(), IsEmpty());
}

TEST_F(ResultsOfAnOperation, ReferencesAreComparedAsPathsOnlyIfTheKeysAreReferences) {
  const Path withoutNameSpace = end("b").in("");  // means the namespace of the enclosing path
  request(end("a"), withoutNameSpace);
  returnFirstEqual(operation, {one}, false);
  EXPECT_THAT(returned(), IsEmpty());
  request(end("a"), withoutNameSpace);
  returnFirstEqual(operation, {one}, true);
  EXPECT_THAT(returned(), ElementsAre("returnInstance(one)"));
}

}  // namespace
}  // namespace ZV::Test
