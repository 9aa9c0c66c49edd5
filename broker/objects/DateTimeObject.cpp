#include "broker/objects/Data.h"
#include "broker/objects/DateTimeText.h"
#include "broker/objects/Objects.h"
#include "broker/objects/TableSupport.h"

namespace zorva::broker {

namespace {

DateTimeObject* copyOfDateTime(Arena& arena, const DateTimeObject& dateTime) { return copyDateTime(arena, dateTime); }

CMPIUint64 getBinaryFormat(const CMPIDateTime* handle, CMPIStatus* status) {
  const DateTimeObject* self = own<DateTimeObject>(handle);
  if (self == nullptr) return badHandle<CMPIUint64>(status);
  setStatus(status, CMPI_RC_OK);
  return self->microseconds;
}

CMPIString* getStringFormat(const CMPIDateTime* handle, CMPIStatus* status) {
  const DateTimeObject* self = own<DateTimeObject>(handle);
  if (self == nullptr) return badHandle<CMPIString*>(status);
  setStatus(status, CMPI_RC_OK);
  return self->text;
}

CMPIBoolean isInterval(const CMPIDateTime* handle, CMPIStatus* status) {
  const DateTimeObject* self = own<DateTimeObject>(handle);
  if (self == nullptr) return badHandle<CMPIBoolean>(status);
  setStatus(status, CMPI_RC_OK);
  return self->interval ? 1 : 0;
}

}  // namespace

CMPIDateTimeFT DateTimeObject::table = {
    kTableVersion,
    releaseObject<DateTimeObject>,
    guarded<cloneObject<DateTimeObject, copyOfDateTime>>,
    guarded<getBinaryFormat>,
    guarded<getStringFormat>,
    guarded<isInterval>,
};

DateTimeObject* DateTimeObject::make(Arena& arena, std::string_view text) {
  const std::optional<DateTimeValue> value = parseDateTime(text);
  if (!value) return nullptr;
  return arena.make<DateTimeObject>(arena, StringObject::make(arena, text), value->microseconds, value->interval);
}

}  // namespace zorva::broker
