#include "broker/objects/Data.h"
#include "broker/objects/Objects.h"
#include "broker/objects/TableSupport.h"

namespace zorva::broker {

namespace {

CMPICount getSize(const CMPIArray* handle, CMPIStatus* status) {
  return readFrom<CMPICount>(own<ArrayObject>(handle), status, &ArrayObject::count);
}

CMPIType getSimpleType(const CMPIArray* handle, CMPIStatus* status) {
  return readFrom<CMPIType>(own<ArrayObject>(handle), status, &ArrayObject::type);
}

CMPIData getElementAt(const CMPIArray* handle, CMPICount index, CMPIStatus* status) {
  const ArrayObject* self = own<ArrayObject>(handle);
  if (self == nullptr) return badHandle<CMPIData>(status);
  if (index >= self->count) return failed<CMPIData>(status, CMPI_RC_ERR_NO_SUCH_PROPERTY, "no such array element");
  setStatus(status, CMPI_RC_OK);
  return self->elements[index];
}

CMPIStatus setElementAt(CMPIArray* handle, CMPICount index, const CMPIValue* value, CMPIType type) {
  ArrayObject* self = own<ArrayObject>(handle);
  if (self == nullptr) return {CMPI_RC_ERR_INVALID_HANDLE, nullptr};
  if (index >= self->count) return statusOf(CMPI_RC_ERR_NO_SUCH_PROPERTY, "no such array element");
  CMPIData data;
  const CMPIrc rc = importData(*self->arena, value, type, data);
  if (rc != CMPI_RC_OK) return {rc, nullptr};
  if (data.type != self->type) {
    if (data.state == CMPI_goodValue)
      return statusOf(CMPI_RC_ERR_TYPE_MISMATCH, "not the type of the array's elements");
    data.type = self->type;
  }
  self->elements[index] = data;
  return {CMPI_RC_OK, nullptr};
}

}  // namespace

CMPIArrayFT ArrayObject::table =
    objectTable<ArrayObject, copyArray, getSize, getSimpleType, getElementAt, setElementAt>();

ArrayObject::ArrayObject(Arena& owner, CMPIType elementType, CMPICount size)
    : CMPIArray{this, &table},
      arena(&owner),
      type(keptType(elementType)),
      count(size),
      elements(owner.makeArray<CMPIData>(size)) {
  for (CMPICount i = 0; i < count; ++i) elements[i] = nullData(type);
}

}  // namespace zorva::broker
