#pragma once

// Gathers the factory's objects and returns them as results.

#include <cmpidt.h>

#include <vector>

#include "factory/DNSClientObjFactory.h"
#include "providers/Operation.h"

namespace ZV {

/// All endpoints or servers, with the namespace of the path. False if the factory fails.
bool fetchEndpoints(Operation& operation, DNSClientObjFactory& factory, const CMPIObjectPath* path,
                    std::vector<CMPIObjectPath*>& endpoints);
bool fetchEndpoints(Operation& operation, DNSClientObjFactory& factory, const CMPIObjectPath* path,
                    const char** properties, std::vector<CMPIInstance*>& endpoints);
bool fetchServers(Operation& operation, DNSClientObjFactory& factory, const CMPIObjectPath* path,
                  std::vector<CMPIObjectPath*>& servers);
bool fetchServers(Operation& operation, DNSClientObjFactory& factory, const CMPIObjectPath* path,
                  const char** properties, std::vector<CMPIInstance*>& servers);

/// Every element in order, null ones included; the elements are counted in 16 bits.
void returnAll(const CMPIResult* result, const std::vector<CMPIInstance*>& instances);
void returnAll(const CMPIResult* result, const std::vector<CMPIObjectPath*>& paths);

/// The path of every instance in order, null for a null one.
void returnPathsOf(const CMPIResult* result, const std::vector<CMPIInstance*>& instances, CMPIStatus* status);

/// The first instance whose path equals ref, or none; instances that are null or without a handle are skipped. Where
/// the keys are references, they are compared as paths.
void returnFirstEqual(const CMPIResult* result, const CMPIObjectPath* ref, const std::vector<CMPIInstance*>& instances,
                      bool keysAreReferences, CMPIStatus* status);

}  // namespace ZV
