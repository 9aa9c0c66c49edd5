// Common to all twelve providers: create functions, function tables, and the operations that do no work.

#include <set>

#include "tests/support/Matchers.h"
#include "tests/support/Providers.h"
#include "tests/support/World.h"

namespace ZV::Test {
namespace {

bool isModifiable(const Provider& provider) {
  return std::set<std::string>{"DNSClient", "DNSSettingData", "DNSGeneralSettingData"}.contains(provider.stem);
}

// Did nothing, and said nothing.
void expectNoWork(const Outcome& outcome, CMPIrc rc) {
  EXPECT_EQ(rc, outcome.rc);
  EXPECT_EQ(std::nullopt, outcome.message);
  EXPECT_THAT(outcome.calls, IsEmpty());
  EXPECT_THAT(outcome.lines, IsEmpty());
}

class EveryProvider : public ::testing::TestWithParam<Provider> {
 protected:
  static Path path() { return Path(GetParam().className); }

  RecordingLogger logger;
  RecordingBroker broker;
};

class EveryAssociationProvider : public EveryProvider {};

TEST_P(EveryProvider, IsMadeWithoutAStatusOrAContext) {
  ASSERT_NE(nullptr, GetParam().createInstanceMI(broker.cmpi(), nullptr, nullptr));
  EXPECT_EQ(0U, broker.callCount());
  EXPECT_EQ(0U, logger.size());
}

TEST_P(EveryProvider, LeavesTheStatusOfItsCreationUntouched) {
  CMPIStatus status{CMPI_RC_ERR_FAILED, broker.makeString("before")};
  const CMPIString* const before = status.msg;
  GetParam().createInstanceMI(broker.cmpi(), broker.makeContext(), &status);
  EXPECT_EQ(CMPI_RC_ERR_FAILED, status.rc);
  EXPECT_EQ(before, status.msg);
}

TEST_P(EveryProvider, AlwaysReturnsTheSameTable) {
  CMPIInstanceMI* const mi = GetParam().createInstanceMI(broker.cmpi(), nullptr, nullptr);
  EXPECT_EQ(nullptr, mi->hdl);
  EXPECT_EQ(200, mi->ft->ftVersion);
  EXPECT_EQ(200, mi->ft->miVersion);
  EXPECT_EQ("instance" + std::string(GetParam().prefix), mi->ft->miName);
  EXPECT_EQ(mi, GetParam().createInstanceMI(broker.cmpi(), nullptr, nullptr));
}

TEST_P(EveryProvider, HasNothingToCleanUp) {
  InstanceProvider provider(GetParam().createInstanceMI, broker);
  expectNoWork(provider.cleanup(true), CMPI_RC_OK);
  expectNoWork(provider.cleanup(false), CMPI_RC_OK);
}

TEST_P(EveryProvider, RefusesToMakeDeleteOrQuery) {
  InstanceProvider provider(GetParam().createInstanceMI, broker);
  expectNoWork(provider.createInstance(path(), Instance(GetParam().className)), CMPI_RC_ERR_NOT_SUPPORTED);
  expectNoWork(provider.deleteInstance(path()), CMPI_RC_ERR_NOT_SUPPORTED);
  expectNoWork(provider.execQuery(path(), "SELECT * FROM X", "CIM:CQL"), CMPI_RC_ERR_NOT_SUPPORTED);
}

TEST_P(EveryProvider, RefusesModificationUnlessItIsOneOfThree) {
  World world;
  world.host().install();
  InstanceProvider provider(GetParam().createInstanceMI, broker);
  const Outcome outcome = provider.modifyInstance(path(), Instance(GetParam().className));
  if (isModifiable(GetParam())) {
    EXPECT_TRUE(outcome.markedEntry());
  } else {
    expectNoWork(outcome, CMPI_RC_ERR_NOT_SUPPORTED);
  }
}

TEST_P(EveryProvider, RefusedOperationsUseNoneOfTheirArguments) {
  CMPIInstanceMI* const mi = GetParam().createInstanceMI(nullptr, nullptr, nullptr);
  EXPECT_EQ(CMPI_RC_OK, mi->ft->cleanup(nullptr, nullptr, 0).rc);
  EXPECT_EQ(CMPI_RC_ERR_NOT_SUPPORTED, mi->ft->createInstance(nullptr, nullptr, nullptr, nullptr, nullptr).rc);
  EXPECT_EQ(CMPI_RC_ERR_NOT_SUPPORTED, mi->ft->deleteInstance(nullptr, nullptr, nullptr, nullptr).rc);
  EXPECT_EQ(CMPI_RC_ERR_NOT_SUPPORTED, mi->ft->execQuery(nullptr, nullptr, nullptr, nullptr, nullptr, nullptr).rc);
}

TEST_P(EveryProvider, OpensItsOperationsUnderItsOwnNameAndCategory) {
  World world;
  world.host().install();
  InstanceProvider provider(GetParam().createInstanceMI, broker);
  const std::string stem = GetParam().stem;
  const std::string file = GetParam().file();
  const std::pair<std::string, Outcome> operations[] = {
      {"_EnumInstanceNames", provider.enumerateInstanceNames(path())},
      {"_EnumInstances", provider.enumerateInstances(path())},
      {"_GetInstance", provider.getInstance(path().key("Name", "x"))}};
  for (const auto& [operation, outcome] : operations) {
    EXPECT_TRUE(outcome.markedEntry()) << operation;
    EXPECT_TRUE(outcome.lines.entered(stem + operation, file)) << outcome;
    EXPECT_EQ(GetParam().category(), outcome.lines.at(1).category);
  }
}

TEST_P(EveryProvider, LatestCreationsBrokerServesAllItsTables) {
  World world;
  world.nic("eth0", usualNic()).install();
  InstanceProvider provider(GetParam().createInstanceMI, broker);
  RecordingBroker later;
  if (GetParam().createAssociationMI != nullptr) {
    const AssociationProvider other(GetParam().createAssociationMI, later);
  } else {
    const InstanceProvider other(GetParam().createInstanceMI, later);
  }
  provider.enumerateInstances(path());
  EXPECT_EQ(0U, broker.callsOf("newObjectPath"));
  EXPECT_LT(0U, later.callsOf("newObjectPath"));
}

// A host with an interface, and what can be null in a request of it.
class NullArguments {
 public:
  NullArguments() { world_.host().nic("eth0", usualNic()).install(); }

  // Runs a request with each combination of a good path, one without a handle or none, and a result or none.
  template <typename Request>
  void forEach(const Path& path, const Request& request) {
    CMPIObjectPath* bare = broker.make(path);
    bare->hdl = nullptr;
    for (const CMPIObjectPath* ref : {broker.make(path), bare, static_cast<CMPIObjectPath*>(nullptr)}) {
      for (const CMPIResult* result : {broker.makeResult(), static_cast<CMPIResult*>(nullptr)}) request(ref, result);
    }
  }

  RecordingBroker broker;

 private:
  World world_;
};

TEST_P(EveryProvider, NullPathResultOrBrokerNeverEndsTheProcess) {
  NullArguments with;
  for (const CMPIBroker* given : {with.broker.cmpi(), static_cast<const CMPIBroker*>(nullptr)}) {
    CMPIInstanceMI* const mi = GetParam().createInstanceMI(given, nullptr, nullptr);
    with.forEach(GetParam().object(), [mi](const CMPIObjectPath* ref, const CMPIResult* result) {
      EXPECT_EQ(nullptr, mi->ft->enumerateInstanceNames(mi, nullptr, result, ref).msg);
      EXPECT_EQ(nullptr, mi->ft->enumerateInstances(mi, nullptr, result, ref, nullptr).msg);
      EXPECT_EQ(nullptr, mi->ft->getInstance(mi, nullptr, result, ref, nullptr).msg);
    });
  }
}

TEST_P(EveryAssociationProvider, NullPathResultOrBrokerNeverEndsTheProcess) {
  NullArguments with;
  const char* const own = GetParam().className;
  for (const CMPIBroker* given : {with.broker.cmpi(), static_cast<const CMPIBroker*>(nullptr)}) {
    CMPIAssociationMI* const mi = GetParam().createAssociationMI(given, nullptr, nullptr);
    for (const Path& source : {GetParam().left, GetParam().right}) {
      with.forEach(source, [mi, own](const CMPIObjectPath* ref, const CMPIResult* result) {
        mi->ft->associators(mi, nullptr, result, ref, own, nullptr, nullptr, nullptr, nullptr);
        mi->ft->associatorNames(mi, nullptr, result, ref, own, nullptr, nullptr, nullptr);
        mi->ft->references(mi, nullptr, result, ref, nullptr, nullptr, nullptr);
        mi->ft->referenceNames(mi, nullptr, result, ref, nullptr, nullptr);
      });
    }
  }
}

TEST_P(EveryAssociationProvider, ReturnsItsTable) {
  CMPIStatus status{CMPI_RC_ERR_FAILED, nullptr};
  CMPIAssociationMI* const mi = GetParam().createAssociationMI(broker.cmpi(), nullptr, &status);
  EXPECT_EQ(CMPI_RC_ERR_FAILED, status.rc);
  EXPECT_EQ(nullptr, mi->hdl);
  EXPECT_EQ(200, mi->ft->ftVersion);
  EXPECT_EQ(200, mi->ft->miVersion);
  EXPECT_EQ("association" + std::string(GetParam().prefix), mi->ft->miName);
  EXPECT_EQ(mi, GetParam().createAssociationMI(broker.cmpi(), nullptr, nullptr));
}

TEST_P(EveryAssociationProvider, HasNothingToCleanUpEither) {
  AssociationProvider provider(GetParam().createAssociationMI, broker);
  expectNoWork(provider.cleanup(true), CMPI_RC_OK);
  expectNoWork(provider.cleanup(false), CMPI_RC_OK);
}

TEST_P(EveryAssociationProvider, OpensItsOperationsUnderItsOwnNameAndCategory) {
  World world;
  world.host().install();
  AssociationProvider provider(GetParam().createAssociationMI, broker);
  const std::string stem = GetParam().stem;
  const std::string file = GetParam().file();
  const Path unknown = Path("ZORVA_Unknown");
  const std::pair<std::string, Outcome> operations[] = {{"_Associators", provider.associators(unknown, {})},
                                                        {"_AssociatorNames", provider.associatorNames(unknown, {})},
                                                        {"_References", provider.references(unknown)},
                                                        {"_ReferenceNames", provider.referenceNames(unknown)}};
  for (const auto& [operation, outcome] : operations) {
    EXPECT_TRUE(outcome.markedEntry()) << operation;
    EXPECT_TRUE(outcome.lines.entered(stem + operation, file)) << outcome;
    EXPECT_EQ(GetParam().category(), outcome.lines.at(1).category);
  }
}

TEST_P(EveryAssociationProvider, LatestCreationsBrokerServesBothTables) {
  World world;
  world.nic("eth0", usualNic()).install();
  AssociationProvider provider(GetParam().createAssociationMI, broker);
  RecordingBroker later;
  InstanceProvider other(GetParam().createInstanceMI, later);
  other.enumerateInstances(path());
  EXPECT_LT(0U, later.callCount());
  EXPECT_EQ(0U, broker.callCount());
}

INSTANTIATE_TEST_SUITE_P(Of, EveryProvider, ::testing::ValuesIn(allProviders()), stemOf);
INSTANTIATE_TEST_SUITE_P(Of, EveryAssociationProvider, ::testing::ValuesIn(associationProviders()), stemOf);

TEST(ProviderFrame, TwelveProvidersHaveEightAssociations) {
  EXPECT_EQ(12U, allProviders().size());
  EXPECT_EQ(8U, associationProviders().size());
}

TEST(MethodProviderOfTheEndpoint, ReturnsItsTable) {
  RecordingBroker broker;
  CMPIMethodMI* const mi = DNSClientProvider_Create_MethodMI(broker.cmpi(), nullptr, nullptr);
  EXPECT_EQ(nullptr, mi->hdl);
  EXPECT_EQ(200, mi->ft->ftVersion);
  EXPECT_EQ(200, mi->ft->miVersion);
  EXPECT_STREQ("methodDNSClientProvider", mi->ft->miName);
  CMPIStatus status{CMPI_RC_ERR_FAILED, nullptr};
  EXPECT_EQ(mi, DNSClientProvider_Create_MethodMI(broker.cmpi(), nullptr, &status));
  EXPECT_EQ(CMPI_RC_ERR_FAILED, status.rc);
}

TEST(MethodProviderOfTheEndpoint, DoesNotSupportItsCleanup) {
  const RecordingLogger logger;
  RecordingBroker broker;
  MethodProvider provider(DNSClientProvider_Create_MethodMI, broker);
  expectNoWork(provider.cleanup(true), CMPI_RC_ERR_NOT_SUPPORTED);
  expectNoWork(provider.cleanup(false), CMPI_RC_ERR_NOT_SUPPORTED);
  EXPECT_EQ(CMPI_RC_ERR_NOT_SUPPORTED, provider.mi()->ft->cleanup(nullptr, nullptr, 1).rc);
}

TEST(MethodProviderOfTheEndpoint, SharesTheBrokerOfItsInstanceTable) {
  World world;
  world.nic("eth0", usualNic()).install();
  RecordingBroker broker;
  RecordingBroker later;
  InstanceProvider instances(DNSClientProvider_Create_InstanceMI, broker);
  const MethodProvider methods(DNSClientProvider_Create_MethodMI, later);
  instances.enumerateInstances(Path("ZORVA_DNSProtocolEndPoint"));
  EXPECT_EQ(1U, later.callsOf("newInstance"));
  EXPECT_EQ(0U, broker.callsOf("newInstance"));
}

TEST(SharedCategory, GeneralSettingDataLogsAsItsSiblingDoes) {
  World world;
  world.nic("eth0", usualNic()).install();
  const RecordingLogger logger;
  RecordingBroker broker;
  InstanceProvider general(DNSGeneralSettingDataProvider_Create_InstanceMI, broker);
  const LogLines lines = general.enumerateInstances(Path("ZORVA_DNSGeneralSettingData")).lines;
  std::set<std::string> categories;
  for (const LogLine& line : lines) {
    if (line.file == "settings/DNSGeneralSettingData.cpp") categories.insert(line.category);
  }
  EXPECT_THAT(categories, ElementsAre("Zorvagent.DNSSettingDataProvider"));
}

}  // namespace
}  // namespace ZV::Test
