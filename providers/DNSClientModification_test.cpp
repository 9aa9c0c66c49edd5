// ModifyInstance of ZORVA_DNSProtocolEndPoint, which writes to the nodes of the instrumentation tree.
#include <filesystem>

#include "providers/testing/ModificationTestSupport.h"

extern "C" CMPIInstanceMI* DNSClientProvider_Create_InstanceMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
extern "C" CMPIInstanceMI* DNSSettingDataProvider_Create_InstanceMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*);

namespace ZV::Test {
namespace {

using std::string_literals::operator""s;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::Optional;

constexpr const char* kClass = "ZORVA_DNSProtocolEndPoint";
constexpr const char* kFailed = "modifyDNSSettingDataCMPIInstance Failed";  // the text of the class for DNS settings
constexpr const char* kFile = "HOSTNAME=filehost\nDOMAINNAME=file.example.org\n";

const Instance kEmpty(kClass);
const Instance kWhole = kEmpty.with("DNSSuffixesToAppend", texts({"a.example.org", "b"}))
                            .with("DomainName", "new.example.org")
                            .with("Hostname", "newhost");

class DNSClientModification : public ::testing::Test {
 protected:
  DNSClientModification() { world_.nic("eth0", usualNic()).nic("eth1", usualNic()).install().file("eth0", kFile); }
  Outcome modify(const Instance& instance, const char* name = "eth0") {
    return provider_.modifyInstance(Path(kClass).key("Name", name), instance);
  }
  // The content of the n-th node: suffixes joined by blanks, domain name and host name.
  std::vector<std::string> node(std::size_t n) const {
    std::string suffixes;
    for (const std::string& suffix : world_.list(n, NodeLexicon::PROP_DNS_SUFFIXES).value_or(std::vector{"none"s})) {
      suffixes += (suffixes.empty() ? "" : " ") + suffix;
    }
    return {suffixes, world_.text(n, NodeLexicon::PROP_DOMAIN_NAME).value_or("none"),
            world_.text(n, NodeLexicon::PROP_HOST_NAME).value_or("none")};
  }
  // Undoes all changes.
  void restore() {
    for (const auto& entry : std::filesystem::directory_iterator(world_.dataDir())) {
      std::filesystem::remove_all(entry.path());
    }
  }

  World world_;
  RecordingLogger logger_;
  RecordingBroker broker_;
  InstanceProvider provider_{DNSClientProvider_Create_InstanceMI, broker_};
  const std::vector<std::string> asItWas_ = {"example.org", "example.org", "host1"};
  const std::vector<std::string> changed_ = {"a.example.org b", "new.example.org", "newhost"};
};

void expectFailed(const Outcome& outcome) {
  EXPECT_EQ(CMPI_RC_ERR_FAILED, outcome.rc);
  EXPECT_EQ(std::nullopt, outcome.message);
  EXPECT_EQ(kFailed, outcome.errors().back());
  EXPECT_EQ("Zorvagent.DNSClientProvider", outcome.lines.back().category);
  EXPECT_EQ("DNSClient_ModifyInstance", outcome.lines.back().function);
  EXPECT_EQ("providers/DNSClientProvider.cpp", outcome.lines.back().file);
  expectDoneWithoutExit(outcome);
}

// --- which properties count as present

TEST_F(DNSClientModification, TextsThatTheBrokerFailsToGiveLeaveWhatIsStored) {
  for (const std::size_t call : {5U, 7U}) {  // the calls that read the domain name and the host name
    for (const Mode mode : {Mode::SetRc, Mode::RcAndNull}) {
      SCOPED_TRACE(std::to_string(call) + ' ' + nameOf(mode));
      restore();
      broker_.startOver();
      broker_.failAt(call, mode);
      const Outcome outcome = modify(kEmpty.with("DomainName", "new.example.org").with("Hostname", "newhost"));
      EXPECT_EQ("getCharPtr", outcome.calls.at(call - 1).name);
      EXPECT_THAT(node(0), ElementsAre("example.org", call == 5 ? "example.org" : "new.example.org",
                                       call == 5 ? "newhost" : "host1"));
    }
  }
}

// --- a whole operation

TEST_F(DNSClientModification, SetsTheThreeValuesOfTheNodeInTheirOrder) {
  const Outcome outcome = modify(kWhole);
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
  EXPECT_EQ(std::nullopt, outcome.message);
  EXPECT_EQ(changed_, node(0));
  EXPECT_EQ(asItWas_, node(1));
  const std::string parameters = " broker=ADDR ref=ADDR properties=0 instance=ADDR status=ADDR";
  EXPECT_THAT(outcome.story(),
              ElementsAre("log 4000 banner", "log 4000 ENTERING DNSClient_ModifyInstance",
                          "log 3000 ENTERING modifyDNSProtocolEndpointCMPIInstance," + parameters,
                          "log 4000 VARIABLE nameKey = eth0", "log 4000 VARIABLE name = eth0",
                          "log 4000 VARIABLE dnsSuffixes.size() = 2", "log 4000 VARIABLE domainName = new.example.org",
                          "log 4000 VARIABLE hostName = newhost", "log 4000 VARIABLE name = eth1", "returnDone()"));
  EXPECT_THAT(outcome.calls.lines(),
              ElementsAre("ref.getKey(\"Name\")", "string \"eth0\".getCharPtr()",
                          "instance.getProperty(\"DNSSuffixesToAppend\")", "A1.getSize()", "A1.getElementAt(0)",
                          "string \"a.example.org\".getCharPtr()", "A1.getElementAt(1)", "string \"b\".getCharPtr()",
                          "instance.getProperty(\"DomainName\")", "string \"new.example.org\".getCharPtr()",
                          "instance.getProperty(\"Hostname\")", "string \"newhost\".getCharPtr()", "returnDone()"));
  for (const LogLine& line : outcome.lines.ofKind(LineKind::Variable)) {
    EXPECT_EQ("Zorvagent.DNSObjFactory", line.category);
    EXPECT_EQ("modifyDNSProtocolEndpointCMPIInstance", line.function);
    EXPECT_EQ("factory/InstanceModification.cpp", line.file);
  }
}

TEST_F(DNSClientModification, LeavesTheFileSoThatTheSettingDataStaysAsItWas) {
  modify(kWhole);
  EXPECT_EQ(kFile, world_.fileContent("eth0"));
  InstanceProvider settings(DNSSettingDataProvider_Create_InstanceMI, broker_);
  const Outcome outcome = settings.getInstance(Path("ZORVA_DNSSettingData").key("InstanceID", "Computer%eth0"));
  EXPECT_EQ(chars("file.example.org"), outcome.instances().at(0)["DomainName"]);
}

TEST_F(DNSClientModification, IsSeenByTheNextReader) {
  modify(kWhole);
  const Outcome outcome = provider_.getInstance(Path(kClass).key("Name", "eth0"));
  EXPECT_EQ(chars("new.example.org"), outcome.instances().at(0)["DomainName"]);
}

TEST_F(DNSClientModification, LeavesTheServersOfTheNodeAlone) {
  modify(kWhole.with("DNSServerAddresses", texts({"192.0.2.1"})));
  EXPECT_THAT(world_.list(0, NodeLexicon::PROP_DNS_SERVER_ADDRESSES), Optional(ElementsAre("192.0.2.53")));
}

TEST_F(DNSClientModification, ThePropertyListDecidesNothing) {
  EXPECT_EQ(CMPI_RC_OK, provider_.modifyInstance(Path(kClass).key("Name", "eth0"), kWhole, {"Caption"}).rc);
  EXPECT_EQ(changed_, node(0));
}

TEST_F(DNSClientModification, OnlyTheNameOfThePathIsRead) {
  const Path path = Path(kClass).key("Name", "eth1").key("SystemName", "elsewhere").key("CreationClassName", "x");
  EXPECT_EQ(CMPI_RC_OK, provider_.modifyInstance(path, kWhole).rc);
  EXPECT_EQ(asItWas_, node(0));
  EXPECT_EQ(changed_, node(1));
}

// --- which nodes

TEST_F(DNSClientModification, TwoNodesOfOneNameAreBothChanged) {
  world_.bmc().nic("eth0", usualNic()).install();
  EXPECT_EQ(CMPI_RC_OK, modify(kWhole).rc);
  EXPECT_EQ(changed_, node(0));
  EXPECT_EQ(asItWas_, node(1));
  EXPECT_EQ(changed_, node(2));
}

TEST_F(DNSClientModification, AnUnknownNameIsASuccessThatChangesNothing) {
  for (const char* name : {"eth9", "ETH0", "eth", ""}) {
    const Outcome outcome = modify(kWhole, name);
    EXPECT_EQ(CMPI_RC_OK, outcome.rc);
    EXPECT_THAT(outcome.errors(), IsEmpty());
    EXPECT_EQ(0U, outcome.calls.count("getProperty"));
    expectDoneWithoutExit(outcome);
  }
  EXPECT_EQ(asItWas_, node(0));
  EXPECT_EQ(asItWas_, node(1));
}

TEST_F(DNSClientModification, ANodeWithoutANameIsSkippedAndNotLogged) {
  World world;
  world.nic("x", {.domain = "nameless", .isUnnamed = true}).nic("eth0").install();
  const Outcome outcome = modify(kWhole, "");
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
  EXPECT_THAT(outcome.lines.ofKind(LineKind::Variable).briefs(),
              ElementsAre("4000 VARIABLE nameKey = ", "4000 VARIABLE name = eth0"));
  EXPECT_THAT(world.text(0, NodeLexicon::PROP_DOMAIN_NAME), Optional("nameless"s));
}

TEST_F(DNSClientModification, AMissingKeyIsAnsweredWithTheBrokersCode) {
  const Outcome outcome = provider_.modifyInstance(Path(kClass), kWhole);
  EXPECT_EQ(broker_.missingKey.rc, outcome.rc);
  EXPECT_THAT(outcome.errors(), IsEmpty());
  expectDoneWithoutExit(outcome);
  EXPECT_EQ(asItWas_, node(0));
}

// --- which properties count as present

TEST_F(DNSClientModification, PropertiesThatTheInstanceLacksDoNotChange) {
  const Outcome outcome = modify(kEmpty.with("Hostname", "newhost"));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
  EXPECT_THAT(node(0), ElementsAre("example.org", "example.org", "newhost"));
}

TEST_F(DNSClientModification, AMissingPropertyIsAnsweredWithTheBrokersCode) {
  const Outcome outcome = modify(kEmpty.with("DomainName", "new.example.org"));
  EXPECT_EQ(broker_.missingProperty.rc, outcome.rc);
  EXPECT_THAT(node(0), ElementsAre("example.org", "new.example.org", "host1"));
  EXPECT_THAT(outcome.errors(), IsEmpty());
  expectDoneWithoutExit(outcome);
}

TEST_F(DNSClientModification, NullPropertiesCountAsAbsent) {
  for (const auto state : std::initializer_list<CMPIValueState>{CMPI_nullValue, CMPI_notFound}) {
    const Outcome outcome = modify(kEmpty.with("DNSSuffixesToAppend", null(CMPI_stringA, state))
                                       .with("DomainName", null(CMPI_string, state))
                                       .with("Hostname", null(CMPI_string, state)));
    EXPECT_EQ(CMPI_RC_OK, outcome.rc);
    EXPECT_EQ(asItWas_, node(0));
  }
}

TEST_F(DNSClientModification, TheStatusOfAPropertyIsNotLookedAt) {
  broker_.failEach("getProperty", Mode::SetRc);
  modify(kWhole);
  EXPECT_EQ(changed_, node(0));
}

TEST_F(DNSClientModification, ValuesOfTheWrongKindAreSkipped) {
  EXPECT_EQ(
      CMPI_RC_OK,
      modify(kEmpty.with("DNSSuffixesToAppend", "a").with("DomainName", texts({"x"})).with("Hostname", uint16(1))).rc);
  EXPECT_EQ(asItWas_, node(0));
}

TEST_F(DNSClientModification, EmptyValuesAreSet) {
  EXPECT_EQ(CMPI_RC_OK,
            modify(kEmpty.with("DNSSuffixesToAppend", texts({})).with("DomainName", "").with("Hostname", "")).rc);
  EXPECT_THAT(node(0), ElementsAre("", "", ""));
}

TEST_F(DNSClientModification, NothingIsValidated) {
  modify(kEmpty.with("DNSSuffixesToAppend", texts({"a b", ".."})).with("DomainName", "x\ny").with("Hostname", "\"h\""));
  EXPECT_THAT(node(0), ElementsAre("a b ..", "x\ny", "\"h\""));
}

TEST_F(DNSClientModification, ElementsThatTheBrokerFailsToGiveOrThatHaveNoTextAreLeftOut) {
  for (const Mode mode : kAllStatusModes) {
    broker_.failNext("getElementAt", mode);
    modify(kWhole.with("DNSSuffixesToAppend", list(CMPI_stringA, {text("a"), null(CMPI_string), text(nameOf(mode))})));
    EXPECT_EQ(nameOf(mode), node(0).at(0));
  }
}

// --- failures

TEST_F(DNSClientModification, AnInstanceThatIsMissingFailsAndIsLogged) {
  CMPIInstance* withoutHandle = broker_.make(kWhole);
  withoutHandle->hdl = nullptr;
  CMPIInstanceMI* mi = provider_.mi();
  for (const CMPIInstance* instance :
       {static_cast<const CMPIInstance*>(nullptr), static_cast<const CMPIInstance*>(withoutHandle)}) {
    logger_.clear();
    broker_.startOver();
    const CMPIObjectPath* ref = broker_.make(Path(kClass).key("Name", "eth0"), "ref");
    const CMPIStatus status = mi->ft->modifyInstance(mi, nullptr, broker_.makeResult(), ref, instance, nullptr);
    EXPECT_EQ(CMPI_RC_ERR_FAILED, status.rc);
    EXPECT_EQ(nullptr, status.msg);
    EXPECT_THAT(logger_.pairs().errors(), ElementsAre("Instance to be Modified is NULL", kFailed));
    EXPECT_THAT(broker_.calls().lines(), ElementsAre("returnDone()"));
  }
}

TEST_F(DNSClientModification, ATreeThatCannotBeReadIsCaughtAndFails) {
  world_.installUnreadable("the reason is not told");
  const Outcome outcome = modify(kWhole);
  EXPECT_THAT(outcome.errors(), ElementsAre("Caught Exception : ", kFailed));
  EXPECT_EQ("modifyDNSProtocolEndpointCMPIInstance", outcome.lines.at(outcome.lines.size() - 2).function);
  EXPECT_FALSE(outcome.lines.exited("modifyDNSProtocolEndpointCMPIInstance"));
  expectFailed(outcome);
}

TEST_F(DNSClientModification, ExceptionsOfTheTreeAreCaughtAndOthersFlyOn) {
  std::size_t flown = 0;
  std::size_t caught = 0;
  const std::size_t tried = forEachTreeFailure([&](std::size_t, Thrown thrown) {
    restore();
    try {
      const Outcome outcome = modify(kWhole);
      if (outcome.rc == CMPI_RC_OK) return;
      ++caught;
      EXPECT_EQ(Thrown::StdException, thrown);
      EXPECT_THAT(outcome.errors(), ElementsAre("Caught Exception : ", kFailed));
      expectFailed(outcome);
    } catch (int) {
      ++flown;
    }
  });
  EXPECT_EQ(tried, flown + caught);
  EXPECT_EQ(flown, caught);
  EXPECT_GT(tried, 20U);
}

TEST_F(DNSClientModification, AStepBeforeAnExceptionKeepsItsEffect) {
  std::size_t domainIsSet = 0;
  forEachTreeFailure([&](std::size_t, Thrown) {
    restore();
    try {
      modify(kWhole);
    } catch (int) {
    }
    if (node(0) == std::vector{"a.example.org b"s, "new.example.org"s, "host1"s}) ++domainIsSet;
  });
  EXPECT_EQ(2U, domainIsSet);  // setting the host name failed in both ways
}

TEST_F(DNSClientModification, AValueIsLoggedBeforeItIsSet) {
  std::vector<std::string> toldLast;
  forEachTreeFailure([&](std::size_t, Thrown) {
    restore();
    logger_.clear();
    try {
      modify(kWhole);
    } catch (int) {
    }
    const bool domainFailed = node(0) == std::vector{"a.example.org b"s, "example.org"s, "host1"s};
    const bool hostFailed = node(0) == std::vector{"a.example.org b"s, "new.example.org"s, "host1"s};
    if (domainFailed || hostFailed) toldLast.push_back(logger_.pairs().ofKind(LineKind::Variable).back().brief());
  });
  EXPECT_THAT(toldLast, ::testing::UnorderedElementsAre(
                            "4000 VARIABLE domainName = new.example.org", "4000 VARIABLE domainName = new.example.org",
                            "4000 VARIABLE hostName = newhost", "4000 VARIABLE hostName = newhost"));
}

TEST_F(DNSClientModification, ValuesThatCannotBeStoredAreNotLookedAt) {
  std::filesystem::remove_all(world_.dataDir());
  const Outcome outcome = modify(kWhole);
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
  EXPECT_THAT(outcome.errors(), IsEmpty());
  EXPECT_EQ(asItWas_, node(0));
}

TEST_F(DNSClientModification, WhateverTheBrokerFailsAtEachValueIsTheOldOrTheNewOrEmpty) {
  const std::size_t tried = forEachFailure(
      broker_,
      [&](std::size_t, Mode) {
        restore();
        try {
          const Outcome outcome = modify(kWhole);
          expectDoneWithoutExit(outcome);
        } catch (const InjectedFailure& failure) {
          // Exceptions in the steps are caught; only the end of the result can still throw.
          EXPECT_STREQ("the broker threw in returnDone", failure.what());
        }
        const auto held = node(0);
        EXPECT_THAT(held[0],
                    testing::AnyOf("example.org", "a.example.org b", "a.example.org", "b", " b", "a.example.org ", ""));
        EXPECT_THAT(held[1], testing::AnyOf("example.org", "new.example.org", ""));
        EXPECT_THAT(held[2], testing::AnyOf("host1", "newhost", ""));
        EXPECT_EQ(asItWas_, node(1));
      },
      {Mode::SetRc, Mode::ReturnNull, Mode::NullHandle, Mode::RcAndNull, Mode::Throw});
  EXPECT_GT(tried, 50U);
}

TEST_F(DNSClientModification, WhatTheBrokerThrowsInTheStepsIsCaughtAndFails) {
  broker_.failNext("getProperty", Mode::Throw);
  const Outcome outcome = modify(kWhole);
  EXPECT_THAT(outcome.errors(), ElementsAre("Caught Exception : ", kFailed));
  expectFailed(outcome);
}

}  // namespace
}  // namespace ZV::Test
