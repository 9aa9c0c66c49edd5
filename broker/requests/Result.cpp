#include "broker/requests/Result.h"

#include "broker/core/BrokerCore.h"
#include "broker/objects/Data.h"
#include "broker/objects/Scope.h"
#include "broker/objects/TableSupport.h"

namespace zorva::broker {

namespace {

CMPIResult* clone(const CMPIResult* handle, CMPIStatus* status) {
  const bool good = own<ResultObject>(handle) != nullptr;
  return failed<CMPIResult*>(status, good ? CMPI_RC_ERR_NOT_SUPPORTED : CMPI_RC_ERR_INVALID_HANDLE);
}

/// Runs `take` under the result's lock, unless the receiver needs no more. An exception of the receiver becomes the
/// error of the operation; the provider does not see it.
template <typename Take>
CMPIStatus give(ResultObject& self, Take take) {
  const std::lock_guard lock(self.mutex);
  self.claim.reset();
  if (self.full) return {CMPI_RC_ERR_FAILED, nullptr};
  try {
    self.full = !take();
    return {CMPI_RC_OK, nullptr};
  } catch (const std::exception& problem) {
    self.full = true;
    self.errorCode = CMPI_RC_ERR_FAILED;
    self.errorMessage = std::string("the results could not be taken: ") + problem.what();
    return {CMPI_RC_ERR_FAILED, nullptr};
  }
}

// Takes an object that a provider returns, which `read` brings into the request; `what` names it in the log.
template <typename Object, typename Read>
CMPIStatus takeReturned(const CMPIResult* handle, ResultObject::Accepts kind, const std::string& what,
                        const typename Object::Handle* returned, Read read, bool (Receiver::*take)(const Object&)) {
  ResultObject* self = own<ResultObject>(handle);
  if (self == nullptr) return {CMPI_RC_ERR_INVALID_HANDLE, nullptr};
  if ((self->accepts & kind) == 0) {
    self->drop("an " + what + " where the operation returns none");
    return {CMPI_RC_ERR_NOT_SUPPORTED, nullptr};
  }
  Arena* arena = currentArena();
  const Object* object = arena != nullptr ? read(*arena, returned) : own<Object>(returned);
  if (object == nullptr) {
    self->drop(returned == nullptr ? "a null " + what : "an " + what + " that cannot be read");
    return {CMPI_RC_ERR_INVALID_HANDLE, nullptr};
  }
  return give(*self, [&] { return (self->receiver->*take)(*object); });
}

CMPIStatus returnInstance(const CMPIResult* handle, const CMPIInstance* instance) {
  return takeReturned(handle, ResultObject::Instances, "instance", instance, readInstance, &Receiver::takeInstance);
}

CMPIStatus returnObjectPath(const CMPIResult* handle, const CMPIObjectPath* path) {
  return takeReturned(handle, ResultObject::Paths, "object path", path, readPath, &Receiver::takePath);
}

CMPIStatus returnData(const CMPIResult* handle, const CMPIValue* value, const CMPIType type) {
  ResultObject* self = own<ResultObject>(handle);
  if (self == nullptr) return {CMPI_RC_ERR_INVALID_HANDLE, nullptr};
  // Instances and paths may come this way too.
  if (value != nullptr && type == CMPI_instance) return returnInstance(handle, value->inst);
  if (value != nullptr && type == CMPI_ref && (self->accepts & ResultObject::Values) == 0) {
    return returnObjectPath(handle, value->ref);
  }
  Arena* arena = currentArena();
  if ((self->accepts & ResultObject::Values) == 0 || arena == nullptr) {
    self->drop("a value where the operation returns none");
    return {CMPI_RC_ERR_NOT_SUPPORTED, nullptr};
  }
  CMPIData data;
  const CMPIrc rc = importData(*arena, value, type, data);
  if (rc != CMPI_RC_OK) return {rc, nullptr};
  return give(*self, [&] { return self->receiver->takeData(data); });
}

// An operation that ends well is complete even without this call.
CMPIStatus returnDone(const CMPIResult* handle) {
  return {own<ResultObject>(handle) != nullptr ? CMPI_RC_OK : CMPI_RC_ERR_INVALID_HANDLE, nullptr};
}

CMPIStatus returnError(const CMPIResult* handle, const CMPIError* error) {
  ResultObject* self = own<ResultObject>(handle);
  const ErrorObject* mine = own<ErrorObject>(error);
  if (self == nullptr || (mine == nullptr && !isForeign(error))) return {CMPI_RC_ERR_INVALID_HANDLE, nullptr};
  CMPIStatus status{CMPI_RC_OK, nullptr};
  const CMPIrc code = mine != nullptr ? mine->codes.status : error->ft->getCIMStatusCode(error, &status);
  const std::string_view message = textOf(mine != nullptr ? mine->message : error->ft->getMessage(error, &status));
  const std::lock_guard lock(self->mutex);
  if (self->errorCode == CMPI_RC_OK) {
    self->errorCode = code == CMPI_RC_OK ? CMPI_RC_ERR_FAILED : code;
    self->errorMessage = message;
  }
  return {CMPI_RC_OK, nullptr};
}

}  // namespace

CMPIResultFT resultTable = {
    kTableVersion,           releaseObject<ResultObject>, guarded<clone>,      guarded<returnData>,
    guarded<returnInstance>, guarded<returnObjectPath>,   guarded<returnDone>, guarded<returnError>,
};

bool Receiver::takeInstance(const InstanceObject& /*instance*/) { return true; }
bool Receiver::takePath(const PathObject& /*path*/) { return true; }
bool Receiver::takeData(const CMPIData& /*data*/) { return true; }

void ResultObject::drop(std::string_view what) const {
  core.log(LogLevel::Warning, who + " returned " + std::string(what) + "; it was dropped");
}

}  // namespace zorva::broker
