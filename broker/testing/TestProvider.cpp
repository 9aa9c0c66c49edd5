// A provider library for the tests of the broker: it serves the classes of TestClasses.h, correctly or with the errors
// that a test asks for, and writes its arguments to the broker's log.

#include <cmpidt.h>
#include <cmpift.h>
#include <cmpimacs.h>

#include <atomic>
#include <mutex>
#include <stdexcept>
#include <string>
#include <vector>

namespace {

// Several providers share it, and one may be made while another runs.
std::atomic<const CMPIBroker*> retained = nullptr;
const CMPIBroker* broker() { return retained.load(); }

constexpr CMPIStatus kOk{CMPI_RC_OK, nullptr};

std::string text(const CMPIString* string) {
  const char* chars = string != nullptr ? string->ft->getCharPtr(string, nullptr) : nullptr;
  return chars != nullptr ? chars : "";
}

std::string nameOf(const CMPIObjectPath* path) {
  const CMPIData key = path->ft->getKey(path, "Name", nullptr);
  return (key.state & CMPI_nullValue) == 0 ? text(key.value.string) : std::string();
}

std::string shown(const CMPIObjectPath* path) {
  std::string shows = text(path->ft->getNameSpace(path, nullptr)) + ":" + text(path->ft->getClassName(path, nullptr));
  const CMPICount count = path->ft->getKeyCount(path, nullptr);
  for (CMPICount i = 0; i < count; ++i) {
    CMPIString* name = nullptr;
    path->ft->getKeyAt(path, i, &name, nullptr);
    shows += (i == 0 ? "." : ",") + text(name);
  }
  return shows;
}

std::string shown(const char* given) { return given != nullptr ? given : "-"; }

std::string shown(const char** list) {
  if (list == nullptr) return "all";
  std::string shows = "[";
  for (; *list != nullptr; ++list) shows += (shows.size() > 1 ? " " : "") + std::string(*list);
  return shows + "]";
}

std::string flags(const CMPIContext* context) {
  const CMPIData entry = context->ft->getEntry(context, CMPIInvocationFlags, nullptr);
  return std::to_string(entry.value.uint32);
}

void note(const std::string& line) {
  broker()->eft->logMessage(broker(), CMPI_SEV_INFO, nullptr, line.c_str(), nullptr);
}

/// What belongs to the thing "abroad" is in another namespace.
std::string nameSpaceFor(const CMPIObjectPath* like) {
  return nameOf(like) == "abroad" ? "root/other" : text(like->ft->getNameSpace(like, nullptr));
}

CMPIObjectPath* pathOf(const CMPIObjectPath* like, const char* className, const std::string& name) {
  CMPIObjectPath* path = broker()->eft->newObjectPath(broker(), nameSpaceFor(like).c_str(), className, nullptr);
  path->ft->addKey(path, "name", reinterpret_cast<const CMPIValue*>(name.c_str()), CMPI_chars);
  return path;
}

void setLabels(CMPIInstance* instance, const std::vector<std::string>& labels) {
  const auto count = static_cast<CMPICount>(labels.size());
  CMPIValue value;
  value.array = broker()->eft->newArray(broker(), count, CMPI_chars, nullptr);
  for (CMPICount i = 0; i < count; ++i) {
    value.array->ft->setElementAt(value.array, i, reinterpret_cast<const CMPIValue*>(labels[i].c_str()), CMPI_chars);
  }
  instance->ft->setProperty(instance, "Labels", &value, CMPI_charsA);
}

CMPIInstance* instanceOf(const CMPIObjectPath* like, const char* className, const std::string& name,
                         const char** properties) {
  CMPIObjectPath* path = broker()->eft->newObjectPath(broker(), nameSpaceFor(like).c_str(), className, nullptr);
  CMPIInstance* instance = broker()->eft->newInstance(broker(), path, nullptr);
  const char* keys[] = {"Name", nullptr};
  instance->ft->setPropertyFilter(instance, properties, keys);
  instance->ft->setProperty(instance, "NAME", reinterpret_cast<const CMPIValue*>(name.c_str()), CMPI_chars);
  instance->ft->setProperty(instance, "Note", reinterpret_cast<const CMPIValue*>("noted"), CMPI_chars);
  instance->ft->setProperty(instance, "Extra", reinterpret_cast<const CMPIValue*>("more"), CMPI_chars);
  const CMPIUint16 size = 7;
  instance->ft->setProperty(instance, "Size", reinterpret_cast<const CMPIValue*>(&size), CMPI_uint16);
  setLabels(instance, {"x", "y"});
  return instance;
}

// The modifiable properties of the thing "a", until the broker ends.
struct ThingA {
  bool hasSize = true;
  CMPIUint16 size = 7;
  std::vector<std::string> labels = {"x", "y"};
};
std::mutex thingMutex;
// Never destroyed: if the broker ends with the process, it cleans up its providers after the library's static objects
// are destroyed.
ThingA& thingA = *new ThingA;

CMPIStatus cleanup(CMPIInstanceMI*, const CMPIContext*, CMPIBoolean) {
  const std::lock_guard lock(thingMutex);
  thingA = ThingA();
  return kOk;
}

/// The thing "stubborn" accepts every modification and changes nothing.
CMPIInstance* thingOf(const CMPIObjectPath* path, const std::string& name, const char** properties) {
  CMPIInstance* instance = instanceOf(path, "T_Thing", name, properties);
  if (name != "a") return instance;
  const std::lock_guard lock(thingMutex);
  instance->ft->setProperty(instance, "Size",
                            thingA.hasSize ? reinterpret_cast<const CMPIValue*>(&thingA.size) : nullptr, CMPI_uint16);
  setLabels(instance, thingA.labels);
  return instance;
}
CMPIStatus associationCleanup(CMPIAssociationMI*, const CMPIContext*, CMPIBoolean) { return kOk; }
CMPIStatus methodCleanup(CMPIMethodMI*, const CMPIContext*, CMPIBoolean) {
  return {CMPI_RC_ERR_NOT_SUPPORTED, nullptr};
}

// ---- Things: a correct provider ----

CMPIStatus thingNames(CMPIInstanceMI*, const CMPIContext* context, const CMPIResult* result,
                      const CMPIObjectPath* path) {
  note("EnumerateInstanceNames " + shown(path) + " flags " + flags(context));
  const bool special = text(path->ft->getClassName(path, nullptr)) == "T_SpecialThing";
  if (!special) {
    result->ft->returnObjectPath(result, pathOf(path, "T_Thing", "a"));
    result->ft->returnObjectPath(result, pathOf(path, "t_thing", "b"));
  }
  // Also for the superclass, as some providers do.
  result->ft->returnObjectPath(result, pathOf(path, "T_SpecialThing", "s"));
  return kOk;  // without returnDone
}

CMPIStatus things(CMPIInstanceMI*, const CMPIContext* context, const CMPIResult* result, const CMPIObjectPath* path,
                  const char** properties) {
  note("EnumerateInstances " + shown(path) + " " + shown(properties) + " flags " + flags(context));
  const bool special = text(path->ft->getClassName(path, nullptr)) == "T_SpecialThing";
  if (!special) {
    result->ft->returnInstance(result, instanceOf(path, "T_Thing", "a", properties));
    result->ft->returnInstance(result, instanceOf(path, "T_Thing", "b", properties));
  }
  result->ft->returnInstance(result, instanceOf(path, "T_SpecialThing", "s", properties));
  result->ft->returnDone(result);
  return kOk;
}

CMPIStatus thing(CMPIInstanceMI*, const CMPIContext* context, const CMPIResult* result, const CMPIObjectPath* path,
                 const char** properties) {
  const CMPIData principal = context->ft->getEntry(context, CMPIPrincipal, nullptr);
  note("GetInstance " + shown(path) + " " + shown(properties) + " by " +
       ((principal.state & CMPI_nullValue) == 0 ? text(principal.value.string) : "nobody"));
  const std::string name = nameOf(path);
  if (name != "a" && name != "b" && name != "stubborn") return kOk;
  // This provider ignores the property list, so the broker must apply it.
  result->ft->returnInstance(result, thingOf(path, name, nullptr));
  return kOk;
}

CMPIStatus create(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath* path,
                  const CMPIInstance* instance) {
  note("CreateInstance " + shown(path) + " properties " +
       std::to_string(instance->ft->getPropertyCount(instance, nullptr)));
  if (nameOf(path) == "quiet") return kOk;
  result->ft->returnObjectPath(result, pathOf(path, "T_Thing", nameOf(path) + "-made"));
  return kOk;
}

std::vector<std::string> labelsOf(const CMPIInstance* instance) {
  std::vector<std::string> found;
  const CMPIData labels = instance->ft->getProperty(instance, "Labels", nullptr);
  if ((labels.state & CMPI_nullValue) != 0) return found;
  const CMPICount count = labels.value.array->ft->getSize(labels.value.array, nullptr);
  for (CMPICount i = 0; i < count; ++i) {
    found.push_back(text(labels.value.array->ft->getElementAt(labels.value.array, i, nullptr).value.string));
  }
  return found;
}

CMPIStatus modify(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath* path,
                  const CMPIInstance* instance, const char** properties) {
  const CMPIData size = instance->ft->getProperty(instance, "size", nullptr);
  const bool hasSize = (size.state & CMPI_nullValue) == 0;
  const std::vector<std::string> labels = labelsOf(instance);
  std::string line = "ModifyInstance " + shown(path) + " " + shown(properties) + " Size " +
                     (hasSize ? std::to_string(size.value.uint16) : "null") + (labels.empty() ? "" : " Labels");
  for (const std::string& label : labels) line += " " + label;
  note(line);
  if (nameOf(path) != "a") return kOk;
  const std::lock_guard lock(thingMutex);
  thingA.hasSize = hasSize;
  if (hasSize) thingA.size = size.value.uint16;
  if (!labels.empty()) thingA.labels = labels;
  return kOk;
}

CMPIStatus remove(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath* path) {
  note("DeleteInstance " + shown(path));
  if (nameOf(path) == "a") return kOk;
  return {CMPI_RC_ERR_NOT_FOUND, broker()->eft->newString(broker(), "no such thing", nullptr)};
}

CMPIInstanceMIFT thingTable = {CMPICurrentVersion,
                               CMPICurrentVersion,
                               "instanceThing",
                               cleanup,
                               thingNames,
                               things,
                               thing,
                               create,
                               modify,
                               remove,
                               nullptr};

CMPIStatus invoke(CMPIMethodMI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath* path,
                  const char* method, const CMPIArgs* in, CMPIArgs* out) {
  CMPIString* first = nullptr;
  const CMPICount count = in->ft->getArgCount(in, nullptr);
  if (count != 0) in->ft->getArgAt(in, 0, &first, nullptr);
  note("InvokeMethod " + shown(path) + " " + method + " " + std::to_string(count) + " " + text(first));
  const CMPIData said = in->ft->getArg(in, "text", nullptr);
  if ((said.state & CMPI_nullValue) == 0) out->ft->addArg(out, "Said", &said.value, CMPI_string);
  const CMPIData times = in->ft->getArg(in, "Times", nullptr);
  if ((times.state & CMPI_nullValue) != 0) return kOk;
  CMPIValue value;
  value.uint32 = times.value.uint16;
  result->ft->returnData(result, &value, CMPI_uint32);
  return kOk;
}

CMPIMethodMIFT methodTable = {CMPICurrentVersion, CMPICurrentVersion, "methodThing", methodCleanup, invoke};

// ---- Trouble: provider errors, selected by the requested name ----

CMPIStatus troubleNames(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath* path) {
  result->ft->returnObjectPath(result, pathOf(path, "T_Trouble", "one"));
  result->ft->returnObjectPath(result, nullptr);
  result->ft->returnObjectPath(result, pathOf(path, "T_NoSuchClass", "two"));
  result->ft->returnInstance(result, instanceOf(path, "T_Trouble", "three", nullptr));
  return kOk;
}

CMPIStatus troubles(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath* path,
                    const char** properties) {
  result->ft->returnInstance(result, instanceOf(path, "T_Trouble", "one", properties));
  result->ft->returnInstance(result, nullptr);
  CMPIObjectPath* wrong = pathOf(path, "T_Trouble", "wrong kind");
  result->ft->returnInstance(result, reinterpret_cast<CMPIInstance*>(wrong));
  result->ft->returnInstance(result, instanceOf(path, "T_Trouble", "two", properties));
  throw std::runtime_error("half way");
}

CMPIStatus trouble(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath* path,
                   const char** properties) {
  const std::string name = nameOf(path);
  if (name == "throw") throw std::out_of_range("thrown on purpose");
  if (name == "throw a number") throw 42;
  if (name == "fail") return {CMPI_RC_ERR_ACCESS_DENIED, nullptr};
  if (name == "fail with text") return {CMPI_RC_ERR_FAILED, broker()->eft->newString(broker(), "the reason", nullptr)};
  if (name == "error") {
    CMPIError* error = broker()->eft->newCMPIError(broker(), "test", "T1", "told by an error", ErrorSevHigh,
                                                   ErrorProbCauseUnknown, CMPI_RC_ERR_ALREADY_EXISTS, nullptr);
    result->ft->returnError(result, error);
    return kOk;
  }
  if (name == "two") {
    result->ft->returnInstance(result, instanceOf(path, "T_Trouble", "first", properties));
    result->ft->returnInstance(result, instanceOf(path, "T_Trouble", "second", properties));
    return kOk;
  }
  if (name == "other") result->ft->returnInstance(result, instanceOf(path, "T_Other", "other", properties));
  return kOk;
}

CMPIStatus refuse(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*) {
  return {CMPI_RC_ERR_NOT_SUPPORTED, nullptr};
}

CMPIInstanceMIFT troubleTable = {CMPICurrentVersion,
                                 CMPICurrentVersion,
                                 "instanceTrouble",
                                 cleanup,
                                 troubleNames,
                                 troubles,
                                 trouble,
                                 nullptr,
                                 nullptr,
                                 refuse,
                                 nullptr};

// ---- Calling: up-calls ----

CMPIStatus callingNames(CMPIInstanceMI*, const CMPIContext* context, const CMPIResult* result,
                        const CMPIObjectPath* path) {
  CMPIObjectPath* things = broker()->eft->newObjectPath(broker(), "ROOT/cimv2", "t_thing", nullptr);
  CMPIStatus status = kOk;
  CMPIEnumeration* names = broker()->bft->enumerateInstanceNames(broker(), context, things, &status);
  while (status.rc == CMPI_RC_OK && names->ft->hasNext(names, &status) != 0) {
    const CMPIData next = names->ft->getNext(names, &status);
    result->ft->returnObjectPath(result, pathOf(path, "T_Calling", "of " + nameOf(next.value.ref)));
  }
  return status;
}

CMPIStatus callings(CMPIInstanceMI*, const CMPIContext* context, const CMPIResult* result, const CMPIObjectPath* path,
                    const char** properties) {
  CMPIObjectPath* things = broker()->eft->newObjectPath(broker(), "root/cimv2", "T_Thing", nullptr);
  const char* wanted[] = {"size", nullptr};
  CMPIStatus status = kOk;
  CMPIEnumeration* found = broker()->bft->enumerateInstances(broker(), context, things, wanted, &status);
  while (status.rc == CMPI_RC_OK && found->ft->hasNext(found, &status) != 0) {
    const CMPIData next = found->ft->getNext(found, &status);
    const CMPIInstance* instance = next.value.inst;
    const std::string name = nameOf(instance->ft->getObjectPath(instance, nullptr));
    const CMPIData size = instance->ft->getProperty(instance, "Size", nullptr);
    const CMPICount count = instance->ft->getPropertyCount(instance, nullptr);
    result->ft->returnInstance(
        result,
        instanceOf(path, "T_Calling", name + " " + std::to_string(size.value.uint16) + " of " + std::to_string(count),
                   properties));
  }
  return status;
}

CMPIStatus calling(CMPIInstanceMI*, const CMPIContext* context, const CMPIResult* result, const CMPIObjectPath* path,
                   const char**) {
  const std::string name = nameOf(path);
  CMPIStatus status = kOk;
  if (name == "circle") {
    broker()->bft->getInstance(broker(), context, path, nullptr, &status);
    return status;
  }
  const char* className = name == "absent" ? "T_Absent" : name == "unserved" ? "T_Unserved" : "T_Thing";
  CMPIObjectPath* asked = broker()->eft->newObjectPath(broker(), "root/cimv2", className, nullptr);
  broker()->bft->enumerateInstanceNames(broker(), context, asked, &status);
  if (status.rc == CMPI_RC_OK) result->ft->returnInstance(result, instanceOf(path, "T_Calling", name, nullptr));
  return status;
}

CMPIInstanceMIFT callingTable = {CMPICurrentVersion,
                                 CMPICurrentVersion,
                                 "instanceCalling",
                                 cleanup,
                                 callingNames,
                                 callings,
                                 calling,
                                 nullptr,
                                 nullptr,
                                 refuse,
                                 nullptr};

// ---- Others, and the associations between them and things ----

CMPIStatus otherNames(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath* path) {
  result->ft->returnObjectPath(result, pathOf(path, "T_Other", "o"));
  return kOk;
}

CMPIStatus others(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath* path,
                  const char** properties) {
  result->ft->returnInstance(result, instanceOf(path, "T_Other", "o", properties));
  return kOk;
}

CMPIInstanceMIFT otherTable = {CMPICurrentVersion,
                               CMPICurrentVersion,
                               "instanceOther",
                               cleanup,
                               otherNames,
                               others,
                               nullptr,
                               nullptr,
                               nullptr,
                               refuse,
                               nullptr};

bool fromThing(const CMPIObjectPath* path) { return text(path->ft->getClassName(path, nullptr)) != "T_Other"; }

CMPIStatus associators(CMPIAssociationMI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath* path,
                       const char* association, const char* resultClass, const char* role, const char* resultRole,
                       const char** properties) {
  note("Associators " + shown(path) + " " + shown(association) + " " + shown(resultClass) + " " + shown(role) + " " +
       shown(resultRole) + " " + shown(properties));
  if (fromThing(path)) {
    result->ft->returnInstance(result, instanceOf(path, "T_Other", "o", properties));
  } else {
    result->ft->returnInstance(result, instanceOf(path, "T_Thing", "a", properties));
    result->ft->returnInstance(result, instanceOf(path, "T_SpecialThing", "s", properties));
  }
  return kOk;
}

CMPIStatus associatorNames(CMPIAssociationMI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath* path,
                           const char* association, const char* resultClass, const char* role, const char* resultRole) {
  note("AssociatorNames " + shown(path) + " " + shown(association) + " " + shown(resultClass) + " " + shown(role) +
       " " + shown(resultRole));
  if (fromThing(path)) {
    result->ft->returnObjectPath(result, pathOf(path, "T_Other", "o"));
  } else {
    result->ft->returnObjectPath(result, pathOf(path, "T_Thing", "a"));
    result->ft->returnObjectPath(result, pathOf(path, "T_SpecialThing", "s"));
  }
  return kOk;
}

CMPIInstance* linkOf(const CMPIObjectPath* path) {
  CMPIObjectPath* name = broker()->eft->newObjectPath(broker(), "", "T_ThingOther", nullptr);
  CMPIInstance* link = broker()->eft->newInstance(broker(), name, nullptr);
  CMPIObjectPath* left = pathOf(path, "T_Thing", "a");
  CMPIObjectPath* right = pathOf(path, "T_Other", "o");
  link->ft->setProperty(link, "Left", reinterpret_cast<const CMPIValue*>(&left), CMPI_ref);
  link->ft->setProperty(link, "Right", reinterpret_cast<const CMPIValue*>(&right), CMPI_ref);
  const CMPIUint16 rank = 3;
  link->ft->setProperty(link, "Rank", reinterpret_cast<const CMPIValue*>(&rank), CMPI_uint16);
  return link;
}

CMPIStatus references(CMPIAssociationMI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath* path,
                      const char* resultClass, const char* role, const char** properties) {
  note("References " + shown(path) + " " + shown(resultClass) + " " + shown(role) + " " + shown(properties));
  result->ft->returnInstance(result, linkOf(path));
  return kOk;
}

CMPIStatus referenceNames(CMPIAssociationMI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath* path,
                          const char* resultClass, const char* role) {
  note("ReferenceNames " + shown(path) + " " + shown(resultClass) + " " + shown(role));
  CMPIInstance* link = linkOf(path);
  CMPIObjectPath* name = link->ft->getObjectPath(link, nullptr);
  // Some providers name their associations by the class of a sibling association.
  if (nameOf(path) == "sister") name->ft->setClassName(name, "T_ThingTrouble");
  result->ft->returnObjectPath(result, name);
  return kOk;
}

CMPIAssociationMIFT linkTable = {CMPICurrentVersion, CMPICurrentVersion, "associationLink", associationCleanup,
                                 associators,        associatorNames,    references,        referenceNames};

CMPIStatus refusedAssociators(CMPIAssociationMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath* path,
                              const char*, const char*, const char*, const char*, const char**) {
  if (nameOf(path) == "fail") return {CMPI_RC_ERR_FAILED, nullptr};
  return {CMPI_RC_ERR_NOT_SUPPORTED, nullptr};
}

CMPIAssociationMIFT refusingTable = {CMPICurrentVersion,
                                     CMPICurrentVersion,
                                     "associationRefusing",
                                     associationCleanup,
                                     refusedAssociators,
                                     nullptr,
                                     nullptr,
                                     nullptr};

}  // namespace

#define TEST_INSTANCE_MI(prefix, functions)                                                                         \
  CMPI_EXTERN_C CMPIInstanceMI* prefix##_Create_InstanceMI(const CMPIBroker* mb, const CMPIContext*, CMPIStatus*) { \
    static CMPIInstanceMI mi = {nullptr, &functions};                                                               \
    retained = mb;                                                                                                  \
    return &mi;                                                                                                     \
  }

#define TEST_ASSOCIATION_MI(prefix, functions)                                                             \
  CMPI_EXTERN_C CMPIAssociationMI* prefix##_Create_AssociationMI(const CMPIBroker* mb, const CMPIContext*, \
                                                                 CMPIStatus*) {                            \
    static CMPIAssociationMI mi = {nullptr, &functions};                                                   \
    retained = mb;                                                                                         \
    return &mi;                                                                                            \
  }

TEST_INSTANCE_MI(Thing, thingTable)
TEST_INSTANCE_MI(Trouble, troubleTable)
TEST_INSTANCE_MI(Calling, callingTable)
TEST_INSTANCE_MI(Other, otherTable)
TEST_INSTANCE_MI(Link, otherTable)
TEST_ASSOCIATION_MI(Link, linkTable)
TEST_ASSOCIATION_MI(Refusing, refusingTable)

CMPI_EXTERN_C CMPIMethodMI* Thing_Create_MethodMI(const CMPIBroker* mb, const CMPIContext* context, CMPIStatus*) {
  static CMPIMethodMI mi = {nullptr, &methodTable};
  retained = mb;
  const CMPIData nameSpace = context->ft->getEntry(context, CMPIInitNameSpace, nullptr);
  note("made in " + text(nameSpace.value.string));
  return &mi;
}

CMPI_EXTERN_C CMPIInstanceMI* Null_Create_InstanceMI(const CMPIBroker* mb, const CMPIContext*, CMPIStatus* status) {
  retained = mb;
  *status = {CMPI_RC_ERR_FAILED, broker()->eft->newString(broker(), "not today", nullptr)};
  return nullptr;
}

CMPI_EXTERN_C CMPIInstanceMI* Throwing_Create_InstanceMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*) {
  throw std::runtime_error("no provider here");
}
