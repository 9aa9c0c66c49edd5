#include "factory/CmpiSupport.h"

#include <PlatformUtilities.h>
#include <cmpift.h>

namespace ZV {

void setNameSpaceAndHost(CMPIObjectPath* path, const std::string& nameSpace) {
  if (!isGood(path)) return;
  setNameSpace(path, nameSpace);
  path->ft->setHostname(path, getSystemName().c_str());
}

CMPIObjectPath* newHostPath(const CMPIBroker* broker, const std::string& nameSpace, const char* className,
                            CMPIStatus* rc) {
  CMPIObjectPath* path = newPath(broker, nameSpace, className, rc);
  setNameSpaceAndHost(path, nameSpace);
  return path;
}

CMPIInstance* newHostInstance(const CMPIBroker* broker, const std::string& nameSpace, const char* className,
                              const char** properties, bool keysOnly, const char* const* keys) {
  const CMPIObjectPath* path = newHostPath(broker, nameSpace, className, nullptr);
  CMPIInstance* instance = newInstance(broker, path, nullptr);
  if (!keysOnly) setPropertyFilter(instance, properties, keys);
  return instance;
}

}  // namespace ZV
