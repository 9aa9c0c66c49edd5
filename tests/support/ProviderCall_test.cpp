#include "tests/support/ProviderCall.h"

#include <cmpimacs.h>

#include "agent/interface/ZALogger.h"
#include "tests/support/Matchers.h"

namespace ZV::Test {
namespace {

// A provider of one class that answers each operation in its own recognisable way.
namespace sample {

const CMPIBroker* broker = nullptr;

void say(const char* text) {
  ZALog::ZALogger::logLevelMessage("f", "s.cpp", 1, "Sample", 6000, nullptr, 0, 0, text);
  ZALog::ZALogger::traceLevelMessage("f", "s.cpp", 1, "Sample", 6000, nullptr, 0, 0, text);
}

CMPIStatus ok() { return {CMPI_RC_OK, nullptr}; }
CMPIStatus refuse() { return {CMPI_RC_ERR_NOT_SUPPORTED, broker->eft->newString(broker, "not here", nullptr)}; }

CMPIStatus cleanup(CMPIInstanceMI*, const CMPIContext*, CMPIBoolean terminating) {
  return {terminating != 0 ? CMPI_RC_OK : CMPI_RC_DO_NOT_UNLOAD, nullptr};
}
CMPIStatus names(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath* ref) {
  say("first");
  CMReturnObjectPath(result, ref);
  say("second");
  CMReturnDone(result);
  return ok();
}
CMPIStatus instances(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath* ref,
                     const char** properties) {
  CMPIInstance* instance = CMNewInstance(broker, ref, nullptr);
  CMPISint32 count = -1;
  for (count = properties == nullptr ? -1 : 0; count >= 0 && properties[count] != nullptr; ++count) {
  }
  CMSetProperty(instance, "Asked", &count, CMPI_sint32);
  CMReturnInstance(result, instance);
  return ok();
}
CMPIStatus withInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath*,
                        const CMPIInstance* instance) {
  CMReturnInstance(result, instance);
  return ok();
}
CMPIStatus modify(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath*,
                  const CMPIInstance* instance, const char**) {
  CMReturnInstance(result, instance);
  return ok();
}
CMPIStatus remove(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*) { return refuse(); }
CMPIStatus query(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const char*,
                 const char*) {
  throw std::out_of_range("query");
}

CMPIInstanceMI* create(const CMPIBroker* given, const CMPIContext*, CMPIStatus*) {
  static CMPIInstanceMIFT table = {200,       200,          "instanceSample", cleanup, names, instances,
                                   instances, withInstance, modify,           remove,  query};
  static CMPIInstanceMI mi = {nullptr, &table};
  broker = given;
  return &mi;
}

void give(const CMPIResult* result, const char* text) { CMReturnData(result, text, CMPI_chars); }
void giveAll(const CMPIResult* result, std::initializer_list<const char*> texts) {
  for (const char* text : texts) give(result, text == nullptr ? "null" : text);
}
CMPIStatus associationCleanup(CMPIAssociationMI*, const CMPIContext*, CMPIBoolean) { return ok(); }
CMPIStatus associators(CMPIAssociationMI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath*,
                       const char* assocClass, const char* resultClass, const char* role, const char* resultRole,
                       const char** properties) {
  giveAll(result, {assocClass, resultClass, role, resultRole, properties == nullptr ? nullptr : properties[0]});
  return ok();
}
CMPIStatus associatorNames(CMPIAssociationMI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath*,
                           const char* assocClass, const char* resultClass, const char* role, const char* resultRole) {
  giveAll(result, {assocClass, resultClass, role, resultRole});
  return ok();
}
CMPIStatus references(CMPIAssociationMI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath*,
                      const char* resultClass, const char* role, const char** properties) {
  giveAll(result, {resultClass, role, properties == nullptr ? nullptr : properties[0]});
  return ok();
}
CMPIStatus referenceNames(CMPIAssociationMI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath*,
                          const char* resultClass, const char* role) {
  giveAll(result, {resultClass, role});
  return ok();
}
CMPIAssociationMI* createAssociation(const CMPIBroker* given, const CMPIContext*, CMPIStatus*) {
  static CMPIAssociationMIFT table = {
      200, 200, "associationSample", associationCleanup, associators, associatorNames, references, referenceNames};
  static CMPIAssociationMI mi = {nullptr, &table};
  broker = given;
  return &mi;
}

CMPIStatus methodCleanup(CMPIMethodMI*, const CMPIContext*, CMPIBoolean) { return refuse(); }
CMPIStatus invoke(CMPIMethodMI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath*,
                  const char* method, const CMPIArgs* in, CMPIArgs* out) {
  CMPIStatus status = ok();
  const CMPIData argument = CMGetArg(in, "In", &status);
  if (status.rc == CMPI_RC_OK) CMAddArg(out, "Out", &argument.value, argument.type);
  give(result, method);
  return status;
}
CMPIMethodMI* createMethod(const CMPIBroker* given, const CMPIContext*, CMPIStatus*) {
  static CMPIMethodMIFT table = {200, 200, "methodSample", methodCleanup, invoke};
  static CMPIMethodMI mi = {nullptr, &table};
  broker = given;
  return &mi;
}

}  // namespace sample

std::vector<std::string> textsOf(const Outcome& outcome) {
  std::vector<std::string> all;
  for (const Value& value : outcome.result.data) all.push_back(value.text());
  return all;
}

const Path kPath = Path("ZORVA_X").key("Name", "eth0");

TEST(ProviderCall, OutcomeHasCallsAndLinesInOneOrder) {
  RecordingLogger logger;
  RecordingBroker broker;
  InstanceProvider provider(sample::create, broker);
  const Outcome outcome = provider.enumerateInstanceNames(kPath);
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
  EXPECT_EQ(std::nullopt, outcome.message);
  EXPECT_EQ(std::vector{kPath}, outcome.paths());
  EXPECT_TRUE(outcome.done());
  EXPECT_THAT(outcome.errors(), ElementsAre("first", "second"));
  EXPECT_THAT(outcome.story(),
              ElementsAre("log 6000 OTHER first", "returnObjectPath(ref)", "log 6000 OTHER second", "returnDone()"));
  EXPECT_FALSE(outcome.markedEntry());
  EXPECT_FALSE(outcome.markedExit());
}

TEST(ProviderCall, EachRequestStartsWithFreshCallsAndNumbers) {
  RecordingBroker broker;
  InstanceProvider provider(sample::create, broker);
  const Outcome first = provider.enumerateInstances(kPath);
  const Outcome second = provider.enumerateInstances(kPath);
  EXPECT_EQ(first.calls.lines(), second.calls.lines());
  EXPECT_THAT(first.calls.lines(),
              ElementsAre("newInstance(ref)", "I1.setProperty(\"Asked\", sint32 -1)", "returnInstance(I1)"));
  EXPECT_THAT(first.lines, IsEmpty());
}

TEST(ProviderCall, PropertyListsAreNullOrEmptyOrNames) {
  RecordingBroker broker;
  InstanceProvider provider(sample::create, broker);
  EXPECT_EQ(sint32(-1), provider.enumerateInstances(kPath, nullptr).instances().at(0)["Asked"]);
  EXPECT_EQ(sint32(0), provider.enumerateInstances(kPath, {}).instances().at(0)["Asked"]);
  EXPECT_EQ(sint32(2), provider.getInstance(kPath, {"Name", "Caption"}).instances().at(0)["Asked"]);
}

TEST(ProviderCall, InstancesAreReturned) {
  RecordingBroker broker;
  InstanceProvider provider(sample::create, broker);
  const Instance given = Instance("ZORVA_X").with("List", texts({"a", "b"}));
  EXPECT_EQ(std::vector{given}, provider.createInstance(kPath, given).instances());
  EXPECT_EQ(std::vector{given}, provider.modifyInstance(kPath, given).instances());
}

TEST(ProviderCall, StatusAndExceptionsComeBack) {
  RecordingBroker broker;
  InstanceProvider provider(sample::create, broker);
  const Outcome outcome = provider.deleteInstance(kPath);
  EXPECT_EQ(CMPI_RC_ERR_NOT_SUPPORTED, outcome.rc);
  EXPECT_EQ("not here", outcome.message);
  EXPECT_THROW(provider.execQuery(kPath, "q", "l"), std::out_of_range);
  EXPECT_EQ(CMPI_RC_OK, provider.cleanup().rc);
  EXPECT_EQ(CMPI_RC_DO_NOT_UNLOAD, provider.cleanup(false).rc);
}

TEST(ProviderCall, FailuresThatWereAskedForBeforehandHitTheRequest) {
  RecordingBroker broker;
  InstanceProvider provider(sample::create, broker);
  broker.failNext("setProperty", Mode::SetRc);
  EXPECT_THAT(provider.enumerateInstances(kPath).instances().at(0).names(), IsEmpty());
  broker.failAt(3, Mode::SetRc);
  EXPECT_THAT(provider.enumerateInstances(kPath).instances(), IsEmpty());
}

TEST(ProviderCall, AssociationArgumentsArriveWhereTheyBelong) {
  RecordingBroker broker;
  AssociationProvider provider(sample::createAssociation, broker);
  const AssociationQuery all{"A", "B", "C", "D", {"E"}};
  EXPECT_THAT(textsOf(provider.associators(kPath, all)), ElementsAre("A", "B", "C", "D", "E"));
  EXPECT_THAT(textsOf(provider.associatorNames(kPath, all)), ElementsAre("A", "B", "C", "D"));
  EXPECT_THAT(textsOf(provider.references(kPath, all)), ElementsAre("B", "C", "E"));
  EXPECT_THAT(textsOf(provider.referenceNames(kPath, {.role = "C"})), ElementsAre("null", "C"));
  EXPECT_EQ(CMPI_RC_OK, provider.cleanup().rc);
}

TEST(ProviderCall, MethodArgumentsGoInAndOut) {
  RecordingBroker broker;
  MethodProvider provider(sample::createMethod, broker);
  const Outcome outcome = provider.invokeMethod(kPath, "Do", {{"In", text("x")}});
  EXPECT_THAT(textsOf(outcome), ElementsAre("Do"));
  ASSERT_EQ(1U, outcome.out.size());
  EXPECT_EQ(text("x"), outcome.out[0].second);
  EXPECT_EQ(CMPI_RC_ERR_NO_SUCH_PROPERTY, provider.invokeMethod(kPath, "Do").rc);
  EXPECT_EQ(CMPI_RC_ERR_NOT_SUPPORTED, provider.cleanup().rc);
}

TEST(ProviderCall, OutcomePrintsAllOfIt) {
  RecordingBroker broker;
  InstanceProvider provider(sample::create, broker);
  std::ostringstream printed;
  printed << provider.enumerateInstanceNames(kPath);
  EXPECT_THAT(printed.str(), HasSubstr("CMPI_RC_OK (0), done\npath root/cimv2:ZORVA_X.Name=\"eth0\"\n"));
  EXPECT_THAT(printed.str(), HasSubstr("  returnObjectPath(ref)\n"));
}

}  // namespace
}  // namespace ZV::Test
