#include "providers/Results.h"

#include <ObjectPaths.h>

#include "factory/CmpiSupport.h"

namespace ZV {

void returnAll(const CMPIResult* result, const std::vector<CMPIInstance*>& instances) {
  for (const CMPIInstance* instance : counted16(instances)) returnInstance(result, instance);
}

void returnAll(const CMPIResult* result, const std::vector<CMPIObjectPath*>& paths) {
  for (const CMPIObjectPath* path : counted16(paths)) returnObjectPath(result, path);
}

void returnPathsOf(const CMPIResult* result, const std::vector<CMPIInstance*>& instances, CMPIStatus* status) {
  for (const CMPIInstance* instance : counted16(instances)) returnObjectPath(result, objectPathOf(instance, status));
}

void returnFirstEqual(const CMPIResult* result, const CMPIObjectPath* ref, const std::vector<CMPIInstance*>& instances,
                      bool keysAreReferences, CMPIStatus* status) {
  for (const CMPIInstance* instance : counted16(instances)) {
    if (!isGood(instance) || !isObjPathsEqual(ref, objectPathOf(instance, status), keysAreReferences)) continue;
    returnInstance(result, instance);
    return;
  }
}

}  // namespace ZV
