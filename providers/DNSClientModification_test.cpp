// ModifyInstance of ZORVA_DNSProtocolEndPoint, which writes to the nodes of the instrumentation tree.

#include <filesystem>

#include "providers/testing/ModificationTestSupport.h"

namespace ZV::Test {
namespace {

using std::string_literals::operator""s;

constexpr const char* kClass = "ZORVA_DNSProtocolEndPoint";
constexpr const char* kFile = "HOSTNAME=filehost\nDOMAINNAME=file.example.org\n";

const Instance kEmpty(kClass);
const Instance kWhole = kEmpty.with("DNSSuffixesToAppend", texts({"a.example.org", "b"}))
                            .with("DomainName", "new.example.org")
                            .with("Hostname", "newhost");

class DNSClientModification : public InstanceTest {
 protected:
  DNSClientModification() : InstanceTest("DNSClientProvider") {
    world.nic("eth0", usualNic()).nic("eth1", usualNic()).install().file("eth0", kFile);
  }
  Outcome modify(const Instance& instance, const char* name = "eth0") {
    return provider.modifyInstance(Path(kClass).key("Name", name), instance);
  }
  // The content of the n-th node: suffixes joined by blanks, domain name and host name.
  std::vector<std::string> node(std::size_t n) const {
    std::string suffixes;
    for (const std::string& suffix : world.list(n, NodeLexicon::PROP_DNS_SUFFIXES).value_or(std::vector{"none"s})) {
      suffixes += (suffixes.empty() ? "" : " ") + suffix;
    }
    return {suffixes, world.text(n, NodeLexicon::PROP_DOMAIN_NAME).value_or("none"),
            world.text(n, NodeLexicon::PROP_HOST_NAME).value_or("none")};
  }
  // Undoes all changes.
  void restore() {
    for (const auto& entry : std::filesystem::directory_iterator(world.dataDir())) {
      std::filesystem::remove_all(entry.path());
    }
  }

  const std::vector<std::string> asItWas_ = {"example.org", "example.org", "host1"};
  const std::vector<std::string> changed_ = {"a.example.org b", "new.example.org", "newhost"};
};

// --- what counts as present

TEST_F(DNSClientModification, TextsThatTheBrokerFailsToGiveLeaveWhatIsStored) {
  for (const std::size_t call : {5U, 7U}) {  // the calls that read the domain name and the host name
    for (const Mode mode : {Mode::SetRc, Mode::RcAndNull}) {
      SCOPED_TRACE(std::to_string(call) + ' ' + nameOf(mode));
      restore();
      broker.startOver();
      broker.failAt(call, mode);
      const Outcome outcome = modify(kEmpty.with("DomainName", "new.example.org").with("Hostname", "newhost"));
      EXPECT_EQ("getCharPtr", outcome.calls.at(call - 1).name);
      EXPECT_THAT(node(0), ElementsAre("example.org", call == 5 ? "example.org" : "new.example.org",
                                       call == 5 ? "newhost" : "host1"));
    }
  }
}

// --- a whole operation

TEST_F(DNSClientModification, SetsTheThreeValuesOfTheNode) {
  EXPECT_EQ(CMPI_RC_OK, modify(kWhole).rc);
  EXPECT_EQ(changed_, node(0));
  EXPECT_EQ(asItWas_, node(1));
}

TEST_F(DNSClientModification, LeavesTheFileSoThatTheSettingDataStaysAsItWas) {
  modify(kWhole);
  EXPECT_EQ(kFile, world.fileContent("eth0"));
  InstanceProvider settings(DNSSettingDataProvider_Create_InstanceMI, broker);
  const Outcome outcome = settings.getInstance(Path("ZORVA_DNSSettingData").key("InstanceID", "Computer%eth0"));
  EXPECT_EQ(chars("file.example.org"), outcome.instances().at(0)["DomainName"]);
}

TEST_F(DNSClientModification, IsSeenByTheNextReader) {
  modify(kWhole);
  const Outcome outcome = provider.getInstance(Path(kClass).key("Name", "eth0"));
  EXPECT_EQ(chars("new.example.org"), outcome.instances().at(0)["DomainName"]);
}

TEST_F(DNSClientModification, LeavesTheServersOfTheNodeAlone) {
  modify(kWhole.with("DNSServerAddresses", texts({"192.0.2.1"})));
  EXPECT_THAT(world.list(0, NodeLexicon::PROP_DNS_SERVER_ADDRESSES), Optional(ElementsAre("192.0.2.53")));
}

TEST_F(DNSClientModification, ThePropertyListDecidesNothing) {
  EXPECT_EQ(CMPI_RC_OK, provider.modifyInstance(Path(kClass).key("Name", "eth0"), kWhole, {"Caption"}).rc);
  EXPECT_EQ(changed_, node(0));
}

TEST_F(DNSClientModification, OnlyTheNameOfThePathIsRead) {
  const Path path = Path(kClass).key("Name", "eth1").key("SystemName", "elsewhere").key("CreationClassName", "x");
  EXPECT_EQ(CMPI_RC_OK, provider.modifyInstance(path, kWhole).rc);
  EXPECT_EQ(asItWas_, node(0));
  EXPECT_EQ(changed_, node(1));
}

// --- which nodes

TEST_F(DNSClientModification, TwoNodesOfOneNameAreBothChanged) {
  world.bmc().nic("eth0", usualNic()).install();
  EXPECT_EQ(CMPI_RC_OK, modify(kWhole).rc);
  EXPECT_EQ(changed_, node(0));
  EXPECT_EQ(asItWas_, node(1));
  EXPECT_EQ(changed_, node(2));
}

TEST_F(DNSClientModification, AnUnknownNameIsASuccessThatChangesNothing) {
  for (const char* name : {"eth9", "ETH0", "eth", ""}) {
    EXPECT_EQ(CMPI_RC_OK, modify(kWhole, name).rc);
  }
  EXPECT_EQ(asItWas_, node(0));
  EXPECT_EQ(asItWas_, node(1));
}

TEST_F(DNSClientModification, ANodeWithoutANameIsPassedOver) {
  World other;
  other.nic("x", {.domain = "nameless", .isUnnamed = true}).nic("eth0").install();
  EXPECT_EQ(CMPI_RC_OK, modify(kWhole, "").rc);
  EXPECT_THAT(other.text(0, NodeLexicon::PROP_DOMAIN_NAME), Optional("nameless"s));
}

// --- which properties count as present

TEST_F(DNSClientModification, PropertiesThatTheInstanceLacksDoNotChange) {
  const Outcome outcome = modify(kEmpty.with("Hostname", "newhost"));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
  EXPECT_THAT(node(0), ElementsAre("example.org", "example.org", "newhost"));
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
  broker.failEach("getProperty", Mode::SetRc);
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
    broker.failNext("getElementAt", mode);
    modify(kWhole.with("DNSSuffixesToAppend", list(CMPI_stringA, {text("a"), null(CMPI_string), text(nameOf(mode))})));
    EXPECT_EQ(nameOf(mode), node(0).at(0));
  }
}

// --- failures

TEST_F(DNSClientModification, ValuesThatCannotBeStoredAreNotLookedAt) {
  std::filesystem::remove_all(world.dataDir());
  const Outcome outcome = modify(kWhole);
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
  EXPECT_THAT(outcome.errors(), IsEmpty());
  EXPECT_EQ(asItWas_, node(0));
}

}  // namespace
}  // namespace ZV::Test
