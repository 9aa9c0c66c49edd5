// ZORVA_DNSSettingData as a CIM server reads it.
#include <gmock/gmock.h>
#include <sys/inotify.h>
#include <unistd.h>

#include <array>
#include <cstring>

#include "ProviderCall.h"
#include "World.h"
#include "providers/testing/DoneOrFailed.h"

extern "C" CMPIInstanceMI* DNSSettingDataProvider_Create_InstanceMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*);

namespace ZV::Test {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;

const Path kClass("ZORVA_DNSSettingData");
const std::string kMakeParameters = " broker=ADDR ref=ADDR data=ADDR properties=0 isObjPath=0 status=ADDR";

Path id(const char* instanceID) { return kClass.key("InstanceID", instanceID); }

// Counts how often a file is opened.
class OpenCounter {
 public:
  // Watches closing too, because the kernel merges equal events in a row.
  explicit OpenCounter(const std::string& path) : inotify_(::inotify_init1(IN_NONBLOCK | IN_CLOEXEC)) {
    ::inotify_add_watch(inotify_, path.c_str(), IN_OPEN | IN_CLOSE);
  }
  ~OpenCounter() { ::close(inotify_); }
  OpenCounter(const OpenCounter&) = delete;
  OpenCounter& operator=(const OpenCounter&) = delete;

  int take() {
    alignas(inotify_event) std::array<char, 4096> reports;
    const ssize_t got = ::read(inotify_, reports.data(), reports.size());
    int opened = 0;
    for (ssize_t at = 0; at < got;) {
      inotify_event event;
      std::memcpy(&event, reports.data() + at, sizeof event);
      if ((event.mask & IN_OPEN) != 0) ++opened;
      at += static_cast<ssize_t>(sizeof event) + static_cast<ssize_t>(event.len);
    }
    return opened;
  }

 private:
  int inotify_;
};

class DNSSettingDataProviderTest : public ::testing::Test {
 protected:
  std::string fileLine(const std::string& nic) const { return "log 4000 VARIABLE fileName = " + world_.filePath(nic); }
  std::vector<Value> idsOf(const Outcome& outcome) const {
    std::vector<Value> ids;
    for (const Instance& instance : outcome.instances()) ids.push_back(instance["InstanceID"]);
    return ids;
  }

  World world_;
  RecordingLogger logger_;
  RecordingBroker broker_;
  InstanceProvider provider_{DNSSettingDataProvider_Create_InstanceMI, broker_};
};

// --- whole operations

TEST_F(DNSSettingDataProviderTest, EnumeratedInstancesAreMadeFirstAndThenReturned) {
  world_.nic("eth0", usualNic()).bmc().nic("bmc0", {.isUnnamed = true}).install();
  world_.file("eth0", "DOMAINNAME=d\nHOSTNAME=h\nCONFIG_NAME=c\nDNSSERVERS=a b \n");
  const Outcome outcome = provider_.enumerateInstances(kClass);
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
  EXPECT_THAT(
      outcome.story(),
      ElementsAre(
          "log 4000 banner", "log 4000 ENTERING DNSSettingData_EnumInstances",
          "log 3000 ENTERING getAllDNSSettingDataCMPIInstances, broker=ADDR ref=ADDR properties=0 instances=ADDR "
          "status=ADDR",
          fileLine("eth0"), "log 3000 ENTERING makeDNSSettingDataInstance," + kMakeParameters,
          "newObjectPath(\"root/cimv2\", \"ZORVA_DNSSettingData\")", "OP1.setNameSpace(\"root/cimv2\")",
          "OP1.setHostname(\"host1\")", "newInstance(OP1)", "I1.setPropertyFilter(null, {\"InstanceID\"})",
          "I1.setProperty(\"InstanceID\", chars \"Computer%eth0\")",
          "I1.setProperty(\"Caption\", chars \"DNS Setting Configuration\")",
          "I1.setProperty(\"Description\", chars \"Represents DNS Setting Configuration for DNS Protocol EndPoint\")",
          "I1.setProperty(\"ElementName\", chars \"DNSSettingData.eth0\")",
          "I1.setProperty(\"AddressOrigin\", uint16 2)", "log 4000 VARIABLE domainName = d",
          "I1.setProperty(\"DomainName\", chars \"d\")", "log 4000 VARIABLE requestedHostname = h",
          "I1.setProperty(\"RequestedHostname\", chars \"h\")", "log 4000 VARIABLE configurationName = c",
          "I1.setProperty(\"ConfigurationName\", chars \"c\")",
          "I1.setProperty(\"UseSuffixWhenRegistering\", boolean false)", "newArray(2, string)", "newString(\"a\")",
          "A1.setElementAt(0, string \"a\")", "newString(\"b\")", "A1.setElementAt(1, string \"b\")",
          "I1.setProperty(\"DNSServerAddresses\", string[] {\"a\", \"b\"})", "newArray(3, uint16)",
          "A2.setElementAt(0, uint16 8)", "A2.setElementAt(1, uint16 14)", "A2.setElementAt(2, uint16 17)",
          "I1.setProperty(\"DHCPOptionsToUse\", uint16[] {8, 14, 17})",
          "log 3000 EXITING makeDNSSettingDataInstance," + kMakeParameters,
          // The second interface has no name, so its values are read from the file of the first.
          fileLine("eth0"), "log 3000 ENTERING makeDNSSettingDataInstance," + kMakeParameters,
          "newObjectPath(\"root/cimv2\", \"ZORVA_DNSSettingData\")", "OP2.setNameSpace(\"root/cimv2\")",
          "OP2.setHostname(\"host1\")", "newInstance(OP2)", "I2.setPropertyFilter(null, {\"InstanceID\"})",
          "I2.setProperty(\"Caption\", chars \"DNS Setting Configuration\")",
          "I2.setProperty(\"Description\", chars \"Represents DNS Setting Configuration for DNS Protocol EndPoint\")",
          "I2.setProperty(\"AddressOrigin\", uint16 2)", "log 4000 VARIABLE domainName = d",
          "I2.setProperty(\"DomainName\", chars \"d\")", "log 4000 VARIABLE requestedHostname = h",
          "I2.setProperty(\"RequestedHostname\", chars \"h\")", "log 4000 VARIABLE configurationName = c",
          "I2.setProperty(\"ConfigurationName\", chars \"c\")",
          "I2.setProperty(\"UseSuffixWhenRegistering\", boolean false)", "newArray(2, string)", "newString(\"a\")",
          "A3.setElementAt(0, string \"a\")", "newString(\"b\")", "A3.setElementAt(1, string \"b\")",
          "I2.setProperty(\"DNSServerAddresses\", string[] {\"a\", \"b\"})", "newArray(3, uint16)",
          "A4.setElementAt(0, uint16 8)", "A4.setElementAt(1, uint16 14)", "A4.setElementAt(2, uint16 17)",
          "I2.setProperty(\"DHCPOptionsToUse\", uint16[] {8, 14, 17})",
          "log 3000 EXITING makeDNSSettingDataInstance," + kMakeParameters, "returnInstance(I1)", "returnInstance(I2)",
          "returnDone()", "log 4000 EXITING DNSSettingData_EnumInstances", "log 4000 banner"));
}

TEST_F(DNSSettingDataProviderTest, EnumeratedNamesAreMadeFirstAndThenReturned) {
  world_.nic("eth0", usualNic()).nic("x", {.isUnnamed = true}).bmc().nic("bmc0").install();
  const Outcome outcome = provider_.enumerateInstanceNames(kClass.in("root/other"));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
  const std::string parameters = " broker=ADDR ref=ADDR paths=ADDR status=ADDR";
  EXPECT_THAT(outcome.story(),
              ElementsAre("log 4000 banner", "log 4000 ENTERING DNSSettingData_EnumInstanceNames",
                          "log 3000 ENTERING getAllDNSSettingDataCMPIObjectPaths," + parameters, fileLine("eth0"),
                          "newObjectPath(\"root/other\", \"ZORVA_DNSSettingData\")", "OP1.setNameSpace(\"root/other\")",
                          "OP1.setHostname(\"host1\")", "OP1.addKey(\"InstanceID\", chars \"Computer%eth0\")",
                          fileLine("eth0"), "newObjectPath(\"root/other\", \"ZORVA_DNSSettingData\")",
                          "OP2.setNameSpace(\"root/other\")", "OP2.setHostname(\"host1\")", fileLine("bmc0"),
                          "newObjectPath(\"root/other\", \"ZORVA_DNSSettingData\")", "OP3.setNameSpace(\"root/other\")",
                          "OP3.setHostname(\"host1\")", "OP3.addKey(\"InstanceID\", chars \"BMC%bmc0\")",
                          "returnObjectPath(OP1)", "returnObjectPath(OP2)", "returnObjectPath(OP3)", "returnDone()",
                          "log 4000 EXITING DNSSettingData_EnumInstanceNames", "log 4000 banner"));
}

TEST_F(DNSSettingDataProviderTest, OneInstanceIsMadeAndReturned) {
  world_.nic("eth0").nic("eth1", usualNic()).install();
  const Outcome outcome = provider_.getInstance(id("Computer%eth1"), {"DomainName"});
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
  EXPECT_THAT(
      outcome.story(),
      ElementsAre(
          "log 4000 banner", "log 4000 ENTERING DNSSettingData_GetInstance",
          "log 3000 ENTERING getOneDNSSettingDataCMPIInstance, broker=ADDR ref=ADDR properties=ADDR "
          "instance=ADDR status=ADDR",
          fileLine("eth0"), fileLine("eth1"),
          "log 3000 ENTERING makeDNSSettingDataInstance, broker=ADDR ref=ADDR data=ADDR properties=ADDR "
          "isObjPath=0 status=ADDR",
          "newObjectPath(\"root/cimv2\", \"ZORVA_DNSSettingData\")", "OP1.setNameSpace(\"root/cimv2\")",
          "OP1.setHostname(\"host1\")", "newInstance(OP1)", "I1.setPropertyFilter({\"DomainName\"}, {\"InstanceID\"})",
          "I1.setProperty(\"InstanceID\", chars \"Computer%eth1\")",
          "I1.setProperty(\"DomainName\", chars \"example.org\")",
          "log 3000 EXITING makeDNSSettingDataInstance, broker=ADDR ref=ADDR data=ADDR properties=ADDR "
          "isObjPath=0 status=ADDR",
          "returnInstance(I1)", "returnDone()", "log 4000 EXITING DNSSettingData_GetInstance", "log 4000 banner"));
}

TEST_F(DNSSettingDataProviderTest, LinesSayWhichSourceAndFunctionTheyAreFrom) {
  world_.nic("eth0", usualNic()).install();
  const LogLines lines = provider_.enumerateInstances(kClass).lines;
  const LogLine& entry = lines.at(1);
  EXPECT_EQ("Zorvagent.DNSSettingDataProvider", entry.category);
  EXPECT_EQ("markProviderEntry", entry.function);
  EXPECT_EQ("trace/Trace.h", entry.file);
  EXPECT_EQ("providers/DNSSettingDataProvider.cpp", entry.fileInText());
  const LogLine& below = lines.at(2);
  EXPECT_EQ("Zorvagent.DNSObjFactory", below.category);
  EXPECT_EQ("getAllDNSSettingDataCMPIInstances", below.function);
  EXPECT_EQ("factory/DNSSettingDataObjects.cpp", below.file);
  EXPECT_EQ("factory/DNSSettingDataObjects.cpp", below.fileInText());
  const LogLine& cursor = lines.at(3);
  EXPECT_EQ("Zorvagent.DNSSettingDataProvider", cursor.category);
  EXPECT_EQ("settings/DNSSettingData.cpp", cursor.file);
}

// --- values

TEST_F(DNSSettingDataProviderTest, ADomainNameAloneComesWithTheKeyAndReadsTheFileOnce) {
  world_.nic("eth0", usualNic()).install().file("eth0", "DOMAINNAME=d\n");
  OpenCounter opens(world_.filePath("eth0"));
  const Outcome outcome = provider_.getInstance(id("Computer%eth0"), {"DomainName"});
  ASSERT_THAT(outcome.instances(), SizeIs(1));
  EXPECT_THAT(outcome.instances()[0].names(), ElementsAre("InstanceID", "DomainName"));
  EXPECT_EQ(1, opens.take());
}

TEST_F(DNSSettingDataProviderTest, AWholeInstanceReadsTheFileOnceForEachOfItsFourValues) {
  world_.nic("eth0", usualNic()).install().file("eth0", "DOMAINNAME=d\n");
  OpenCounter opens(world_.filePath("eth0"));
  provider_.enumerateInstances(kClass);
  EXPECT_EQ(4, opens.take());
  provider_.enumerateInstances(kClass, {});
  provider_.enumerateInstanceNames(kClass);
  EXPECT_EQ(0, opens.take());
}

TEST_F(DNSSettingDataProviderTest, PropertiesThatTheClassLacksAreIgnored) {
  world_.nic("eth0", usualNic()).install();
  const Outcome outcome = provider_.getInstance(id("Computer%eth0"), {"Name", "Caption"});
  ASSERT_THAT(outcome.instances(), SizeIs(1));
  EXPECT_THAT(outcome.instances()[0].names(), ElementsAre("InstanceID", "Caption"));
}

TEST_F(DNSSettingDataProviderTest, AnInterfaceWithoutANameIsDeliveredWithoutIdentity) {
  world_.nic("x", {.isUnnamed = true}).install();
  const Outcome outcome = provider_.enumerateInstances(kClass);
  ASSERT_THAT(outcome.instances(), SizeIs(1));
  EXPECT_THAT(outcome.instances()[0].names(),
              ElementsAre("Caption", "Description", "AddressOrigin", "ConfigurationName", "UseSuffixWhenRegistering",
                          "DHCPOptionsToUse"));
  EXPECT_TRUE(outcome.done());
}

TEST_F(DNSSettingDataProviderTest, AnEmptyKeyFindsTheInterfaceWithoutAName) {
  world_.nic("eth0").nic("x", {.domain = "nameless.example.org", .isUnnamed = true}).install();
  for (const Path& path : {id(""), kClass}) {
    const Outcome outcome = provider_.getInstance(path);
    ASSERT_THAT(outcome.instances(), SizeIs(1));
    EXPECT_EQ(chars("nameless.example.org"), outcome.instances()[0]["DomainName"]);
    EXPECT_FALSE(outcome.instances()[0].has("InstanceID"));
  }
}

TEST_F(DNSSettingDataProviderTest, OfTwoInterfacesOfOneNameTheFirstIsFound) {
  world_.nic("eth0", {.domain = "first"}).nic("eth0", {.domain = "second"}).install();
  const Outcome outcome = provider_.getInstance(id("Computer%eth0"));
  ASSERT_THAT(outcome.instances(), SizeIs(1));
  EXPECT_EQ(chars("first"), outcome.instances()[0]["DomainName"]);
}

TEST_F(DNSSettingDataProviderTest, WithoutInterfacesThereIsNothingAndThatIsDone) {
  world_.host().install();
  for (const Outcome& outcome : {provider_.enumerateInstances(kClass), provider_.enumerateInstanceNames(kClass)}) {
    EXPECT_EQ(CMPI_RC_OK, outcome.rc);
    EXPECT_THAT(outcome.calls.steps(), ElementsAre("returnDone()"));
    EXPECT_TRUE(outcome.markedExit());
  }
}

TEST_F(DNSSettingDataProviderTest, InterfacesOfTheServiceProcessorCountInTreeOrder) {
  world_.bmc().nic("bmc0").host().nic("eth1").nic("eth0").install();
  EXPECT_THAT(idsOf(provider_.enumerateInstances(kClass)),
              ElementsAre(chars("BMC%bmc0"), chars("Computer%eth1"), chars("Computer%eth0")));
}

TEST_F(DNSSettingDataProviderTest, AFileWithoutServersLeavesThemOutEvenIfTheNodeHasThem) {
  world_.nic("eth0", usualNic()).install().file("eth0", "DNSSERVERS=\n");
  EXPECT_FALSE(provider_.enumerateInstances(kClass).instances().at(0).has("DNSServerAddresses"));
}

TEST_F(DNSSettingDataProviderTest, AMissingFileCostsTheConfigurationNameAlone) {
  world_.nic("eth0", usualNic()).install();
  const Instance instance = provider_.enumerateInstances(kClass).instances().at(0);
  EXPECT_EQ(chars(""), instance["ConfigurationName"]);
  EXPECT_EQ(chars("example.org"), instance["DomainName"]);
  EXPECT_EQ(chars("host1"), instance["RequestedHostname"]);
  EXPECT_EQ(texts({"192.0.2.53"}), instance["DNSServerAddresses"]);
}

TEST(DNSSettingDataProvider, CountsNamesInSixteenBits) {
  World world;
  for (int i = 0; i < 65536 + 2; ++i) world.nic(std::to_string(i));
  world.install();
  RecordingBroker broker;
  broker.keepsLines = false;
  InstanceProvider provider(DNSSettingDataProvider_Create_InstanceMI, broker);
  EXPECT_THAT(provider.enumerateInstanceNames(kClass).paths(), SizeIs(2));
}

// --- failures

TEST_F(DNSSettingDataProviderTest, AnUnknownInstanceIDIsLoggedAndAnsweredWithNothingLeftOpen) {
  world_.nic("eth0").install();
  const Outcome outcome = provider_.getInstance(id("Computer%eth9"));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
  EXPECT_THAT(outcome.calls.steps(), IsEmpty());
  EXPECT_THAT(outcome.errors(), ElementsAre("getOneDNSSettingDataCMPIInstance Failed"));
  const LogLine& last = outcome.lines.back();
  EXPECT_EQ("Zorvagent.DNSSettingDataProvider", last.category);
  EXPECT_EQ("DNSSettingData_GetInstance", last.function);
  EXPECT_EQ("providers/DNSSettingDataProvider.cpp", last.file);
}

TEST_F(DNSSettingDataProviderTest, AMissingKeyIsAnsweredWithTheBrokersCode) {
  world_.nic("eth0").install();
  const Outcome outcome = provider_.getInstance(kClass);
  EXPECT_EQ(broker_.missingKey.rc, outcome.rc);
  EXPECT_THAT(outcome.errors(), ElementsAre("getOneDNSSettingDataCMPIInstance Failed"));
  EXPECT_FALSE(outcome.done());
  EXPECT_FALSE(outcome.markedExit());
}

TEST_F(DNSSettingDataProviderTest, AnInstanceThatCannotBeMadeIsReturnedAsTheBrokerMadeIt) {
  world_.nic("eth0").nic("eth1").install();
  broker_.failNext("newObjectPath", Mode::ReturnNull);
  const Outcome one = provider_.getInstance(id("Computer%eth0"));
  EXPECT_EQ(CMPI_RC_OK, one.rc);
  EXPECT_THAT(one.calls.only({"returnInstance", "returnDone"}), ElementsAre("returnInstance(null)", "returnDone()"));
  EXPECT_TRUE(one.markedExit());
  EXPECT_THAT(one.errors(), IsEmpty());
  broker_.failNext("newInstance", Mode::NullHandle);
  const Outcome all = provider_.enumerateInstances(kClass);
  EXPECT_EQ(CMPI_RC_OK, all.rc);
  EXPECT_THAT(all.calls.only({"returnInstance", "returnDone"}),
              ElementsAre("returnInstance(I1(no handle))", "returnInstance(I2)", "returnDone()"));
  EXPECT_TRUE(all.markedExit());
}

TEST_F(DNSSettingDataProviderTest, APathThatCannotBeMadeLeavesTheNamesOpenWithTheTextOfTheInstances) {
  world_.nic("eth0").nic("eth1").install();
  for (const Mode mode : {Mode::ReturnNull, Mode::NullHandle, Mode::RcAndNull}) {
    broker_.failNext("newObjectPath", mode);
    const Outcome outcome = provider_.enumerateInstanceNames(kClass);
    EXPECT_EQ(CMPI_RC_OK, outcome.rc);
    EXPECT_EQ(0U, outcome.calls.count("returnObjectPath"));
    EXPECT_FALSE(outcome.done());
    EXPECT_FALSE(outcome.markedExit());
    EXPECT_THAT(outcome.errors(),
                ElementsAre("getAllDNSSettingDataCMPIObjectPaths failed", "getAllDNSSettingDataCMPIInstances Failed"));
    EXPECT_EQ("DNSSettingData_EnumInstanceNames", outcome.lines.back().function);
  }
}

TEST_F(DNSSettingDataProviderTest, AnArrayThatCannotBeMadeIsLoggedAndTheInstanceDelivered) {
  world_.nic("eth0", usualNic()).install();
  broker_.failNext("newArray", Mode::RcAndNull);
  const Outcome outcome = provider_.enumerateInstances(kClass);
  EXPECT_EQ(CMPI_RC_ERR_FAILED, outcome.rc);  // as the broker left it
  ASSERT_THAT(outcome.instances(), SizeIs(1));
  EXPECT_FALSE(outcome.instances()[0].has("DNSServerAddresses"));
  EXPECT_FALSE(outcome.instances()[0].has("DHCPOptionsToUse"));
  EXPECT_THAT(outcome.errors(), ElementsAre("Create Array for Property DNSServerAddresses failed."));
  EXPECT_TRUE(outcome.done());
  EXPECT_TRUE(outcome.markedExit());
}

TEST_F(DNSSettingDataProviderTest, ATreeThatCannotBeReadFliesOn) {
  world_.installUnreadable();
  EXPECT_THROW(provider_.enumerateInstances(kClass), std::runtime_error);
  EXPECT_THROW(provider_.enumerateInstanceNames(kClass), std::runtime_error);
  EXPECT_THROW(provider_.getInstance(id("Computer%eth0")), std::runtime_error);
  EXPECT_THAT(logger_.pairs().errors(), IsEmpty());
}

TEST_F(DNSSettingDataProviderTest, WhateverTheBrokerFailsAtEachOperationEndsInOneOfItsWays) {
  world_.nic("eth0", usualNic()).nic("eth1", usualNic()).install();
  const std::size_t tried =
      forEachFailure(broker_,
                     [&](std::size_t, Mode mode) {
                       const std::size_t objects = broker_.mark();
                       try {
                         const Outcome instances = provider_.enumerateInstances(kClass);
                         EXPECT_TRUE(calledDone(instances));
                         EXPECT_EQ(2U, instances.calls.count("returnInstance"));
                         expectDoneOrFailed(instances);
                         const Outcome names = provider_.enumerateInstanceNames(kClass);
                         EXPECT_EQ(calledDone(names) ? 2U : 0U, names.calls.count("returnObjectPath"));
                         expectDoneOrFailed(names);
                         const Outcome one = provider_.getInstance(id("Computer%eth1"));
                         EXPECT_EQ(calledDone(one) ? 1U : 0U, one.calls.count("returnInstance"));
                         expectDoneOrFailed(one);
                       } catch (const InjectedFailure&) {
                         EXPECT_EQ(Mode::Throw, mode);
                       }
                       broker_.freeSince(objects);
                     },
                     {Mode::SetRc, Mode::ReturnNull, Mode::NullHandle, Mode::RcAndNull, Mode::Throw});
  EXPECT_GT(tried, 400U);
}

TEST_F(DNSSettingDataProviderTest, WhateverTheTreeThrowsFliesOn) {
  world_.nic("eth0", usualNic()).install();
  std::size_t flown = 0;
  const std::size_t tried = forEachTreeFailure([&](std::size_t, Thrown) {
    try {
      provider_.enumerateInstances(kClass);
      provider_.enumerateInstanceNames(kClass);
      provider_.getInstance(id("Computer%eth0"));
    } catch (...) {
      ++flown;
    }
  });
  EXPECT_EQ(tried, flown);
  EXPECT_GT(tried, 60U);
}

TEST_F(DNSSettingDataProviderTest, WithoutResultAndPathNothingBreaks) {
  world_.nic("eth0").install();
  CMPIInstanceMI* mi = provider_.mi();
  EXPECT_EQ(CMPI_RC_OK, mi->ft->enumerateInstances(mi, nullptr, nullptr, nullptr, nullptr).rc);
  EXPECT_EQ(CMPI_RC_OK, mi->ft->enumerateInstanceNames(mi, nullptr, nullptr, nullptr).rc);
  EXPECT_EQ(CMPI_RC_OK, mi->ft->getInstance(mi, nullptr, nullptr, nullptr, nullptr).rc);
}

}  // namespace
}  // namespace ZV::Test
