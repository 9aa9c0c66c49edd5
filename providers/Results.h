// Handing out what an operation has gathered.
#pragma once

#include <cmpidt.h>

#include <vector>

namespace ZV {

// Every element in order, null ones included; the elements are counted in 16 bits.
void returnAll(const CMPIResult* result, const std::vector<CMPIInstance*>& instances);
void returnAll(const CMPIResult* result, const std::vector<CMPIObjectPath*>& paths);

// The path of every instance in order, null for a null one.
void returnPathsOf(const CMPIResult* result, const std::vector<CMPIInstance*>& instances, CMPIStatus* status);

// The first instance whose path equals ref, or none; instances that are null or without a handle are skipped. Where the
// keys are references, they are compared as paths.
void returnFirstEqual(const CMPIResult* result, const CMPIObjectPath* ref, const std::vector<CMPIInstance*>& instances,
                      bool keysAreReferences, CMPIStatus* status);

}  // namespace ZV
