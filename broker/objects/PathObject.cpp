#include "broker/objects/ClassTable.h"
#include "broker/objects/Data.h"
#include "broker/objects/ObjectText.h"
#include "broker/objects/Objects.h"
#include "broker/objects/Qualifiers.h"
#include "broker/objects/Scope.h"
#include "broker/objects/TableSupport.h"

namespace zorva::broker {

namespace {

CMPIStatus setNamespaceText(CMPIObjectPath* handle, const char* name) {
  return change(own<PathObject>(handle), [&](PathObject& self) { self.setNameSpace(name != nullptr ? name : ""); });
}

CMPIString* getNameSpace(const CMPIObjectPath* handle, CMPIStatus* status) {
  return readFrom<CMPIString*>(own<PathObject>(handle), status, &PathObject::nameSpace);
}

CMPIStatus setHostname(CMPIObjectPath* handle, const char* name) {
  return change(own<PathObject>(handle), [&](PathObject& self) { self.setHost(name != nullptr ? name : ""); });
}

CMPIString* getHostname(const CMPIObjectPath* handle, CMPIStatus* status) {
  return readFrom<CMPIString*>(own<PathObject>(handle), status, &PathObject::host);
}

CMPIStatus setClassName(CMPIObjectPath* handle, const char* name) {
  return change(own<PathObject>(handle), [&](PathObject& self) { self.setClass(name != nullptr ? name : ""); });
}

CMPIString* getClassName(const CMPIObjectPath* handle, CMPIStatus* status) {
  return readFrom<CMPIString*>(own<PathObject>(handle), status, &PathObject::className);
}

CMPIStatus addKey(CMPIObjectPath* handle, const char* name, const CMPIValue* value, CMPIType type) {
  PathObject* self = own<PathObject>(handle);
  if (self == nullptr) return {CMPI_RC_ERR_INVALID_HANDLE, nullptr};
  CMPIData data;
  const CMPIStatus status = importEntry(*self->arena, name, value, type, data, "a key without a name");
  if (status.rc != CMPI_RC_OK) return status;
  // A key that the class lacks is kept: the receiver of the path checks it.
  const PropertyInfo* known = self->info != nullptr ? self->info->findKey(self->keys.size(), name) : nullptr;
  if (known != nullptr && fitData(*known, data) != CMPI_RC_OK) {
    return statusOf(CMPI_RC_ERR_TYPE_MISMATCH, std::string(name) + " is declared with another type");
  }
  self->keys.set(*self->arena, known != nullptr ? known->name : intern(*self->arena, name), data);
  return {CMPI_RC_OK, nullptr};
}

// Marks a datum that was found.
CMPIData asKey(CMPIData data) noexcept {
  if ((data.state & CMPI_notFound) == 0) data.state = static_cast<CMPIValueState>(data.state | CMPI_keyValue);
  return data;
}

CMPIData getKey(const CMPIObjectPath* handle, const char* name, CMPIStatus* status) {
  const PathObject* self = own<PathObject>(handle);
  if (self == nullptr) return badHandle<CMPIData>(status);
  return asKey(entryIn(self->keys, name, status));
}

CMPIData getKeyAt(const CMPIObjectPath* handle, CMPICount index, CMPIString** name, CMPIStatus* status) {
  if (name != nullptr) *name = nullptr;
  const PathObject* self = own<PathObject>(handle);
  if (self == nullptr) return badHandle<CMPIData>(status);
  return asKey(entryIn(self->keys, index, name, status));
}

CMPICount getKeyCount(const CMPIObjectPath* handle, CMPIStatus* status) {
  return readFrom<CMPICount>(own<PathObject>(handle), status, [](const PathObject& self) { return self.keys.size(); });
}

CMPIStatus setNameSpaceFromObjectPath(CMPIObjectPath* handle, const CMPIObjectPath* source) {
  PathObject* self = own<PathObject>(handle);
  const PathObject* from = self != nullptr ? readPath(*self->arena, source) : nullptr;
  if (from == nullptr) return {CMPI_RC_ERR_INVALID_HANDLE, nullptr};
  self->nameSpace = copyString(*self->arena, *from->nameSpace);
  return {CMPI_RC_OK, nullptr};
}

CMPIStatus setHostAndNameSpaceFromObjectPath(CMPIObjectPath* handle, const CMPIObjectPath* source) {
  PathObject* self = own<PathObject>(handle);
  const PathObject* from = self != nullptr ? readPath(*self->arena, source) : nullptr;
  if (from == nullptr) return {CMPI_RC_ERR_INVALID_HANDLE, nullptr};
  self->nameSpace = copyString(*self->arena, *from->nameSpace);
  self->host = copyString(*self->arena, *from->host);
  return {CMPI_RC_OK, nullptr};
}

CMPIData getClassQualifier(const CMPIObjectPath* handle, const char* qualifier, CMPIStatus* status) {
  const PathObject* self = own<PathObject>(handle);
  if (self == nullptr) return badHandle<CMPIData>(status);
  return qualifierData(*self, classQualifiers(*self), qualifier, status);
}

CMPIData getPropertyQualifier(const CMPIObjectPath* handle, const char* property, const char* qualifier,
                              CMPIStatus* status) {
  const PathObject* self = own<PathObject>(handle);
  if (self == nullptr) return badHandle<CMPIData>(status);
  return qualifierData(*self, propertyQualifiers(*self, property), qualifier, status);
}

CMPIData getMethodQualifier(const CMPIObjectPath* handle, const char* method, const char* qualifier,
                            CMPIStatus* status) {
  const PathObject* self = own<PathObject>(handle);
  if (self == nullptr) return badHandle<CMPIData>(status);
  return qualifierData(*self, methodQualifiers(*self, method), qualifier, status);
}

CMPIData getParameterQualifier(const CMPIObjectPath* handle, const char* method, const char* parameter,
                               const char* qualifier, CMPIStatus* status) {
  const PathObject* self = own<PathObject>(handle);
  if (self == nullptr) return badHandle<CMPIData>(status);
  return qualifierData(*self, parameterQualifiers(*self, method, parameter), qualifier, status);
}

CMPIString* toString(const CMPIObjectPath* handle, CMPIStatus* status) {
  const PathObject* self = own<PathObject>(handle);
  if (self == nullptr) return badHandle<CMPIString*>(status);
  setStatus(status, CMPI_RC_OK);
  return StringObject::make(*currentArena(self->arena), objectText(*self));
}

}  // namespace

CMPIObjectPathFT PathObject::table =
    objectTable<PathObject, copyPath, setNamespaceText, getNameSpace, setHostname, getHostname, setClassName,
                getClassName, addKey, getKey, getKeyAt, getKeyCount, setNameSpaceFromObjectPath,
                setHostAndNameSpaceFromObjectPath, getClassQualifier, getPropertyQualifier, getMethodQualifier,
                getParameterQualifier, toString>();

PathObject* PathObject::make(Arena& arena, std::string_view nameSpace, std::string_view className) {
  auto* path = arena.make<PathObject>(arena);
  path->setNameSpace(nameSpace);
  path->setClass(className);
  return path;
}

void PathObject::setClass(std::string_view name) {
  if (const ClassInfo* known = findClass(*arena, name)) {
    setClass(*known);
  } else {
    info = nullptr;
    className = intern(*arena, name);
  }
}

void PathObject::setClass(const ClassInfo& known) noexcept {
  info = &known;
  className = known.nameObject();
}

void PathObject::setNameSpace(std::string_view name) {
  if (nameSpace->view() != name) nameSpace = intern(*arena, name);
}

void PathObject::setHost(std::string_view name) {
  if (host->view() != name) host = intern(*arena, name);
}

}  // namespace zorva::broker
