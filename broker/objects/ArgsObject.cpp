#include "broker/objects/Data.h"
#include "broker/objects/Objects.h"
#include "broker/objects/TableSupport.h"

namespace zorva::broker {

namespace {

CMPIStatus addArg(const CMPIArgs* handle, const char* name, const CMPIValue* value, const CMPIType type) {
  ArgsObject* self = own<ArgsObject>(handle);
  if (self == nullptr) return {CMPI_RC_ERR_INVALID_HANDLE, nullptr};
  CMPIData data;
  const CMPIStatus status = importEntry(*self->arena, name, value, type, data, "an argument without a name");
  if (status.rc == CMPI_RC_OK) self->list.set(*self->arena, intern(*self->arena, name), data);
  return status;
}

}  // namespace

CMPIArgsFT ArgsObject::table =
    objectTable<ArgsObject, copyArgs, addArg, entryOf<ArgsObject>, entryAt<ArgsObject>, entryCount<ArgsObject>>();

}  // namespace zorva::broker
