// The endpoint's extrinsic methods: accepted, checked and answered, and nothing changes.

#include "providers/testing/InstanceTest.h"

namespace ZV::Test {
namespace {

struct Method {
  const char* name;
  const char* argumentName;
  Value argument;
};
void PrintTo(const Method& method, std::ostream* out) { *out << method.name; }

const Method kMethods[] = {
    {"SetDNSDomain", "DNSDomain", text("new.example.org")},
    {"SetDNSServerSearchOrder", "DNSServerSearchOrder", texts({"203.0.113.1", "192.0.2.1"})},
    {"SetDNSSuffixSearchOrder", "DNSDomainSuffixSearchOrder", texts({"new.example.org"})},
};

class EndpointMethods : public InstanceTest {
 protected:
  EndpointMethods() : InstanceTest("DNSClientProvider") {}

  void haveOne() { world.nic("eth0", usualNic()).install(); }

  const Path kClass{kEndpointClass};
  MethodProvider methods{DNSClientProvider_Create_MethodMI, broker};
};

class EndpointMethod : public EndpointMethods, public ::testing::WithParamInterface<Method> {
 protected:
  Outcome invoke(const Path& path) { return invoke(path, {{GetParam().argumentName, GetParam().argument}}); }
  Outcome invoke(const Path& path, const std::vector<NamedValue>& arguments) {
    return methods.invokeMethod(path, GetParam().name, arguments);
  }
  std::vector<Value> valuesOf(const Path& path) { return invoke(path).result.data; }
};

TEST_P(EndpointMethod, ReturnsZeroAndLeavesTheHostUnchanged) {
  haveOne();
  const std::vector<Instance> before = instances();
  EXPECT_THAT(valuesOf(kClass.key("Name", "eth0")), ElementsAre(uint32(0)));
  EXPECT_EQ(before, instances());
  EXPECT_EQ("example.org", world.text(0, NodeLexicon::PROP_DOMAIN_NAME));
  EXPECT_THAT(*world.list(0, NodeLexicon::PROP_DNS_SERVER_ADDRESSES), ElementsAre("192.0.2.53"));
  EXPECT_THAT(*world.list(0, NodeLexicon::PROP_DNS_SUFFIXES), ElementsAre("example.org"));
  EXPECT_EQ(std::nullopt, world.fileContent("eth0"));
}

TEST_P(EndpointMethod, OnAnUnknownEndpointReturnsOne) {
  haveOne();
  for (const char* name : {"eth1", "ETH0", ""}) {
    EXPECT_THAT(valuesOf(kClass.key("Name", name)), ElementsAre(uint32(1))) << name;
  }
  world.installUnreadable();
  EXPECT_THAT(valuesOf(kClass.key("Name", "eth0")), ElementsAre(uint32(1)));
}

TEST_P(EndpointMethod, WithoutANameReturnsZero) {
  haveOne();
  EXPECT_THAT(valuesOf(kClass), ElementsAre(uint32(0)));
  EXPECT_THAT(valuesOf(kClass.key("SystemName", "host1")), ElementsAre(uint32(0)));
  broker.missingKey = {CMPI_RC_OK, CMPI_nullValue};
  EXPECT_THAT(valuesOf(kClass), ElementsAre(uint32(0)));
}

TEST_P(EndpointMethod, TakesAnArgumentOfAnotherKindForNone) {
  haveOne();
  for (const Value& odd : {null(), null(CMPI_stringA), uint32(7), text(""), texts({}), uint16s({1, 2}),
                           list(CMPI_stringA, {null(CMPI_string), text("a")}), ref(Path("X"))}) {
    const Outcome outcome = invoke(kClass.key("Name", "eth0"), {{GetParam().argumentName, odd}});
    EXPECT_THAT(outcome.result.data, ElementsAre(uint32(0))) << odd;
  }
}

TEST_P(EndpointMethod, InAnotherSpellingOrOfAnotherClassIsNotKnown) {
  haveOne();
  std::string otherCase = GetParam().name;
  otherCase[0] = 's';
  for (const std::string& name : {otherCase, GetParam().name + std::string("s"), std::string(), std::string("Set")}) {
    EXPECT_THAT(methods.invokeMethod(kClass.key("Name", "eth0"), name.c_str()).result.data, IsEmpty());
  }
  for (const char* className : {"CIM_DNSProtocolEndPoint", "zorva_dnsprotocolendpoint", "ZORVA_DNSProtocolEndpoint"}) {
    EXPECT_THAT(valuesOf(Path(className).key("Name", "eth0")), IsEmpty());
  }
}

TEST_P(EndpointMethod, NullPathMethodOrArgumentsNeverEndTheProcess) {
  haveOne();
  CMPIMethodMI* const mi = methods.mi();
  const CMPIObjectPath* path = broker.make(kClass.key("Name", "eth0"));
  const CMPIArgs* in = broker.makeArgs({{GetParam().argumentName, GetParam().argument}});
  const auto values = [&](const CMPIObjectPath* ref, const char* method, const CMPIArgs* arguments) {
    const CMPIResult* result = broker.makeResult();
    EXPECT_EQ(CMPI_RC_OK, mi->ft->invokeMethod(mi, nullptr, result, ref, method, arguments, nullptr).rc);
    return RecordingBroker::read(result).data;
  };
  EXPECT_THAT(values(path, GetParam().name, in), ElementsAre(uint32(0)));
  EXPECT_THAT(values(path, GetParam().name, nullptr), ElementsAre(uint32(0)));
  EXPECT_THAT(values(path, nullptr, in), IsEmpty());
  EXPECT_THAT(values(nullptr, GetParam().name, in), IsEmpty());
}

INSTANTIATE_TEST_SUITE_P(Of, EndpointMethod, ::testing::ValuesIn(kMethods),
                         [](const auto& row) { return std::string(row.param.name); });

TEST_F(EndpointMethods, ArrayOfMoreThan65536ElementsComesToAnEnd) {
  haveOne();
  broker.keepsLines = false;
  const Value many = texts(std::vector<std::string>(70000, "192.0.2.53"));
  const Outcome outcome =
      methods.invokeMethod(kClass.key("Name", "eth0"), "SetDNSServerSearchOrder", {{"DNSServerSearchOrder", many}});
  EXPECT_EQ(std::vector{uint32(0)}, outcome.result.data);
}

TEST_F(EndpointMethods, DomainIsNotChecked) {
  haveOne();
  for (const char* domain : {"", "not a domain!", "-", "\xff"}) {
    const Outcome outcome =
        methods.invokeMethod(kClass.key("Name", "eth0"), "SetDNSDomain", {{"DNSDomain", text(domain)}});
    EXPECT_EQ(std::vector{uint32(0)}, outcome.result.data);
    EXPECT_THAT(outcome.errors(), IsEmpty());
  }
}

}  // namespace
}  // namespace ZV::Test
