#pragma once

// Gathers the factory's objects and returns them as results.

#include <cmpidt.h>

#include <optional>
#include <vector>

#include "factory/DNSClientObjFactory.h"
#include "providers/Operation.h"

namespace ZV {

/// All endpoints or servers, with the namespace of the path; none if the factory fails. Found is CMPIObjectPath, or
/// CMPIInstance for instances with the operation's properties or with their keys only.
template <typename Found>
std::optional<std::vector<Found*>> fetchEndpoints(Operation& operation, DNSClientObjFactory& factory,
                                                  const CMPIObjectPath* path, bool keysOnly = false);
template <typename Found>
std::optional<std::vector<Found*>> fetchServers(Operation& operation, DNSClientObjFactory& factory,
                                                const CMPIObjectPath* path, bool keysOnly = false);

/// The same for the setting data of the interfaces, and for that of the host. A failure is logged with the text, or
/// with the name of the factory's function.
template <typename Found>
std::optional<std::vector<Found*>> fetchSettings(Operation& operation, const CMPIObjectPath* path,
                                                 const char* failed = nullptr, const Place& place = Place::here());
template <typename Found>
std::optional<std::vector<Found*>> fetchGeneralSettings(Operation& operation, const CMPIObjectPath* path,
                                                        const char* failed = nullptr,
                                                        const Place& place = Place::here());

/// One result: a path or an instance, null or not.
inline void returnOne(const Operation& operation, const CMPIObjectPath* path) {
  returnObjectPath(operation.result, path);
}
inline void returnOne(const Operation& operation, const CMPIInstance* instance) {
  returnInstance(operation.result, instance);
}

/// Every element in order, null ones included; the elements are counted in 16 bits.
template <typename Object>
void returnAll(const Operation& operation, const std::vector<Object*>& objects) {
  for (const Object* object : counted16(objects)) returnOne(operation, object);
}

/// The path of every instance in order, null for a null one.
void returnPathsOf(Operation& operation, const std::vector<CMPIInstance*>& instances);

/// The first instance whose path equals that of the request, or none; instances that are null or without a handle are
/// skipped. Where the keys are references, they are compared as paths.
void returnFirstEqual(Operation& operation, const std::vector<CMPIInstance*>& instances, bool keysAreReferences);

/// The end of an enumeration: every object is returned. Without them the error is written and the operation is left
/// open.
template <typename Object>
CMPIStatus endWithEach(const Operation& operation, const std::optional<std::vector<Object*>>& objects,
                       const char* failed, const Place& place = Place::here()) {
  if (!objects) return fail(operation, failed, place);
  for (const Object* object : *objects) returnOne(operation, object);
  return end(operation, place);
}

/// The same for objects that are counted in 16 bits, and whose failure is already logged.
template <typename Object>
CMPIStatus endWithAll(const Operation& operation, const std::optional<std::vector<Object*>>& objects,
                      const Place& place = Place::here()) {
  if (!objects) return operation.status;
  returnAll(operation, *objects);
  return end(operation, place);
}

using GetNamed = unsigned short (DNSClientObjFactory::*)(const CMPIBroker*, const CMPIObjectPath*, CMPIString* name,
                                                         const char** properties, std::vector<CMPIInstance*>&,
                                                         CMPIStatus*);
using FetchInstances = std::optional<std::vector<CMPIInstance*>> (*)(Operation&, DNSClientObjFactory&,
                                                                     const CMPIObjectPath*, bool keysOnly);

/// GetInstance of an endpoint or a server. If the path has a name, only the name decides and the other keys are
/// ignored; otherwise all keys count.
CMPIStatus endWithNamed(Operation& operation, GetNamed getNamed, const char* noneNamed, FetchInstances fetch,
                        const char* cannotFetch, const Place& place = Place::here());

/// The end of a modification with this code: a failure is logged, and the client gets its code. No exit is logged.
CMPIStatus endModification(Operation& operation, unsigned int rc, const Place& place = Place::here());

}  // namespace ZV
