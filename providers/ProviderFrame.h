#pragma once

// The frame of all twelve providers: function tables, create functions, and the operations that do no work.
//
// A provider's source includes this header once and defines its operations in namespace ZV as <Stem>_<Operation>. Each
// takes its arguments as one value, an Operation. The source ends with the MI macros for the kinds that it serves. Each
// source has its own broker and its own tables.

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

// The functions of the tables: each makes an Operation of its arguments. No provider reads a role.

using Serve = CMPIStatus (*)(Operation operation);
using Modify = CMPIStatus (*)(Operation operation, const CMPIInstance* changed);

template <Serve serve>
static CMPIStatus enumInstanceNames(CMPIInstanceMI*, const CMPIContext* context, const CMPIResult* result,
                                    const CMPIObjectPath* ref) {
  return serve({.broker = broker, .context = context, .result = result, .ref = ref});
}

/// EnumInstances and GetInstance.
template <Serve serve>
static CMPIStatus readInstances(CMPIInstanceMI*, const CMPIContext* context, const CMPIResult* result,
                                const CMPIObjectPath* ref, const char** properties) {
  return serve({.broker = broker, .context = context, .result = result, .ref = ref, .properties = properties});
}

template <Modify modify>
static CMPIStatus modifyInstance(CMPIInstanceMI*, const CMPIContext* context, const CMPIResult* result,
                                 const CMPIObjectPath* ref, const CMPIInstance* changed, const char** properties) {
  return modify({.broker = broker, .context = context, .result = result, .ref = ref, .properties = properties},
                changed);
}

template <Serve serve>
static CMPIStatus associators(CMPIAssociationMI*, const CMPIContext* context, const CMPIResult* result,
                              const CMPIObjectPath* ref, const char* assocClass, const char* resultClass, const char*,
                              const char*, const char** properties) {
  return serve({.broker = broker,
                .context = context,
                .result = result,
                .ref = ref,
                .properties = properties,
                .assocClass = assocClass,
                .resultClass = resultClass});
}

template <Serve serve>
static CMPIStatus associatorNames(CMPIAssociationMI* mi, const CMPIContext* context, const CMPIResult* result,
                                  const CMPIObjectPath* ref, const char* assocClass, const char* resultClass,
                                  const char* role, const char* resultRole) {
  return associators<serve>(mi, context, result, ref, assocClass, resultClass, role, resultRole, nullptr);
}

template <Serve serve>
static CMPIStatus references(CMPIAssociationMI*, const CMPIContext* context, const CMPIResult* result,
                             const CMPIObjectPath* ref, const char*, const char*, const char**) {
  return serve({.broker = broker, .context = context, .result = result, .ref = ref});
}

template <Serve serve>
static CMPIStatus referenceNames(CMPIAssociationMI*, const CMPIContext* context, const CMPIResult* result,
                                 const CMPIObjectPath* ref, const char*, const char*) {
  return serve({.broker = broker, .context = context, .result = result, .ref = ref});
}

// Operations that no provider implements: nothing is kept across calls, so there is nothing to clean up, and a client
// can neither create nor delete an object.

template <typename MI>
static CMPIStatus nothingToCleanUp(MI*, const CMPIContext*, CMPIBoolean) {
  return kStatusOk;
}

inline CMPIStatus refusedCreation(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*,
                                  const CMPIInstance*) {
  return kNotSupported;
}

inline CMPIStatus refusedDeletion(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*) {
  return kNotSupported;
}

inline CMPIStatus refusedQuery(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*,
                               const char*, const char*) {
  return kNotSupported;
}

/// For the nine providers whose instances cannot be changed.
inline CMPIStatus refusedModification(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*,
                                      const CMPIInstance*, const char**) {
  return kNotSupported;
}

}  // namespace ZV

/// The table of a provider's instance operations and the create function that returns it. modify is
/// refusedModification, or the provider's own function as modifyInstance<...>.
#define ZV_INSTANCE_MI(prefix, stem, modify)                                                      \
  namespace ZV {                                                                                  \
  static constinit CMPIInstanceMIFT instMIFT__ = tableOf<CMPIInstanceMIFT>(                       \
      kTableVersion, kTableVersion, "instance" #prefix, nothingToCleanUp<CMPIInstanceMI>,         \
      enumInstanceNames<stem##_EnumInstanceNames>, readInstances<stem##_EnumInstances>,           \
      readInstances<stem##_GetInstance>, refusedCreation, modify, refusedDeletion, refusedQuery); \
  }                                                                                               \
  ZORVA_CREATE_MI(Instance, prefix, ::ZV::instMIFT__, ::ZV::broker)

#define ZV_ASSOCIATION_MI(prefix, stem)                                                                        \
  namespace ZV {                                                                                               \
  static constinit CMPIAssociationMIFT assocMIFT__ = tableOf<CMPIAssociationMIFT>(                             \
      kTableVersion, kTableVersion, "association" #prefix, nothingToCleanUp<CMPIAssociationMI>,                \
      associators<stem##_Associators>, associatorNames<stem##_AssociatorNames>, references<stem##_References>, \
      referenceNames<stem##_ReferenceNames>);                                                                  \
  }                                                                                                            \
  ZORVA_CREATE_MI(Association, prefix, ::ZV::assocMIFT__, ::ZV::broker)

#define ZV_METHOD_MI(prefix, stem)                                                                                     \
  namespace ZV {                                                                                                       \
  static constinit CMPIMethodMIFT methMIFT__ = tableOf<CMPIMethodMIFT>(kTableVersion, kTableVersion, "method" #prefix, \
                                                                       stem##_MethodCleanup, stem##_InvokeMethod);     \
  }                                                                                                                    \
  ZORVA_CREATE_MI(Method, prefix, ::ZV::methMIFT__, ::ZV::broker)
