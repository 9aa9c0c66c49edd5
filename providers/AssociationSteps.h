// The shared steps in the form of the providers that do not use an Operation yet.
#pragma once

#include "providers/AssociationOperation.h"

namespace ZV {

inline bool isMissing(const CMPIObjectPath* path, const std::string& logger, const LogSite& site, const char* text) {
  if (isGood(path)) return false;
  logError(logger, site, text);
  return true;
}

inline CMPIInstance* newPair(const CMPIBroker* broker, const CMPIObjectPath* association, const char* firstName,
                             const CMPIObjectPath* first, const char* secondName, const CMPIObjectPath* second,
                             CMPIStatus* status) {
  CMPIInstance* pair = newInstance(broker, association, status);
  setPair(pair, firstName, first, secondName, second);
  return pair;
}

}  // namespace ZV
