#include "tests/support/RecordingBroker.h"

#include <algorithm>
#include <array>
#include <cstdlib>
#include <cstring>

#include "tests/support/BrokerObjects.h"
#include "tests/support/Places.h"

namespace ZV::Test {

// The functions of the broker's own tables, and what they do.
struct BrokerEncapsulation {
  static CMPIInstance* newInstance(const CMPIBroker* face, const CMPIObjectPath* path, CMPIStatus* rc);
  static CMPIObjectPath* newObjectPath(const CMPIBroker* face, const char* space, const char* name, CMPIStatus* rc);
  static CMPIArgs* newArgs(const CMPIBroker* face, CMPIStatus* rc);
  static CMPIString* newString(const CMPIBroker* face, const char* text, CMPIStatus* rc);
  static CMPIArray* newArray(const CMPIBroker* face, CMPICount size, CMPIType type, CMPIStatus* rc);
  static CMPIDateTime* newDateTime(const CMPIBroker* face, CMPIStatus* rc);
  static CMPIDateTime* newDateTimeFromBinary(const CMPIBroker* face, CMPIUint64, CMPIBoolean, CMPIStatus* rc);
  static CMPIDateTime* newDateTimeFromChars(const CMPIBroker* face, const char* text, CMPIStatus* rc);
  static CMPIBoolean classPathIsA(const CMPIBroker* face, const CMPIObjectPath* path, const char* type, CMPIStatus* rc);
  static CMPIString* getMessage(const CMPIBroker* face, const char* id, const char* text, CMPIStatus* rc, CMPICount,
                                ...);
  static CMPIString* getMessage2(const CMPIBroker* face, const char* id, const CMPIMsgFileHandle, const char* text,
                                 CMPIStatus* rc, CMPICount, ...);
  static CMPIStatus logMessage(const CMPIBroker* face, int, const char* id, const char* text, const CMPIString*);
  static CMPIBrokerEncFT table;
};

struct BrokerUpCalls {
  static CMPIEnumeration* enumerateInstanceNames(const CMPIBroker* face, const CMPIContext* context,
                                                 const CMPIObjectPath* path, CMPIStatus* rc);
  static CMPIEnumeration* enumerateInstances(const CMPIBroker* face, const CMPIContext* context,
                                             const CMPIObjectPath* path, const char** properties, CMPIStatus* rc);
  static CMPIInstance* getInstance(const CMPIBroker* face, const CMPIContext* context, const CMPIObjectPath* path,
                                   const char** properties, CMPIStatus* rc);
  static CMPIBrokerFT table;
};

namespace {

constexpr std::array kReads = {
    "getNameSpace", "getHostname", "getClassName",     "getKey",     "getKeyAt",   "getKeyCount",
    "toString",     "getProperty", "getPropertyAt",    "getCharPtr", "getSize",    "getSimpleType",
    "getElementAt", "hasNext",     "getPropertyCount", "getEntry",   "getEntryAt", "getEntryCount",
    "getArg",       "getArgAt",    "getArgCount",
};

bool isRead(const std::string& name) {
  return std::any_of(kReads.begin(), kReads.end(), [&name](const char* read) { return name == read; });
}

template <typename Names>
bool isAmong(const Names& names, const std::string& name) {
  return std::find(names.begin(), names.end(), name) != names.end();
}

RecordingBroker* brokerOf(const CMPIBroker* face) { return static_cast<RecordingBroker*>(face->hdl); }

// A slot that this broker does not implement: it says so by its status, if it has one, and returns null.
CMPIStatus lastStatusOf() { return {CMPI_RC_ERR_NOT_SUPPORTED, nullptr}; }

template <typename Last>
void refuseBy(Last last) {
  if constexpr (std::is_same_v<Last, CMPIStatus*>) {
    if (last != nullptr) *last = lastStatusOf();
  }
}
template <typename First, typename Second, typename... Rest>
void refuseBy(First, Second second, Rest... rest) {
  refuseBy(second, rest...);
}

template <typename Slot>
struct Refused;
template <typename Result, typename... Arguments>
struct Refused<Result (*)(Arguments...)> {
  static Result call(Arguments... arguments) {
    refuseBy(arguments...);
    if constexpr (std::is_same_v<Result, CMPIStatus>) {
      return lastStatusOf();
    } else if constexpr (!std::is_void_v<Result>) {
      return Result{};
    }
  }
};

// Puts a refusing function into a slot.
template <typename Slot>
void refuse(Slot& slot) {
  slot = &Refused<Slot>::call;
}

const std::map<std::string, std::vector<std::string>>& commonKeys() {
  static const std::vector<std::string> kSystemKeys = {"SystemCreationClassName", "CreationClassName", "SystemName",
                                                       "Name"};
  static const std::map<std::string, std::vector<std::string>> kKeys = {
      {"ZORVA_DNSProtocolEndPoint", kSystemKeys},
      {"ZORVA_RemoteServiceAccessPoint", kSystemKeys},
      {"ZORVA_IPProtocolEndpoint", kSystemKeys},
      {"ZORVA_ComputerSystem", {"CreationClassName", "Name"}},
      {"ZORVA_SPComputerSystem", {"CreationClassName", "Name"}},
      {"ZORVA_DNSSettingData", {"InstanceID"}},
      {"ZORVA_DNSGeneralSettingData", {"InstanceID"}},
      {"ZORVA_IPAssignmentSettingData", {"InstanceID"}},
      {"ZORVA_RemoteAccessAvailableToElement", {"Antecedent", "Dependent"}},
      {"ZORVA_DNSSAPSAPDependency", {"Antecedent", "Dependent"}},
      {"ZORVA_DNSHostedAccessPoint", {"Antecedent", "Dependent"}},
      {"ZORVA_DNSGeneralElementSettingData", {"ManagedElement", "SettingData"}},
      {"ZORVA_DNSGenEndPointElementSettingData", {"ManagedElement", "SettingData"}},
      {"ZORVA_DNSEndPointElementSettingData", {"ManagedElement", "SettingData"}},
      {"ZORVA_DNSGenOrderedComponent", {"GroupComponent", "PartComponent"}},
      {"ZORVA_DNSOrderedComponent", {"GroupComponent", "PartComponent"}},
  };
  return kKeys;
}

CMPIBrokerExtFT* makeThreadTable() {
  static CMPIBrokerExtFT table = [] {
    CMPIBrokerExtFT slots{};
    slots.ftVersion = CMPICurrentVersion;
    refuse(slots.resolveFileName);
    refuse(slots.newThread);
    refuse(slots.joinThread);
    refuse(slots.exitThread);
    refuse(slots.cancelThread);
    refuse(slots.threadSleep);
    refuse(slots.threadOnce);
    refuse(slots.createThreadKey);
    refuse(slots.destroyThreadKey);
    refuse(slots.getThreadSpecific);
    refuse(slots.setThreadSpecific);
    refuse(slots.newMutex);
    refuse(slots.destroyMutex);
    refuse(slots.lockMutex);
    refuse(slots.unlockMutex);
    refuse(slots.newCondition);
    refuse(slots.destroyCondition);
    refuse(slots.condWait);
    refuse(slots.timedCondWait);
    refuse(slots.signalCondition);
    return slots;
  }();
  return &table;
}

CMPIGcStat* markMemory(const CMPIBroker* face, CMPIStatus* rc) {
  return Call(brokerOf(face), "mark", "mark", "").giveNull(rc, CMPI_RC_OK);
}
CMPIStatus releaseMemory(const CMPIBroker* face, const CMPIGcStat*) {
  return Call(brokerOf(face), "release", "release", "").status();
}
void* allocate(const CMPIBroker*, std::size_t size) { return std::malloc(size); }
void* allocateZeroed(const CMPIBroker*, std::size_t count, std::size_t size) { return std::calloc(count, size); }
void* reallocate(const CMPIBroker*, void* memory, std::size_t size) { return std::realloc(memory, size); }
char* duplicate(const CMPIBroker*, const char* text) { return ::strdup(text); }
void deallocate(const CMPIBroker*, void* memory) { std::free(memory); }

// Freeing an object is recorded; the object itself lives as long as the broker.
template <typename Face>
void freeObject(const CMPIBroker* face, Face*) {
  Call(brokerOf(face), "free", "free", "").status();
}

CMPIBrokerMemFT* memoryTable() {
  static CMPIBrokerMemFT table = {CMPICurrentVersion,
                                  markMemory,
                                  releaseMemory,
                                  allocate,
                                  allocateZeroed,
                                  reallocate,
                                  duplicate,
                                  deallocate,
                                  freeObject<CMPIInstance>,
                                  freeObject<CMPIObjectPath>,
                                  freeObject<CMPIArgs>,
                                  freeObject<CMPIString>,
                                  freeObject<CMPIArray>,
                                  freeObject<CMPIDateTime>,
                                  freeObject<CMPISelectExp>};
  return &table;
}

}  // namespace

const char* nameOf(Mode mode) {
  static constexpr const char* kNames[] = {"rc set", "null", "null handle", "rc set and null", "exception"};
  return kNames[static_cast<std::size_t>(mode)];
}

std::vector<std::string> Calls::lines() const { return without({}); }

std::vector<std::string> Calls::steps() const {
  std::vector<std::string> all;
  for (const RecordedCall& call : *this) {
    if (!isRead(call.name)) all.push_back(call.line);
  }
  return all;
}

std::vector<std::string> Calls::only(std::initializer_list<std::string_view> names) const {
  std::vector<std::string> all;
  for (const RecordedCall& call : *this) {
    if (isAmong(names, call.name)) all.push_back(call.line);
  }
  return all;
}

std::vector<std::string> Calls::without(std::initializer_list<std::string_view> names) const {
  std::vector<std::string> all;
  for (const RecordedCall& call : *this) {
    if (!isAmong(names, call.name)) all.push_back(call.line);
  }
  return all;
}

std::size_t Calls::count(std::string_view name) const {
  return static_cast<std::size_t>(
      std::count_if(begin(), end(), [name](const RecordedCall& call) { return call.name == name; }));
}

RecordingBroker::RecordingBroker()
    : broker_{this, &BrokerUpCalls::table, &BrokerEncapsulation::table, makeThreadTable(), memoryTable()},
      keysOfClass_(commonKeys()) {}

RecordingBroker::~RecordingBroker() = default;

CMPIObjectPath* RecordingBroker::make(const Path& path, const std::string& label) { return addPath(path, label); }
CMPIInstance* RecordingBroker::make(const Instance& instance, const std::string& label) {
  return addInstance(instance, label);
}
CMPIString* RecordingBroker::makeString(const std::string& text) { return addString(text); }
CMPIArray* RecordingBroker::makeArray(const Value& list, const std::string& label) {
  return addArray(static_cast<CMPIType>(list.type & ~CMPI_ARRAY), list.elements(), label);
}
CMPIArgs* RecordingBroker::makeArgs(const std::vector<NamedValue>& arguments, const std::string& label) {
  return addArgs(arguments, label);
}
CMPIContext* RecordingBroker::makeContext(const std::string& label) { return addContext(label); }
CMPIResult* RecordingBroker::makeResult(const std::string& label) { return addResult(label); }
CMPIData RecordingBroker::makeData(const Value& value) { return ObjectTables::dataOf(this, value); }

Path RecordingBroker::read(const CMPIObjectPath* path) { return ObjectTables::pathOf(path); }
Instance RecordingBroker::read(const CMPIInstance* instance) { return ObjectTables::instanceOf(instance); }
std::string RecordingBroker::read(const CMPIString* string) { return ObjectTables::textOf(string); }

std::vector<NamedValue> RecordingBroker::read(const CMPIArgs* arguments) {
  const ArgsObject* object = ObjectTables::own(arguments);
  return object == nullptr ? std::vector<NamedValue>() : object->arguments;
}

Results RecordingBroker::read(const CMPIResult* result) {
  const ResultObject* object = ObjectTables::own(result);
  return object == nullptr ? Results() : object->results;
}

void RecordingBroker::addToAllStates(CMPIValueState state) {
  stateOfKeys = stateOfNexts = stateOfElements = stateOfArguments = state;
}

void RecordingBroker::setKeysOfClass(const std::string& className, std::vector<std::string> names) {
  keysOfClass_[className] = std::move(names);
}

const std::vector<std::string>& RecordingBroker::keysOfClass(const std::string& className) const {
  static const std::vector<std::string> kNone;
  const auto found = keysOfClass_.find(className);
  return found == keysOfClass_.end() ? kNone : found->second;
}

ServedClass& RecordingBroker::serve(const std::string& className, std::vector<Instance> instances) {
  ServedClass& served = served_[className];
  served = ServedClass();
  served.instances = std::move(instances);
  return served;
}

void RecordingBroker::failAt(std::size_t n, Mode mode) {
  const std::lock_guard lock(mutex_);
  failAt_ = {callCount_ + n, mode};
}

void RecordingBroker::failNext(const std::string& name, Mode mode) {
  const std::lock_guard lock(mutex_);
  failNext_[name] = mode;
}

void RecordingBroker::failEach(const std::string& name, Mode mode) {
  const std::lock_guard lock(mutex_);
  failEach_[name] = mode;
}

void RecordingBroker::failNever() {
  const std::lock_guard lock(mutex_);
  failAt_.reset();
  failNext_.clear();
  failEach_.clear();
}

bool RecordingBroker::hasFailed() const {
  const std::lock_guard lock(mutex_);
  return hasFailed_;
}

Calls RecordingBroker::calls() const {
  const std::lock_guard lock(mutex_);
  return calls_;
}

std::size_t RecordingBroker::callCount() const {
  const std::lock_guard lock(mutex_);
  return callCount_;
}

void RecordingBroker::beginRequest() {
  const std::lock_guard lock(mutex_);
  calls_.clear();
  numbers_.clear();
  pathsToLose_.clear();
}

void RecordingBroker::startOver() {
  failNever();
  const std::lock_guard lock(mutex_);
  calls_.clear();
  callCount_ = 0;
  hasFailed_ = false;
  numbers_.clear();
  lossOfHandles_ = {};
  pathsToLose_.clear();
}

std::size_t RecordingBroker::mark() const {
  const std::lock_guard lock(mutex_);
  return objects_.size();
}

void RecordingBroker::freeSince(std::size_t mark) {
  const std::lock_guard lock(mutex_);
  objects_.resize(std::min(mark, objects_.size()));
}

std::optional<Mode> RecordingBroker::record(const char* name, std::string line) {
  std::optional<Mode> failure;
  {
    const std::lock_guard lock(mutex_);
    ++callCount_;
    if (failAt_.has_value() && failAt_->first == callCount_) failure = failAt_->second;
    if (const auto each = failEach_.find(name); each != failEach_.end()) failure = each->second;
    if (const auto next = failNext_.find(name); next != failNext_.end()) {
      failure = next->second;
      failNext_.erase(next);
    }
    if (failure.has_value()) {
      hasFailed_ = true;
      line += std::string(" fails: ") + nameOf(*failure);
    }
    if (keepsLines) calls_.push_back({name, std::move(line), nextPlace()});
  }
  if (failure == Mode::Throw) throw InjectedFailure(std::string("the broker threw in ") + name);
  return failure;
}

template <typename Object>
Object* RecordingBroker::add(std::unique_ptr<Object> object, const char* kind, const std::string& label) {
  Object* made = object.get();
  made->broker = this;
  made->hdl = static_cast<BrokerObject*>(made);
  const std::lock_guard lock(mutex_);
  made->label = label.empty() ? kind + std::to_string(++numbers_[kind]) : label;
  objects_.push_back(std::move(object));
  return made;
}

PathObject* RecordingBroker::addPath(Path path, const std::string& label) {
  auto object = std::make_unique<PathObject>();
  object->ft = &ObjectTables::path;
  object->path = std::move(path);
  return add(std::move(object), "OP", label);
}

PathObject* RecordingBroker::addNewPath(Path path) {
  const auto& [victims, occasion] = lossOfHandles_;
  if (!occasion.empty() && path.className == occasion) {
    for (PathObject* victim : pathsToLose_) victim->hdl = nullptr;
  }
  const bool isVictim = path.className == victims;
  PathObject* object = addPath(std::move(path));
  if (!victims.empty() && isVictim) pathsToLose_.push_back(object);
  return object;
}

InstanceObject* RecordingBroker::addInstance(Instance instance, const std::string& label) {
  auto object = std::make_unique<InstanceObject>();
  object->ft = &ObjectTables::instance;
  object->instance = std::move(instance);
  return add(std::move(object), "I", label);
}

StringObject* RecordingBroker::addString(std::string text) {
  auto object = std::make_unique<StringObject>();
  object->ft = &ObjectTables::string;
  object->text = std::move(text);
  const std::string label = "string " + inQuotes(object->text);
  return add(std::move(object), "S", label);
}

ArrayObject* RecordingBroker::addArray(CMPIType elementType, std::vector<Value> elements, const std::string& label) {
  auto object = std::make_unique<ArrayObject>();
  object->ft = &ObjectTables::array;
  object->elementType = elementType;
  object->elements = std::move(elements);
  return add(std::move(object), "A", label);
}

EnumerationObject* RecordingBroker::addEnumeration(std::vector<Value> elements) {
  auto object = std::make_unique<EnumerationObject>();
  object->ft = &ObjectTables::enumeration;
  object->elements = std::move(elements);
  return add(std::move(object), "E", {});
}

ResultObject* RecordingBroker::addResult(const std::string& label) {
  auto object = std::make_unique<ResultObject>();
  object->ft = &ObjectTables::result;
  return add(std::move(object), "R", label);
}

ContextObject* RecordingBroker::addContext(const std::string& label) {
  auto object = std::make_unique<ContextObject>();
  object->ft = &ObjectTables::context;
  return add(std::move(object), "C", label);
}

ArgsObject* RecordingBroker::addArgs(std::vector<NamedValue> arguments, const std::string& label) {
  auto object = std::make_unique<ArgsObject>();
  object->ft = &ObjectTables::args;
  object->arguments = std::move(arguments);
  return add(std::move(object), "AR", label);
}

DateTimeObject* RecordingBroker::addDateTime(std::string text) {
  auto object = std::make_unique<DateTimeObject>();
  object->ft = &ObjectTables::dateTime;
  object->text = std::move(text);
  return add(std::move(object), "DT", {});
}

CMPIInstance* BrokerEncapsulation::newInstance(const CMPIBroker* face, const CMPIObjectPath* path, CMPIStatus* rc) {
  RecordingBroker* broker = brokerOf(face);
  const Call call(broker, "newInstance", "newInstance", ObjectTables::nameOf(path));
  if (path == nullptr || path->hdl == nullptr) return call.giveNull(rc, CMPI_RC_ERR_INVALID_PARAMETER);
  // The host is not copied: a provider that needs it in a path of the instance has to set it there.
  Instance fresh;
  fresh.path = ObjectTables::pathOf(path).on("");
  return call.give([&] { return broker->addInstance(fresh); }, rc);
}

CMPIObjectPath* BrokerEncapsulation::newObjectPath(const CMPIBroker* face, const char* space, const char* name,
                                                   CMPIStatus* rc) {
  RecordingBroker* broker = brokerOf(face);
  const Call call(broker, "newObjectPath", "newObjectPath", inQuotesOrNull(space) + ", " + inQuotesOrNull(name));
  const Path path(name == nullptr ? "" : name, space == nullptr ? "" : space);
  return call.give([&] { return broker->addNewPath(path); }, rc);
}

CMPIArgs* BrokerEncapsulation::newArgs(const CMPIBroker* face, CMPIStatus* rc) {
  RecordingBroker* broker = brokerOf(face);
  const Call call(broker, "newArgs", "newArgs", "");
  return call.give([&] { return broker->addArgs({}); }, rc);
}

CMPIString* BrokerEncapsulation::newString(const CMPIBroker* face, const char* text, CMPIStatus* rc) {
  RecordingBroker* broker = brokerOf(face);
  const Call call(broker, "newString", "newString", inQuotesOrNull(text));
  return call.give([&] { return broker->addString(text == nullptr ? "" : text); }, rc);
}

CMPIArray* BrokerEncapsulation::newArray(const CMPIBroker* face, CMPICount size, CMPIType type, CMPIStatus* rc) {
  RecordingBroker* broker = brokerOf(face);
  const Call call(broker, "newArray", "newArray", std::to_string(size) + ", " + nameOfType(type));
  return call.give([&] { return broker->addArray(type, std::vector<Value>(size, null(type))); }, rc);
}

CMPIDateTime* BrokerEncapsulation::newDateTime(const CMPIBroker* face, CMPIStatus* rc) {
  RecordingBroker* broker = brokerOf(face);
  const Call call(broker, "newDateTime", "newDateTime", "");
  return call.give([&] { return broker->addDateTime("20260101000000.000000+000"); }, rc);
}

CMPIDateTime* BrokerEncapsulation::newDateTimeFromBinary(const CMPIBroker* face, CMPIUint64, CMPIBoolean,
                                                         CMPIStatus* rc) {
  const Call call(brokerOf(face), "newDateTimeFromBinary", "newDateTimeFromBinary", "");
  return call.giveNull(rc, CMPI_RC_ERR_NOT_SUPPORTED);
}

CMPIDateTime* BrokerEncapsulation::newDateTimeFromChars(const CMPIBroker* face, const char* text, CMPIStatus* rc) {
  RecordingBroker* broker = brokerOf(face);
  const Call call(broker, "newDateTimeFromChars", "newDateTimeFromChars", inQuotesOrNull(text));
  return call.give([&] { return broker->addDateTime(text == nullptr ? "" : text); }, rc);
}

CMPIBoolean BrokerEncapsulation::classPathIsA(const CMPIBroker* face, const CMPIObjectPath* path, const char* type,
                                              CMPIStatus* rc) {
  const Call call(brokerOf(face), "classPathIsA", "classPathIsA",
                  ObjectTables::nameOf(path) + ", " + inQuotesOrNull(type));
  const bool isSame = type != nullptr && sameName(ObjectTables::pathOf(path).className, type);
  return call.giveNumber(static_cast<CMPIBoolean>(isSame), rc);
}

CMPIString* BrokerEncapsulation::getMessage(const CMPIBroker* face, const char* id, const char* text, CMPIStatus* rc,
                                            CMPICount, ...) {
  RecordingBroker* broker = brokerOf(face);
  const Call call(broker, "getMessage", "getMessage", inQuotesOrNull(id) + ", " + inQuotesOrNull(text));
  return call.give([&] { return broker->addString(text == nullptr ? "" : text); }, rc);
}

CMPIString* BrokerEncapsulation::getMessage2(const CMPIBroker* face, const char* id, const CMPIMsgFileHandle,
                                             const char* text, CMPIStatus* rc, CMPICount, ...) {
  return getMessage(face, id, text, rc, 0);
}

CMPIStatus BrokerEncapsulation::logMessage(const CMPIBroker* face, int, const char* id, const char* text,
                                           const CMPIString*) {
  return Call(brokerOf(face), "logMessage", "logMessage", inQuotesOrNull(id) + ", " + inQuotesOrNull(text)).status();
}

CMPIBrokerEncFT BrokerEncapsulation::table = [] {
  CMPIBrokerEncFT slots{};
  slots.ftVersion = CMPICurrentVersion;
  slots.newInstance = newInstance;
  slots.newObjectPath = newObjectPath;
  slots.newArgs = newArgs;
  slots.newString = newString;
  slots.newArray = newArray;
  slots.newDateTime = newDateTime;
  slots.newDateTimeFromBinary = newDateTimeFromBinary;
  slots.newDateTimeFromChars = newDateTimeFromChars;
  slots.classPathIsA = classPathIsA;
  slots.getMessage = getMessage;
  slots.getMessage2 = getMessage2;
  slots.logMessage = logMessage;
  slots.trace = logMessage;
  refuse(slots.newSelectExp);
  refuse(slots.toString);
  refuse(slots.isOfType);
  refuse(slots.getType);
  refuse(slots.newCMPIError);
  refuse(slots.openMessageFile);
  refuse(slots.closeMessageFile);
  return slots;
}();

namespace {

// A provider passes the context of its own operation, so a line shows the context only if it is another one.
std::string upCallArguments(const CMPIContext* context, const CMPIObjectPath* path) {
  const std::string name = ObjectTables::nameOf(context);
  return ObjectTables::nameOf(path) + (name == "context" ? "" : ", context " + name);
}

Value pathAsServed(const RecordingBroker& broker, const Instance& instance, const Path& asked) {
  Path path = instance.path.in(asked.nameSpace);
  for (const std::string& name : broker.keysOfClass(instance.path.className)) {
    if (const Value* value = findValue(instance.properties, name)) putValue(path.keys, name, *value);
  }
  return ref(std::move(path));
}

Value instanceAsServed(const Instance& instance, const Path& asked) {
  Instance copy = instance;
  copy.path.nameSpace = asked.nameSpace;
  return {CMPI_instance, CMPI_goodValue, std::make_shared<const Instance>(std::move(copy))};
}

}  // namespace

CMPIEnumeration* BrokerUpCalls::enumerateInstanceNames(const CMPIBroker* face, const CMPIContext* context,
                                                       const CMPIObjectPath* path, CMPIStatus* rc) {
  RecordingBroker* broker = brokerOf(face);
  const Call call(broker, "enumerateInstanceNames", "enumerateInstanceNames", upCallArguments(context, path));
  const Path asked = ObjectTables::pathOf(path);
  const auto served = broker->served_.find(asked.className);
  if (served == broker->served_.end()) return call.giveNull(rc, CMPI_RC_ERR_INVALID_CLASS);
  std::vector<Value> names;
  for (const Instance& instance : served->second.instances) names.push_back(pathAsServed(*broker, instance, asked));
  return call.giveServed(
      served->second, [&] { return broker->addEnumeration(names); }, rc);
}

CMPIEnumeration* BrokerUpCalls::enumerateInstances(const CMPIBroker* face, const CMPIContext* context,
                                                   const CMPIObjectPath* path, const char** properties,
                                                   CMPIStatus* rc) {
  RecordingBroker* broker = brokerOf(face);
  const std::string list = properties == nullptr ? "" : ", " + listInQuotes(properties);
  const Call call(broker, "enumerateInstances", "enumerateInstances", upCallArguments(context, path) + list);
  const Path asked = ObjectTables::pathOf(path);
  const auto served = broker->served_.find(asked.className);
  if (served == broker->served_.end()) return call.giveNull(rc, CMPI_RC_ERR_INVALID_CLASS);
  std::vector<Value> instances;
  for (const Instance& instance : served->second.instances) instances.push_back(instanceAsServed(instance, asked));
  return call.giveServed(
      served->second, [&] { return broker->addEnumeration(instances); }, rc);
}

CMPIInstance* BrokerUpCalls::getInstance(const CMPIBroker* face, const CMPIContext* context, const CMPIObjectPath* path,
                                         const char** properties, CMPIStatus* rc) {
  RecordingBroker* broker = brokerOf(face);
  const std::string list = properties == nullptr ? "" : ", " + listInQuotes(properties);
  const Call call(broker, "getInstance", "getInstance", upCallArguments(context, path) + list);
  const Path asked = ObjectTables::pathOf(path);
  const auto served = broker->served_.find(asked.className);
  if (served == broker->served_.end()) return call.giveNull(rc, CMPI_RC_ERR_INVALID_CLASS);
  for (const Instance& instance : served->second.instances) {
    const Path candidate = pathAsServed(*broker, instance, asked).path();
    const bool isAsked = std::all_of(asked.keys.begin(), asked.keys.end(), [&candidate](const NamedValue& key) {
      return candidate[key.first].content == key.second.content;
    });
    if (!isAsked) continue;
    return call.giveServed(
        served->second,
        [&] {
          return broker->addInstance(
              *std::get<std::shared_ptr<const Instance>>(instanceAsServed(instance, asked).content));
        },
        rc);
  }
  return call.giveNull(rc, CMPI_RC_ERR_NOT_FOUND);
}

CMPIBrokerFT BrokerUpCalls::table = [] {
  CMPIBrokerFT slots{};
  slots.brokerCapabilities = CMPI_MB_BasicRead | CMPI_MB_AssociationTraversal;
  slots.brokerVersion = CMPICurrentVersion;
  slots.brokerName = "RecordingBroker";
  slots.enumerateInstanceNames = enumerateInstanceNames;
  slots.enumerateInstances = enumerateInstances;
  slots.getInstance = getInstance;
  refuse(slots.prepareAttachThread);
  refuse(slots.attachThread);
  refuse(slots.detachThread);
  refuse(slots.deliverIndication);
  refuse(slots.createInstance);
  refuse(slots.modifyInstance);
  refuse(slots.deleteInstance);
  refuse(slots.execQuery);
  refuse(slots.associators);
  refuse(slots.associatorNames);
  refuse(slots.references);
  refuse(slots.referenceNames);
  refuse(slots.invokeMethod);
  refuse(slots.setProperty);
  refuse(slots.getProperty);
  return slots;
}();

std::size_t forEachFailure(RecordingBroker& broker, const std::function<void(std::size_t n, Mode mode)>& operation,
                           std::initializer_list<Mode> modes) {
  std::size_t tried = 0;
  for (const Mode mode : modes) {
    for (std::size_t n = 1;; ++n) {
      const std::size_t before = broker.mark();
      broker.startOver();
      broker.failAt(n, mode);
      operation(n, mode);
      const bool reached = broker.hasFailed();
      broker.freeSince(before);
      if (!reached) break;
      ++tried;
    }
  }
  broker.startOver();
  return tried;
}

std::string describe(const CMPIObjectPath* path) {
  return path == nullptr ? "null" : describe(RecordingBroker::read(path));
}
std::string describe(const CMPIInstance* instance) {
  return instance == nullptr ? "null" : describe(RecordingBroker::read(instance));
}

}  // namespace ZV::Test
