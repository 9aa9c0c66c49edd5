#include "providers/Results.h"

#include <ObjectPaths.h>

#include "factory/CmpiSupport.h"

namespace ZV {

void returnAll(const CMPIResult* result, const std::vector<CMPIInstance*>& instances) {
  for (unsigned short i = 0; i < count16(instances); ++i) returnInstance(result, instances.at(i));
}

void returnAll(const CMPIResult* result, const std::vector<CMPIObjectPath*>& paths) {
  for (unsigned short i = 0; i < count16(paths); ++i) returnObjectPath(result, paths.at(i));
}

void returnPathsOf(const CMPIResult* result, const std::vector<CMPIInstance*>& instances, CMPIStatus* status) {
  for (unsigned short i = 0; i < count16(instances); ++i) {
    returnObjectPath(result, objectPathOf(instances.at(i), status));
  }
}

void returnFirstEqual(const CMPIResult* result, const CMPIObjectPath* ref, const std::vector<CMPIInstance*>& instances,
                      bool keysAreReferences, CMPIStatus* status) {
  for (unsigned short i = 0; i < count16(instances); ++i) {
    const CMPIInstance* instance = instances.at(i);
    if (!isGood(instance) || !isObjPathsEqual(ref, objectPathOf(instance, status), keysAreReferences)) continue;
    returnInstance(result, instance);
    return;
  }
}

}  // namespace ZV
