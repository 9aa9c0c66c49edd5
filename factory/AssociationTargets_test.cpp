
#include <optional>
#include <set>
#include <string>
#include <utility>

#include "factory/DNSClientObjFactory.h"
#include "tests/support/Matchers.h"
#include "tests/support/RecordingBroker.h"
#include "tests/support/RecordingLogger.h"
#include "tests/support/World.h"

namespace ZV::Test {
namespace {

struct Row {
  const char* source;
  const char* association;
  const char* target;
  std::optional<std::string> text;
};

const Row kRows[] = {
    {"ZORVA_DNSProtocolEndPoint", "ZORVA_RemoteAccessAvailableToElement", "ZORVA_RemoteServiceAccessPoint",
     "Target Class is ZORVA_RemoteServiceAccessPoint"},
    {"ZORVA_RemoteServiceAccessPoint", "ZORVA_RemoteAccessAvailableToElement", "ZORVA_DNSProtocolEndPoint",
     "Target Class is ZORVA_DNSProtocolEndPointClass"},
    {"ZORVA_DNSProtocolEndPoint", "ZORVA_DNSSAPSAPDependency", "ZORVA_IPProtocolEndpoint",
     "Target Class is ZORVA_IPProtocolEndPoint"},
    {"ZORVA_IPProtocolEndpoint", "ZORVA_DNSSAPSAPDependency", "ZORVA_DNSProtocolEndPoint",
     "Target Class is ZORVA_DNSProtocolEndPointClass"},
    {"ZORVA_DNSProtocolEndPoint", "ZORVA_DNSHostedAccessPoint", "ZORVA_ComputerSystem",
     "Target Class is ZORVA_ComputerSystem"},
    {"ZORVA_ComputerSystem", "ZORVA_DNSHostedAccessPoint", "ZORVA_DNSProtocolEndPoint",
     "Target Class is ZORVA_DNSProtocolEndPoint"},
    {"ZORVA_DNSGeneralSettingData", "ZORVA_DNSGeneralElementSettingData", "ZORVA_ComputerSystem",
     "Target Class is ZORVA_ComputerSystem"},
    {"ZORVA_ComputerSystem", "ZORVA_DNSGeneralElementSettingData", "ZORVA_DNSGeneralSettingData",
     "Target Class is ZORVA_DNSGeneralSettingData"},
    {"ZORVA_DNSSettingData", "ZORVA_DNSEndPointElementSettingData", "ZORVA_DNSProtocolEndPoint",
     "Target Class is ZORVA_DNSProtocolEndPoint"},
    {"ZORVA_DNSProtocolEndPoint", "ZORVA_DNSEndPointElementSettingData", "ZORVA_DNSSettingData",
     "Target Class is ZORVA_DNSSettingData"},
    {"ZORVA_DNSGeneralSettingData", "ZORVA_DNSGenEndPointElementSettingData", "ZORVA_DNSProtocolEndPoint",
     "Target Class is ZORVA_DNSProtocolEndPoint"},
    {"ZORVA_DNSProtocolEndPoint", "ZORVA_DNSGenEndPointElementSettingData", "ZORVA_DNSGeneralSettingData",
     "Target Class is ZORVA_DNSGeneralSettingData"},
    {"ZORVA_DNSGeneralSettingData", "ZORVA_DNSGenOrderedComponent", "ZORVA_IPAssignmentSettingData", std::nullopt},
    {"ZORVA_IPAssignmentSettingData", "ZORVA_DNSGenOrderedComponent", "ZORVA_DNSGeneralSettingData", std::nullopt},
    {"ZORVA_DNSSettingData", "ZORVA_DNSOrderedComponent", "ZORVA_IPAssignmentSettingData", std::nullopt},
    {"ZORVA_IPAssignmentSettingData", "ZORVA_DNSOrderedComponent", "ZORVA_DNSSettingData", std::nullopt},
};

class AssociationTargets : public ::testing::Test {
 protected:
  AssociationTargets() { world.nic("eth0").nic("eth1").install(); }

  std::string targetOf(const std::string& source, const char* association, const char* right = nullptr) {
    return targetOf(broker.make(Path(source)), association, right);
  }
  std::string targetOf(const CMPIObjectPath* source, const char* association, const char* right = nullptr) {
    logger.clear();
    return DNSClientObjFactory().get_assoc_targetClass_Name(broker.cmpi(), source, association, right, &status);
  }
  CMPIObjectPath* pathOf(const Path& source, const char* association) {
    const CMPIObjectPath* ref = broker.make(source, "ref");
    broker.startOver();
    return DNSClientObjFactory().get_assoc_targetClass_ObjectPath(broker.cmpi(), ref, association, nullptr, &status);
  }
  // The instance in a slot that held `before` after the look-up.
  CMPIInstance* endpointOf(const std::string& interface, CMPIInstance* before = nullptr, bool isObjPath = true,
                           const char** properties = nullptr) {
    const CMPIObjectPath* ref = broker.make(Path("ZORVA_X", "root/lab"), "ref");
    CMPIInstance* slot = before;
    broker.beginRequest();
    EXPECT_EQ(0, DNSClientObjFactory().getDNSClientCMPIInstanceFromIPInterface(broker.cmpi(), ref, interface, slot,
                                                                               isObjPath, properties, &status));
    return slot;
  }
  std::vector<std::string> messages() const {
    return logger.pairs().ofFunction("get_assoc_targetClass_Name").ofKind(LineKind::Message).briefsWithCategory();
  }

  RecordingLogger logger;
  World world;
  RecordingBroker broker;
  CMPIStatus status{CMPI_RC_OK, nullptr};
};

// --- The class at the far end

TEST_F(AssociationTargets, EveryEndOfTheEightAssociationsLeadsToTheOther) {
  for (const Row& row : kRows) {
    SCOPED_TRACE(std::string(row.source) + ", " + row.association);
    EXPECT_EQ(row.target, targetOf(row.source, row.association));
    if (row.text.has_value()) {
      EXPECT_THAT(messages(), ElementsAre("Zorvagent.DNSObjFactory 4000 MESSAGE " + *row.text));
    } else {
      EXPECT_THAT(messages(), IsEmpty());
    }
    EXPECT_EQ(CMPI_RC_OK, status.rc);
  }
}

TEST_F(AssociationTargets, ClassThatIsNoEndOfTheAssociationLeadsNowhere) {
  std::set<std::pair<std::string, std::string>> ends;
  std::set<std::string> associations;
  for (const Row& row : kRows) {
    ends.emplace(row.source, row.association);
    associations.insert(row.association);
  }
  std::set<std::string> sources = associations;
  for (const Row& row : kRows) sources.insert(row.source);
  for (const std::string& source : sources) {
    for (const std::string& association : associations) {
      if (ends.contains({source, association})) continue;
      EXPECT_EQ("", targetOf(source, association.c_str())) << source << ", " << association;
      EXPECT_THAT(messages(), ElementsAre("Zorvagent.DNSObjFactory 4000 MESSAGE Target Class is EMPTY"));
    }
  }
}

TEST_F(AssociationTargets, NamesAreTakenExactly) {
  const char* const association = "ZORVA_DNSSAPSAPDependency";
  for (const char* source : {"zorva_DNSProtocolEndPoint", "ZORVA_DNSProtocolEndpoint", "CIM_DNSProtocolEndPoint",
                             "ZORVA_IPProtocolEndPoint", "ZORVA_DNSProtocolEndPoint ", ""}) {
    EXPECT_EQ("", targetOf(source, association)) << source;
  }
  for (const char* name : {"zorva_DNSSAPSAPDependency", "CIM_DNSSAPSAPDependency", "", "ZORVA_DNSSAPSAPDependenc"}) {
    EXPECT_EQ("", targetOf("ZORVA_DNSProtocolEndPoint", name)) << name;
  }
}

TEST_F(AssociationTargets, WithoutAnAssociationClassOrAPathThereIsNoFarEnd) {
  EXPECT_EQ("", targetOf("ZORVA_DNSProtocolEndPoint", nullptr));
  EXPECT_EQ("", targetOf(static_cast<const CMPIObjectPath*>(nullptr), "ZORVA_DNSSAPSAPDependency"));
  CMPIObjectPath* lost = broker.make(Path("ZORVA_DNSProtocolEndPoint"));
  lost->hdl = nullptr;
  EXPECT_EQ("", targetOf(lost, "ZORVA_DNSSAPSAPDependency"));
  EXPECT_THAT(messages(), ElementsAre(HasSubstr("Target Class is EMPTY")));
}

TEST_F(AssociationTargets, ClassOfTheSourceIsReadOnceAndOneThatCannotBeReadLeadsNowhere) {
  const CMPIObjectPath* source = broker.make(Path("ZORVA_IPAssignmentSettingData"), "ref");
  broker.startOver();
  EXPECT_EQ("ZORVA_DNSSettingData", targetOf(source, "ZORVA_DNSOrderedComponent"));
  EXPECT_EQ(1U, broker.callsOf("getClassName"));
  for (const char* slot : {"getClassName", "getCharPtr"}) {
    for (const Mode mode : {Mode::ReturnNull, Mode::NullHandle, Mode::RcAndNull}) {
      broker.failNext(slot, mode);
      EXPECT_EQ("", targetOf(source, "ZORVA_DNSOrderedComponent"));
    }
  }
}

// --- The path to the far end

TEST_F(AssociationTargets, FarEndPathHasTheSourcesNamespaceThisHostAndNoKeys) {
  const CMPIObjectPath* path = pathOf(Path("ZORVA_ComputerSystem", "root/lab"), "ZORVA_DNSHostedAccessPoint");
  EXPECT_EQ(Path("ZORVA_DNSProtocolEndPoint", "root/lab").on("host1"), RecordingBroker::read(path));
  EXPECT_THAT(broker.calls().steps(), ElementsAre(R"(newObjectPath("root/lab", "ZORVA_DNSProtocolEndPoint"))",
                                                  R"(OP1.setNameSpace("root/lab"))", R"(OP1.setHostname("host1"))"));
  const std::string list = ", _broker=ADDR ref=ADDR _RefLeftClass=ZORVA_DNSHostedAccessPoint _RefRightClass= rc=ADDR";
  EXPECT_THAT(logger.pairs().ofFunction("get_assoc_targetClass_ObjectPath").briefsWithCategory(),
              ElementsAre("Zorvagent.DNSObjFactory 3000 ENTERING get_assoc_targetClass_ObjectPath" + list));
}

// --- The endpoint of an interface

TEST_F(AssociationTargets, EndpointOfAnInterfaceIsMadeInTheSourcesNamespace) {
  const Instance endpoint = RecordingBroker::read(endpointOf("eth1"));
  EXPECT_EQ("ZORVA_DNSProtocolEndPoint", endpoint.path.className);
  EXPECT_EQ("root/lab", endpoint.path.nameSpace);
  EXPECT_EQ("eth1", endpoint["Name"].text());
  EXPECT_THAT(endpoint.names(), ElementsAre("SystemCreationClassName", "CreationClassName", "SystemName", "Name"));
}

TEST_F(AssociationTargets, FlagAndPropertyListReachTheEndpoint) {
  const char* wanted[] = {"NameFormat", nullptr};
  EXPECT_TRUE(RecordingBroker::read(endpointOf("eth0", nullptr, false)).has("EnabledState"));
  const Instance narrow = RecordingBroker::read(endpointOf("eth0", nullptr, false, wanted));
  EXPECT_TRUE(narrow.has("NameFormat"));
  EXPECT_FALSE(narrow.has("EnabledState"));
}

TEST_F(AssociationTargets, NameThatNoInterfaceHasLeavesTheSlotAsItWas) {
  CMPIInstance* const before = broker.make(Instance("ZORVA_X"));
  for (const std::string& name : {std::string("eth2"), std::string("ETH0"), std::string("eth"), std::string("eth00"),
                                  std::string(), std::string("eth0\0", 5), std::string(1 << 20, 'e')}) {
    EXPECT_EQ(before, endpointOf(name, before)) << name.substr(0, 8);
    EXPECT_THAT(broker.calls(), IsEmpty());
  }
}

TEST_F(AssociationTargets, EndpointThatCouldNotBeMadeReplacesTheSlotAndIsNoFailure) {
  CMPIInstance* const before = broker.make(Instance("ZORVA_X"));
  broker.failNext("newObjectPath", Mode::ReturnNull);
  EXPECT_EQ(nullptr, endpointOf("eth0", before));
  broker.failNext("newInstance", Mode::NullHandle);
  CMPIInstance* const lost = endpointOf("eth0", before);
  ASSERT_NE(nullptr, lost);
  EXPECT_EQ(nullptr, lost->hdl);
}

// --- The factory's view of the host

TEST_F(AssociationTargets, FailedReadOfTheEndpointsLeavesNoServersEitherAndIsNoFailure) {
  world.nic("eth2", {.servers = {"192.0.2.1"}}).installUnreadable();
  const DNSClientObjFactory factory;
  EXPECT_EQ(0, factory.getNumberOfDNSClientInstances());
  EXPECT_EQ(0, factory.getNumberOfDNSServerInstances());
}

TEST_F(AssociationTargets, EachFactorySeesTheHostAfresh) {
  EXPECT_EQ(2, DNSClientObjFactory().getNumberOfDNSClientInstances());
  world.nic("eth2", {.servers = {"192.0.2.1", "192.0.2.2"}}).install();
  EXPECT_EQ(3, DNSClientObjFactory().getNumberOfDNSClientInstances());
  EXPECT_EQ(2, DNSClientObjFactory().getNumberOfDNSServerInstances());
}

}  // namespace
}  // namespace ZV::Test
