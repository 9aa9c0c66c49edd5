// ZORVA_DNSGeneralSettingData as a CIM server reads it.
#include <gmock/gmock.h>

#include "ProviderCall.h"
#include "World.h"
#include "providers/testing/DoneOrFailed.h"

extern "C" CMPIInstanceMI* DNSGeneralSettingDataProvider_Create_InstanceMI(const CMPIBroker*, const CMPIContext*,
                                                                           CMPIStatus*);

namespace ZV::Test {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;

const Path kClass("ZORVA_DNSGeneralSettingData");
Path id(const char* instanceID) { return kClass.key("InstanceID", instanceID); }

const char* const kMake = "makeDNSGeneralSettingDataInstance, broker=ADDR ref=ADDR data=ADDR properties=";

class DNSGeneralSettingDataProviderTest : public ::testing::Test {
 protected:
  DNSGeneralSettingDataProviderTest() { world_.host("myhost"); }

  // The reading operations, each with its own request.
  std::vector<Outcome> readAll() {
    return {provider_.enumerateInstances(kClass), provider_.enumerateInstanceNames(kClass),
            provider_.getInstance(id("dnsgen1:myhost"))};
  }

  World world_;
  RecordingLogger logger_;
  RecordingBroker broker_;
  InstanceProvider provider_{DNSGeneralSettingDataProvider_Create_InstanceMI, broker_};
};

// --- whole operations

TEST_F(DNSGeneralSettingDataProviderTest, TheEnumeratedInstanceIsMadeAndReturned) {
  world_.nic("eth0", usualNic()).install().file("eth0", "CONFIG_NAME=c\nDNSSUFFIXES=a b \n");
  const Outcome outcome = provider_.enumerateInstances(kClass);
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
  EXPECT_THAT(
      outcome.story(),
      ElementsAre(
          "log 4000 banner", "log 4000 ENTERING DNSGeneralSettingData_EnumInstances",
          "log 3000 ENTERING getAllDNSGeneralSettingDataCMPIInstances, broker=ADDR ref=ADDR properties=0 "
          "instances=ADDR status=ADDR",
          "log 4000 VARIABLE nodeString = Computer",
          std::string("log 3000 ENTERING ") + kMake + "0 isObjPath=0 status=ADDR",
          "newObjectPath(\"root/cimv2\", \"ZORVA_DNSGeneralSettingData\")", "OP1.setNameSpace(\"root/cimv2\")",
          "OP1.setHostname(\"myhost\")", "newInstance(OP1)", "I1.setPropertyFilter(null, {\"InstanceID\"})",
          "I1.setProperty(\"InstanceID\", chars \"dnsgen1:myhost\")",
          "I1.setProperty(\"Caption\", chars \"DNS General Configuration\")",
          "I1.setProperty(\"Description\", chars \"Represents DNS General Configuration for DNS Protocol EndPoint\")",
          "I1.setProperty(\"ElementName\", chars \"DNSGeneralSettingData\")", "log 4000 VARIABLE configurationName = c",
          "I1.setProperty(\"ConfigurationName\", chars \"c\")", "I1.setProperty(\"AddressOrigin\", uint16 2)",
          "newArray(2, string)", "log 4000 VARIABLE dnsSuf = a", "newString(\"a\")", "A1.setElementAt(0, string \"a\")",
          "log 4000 VARIABLE dnsSuf = b", "newString(\"b\")", "A1.setElementAt(1, string \"b\")",
          "I1.setProperty(\"DNSSuffixesToAppend\", string[] {\"a\", \"b\"})",
          std::string("log 3000 EXITING ") + kMake + "0 isObjPath=0 status=ADDR",
          "log 3000 EXITING getAllDNSGeneralSettingDataCMPIInstances, broker=ADDR ref=ADDR properties=0 "
          "instances=ADDR status=ADDR",
          "returnInstance(I1)", "returnDone()", "log 4000 EXITING DNSGeneralSettingData_EnumInstances",
          "log 4000 banner"));
}

TEST_F(DNSGeneralSettingDataProviderTest, TheEnumeratedNameIsMadeAndReturned) {
  world_.nic("eth0", usualNic()).nic("eth1").install();
  const Outcome outcome = provider_.enumerateInstanceNames(kClass.in("root/other"));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
  const std::string parameters = " broker=ADDR ref=ADDR paths=ADDR status=ADDR";
  EXPECT_THAT(
      outcome.story(),
      ElementsAre("log 4000 banner", "log 4000 ENTERING DNSGeneralSettingData_EnumInstanceNames",
                  "log 3000 ENTERING getAllDNSGeneralSettingDataCMPIObjectPaths," + parameters,
                  "log 4000 VARIABLE nodeString = Computer",
                  "newObjectPath(\"root/other\", \"ZORVA_DNSGeneralSettingData\")", "OP1.setNameSpace(\"root/other\")",
                  "OP1.setHostname(\"myhost\")", "OP1.addKey(\"InstanceID\", chars \"dnsgen1:myhost\")",
                  "log 3000 EXITING getAllDNSGeneralSettingDataCMPIObjectPaths," + parameters, "returnObjectPath(OP1)",
                  "returnDone()", "log 4000 EXITING DNSGeneralSettingData_EnumInstanceNames", "log 4000 banner"));
}

TEST_F(DNSGeneralSettingDataProviderTest, TheOneInstanceIsMadeAndReturned) {
  world_.nic("eth0", usualNic()).install();
  const Outcome outcome = provider_.getInstance(id("dnsgen1:myhost"), {"AddressOrigin"});
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
  const std::string parameters = " broker=ADDR ref=ADDR properties=ADDR instances=ADDR status=ADDR";
  EXPECT_THAT(
      outcome.story(),
      ElementsAre("log 4000 banner", "log 4000 ENTERING DNSGeneralSettingData_GetInstance",
                  "log 3000 ENTERING getOneDNSGeneralSettingDataCMPIInstance," + parameters,
                  "log 4000 VARIABLE nodeString = Computer",
                  std::string("log 3000 ENTERING ") + kMake + "ADDR isObjPath=0 status=ADDR",
                  "newObjectPath(\"root/cimv2\", \"ZORVA_DNSGeneralSettingData\")", "OP1.setNameSpace(\"root/cimv2\")",
                  "OP1.setHostname(\"myhost\")", "newInstance(OP1)",
                  "I1.setPropertyFilter({\"AddressOrigin\"}, {\"InstanceID\"})",
                  "I1.setProperty(\"InstanceID\", chars \"dnsgen1:myhost\")",
                  "I1.setProperty(\"AddressOrigin\", uint16 2)",
                  std::string("log 3000 EXITING ") + kMake + "ADDR isObjPath=0 status=ADDR",
                  "log 3000 EXITING getOneDNSGeneralSettingDataCMPIInstance," + parameters, "returnInstance(I1)",
                  "returnDone()", "log 4000 EXITING DNSGeneralSettingData_GetInstance", "log 4000 banner"));
}

TEST_F(DNSGeneralSettingDataProviderTest, LinesSayWhichSourceAndFunctionTheyAreFrom) {
  world_.nic("eth0", usualNic()).install();
  const LogLines lines = provider_.enumerateInstances(kClass).lines;
  EXPECT_EQ("Zorvagent.DNSGeneralSettingDataProvider", lines.at(1).category);
  EXPECT_EQ("providers/DNSGeneralSettingDataProvider.cpp", lines.at(1).fileInText());
  EXPECT_EQ("Zorvagent.DNSObjFactory", lines.at(2).category);
  EXPECT_EQ("getAllDNSGeneralSettingDataCMPIInstances", lines.at(2).function);
  EXPECT_EQ("factory/DNSGeneralSettingDataObjects.cpp", lines.at(2).file);
  EXPECT_EQ("Zorvagent.DNSSettingDataProvider", lines.at(3).category);
  EXPECT_EQ("settings/DNSGeneralSettingData.cpp", lines.at(3).file);
}

// --- values

TEST_F(DNSGeneralSettingDataProviderTest, TheInstanceIDOfAnotherSystemGivesTheInstanceOfThisOne) {
  world_.nic("eth0", usualNic()).install();
  for (const char* instanceID : {"dnsgen1:elsewhere", "", "x"}) {
    const Outcome outcome = provider_.getInstance(id(instanceID));
    EXPECT_EQ(CMPI_RC_OK, outcome.rc);
    ASSERT_THAT(outcome.instances(), SizeIs(1));
    EXPECT_EQ(chars("dnsgen1:myhost"), outcome.instances()[0]["InstanceID"]);
    EXPECT_TRUE(outcome.markedExit());
  }
}

TEST_F(DNSGeneralSettingDataProviderTest, AMissingKeyGivesTheInstanceAndTheBrokersCode) {
  world_.nic("eth0").install();
  const Outcome outcome = provider_.getInstance(kClass);
  EXPECT_EQ(broker_.missingKey.rc, outcome.rc);
  EXPECT_THAT(outcome.instances(), SizeIs(1));
  EXPECT_TRUE(outcome.done());
}

TEST_F(DNSGeneralSettingDataProviderTest, TheInstanceIDIsTheKeyOfThePath) {
  world_.nic("eth0").install();
  EXPECT_EQ(provider_.enumerateInstances(kClass).instances().at(0)["InstanceID"],
            provider_.enumerateInstanceNames(kClass).paths().at(0)["InstanceID"]);
}

TEST_F(DNSGeneralSettingDataProviderTest, WithTheServiceProcessorsInterfacesAloneThereIsNothingAndNoError) {
  world_.bmc().nic("bmc0", usualNic()).install();
  for (const Outcome& outcome : readAll()) {
    EXPECT_EQ(CMPI_RC_OK, outcome.rc);
    EXPECT_THAT(outcome.calls.steps(), ElementsAre("returnDone()"));
    EXPECT_TRUE(outcome.markedExit());
    EXPECT_THAT(outcome.errors(), IsEmpty());
  }
}

TEST_F(DNSGeneralSettingDataProviderTest, AMissingFileGivesAnEmptyConfigurationNameAndTheSuffixesOfTheNode) {
  world_.nic("eth0", usualNic()).install();
  const Instance instance = provider_.enumerateInstances(kClass).instances().at(0);
  EXPECT_EQ(chars(""), instance["ConfigurationName"]);
  EXPECT_EQ(texts({"example.org"}), instance["DNSSuffixesToAppend"]);
}

TEST_F(DNSGeneralSettingDataProviderTest, AnInterfaceWithoutANameReadsTheFileWithoutOne) {
  world_.nic("x", {.isUnnamed = true}).install().file("", "CONFIG_NAME=nameless\n");
  const Outcome outcome = provider_.enumerateInstances(kClass);
  ASSERT_THAT(outcome.instances(), SizeIs(1));
  EXPECT_EQ(chars("nameless"), outcome.instances()[0]["ConfigurationName"]);
  EXPECT_EQ(chars("dnsgen1:myhost"), outcome.instances()[0]["InstanceID"]);
  EXPECT_THAT(outcome.errors(), ElementsAre("Name Property is not available from Instrumentation",
                                            "Name Property is not available from Instrumentation"));
}

// --- failures

TEST_F(DNSGeneralSettingDataProviderTest, APathThatCannotBeMadeLeavesTheNamesOpenWithoutACode) {
  world_.nic("eth0").install();
  for (const Mode mode : {Mode::ReturnNull, Mode::NullHandle, Mode::RcAndNull}) {
    broker_.failNext("newObjectPath", mode);
    const Outcome outcome = provider_.enumerateInstanceNames(kClass);
    EXPECT_EQ(CMPI_RC_OK, outcome.rc);
    EXPECT_EQ(0U, outcome.calls.count("returnObjectPath"));
    EXPECT_FALSE(outcome.done());
    EXPECT_FALSE(outcome.markedExit());
    EXPECT_THAT(outcome.errors(), ElementsAre("getAllDNSGeneralSettingDataCMPIObjectPaths failed",
                                              "getAllDNSGeneralSettingDataCMPIObjectPaths Failed"));
    const LogLine& last = outcome.lines.back();
    EXPECT_EQ("Zorvagent.DNSGeneralSettingDataProvider", last.category);
    EXPECT_EQ("DNSGeneralSettingData_EnumInstanceNames", last.function);
    EXPECT_EQ("providers/DNSGeneralSettingDataProvider.cpp", last.file);
  }
}

TEST_F(DNSGeneralSettingDataProviderTest, AnInstanceThatCannotBeMadeIsReturnedAsTheBrokerMadeIt) {
  world_.nic("eth0").install();
  broker_.failEach("newInstance", Mode::ReturnNull);
  for (const Outcome& outcome : {provider_.enumerateInstances(kClass), provider_.getInstance(id("x"))}) {
    EXPECT_EQ(CMPI_RC_OK, outcome.rc);
    EXPECT_THAT(outcome.calls.only({"returnInstance", "returnDone"}),
                ElementsAre("returnInstance(null)", "returnDone()"));
    EXPECT_TRUE(outcome.markedExit());
    EXPECT_THAT(outcome.errors(), IsEmpty());
  }
}

TEST_F(DNSGeneralSettingDataProviderTest, AnArrayThatCannotBeMadeIsLoggedAndTheInstanceDelivered) {
  world_.nic("eth0", usualNic()).install();
  broker_.failNext("newArray", Mode::RcAndNull);
  const Outcome outcome = provider_.enumerateInstances(kClass);
  EXPECT_EQ(CMPI_RC_ERR_FAILED, outcome.rc);  // as the broker left it
  ASSERT_THAT(outcome.instances(), SizeIs(1));
  EXPECT_FALSE(outcome.instances()[0].has("DNSSuffixesToAppend"));
  EXPECT_THAT(outcome.errors(), ElementsAre("Create Array for Property DNSSuffixesToAppend failed."));
  EXPECT_TRUE(outcome.markedExit());
}

TEST_F(DNSGeneralSettingDataProviderTest, ATreeThatCannotBeReadIsLoggedAndAnsweredWithNothing) {
  world_.installUnreadable();
  for (const Outcome& outcome : readAll()) {
    EXPECT_EQ(CMPI_RC_OK, outcome.rc);
    EXPECT_THAT(outcome.calls.steps(), ElementsAre("returnDone()"));
    EXPECT_TRUE(outcome.markedExit());
    EXPECT_THAT(outcome.errors(), ElementsAre("Select Node for NetworkIPConfig failed"));
  }
}

TEST_F(DNSGeneralSettingDataProviderTest, WhateverTheBrokerFailsAtEachOperationEndsInOneOfItsWays) {
  world_.nic("eth0", usualNic()).install();
  const std::size_t tried =
      forEachFailure(broker_,
                     [&](std::size_t, Mode mode) {
                       const std::size_t objects = broker_.mark();
                       try {
                         const std::vector<Outcome> outcomes = readAll();
                         for (const Outcome& outcome : outcomes) expectDoneOrFailed(outcome);
                         EXPECT_TRUE(calledDone(outcomes[0]));
                         EXPECT_TRUE(calledDone(outcomes[2]));
                         EXPECT_EQ(1U, outcomes[0].calls.count("returnInstance"));
                         EXPECT_EQ(calledDone(outcomes[1]) ? 1U : 0U, outcomes[1].calls.count("returnObjectPath"));
                         EXPECT_EQ(1U, outcomes[2].calls.count("returnInstance"));
                       } catch (const InjectedFailure&) {
                         EXPECT_EQ(Mode::Throw, mode);
                       }
                       broker_.freeSince(objects);
                     },
                     {Mode::SetRc, Mode::ReturnNull, Mode::NullHandle, Mode::RcAndNull, Mode::Throw});
  EXPECT_GT(tried, 200U);
}

TEST_F(DNSGeneralSettingDataProviderTest, WhateverTheTreeThrowsFliesOnUnlessItIsTheSelection) {
  world_.nic("eth0", usualNic()).install();
  std::size_t flown = 0;
  const std::size_t tried = forEachTreeFailure([&](std::size_t, Thrown) {
    try {
      readAll();
    } catch (...) {
      ++flown;
    }
  });
  EXPECT_EQ(tried - 2 * 3, flown);  // each of the three operations selects once
  EXPECT_GT(tried, 40U);
}

TEST_F(DNSGeneralSettingDataProviderTest, WithoutResultAndPathNothingBreaks) {
  world_.nic("eth0").install();
  CMPIInstanceMI* mi = provider_.mi();
  EXPECT_EQ(CMPI_RC_OK, mi->ft->enumerateInstances(mi, nullptr, nullptr, nullptr, nullptr).rc);
  EXPECT_EQ(CMPI_RC_OK, mi->ft->enumerateInstanceNames(mi, nullptr, nullptr, nullptr).rc);
  EXPECT_EQ(CMPI_RC_OK, mi->ft->getInstance(mi, nullptr, nullptr, nullptr, nullptr).rc);
}

}  // namespace
}  // namespace ZV::Test
