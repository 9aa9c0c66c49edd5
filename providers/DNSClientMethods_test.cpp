// The endpoint's extrinsic methods: they check their arguments and return a value, and change nothing.
#include <ProviderCall.h>
#include <World.h>
#include <gmock/gmock.h>

extern "C" CMPIInstanceMI* DNSClientProvider_Create_InstanceMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
extern "C" CMPIMethodMI* DNSClientProvider_Create_MethodMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*);

namespace ZV::Test {
namespace {

using ::testing::ElementsAre;
using ::testing::ElementsAreArray;
using ::testing::IsEmpty;

// A method, its argument, and its error text if there is no such endpoint.
struct Method {
  const char* name;
  const char* argumentName;
  Value argument;
  const char* function;    // of the factory
  const char* parameters;  // the parameters in its entry line
  std::vector<std::string> unknownEndpoint;
};
void PrintTo(const Method& method, std::ostream* out) { *out << method.name; }

const Method kMethods[] = {
    {"SetDNSDomain",
     "DNSDomain",
     text("new.example.org"),
     "setDNSDomainName",
     " _broker=ADDR ref=ADDR domainName=ADDR ctx=ADDR",
     {"DNS Client Map empty"}},
    {"SetDNSServerSearchOrder",
     "DNSServerSearchOrder",
     texts({"203.0.113.1", "192.0.2.1"}),
     "setDNSServerSearchOrder",
     " _broker=ADDR ref=ADDR serverAddrs=ADDR ctx=ADDR",
     {}},
    {"SetDNSSuffixSearchOrder",
     "DNSDomainSuffixSearchOrder",
     texts({"new.example.org"}),
     "setDNSSuffixesSearchOrder",
     " _broker=ADDR ref=ADDR suffixes=ADDR ctx=ADDR rc=ADDR",
     {"DNS Client Map Empty"}},
};

class EndpointMethods : public ::testing::Test {
 protected:
  static inline const Path kClass = Path("ZORVA_DNSProtocolEndPoint");

  void haveOne() { world.nic("eth0", usualNic()).install(); }

  World world;
  RecordingLogger logger;
  RecordingBroker broker;
  MethodProvider provider{DNSClientProvider_Create_MethodMI, broker};
};

class EndpointMethod : public EndpointMethods, public ::testing::WithParamInterface<Method> {
 protected:
  Outcome invoke(const Path& path) { return invoke(path, {{GetParam().argumentName, GetParam().argument}}); }
  Outcome invoke(const Path& path, const std::vector<NamedValue>& arguments) {
    return provider.invokeMethod(path, GetParam().name, arguments);
  }
  // The method returned that value, and ended as methods do: first the exit is logged, then the result is done.
  static void expectAnswer(const Outcome& outcome, std::uint32_t value, CMPIrc rc = CMPI_RC_OK) {
    EXPECT_EQ(rc, outcome.rc) << outcome;
    EXPECT_EQ(std::vector{uint32(value)}, outcome.result.data) << outcome;
    EXPECT_TRUE(outcome.markedEntry());
    EXPECT_THAT(outcome.out, IsEmpty());
    const std::vector<std::string> story = outcome.story();
    ASSERT_LE(4U, story.size());
    const std::vector<std::string> end(story.end() - 4, story.end());
    EXPECT_THAT(end, ElementsAre("returnData(uint32 " + std::to_string(value) + ")",
                                 "log 4000 EXITING DNSClient_InvokeMethod", "log 4000 banner", "returnDone()"));
  }
};

TEST_P(EndpointMethod, OnAKnownEndpointReturnsZero) {
  haveOne();
  const Outcome outcome = invoke(kClass.key("Name", "eth0"));
  expectAnswer(outcome, 0);
  EXPECT_THAT(outcome.errors(), IsEmpty());
}

TEST_P(EndpointMethod, LeavesTheHostAsItIs) {
  haveOne();
  InstanceProvider instances(DNSClientProvider_Create_InstanceMI, broker);
  const std::vector<Instance> before = instances.enumerateInstances(kClass).instances();
  expectAnswer(invoke(kClass.key("Name", "eth0")), 0);
  EXPECT_EQ(before, instances.enumerateInstances(kClass).instances());
  EXPECT_EQ(1U, before.size());
  EXPECT_EQ("example.org", world.text(0, NodeLexicon::PROP_DOMAIN_NAME));
  EXPECT_THAT(*world.list(0, NodeLexicon::PROP_DNS_SERVER_ADDRESSES), ElementsAre("192.0.2.53"));
  EXPECT_THAT(*world.list(0, NodeLexicon::PROP_DNS_SUFFIXES), ElementsAre("example.org"));
  EXPECT_EQ(std::nullopt, world.fileContent("eth0"));
}

TEST_P(EndpointMethod, LogsItsSteps) {
  haveOne();
  const Outcome outcome = invoke(kClass.key("Name", "eth0"));
  const LogLines lines = outcome.lines.ofFunction(GetParam().function);
  EXPECT_THAT(
      lines.briefsWithCategory(),
      ElementsAre(
          "Zorvagent.DNSObjFactory 3000 ENTERING " + std::string(GetParam().function) + "," + GetParam().parameters,
          "Zorvagent.DNSObjFactory 3000 EXITING " + std::string(GetParam().function) + "," + GetParam().parameters));
  EXPECT_EQ("factory/ExtrinsicMethods.cpp", lines.at(0).file);
  EXPECT_TRUE(outcome.lines.entered("DNSClient_InvokeMethod", "providers/DNSClientProvider.cpp"));
  EXPECT_EQ("Zorvagent.DNSClientProvider", outcome.lines.at(1).category);
}

TEST_P(EndpointMethod, OnAnUnknownEndpointReturnsOneInItsOwnWay) {
  haveOne();
  const std::vector<Path> unknown = {kClass.key("Name", "eth1"), kClass.key("Name", "ETH0"), kClass.key("Name", "")};
  for (const Path& path : unknown) {
    const Outcome outcome = invoke(path);
    expectAnswer(outcome, 1);
    EXPECT_THAT(outcome.errors(), ElementsAreArray(GetParam().unknownEndpoint));
    EXPECT_TRUE(outcome.lines.entered(GetParam().function));
    EXPECT_FALSE(outcome.lines.exited(GetParam().function));
    for (const LogLine& line : outcome.lines) {
      if (line.level == 6000) {
        EXPECT_EQ("Zorvagent.DNSObjFactory " + std::string(GetParam().function), line.category + " " + line.function);
      }
    }
  }
}

TEST_P(EndpointMethod, OnAnEmptyHostReturnsOne) {
  world.host().install();
  const Outcome outcome = invoke(kClass.key("Name", "eth0"));
  expectAnswer(outcome, 1);
  EXPECT_THAT(outcome.errors(), ElementsAreArray(GetParam().unknownEndpoint));
}

TEST_P(EndpointMethod, OnAHostThatCannotBeReadReturnsOne) {
  world.installUnreadable();
  std::vector<std::string> errors = {"Caught Exception"};
  errors.insert(errors.end(), GetParam().unknownEndpoint.begin(), GetParam().unknownEndpoint.end());
  const Outcome outcome = invoke(kClass.key("Name", "eth0"));
  expectAnswer(outcome, 1);
  EXPECT_EQ(errors, outcome.errors());
}

TEST_P(EndpointMethod, WithoutANameReturnsZeroOnAnEmptyRecord) {
  haveOne();
  expectAnswer(invoke(kClass), 0);
  expectAnswer(invoke(kClass.key("SystemName", "host1")), 0);
  broker.missingKey = {CMPI_RC_OK, CMPI_nullValue};
  expectAnswer(invoke(kClass), 0);
}

TEST_P(EndpointMethod, WithoutANameReturnsZeroOnAnEmptyHostToo) {
  world.host().install();
  expectAnswer(invoke(kClass), 0);
}

TEST_P(EndpointMethod, OtherKeysAreNotLookedAt) {
  haveOne();
  expectAnswer(invoke(kClass.key("Name", "eth0").key("SystemName", "elsewhere")), 0);
}

TEST_P(EndpointMethod, WithoutItsArgumentReturnsZeroAndTheStatusOfTheArgument) {
  haveOne();
  for (const std::vector<NamedValue>& arguments :
       {std::vector<NamedValue>(), std::vector<NamedValue>{{"Other", GetParam().argument}}}) {
    const Outcome outcome = invoke(kClass.key("Name", "eth0"), arguments);
    expectAnswer(outcome, 0, CMPI_RC_ERR_NO_SUCH_PROPERTY);
    EXPECT_FALSE(outcome.lines.entered(GetParam().function));
    EXPECT_THAT(outcome.errors(), IsEmpty());
  }
}

TEST_P(EndpointMethod, AsksForItsArgumentByThisName) {
  haveOne();
  EXPECT_THAT(invoke(kClass.key("Name", "eth0")).calls.only({"getArg"}),
              ElementsAre("in.getArg(\"" + std::string(GetParam().argumentName) + "\")"));
}

TEST_P(EndpointMethod, TakesAnArgumentOfAnotherKindForNone) {
  haveOne();
  for (const Value& odd : {null(), null(CMPI_stringA), uint32(7), text(""), texts({}), uint16s({1, 2}),
                           list(CMPI_stringA, {null(CMPI_string), text("a")}), ref(Path("X"))}) {
    expectAnswer(invoke(kClass.key("Name", "eth0"), {{GetParam().argumentName, odd}}), 0);
  }
}

TEST_P(EndpointMethod, InAnotherSpellingIsNotKnown) {
  haveOne();
  std::string otherCase = GetParam().name;
  otherCase[0] = 's';
  for (const std::string& name : {otherCase, GetParam().name + std::string("s"), std::string(), std::string("Set")}) {
    const Outcome outcome =
        provider.invokeMethod(kClass.key("Name", "eth0"), name.c_str(), {{GetParam().argumentName, text("x")}});
    EXPECT_EQ(CMPI_RC_OK, outcome.rc);
    EXPECT_THAT(outcome.result.data, IsEmpty());
    EXPECT_EQ(0U, outcome.calls.count("getArg"));
    EXPECT_TRUE(outcome.done());
    EXPECT_TRUE(outcome.markedExit());
    EXPECT_THAT(outcome.errors(), IsEmpty());
  }
}

TEST_P(EndpointMethod, OfAnotherClassIsNotKnown) {
  haveOne();
  for (const char* className : {"CIM_DNSProtocolEndPoint", "zorva_dnsprotocolendpoint", "ZORVA_DNSProtocolEndpoint"}) {
    const Outcome outcome = invoke(Path(className).key("Name", "eth0"));
    EXPECT_EQ(CMPI_RC_OK, outcome.rc);
    EXPECT_THAT(outcome.result.data, IsEmpty());
    EXPECT_EQ(0U, outcome.calls.count("getArg"));
    EXPECT_TRUE(outcome.done());
    EXPECT_TRUE(outcome.markedExit());
  }
}

TEST_P(EndpointMethod, SurvivesEveryFailureOfTheBroker) {
  haveOne();
  const std::size_t tried = forEachFailure(broker, [&](std::size_t, Mode) {
    const Outcome outcome = invoke(kClass.key("Name", "eth0"));
    EXPECT_TRUE(outcome.markedEntry());
    EXPECT_TRUE(outcome.markedExit());
    EXPECT_EQ(1U, outcome.calls.count("returnDone"));
    for (const Value& value : outcome.result.data) EXPECT_LE(value.number(), 1U);
  });
  EXPECT_LE(4U * 7, tried);
}

TEST_P(EndpointMethod, ArgumentThatFailsIsNotPassedOn) {
  haveOne();
  for (const Mode mode : {Mode::SetRc, Mode::RcAndNull}) {
    broker.failNext("getArg", mode);
    const Outcome outcome = invoke(kClass.key("Name", "eth0"));
    expectAnswer(outcome, 0, CMPI_RC_ERR_FAILED);
    EXPECT_FALSE(outcome.lines.entered(GetParam().function));
  }
}

TEST_P(EndpointMethod, NullPathMethodOrArgumentsNeverEndTheProcess) {
  haveOne();
  CMPIMethodMI* const mi = provider.mi();
  const CMPIObjectPath* path = broker.make(kClass.key("Name", "eth0"));
  const CMPIArgs* in = broker.makeArgs({{GetParam().argumentName, GetParam().argument}});
  const auto valuesOf = [&](const CMPIObjectPath* ref, const char* method, const CMPIArgs* arguments) {
    const CMPIResult* result = broker.makeResult();
    EXPECT_EQ(CMPI_RC_OK, mi->ft->invokeMethod(mi, nullptr, result, ref, method, arguments, nullptr).rc);
    return RecordingBroker::read(result).data;
  };
  EXPECT_EQ(std::vector{uint32(0)}, valuesOf(path, GetParam().name, in));
  EXPECT_EQ(std::vector{uint32(0)}, valuesOf(path, GetParam().name, nullptr));
  EXPECT_THAT(valuesOf(path, nullptr, in), IsEmpty());
  EXPECT_THAT(valuesOf(nullptr, GetParam().name, in), IsEmpty());
}

TEST_P(EndpointMethod, LetsOtherExceptionsOfTheTreePass) {
  haveOne();
  for (const Thrown thrown : {Thrown::StdException, Thrown::Int}) {
    const FailingTree failing(1, thrown);
    EXPECT_ANY_THROW(invoke(kClass.key("Name", "eth0")));
  }
  const FailingTree failing(2, Thrown::Int);
  EXPECT_THROW(invoke(kClass.key("Name", "eth0")), int);
}

INSTANTIATE_TEST_SUITE_P(Of, EndpointMethod, ::testing::ValuesIn(kMethods),
                         [](const auto& row) { return std::string(row.param.name); });

TEST_F(EndpointMethods, ArrayIsReadElementByElement) {
  haveOne();
  const Outcome outcome = provider.invokeMethod(kClass.key("Name", "eth0"), "SetDNSSuffixSearchOrder",
                                                {{"DNSDomainSuffixSearchOrder", texts({"a.org", "b.org"})}});
  EXPECT_THAT(outcome.calls.only({"getSize", "getElementAt"}),
              ElementsAre("A1.getSize()", "A1.getElementAt(0)", "A1.getSize()", "A1.getElementAt(1)", "A1.getSize()"));
}

TEST_F(EndpointMethods, ArrayOfMoreThan65536ElementsComesToAnEnd) {
  haveOne();
  broker.keepsLines = false;
  const Value many = texts(std::vector<std::string>(70000, "192.0.2.53"));
  const Outcome outcome =
      provider.invokeMethod(kClass.key("Name", "eth0"), "SetDNSServerSearchOrder", {{"DNSServerSearchOrder", many}});
  EXPECT_EQ(std::vector{uint32(0)}, outcome.result.data);
}

TEST_F(EndpointMethods, ServerSearchOrderReadsTheServersAgain) {
  haveOne();
  const Outcome outcome = provider.invokeMethod(kClass.key("Name", "eth0"), "SetDNSServerSearchOrder",
                                                {{"DNSServerSearchOrder", texts({"192.0.2.53"})}});
  EXPECT_EQ(2U, outcome.lines.ofFunction("getDNSServerInstances").ofKind(LineKind::Entering).size());
}

TEST_F(EndpointMethods, ServerSearchOrderFailsIfTheServersCannotBeReadAgain) {
  haveOne();
  // The tree fails in the last walk, that of the method itself.
  std::vector<zorva::agent::TreeCall> calls;
  const auto invoke = [this] {
    return provider.invokeMethod(kClass.key("Name", "eth0"), "SetDNSServerSearchOrder",
                                 {{"DNSServerSearchOrder", texts({"192.0.2.53"})}});
  };
  {
    const FailingTree counting;
    invoke();
    calls = counting.calls();
  }
  const FailingTree failing(calls.size());
  const Outcome outcome = invoke();
  EXPECT_EQ(std::vector{uint32(1)}, outcome.result.data);
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
  EXPECT_THAT(outcome.errors(), ElementsAre("Caught Exception", "setDNSServerSearchOrder function failed"));
  EXPECT_TRUE(outcome.lines.exited("setDNSServerSearchOrder"));
  EXPECT_TRUE(outcome.done());
  EXPECT_TRUE(outcome.markedExit());
}

TEST_F(EndpointMethods, DomainIsNotChecked) {
  haveOne();
  for (const char* domain : {"", "not a domain!", "-", "\xff"}) {
    const Outcome outcome =
        provider.invokeMethod(kClass.key("Name", "eth0"), "SetDNSDomain", {{"DNSDomain", text(domain)}});
    EXPECT_EQ(std::vector{uint32(0)}, outcome.result.data);
    EXPECT_THAT(outcome.errors(), IsEmpty());
  }
}

TEST_F(EndpointMethods, AnythingElseIsDoneWithoutAValue) {
  haveOne();
  EXPECT_THAT(
      provider.invokeMethod(kClass.key("Name", "eth0"), "Reset").story(),
      ElementsAre("log 4000 banner", "log 4000 ENTERING DNSClient_InvokeMethod",
                  "log 3000 ENTERING getDNSClientInstances, dnsClientMap=ADDR",
                  "log 4000 VARIABLE string = example.org", "log 4000 VARIABLE nodeString = Computer",
                  "log 3000 EXITING getDNSClientInstances, dnsClientMap=ADDR",
                  "log 3000 ENTERING getDNSServerInstances, dnsServerMap=ADDR", "log 4000 VARIABLE name = 192.0.2.53",
                  "log 3000 EXITING getDNSServerInstances, dnsServerMap=ADDR",
                  "log 4000 EXITING DNSClient_InvokeMethod", "log 4000 banner", "returnDone()"));
}

}  // namespace
}  // namespace ZV::Test
