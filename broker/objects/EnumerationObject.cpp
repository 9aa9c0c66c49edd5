#include <algorithm>

#include "broker/objects/Data.h"
#include "broker/objects/Objects.h"
#include "broker/objects/Scope.h"
#include "broker/objects/TableSupport.h"

namespace zorva::broker {

namespace {

EnumerationObject* copyEnumeration(Arena& arena, const EnumerationObject& enumeration) {
  auto* copy = arena.make<EnumerationObject>(arena, enumeration.type);
  for (std::uint32_t i = 0; i < enumeration.count; ++i) copy->append(copyData(arena, enumeration.elements[i]));
  copy->position = enumeration.position;
  return copy;
}

CMPIData getNext(const CMPIEnumeration* handle, CMPIStatus* status) {
  EnumerationObject* self = own<EnumerationObject>(handle);
  if (self == nullptr) return badHandle<CMPIData>(status);
  if (self->position == self->count) {
    setStatus(status, CMPI_RC_ERR_NOT_FOUND);
    return nullData(self->type, CMPI_notFound | CMPI_nullValue);
  }
  setStatus(status, CMPI_RC_OK);
  return self->elements[self->position++];
}

CMPIBoolean hasNext(const CMPIEnumeration* handle, CMPIStatus* status) {
  return readFrom<CMPIBoolean>(own<EnumerationObject>(handle), status,
                               [](const EnumerationObject& self) { return self.position < self.count ? 1 : 0; });
}

// All elements, including those that getNext returned; the enumeration does not change.
CMPIArray* toArray(const CMPIEnumeration* handle, CMPIStatus* status) {
  const EnumerationObject* self = own<EnumerationObject>(handle);
  if (self == nullptr) return badHandle<CMPIArray*>(status);
  Arena& arena = *currentArena(self->arena);
  auto* array = arena.make<ArrayObject>(arena, self->type, self->count);
  for (std::uint32_t i = 0; i < self->count; ++i) array->elements[i] = copyData(arena, self->elements[i]);
  setStatus(status, CMPI_RC_OK);
  return array;
}

}  // namespace

CMPIEnumerationFT EnumerationObject::table =
    objectTable<EnumerationObject, copyEnumeration, getNext, hasNext, toArray>();

void EnumerationObject::append(const CMPIData& data) {
  if (count == capacity) {
    const std::uint32_t grown = capacity == 0 ? 8 : capacity * 2;
    auto* more = arena->makeArray<CMPIData>(grown);
    std::copy(elements, elements + count, more);
    elements = more;
    capacity = grown;
  }
  elements[count++] = data;
}

}  // namespace zorva::broker
