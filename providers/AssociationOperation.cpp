#include "providers/AssociationOperation.h"

#include <strings.h>

#include "providers/Results.h"

namespace ZV {

bool isMissing(const Operation& operation, const CMPIObjectPath* path, const char* text, const Place& place) {
  if (isGood(path)) return false;
  complain(operation, text, place);
  return true;
}

void returnOnThisHost(const Operation& operation, const CMPIInstance* instance, const std::string&) {
  returnOne(operation, instance);
}

void returnOnThisHost(const Operation& operation, CMPIObjectPath* path, const std::string& nameSpace) {
  setNameSpaceAndHost(path, nameSpace);
  returnOne(operation, path);
}

CMPIStatus associateWith(Associate walk, Operation operation, const Association& association, const char* noFarEnd,
                         const Place& place) {
  DNSClientObjFactory factory;
  FarEnd farEnd;
  farEnd.path = factory.get_assoc_targetClass_ObjectPath(operation.broker, operation.ref,
                                                         associationOr(operation.assocClass, association.className),
                                                         operation.resultClass, &operation.status);
  if (isMissing(operation, farEnd.path, noFarEnd, place)) return operation.status;
  farEnd.className = classNameOf(farEnd.path, &operation.status);
  return walk(operation, factory, farEnd);
}

CMPIStatus referWith(Refer walk, Operation operation, const Association& association, const char* madeClass,
                     const char* noFarEnd, const Place& place) {
  DNSClientObjFactory factory;
  ReferenceParts parts;
  parts.farEnd.path = factory.get_assoc_targetClass_ObjectPath(operation.broker, operation.ref, association.className,
                                                               nullptr, &operation.status);
  parts.nameSpace = nameSpaceOf(operation.ref, &operation.status);
  parts.association = association.family.makePath(operation.broker, parts.nameSpace, madeClass, &operation.status);
  if (isMissing(operation, parts.farEnd.path, noFarEnd, place)) return operation.status;
  parts.farEnd.className = classNameOf(parts.farEnd.path, &operation.status);
  return walk(operation, factory, parts);
}

bool passesResultClass(const char* resultClass, const char* ownName, const char* cimName) {
  return resultClass == nullptr || strcasecmp(resultClass, ownName) == 0 || strcasecmp(resultClass, cimName) == 0;
}

std::string sourceKey(Operation& operation, const char* name) {
  return keyText(operation.ref, name, &operation.status);
}

void setPairFilter(const Operation& operation, const Association& association, CMPIInstance* instance) {
  const char* const keys[] = {association.references.first, association.references.second, nullptr};
  setPropertyFilter(instance, operation.properties, keys);
}

void setPair(const CMPIInstance* instance, const Association& association, const CMPIObjectPath* first,
             const CMPIObjectPath* second) {
  setReference(instance, association.references.first, first);
  setReference(instance, association.references.second, second);
  if (association.setOthers != nullptr) association.setOthers(instance);
}

CMPIInstance* newPair(Operation& operation, const Association& association, const CMPIObjectPath* path,
                      const CMPIObjectPath* first, const CMPIObjectPath* second) {
  CMPIInstance* pair = newInstance(operation.broker, path, &operation.status);
  setPair(pair, association, first, second);
  return pair;
}

bool addBuilt(Operation& operation, const Association& association, const std::string& nameSpace, const char* noPath,
              const CMPIObjectPath* first, const CMPIObjectPath* second, std::vector<CMPIInstance*>& instances,
              const char* notMade, const Place& place) {
  const CMPIObjectPath* path = newHostPath(operation.broker, nameSpace, association.className, &operation.status);
  if (isMissing(operation, path, noPath, place)) return false;
  CMPIInstance* instance = newInstance(operation.broker, path, nullptr);
  if (!isGood(instance)) {
    if (notMade != nullptr) complain(operation, notMade, place);
    return true;
  }
  setPairFilter(operation, association, instance);
  setPair(instance, association, first, second);
  instances.push_back(instance);
  return true;
}

bool returnPair(Operation& operation, const Association& association, const std::string& nameSpace, const char* noPath,
                const CMPIObjectPath* first, const CMPIObjectPath* second, const Place& place) {
  CMPIObjectPath* path = newHostPath(operation.broker, nameSpace, association.className, &operation.status);
  if (isMissing(operation, path, noPath, place)) return false;
  addReferenceKey(path, association.references.first, first);
  addReferenceKey(path, association.references.second, second);
  returnOne(operation, path);
  return true;
}

unsigned short failBuilder(const Operation& operation, const char* text, const Place& place) {
  complain(operation, text, place);
  return 1;
}

unsigned short endBuilder(const Operation& operation, const Place& place) {
  markExit(operation, place);
  return 0;
}

unsigned short leaveBuilder(const Operation& operation, const Place& place) {
  markExit(operation, place);
  return 1;
}

void returnBuilt(const Operation& operation, Builder build) {
  std::vector<CMPIInstance*> instances;
  if (build(operation, instances) == 0) returnAll(operation, instances);
}

void returnPathsOfBuilt(Operation& operation, Builder build) {
  std::vector<CMPIInstance*> instances;
  if (build(operation, instances) == 0) returnPathsOf(operation, instances);
}

void returnEqualBuilt(Operation& operation, Builder build, const Place& place) {
  std::vector<CMPIInstance*> instances;
  if (keyCountOf(operation.ref, &operation.status) == 0) {
    complain(operation, "At least one key should be passed", place);
  } else if (build(operation, instances) == 0) {
    returnFirstEqual(operation, instances, true);
  }
}

CMPIStatus endWithoutDone(const Operation& operation, const Place& place) {
  markExit(operation, place);
  return operation.status;
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
