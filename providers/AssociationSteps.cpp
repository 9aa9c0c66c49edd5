#include "providers/AssociationSteps.h"

#include <strings.h>

#include "factory/CmpiSupport.h"

namespace ZV {

bool isMissing(const CMPIObjectPath* path, const std::string& logger, const LogSite& site, const char* text) {
  if (isGood(path)) return false;
  logError(logger, site, text);
  return true;
}

bool passesResultClass(const char* resultClass, const char* ownName, const char* cimName) {
  return resultClass == nullptr || strcasecmp(resultClass, ownName) == 0 || strcasecmp(resultClass, cimName) == 0;
}

CMPIInstance* newPair(const CMPIBroker* broker, const CMPIObjectPath* association, const char* firstName,
                      const CMPIObjectPath* first, const char* secondName, const CMPIObjectPath* second,
                      CMPIStatus* status) {
  CMPIInstance* pair = newInstance(broker, association, status);
  setReference(pair, firstName, first);
  setReference(pair, secondName, second);
  return pair;
}

void Tokenize(const std::string& text, std::vector<std::string>& tokens, const std::string& delimiters) {
  std::size_t start = text.find_first_not_of(delimiters);
  while (start != std::string::npos) {
    const std::size_t end = text.find_first_of(delimiters, start);
    tokens.push_back(text.substr(start, end - start));
    start = text.find_first_not_of(delimiters, end);
  }
}

}  // namespace ZV
