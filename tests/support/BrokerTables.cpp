// The function tables of the recording broker's objects: each function records its call, checks whether it must fail,
// and does its work.

#include <cstring>

#include "tests/support/BrokerObjects.h"

namespace ZV::Test {

namespace {

std::string plain(const char* text) { return text == nullptr ? std::string() : text; }

std::string numberText(CMPICount number) { return std::to_string(number); }

// The object whose face is the first argument of a function of its table.
template <typename Object, typename Face>
Object* objectOfFace(const Face* face) {
  return static_cast<Object*>(const_cast<Face*>(face));
}
PathObject* self(const CMPIObjectPath* face) { return objectOfFace<PathObject>(face); }
InstanceObject* self(const CMPIInstance* face) { return objectOfFace<InstanceObject>(face); }
StringObject* self(const CMPIString* face) { return objectOfFace<StringObject>(face); }
ArrayObject* self(const CMPIArray* face) { return objectOfFace<ArrayObject>(face); }
EnumerationObject* self(const CMPIEnumeration* face) { return objectOfFace<EnumerationObject>(face); }
ResultObject* self(const CMPIResult* face) { return objectOfFace<ResultObject>(face); }
ContextObject* self(const CMPIContext* face) { return objectOfFace<ContextObject>(face); }
ArgsObject* self(const CMPIArgs* face) { return objectOfFace<ArgsObject>(face); }
DateTimeObject* self(const CMPIDateTime* face) { return objectOfFace<DateTimeObject>(face); }

std::string nameAndValue(const char* name, const CMPIValue* value, CMPIType type) {
  return inQuotesOrNull(name) + ", " + ObjectTables::argument(value, type);
}

// Objects live as long as the broker, even after release.
template <typename Face>
CMPIStatus release(Face* face) {
  return Call(self(face), "release", "").status();
}

// The n-th of named values, and its name in its own string.
CMPIData giveNamed(const Call& call, const std::vector<NamedValue>& values, CMPICount index, const Missing& missing,
                   CMPIString** name, CMPIStatus* rc, CMPIString* (*makeName)(RecordingBroker*, const std::string&),
                   CMPIValueState added = CMPI_goodValue) {
  if (name != nullptr) *name = nullptr;
  if (index >= values.size()) return call.giveMissing(missing, rc);
  if (name != nullptr && call.hasHandle) *name = makeName(call.broker, values[index].first);
  return call.giveData(values[index].second, rc, added);
}

CMPIString* makeName(RecordingBroker* broker, const std::string& name) { return broker->makeString(name); }

CMPIData giveByName(const Call& call, const std::vector<NamedValue>& values, const char* name, const Missing& missing,
                    CMPIStatus* rc, CMPIValueState added = CMPI_goodValue) {
  const Value* value = findValue(values, plain(name));
  return value == nullptr ? call.giveMissing(missing, rc) : call.giveData(*value, rc, added);
}

// --- object paths

CMPIObjectPath* pathClone(const CMPIObjectPath* face, CMPIStatus* rc) {
  const PathObject* path = self(face);
  const Call call(path, "clone", "");
  return call.give([&] { return path->broker->make(path->path, {}); }, rc);
}

CMPIStatus setNameSpace(CMPIObjectPath* face, const char* nameSpace) {
  PathObject* path = self(face);
  const Call call(path, "setNameSpace", inQuotesOrNull(nameSpace));
  if (!call.refused()) path->path.nameSpace = plain(nameSpace);
  return call.status();
}

CMPIString* getNameSpace(const CMPIObjectPath* face, CMPIStatus* rc) {
  const PathObject* path = self(face);
  const Call call(path, "getNameSpace", "");
  return call.give([&] { return path->broker->makeString(path->path.nameSpace); }, rc);
}

CMPIStatus setHostname(CMPIObjectPath* face, const char* host) {
  PathObject* path = self(face);
  const Call call(path, "setHostname", inQuotesOrNull(host));
  if (!call.refused()) path->path.host = plain(host);
  return call.status();
}

CMPIString* getHostname(const CMPIObjectPath* face, CMPIStatus* rc) {
  const PathObject* path = self(face);
  const Call call(path, "getHostname", "");
  return call.give([&] { return path->broker->makeString(path->path.host); }, rc);
}

CMPIStatus setClassName(CMPIObjectPath* face, const char* name) {
  PathObject* path = self(face);
  const Call call(path, "setClassName", inQuotesOrNull(name));
  if (!call.refused()) path->path.className = plain(name);
  return call.status();
}

CMPIString* getClassName(const CMPIObjectPath* face, CMPIStatus* rc) {
  const PathObject* path = self(face);
  const Call call(path, "getClassName", "");
  return call.give([&] { return path->broker->makeString(path->path.className); }, rc);
}

CMPIStatus addKey(CMPIObjectPath* face, const char* name, const CMPIValue* value, const CMPIType type) {
  PathObject* path = self(face);
  const Call call(path, "addKey", nameAndValue(name, value, type));
  if (!call.refused()) putValue(path->path.keys, plain(name), ObjectTables::valueOf(value, type));
  return call.status();
}

CMPIData getKey(const CMPIObjectPath* face, const char* name, CMPIStatus* rc) {
  const PathObject* path = self(face);
  const Call call(path, "getKey", inQuotesOrNull(name));
  return giveByName(call, path->path.keys, name, path->broker->missingKey, rc, path->broker->stateOfKeys);
}

CMPIData getKeyAt(const CMPIObjectPath* face, CMPICount index, CMPIString** name, CMPIStatus* rc) {
  const PathObject* path = self(face);
  const Call call(path, "getKeyAt", numberText(index));
  return giveNamed(call, path->path.keys, index, path->broker->missingKey, name, rc, makeName,
                   path->broker->stateOfKeys);
}

CMPICount getKeyCount(const CMPIObjectPath* face, CMPIStatus* rc) {
  const PathObject* path = self(face);
  return Call(path, "getKeyCount", "").giveNumber(static_cast<CMPICount>(path->path.keys.size()), rc);
}

CMPIStatus setNameSpaceFromObjectPath(CMPIObjectPath* face, const CMPIObjectPath* from) {
  PathObject* path = self(face);
  const Call call(path, "setNameSpaceFromObjectPath", ObjectTables::nameOf(from));
  if (!call.refused()) path->path.nameSpace = ObjectTables::pathOf(from).nameSpace;
  return call.status();
}

CMPIStatus setHostAndNameSpaceFromObjectPath(CMPIObjectPath* face, const CMPIObjectPath* from) {
  PathObject* path = self(face);
  const Call call(path, "setHostAndNameSpaceFromObjectPath", ObjectTables::nameOf(from));
  if (!call.refused()) {
    path->path.nameSpace = ObjectTables::pathOf(from).nameSpace;
    path->path.host = ObjectTables::pathOf(from).host;
  }
  return call.status();
}

// There is no schema, so there are no qualifiers.
CMPIData giveNoQualifier(const Call& call, CMPIStatus* rc) {
  return call.giveMissing({CMPI_RC_ERR_NOT_FOUND, CMPI_notFound}, rc);
}

CMPIData getClassQualifier(const CMPIObjectPath* face, const char* qualifier, CMPIStatus* rc) {
  return giveNoQualifier(Call(self(face), "getClassQualifier", inQuotesOrNull(qualifier)), rc);
}

CMPIData getPropertyQualifier(const CMPIObjectPath* face, const char* property, const char* qualifier, CMPIStatus* rc) {
  const std::string names = inQuotesOrNull(property) + ", " + inQuotesOrNull(qualifier);
  return giveNoQualifier(Call(self(face), "getPropertyQualifier", names), rc);
}

CMPIData getMethodQualifier(const CMPIObjectPath* face, const char* method, const char* qualifier, CMPIStatus* rc) {
  const std::string names = inQuotesOrNull(method) + ", " + inQuotesOrNull(qualifier);
  return giveNoQualifier(Call(self(face), "getMethodQualifier", names), rc);
}

CMPIData getParameterQualifier(const CMPIObjectPath* face, const char* method, const char* parameter,
                               const char* qualifier, CMPIStatus* rc) {
  const std::string names =
      inQuotesOrNull(method) + ", " + inQuotesOrNull(parameter) + ", " + inQuotesOrNull(qualifier);
  return giveNoQualifier(Call(self(face), "getParameterQualifier", names), rc);
}

CMPIString* pathToString(const CMPIObjectPath* face, CMPIStatus* rc) {
  const PathObject* path = self(face);
  const Call call(path, "toString", "");
  return call.give([&] { return path->broker->makeString(describeWhole(path->path)); }, rc);
}

// --- instances

CMPIInstance* instanceClone(const CMPIInstance* face, CMPIStatus* rc) {
  const InstanceObject* instance = self(face);
  const Call call(instance, "clone", "");
  return call.give([&] { return instance->broker->make(instance->instance, {}); }, rc);
}

CMPIData getProperty(const CMPIInstance* face, const char* name, CMPIStatus* rc) {
  const InstanceObject* instance = self(face);
  const Call call(instance, "getProperty", inQuotesOrNull(name));
  return giveByName(call, instance->instance.properties, name, instance->broker->missingProperty, rc);
}

CMPIData getPropertyAt(const CMPIInstance* face, CMPICount index, CMPIString** name, CMPIStatus* rc) {
  const InstanceObject* instance = self(face);
  const Call call(instance, "getPropertyAt", numberText(index));
  return giveNamed(call, instance->instance.properties, index, instance->broker->missingProperty, name, rc, makeName);
}

CMPICount getPropertyCount(const CMPIInstance* face, CMPIStatus* rc) {
  const InstanceObject* instance = self(face);
  const Call call(instance, "getPropertyCount", "");
  return call.giveNumber(static_cast<CMPICount>(instance->instance.properties.size()), rc);
}

bool contains(const std::vector<std::string>& names, const std::string& name) {
  for (const std::string& held : names) {
    if (sameName(held, name)) return true;
  }
  return false;
}

bool passesFilter(const InstanceObject* instance, const std::string& name) {
  if (!instance->isFiltered || contains(instance->wanted, name)) return true;
  return instance->filterKeys.has_value() && contains(*instance->filterKeys, name);
}

CMPIStatus setInstanceProperty(InstanceObject* instance, const Call& call, const char* name, const CMPIValue* value,
                               CMPIType type) {
  if (!call.refused() && passesFilter(instance, plain(name))) {
    putValue(instance->instance.properties, plain(name), ObjectTables::valueOf(value, type));
  }
  return call.status();
}

CMPIStatus setProperty(const CMPIInstance* face, const char* name, const CMPIValue* value, CMPIType type) {
  InstanceObject* instance = self(face);
  const Call call(instance, "setProperty", nameAndValue(name, value, type));
  return setInstanceProperty(instance, call, name, value, type);
}

CMPIStatus setPropertyWithOrigin(const CMPIInstance* face, const char* name, const CMPIValue* value,
                                 const CMPIType type, const char* origin) {
  InstanceObject* instance = self(face);
  const Call call(instance, "setPropertyWithOrigin", nameAndValue(name, value, type) + ", " + inQuotesOrNull(origin));
  return setInstanceProperty(instance, call, name, value, type);
}

CMPIObjectPath* getObjectPath(const CMPIInstance* face, CMPIStatus* rc) {
  const InstanceObject* instance = self(face);
  const Call call(instance, "getObjectPath", "");
  return call.give([&] { return instance->broker->make(ObjectTables::pathOfInstance(*instance), {}); }, rc);
}

std::vector<std::string> namesOf(const char** names) {
  std::vector<std::string> all;
  for (std::size_t i = 0; names != nullptr && names[i] != nullptr; ++i) all.emplace_back(names[i]);
  return all;
}

CMPIStatus setPropertyFilter(CMPIInstance* face, const char** properties, const char** keys) {
  InstanceObject* instance = self(face);
  const Call call(instance, "setPropertyFilter", listInQuotes(properties) + ", " + listInQuotes(keys));
  if (!call.refused()) {
    instance->isFiltered = properties != nullptr;
    instance->wanted = namesOf(properties);
    if (keys != nullptr) instance->filterKeys = namesOf(keys);
  }
  return call.status();
}

CMPIStatus setObjectPath(CMPIInstance* face, const CMPIObjectPath* path) {
  InstanceObject* instance = self(face);
  const Call call(instance, "setObjectPath", ObjectTables::nameOf(path));
  if (!call.refused()) instance->instance.path = ObjectTables::pathOf(path);
  return call.status();
}

// --- strings, arrays, enumerations

CMPIString* stringClone(const CMPIString* face, CMPIStatus* rc) {
  const StringObject* string = self(face);
  const Call call(string, "clone", "");
  return call.give([&] { return string->broker->makeString(string->text); }, rc);
}

const char* getCharPtr(const CMPIString* face, CMPIStatus* rc) {
  const StringObject* string = self(face);
  return Call(string, "getCharPtr", "").giveText(string->text.c_str(), rc);
}

CMPIArray* arrayClone(const CMPIArray* face, CMPIStatus* rc) {
  const ArrayObject* array = self(face);
  const Call call(array, "clone", "");
  const auto type = static_cast<CMPIType>(array->elementType | CMPI_ARRAY);
  return call.give([&] { return array->broker->makeArray(list(type, array->elements), {}); }, rc);
}

CMPICount getSize(const CMPIArray* face, CMPIStatus* rc) {
  const ArrayObject* array = self(face);
  return Call(array, "getSize", "").giveNumber(static_cast<CMPICount>(array->elements.size()), rc);
}

CMPIType getSimpleType(const CMPIArray* face, CMPIStatus* rc) {
  const ArrayObject* array = self(face);
  return Call(array, "getSimpleType", "").giveNumber(array->elementType, rc);
}

CMPIData getElementAt(const CMPIArray* face, CMPICount index, CMPIStatus* rc) {
  const ArrayObject* array = self(face);
  const Call call(array, "getElementAt", numberText(index));
  if (index >= array->elements.size()) return call.giveMissing({CMPI_RC_ERR_NO_SUCH_PROPERTY, CMPI_badValue}, rc);
  return call.giveData(array->elements[index], rc, array->broker->stateOfElements);
}

CMPIStatus setElementAt(CMPIArray* face, CMPICount index, const CMPIValue* value, CMPIType type) {
  ArrayObject* array = self(face);
  const Call call(array, "setElementAt", numberText(index) + ", " + ObjectTables::argument(value, type));
  if (call.refused()) return call.status();
  if (index >= array->elements.size()) return call.status(CMPI_RC_ERR_NO_SUCH_PROPERTY);
  array->elements[index] = ObjectTables::valueOf(value, type);
  return call.status();
}

CMPIEnumeration* enumerationClone(const CMPIEnumeration* face, CMPIStatus* rc) {
  return Call(self(face), "clone", "").giveNull(rc, CMPI_RC_ERR_NOT_SUPPORTED);
}

CMPIData getNext(const CMPIEnumeration* face, CMPIStatus* rc) {
  EnumerationObject* enumeration = self(face);
  const Call call(enumeration, "getNext", "");
  if (enumeration->next >= enumeration->elements.size()) {
    return call.giveMissing({CMPI_RC_ERR_NOT_FOUND, CMPI_nullValue}, rc);
  }
  return call.giveData(enumeration->elements[enumeration->next++], rc, enumeration->broker->stateOfNexts);
}

CMPIBoolean hasNext(const CMPIEnumeration* face, CMPIStatus* rc) {
  const EnumerationObject* enumeration = self(face);
  const bool hasMore = enumeration->next < enumeration->elements.size();
  return Call(enumeration, "hasNext", "").giveNumber(static_cast<CMPIBoolean>(hasMore), rc);
}

CMPIArray* toArray(const CMPIEnumeration* face, CMPIStatus* rc) {
  const EnumerationObject* enumeration = self(face);
  const Call call(enumeration, "toArray", "");
  const CMPIType type = enumeration->elements.empty() ? CMPI_ref : enumeration->elements.front().type;
  const Value all = list(static_cast<CMPIType>(type | CMPI_ARRAY), enumeration->elements);
  return call.give([&] { return enumeration->broker->makeArray(all, {}); }, rc);
}

// --- the result; there is one for each request, so its calls are shown without an object

CMPIResult* resultClone(const CMPIResult* face, CMPIStatus* rc) {
  return Call(self(face), "clone", "").giveNull(rc, CMPI_RC_ERR_NOT_SUPPORTED);
}

CMPIStatus returnData(const CMPIResult* face, const CMPIValue* value, const CMPIType type) {
  ResultObject* result = self(face);
  const Call call(result->broker, "returnData", "returnData", ObjectTables::argument(value, type));
  if (!call.refused()) result->results.data.push_back(ObjectTables::valueOf(value, type));
  return call.status();
}

CMPIStatus returnInstance(const CMPIResult* face, const CMPIInstance* instance) {
  ResultObject* result = self(face);
  const Call call(result->broker, "returnInstance", "returnInstance", ObjectTables::nameOf(instance));
  if (call.refused()) return call.status();
  if (instance == nullptr || instance->hdl == nullptr) return call.status(CMPI_RC_ERR_INVALID_PARAMETER);
  result->results.instances.push_back(ObjectTables::instanceOf(instance));
  return call.status();
}

CMPIStatus returnObjectPath(const CMPIResult* face, const CMPIObjectPath* path) {
  ResultObject* result = self(face);
  const Call call(result->broker, "returnObjectPath", "returnObjectPath", ObjectTables::nameOf(path));
  if (call.refused()) return call.status();
  if (path == nullptr || path->hdl == nullptr) return call.status(CMPI_RC_ERR_INVALID_PARAMETER);
  result->results.paths.push_back(ObjectTables::pathOf(path));
  return call.status();
}

CMPIStatus returnDone(const CMPIResult* face) {
  ResultObject* result = self(face);
  const Call call(result->broker, "returnDone", "returnDone", "");
  if (!call.refused()) ++result->results.doneCount;
  return call.status();
}

CMPIStatus returnError(const CMPIResult* face, const CMPIError*) {
  return Call(self(face)->broker, "returnError", "returnError", "").status(CMPI_RC_ERR_NOT_SUPPORTED);
}

// --- contexts and arguments

CMPIContext* contextClone(const CMPIContext* face, CMPIStatus* rc) {
  const ContextObject* context = self(face);
  const Call call(context, "clone", "");
  return call.give([&] { return context->broker->makeContext({}); }, rc);
}

CMPIData getEntry(const CMPIContext* face, const char* name, CMPIStatus* rc) {
  const ContextObject* context = self(face);
  const Call call(context, "getEntry", inQuotesOrNull(name));
  return giveByName(call, context->entries, name, {CMPI_RC_ERR_NO_SUCH_PROPERTY, CMPI_notFound}, rc);
}

CMPIData getEntryAt(const CMPIContext* face, CMPICount index, CMPIString** name, CMPIStatus* rc) {
  const ContextObject* context = self(face);
  const Call call(context, "getEntryAt", numberText(index));
  const Missing missing{CMPI_RC_ERR_NO_SUCH_PROPERTY, CMPI_notFound};
  return giveNamed(call, context->entries, index, missing, name, rc, makeName);
}

CMPICount getEntryCount(const CMPIContext* face, CMPIStatus* rc) {
  const ContextObject* context = self(face);
  return Call(context, "getEntryCount", "").giveNumber(static_cast<CMPICount>(context->entries.size()), rc);
}

CMPIStatus addEntry(const CMPIContext* face, const char* name, const CMPIValue* value, const CMPIType type) {
  ContextObject* context = self(face);
  const Call call(context, "addEntry", nameAndValue(name, value, type));
  if (!call.refused()) putValue(context->entries, plain(name), ObjectTables::valueOf(value, type));
  return call.status();
}

CMPIArgs* argsClone(const CMPIArgs* face, CMPIStatus* rc) {
  const ArgsObject* args = self(face);
  const Call call(args, "clone", "");
  return call.give([&] { return args->broker->makeArgs(args->arguments, {}); }, rc);
}

CMPIStatus addArg(const CMPIArgs* face, const char* name, const CMPIValue* value, const CMPIType type) {
  ArgsObject* args = self(face);
  const Call call(args, "addArg", nameAndValue(name, value, type));
  if (!call.refused()) putValue(args->arguments, plain(name), ObjectTables::valueOf(value, type));
  return call.status();
}

CMPIData getArg(const CMPIArgs* face, const char* name, CMPIStatus* rc) {
  const ArgsObject* args = self(face);
  const Call call(args, "getArg", inQuotesOrNull(name));
  return giveByName(call, args->arguments, name, args->broker->missingArgument, rc, args->broker->stateOfArguments);
}

CMPIData getArgAt(const CMPIArgs* face, CMPICount index, CMPIString** name, CMPIStatus* rc) {
  const ArgsObject* args = self(face);
  const Call call(args, "getArgAt", numberText(index));
  return giveNamed(call, args->arguments, index, args->broker->missingArgument, name, rc, makeName,
                   args->broker->stateOfArguments);
}

CMPICount getArgCount(const CMPIArgs* face, CMPIStatus* rc) {
  const ArgsObject* args = self(face);
  return Call(args, "getArgCount", "").giveNumber(static_cast<CMPICount>(args->arguments.size()), rc);
}

// --- dates

CMPIDateTime* dateTimeClone(const CMPIDateTime* face, CMPIStatus* rc) {
  const DateTimeObject* date = self(face);
  const Call call(date, "clone", "");
  return call.give(
      [&] {
        return date->broker->makeData({CMPI_dateTime, CMPI_goodValue, date->text}).value.dateTime;
      },
      rc);
}

CMPIUint64 getBinaryFormat(const CMPIDateTime* face, CMPIStatus* rc) {
  const Call call(self(face), "getBinaryFormat", "");
  call.giveNull(rc, CMPI_RC_ERR_NOT_SUPPORTED);
  return 0;
}

CMPIString* getStringFormat(const CMPIDateTime* face, CMPIStatus* rc) {
  const DateTimeObject* date = self(face);
  const Call call(date, "getStringFormat", "");
  return call.give([&] { return date->broker->makeString(date->text); }, rc);
}

CMPIBoolean isInterval(const CMPIDateTime* face, CMPIStatus* rc) {
  const DateTimeObject* date = self(face);
  const bool ends = date->text.size() == 25 && date->text[21] == ':';
  return Call(date, "isInterval", "").giveNumber(static_cast<CMPIBoolean>(ends), rc);
}

}  // namespace

CMPIObjectPathFT ObjectTables::path = {
    CMPICurrentVersion,
    release<CMPIObjectPath>,
    pathClone,
    setNameSpace,
    getNameSpace,
    setHostname,
    getHostname,
    setClassName,
    getClassName,
    addKey,
    getKey,
    getKeyAt,
    getKeyCount,
    setNameSpaceFromObjectPath,
    setHostAndNameSpaceFromObjectPath,
    getClassQualifier,
    getPropertyQualifier,
    getMethodQualifier,
    getParameterQualifier,
    pathToString,
};

CMPIInstanceFT ObjectTables::instance = {
    CMPICurrentVersion, release<CMPIInstance>, instanceClone,         getProperty,
    getPropertyAt,      getPropertyCount,      setProperty,           getObjectPath,
    setPropertyFilter,  setObjectPath,         setPropertyWithOrigin,
};

CMPIStringFT ObjectTables::string = {CMPICurrentVersion, release<CMPIString>, stringClone, getCharPtr};

CMPIArrayFT ObjectTables::array = {
    CMPICurrentVersion, release<CMPIArray>, arrayClone, getSize, getSimpleType, getElementAt, setElementAt,
};

CMPIEnumerationFT ObjectTables::enumeration = {
    CMPICurrentVersion, release<CMPIEnumeration>, enumerationClone, getNext, hasNext, toArray,
};

CMPIResultFT ObjectTables::result = {
    CMPICurrentVersion, release<CMPIResult>, resultClone, returnData,
    returnInstance,     returnObjectPath,    returnDone,  returnError,
};

CMPIContextFT ObjectTables::context = {
    CMPICurrentVersion, release<CMPIContext>, contextClone, getEntry, getEntryAt, getEntryCount, addEntry,
};

CMPIArgsFT ObjectTables::args = {
    CMPICurrentVersion, release<CMPIArgs>, argsClone, addArg, getArg, getArgAt, getArgCount,
};

CMPIDateTimeFT ObjectTables::dateTime = {
    CMPICurrentVersion, release<CMPIDateTime>, dateTimeClone, getBinaryFormat, getStringFormat, isInterval,
};

}  // namespace ZV::Test
