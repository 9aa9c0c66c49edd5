#include "providers/testing/AssociationTestSupport.h"

extern "C" CMPIInstanceMI* DNSSAPSAPDependencyProvider_Create_InstanceMI(const CMPIBroker*, const CMPIContext*,
                                                                         CMPIStatus*);
extern "C" CMPIAssociationMI* DNSSAPSAPDependencyProvider_Create_AssociationMI(const CMPIBroker*, const CMPIContext*,
                                                                               CMPIStatus*);

namespace ZV::Test {

namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;

const char* const kAssociation = "ZORVA_DNSSAPSAPDependency";
const char* const kIpEndpoint = "ZORVA_IPProtocolEndpoint";
const char* const kEndpoint = "ZORVA_DNSProtocolEndPoint";
const char* const kBuilder = "DNSSAPSAPDependencyCMPIInstances";

const char* const kNoIpClass = "Create CMPIObjectPath failed for IpInterfaceClass.";
const char* const kNoNames = "CBEnumInstanceNames Failed for the target Class";
const char* const kBadEndpoint = "CMPIObjectPath is NULL for DNS Client";
const char* const kNoPathInBuilder = "Create CMPIObjectPath failed for \t\t\t\tDNSSAPSAPDependency.";
const char* const kNoPathInNames = "Create CMPIObjectPath failed for \t\t\t\tdnsSAPSAPDependencyClass.";

class SAPSAPDependency : public AssociationTest {
 protected:
  SAPSAPDependency()
      : AssociationTest({.className = kAssociation,
                         .left = "Antecedent",
                         .right = "Dependent",
                         .stem = "DNSSAPSAPDependency",
                         .builder = kBuilder,
                         .source = "providers/DNSSAPSAPDependencyProvider.cpp",
                         .category = "Zorvagent.DNSSAPSAPDependencyProvider",
                         .createInstanceMI = DNSSAPSAPDependencyProvider_Create_InstanceMI,
                         .createAssociationMI = DNSSAPSAPDependencyProvider_Create_AssociationMI,
                         .associationsAreDone = false}) {}

  // IP endpoints of these names, served by another provider.
  static std::vector<Instance> ipEndpoints(const std::vector<std::string>& names) {
    std::vector<Instance> all;
    for (const std::string& name : names) all.push_back(objectOf(ipEndpointPath(name)));
    return all;
  }
  void install(std::initializer_list<const char*> endpoints, const std::vector<std::string>& ipNames) {
    for (const char* name : endpoints) world.nic(name);
    world.install();
    broker.serve(kIpEndpoint, ipEndpoints(ipNames));
  }
  Path pair(const std::string& ipName, const std::string& name) const {
    return pairOf(ipEndpointPath(ipName), endpointPath(name));
  }
  std::function<Outcome()> names() {
    return [this] { return enumerateInstanceNames(); };
  }
  std::function<Outcome()> instances() {
    return [this] { return enumerateInstances(); };
  }
};

// --- Which names match

struct IpName {
  const char* name;
  bool isWhole;       // equals eth0
  bool beginsWithIt;  // its first token equals eth0
};
constexpr IpName kIpNames[] = {
    {"eth0", true, true},     {"eth0_1", false, true},      {"eth0_1_2", false, true}, {"eth0_", false, true},
    {"_eth0", false, true},   {"__eth0__1__", false, true}, {"_", false, false},       {"___", false, false},
    {"", false, false},       {"ETH0", false, false},       {"eth", false, false},     {"eth01", false, false},
    {"1_eth0", false, false}, {"eth0 _1", false, false},    {"eth0:1", false, false},
};

TEST_F(SAPSAPDependency, EnumerationsAndAssociatorsOfAnIpEndpointCompareWholeNames) {
  install({"eth0"}, {});
  for (const IpName& ip : kIpNames) {
    SCOPED_TRACE(ip.name);
    broker.serve(kIpEndpoint, ipEndpoints({ip.name}));
    const std::size_t count = ip.isWhole ? 1 : 0;
    EXPECT_EQ(count, enumerateInstanceNames().paths().size());
    EXPECT_EQ(count, enumerateInstances().instances().size());
    EXPECT_EQ(count, getInstance(pair(ip.name, "eth0")).instances().size());
    EXPECT_EQ(count, associators(ipEndpointPath(ip.name)).instances().size());
    EXPECT_EQ(count, associatorNames(ipEndpointPath(ip.name)).paths().size());
  }
}

TEST_F(SAPSAPDependency, ReferencesAndAssociatorsOfADnsEndpointCompareTheFirstToken) {
  install({"eth0"}, {});
  for (const IpName& ip : kIpNames) {
    SCOPED_TRACE(ip.name);
    broker.serve(kIpEndpoint, ipEndpoints({ip.name}));
    const std::vector<std::string> pairs(ip.beginsWithIt ? 1 : 0, std::string(ip.name) + " > eth0");
    EXPECT_EQ(pairs, pairsOf(references(endpointPath("eth0"))));
    EXPECT_EQ(pairs, pairsOf(referenceNames(endpointPath("eth0"))));
    EXPECT_EQ(pairs, pairsOf(references(ipEndpointPath(ip.name))));
    EXPECT_EQ(pairs, pairsOf(referenceNames(ipEndpointPath(ip.name))));
    EXPECT_EQ(pairs.size(), associators(endpointPath("eth0")).instances().size());
    EXPECT_EQ(pairs.size(), associatorNames(endpointPath("eth0")).paths().size());
  }
}

TEST_F(SAPSAPDependency, SameNameAtBothEndsIsOneAssociationInEveryOperation) {
  install({"eth0", "eth1"}, {"eth0", "eth2"});
  EXPECT_THAT(pairsOf(enumerateInstanceNames()), ElementsAre("eth0 > eth0"));
  EXPECT_THAT(pairsOf(enumerateInstances()), ElementsAre("eth0 > eth0"));
  EXPECT_THAT(pairsOf(getInstance(pair("eth0", "eth0"))), ElementsAre("eth0 > eth0"));
  EXPECT_THAT(textsOf(associators(endpointPath("eth0")).instances(), "Name"), ElementsAre("eth0"));
  EXPECT_THAT(textsOf(associatorNames(ipEndpointPath("eth0")).paths(), "Name"), ElementsAre("eth0"));
  EXPECT_THAT(pairsOf(references(endpointPath("eth0"))), ElementsAre("eth0 > eth0"));
  EXPECT_THAT(pairsOf(references(ipEndpointPath("eth0"))), ElementsAre("eth0 > eth0"));
}

TEST_F(SAPSAPDependency, OfTwoIpEndpointsWithOneFirstTokenTheFirstIsAssociatedAndBothAreReferred) {
  install({"eth0"}, {"eth1", "eth0_2", "eth0_1"});
  EXPECT_THAT(textsOf(associators(endpointPath("eth0")).instances(), "Name"), ElementsAre("eth0_2"));
  EXPECT_THAT(textsOf(associatorNames(endpointPath("eth0")).paths(), "Name"), ElementsAre("eth0_2"));
  EXPECT_THAT(pairsOf(references(endpointPath("eth0"))), ElementsAre("eth0_2 > eth0", "eth0_1 > eth0"));
  EXPECT_THAT(pairsOf(referenceNames(endpointPath("eth0"))), ElementsAre("eth0_2 > eth0", "eth0_1 > eth0"));
}

TEST_F(SAPSAPDependency, DnsEndpointWithAnUnderscoreInItsNameIsFoundByWholeNameAlone) {
  install({"eth0_1"}, {"eth0_1"});
  EXPECT_THAT(pairsOf(enumerateInstances()), ElementsAre("eth0_1 > eth0_1"));
  EXPECT_THAT(associators(ipEndpointPath("eth0_1")).instances(), SizeIs(1));
  EXPECT_THAT(associators(endpointPath("eth0_1")).instances(), IsEmpty());
  EXPECT_THAT(references(endpointPath("eth0_1")).instances(), IsEmpty());
  EXPECT_THAT(references(ipEndpointPath("eth0_1")).instances(), IsEmpty());
}

TEST_F(SAPSAPDependency, IpEndpointThatIsNotFoundIsNotPairedWithTheDnsEndpointBeforeIt) {
  install({"eth0", "eth1"}, {"eth9", "eth1", "eth9", "eth0", "eth9"});
  EXPECT_THAT(pairsOf(enumerateInstanceNames()), ElementsAre("eth1 > eth1", "eth0 > eth0"));
  EXPECT_THAT(pairsOf(enumerateInstances()), ElementsAre("eth1 > eth1", "eth0 > eth0"));
}

TEST_F(SAPSAPDependency, IpEndpointWithoutANameOrWithOneThatIsNoTextMatchesNothing) {
  install({"eth0"}, {});
  broker.serve(kIpEndpoint, {objectOf(Path(kIpEndpoint)), objectOf(Path(kIpEndpoint).key("Name", uint16(0)))});
  for (const Outcome& outcome : {enumerateInstanceNames(), enumerateInstances(), associators(endpointPath("eth0")),
                                 associatorNames(endpointPath("eth0")), references(endpointPath("eth0")),
                                 referenceNames(endpointPath("eth0"))}) {
    EXPECT_EQ(0U, outcome.instances().size() + outcome.paths().size());
    EXPECT_THAT(complaintsOf(outcome), IsEmpty());
  }
}

TEST_F(SAPSAPDependency, SourceWithoutANameMatchesNothing) {
  install({"eth0"}, {"eth0"});
  for (const Path& source : {Path(kEndpoint), Path(kIpEndpoint), Path(kIpEndpoint).key("Name", uint16(0)),
                             Path(kEndpoint).key("Name", ref(endpointPath("eth0")))}) {
    for (const Outcome& outcome :
         {associators(source), associatorNames(source), references(source), referenceNames(source)}) {
      EXPECT_EQ("not done, marked", endOf(outcome).at(1));
      EXPECT_EQ(0U, outcome.calls.count("returnInstance") + outcome.calls.count("returnObjectPath"));
    }
  }
}

// --- Enumerations

TEST_F(SAPSAPDependency, NamesLeaveTheIpEndpointAsTheBrokerGaveItAndAreDoneBeforeTheyAreMarked) {
  install({"eth0"}, {"eth0"});
  const Outcome names = enumerateInstanceNames();
  EXPECT_EQ(tell({entry(operation("EnumInstanceNames")),
                  {newPath(kIpEndpoint), "enumerateInstanceNames(OP1)", "E1.getNext()"},
                  newEndpoint("OP3", "I1", "eth0"),
                  {"I1.getObjectPath()"},
                  placed("OP4"),
                  newHostPath("OP5", kAssociation),
                  keyEnds("OP5", "OP2", "OP4"),
                  {"returnObjectPath(OP5)", "returnDone()"},
                  exitMark(operation("EnumInstanceNames"))}),
            storyOf(names));
}

TEST_F(SAPSAPDependency, InstancesAreDoneBeforeTheyAreMarked) {
  install({"eth0"}, {"eth0"});
  const Outcome all = enumerateInstances({"Name"});
  EXPECT_EQ(tell({entry(operation("EnumInstances")),
                  entry(kBuilder),
                  {newPath(kIpEndpoint), "enumerateInstanceNames(OP1)", "E1.getNext()"},
                  newEndpoint("OP3", "I1", "eth0", R"({"Name"})"),
                  {"I1.getObjectPath()"},
                  placed("OP4"),
                  newHostPath("OP5", kAssociation),
                  {"newInstance(OP5)", R"(I2.setPropertyFilter({"Name"}, {"Antecedent", "Dependent"}))"},
                  setEnds("I2", "OP2", "OP4"),
                  exitMark(kBuilder),
                  {"returnInstance(I2)", "returnDone()"},
                  exitMark(operation("EnumInstances"))}),
            storyOf(all));
}

TEST_F(SAPSAPDependency, AssociationsComeInTheBrokersOrder) {
  install({"eth0", "eth1"}, {"eth1", "eth0"});
  EXPECT_THAT(pairsOf(enumerateInstanceNames()), ElementsAre("eth1 > eth1", "eth0 > eth0"));
  EXPECT_THAT(pairsOf(enumerateInstances()), ElementsAre("eth1 > eth1", "eth0 > eth0"));
}

TEST_F(SAPSAPDependency, NothingToPairEndsRegularly) {
  install({}, {"eth0"});
  EXPECT_THAT(endOf(enumerateInstanceNames()), ElementsAre("CMPI_RC_OK", "done, marked"));
  EXPECT_THAT(endOf(enumerateInstances()), ElementsAre("CMPI_RC_OK", "done, marked"));
  broker.serve(kIpEndpoint);
  EXPECT_THAT(endOf(enumerateInstanceNames()), ElementsAre("CMPI_RC_OK", "done, marked"));
}

TEST_F(SAPSAPDependency, NamesLeaveOpenOnEveryFailureAndShowItsCode) {
  install({"eth0", "eth1"}, {"eth0", "eth1"});
  EXPECT_THAT(endOf(failing(newPath(kIpEndpoint), Mode::RcAndNull, names())),
              ElementsAre("CMPI_RC_ERR_FAILED", "not done, not marked", kNoIpClass));
  EXPECT_THAT(endOf(failing(newPath(kIpEndpoint), Mode::NullHandle, names())),
              ElementsAre("CMPI_RC_OK", "not done, not marked", kNoIpClass));
  EXPECT_THAT(endOf(failing("enumerateInstanceNames(", Mode::SetRc, names())),
              ElementsAre("CMPI_RC_ERR_FAILED", "not done, not marked", kNoNames));
  EXPECT_THAT(endOf(failing("getObjectPath()", Mode::RcAndNull, names())),
              ElementsAre("CMPI_RC_ERR_FAILED", "not done, not marked", kBadEndpoint));
  EXPECT_THAT(endOf(failing("getObjectPath()", Mode::NullHandle, names())),
              ElementsAre("CMPI_RC_OK", "not done, not marked", kBadEndpoint));
  EXPECT_THAT(endOf(failing(newPath(kAssociation), Mode::RcAndNull, names())),
              ElementsAre("CMPI_RC_ERR_FAILED", "not done, not marked", kNoPathInNames));
  EXPECT_THAT(pairsOf(failing(newPath(kAssociation), Mode::ReturnNull, names(), 2)), ElementsAre("eth0 > eth0"));
}

TEST_F(SAPSAPDependency, InstancesEndEmptyOnEveryFailureAndShowNoCode) {
  install({"eth0", "eth1"}, {"eth0", "eth1"});
  const auto expectEmpty = [this](const Outcome& outcome, const char* text) {
    EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "done, marked", text));
    EXPECT_EQ(0U, outcome.calls.count("returnInstance"));
    EXPECT_FALSE(outcome.lines.exited(kBuilder));
  };
  expectEmpty(failing(newPath(kIpEndpoint), Mode::RcAndNull, instances()), kNoIpClass);
  expectEmpty(failing(newPath(kIpEndpoint), Mode::NullHandle, instances()), kNoIpClass);
  expectEmpty(failing("enumerateInstanceNames(", Mode::SetRc, instances()), kNoNames);
  expectEmpty(failing("getObjectPath()", Mode::RcAndNull, instances(), 2), kBadEndpoint);
  expectEmpty(failing("getObjectPath()", Mode::NullHandle, instances(), 2), kBadEndpoint);
  expectEmpty(failing(newPath(kAssociation), Mode::RcAndNull, instances(), 2), kNoPathInBuilder);
}

TEST_F(SAPSAPDependency, InstanceThatCouldNotBeMadeIsLeftOut) {
  install({"eth0", "eth1"}, {"eth0", "eth1"});
  for (const Mode mode : {Mode::ReturnNull, Mode::NullHandle, Mode::RcAndNull}) {
    for (const std::size_t n : {1U, 2U}) {  // of the endpoint, and of the association
      const Outcome all = failing("newInstance(", mode, instances(), n);
      EXPECT_THAT(endOf(all), ElementsAre("CMPI_RC_OK", "done, marked"));
      EXPECT_THAT(all.calls.only({"returnInstance"}), SizeIs(1));
      EXPECT_THAT(pairsOf(all), ElementsAre("eth1 > eth1"));
    }
  }
}

// --- One instance

TEST_F(SAPSAPDependency, InstanceOfAPairIsFoundAndDoneBeforeItIsMarked) {
  install({"eth0", "eth1"}, {"eth0", "eth1"});
  const Outcome got = getInstance(pair("eth1", "eth1"), {{}});
  EXPECT_THAT(pairsOf(got), ElementsAre("eth1 > eth1"));
  const Story story = storyOf(got);
  EXPECT_EQ(tell({{"returnInstance(I4)", "returnDone()"}, exitMark(operation("GetInstance"))}),
            Story(story.end() - 4, story.end()));
}

TEST_F(SAPSAPDependency, PathThatNamesNoPairGivesAnEmptyCompletedResult) {
  install({"eth0", "eth1"}, {"eth0", "eth1"});
  const Path half = Path(kAssociation).key("Antecedent", ref(ipEndpointPath("eth0")));
  for (const Path& path : {pair("eth0", "eth1"), half, half.key("Dependent", "eth0")}) {
    const Outcome got = getInstance(path);
    EXPECT_THAT(endOf(got), ElementsAre("CMPI_RC_OK", "done, marked"));
    EXPECT_THAT(got.instances(), IsEmpty());
  }
  EXPECT_THAT(endOf(getInstance(associationClass())),
              ElementsAre("CMPI_RC_OK", "done, marked", "At least one key should be passed"));
}

// --- Associators and their names

TEST_F(SAPSAPDependency, AssociatorOfADnsEndpointIsReturnedAsTheBrokerMadeItWhateverTheList) {
  install({"eth0"}, {"eth0"});
  const Outcome found = associators(endpointPath("eth0"), {.properties = {"Name"}});
  EXPECT_EQ(tell({entry(operation("Associators")),
                  newHostPath("OP1", kIpEndpoint),
                  {"enumerateInstances(OP1)", "E1.getNext()", "returnInstance(I1)"},
                  exitMark(operation("Associators"))}),
            storyOf(found));
  EXPECT_EQ(tell({entry(operation("AssociatorNames")),
                  newHostPath("OP1", kIpEndpoint),
                  {"enumerateInstanceNames(OP1)", "E1.getNext()", "returnObjectPath(OP2)"},
                  exitMark(operation("AssociatorNames"))}),
            storyOf(associatorNames(endpointPath("eth0"))));
}

TEST_F(SAPSAPDependency, AssociatorOfAnIpEndpointComesFromTheSourcesPath) {
  install({"eth0"}, {});
  const Outcome found = associators(ipEndpointPath("eth0"), {.properties = {"Name"}});
  EXPECT_EQ(tell({entry(operation("Associators")),
                  newHostPath("OP1", kEndpoint),
                  newEndpoint("OP2", "I1", "eth0", R"({"Name"})"),
                  {"returnInstance(I1)"},
                  exitMark(operation("Associators"))}),
            storyOf(found));
  EXPECT_EQ(tell({entry(operation("AssociatorNames")),
                  newHostPath("OP1", kEndpoint),
                  newEndpoint("OP2", "I1", "eth0"),
                  {"I1.getObjectPath()", "returnObjectPath(OP3)"},
                  exitMark(operation("AssociatorNames"))}),
            storyOf(associatorNames(ipEndpointPath("eth0"))));
}

TEST_F(SAPSAPDependency, ResultClassIsTakenByItsTwoNamesInAnyCaseAndByNoOther) {
  install({"eth0"}, {"eth0"});
  expectResultClasses(endpointPath("eth0"), 1,
                      {nullptr, kIpEndpoint, "zorva_ipprotocolendpoint", "CIM_IPProtocolEndPoint",
                       "CIM_IPProtocolEndpoint", "cim_ipprotocolENDPOINT"},
                      {"", kEndpoint, "CIM_ProtocolEndpoint", "ZORVA_Nowhere"});
  expectResultClasses(
      ipEndpointPath("eth0"), 1,
      {nullptr, kEndpoint, "zorva_dnsprotocolendpoint", "CIM_DNSProtocolEndPoint", "cim_DNSPROTOCOLendpoint"},
      {"", kIpEndpoint, "CIM_ProtocolEndpoint", "ZORVA_Nowhere"});
}

TEST_F(SAPSAPDependency, ResultClassIsTestedBeforeTheOtherProviderIsAsked) {
  install({"eth0"}, {"eth0"});
  const AssociationQuery wrong = {.resultClass = "ZORVA_Nowhere"};
  EXPECT_EQ(0U, associators(endpointPath("eth0"), wrong).calls.count("enumerateInstances"));
  EXPECT_EQ(0U, associatorNames(endpointPath("eth0"), wrong).calls.count("enumerateInstanceNames"));
  EXPECT_THAT(endOf(associators(Path(kEndpoint), wrong)), ElementsAre("CMPI_RC_OK", "not done, not marked"));
}

TEST_F(SAPSAPDependency, DnsEndpointThatCouldNotBeMadeIsNotAssociated) {
  install({"eth0"}, {});
  const auto associators = [this] { return this->associators(ipEndpointPath("eth0")); };
  const auto names = [this] { return associatorNames(ipEndpointPath("eth0")); };
  EXPECT_EQ(0U, failing("newInstance(", Mode::ReturnNull, associators).calls.count("returnInstance"));
  EXPECT_EQ(0U, failing("newInstance(", Mode::ReturnNull, names).calls.count("returnObjectPath"));
  EXPECT_THAT(failing("newInstance(", Mode::NullHandle, associators).instances(), IsEmpty());
  EXPECT_THAT(failing("newInstance(", Mode::NullHandle, names).paths(), IsEmpty());
}

// --- References and their names

TEST_F(SAPSAPDependency, ReferencesOfADnsEndpointLeaveTheIpEndpointUntouched) {
  install({"eth0"}, {"eth0_1"});
  const Outcome found = references(endpointPath("eth0"));
  EXPECT_EQ(tell({entry(operation("References")),
                  newHostPath("OP1", kIpEndpoint),
                  newHostPath("OP2", kAssociation),
                  {"enumerateInstanceNames(OP1)", "E1.getNext()", "newInstance(OP2)"},
                  setEnds("I1", "OP3", "ref"),
                  {"returnInstance(I1)"},
                  exitMark(operation("References"))}),
            storyOf(found));
}

TEST_F(SAPSAPDependency, ReferencesOfAnIpEndpointPlaceTheDnsEndpoint) {
  install({"eth0"}, {});
  const Outcome found = references(ipEndpointPath("eth0_1"));
  EXPECT_EQ(tell({entry(operation("References")),
                  newHostPath("OP1", kEndpoint),
                  newHostPath("OP2", kAssociation),
                  newEndpointPath("OP3", "eth0"),
                  {"newInstance(OP2)"},
                  placed("OP3"),
                  setEnds("I1", "ref", "OP3"),
                  {"returnInstance(I1)"},
                  exitMark(operation("References"))}),
            storyOf(found));
}

TEST_F(SAPSAPDependency, ReferenceNamesAreThePathsOfInstancesOnTheSourcesNamespaceAndThisHost) {
  install({"eth0"}, {"eth0"});
  EXPECT_EQ(tell({entry(operation("ReferenceNames")),
                  newHostPath("OP1", kIpEndpoint),
                  newHostPath("OP2", kAssociation),
                  {"enumerateInstanceNames(OP1)", "E1.getNext()", "newInstance(OP2)"},
                  setEnds("I1", "OP3", "ref"),
                  {"I1.getObjectPath()"},
                  placed("OP4"),
                  {"returnObjectPath(OP4)"},
                  exitMark(operation("ReferenceNames"))}),
            storyOf(referenceNames(endpointPath("eth0"))));
  EXPECT_EQ(tell({entry(operation("ReferenceNames")),
                  newHostPath("OP1", kEndpoint),
                  newHostPath("OP2", kAssociation),
                  newEndpointPath("OP3", "eth0"),
                  {"newInstance(OP2)"},
                  placed("OP3"),
                  setEnds("I1", "ref", "OP3"),
                  {"I1.getObjectPath()"},
                  placed("OP4"),
                  {"returnObjectPath(OP4)"},
                  exitMark(operation("ReferenceNames"))}),
            storyOf(referenceNames(ipEndpointPath("eth0"))));
}

TEST_F(SAPSAPDependency, SourceThatDoesNotExistIsReferredToWhereItsNameFits) {
  install({"eth0"}, {"eth9"});
  EXPECT_THAT(pairsOf(references(endpointPath("eth9", "host2"))), ElementsAre("eth9 > eth9"));
  EXPECT_THAT(pairsOf(references(ipEndpointPath("eth0_77"))), ElementsAre("eth0_77 > eth0"));
}

TEST_F(SAPSAPDependency, ReferencesOfAnIpEndpointOnAHostWithoutEndpointsComplainAndLeaveOpen) {
  install({}, {});
  for (const Outcome& found : {references(ipEndpointPath("eth0")), referenceNames(ipEndpointPath("eth0"))}) {
    EXPECT_THAT(endOf(found), ElementsAre("CMPI_RC_OK", "not done, not marked", "getAllDNSClientCMPIObjPaths Failed"));
  }
}

TEST_F(SAPSAPDependency, DnsEndpointsThatCouldNotBeFetchedLeaveTheirCode) {
  install({"eth0"}, {});
  const Path source = ipEndpointPath("eth0");
  for (const std::function<Outcome()>& run :
       {std::function([&] { return references(source); }), std::function([&] { return referenceNames(source); })}) {
    EXPECT_THAT(endOf(failing(newPath(kEndpoint), Mode::RcAndNull, run, 2)),
                ElementsAre("CMPI_RC_ERR_FAILED", "not done, not marked", "getAllDNSClientCMPIObjPaths Failed"));
  }
}

TEST_F(SAPSAPDependency, ReferenceThatCouldNotBeMadeIsReturnedUnchanged) {
  install({"eth0"}, {"eth0"});
  for (const Path& source : {endpointPath("eth0"), ipEndpointPath("eth0")}) {
    EXPECT_THAT(
        failing("newInstance(", Mode::ReturnNull, [&] { return references(source); }).calls.only({"returnInstance"}),
        ElementsAre("returnInstance(null)"));
    EXPECT_THAT(failing("newInstance(", Mode::ReturnNull, [&] { return referenceNames(source); })
                    .calls.only({"returnObjectPath"}),
                ElementsAre("returnObjectPath(null)"));
  }
}

// --- The other provider, sources, arguments, failures

TEST_F(SAPSAPDependency, OtherProvidersFailureShowsItsCodeWhereverTheBrokerIsAskedButInTheBuilder) {
  install({"eth0"}, {});
  expectToEndAsTheOtherProviderHasIt(
      kIpEndpoint, ipEndpoints({"eth0", "eth0_1"}),
      {{names(), kNoNames, true},
       {instances(), kNoNames, false},
       {[this] { return getInstance(pair("eth0", "eth0")); }, kNoNames, false},
       {[this] { return associators(endpointPath("eth0")); }, "Call to CBEnumInstances of target Class Failed.", true},
       {[this] { return associatorNames(endpointPath("eth0")); }, kNoNames, true},
       {[this] { return references(endpointPath("eth0")); }, kNoNames, true},
       {[this] { return referenceNames(endpointPath("eth0")); }, kNoNames, true}});
}

TEST_F(SAPSAPDependency, IpEndpointsProviderIsNotNeededFromAnIpEndpoint) {
  world.nic("eth0").install();
  EXPECT_THAT(associators(ipEndpointPath("eth0")).instances(), SizeIs(1));
  EXPECT_THAT(associatorNames(ipEndpointPath("eth0")).paths(), SizeIs(1));
  EXPECT_THAT(references(ipEndpointPath("eth0")).instances(), SizeIs(1));
  EXPECT_THAT(referenceNames(ipEndpointPath("eth0")).paths(), SizeIs(1));
}

TEST_F(SAPSAPDependency, SourceOfAClassAtNeitherEndHasNoFarEnd) {
  install({"eth0"}, {"eth0"});
  for (const Path& source : {systemPath("host1"), serverPath("192.0.2.1"),
                             Path("ZORVA_IPProtocolEndPoint").key("Name", "eth0")}) {  // the P is small
    expectNoFarEnd(source, {"Object Path is NULL in Associators.", "Object Path is NULL in AssociatorNames.",
                            "Object Path is NULL in References.", "Object Path is NULL in ReferenceNames."});
  }
}

TEST_F(SAPSAPDependency, AssociationClassOfAnotherAssociationLeadsToItsFarEnd) {
  install({"eth0"}, {"eth0"});
  const AssociationQuery servers = {.assocClass = "ZORVA_RemoteAccessAvailableToElement"};
  EXPECT_THAT(endOf(associators(endpointPath("eth0"), servers)), ElementsAre("CMPI_RC_OK", "not done, marked"));
  EXPECT_THAT(endOf(associatorNames(endpointPath("eth0"), servers)), ElementsAre("CMPI_RC_OK", "not done, marked"));
  // Both associations have this end, found by the source's name.
  const AssociationQuery hosted = {.assocClass = "ZORVA_DNSHostedAccessPoint"};
  EXPECT_THAT(textsOf(associators(systemPath("eth0"), hosted).instances(), "Name"), ElementsAre("eth0"));
  EXPECT_THAT(associationProvider.associators(endpointPath("eth0"), {}).instances(), SizeIs(1));
  EXPECT_THAT(associationProvider.associatorNames(endpointPath("eth0"), {}).paths(), SizeIs(1));
}

TEST_F(SAPSAPDependency, RolesAndTheArgumentsOfReferencesAreNotRead) {
  install({"eth0"}, {"eth0"});
  expectUnreadArgumentsIgnored(endpointPath("eth0"));
  expectUnreadArgumentsIgnored(ipEndpointPath("eth0"));
}

TEST_F(SAPSAPDependency, EveryUpCallHasTheOperationsContext) {
  install({"eth0"}, {"eth0"});
  expectUpCallsInTheOperationsContext(allRequests(pair("eth0", "eth0"), endpointPath("eth0"), ipEndpointPath("eth0")),
                                      7);
}

TEST_F(SAPSAPDependency, EverythingLiesInTheNamespaceOfTheRequest) {
  install({"eth0"}, {"eth0"});
  expectTheRequestsNamespaceEverywhere(ipEndpointPath("eth0"), endpointPath("eth0"));
}

TEST_F(SAPSAPDependency, SurvivesEveryFailureOfTheBroker) {
  install({"eth0", "eth1"}, {"eth0", "eth1"});
  expectToSurviveEveryFailure(allRequests(pair("eth1", "eth1"), endpointPath("eth1"), ipEndpointPath("eth1")));
}

TEST_F(SAPSAPDependency, SurvivesEveryFailureOfTheTree) {
  install({"eth0", "eth1"}, {"eth0", "eth1"});
  expectToSurviveEveryTreeFailure(allRequests(pair("eth1", "eth1"), endpointPath("eth1"), ipEndpointPath("eth1")),
                                  {zorva::agent::TreeCall::Construct});
}

}  // namespace
}  // namespace ZV::Test
