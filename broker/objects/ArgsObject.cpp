#include "broker/objects/Data.h"
#include "broker/objects/Objects.h"
#include "broker/objects/TableSupport.h"

namespace zorva::broker {

namespace {

CMPIStatus addArg(const CMPIArgs* handle, const char* name, const CMPIValue* value, const CMPIType type) {
  ArgsObject* self = own<ArgsObject>(handle);
  if (self == nullptr) return {CMPI_RC_ERR_INVALID_HANDLE, nullptr};
  if (name == nullptr || *name == '\0') return statusOf(CMPI_RC_ERR_INVALID_PARAMETER, "an argument without a name");
  CMPIData data;
  const CMPIrc rc = importData(*self->arena, value, type, data);
  if (rc != CMPI_RC_OK) return {rc, nullptr};
  self->list.set(*self->arena, intern(*self->arena, name), data);
  return {CMPI_RC_OK, nullptr};
}

CMPIData getArg(const CMPIArgs* handle, const char* name, CMPIStatus* status) {
  const ArgsObject* self = own<ArgsObject>(handle);
  if (self == nullptr) return badHandle<CMPIData>(status);
  const EntryList::Entry* argument = name != nullptr ? self->list.find(name) : nullptr;
  if (argument == nullptr) {
    setStatus(status, CMPI_RC_ERR_NOT_FOUND);
    return nullData(CMPI_null, CMPI_notFound | CMPI_nullValue);
  }
  setStatus(status, CMPI_RC_OK);
  return argument->data;
}

CMPIData getArgAt(const CMPIArgs* handle, CMPICount index, CMPIString** name, CMPIStatus* status) {
  if (name != nullptr) *name = nullptr;
  const ArgsObject* self = own<ArgsObject>(handle);
  if (self == nullptr) return badHandle<CMPIData>(status);
  if (index >= self->list.size()) {
    setStatus(status, CMPI_RC_ERR_NOT_FOUND);
    return nullData(CMPI_null, CMPI_notFound | CMPI_nullValue);
  }
  if (name != nullptr) *name = self->list[index].name;
  setStatus(status, CMPI_RC_OK);
  return self->list[index].data;
}

CMPICount getArgCount(const CMPIArgs* handle, CMPIStatus* status) {
  const ArgsObject* self = own<ArgsObject>(handle);
  if (self == nullptr) return badHandle<CMPICount>(status);
  setStatus(status, CMPI_RC_OK);
  return self->list.size();
}

}  // namespace

CMPIArgsFT ArgsObject::table = {
    kTableVersion,        releaseObject<ArgsObject>, guarded<cloneObject<ArgsObject, copyArgs>>,
    guarded<addArg>,      guarded<getArg>,           guarded<getArgAt>,
    guarded<getArgCount>,
};

}  // namespace zorva::broker
