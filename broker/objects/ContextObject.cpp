#include "broker/objects/Data.h"
#include "broker/objects/Objects.h"
#include "broker/objects/TableSupport.h"

namespace zorva::broker {

namespace {

ContextObject* copyContext(Arena& arena, const ContextObject& context) {
  auto* copy = arena.make<ContextObject>(arena);
  copyEntries(arena, context.list, copy->list);
  return copy;
}

CMPIData getEntry(const CMPIContext* handle, const char* name, CMPIStatus* status) {
  const ContextObject* self = own<ContextObject>(handle);
  if (self == nullptr) return badHandle<CMPIData>(status);
  const EntryList::Entry* entry = name != nullptr ? self->list.find(name) : nullptr;
  if (entry == nullptr) {
    setStatus(status, CMPI_RC_ERR_NOT_FOUND);
    return nullData(CMPI_null, CMPI_notFound | CMPI_nullValue);
  }
  setStatus(status, CMPI_RC_OK);
  return entry->data;
}

CMPIData getEntryAt(const CMPIContext* handle, CMPICount index, CMPIString** name, CMPIStatus* status) {
  if (name != nullptr) *name = nullptr;
  const ContextObject* self = own<ContextObject>(handle);
  if (self == nullptr) return badHandle<CMPIData>(status);
  if (index >= self->list.size()) {
    setStatus(status, CMPI_RC_ERR_NOT_FOUND);
    return nullData(CMPI_null, CMPI_notFound | CMPI_nullValue);
  }
  if (name != nullptr) *name = self->list[index].name;
  setStatus(status, CMPI_RC_OK);
  return self->list[index].data;
}

CMPICount getEntryCount(const CMPIContext* handle, CMPIStatus* status) {
  const ContextObject* self = own<ContextObject>(handle);
  if (self == nullptr) return badHandle<CMPICount>(status);
  setStatus(status, CMPI_RC_OK);
  return self->list.size();
}

CMPIStatus addEntry(const CMPIContext* handle, const char* name, const CMPIValue* value, const CMPIType type) {
  ContextObject* self = own<ContextObject>(handle);
  if (self == nullptr) return {CMPI_RC_ERR_INVALID_HANDLE, nullptr};
  if (name == nullptr || *name == '\0') return statusOf(CMPI_RC_ERR_INVALID_PARAMETER, "an entry without a name");
  CMPIData data;
  const CMPIrc rc = importData(*self->arena, value, type, data);
  if (rc == CMPI_RC_OK) self->list.set(*self->arena, StringObject::make(*self->arena, name), data);
  return {rc, nullptr};
}

}  // namespace

CMPIContextFT ContextObject::table = {
    kTableVersion,     releaseObject<ContextObject>, guarded<cloneObject<ContextObject, copyContext>>,
    guarded<getEntry>, guarded<getEntryAt>,          guarded<getEntryCount>,
    guarded<addEntry>,
};

void ContextObject::setText(const char* name, std::string_view text) {
  list.set(*arena, StringObject::make(*arena, name), stringData(StringObject::make(*arena, text)));
}

void ContextObject::setFlags(CMPIFlags flags) {
  CMPIData data{};
  data.type = CMPI_uint32;
  data.state = CMPI_goodValue;
  data.value.uint32 = flags;
  list.set(*arena, StringObject::make(*arena, CMPIInvocationFlags), data);
}

}  // namespace zorva::broker
