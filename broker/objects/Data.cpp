#include "broker/objects/Data.h"

#include <algorithm>
#include <cstring>

#include "broker/objects/ClassTable.h"
#include "util/NotCopied.h"

namespace zorva::broker {

namespace {

/// How deep objects of another broker may be nested. Deeper ones count as unreadable.
constexpr int kDeepest = 16;

thread_local int adoptionDepth = 0;

class AdoptionLevel : util::NotCopied {
 public:
  AdoptionLevel() noexcept { ++adoptionDepth; }
  ~AdoptionLevel() { --adoptionDepth; }
  bool tooDeep() const noexcept { return adoptionDepth > kDeepest; }
};

/// Bytes of a simple type; 0 for any other type.
std::size_t simpleSize(CMPIType type) noexcept {
  switch (type) {
    case CMPI_boolean:
    case CMPI_uint8:
    case CMPI_sint8:
      return 1;
    case CMPI_char16:
    case CMPI_uint16:
    case CMPI_sint16:
      return 2;
    case CMPI_uint32:
    case CMPI_sint32:
    case CMPI_real32:
      return 4;
    case CMPI_uint64:
    case CMPI_sint64:
    case CMPI_real64:
      return 8;
    default:
      return 0;
  }
}

CMPIrc importText(Arena& arena, const char* text, CMPIData& data) {
  if (text == nullptr) return CMPI_RC_OK;
  data.type = CMPI_string;
  data.value.string = StringObject::make(arena, text);
  data.state = CMPI_goodValue;
  return CMPI_RC_OK;
}

/// Puts `object`, made from `handle`, into `data`. A null handle gives no value; a handle without an object is an
/// error.
template <typename Handle, typename Object>
CMPIrc place(const Handle* handle, Object* object, Handle* CMPIValue::*member, CMPIData& data) noexcept {
  if (handle == nullptr) return CMPI_RC_OK;
  if (object == nullptr) return CMPI_RC_ERR_INVALID_HANDLE;
  data.state = CMPI_goodValue;
  data.value.*member = object;
  return CMPI_RC_OK;
}

CMPIrc importArray(Arena& arena, const CMPIArray* handle, CMPIType type, CMPIData& data) {
  if (handle == nullptr) return CMPI_RC_OK;
  ArrayObject* array = adoptArray(arena, handle);
  if (array == nullptr) return CMPI_RC_ERR_INVALID_HANDLE;
  if ((array->type | CMPI_ARRAY) != type) return CMPI_RC_ERR_TYPE_MISMATCH;
  data.state = CMPI_goodValue;
  data.value.array = array;
  return CMPI_RC_OK;
}

/// Another broker's data as ours, in `arena`. Data that cannot be kept get no value.
CMPIData adoptData(Arena& arena, const CMPIData& foreign) {
  const CMPIType type = keptType(foreign.type);
  if ((foreign.state & (CMPI_nullValue | CMPI_notFound | CMPI_badValue)) != 0) return nullData(type);
  CMPIData data = nullData(type);
  // In data of another broker, a C string is the member of the value, never the value's address.
  const CMPIType given = foreign.type == CMPI_chars ? CMPIType{CMPI_charsptr} : foreign.type;
  if (importData(arena, &foreign.value, given, data) != CMPI_RC_OK) return nullData(type);
  return data;
}

}  // namespace

CMPIType keptType(CMPIType type) noexcept {
  const auto array = static_cast<CMPIType>(type & CMPI_ARRAY);
  const auto simple = static_cast<CMPIType>(type & ~CMPI_ARRAY);
  if (simple == CMPI_chars || simple == CMPI_charsptr) return static_cast<CMPIType>(CMPI_string | array);
  const bool object = simple == CMPI_string || simple == CMPI_dateTime || simple == CMPI_ref || simple == CMPI_instance;
  return object || simpleSize(simple) != 0 ? type : CMPIType{CMPI_null};
}

CMPIrc importData(Arena& arena, const CMPIValue* value, CMPIType type, CMPIData& data) {
  const CMPIType kept = keptType(type);
  // Field by field: copying a whole struct right after its fields were written one by one makes the processor wait, and
  // this runs for each property that a provider sets.
  data.type = kept;
  data.state = CMPI_nullValue;
  data.value.uint64 = 0;
  if (type == CMPI_null) return CMPI_RC_OK;
  if (kept == CMPI_null) return CMPI_RC_ERR_INVALID_DATA_TYPE;
  if (value == nullptr) return CMPI_RC_OK;
  if ((type & CMPI_ARRAY) != 0) return importArray(arena, value->array, kept, data);
  switch (type) {
    case CMPI_chars:
      return importText(arena, reinterpret_cast<const char*>(value), data);
    case CMPI_charsptr:
      return importText(arena, value->chars, data);
    case CMPI_string:
      return place(value->string, adoptString(arena, value->string), &CMPIValue::string, data);
    case CMPI_dateTime:
      return place(value->dateTime, adoptDateTime(arena, value->dateTime), &CMPIValue::dateTime, data);
    case CMPI_ref:
      return place(value->ref, adoptPath(arena, value->ref), &CMPIValue::ref, data);
    case CMPI_instance:
      return place(value->inst, adoptInstance(arena, value->inst), &CMPIValue::inst, data);
    default:
      // `value` often points to a variable of exactly this type, not to a whole CMPIValue.
      data.state = CMPI_goodValue;
      std::memcpy(&data.value, value, simpleSize(type));
      return CMPI_RC_OK;
  }
}

CMPIData copyData(Arena& arena, const CMPIData& data) {
  CMPIData copy = data;
  if (data.state != CMPI_goodValue) return copy;
  if ((data.type & CMPI_ARRAY) != 0) {
    copy.value.array = copyArray(arena, *own<ArrayObject>(data.value.array));
    return copy;
  }
  switch (data.type) {
    case CMPI_string:
      copy.value.string = copyString(arena, *own<StringObject>(data.value.string));
      break;
    case CMPI_dateTime:
      copy.value.dateTime = copyDateTime(arena, *own<DateTimeObject>(data.value.dateTime));
      break;
    case CMPI_ref:
      copy.value.ref = copyPath(arena, *own<PathObject>(data.value.ref));
      break;
    case CMPI_instance:
      copy.value.inst = copyInstance(arena, *own<InstanceObject>(data.value.inst));
      break;
    default:
      break;
  }
  return copy;
}

bool typeFits(CMPIType declared, bool takesInstance, CMPIType type) noexcept {
  if (declared == type) return true;
  const auto array = static_cast<CMPIType>(declared & CMPI_ARRAY);
  return takesInstance && type == (CMPI_instance | array);
}

CMPIrc fitData(const PropertyInfo& property, CMPIData& data) noexcept {
  if (typeFits(property.type, property.takesInstance, data.type)) return CMPI_RC_OK;
  if ((data.state & CMPI_nullValue) == 0) return CMPI_RC_ERR_TYPE_MISMATCH;
  data.type = property.type;
  return CMPI_RC_OK;
}

CMPIData nullData(CMPIType type, CMPIValueState state) noexcept {
  CMPIData data{};
  data.type = type;
  data.state = state;
  return data;
}

CMPIData stringData(StringObject* text) noexcept {
  CMPIData data{};
  data.type = CMPI_string;
  data.state = CMPI_goodValue;
  data.value.string = text;
  return data;
}

StringObject* copyString(Arena& arena, const StringObject& text) {
  if (text.arena == nullptr || text.arena == &arena) return const_cast<StringObject*>(&text);
  return StringObject::make(arena, text.view());
}

DateTimeObject* copyDateTime(Arena& arena, const DateTimeObject& dateTime) {
  if (dateTime.arena == &arena) return const_cast<DateTimeObject*>(&dateTime);
  return arena.make<DateTimeObject>(arena, copyString(arena, *dateTime.text), dateTime.microseconds, dateTime.interval);
}

ArrayObject* copyArray(Arena& arena, const ArrayObject& array) {
  auto* copy = arena.make<ArrayObject>(arena, array.type, array.count);
  for (CMPICount i = 0; i < array.count; ++i) copy->elements[i] = copyData(arena, array.elements[i]);
  return copy;
}

void copyEntries(Arena& arena, const EntryList& from, EntryList& to) {
  to.reserve(arena, from.size());
  for (const EntryList::Entry& entry : from) {
    to.append(arena, copyString(arena, *entry.name), copyData(arena, entry.data));
  }
}

namespace {

/// True for data that no other owner can change: without objects, or a text or date-time.
bool isUnchanging(const EntryList::Entry& entry) noexcept {
  const CMPIType type = entry.data.type;
  return type != CMPI_ref && type != CMPI_instance && (type & CMPI_ARRAY) == 0;
}

/// Namespaces and hosts are the same in most objects: all share one text in the new arena.
StringObject* copyName(Arena& arena, const StringObject& name) {
  if (name.arena == nullptr || name.arena == &arena) return const_cast<StringObject*>(&name);
  return intern(arena, name.view());
}

}  // namespace

PathObject* copyPath(Arena& arena, const PathObject& path) {
  auto* copy = arena.make<PathObject>(arena);
  copy->info = path.info;
  copy->nameSpace = copyName(arena, *path.nameSpace);
  copy->host = copyName(arena, *path.host);
  copy->className = copyString(arena, *path.className);
  if (path.arena == &arena && std::all_of(path.keys.begin(), path.keys.end(), isUnchanging)) {
    copy->keys.share(path.keys);
  } else {
    copyEntries(arena, path.keys, copy->keys);
  }
  return copy;
}

InstanceObject* copyInstance(Arena& arena, const InstanceObject& instance) {
  auto* copy = arena.make<InstanceObject>(arena, *instance.info);
  copy->nameSpace = copyName(arena, *instance.nameSpace);
  copy->host = copyName(arena, *instance.host);
  copy->slots = arena.makeArray<InstanceObject::Slot>(instance.count);
  copy->count = instance.count;
  copy->present = instance.present;
  copy->capacity = instance.count;
  for (std::uint32_t i = 0; i < instance.count; ++i) {
    copy->slots[i] = {instance.slots[i].property, copyData(arena, instance.slots[i].data)};
  }
  if (instance.filter != nullptr) {
    const std::size_t words = instance.info->properties().size() / 64 + 1;
    copy->filter = arena.makeArray<std::uint64_t>(words);
    std::memcpy(copy->filter, instance.filter, words * sizeof(std::uint64_t));
  }
  if (instance.looseKeys != nullptr) {
    auto* keys = arena.make<EntryList>();
    copyEntries(arena, *instance.looseKeys, *keys);
    copy->looseKeys = keys;
  }
  return copy;
}

ArgsObject* copyArgs(Arena& arena, const ArgsObject& args) {
  auto* copy = arena.make<ArgsObject>(arena);
  copyEntries(arena, args.list, copy->list);
  return copy;
}

std::string_view textOf(const CMPIString* handle) noexcept {
  if (const StringObject* text = own<StringObject>(handle)) return text->view();
  if (!isForeign(handle)) return {};
  CMPIStatus status{CMPI_RC_OK, nullptr};
  const char* chars = handle->ft->getCharPtr(handle, &status);
  return chars != nullptr ? std::string_view(chars) : std::string_view();
}

StringObject* adoptString(Arena& arena, const CMPIString* handle) {
  if (const StringObject* text = own<StringObject>(handle)) return copyString(arena, *text);
  if (!isForeign(handle)) return nullptr;
  return StringObject::make(arena, textOf(handle));
}

DateTimeObject* adoptDateTime(Arena& arena, const CMPIDateTime* handle) {
  if (const DateTimeObject* dateTime = own<DateTimeObject>(handle)) return copyDateTime(arena, *dateTime);
  if (!isForeign(handle)) return nullptr;
  CMPIStatus status{CMPI_RC_OK, nullptr};
  return DateTimeObject::make(arena, textOf(handle->ft->getStringFormat(handle, &status)));
}

ArrayObject* adoptArray(Arena& arena, const CMPIArray* handle) {
  if (const ArrayObject* array = own<ArrayObject>(handle)) return copyArray(arena, *array);
  const AdoptionLevel level;
  if (!isForeign(handle) || level.tooDeep()) return nullptr;
  CMPIStatus status{CMPI_RC_OK, nullptr};
  const CMPIType type = keptType(handle->ft->getSimpleType(handle, &status));
  const CMPICount count = handle->ft->getSize(handle, &status);
  if (status.rc != CMPI_RC_OK || type == CMPI_null) return nullptr;
  auto* copy = arena.make<ArrayObject>(arena, type, count);
  for (CMPICount i = 0; i < count; ++i) {
    const CMPIData element = handle->ft->getElementAt(handle, i, &status);
    if (status.rc == CMPI_RC_OK) copy->elements[i] = adoptData(arena, element);
  }
  return copy;
}

PathObject* adoptPath(Arena& arena, const CMPIObjectPath* handle) {
  if (const PathObject* path = own<PathObject>(handle)) return copyPath(arena, *path);
  const AdoptionLevel level;
  if (!isForeign(handle) || level.tooDeep()) return nullptr;
  CMPIStatus status{CMPI_RC_OK, nullptr};
  PathObject* path = PathObject::make(arena, textOf(handle->ft->getNameSpace(handle, &status)),
                                      textOf(handle->ft->getClassName(handle, &status)));
  path->setHost(textOf(handle->ft->getHostname(handle, &status)));
  const CMPICount count = handle->ft->getKeyCount(handle, &status);
  for (CMPICount i = 0; i < count && status.rc == CMPI_RC_OK; ++i) {
    CMPIString* name = nullptr;
    const CMPIData data = handle->ft->getKeyAt(handle, i, &name, &status);
    const std::string_view spelling = textOf(name);
    const PropertyInfo* known = path->info != nullptr ? path->info->find(spelling) : nullptr;
    path->keys.set(arena, known != nullptr ? known->name : intern(arena, spelling), adoptData(arena, data));
  }
  return path;
}

InstanceObject* adoptInstance(Arena& arena, const CMPIInstance* handle) {
  if (const InstanceObject* instance = own<InstanceObject>(handle)) return copyInstance(arena, *instance);
  const AdoptionLevel level;
  if (!isForeign(handle) || level.tooDeep()) return nullptr;
  CMPIStatus status{CMPI_RC_OK, nullptr};
  const PathObject* path = readPath(arena, handle->ft->getObjectPath(handle, &status));
  if (path == nullptr || path->info == nullptr) return nullptr;
  InstanceObject* instance = InstanceObject::make(arena, *path);
  const CMPICount count = handle->ft->getPropertyCount(handle, &status);
  for (CMPICount i = 0; i < count && status.rc == CMPI_RC_OK; ++i) {
    CMPIString* name = nullptr;
    const CMPIData given = handle->ft->getPropertyAt(handle, i, &name, &status);
    const PropertyInfo* property = path->info->find(textOf(name));
    if (property == nullptr) continue;
    CMPIData data = adoptData(arena, given);
    if (fitData(*property, data) == CMPI_RC_OK) instance->set(*property, data);
  }
  return instance;
}

const PathObject* readPath(Arena& arena, const CMPIObjectPath* handle) {
  if (const PathObject* path = own<PathObject>(handle)) return path;
  return adoptPath(arena, handle);
}

const InstanceObject* readInstance(Arena& arena, const CMPIInstance* handle) {
  if (const InstanceObject* instance = own<InstanceObject>(handle)) return instance;
  return adoptInstance(arena, handle);
}

}  // namespace zorva::broker
