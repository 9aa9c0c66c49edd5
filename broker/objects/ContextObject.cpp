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

CMPIStatus addEntry(const CMPIContext* handle, const char* name, const CMPIValue* value, const CMPIType type) {
  ContextObject* self = own<ContextObject>(handle);
  if (self == nullptr) return {CMPI_RC_ERR_INVALID_HANDLE, nullptr};
  CMPIData data;
  const CMPIStatus status = importEntry(*self->arena, name, value, type, data, "an entry without a name");
  if (status.rc == CMPI_RC_OK) self->list.set(*self->arena, StringObject::make(*self->arena, name), data);
  return status;
}

}  // namespace

CMPIContextFT ContextObject::table = objectTable<ContextObject, copyContext, entryOf<ContextObject>,
                                                 entryAt<ContextObject>, entryCount<ContextObject>, addEntry>();

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
