// Every slot of every table is called: once with good arguments, then with each pointer null in turn, then with each
// object replaced by one of another kind in turn. The list of slots comes from the facts about CMPI
// (generate_slot_test.py).

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <array>
#include <map>
#include <optional>
#include <set>
#include <string>
#include <tuple>
#include <type_traits>
#include <utility>

#include "broker/Broker.h"
#include "broker/core/BrokerCore.h"
#include "broker/objects/Data.h"
#include "broker/objects/Objects.h"
#include "broker/objects/QueryObjects.h"
#include "broker/objects/Scope.h"
#include "broker/requests/Result.h"
#include "broker/testing/TestClasses.h"

namespace zorva::broker {
namespace {

Broker& theBroker() {
  static Broker broker = [] {
    BrokerOptions options;
    options.registry = ProviderRegistry();
    options.registry.add({"T_Thing", "Thing", "zorvabrokertestprovider", InstanceMi | MethodMi});
    options.registry.add({"T_Other", "Other", "zorvabrokertestprovider", InstanceMi});
    options.registry.add({"T_ThingOther", "Link", "zorvabrokertestprovider", InstanceMi | AssociationMi});
    options.providerDirectory = ZORVA_LIB_DIR;
    return Broker(testing::testClasses(), std::move(options));
  }();
  return broker;
}

/// A receiver that takes everything.
Receiver& anyReceiver() {
  static Receiver receiver;
  return receiver;
}

/// One object of each kind, and a value of each other type that a slot may need.
class World {
 public:
  World() : result(core, ResultObject::Instances | ResultObject::Paths | ResultObject::Values, &anyReceiver(), "test") {
    const CMPIBroker* broker = core.handle();
    string = broker->eft->newString(broker, "2024", nullptr);
    path = broker->eft->newObjectPath(broker, "root/cimv2", "T_Thing", nullptr);
    path->ft->addKey(path, "Name", reinterpret_cast<const CMPIValue*>("a"), CMPI_chars);
    instance = broker->eft->newInstance(broker, path, nullptr);
    array = broker->eft->newArray(broker, 2, CMPI_string, nullptr);
    args = broker->eft->newArgs(broker, nullptr);
    value.string = string;
    args->ft->addArg(args, "Text", &value, CMPI_string);
    dateTime = broker->eft->newDateTime(broker, nullptr);
    error =
        broker->eft->newCMPIError(broker, "me", "1", "text", ErrorSevLow, ErrorProbCauseUnknown, CMPI_RC_OK, nullptr);
    auto* own = scope.arena().make<ContextObject>(scope.arena());
    own->setText(CMPIPrincipal, "alice");
    context = own;
    auto* paths = scope.arena().make<EnumerationObject>(scope.arena(), CMPIType{CMPI_ref});
    CMPIData element = nullData(CMPI_ref, CMPI_goodValue);
    element.value.ref = path;
    paths->append(element);
    enumeration = paths;
    mark = broker->mft->mark(broker, nullptr);
    block = broker->mft->cmpiMalloc(broker, 8);
  }

  BrokerCore& core = *BrokerCore::of(theBroker().handle());
  Scope scope{core.classes(), core.blocks()};
  CMPIString* string = nullptr;
  CMPIObjectPath* path = nullptr;
  CMPIInstance* instance = nullptr;
  CMPIArray* array = nullptr;
  CMPIArgs* args = nullptr;
  CMPIDateTime* dateTime = nullptr;
  CMPIError* error = nullptr;
  CMPIContext* context = nullptr;
  CMPIEnumeration* enumeration = nullptr;
  ResultObject result;
  CMPIValue value{};
  void* mark = nullptr;
  void* block = nullptr;
  CMPIStatus status{CMPI_RC_ERROR, nullptr};
  CMPIString* someString = nullptr;
  CMPIArray* someArray = nullptr;
  CMPIType someType = 0;
  CMPIPredOp someOperator = CMPI_PredOp_Equals;
  int someInt = 0;
  void* somePointer = nullptr;
  std::array<const char*, 2> list{"Name", nullptr};
};

/// A text that is valid for that parameter.
const char* goodText(const std::string& slot, const std::string& parameter) {
  if (slot == "CMPIContextFT.getEntry" || slot == "CMPIContextFT.addEntry") return CMPIPrincipal;
  if (slot == "CMPIArgsFT.getArg") return "Text";
  if (slot == "CMPIBrokerEncFT.classPathIsA") return "T_Base";
  if (slot == "CMPIBrokerEncFT.isOfType") return "CMPIString";
  if (slot == "CMPIBrokerFT.setProperty") return "Inner";  // a key cannot be changed
  if (slot == "CMPIObjectPathFT.getPropertyQualifier") return parameter == "pName" ? "Size" : "Values";
  if (parameter == "resultClass") return slot.find("eferenc") != std::string::npos ? "T_ThingOther" : "T_Other";
  static const std::map<std::string, const char*> texts = {{"ns", "root/cimv2"},
                                                           {"cn", "T_Thing"},
                                                           {"utcTime", "20240102030405.000006+060"},
                                                           {"role", "Left"},
                                                           {"assocClass", "T_ThingOther"},
                                                           {"resultRole", "Right"},
                                                           {"method", "Echo"},
                                                           {"methodName", "Echo"},
                                                           {"mName", "Echo"},
                                                           {"pName", "Text"},
                                                           {"qName", "Description"}};
  const auto found = texts.find(parameter);
  return found != texts.end() ? found->second : "Name";
}

/// The good argument of each type.
template <typename T>
T good(World& world, const std::string& slot, const std::string& parameter) {
  using Bare = std::remove_const_t<std::remove_pointer_t<T>>;
  if constexpr (std::is_same_v<Bare, CMPIBroker>)
    return world.core.handle();
  else if constexpr (std::is_same_v<T, const char*>)
    return goodText(slot, parameter);
  else if constexpr (std::is_same_v<Bare, CMPIString>)
    return world.string;
  else if constexpr (std::is_same_v<Bare, CMPIObjectPath>)
    return world.path;
  else if constexpr (std::is_same_v<Bare, CMPIInstance>)
    return world.instance;
  else if constexpr (std::is_same_v<Bare, CMPIArray>)
    return world.array;
  else if constexpr (std::is_same_v<Bare, CMPIArgs>)
    return world.args;
  else if constexpr (std::is_same_v<Bare, CMPIDateTime>)
    return world.dateTime;
  else if constexpr (std::is_same_v<Bare, CMPIError>)
    return world.error;
  else if constexpr (std::is_same_v<Bare, CMPIContext>)
    return world.context;
  else if constexpr (std::is_same_v<Bare, CMPIEnumeration>)
    return world.enumeration;
  else if constexpr (std::is_same_v<Bare, CMPIResult>)
    return &world.result;
  else if constexpr (std::is_same_v<Bare, CMPISelectExp>)
    return &theOnly<SelectExpObject>();
  else if constexpr (std::is_same_v<Bare, CMPISelectCond>)
    return &theOnly<SelectCondObject>();
  else if constexpr (std::is_same_v<Bare, CMPISubCond>)
    return &theOnly<SubCondObject>();
  else if constexpr (std::is_same_v<Bare, CMPIPredicate>)
    return &theOnly<PredicateObject>();
  else if constexpr (std::is_same_v<Bare, CMPIStatus>)
    return &world.status;
  else if constexpr (std::is_same_v<Bare, CMPIValue>)
    return &world.value;
  else if constexpr (std::is_same_v<T, CMPIString**>)
    return &world.someString;
  else if constexpr (std::is_same_v<T, CMPIArray**>)
    return &world.someArray;
  else if constexpr (std::is_same_v<T, CMPIPredOp*>)
    return &world.someOperator;
  else if constexpr (std::is_same_v<T, CMPIType*>)
    return &world.someType;
  else if constexpr (std::is_same_v<T, int*>)
    return &world.someInt;
  else if constexpr (std::is_same_v<T, void**>)
    return &world.somePointer;
  else if constexpr (std::is_same_v<T, const char**>)
    return world.list.data();
  else if constexpr (std::is_same_v<T, CMPIAccessor*>)
    return [](const char*, void*) { return CMPIData{}; };
  else if constexpr (std::is_same_v<T, const void*>) {
    if (parameter == "gc") return world.mark;
    return world.string;
  } else if constexpr (std::is_same_v<T, void*>) {
    return slot.find("MemFT") != std::string::npos ? world.block : nullptr;
  } else if constexpr (std::is_same_v<T, CMPIType>)
    return CMPI_string;
  else if constexpr (std::is_same_v<T, std::size_t>)
    return 16;
  else if constexpr (std::is_same_v<T, CMPICount>)
    return parameter == "max" ? 2 : 0;
  else
    return T{};
}

template <typename T, typename... Kinds>
constexpr bool isOneOf() {
  return (std::is_same_v<T, Kinds> || ...);
}

template <typename T>
inline constexpr bool isHandle = isOneOf<std::remove_const_t<T>, CMPIBroker, CMPIString, CMPIObjectPath, CMPIInstance,
                                         CMPIArray, CMPIArgs, CMPIDateTime, CMPIError, CMPIContext, CMPIEnumeration,
                                         CMPIResult, CMPISelectExp, CMPISelectCond, CMPISubCond, CMPIPredicate>();

/// An object of another kind than T*.
template <typename T>
T* wrongKind(World& world) {
  void* other = std::is_same_v<std::remove_const_t<T>, CMPIString> ? static_cast<void*>(world.path)
                                                                   : static_cast<void*>(world.string);
  // A broker is larger than the other objects; the wrong object must be as large, because it is read.
  static CMPIBroker noBroker{};
  noBroker.hdl = &noBroker;
  if (std::is_same_v<std::remove_const_t<T>, CMPIBroker>) other = &noBroker;
  return static_cast<T*>(other);
}

enum class Variant { Null, WrongKind };

/// What a call returned: a code, if it can return one.
struct Told {
  bool tells = false;
  CMPIrc rc = CMPI_RC_OK;
};

template <typename R, typename... Args>
Told callWith(World& world, R (*function)(Args...), std::tuple<Args...>& arguments) {
  constexpr bool hasStatus = (std::is_same_v<Args, CMPIStatus*> || ...);
  if constexpr (std::is_same_v<R, CMPIStatus>) {
    return {true, std::apply(function, arguments).rc};
  } else if constexpr (std::is_void_v<R>) {
    std::apply(function, arguments);
    return {};
  } else {
    [[maybe_unused]] R given = std::apply(function, arguments);
    if constexpr (std::is_pointer_v<R> && isHandle<std::remove_pointer_t<R>>) {
      if (given != nullptr) given->ft->release(given);  // a clone must be released; for all else it is harmless
    }
    return {hasStatus, world.status.rc};
  }
}

/// Slots whose handle is optional: a text parameter has the same meaning.
bool isOptional(const std::string& slot, const std::string& parameter) {
  return parameter == "string" && (slot == "CMPIBrokerEncFT.logMessage" || slot == "CMPIBrokerEncFT.trace");
}

void expectGoodAnswer(const std::string& slot, const Told& told) {
  EXPECT_TRUE(!told.tells || told.rc == CMPI_RC_OK || told.rc == CMPI_RC_ERR_NOT_SUPPORTED) << slot << ": " << told.rc;
}

/// The answer to a call whose parameter `index`, a handle, is spoilt.
void expectRefusal(const std::string& slot, const std::string& parameter, std::size_t index, Variant variant,
                   const Told& told) {
  if (!told.tells || isOptional(slot, parameter)) return;
  EXPECT_TRUE(told.rc == CMPI_RC_ERR_INVALID_HANDLE || (index != 0 && told.rc == CMPI_RC_ERR_NOT_SUPPORTED))
      << slot << " with parameter " << index << (variant == Variant::Null ? " null" : " of the wrong kind") << ": "
      << told.rc;
}

/// Spoils an argument, if it is of a type that has this variant.
template <typename T>
bool spoil(World& world, T& argument, Variant variant) {
  if constexpr (std::is_pointer_v<T>) {
    if (variant == Variant::Null) {
      argument = nullptr;
      return true;
    }
    if constexpr (isHandle<std::remove_pointer_t<T>>) {
      argument = wrongKind<std::remove_pointer_t<T>>(world);
      return true;
    }
  }
  return false;
}

/// One call with good arguments, or with parameter `spoilt` replaced.
template <typename R, typename... Args, std::size_t... index>
void exerciseOne(const std::string& slot, R (*function)(Args...), const std::array<std::string, sizeof...(Args)>& names,
                 std::index_sequence<index...> /*all*/, std::optional<std::size_t> spoilt, Variant variant) {
  World world;
  std::tuple<Args...> arguments{good<Args>(world, slot, names[index])...};
  if (spoilt && !((index == *spoilt && spoil(world, std::get<index>(arguments), variant)) || ...)) return;
  const Told told = callWith(world, function, arguments);
  constexpr std::array handles{(std::is_pointer_v<Args> && isHandle<std::remove_pointer_t<Args>>)...};
  if (!spoilt) {
    expectGoodAnswer(slot, told);
  } else if (handles[*spoilt]) {
    expectRefusal(slot, names[*spoilt], *spoilt, variant, told);
  }
}

template <typename R, typename... Args>
void exercise(const std::string& slot, R (*function)(Args...), const std::array<std::string, sizeof...(Args)>& names) {
  const auto all = std::index_sequence_for<Args...>();
  exerciseOne(slot, function, names, all, std::nullopt, Variant::Null);
  for (const Variant variant : {Variant::Null, Variant::WrongKind}) {
    for (std::size_t index = 0; index < sizeof...(Args); ++index) {
      exerciseOne(slot, function, names, all, index, variant);
    }
  }
}

// The tables, by the names of their types.
auto& tableOf(const CMPIBrokerFT*) { return brokerTable; }
auto& tableOf(const CMPIBrokerEncFT*) { return encapsulationTable; }
auto& tableOf(const CMPIBrokerExtFT*) { return extensionTable; }
auto& tableOf(const CMPIBrokerMemFT*) { return memoryTable; }
auto& tableOf(const CMPIContextFT*) { return ContextObject::table; }
auto& tableOf(const CMPIResultFT*) { return ResultObject::table; }
auto& tableOf(const CMPIErrorFT*) { return ErrorObject::table; }
auto& tableOf(const CMPIInstanceFT*) { return InstanceObject::table; }
auto& tableOf(const CMPIObjectPathFT*) { return PathObject::table; }
auto& tableOf(const CMPISelectExpFT*) { return SelectExpObject::table; }
auto& tableOf(const CMPISelectCondFT*) { return SelectCondObject::table; }
auto& tableOf(const CMPISubCondFT*) { return SubCondObject::table; }
auto& tableOf(const CMPIPredicateFT*) { return PredicateObject::table; }
auto& tableOf(const CMPIArgsFT*) { return ArgsObject::table; }
auto& tableOf(const CMPIStringFT*) { return StringObject::table; }
auto& tableOf(const CMPIArrayFT*) { return ArrayObject::table; }
auto& tableOf(const CMPIEnumerationFT*) { return EnumerationObject::table; }
auto& tableOf(const CMPIDateTimeFT*) { return DateTimeObject::table; }

/// Slots that end threads, wait, or need their own thread: Threads_test.cpp calls each of them.
const std::set<std::string>& calledInThreadsTest() {
  static const std::set<std::string> slots = {
      "CMPIBrokerFT.attachThread",         "CMPIBrokerFT.detachThread",        "CMPIBrokerExtFT.resolveFileName",
      "CMPIBrokerExtFT.newThread",         "CMPIBrokerExtFT.joinThread",       "CMPIBrokerExtFT.exitThread",
      "CMPIBrokerExtFT.cancelThread",      "CMPIBrokerExtFT.threadSleep",      "CMPIBrokerExtFT.threadOnce",
      "CMPIBrokerExtFT.createThreadKey",   "CMPIBrokerExtFT.destroyThreadKey", "CMPIBrokerExtFT.getThreadSpecific",
      "CMPIBrokerExtFT.setThreadSpecific", "CMPIBrokerExtFT.newMutex",         "CMPIBrokerExtFT.destroyMutex",
      "CMPIBrokerExtFT.lockMutex",         "CMPIBrokerExtFT.unlockMutex",      "CMPIBrokerExtFT.newCondition",
      "CMPIBrokerExtFT.destroyCondition",  "CMPIBrokerExtFT.condWait",         "CMPIBrokerExtFT.timedCondWait",
      "CMPIBrokerExtFT.signalCondition"};
  return slots;
}

bool isExercised(const std::string& slot, bool isThere) {
  EXPECT_TRUE(isThere) << slot;
  return isThere && !calledInThreadsTest().contains(slot);
}

TEST(Tables, EverySlotAnswersGoodNullAndWrongArguments) {
  int slots = 0;
  std::set<std::string> variadic;
#define SLOT(table, slot, ...)                                                                                   \
  {                                                                                                              \
    ++slots;                                                                                                     \
    const auto function = tableOf(static_cast<const table*>(nullptr)).slot;                                      \
    if (isExercised(#table "." #slot, function != nullptr)) exercise(#table "." #slot, function, {__VA_ARGS__}); \
  }
#define VARIADIC_SLOT(table, slot)                                        \
  {                                                                       \
    ++slots;                                                              \
    EXPECT_NE(tableOf(static_cast<const table*>(nullptr)).slot, nullptr); \
    variadic.insert(#slot);                                               \
  }
#include "broker_slots.inc"
#undef SLOT
#undef VARIADIC_SLOT
  EXPECT_EQ(slots, 185);
  EXPECT_EQ(variadic, (std::set<std::string>{"getMessage", "getMessage2"}));  // called below
}

TEST(Tables, HaveTheVersionOfTheStandard) {
  EXPECT_EQ(brokerTable.brokerVersion, static_cast<unsigned>(CMPIVersion200));
  EXPECT_EQ(encapsulationTable.ftVersion, 200);
  EXPECT_EQ(extensionTable.ftVersion, 200);
  EXPECT_EQ(memoryTable.ftVersion, 200);
  EXPECT_EQ(InstanceObject::table.ftVersion, 200);
  EXPECT_EQ(PathObject::table.ftVersion, 200);
  EXPECT_EQ(StringObject::table.ftVersion, 200);
  EXPECT_EQ(ArrayObject::table.ftVersion, 200);
  EXPECT_EQ(ArgsObject::table.ftVersion, 200);
  EXPECT_EQ(DateTimeObject::table.ftVersion, 200);
  EXPECT_EQ(EnumerationObject::table.ftVersion, 200);
  EXPECT_EQ(ContextObject::table.ftVersion, 200);
  EXPECT_EQ(ResultObject::table.ftVersion, 200);
  EXPECT_EQ(ErrorObject::table.ftVersion, 200);
  EXPECT_EQ(SelectExpObject::table.ftVersion, 200);
  EXPECT_EQ(SelectCondObject::table.ftVersion, 200);
  EXPECT_EQ(SubCondObject::table.ftVersion, 200);
  EXPECT_EQ(PredicateObject::table.ftVersion, 200);
}

TEST(Tables, MessagesAreTheirDefaultTextWithInserts) {
  const World world;
  const CMPIBroker* broker = world.core.handle();
  CMPIStatus status{CMPI_RC_ERROR, nullptr};
  CMPIString* message = broker->eft->getMessage(broker, "id", "{0} and {1}, {2} {3} {9} {", &status,
                                                CMFmtArgs3(CMFmtSint(-4), CMFmtChars("x"), CMFmtString(world.string)));
  EXPECT_EQ(status.rc, CMPI_RC_OK);
  EXPECT_EQ(textOf(message), "-4 and x, 2024 {3} {9} {");
  message =
      broker->eft->getMessage2(broker, "id", nullptr, "{1}{0}", &status, CMFmtArgs2(CMFmtBoolean(1), CMFmtUint64(7)));
  EXPECT_EQ(textOf(message), "7true");
  EXPECT_EQ(broker->eft->getMessage2(broker, "id", world.string, "x", &status, 0), nullptr);
  EXPECT_EQ(status.rc, CMPI_RC_ERR_INVALID_HANDLE);
  EXPECT_EQ(broker->eft->getMessage(nullptr, "id", "x", &status, 0), nullptr);
  EXPECT_EQ(status.rc, CMPI_RC_ERR_INVALID_HANDLE);
  EXPECT_EQ(textOf(broker->eft->getMessage(broker, nullptr, nullptr, nullptr, 0)), "");
}

TEST(Tables, WithoutAScopeNothingIsMade) {
  const CMPIBroker* broker = theBroker().handle();
  CMPIStatus status{CMPI_RC_OK, nullptr};
  EXPECT_EQ(broker->eft->newString(broker, "x", &status), nullptr);
  EXPECT_EQ(status.rc, CMPI_RC_ERR_FAILED);
  EXPECT_EQ(broker->mft->cmpiMalloc(broker, 8), nullptr);
}

}  // namespace
}  // namespace zorva::broker
