#pragma once

// The frame of all twelve providers: function tables, create functions, and the operations that do no work.
//
// A provider's source includes this header once, defines its operations in namespace ZV as <Stem>_<Operation>, and ends
// with the MI macros for the kinds that it serves. Each source has its own broker and its own tables.

#include <cmpidt.h>
#include <cmpift.h>

#include <string>
#include <vector>

#include "cmpi/support/ProviderFrame.h"
#include "factory/CmpiSupport.h"
#include "providers/Operation.h"
#include "trace/Trace.h"

namespace ZV {

/// Set by the source's create functions, the last call wins; read by its operations.
static const CMPIBroker* broker = nullptr;

}  // namespace ZV

/// Operations that no provider implements: nothing is kept across calls, so there is nothing to clean up, and a client
/// can neither create nor delete an object.
#define ZV_REFUSED_INSTANCE_OPERATIONS(stem)                                                                        \
  static CMPIStatus stem##_Cleanup(CMPIInstanceMI*, const CMPIContext*, CMPIBoolean) { return kStatusOk; }          \
  static CMPIStatus stem##_CreateInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*,                   \
                                          const CMPIObjectPath*, const CMPIInstance*) {                             \
    return kNotSupported;                                                                                           \
  }                                                                                                                 \
  static CMPIStatus stem##_DeleteInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*,                   \
                                          const CMPIObjectPath*) {                                                  \
    return kNotSupported;                                                                                           \
  }                                                                                                                 \
  static CMPIStatus stem##_ExecQuery(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, \
                                     const char*, const char*) {                                                    \
    return kNotSupported;                                                                                           \
  }

/// For the nine providers whose instances cannot be changed.
#define ZV_REFUSED_MODIFICATION(stem)                                                                 \
  static CMPIStatus stem##_ModifyInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*,     \
                                          const CMPIObjectPath*, const CMPIInstance*, const char**) { \
    return kNotSupported;                                                                             \
  }

#define ZV_ASSOCIATION_CLEANUP(stem) \
  static CMPIStatus stem##_AssociationCleanup(CMPIAssociationMI*, const CMPIContext*, CMPIBoolean) { return kStatusOk; }

/// The table of a provider's instance operations and the create function that returns it.
#define ZV_INSTANCE_MI(prefix, stem)                                                                                 \
  namespace ZV {                                                                                                     \
  static constinit CMPIInstanceMIFT instMIFT__ = tableOf<CMPIInstanceMIFT>(                                          \
      kTableVersion, kTableVersion, "instance" #prefix, stem##_Cleanup, stem##_EnumInstanceNames,                    \
      stem##_EnumInstances, stem##_GetInstance, stem##_CreateInstance, stem##_ModifyInstance, stem##_DeleteInstance, \
      stem##_ExecQuery);                                                                                             \
  }                                                                                                                  \
  ZORVA_CREATE_MI(Instance, prefix, ::ZV::instMIFT__, ::ZV::broker)

#define ZV_ASSOCIATION_MI(prefix, stem)                                                                   \
  namespace ZV {                                                                                          \
  static constinit CMPIAssociationMIFT assocMIFT__ = tableOf<CMPIAssociationMIFT>(                        \
      kTableVersion, kTableVersion, "association" #prefix, stem##_AssociationCleanup, stem##_Associators, \
      stem##_AssociatorNames, stem##_References, stem##_ReferenceNames);                                  \
  }                                                                                                       \
  ZORVA_CREATE_MI(Association, prefix, ::ZV::assocMIFT__, ::ZV::broker)

#define ZV_METHOD_MI(prefix, stem)                                                                                     \
  namespace ZV {                                                                                                       \
  static constinit CMPIMethodMIFT methMIFT__ = tableOf<CMPIMethodMIFT>(kTableVersion, kTableVersion, "method" #prefix, \
                                                                       stem##_MethodCleanup, stem##_InvokeMethod);     \
  }                                                                                                                    \
  ZORVA_CREATE_MI(Method, prefix, ::ZV::methMIFT__, ::ZV::broker)
