#include "broker/objects/Data.h"
#include "broker/objects/DateTimeText.h"
#include "broker/objects/Objects.h"
#include "broker/objects/TableSupport.h"

namespace zorva::broker {

namespace {

DateTimeObject* copyOfDateTime(Arena& arena, const DateTimeObject& dateTime) { return copyDateTime(arena, dateTime); }

CMPIUint64 getBinaryFormat(const CMPIDateTime* handle, CMPIStatus* status) {
  return readFrom<CMPIUint64>(own<DateTimeObject>(handle), status, &DateTimeObject::microseconds);
}

CMPIString* getStringFormat(const CMPIDateTime* handle, CMPIStatus* status) {
  return readFrom<CMPIString*>(own<DateTimeObject>(handle), status, &DateTimeObject::text);
}

CMPIBoolean isInterval(const CMPIDateTime* handle, CMPIStatus* status) {
  return readFrom<CMPIBoolean>(own<DateTimeObject>(handle), status,
                               [](const DateTimeObject& self) { return self.interval ? 1 : 0; });
}

}  // namespace

CMPIDateTimeFT DateTimeObject::table =
    objectTable<DateTimeObject, copyOfDateTime, getBinaryFormat, getStringFormat, isInterval>();

DateTimeObject* DateTimeObject::make(Arena& arena, std::string_view text) {
  const std::optional<DateTimeValue> value = parseDateTime(text);
  if (!value) return nullptr;
  return arena.make<DateTimeObject>(arena, StringObject::make(arena, text), value->microseconds, value->interval);
}

}  // namespace zorva::broker
