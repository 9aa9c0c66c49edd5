#include "broker/objects/Data.h"
#include "broker/objects/Objects.h"
#include "broker/objects/TableSupport.h"

namespace zorva::broker {

namespace {

StringObject* copySet(Arena& arena, const StringObject* text) {
  return text != nullptr ? copyString(arena, *text) : nullptr;
}

ErrorObject* copyError(Arena& arena, const ErrorObject& error) {
  auto* copy = arena.make<ErrorObject>(arena);
  copy->codes = error.codes;
  for (StringObject* ErrorObject::*text : {&ErrorObject::otherType, &ErrorObject::owningEntity, &ErrorObject::messageId,
                                           &ErrorObject::message, &ErrorObject::causeDescription, &ErrorObject::source,
                                           &ErrorObject::otherSourceFormat, &ErrorObject::statusDescription}) {
    copy->*text = copySet(arena, error.*text);
  }
  if (error.actions != nullptr) copy->actions = copyArray(arena, *error.actions);
  if (error.arguments != nullptr) copy->arguments = copyArray(arena, *error.arguments);
  return copy;
}

// The getters and setters differ only in the member.

template <auto member>
auto getCode(const CMPIError* handle, CMPIStatus* status) {
  using Code = std::remove_reference_t<decltype(std::declval<ErrorObject::Codes&>().*member)>;
  const ErrorObject* self = own<ErrorObject>(handle);
  if (self == nullptr) return badHandle<Code>(status);
  setStatus(status, CMPI_RC_OK);
  return self->codes.*member;
}

template <StringObject* ErrorObject::*member>
CMPIString* getText(const CMPIError* handle, CMPIStatus* status) {
  return readFrom<CMPIString*>(own<ErrorObject>(handle), status, member);
}

template <ArrayObject* ErrorObject::*member>
CMPIArray* getArray(const CMPIError* handle, CMPIStatus* status) {
  return readFrom<CMPIArray*>(own<ErrorObject>(handle), status, member);
}

template <StringObject* ErrorObject::*member>
CMPIStatus setText(CMPIError* handle, const char* text) {
  ErrorObject* self = own<ErrorObject>(handle);
  if (self == nullptr) return {CMPI_RC_ERR_INVALID_HANDLE, nullptr};
  self->*member = text != nullptr ? StringObject::make(*self->arena, text) : nullptr;
  return {CMPI_RC_OK, nullptr};
}

CMPIStatus setTextArray(CMPIError* handle, ArrayObject* ErrorObject::*member, const CMPIArray* given) {
  ErrorObject* self = own<ErrorObject>(handle);
  ArrayObject* array = self != nullptr ? adoptArray(*self->arena, given) : nullptr;
  if (array == nullptr) return {CMPI_RC_ERR_INVALID_HANDLE, nullptr};
  if (array->type != CMPI_string) return statusOf(CMPI_RC_ERR_TYPE_MISMATCH, "not an array of texts");
  self->*member = array;
  return {CMPI_RC_OK, nullptr};
}

CMPIStatus setErrorType(CMPIError* handle, const CMPIErrorType type) {
  return change(own<ErrorObject>(handle), [&](ErrorObject& self) { self.codes.type = type; });
}

CMPIStatus setErrorSourceFormat(CMPIError* handle, const CMPIErrorSrcFormat format) {
  return change(own<ErrorObject>(handle), [&](ErrorObject& self) { self.codes.sourceFormat = format; });
}

CMPIStatus setRecommendedActions(CMPIError* handle, const CMPIArray* actions) {
  return setTextArray(handle, &ErrorObject::actions, actions);
}

CMPIStatus setMessageArguments(CMPIError* handle, CMPIArray* arguments) {
  return setTextArray(handle, &ErrorObject::arguments, arguments);
}

}  // namespace

CMPIErrorFT ErrorObject::table =
    objectTable<ErrorObject, copyError, getCode<&ErrorObject::Codes::type>, getText<&ErrorObject::otherType>,
                getText<&ErrorObject::owningEntity>, getText<&ErrorObject::messageId>, getText<&ErrorObject::message>,
                getCode<&ErrorObject::Codes::severity>, getCode<&ErrorObject::Codes::cause>,
                getText<&ErrorObject::causeDescription>, getArray<&ErrorObject::actions>, getText<&ErrorObject::source>,
                getCode<&ErrorObject::Codes::sourceFormat>, getText<&ErrorObject::otherSourceFormat>,
                getCode<&ErrorObject::Codes::status>, getText<&ErrorObject::statusDescription>,
                getArray<&ErrorObject::arguments>, setErrorType, setText<&ErrorObject::otherType>,
                setText<&ErrorObject::causeDescription>, setRecommendedActions, setText<&ErrorObject::source>,
                setErrorSourceFormat, setText<&ErrorObject::otherSourceFormat>,
                setText<&ErrorObject::statusDescription>, setMessageArguments>();

}  // namespace zorva::broker
