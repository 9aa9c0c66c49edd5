#include "tests/support/RecordingBroker.h"

#include <cmpimacs.h>

#include <thread>

#include "tests/support/BrokerObjects.h"
#include "tests/support/Matchers.h"

namespace ZV::Test {
namespace {

CMPIObjectPath* makeEndpointPath(const CMPIBroker* cmpi) {
  CMPIObjectPath* path = CMNewObjectPath(cmpi, "root/cimv2", "ZORVA_DNSProtocolEndPoint", nullptr);
  CMAddKey(path, "Name", "eth0", CMPI_chars);
  return path;
}

TEST(RecordingBroker, WritesDownCallsInOrderWithTheirArguments) {
  RecordingBroker broker;
  CMPIObjectPath* path = makeEndpointPath(broker.cmpi());
  CMSetHostname(path, "host1");
  CMPIInstance* instance = CMNewInstance(broker.cmpi(), path, nullptr);
  const char* keys[] = {"Name", nullptr};
  CMSetPropertyFilter(instance, nullptr, keys);
  CMPIUint16 state = 2;
  CMSetProperty(instance, "EnabledState", &state, CMPI_uint16);
  CMSetProperty(instance, "Antecedent", &path, CMPI_ref);
  const CMPIResult* result = broker.makeResult();
  CMReturnInstance(result, instance);
  CMReturnDone(result);
  EXPECT_THAT(broker.calls().lines(),
              ElementsAre("newObjectPath(\"root/cimv2\", \"ZORVA_DNSProtocolEndPoint\")",
                          "OP1.addKey(\"Name\", chars \"eth0\")", "OP1.setHostname(\"host1\")", "newInstance(OP1)",
                          "I1.setPropertyFilter(null, {\"Name\"})", "I1.setProperty(\"EnabledState\", uint16 2)",
                          "I1.setProperty(\"Antecedent\", ref OP1)", "returnInstance(I1)", "returnDone()"));
}

TEST(RecordingBroker, StepsLeaveOutWhatOnlyReads) {
  RecordingBroker broker;
  CMPIObjectPath* path = makeEndpointPath(broker.cmpi());
  const CMPIData key = CMGetKey(path, "name", nullptr);
  EXPECT_STREQ("eth0", CMGetCharsPtr(key.value.string, nullptr));
  EXPECT_EQ(4U, broker.callCount());
  EXPECT_EQ(4U, broker.calls().lines().size());
  EXPECT_EQ(2U, broker.calls().steps().size());
  EXPECT_THAT(broker.calls().only({"getCharPtr"}), ElementsAre("string \"eth0\".getCharPtr()"));
  EXPECT_EQ(1U, broker.callsOf("getKey"));
}

TEST(RecordingBroker, ResultHoldsCopiesOfWhatWasReturned) {
  RecordingBroker broker;
  CMPIObjectPath* path = makeEndpointPath(broker.cmpi());
  const CMPIResult* result = broker.makeResult();
  CMReturnObjectPath(result, path);
  CMPIUint32 number = 7;
  CMReturnData(result, &number, CMPI_uint32);
  CMSetHostname(path, "afterwards");
  const Results results = RecordingBroker::read(result);
  ASSERT_EQ(1U, results.paths.size());
  EXPECT_EQ("root/cimv2:ZORVA_DNSProtocolEndPoint.Name=\"eth0\"", describeWhole(results.paths[0]));
  EXPECT_EQ(std::vector{uint32(7)}, results.data);
  EXPECT_FALSE(results.done());
}

TEST(RecordingBroker, NullResultsAreRefusedAndNotKept) {
  RecordingBroker broker;
  const CMPIResult* result = broker.makeResult();
  EXPECT_EQ(CMPI_RC_ERR_INVALID_PARAMETER, CMReturnInstance(result, static_cast<CMPIInstance*>(nullptr)).rc);
  EXPECT_THAT(RecordingBroker::read(result).instances, IsEmpty());
  EXPECT_THAT(broker.calls().lines(), ElementsAre("returnInstance(null)"));
}

TEST(RecordingBroker, FilterDropsPropertiesThatAreNeitherAskedForNorKeys) {
  RecordingBroker broker;
  CMPIInstance* instance = broker.make(Instance("ZORVA_X"));
  const char* properties[] = {"domainname", nullptr};
  const char* keys[] = {"Name", nullptr};
  CMSetPropertyFilter(instance, properties, keys);
  for (const char* name : {"Name", "DomainName", "Caption"}) CMSetProperty(instance, name, "x", CMPI_chars);
  EXPECT_THAT(RecordingBroker::read(instance).names(), ElementsAre("Name", "DomainName"));
  EXPECT_EQ("ZORVA_X.Name=\"x\"", describe(CMGetObjectPath(instance, nullptr)));
}

TEST(RecordingBroker, PathOfAnUnfilteredInstanceHasTheKeysOfItsClass) {
  RecordingBroker broker;
  CMPIObjectPath* system = broker.make(Path("ZORVA_ComputerSystem").key("Name", "host1"), "system");
  CMPIInstance* instance = broker.make(Instance("ZORVA_DNSHostedAccessPoint"));
  CMSetProperty(instance, "Antecedent", &system, CMPI_ref);
  CMSetProperty(instance, "Caption", "x", CMPI_chars);
  EXPECT_EQ("ZORVA_DNSHostedAccessPoint.Antecedent=(ZORVA_ComputerSystem.Name=\"host1\")",
            describe(CMGetObjectPath(instance, nullptr)));
  broker.setKeysOfClass("ZORVA_DNSHostedAccessPoint", {"Caption"});
  EXPECT_EQ("ZORVA_DNSHostedAccessPoint.Caption=\"x\"", describe(CMGetObjectPath(instance, nullptr)));
}

TEST(RecordingBroker, NewInstanceForgetsTheHostOfItsPath) {
  RecordingBroker broker;
  CMPIObjectPath* path = broker.make(Path("ZORVA_X").on("host1"));
  CMPIInstance* instance = CMNewInstance(broker.cmpi(), path, nullptr);
  EXPECT_EQ("", RecordingBroker::read(CMGetObjectPath(instance, nullptr)).host);
}

TEST(RecordingBroker, UnsetArrayElementsAreNull) {
  RecordingBroker broker;
  CMPIArray* array = CMNewArray(broker.cmpi(), 2, CMPI_string, nullptr);
  CMPIString* text = CMNewString(broker.cmpi(), "a", nullptr);
  EXPECT_EQ(CMPI_RC_OK, CMSetArrayElementAt(array, 1, &text, CMPI_string).rc);
  EXPECT_EQ(CMPI_RC_ERR_NO_SUCH_PROPERTY, CMSetArrayElementAt(array, 2, &text, CMPI_string).rc);
  CMPIInstance* instance = broker.make(Instance("ZORVA_X"));
  CMSetProperty(instance, "List", &array, CMPI_stringA);
  EXPECT_EQ("ZORVA_X\n  List = string[] {null, \"a\"}\n", describe(instance));
  EXPECT_NE(0, CMGetArrayElementAt(array, 0, nullptr).state & CMPI_nullValue);
  EXPECT_EQ(2U, CMGetArrayCount(array, nullptr));
}

TEST(RecordingBroker, MissingNamesAnswerAsTheTestSays) {
  RecordingBroker broker;
  broker.missingProperty = {CMPI_RC_OK, CMPI_nullValue};
  CMPIStatus status{};
  EXPECT_EQ(CMPI_notFound, CMGetKey(broker.make(Path("ZORVA_X")), "Name", &status).state);
  EXPECT_EQ(CMPI_RC_ERR_NOT_FOUND, status.rc);
  EXPECT_EQ(CMPI_nullValue, CMGetProperty(broker.make(Instance("ZORVA_X")), "Name", &status).state);
  EXPECT_EQ(CMPI_RC_OK, status.rc);
}

TEST(RecordingBroker, KeysCanBeMarkedAsKeys) {
  RecordingBroker broker;
  broker.stateOfKeys = CMPI_keyValue;
  const CMPIData key = CMGetKey(broker.make(Path("ZORVA_X").key("Name", "eth0")), "Name", nullptr);
  EXPECT_EQ(CMPI_keyValue, key.state);
  EXPECT_STREQ("eth0", CMGetCharsPtr(key.value.string, nullptr));
}

TEST(RecordingBroker, EveryTypeSurvivesTheWayInAndOut) {
  RecordingBroker broker;
  const std::vector<Value> values = {
      boolean(true),
      uint8(255),
      uint16(65535),
      uint32(4294967295U),
      uint64(~0ULL),
      sint32(-1),
      text("a\nb"),
      texts({"a", ""}),
      uint16s({8, 14, 17}),
      ref(Path("ZORVA_Y").key("InstanceID", "x")),
      {CMPI_sint8, CMPI_goodValue, std::int64_t{-128}},
      {CMPI_sint16, CMPI_goodValue, std::int64_t{-32768}},
      {CMPI_sint64, CMPI_goodValue, std::int64_t{-5}},
      {CMPI_char16, CMPI_goodValue, std::uint64_t{0x20ac}},
      {CMPI_real32, CMPI_goodValue, 0.5},
      {CMPI_real64, CMPI_goodValue, -0.25},
      {CMPI_dateTime, CMPI_goodValue, std::string("00000001000000.000000:000")},
  };
  for (const Value& value : values) {
    const CMPIData data = broker.makeData(value);
    CMPIInstance* instance = broker.make(Instance("ZORVA_X"));
    CMSetProperty(instance, "P", &data.value, data.type);
    EXPECT_EQ(value, RecordingBroker::read(instance)["P"]);
  }
}

TEST(RecordingBroker, ServedClassIsEnumeratedInTheNamespaceThatWasAsked) {
  RecordingBroker broker;
  broker.serve("ZORVA_IPProtocolEndpoint",
               {Instance("ZORVA_IPProtocolEndpoint").with("Name", "eth0").with("A", uint16(1))});
  const CMPIContext* context = broker.makeContext();
  CMPIObjectPath* asked = broker.make(Path("ZORVA_IPProtocolEndpoint", "root/other"), "asked");
  CMPIStatus status{};
  CMPIEnumeration* names = CBEnumInstanceNames(broker.cmpi(), context, asked, &status);
  ASSERT_NE(nullptr, names);
  ASSERT_TRUE(CMHasNext(names, &status));
  EXPECT_EQ("root/other:ZORVA_IPProtocolEndpoint.Name=\"eth0\"",
            describeWhole(RecordingBroker::read(CMGetNext(names, &status).value.ref)));
  EXPECT_FALSE(CMHasNext(names, &status));
  CMPIEnumeration* instances = CBEnumInstances(broker.cmpi(), context, asked, nullptr, &status);
  EXPECT_EQ("ZORVA_IPProtocolEndpoint\n  Name = string \"eth0\"\n  A = uint16 1\n",
            describe(CMGetNext(instances, &status).value.inst));
  EXPECT_EQ(CMPI_RC_OK, status.rc);
  EXPECT_THAT(broker.calls().only({"enumerateInstanceNames", "enumerateInstances"}),
              ElementsAre("enumerateInstanceNames(asked)", "enumerateInstances(asked)"));
}

TEST(RecordingBroker, UpCallWithAnotherContextSaysSo) {
  RecordingBroker broker;
  CMPIObjectPath* asked = broker.make(Path("ZORVA_X"), "asked");
  CMPIStatus status{};
  EXPECT_EQ(nullptr, CBEnumInstanceNames(broker.cmpi(), static_cast<CMPIContext*>(nullptr), asked, &status));
  EXPECT_EQ(CMPI_RC_ERR_INVALID_CLASS, status.rc);
  EXPECT_THAT(broker.calls().lines(), ElementsAre("enumerateInstanceNames(asked, context null)"));
}

TEST(RecordingBroker, ServedClassFailsAsTheTestSays) {
  RecordingBroker broker;
  const CMPIContext* context = broker.makeContext();
  CMPIObjectPath* asked = broker.make(Path("ZORVA_X"));
  CMPIStatus status{};
  ServedClass& served = broker.serve("ZORVA_X", {Instance("ZORVA_X")});
  served.rc = CMPI_RC_ERR_ACCESS_DENIED;
  EXPECT_NE(nullptr, CBEnumInstances(broker.cmpi(), context, asked, nullptr, &status));
  EXPECT_EQ(CMPI_RC_ERR_ACCESS_DENIED, status.rc);
  served.rc = CMPI_RC_OK;
  served.nullEnumeration = true;
  EXPECT_EQ(nullptr, CBEnumInstances(broker.cmpi(), context, asked, nullptr, &status));
  EXPECT_EQ(CMPI_RC_OK, status.rc);
  served.throws = true;
  EXPECT_THROW(CBEnumInstanceNames(broker.cmpi(), context, asked, &status), InjectedFailure);
}

struct FailureCase {
  const char* name;
  Mode mode;
  CMPIrc rc;
  bool isNull;
  bool hasHandle;
};

class BrokerFailure : public ::testing::TestWithParam<FailureCase> {};

TEST_P(BrokerFailure, OfAnObjectThatIsMade) {
  RecordingBroker broker;
  broker.failNext("newArray", GetParam().mode);
  CMPIStatus status{};
  const CMPIArray* array = CMNewArray(broker.cmpi(), 1, CMPI_string, &status);
  EXPECT_EQ(GetParam().rc, status.rc);
  EXPECT_EQ(GetParam().rc != CMPI_RC_OK, status.msg != nullptr);
  EXPECT_EQ(GetParam().isNull, array == nullptr);
  if (array != nullptr) {
    EXPECT_EQ(GetParam().hasHandle, array->hdl != nullptr);
  }
  EXPECT_TRUE(broker.hasFailed());
  const CMPIArray* next = CMNewArray(broker.cmpi(), 1, CMPI_string, &status);
  EXPECT_EQ(CMPI_RC_OK, status.rc);
  EXPECT_NE(nullptr, next->hdl);
}

TEST_P(BrokerFailure, OfAKeyThatIsRead) {
  RecordingBroker broker;
  const CMPIObjectPath* path = broker.make(Path("ZORVA_X").key("Name", "eth0"));
  broker.failAt(1, GetParam().mode);
  CMPIStatus status{};
  const CMPIData key = CMGetKey(path, "Name", &status);
  EXPECT_EQ(GetParam().rc, status.rc);
  EXPECT_EQ(GetParam().isNull, (key.state & CMPI_nullValue) != 0);
  EXPECT_EQ(GetParam().isNull, key.value.string == nullptr);
  if (key.value.string != nullptr) {
    EXPECT_EQ(GetParam().hasHandle, key.value.string->hdl != nullptr);
  }
}

TEST_P(BrokerFailure, OfAPropertyThatIsSetByItsStatus) {
  RecordingBroker broker;
  CMPIInstance* instance = broker.make(Instance("ZORVA_X"));
  broker.failEach("setProperty", GetParam().mode);
  EXPECT_EQ(CMPI_RC_ERR_FAILED, CMSetProperty(instance, "A", "x", CMPI_chars).rc);
  EXPECT_EQ(CMPI_RC_ERR_FAILED, CMSetProperty(instance, "B", "x", CMPI_chars).rc);
  EXPECT_THAT(RecordingBroker::read(instance).names(), IsEmpty());
}

INSTANTIATE_TEST_SUITE_P(EachMode, BrokerFailure,
                         ::testing::Values(FailureCase{"SetRc", Mode::SetRc, CMPI_RC_ERR_FAILED, false, true},
                                           FailureCase{"ReturnNull", Mode::ReturnNull, CMPI_RC_OK, true, false},
                                           FailureCase{"NullHandle", Mode::NullHandle, CMPI_RC_OK, false, false},
                                           FailureCase{"RcAndNull", Mode::RcAndNull, CMPI_RC_ERR_FAILED, true, false}),
                         [](const auto& one) { return one.param.name; });

TEST(RecordingBroker, FailingCallIsMarkedInItsLine) {
  RecordingBroker broker;
  broker.failAt(2, Mode::RcAndNull);
  CMNewString(broker.cmpi(), "a", nullptr);
  CMNewString(broker.cmpi(), "b", nullptr);
  EXPECT_THAT(broker.calls().lines(), ElementsAre("newString(\"a\")", "newString(\"b\") fails: rc set and null"));
}

TEST(RecordingBroker, ThrowsIfItIsAskedTo) {
  RecordingBroker broker;
  broker.failNext("newString", Mode::Throw);
  EXPECT_THROW(CMNewString(broker.cmpi(), "a", nullptr), InjectedFailure);
  EXPECT_NE(nullptr, CMNewString(broker.cmpi(), "a", nullptr));
}

TEST(RecordingBroker, ObjectWithoutHandleRefusesAndDoesNotChange) {
  RecordingBroker broker;
  broker.failNext("newObjectPath", Mode::NullHandle);
  CMPIObjectPath* path = CMNewObjectPath(broker.cmpi(), "root/cimv2", "ZORVA_X", nullptr);
  EXPECT_EQ(CMPI_RC_ERR_INVALID_HANDLE, CMSetHostname(path, "host1").rc);
  CMPIStatus status{};
  EXPECT_EQ(nullptr, CMGetNameSpace(path, &status));
  EXPECT_EQ(CMPI_RC_ERR_INVALID_HANDLE, status.rc);
  EXPECT_EQ(0U, CMGetKeyCount(path, &status));
  EXPECT_EQ(nullptr, CMNewInstance(broker.cmpi(), path, &status));
  EXPECT_THAT(broker.calls().only({"setHostname", "newInstance"}),
              ElementsAre("OP1(no handle).setHostname(\"host1\")", "newInstance(OP1(no handle))"));
}

TEST(RecordingBroker, ReleaseIsWrittenDown) {
  RecordingBroker broker;
  CMPIString* string = CMNewString(broker.cmpi(), "a", nullptr);
  CMRelease(string);
  EXPECT_THAT(broker.calls().only({"release"}), ElementsAre("string \"a\".release()"));
}

TEST(RecordingBroker, EachFailureIsTriedUntilTheOperationMakesNoCallMore) {
  RecordingBroker broker;
  std::vector<std::size_t> reached;
  const std::size_t tried = forEachFailure(broker,
                                           [&](std::size_t n, Mode) {
                                             const CMPIString* first = CMNewString(broker.cmpi(), "a", nullptr);
                                             if (first != nullptr && first->hdl != nullptr)
                                               CMGetCharsPtr(first, nullptr);
                                             if (broker.hasFailed()) reached.push_back(n);
                                           },
                                           {Mode::SetRc, Mode::ReturnNull});
  EXPECT_EQ(4U, tried);
  EXPECT_THAT(reached, ElementsAre(1, 2, 1, 2));
  EXPECT_EQ(0U, broker.mark());
}

// Objects with their own tables, as another implementation of a broker has them.
TEST(RecordingBroker, ObjectsOfAnotherKindOfBrokerAreReadThroughTheirTables) {
  RecordingBroker broker;
  CMPIObjectPathFT pathTable = ObjectTables::path;
  CMPIInstanceFT instanceTable = ObjectTables::instance;
  CMPIArrayFT arrayTable = ObjectTables::array;
  const Path known = Path("ZORVA_X").on("host1").key("Name", "eth0").key("N", uint16(3));
  CMPIObjectPath* path = broker.make(known);
  path->ft = &pathTable;
  CMPIArray* array = broker.makeArray(list(CMPI_stringA, {text("a"), null(CMPI_string)}));
  array->ft = &arrayTable;
  CMPIInstance* instance = broker.make(Instance("ZORVA_X"));
  CMSetProperty(instance, "List", &array, CMPI_stringA);
  CMSetProperty(instance, "Far", &path, CMPI_ref);
  instance->ft = &instanceTable;

  const CMPIResult* result = broker.makeResult();
  CMReturnObjectPath(result, path);
  CMReturnInstance(result, instance);
  const Results results = RecordingBroker::read(result);
  EXPECT_EQ(std::vector{known}, results.paths);
  ASSERT_EQ(1U, results.instances.size());
  EXPECT_EQ(list(CMPI_stringA, {text("a"), null(CMPI_string)}), results.instances[0]["List"]);
  EXPECT_EQ(ref(known), results.instances[0]["Far"]);
  EXPECT_THAT(broker.calls().only({"returnInstance"}), ElementsAre("returnInstance(another broker's object)"));
}

TEST(RecordingBroker, PathsOfAClassLoseTheirHandlesWhenOneOfAnotherIsMade) {
  RecordingBroker broker;
  broker.loseHandles("ZORVA_X", "ZORVA_Y");
  const auto make = [&](const char* name) { return CMNewObjectPath(broker.cmpi(), "root/cimv2", name, nullptr); };
  const CMPIObjectPath* victim = make("ZORVA_X");
  const CMPIObjectPath* other = make("ZORVA_Z");
  EXPECT_NE(nullptr, victim->hdl);
  const CMPIObjectPath* occasion = make("ZORVA_Y");
  EXPECT_EQ(nullptr, victim->hdl);
  EXPECT_NE(nullptr, other->hdl);
  EXPECT_NE(nullptr, occasion->hdl);
  EXPECT_NE(nullptr, make("ZORVA_X")->hdl);
}

TEST(RecordingBroker, CountsTheCallsOfSeveralThreads) {
  RecordingBroker broker;
  std::vector<std::thread> threads;
  for (int t = 0; t < 4; ++t) {
    threads.emplace_back([&broker] {
      for (int i = 0; i < 100; ++i) {
        CMPIObjectPath* path = makeEndpointPath(broker.cmpi());
        CMSetHostname(path, "host1");
      }
    });
  }
  for (std::thread& thread : threads) thread.join();
  EXPECT_EQ(1200U, broker.callCount());
  EXPECT_EQ(400U, broker.callsOf("setHostname"));
  EXPECT_EQ(400U, broker.mark());
}

TEST(RecordingBroker, UnusedSlotsAnswerNotSupported) {
  RecordingBroker broker;
  const CMPIObjectPath* path = broker.make(Path("ZORVA_X"));
  CMPIStatus status{};
  EXPECT_EQ(nullptr, broker.cmpi()->bft->execQuery(broker.cmpi(), nullptr, path, "q", "l", &status));
  EXPECT_EQ(CMPI_RC_ERR_NOT_SUPPORTED, status.rc);
  EXPECT_EQ(CMPI_RC_ERR_NOT_SUPPORTED, broker.cmpi()->bft->deleteInstance(broker.cmpi(), nullptr, path).rc);
  EXPECT_EQ(nullptr, broker.cmpi()->xft->newMutex(0));
}

TEST(RecordingBroker, NoSlotIsEmpty) {
  RecordingBroker broker;
  const auto allFilled = [](const void* table, std::size_t start, std::size_t size) {
    for (std::size_t at = start; at < size; at += sizeof(void*)) {
      if (*reinterpret_cast<void* const*>(static_cast<const char*>(table) + at) == nullptr) return false;
    }
    return true;
  };
  const CMPIBroker* cmpi = broker.cmpi();
  EXPECT_TRUE(allFilled(cmpi->bft, 8, sizeof *cmpi->bft));
  EXPECT_TRUE(allFilled(cmpi->eft, 8, sizeof *cmpi->eft));
  EXPECT_TRUE(allFilled(cmpi->xft, 8, sizeof *cmpi->xft));
  EXPECT_TRUE(allFilled(cmpi->mft, 8, sizeof *cmpi->mft));
  EXPECT_TRUE(allFilled(&ObjectTables::path, 8, sizeof ObjectTables::path));
  EXPECT_TRUE(allFilled(&ObjectTables::instance, 8, sizeof ObjectTables::instance));
  EXPECT_TRUE(allFilled(&ObjectTables::result, 8, sizeof ObjectTables::result));
  EXPECT_TRUE(allFilled(&ObjectTables::dateTime, 8, sizeof ObjectTables::dateTime));
}

TEST(RecordingBroker, LongAndOddTextsAreShownShortAndPlain) {
  EXPECT_EQ("\"a\\\"b\\\\\\n\\t\\x01\"", inQuotes("a\"b\\\n\t\x01"));
  EXPECT_EQ("\"" + std::string(400, 'x') + "\"... (1000 bytes)", inQuotes(std::string(1000, 'x')));
}

}  // namespace
}  // namespace ZV::Test
