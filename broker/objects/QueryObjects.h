#pragma once

// Query expressions. This broker runs no queries and delivers no indications, so it never makes such an object. One
// object of each kind exists, so that its function table can be reached. All their functions answer
// CMPI_RC_ERR_NOT_SUPPORTED, except that releasing one does nothing.

#include <cmpidt.h>
#include <cmpift.h>

namespace zorva::broker {

struct SelectExpObject : CMPISelectExp {
  using Handle = CMPISelectExp;
  static CMPISelectExpFT table;
};

struct SelectCondObject : CMPISelectCond {
  using Handle = CMPISelectCond;
  static CMPISelectCondFT table;
};

struct SubCondObject : CMPISubCond {
  using Handle = CMPISubCond;
  static CMPISubCondFT table;
};

struct PredicateObject : CMPIPredicate {
  using Handle = CMPIPredicate;
  static CMPIPredicateFT table;
};

/// The one object of a kind. It is never changed.
template <typename Object>
Object& theOnly() noexcept {
  static Object object{{&object, &Object::table}};
  return object;
}

}  // namespace zorva::broker
