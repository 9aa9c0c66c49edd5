#include <algorithm>

#include "broker/objects/ClassTable.h"
#include "broker/objects/Data.h"
#include "broker/objects/Objects.h"
#include "broker/objects/Scope.h"
#include "broker/objects/TableSupport.h"

namespace zorva::broker {

namespace {

CMPIData getProperty(const CMPIInstance* handle, const char* name, CMPIStatus* status) {
  const InstanceObject* self = own<InstanceObject>(handle);
  if (self == nullptr) return badHandle<CMPIData>(status);
  const PropertyInfo* property = name != nullptr ? self->info->find(name) : nullptr;
  if (property == nullptr) return notFound(status, CMPI_RC_ERR_NO_SUCH_PROPERTY);
  setStatus(status, CMPI_RC_OK);
  const InstanceObject::Slot* slot = self->find(*property);
  return slot != nullptr ? slot->data : nullData(property->type);
}

CMPIData getPropertyAt(const CMPIInstance* handle, CMPICount index, CMPIString** name, CMPIStatus* status) {
  if (name != nullptr) *name = nullptr;
  const InstanceObject* self = own<InstanceObject>(handle);
  if (self == nullptr) return badHandle<CMPIData>(status);
  if (index >= self->count) return notFound(status, CMPI_RC_ERR_NO_SUCH_PROPERTY);
  if (name != nullptr) *name = self->slots[index].property->name;
  setStatus(status, CMPI_RC_OK);
  return self->slots[index].data;
}

CMPICount getPropertyCount(const CMPIInstance* handle, CMPIStatus* status) {
  return readFrom<CMPICount>(own<InstanceObject>(handle), status, &InstanceObject::count);
}

CMPIStatus setProperty(const CMPIInstance* handle, const char* name, const CMPIValue* value, CMPIType type) {
  InstanceObject* self = own<InstanceObject>(handle);
  if (self == nullptr) return {CMPI_RC_ERR_INVALID_HANDLE, nullptr};
  const PropertyInfo* previous = self->count > 0 ? self->slots[self->count - 1].property : nullptr;
  const PropertyInfo* property = name != nullptr ? self->info->findAfter(previous, name) : nullptr;
  if (property == nullptr) {
    return statusOf(CMPI_RC_ERR_NO_SUCH_PROPERTY,
                    self->info->name() + " has no property " + (name != nullptr ? name : "without a name"));
  }
  // Properties that the filter excludes are dropped without an error: the provider need not know what was requested.
  if (!self->passes(*property)) return {CMPI_RC_OK, nullptr};
  CMPIData data;
  const CMPIrc rc = importData(*self->arena, value, type, data);
  if (rc != CMPI_RC_OK) return {rc, nullptr};
  if (fitData(*property, data) != CMPI_RC_OK) {
    return statusOf(CMPI_RC_ERR_TYPE_MISMATCH,
                    self->info->name() + "." + property->declared->name + " is declared with another type");
  }
  self->set(*property, data);
  return {CMPI_RC_OK, nullptr};
}

CMPIObjectPath* getObjectPath(const CMPIInstance* handle, CMPIStatus* status) {
  const InstanceObject* self = own<InstanceObject>(handle);
  if (self == nullptr) return badHandle<CMPIObjectPath*>(status);
  setStatus(status, CMPI_RC_OK);
  return self->path(*currentArena(self->arena));
}

void admit(const InstanceObject& instance, const char** names) {
  for (; names != nullptr && *names != nullptr; ++names) {
    if (const PropertyInfo* property = instance.info->find(*names)) {
      instance.filter[property->index / 64] |= std::uint64_t{1} << (property->index % 64);
    }
  }
}

CMPIStatus setPropertyFilter(CMPIInstance* handle, const char** properties, const char** keys) {
  InstanceObject* self = own<InstanceObject>(handle);
  if (self == nullptr) return {CMPI_RC_ERR_INVALID_HANDLE, nullptr};
  self->filter = nullptr;
  if (properties == nullptr) return {CMPI_RC_OK, nullptr};
  self->filter = self->arena->makeArray<std::uint64_t>(self->info->properties().size() / 64 + 1);
  admit(*self, properties);
  admit(*self, keys);
  if (keys == nullptr) {
    // Without its keys an instance has no name.
    for (const PropertyInfo* key : self->info->keys()) {
      self->filter[key->index / 64] |= std::uint64_t{1} << (key->index % 64);
    }
  }
  return {CMPI_RC_OK, nullptr};
}

CMPIStatus setObjectPath(CMPIInstance* handle, const CMPIObjectPath* path) {
  InstanceObject* self = own<InstanceObject>(handle);
  const PathObject* from = self != nullptr ? readPath(*self->arena, path) : nullptr;
  if (from == nullptr) return {CMPI_RC_ERR_INVALID_HANDLE, nullptr};
  if (from->info != self->info) {
    return statusOf(CMPI_RC_ERR_INVALID_CLASS, "an instance of " + self->info->name() + " keeps its class");
  }
  self->nameSpace = copyString(*self->arena, *from->nameSpace);
  self->host = copyString(*self->arena, *from->host);
  for (const EntryList::Entry& key : from->keys) {
    if (const PropertyInfo* property = self->info->find(key.name->view())) {
      self->set(*property, copyData(*self->arena, key.data));
    }
  }
  return {CMPI_RC_OK, nullptr};
}

// The origin of a property comes from the schema.
CMPIStatus setPropertyWithOrigin(const CMPIInstance* handle, const char* name, const CMPIValue* value,
                                 const CMPIType type, const char* /*origin*/) {
  return setProperty(handle, name, value, type);
}

}  // namespace

CMPIInstanceFT InstanceObject::table =
    objectTable<InstanceObject, copyInstance, getProperty, getPropertyAt, getPropertyCount, setProperty, getObjectPath,
                setPropertyFilter, setObjectPath, setPropertyWithOrigin>();

InstanceObject* InstanceObject::make(Arena& arena, const PathObject& path) {
  auto* instance = arena.make<InstanceObject>(arena, *path.info);
  instance->nameSpace = copyString(arena, *path.nameSpace);
  instance->host = copyString(arena, *path.host);
  if (path.keys.size() != 0 && path.info->keys().empty()) {
    auto* keys = arena.make<EntryList>();
    copyEntries(arena, path.keys, *keys);
    instance->looseKeys = keys;
  }
  for (std::uint32_t i = 0; i < path.keys.size(); ++i) {
    if (const PropertyInfo* property = path.info->findKey(i, path.keys[i].name->view())) {
      instance->set(*property, copyData(arena, path.keys[i].data));
    }
  }
  return instance;
}

namespace {

std::uint64_t bitOf(const PropertyInfo& property) noexcept { return std::uint64_t{1} << (property.index % 64); }

}  // namespace

const InstanceObject::Slot* InstanceObject::find(const PropertyInfo& property) const noexcept {
  if ((present & bitOf(property)) == 0) return nullptr;
  const Slot* found = std::find_if(slots, slots + count, [&](const Slot& slot) { return slot.property == &property; });
  return found != slots + count ? found : nullptr;
}

void InstanceObject::set(const PropertyInfo& property, const CMPIData& data) {
  if (const Slot* known = find(property)) {
    slots[known - slots].data = data;
    return;
  }
  if (count == capacity) {
    const std::uint32_t grown = capacity == 0 ? std::max(4U, info->usualSize()) : capacity * 2;
    auto* more = arena->makeArray<Slot>(grown);
    std::copy(slots, slots + count, more);
    slots = more;
    capacity = grown;
  }
  present |= bitOf(property);
  Slot& slot = slots[count++];
  slot.property = &property;
  slot.data.type = data.type;
  slot.data.state = data.state;
  slot.data.value = data.value;
  info->noteSize(count);
}

PathObject* InstanceObject::path(Arena& into) const {
  auto* name = into.make<PathObject>(into);
  name->setClass(*info);
  name->nameSpace = copyString(into, *nameSpace);
  name->host = copyString(into, *host);
  if (looseKeys != nullptr) copyEntries(into, *looseKeys, name->keys);
  name->keys.reserve(into, static_cast<std::uint32_t>(info->keys().size()));
  for (const PropertyInfo* key : info->keys()) {
    if (const Slot* slot = find(*key)) name->keys.append(into, key->name, copyData(into, slot->data));
  }
  return name;
}

}  // namespace zorva::broker
