#pragma once

// Gathers the factory's objects and returns them as results.

#include <cmpidt.h>

#include <vector>

#include "factory/DNSClientObjFactory.h"
#include "providers/Operation.h"

namespace ZV {

/// All endpoints or servers, with the namespace of the path; as instances they have the operation's properties. False
/// if the factory fails.
bool fetchEndpoints(Operation& operation, DNSClientObjFactory& factory, const CMPIObjectPath* path,
                    std::vector<CMPIObjectPath*>& endpoints);
bool fetchEndpoints(Operation& operation, DNSClientObjFactory& factory, const CMPIObjectPath* path,
                    std::vector<CMPIInstance*>& endpoints);
bool fetchServers(Operation& operation, DNSClientObjFactory& factory, const CMPIObjectPath* path,
                  std::vector<CMPIObjectPath*>& servers);
bool fetchServers(Operation& operation, DNSClientObjFactory& factory, const CMPIObjectPath* path,
                  std::vector<CMPIInstance*>& servers);

/// The same for the setting data of the interfaces, and for that of the host. A failure is logged.
bool fetchSettings(Operation& operation, const CMPIObjectPath* path, std::vector<CMPIObjectPath*>& settings,
                   const Place& place = Place::here());
bool fetchSettings(Operation& operation, const CMPIObjectPath* path, std::vector<CMPIInstance*>& settings,
                   const Place& place = Place::here());
bool fetchGeneralSettings(Operation& operation, const CMPIObjectPath* path, std::vector<CMPIObjectPath*>& settings,
                          const Place& place = Place::here());
bool fetchGeneralSettings(Operation& operation, const CMPIObjectPath* path, std::vector<CMPIInstance*>& settings,
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

/// The end of a modification with this code: a failure is logged, and the client gets its code. No exit is logged.
CMPIStatus endModification(Operation& operation, unsigned int rc, const Place& place = Place::here());

}  // namespace ZV
