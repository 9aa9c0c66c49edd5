// Reading the endpoints and the servers: two providers that work alike and differ in their texts.
#include <ProviderCall.h>
#include <World.h>
#include <gmock/gmock.h>

#include <algorithm>
#include <thread>

extern "C" CMPIInstanceMI* DNSClientProvider_Create_InstanceMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
extern "C" CMPIInstanceMI* DNSRemoteServiceAccessPointProvider_Create_InstanceMI(const CMPIBroker*, const CMPIContext*,
                                                                                 CMPIStatus*);

namespace ZV::Test {
namespace {

using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

// One of the two providers, and its error texts.
struct Reader {
  InstanceProvider::Create create;
  const char* stem;
  const char* source;
  const char* className;
  const char* first;  // the names of its two instances, in order
  const char* second;
  const char* noPaths;
  const char* pathNotMade;
  const char* pathsFailed;
  const char* instancesFailed;
  const char* unknownName;
  const char* oneFailed;
};

void PrintTo(const Reader& reader, std::ostream* out) { *out << reader.stem; }

const Reader kReaders[] = {
    {DNSClientProvider_Create_InstanceMI, "DNSClient", "DNSClientProvider", "ZORVA_DNSProtocolEndPoint", "eth0", "eth1",
     "No ObjectPath Found", "Create CMPIObjectPath                     failed for DNSClientClass.",
     "getAllDNSClientCMPIObjPaths Failed", "getAllDNSClientCMPIInstances Failed",
     "No DNSClient instance found in the Map", "getOneDNSClientCMPIInstance Failed"},
    {DNSRemoteServiceAccessPointProvider_Create_InstanceMI, "DNSRemoteServiceAccessPoint",
     "DNSRemoteServiceAccessPointProvider", "ZORVA_RemoteServiceAccessPoint", "192.0.2.1", "2001:db8::1",
     "No ObjectPath found", "Create CMPIObjectPath                     failed for DNSServerClass.",
     "getAllDNSServerCMPIObjPaths Failed", "getAllDNSServerCMPIInstances Failed",
     "No DNS Server instance found in the map", "getOneDNSServerCMPIInstance Failed"},
};

class Reading : public ::testing::TestWithParam<Reader> {
 protected:
  // Two endpoints and two servers, neither in the order of their names.
  void haveBoth() {
    world.nic("eth1", {.suffixes = {"example.org"}}).nic("eth0", {.servers = {"2001:db8::1", "192.0.2.1"}}).install();
  }
  void haveNone() { world.host().install(); }

  static Path classPath() { return Path(GetParam().className); }
  static Path fullPath(const std::string& name) {
    return classPath()
        .key("SystemCreationClassName", "ZORVA_ComputerSystem")
        .key("CreationClassName", GetParam().className)
        .key("SystemName", "host1")
        .key("Name", name.c_str());
  }
  static std::string operation(const std::string& name) { return std::string(GetParam().stem) + "_" + name; }

  // The line of an error, which must name the operation and its file.
  static void expectErrorsOf(const Outcome& outcome, const std::string& name, const char* inFactory,
                             const char* inProvider) {
    ASSERT_THAT(outcome.errors(), ElementsAre(inFactory, inProvider)) << outcome;
    const LogLine& own = *std::find_if(outcome.lines.rbegin(), outcome.lines.rend(),
                                       [](const LogLine& line) { return line.level == 6000; });
    EXPECT_EQ(operation(name), own.function);
    EXPECT_EQ("providers/" + std::string(GetParam().source) + ".cpp", own.file);
    EXPECT_EQ(own.file, own.fileInText());
    EXPECT_EQ(own.line, own.lineInText());
    EXPECT_EQ("Zorvagent." + std::string(GetParam().source), own.category);
    const LogLines factory = outcome.lines.ofCategory("Zorvagent.DNSObjFactory");
    EXPECT_THAT(factory.errors(), ElementsAre(inFactory));
  }
  // Neither returnDone nor an exit line, and no results.
  static void expectLeftOpen(const Outcome& outcome, CMPIrc rc = CMPI_RC_OK) {
    EXPECT_EQ(rc, outcome.rc) << outcome;
    EXPECT_TRUE(outcome.markedEntry());
    EXPECT_FALSE(outcome.done());
    EXPECT_FALSE(outcome.markedExit());
    EXPECT_THAT(outcome.calls.only({"returnInstance", "returnObjectPath"}), IsEmpty());
  }
  // returnDone, then the exit line.
  static void expectComplete(const Outcome& outcome, const std::string& name, CMPIrc rc = CMPI_RC_OK) {
    EXPECT_EQ(rc, outcome.rc) << outcome;
    EXPECT_TRUE(outcome.markedEntry());
    EXPECT_TRUE(outcome.markedExit());
    const std::vector<std::string> story = outcome.story();
    ASSERT_LE(3U, story.size());
    const std::vector<std::string> end(story.end() - 3, story.end());
    EXPECT_THAT(end, ElementsAre("returnDone()", "log 4000 EXITING " + operation(name), "log 4000 banner"));
  }
  static std::vector<std::string> namesOf(const std::vector<Instance>& instances) {
    std::vector<std::string> all;
    for (const Instance& instance : instances) all.push_back(instance["Name"].text());
    return all;
  }

  World world;
  RecordingLogger logger;
  RecordingBroker broker;
  InstanceProvider provider{GetParam().create, broker};
};

TEST_P(Reading, NamesComeInTheOrderOfTheNames) {
  haveBoth();
  const Outcome outcome = provider.enumerateInstanceNames(classPath());
  expectComplete(outcome, "EnumInstanceNames");
  EXPECT_THAT(outcome.calls.only({"returnObjectPath", "returnDone"}),
              ElementsAre("returnObjectPath(OP1)", "returnObjectPath(OP2)", "returnDone()"));
  ASSERT_EQ(2U, outcome.paths().size());
  EXPECT_EQ(GetParam().first, outcome.paths()[0]["Name"].text());
  EXPECT_EQ(GetParam().second, outcome.paths()[1]["Name"].text());
  EXPECT_THAT(outcome.errors(), IsEmpty());
}

TEST_P(Reading, PathsHaveFourKeysTheHostAndTheNamespaceThatWasAsked) {
  haveBoth();
  const Outcome outcome = provider.enumerateInstanceNames(classPath().in("root/other"));
  ASSERT_EQ(2U, outcome.paths().size());
  EXPECT_EQ("//host1/root/other:" + std::string(GetParam().className) +
                ".SystemCreationClassName=\"ZORVA_ComputerSystem\",CreationClassName=\"" + GetParam().className +
                "\",SystemName=\"host1\",Name=\"" + GetParam().first + "\"",
            describeWhole(outcome.paths()[0]));
}

TEST_P(Reading, InstancesComeInTheOrderOfTheNames) {
  haveBoth();
  const Outcome outcome = provider.enumerateInstances(classPath());
  expectComplete(outcome, "EnumInstances");
  EXPECT_THAT(outcome.calls.only({"returnInstance", "returnDone"}),
              ElementsAre("returnInstance(I1)", "returnInstance(I2)", "returnDone()"));
  EXPECT_THAT(namesOf(outcome.instances()), ElementsAre(GetParam().first, GetParam().second));
  EXPECT_THAT(outcome.errors(), IsEmpty());
}

TEST_P(Reading, PropertyListReachesTheInstances) {
  haveBoth();
  const std::vector<std::string> wanted = {"SystemCreationClassName", "CreationClassName", "SystemName", "Name",
                                           "ElementName"};
  EXPECT_EQ(wanted, provider.enumerateInstances(classPath(), {"ElementName"}).instances().at(1).names());
  EXPECT_EQ(wanted, provider.getInstance(fullPath(GetParam().first), {"ElementName"}).instances().at(0).names());
  EXPECT_EQ(4U, provider.enumerateInstances(classPath(), {}).instances().at(0).properties.size());
}

TEST_P(Reading, NamesOfAnEmptyHostLeaveTheResultOpen) {
  haveNone();
  const Outcome outcome = provider.enumerateInstanceNames(classPath());
  expectLeftOpen(outcome);
  expectErrorsOf(outcome, "EnumInstanceNames", GetParam().noPaths, GetParam().pathsFailed);
}

TEST_P(Reading, InstancesOfAnEmptyHostLeaveTheResultOpen) {
  haveNone();
  const Outcome outcome = provider.enumerateInstances(classPath());
  expectLeftOpen(outcome);
  expectErrorsOf(outcome, "EnumInstances", "***No instance found***", GetParam().instancesFailed);
}

TEST_P(Reading, HostThatCannotBeReadIsAnEmptyOne) {
  world.installUnreadable();
  const Outcome outcome = provider.enumerateInstanceNames(classPath());
  expectLeftOpen(outcome);
  EXPECT_THAT(outcome.errors(), ElementsAre("Caught Exception", GetParam().noPaths, GetParam().pathsFailed));
  EXPECT_FALSE(outcome.lines.entered("getDNSServerInstances"));  // the second walk is not begun
}

TEST_P(Reading, PathThatIsNotMadeEndsTheNamesWithItsStatus) {
  haveBoth();
  const std::pair<Mode, CMPIrc> rows[] = {
      {Mode::ReturnNull, CMPI_RC_OK}, {Mode::NullHandle, CMPI_RC_OK}, {Mode::RcAndNull, CMPI_RC_ERR_FAILED}};
  for (const auto& [mode, rc] : rows) {
    broker.failNext("newObjectPath", mode);
    const Outcome outcome = provider.enumerateInstanceNames(classPath());
    expectLeftOpen(outcome, rc);
    expectErrorsOf(outcome, "EnumInstanceNames", GetParam().pathNotMade, GetParam().pathsFailed);
    EXPECT_EQ(1U, outcome.calls.count("newObjectPath"));
  }
}

TEST_P(Reading, PathsMadeBeforeTheFailureAreNotReturned) {
  haveBoth();
  const Calls calls = provider.enumerateInstanceNames(classPath()).calls;
  std::size_t secondPath = calls.size();
  while (calls.at(secondPath - 1).name != "newObjectPath") --secondPath;
  broker.failAt(secondPath, Mode::ReturnNull);
  const Outcome outcome = provider.enumerateInstanceNames(classPath());
  EXPECT_EQ(2U, outcome.calls.count("newObjectPath"));
  expectLeftOpen(outcome);
  expectErrorsOf(outcome, "EnumInstanceNames", GetParam().pathNotMade, GetParam().pathsFailed);
}

TEST_P(Reading, GoodPathWithAnRcIsUsed) {
  haveBoth();
  broker.failEach("newObjectPath", Mode::SetRc);
  const Outcome outcome = provider.enumerateInstanceNames(classPath());
  EXPECT_EQ(2U, outcome.paths().size());
  expectComplete(outcome, "EnumInstanceNames", CMPI_RC_ERR_FAILED);
}

TEST_P(Reading, InstanceThatIsNotMadeIsReturnedUnchanged) {
  haveBoth();
  const std::pair<Mode, const char*> rows[] = {{Mode::ReturnNull, "returnInstance(null)"},
                                               {Mode::RcAndNull, "returnInstance(null)"},
                                               {Mode::NullHandle, "returnInstance(I1(no handle))"}};
  for (const auto& [mode, line] : rows) {
    broker.failNext("newInstance", mode);
    const Outcome all = provider.enumerateInstances(classPath());
    expectComplete(all, "EnumInstances");
    ASSERT_EQ(2U, all.calls.count("returnInstance"));
    EXPECT_EQ(line, all.calls.only({"returnInstance"})[0]);
    EXPECT_THAT(all.errors(), IsEmpty());

    broker.failNext("newInstance", mode);
    const Outcome one = provider.getInstance(fullPath(GetParam().first));
    expectComplete(one, "GetInstance");
    EXPECT_THAT(one.calls.only({"returnInstance"}), ElementsAre(line));
    EXPECT_THAT(one.errors(), IsEmpty());
  }
}

TEST_P(Reading, InstanceWithoutAPathIsReturnedAsNull) {
  haveBoth();
  for (const Mode mode : {Mode::ReturnNull, Mode::NullHandle, Mode::RcAndNull}) {
    broker.failNext("newObjectPath", mode);
    const Outcome outcome = provider.enumerateInstances(classPath());
    expectComplete(outcome, "EnumInstances");
    EXPECT_EQ("returnInstance(null)", outcome.calls.only({"returnInstance"}).at(0));
    EXPECT_THAT(namesOf(outcome.instances()), ElementsAre(GetParam().second));
    EXPECT_THAT(outcome.errors(), IsEmpty());
  }
}

TEST_P(Reading, PathWithoutKeysGetsNothingAndTheHostIsNotRead) {
  haveBoth();
  const Outcome outcome = provider.getInstance(classPath());
  expectComplete(outcome, "GetInstance");
  EXPECT_THAT(outcome.errors(), ElementsAre("At least one key should be passed"));
  EXPECT_THAT(outcome.instances(), IsEmpty());
  EXPECT_FALSE(outcome.lines.entered("getDNSClientInstances"));
  EXPECT_THAT(outcome.calls.lines(), ElementsAre("ref.getKeyCount()", "returnDone()"));
}

TEST_P(Reading, StatusOfCountingTheKeysIsKept) {
  haveBoth();
  broker.failNext("getKeyCount", Mode::RcAndNull);
  const Outcome outcome = provider.getInstance(fullPath(GetParam().first));
  expectComplete(outcome, "GetInstance", CMPI_RC_ERR_FAILED);
  EXPECT_THAT(outcome.errors(), ElementsAre("At least one key should be passed"));
}

TEST_P(Reading, NameAloneGetsTheInstance) {
  haveBoth();
  const Outcome outcome = provider.getInstance(classPath().key("Name", GetParam().second));
  expectComplete(outcome, "GetInstance");
  EXPECT_THAT(namesOf(outcome.instances()), ElementsAre(GetParam().second));
  EXPECT_EQ(1U, outcome.calls.count("newInstance"));
  EXPECT_EQ(1U, outcome.calls.count("returnInstance"));
  EXPECT_THAT(outcome.errors(), IsEmpty());
}

TEST_P(Reading, OtherKeysAreIgnoredIfThereIsAName) {
  haveBoth();
  const Path wrong = fullPath(GetParam().first)
                         .key("SystemName", "elsewhere")
                         .key("CreationClassName", "CIM_Other")
                         .key("SystemCreationClassName", "CIM_Other")
                         .key("Extra", "x");
  EXPECT_THAT(namesOf(provider.getInstance(wrong).instances()), ElementsAre(GetParam().first));
}

TEST_P(Reading, KeyThatIsMarkedAsOneIsAsGood) {
  haveBoth();
  broker.stateOfKeys = CMPI_keyValue;
  EXPECT_THAT(namesOf(provider.getInstance(fullPath(GetParam().first)).instances()), ElementsAre(GetParam().first));
}

TEST_P(Reading, UnknownNameLeavesTheResultOpen) {
  haveBoth();
  std::string otherCase = GetParam().second;
  std::transform(otherCase.begin(), otherCase.end(), otherCase.begin(), ::toupper);
  for (const std::string& name : {std::string("nobody"), std::string(), otherCase}) {
    const Outcome outcome = provider.getInstance(fullPath(name));
    expectLeftOpen(outcome);
    expectErrorsOf(outcome, "GetInstance", GetParam().unknownName, GetParam().oneFailed);
  }
}

TEST_P(Reading, NameOnAnEmptyHostLeavesTheResultOpen) {
  haveNone();
  const Outcome outcome = provider.getInstance(fullPath(GetParam().first));
  expectLeftOpen(outcome);
  expectErrorsOf(outcome, "GetInstance", GetParam().unknownName, GetParam().oneFailed);
}

TEST_P(Reading, PathWithoutANameFindsNothing) {
  haveBoth();
  const Outcome outcome = provider.getInstance(classPath().key("SystemName", "host1"));
  expectComplete(outcome, "GetInstance");
  EXPECT_EQ(2U, outcome.calls.count("newInstance"));
  EXPECT_THAT(outcome.calls.only({"returnInstance"}), IsEmpty());
  EXPECT_THAT(outcome.errors(), IsEmpty());
}

TEST_P(Reading, PathWithoutANameOnAnEmptyHostLeavesTheResultOpenWithTheStatusOfTheKey) {
  haveNone();
  const Outcome outcome = provider.getInstance(classPath().key("SystemName", "host1"));
  expectLeftOpen(outcome, CMPI_RC_ERR_NOT_FOUND);
  expectErrorsOf(outcome, "GetInstance", "***No instance found***", GetParam().instancesFailed);
}

// A name that cannot be read as text counts as missing: then all keys count.
TEST_P(Reading, ScanComparesAllKeysAndStopsAtTheMatch) {
  haveBoth();
  broker.failNext("getKey", Mode::NullHandle);
  const Outcome outcome = provider.getInstance(fullPath(GetParam().first));
  expectComplete(outcome, "GetInstance");
  EXPECT_THAT(namesOf(outcome.instances()), ElementsAre(GetParam().first));
  EXPECT_EQ(2U, outcome.calls.count("newInstance"));
  EXPECT_EQ(1U, outcome.calls.count("getObjectPath"));

  broker.failNext("getKey", Mode::NullHandle);
  EXPECT_THAT(namesOf(provider.getInstance(fullPath(GetParam().second)).instances()), ElementsAre(GetParam().second));
  broker.failNext("getKey", Mode::NullHandle);
  const Outcome wrong = provider.getInstance(fullPath(GetParam().first).key("SystemName", "elsewhere"));
  expectComplete(wrong, "GetInstance");
  EXPECT_THAT(wrong.instances(), IsEmpty());
}

TEST_P(Reading, ScanPassesThePropertyListOn) {
  haveBoth();
  broker.failNext("getKey", Mode::NullHandle);
  const Outcome outcome = provider.getInstance(fullPath(GetParam().second), {"ElementName"});
  ASSERT_EQ(1U, outcome.instances().size());
  EXPECT_EQ(5U, outcome.instances()[0].properties.size());
}

TEST_P(Reading, ScanStepsOverInstancesThatAreNotGood) {
  haveBoth();
  for (const Mode mode : {Mode::ReturnNull, Mode::NullHandle}) {
    broker.failNext("getKey", Mode::NullHandle);
    broker.failNext("newInstance", mode);
    const Outcome outcome = provider.getInstance(fullPath(GetParam().second));
    expectComplete(outcome, "GetInstance");
    EXPECT_THAT(namesOf(outcome.instances()), ElementsAre(GetParam().second));
    EXPECT_EQ(1U, outcome.calls.count("getObjectPath"));
  }
}

TEST_P(Reading, NullPathOrBrokerNeverEndsTheProcess) {
  haveBoth();
  for (const CMPIBroker* given : {broker.cmpi(), static_cast<const CMPIBroker*>(nullptr)}) {
    CMPIInstanceMI* const mi = GetParam().create(given, nullptr, nullptr);
    const CMPIObjectPath* path = broker.make(fullPath(GetParam().first));
    CMPIObjectPath* bare = broker.make(classPath());
    bare->hdl = nullptr;
    for (const CMPIObjectPath* ref : {path, static_cast<const CMPIObjectPath*>(bare), {}}) {
      CMPIResult* const result = broker.makeResult();
      EXPECT_EQ(CMPI_RC_OK, mi->ft->enumerateInstanceNames(mi, nullptr, result, ref).rc);
      EXPECT_EQ(CMPI_RC_OK, mi->ft->enumerateInstances(mi, nullptr, result, ref, nullptr).rc);
      EXPECT_EQ(CMPI_RC_OK, mi->ft->getInstance(mi, nullptr, result, ref, nullptr).rc);
    }
  }
}

using Operation = std::function<Outcome()>;

TEST_P(Reading, SurvivesEveryFailureOfTheBroker) {
  haveBoth();
  const Path named = fullPath(GetParam().first);
  const Path unnamed = classPath().key("SystemName", "host1");
  const Operation operations[] = {[&] { return provider.enumerateInstanceNames(classPath()); },
                                  [&] { return provider.enumerateInstances(classPath()); },
                                  [&] {
                                    return provider.getInstance(named, {"Caption", "DNSSuffixesToAppend"});
                                  },
                                  [&] { return provider.getInstance(unnamed); }};
  for (const Operation& operation : operations) {
    const std::size_t tried = forEachFailure(broker, [&](std::size_t, Mode) {
      const Outcome outcome = operation();
      const std::size_t done = outcome.calls.count("returnDone");
      EXPECT_TRUE(outcome.markedEntry());
      EXPECT_EQ(outcome.markedExit() ? 1U : 0U, done) << outcome;
      if (done != 0) {
        EXPECT_EQ("returnDone", outcome.calls.back().name) << outcome;
      }
    });
    EXPECT_LE(40U, tried);
  }
}

TEST_P(Reading, LetsAnExceptionOfTheBrokerPass) {
  haveBoth();
  const std::size_t tried = forEachFailure(broker,
                                           [&](std::size_t, Mode) {
                                             try {
                                               provider.enumerateInstances(classPath());
                                               EXPECT_FALSE(broker.hasFailed());
                                             } catch (const InjectedFailure&) {
                                               EXPECT_TRUE(broker.hasFailed());
                                             }
                                           },
                                           {Mode::Throw});
  EXPECT_LE(20U, tried);
}

TEST_P(Reading, FailureOfTheTreeLeavesWhatWasRead) {
  haveBoth();
  std::size_t openResults = 0;
  for (std::size_t n = 2;; ++n) {  // the first call is outside the try block
    const FailingTree failing(n);
    const Outcome outcome = provider.enumerateInstances(classPath());
    if (!failing.hasThrown()) break;
    EXPECT_EQ(CMPI_RC_OK, outcome.rc);
    EXPECT_EQ(outcome.done(), outcome.markedExit());
    EXPECT_THAT(outcome.errors(), Contains("Caught Exception"));
    if (!outcome.done()) ++openResults;
    EXPECT_EQ(outcome.done() ? 1U : 3U, outcome.errors().size()) << outcome;
  }
  EXPECT_LT(0U, openResults);
}

TEST_P(Reading, OtherExceptionsOfTheTreePass) {
  haveBoth();
  const FailingTree counting;
  provider.enumerateInstances(classPath());
  const std::size_t count = counting.callCount();
  EXPECT_LT(10U, count);
  for (std::size_t n = 1; n <= count; ++n) {
    const FailingTree failing(n, Thrown::Int);
    EXPECT_THROW(provider.enumerateInstances(classPath()), int) << n;
  }
  const FailingTree failing(1);
  EXPECT_THROW(provider.enumerateInstances(classPath()), std::runtime_error);
}

std::string nameOfReader(const ::testing::TestParamInfo<Reader>& row) { return row.param.stem; }
INSTANTIATE_TEST_SUITE_P(Of, Reading, ::testing::ValuesIn(kReaders), nameOfReader);

// Without a logger: the lines of several threads make no pairs.
TEST(ReadingOnSeveralThreads, DoesNotMixResults) {
  World world;
  world.nic("eth1", usualNic()).nic("eth0", usualNic()).install();
  RecordingBroker broker;
  broker.keepsLines = false;
  std::vector<std::thread> threads;
  for (int t = 0; t < 4; ++t) {
    threads.emplace_back([&broker] {
      InstanceProvider provider(DNSClientProvider_Create_InstanceMI, broker);
      for (int i = 0; i < 25; ++i) {
        const Outcome outcome = provider.enumerateInstances(Path("ZORVA_DNSProtocolEndPoint"));
        EXPECT_TRUE(outcome.done());
        ASSERT_EQ(2U, outcome.instances().size());
        EXPECT_EQ("eth0", outcome.instances()[0]["Name"].text());
        EXPECT_EQ(15U, outcome.instances()[1].properties.size());
      }
    });
  }
  for (std::thread& thread : threads) thread.join();
}

}  // namespace
}  // namespace ZV::Test
