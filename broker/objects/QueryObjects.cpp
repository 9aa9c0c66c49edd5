#include "broker/objects/QueryObjects.h"

#include "broker/objects/TableSupport.h"

namespace zorva::broker {

namespace {

template <typename Object>
CMPIrc refusal(const typename Object::Handle* handle) noexcept {
  return own<Object>(handle) != nullptr ? CMPI_RC_ERR_NOT_SUPPORTED : CMPI_RC_ERR_INVALID_HANDLE;
}

template <typename Object>
CMPIStatus release(typename Object::Handle* handle) {
  return {own<Object>(handle) != nullptr ? CMPI_RC_OK : CMPI_RC_ERR_INVALID_HANDLE, nullptr};
}

/// A getter that takes a status last.
template <typename Object, typename Result, typename... Args>
Result refused(const typename Object::Handle* handle, Args... args) {
  return failed<Result>(detail::lastStatus(args...), refusal<Object>(handle));
}

CMPIStatus getData(const CMPIPredicate* handle, CMPIType* /*type*/, CMPIPredOp* /*op*/, CMPIString** /*lhs*/,
                   CMPIString** /*rhs*/) {
  return {refusal<PredicateObject>(handle), nullptr};
}

}  // namespace

CMPISelectExpFT SelectExpObject::table = {
    kTableVersion,
    release<SelectExpObject>,
    refused<SelectExpObject, CMPISelectExp*, CMPIStatus*>,
    refused<SelectExpObject, CMPIBoolean, const CMPIInstance*, CMPIStatus*>,
    refused<SelectExpObject, CMPIString*, CMPIStatus*>,
    refused<SelectExpObject, CMPISelectCond*, CMPIStatus*>,
    refused<SelectExpObject, CMPISelectCond*, CMPIStatus*>,
    refused<SelectExpObject, CMPIBoolean, CMPIAccessor*, void*, CMPIStatus*>,
};

CMPISelectCondFT SelectCondObject::table = {
    kTableVersion,
    release<SelectCondObject>,
    refused<SelectCondObject, CMPISelectCond*, CMPIStatus*>,
    refused<SelectCondObject, CMPICount, int*, CMPIStatus*>,
    refused<SelectCondObject, CMPISubCond*, CMPICount, CMPIStatus*>,
};

CMPISubCondFT SubCondObject::table = {
    kTableVersion,
    release<SubCondObject>,
    refused<SubCondObject, CMPISubCond*, CMPIStatus*>,
    refused<SubCondObject, CMPICount, CMPIStatus*>,
    refused<SubCondObject, CMPIPredicate*, CMPICount, CMPIStatus*>,
    refused<SubCondObject, CMPIPredicate*, const char*, CMPIStatus*>,
};

CMPIPredicateFT PredicateObject::table = {
    kTableVersion,
    release<PredicateObject>,
    refused<PredicateObject, CMPIPredicate*, CMPIStatus*>,
    getData,
    refused<PredicateObject, CMPIBoolean, CMPIAccessor*, void*, CMPIStatus*>,
};

}  // namespace zorva::broker
