#include "providers/AssociationOperation.h"

#include <strings.h>

#include "providers/Results.h"

namespace ZV {

bool isMissing(const Operation& operation, const CMPIObjectPath* path, const char* text, const Place& place) {
  if (isGood(path)) return false;
  complain(operation, text, place);
  return true;
}

FarEnd resolveFarEnd(Operation& operation, DNSClientObjFactory& factory, const char* associationClass,
                     const char* resultClass, const char* noFarEnd, const Place& place) {
  FarEnd farEnd;
  farEnd.path = factory.get_assoc_targetClass_ObjectPath(operation.broker, operation.ref, associationClass, resultClass,
                                                         &operation.status);
  if (!isMissing(operation, farEnd.path, noFarEnd, place)) {
    farEnd.className = classNameOf(farEnd.path, &operation.status);
  }
  return farEnd;
}

ReferenceParts resolveReferences(Operation& operation, DNSClientObjFactory& factory, const char* ownClass,
                                 MakePath makePath, const char* madeClass, const char* noFarEnd, const Place& place) {
  ReferenceParts parts;
  parts.farEnd.path =
      factory.get_assoc_targetClass_ObjectPath(operation.broker, operation.ref, ownClass, nullptr, &operation.status);
  parts.nameSpace = nameSpaceOf(operation.ref, &operation.status);
  parts.association = makePath(operation.broker, parts.nameSpace, madeClass, &operation.status);
  if (!isMissing(operation, parts.farEnd.path, noFarEnd, place)) {
    parts.farEnd.className = classNameOf(parts.farEnd.path, &operation.status);
  }
  return parts;
}

bool passesResultClass(const char* resultClass, const char* ownName, const char* cimName) {
  return resultClass == nullptr || strcasecmp(resultClass, ownName) == 0 || strcasecmp(resultClass, cimName) == 0;
}

bool askForNames(Operation& operation, const CMPIObjectPath* classPath, const CMPIEnumeration*& names,
                 const Place& place) {
  names = enumerateInstanceNames(operation.broker, operation.context, classPath, &operation.status);
  return operation.status.rc == CMPI_RC_OK ||
         complain(operation, "CBEnumInstanceNames Failed for the target Class", place);
}

bool askForNames(Operation& operation, const std::string& nameSpace, const char* className, const char* noPath,
                 const CMPIEnumeration*& names, const Place& place) {
  const CMPIObjectPath* classPath = newPath(operation.broker, nameSpace, className, &operation.status);
  return !isMissing(operation, classPath, noPath, place) && askForNames(operation, classPath, names, place);
}

bool askForInstances(Operation& operation, const std::string& nameSpace, const char* className, const char* noPath,
                     const CMPIEnumeration*& instances, const Place& place) {
  const CMPIObjectPath* classPath = newPath(operation.broker, nameSpace, className, &operation.status);
  return !isMissing(operation, classPath, noPath, place) &&
         askForInstances(operation, classPath, "CBEnumInstanceNames Failed for the target Class", instances, place);
}

bool askForInstances(Operation& operation, const CMPIObjectPath* classPath, const char* failed,
                     const CMPIEnumeration*& instances, const Place& place) {
  instances = enumerateInstances(operation.broker, operation.context, classPath, &operation.status);
  return operation.status.rc == CMPI_RC_OK || complain(operation, failed, place);
}

std::string sourceKey(Operation& operation, const char* name) {
  return keyText(operation.ref, name, &operation.status);
}

void setPair(const CMPIInstance* instance, const char* firstName, const CMPIObjectPath* first, const char* secondName,
             const CMPIObjectPath* second) {
  setReference(instance, firstName, first);
  setReference(instance, secondName, second);
}

CMPIInstance* newPair(Operation& operation, const CMPIObjectPath* association, const char* firstName,
                      const CMPIObjectPath* first, const char* secondName, const CMPIObjectPath* second) {
  CMPIInstance* pair = newInstance(operation.broker, association, &operation.status);
  setPair(pair, firstName, first, secondName, second);
  return pair;
}

bool newBuilt(Operation& operation, const std::string& nameSpace, const char* className, const char* noPath,
              CMPIInstance*& instance, const Place& place) {
  const CMPIObjectPath* path = newHostPath(operation.broker, nameSpace, className, &operation.status);
  if (isMissing(operation, path, noPath, place)) return false;
  instance = newInstance(operation.broker, path, nullptr);
  return true;
}

void returnPairPath(const Operation& operation, CMPIObjectPath* path, const char* firstName,
                    const CMPIObjectPath* first, const char* secondName, const CMPIObjectPath* second) {
  addReferenceKey(path, firstName, first);
  addReferenceKey(path, secondName, second);
  returnObjectPath(operation.result, path);
}

void deliverInstance(Operation& operation, const CMPIInstance* reference, const std::string&) {
  returnInstance(operation.result, reference);
}

void deliverPath(Operation& operation, const CMPIInstance* reference, const std::string& nameSpace) {
  CMPIObjectPath* path = objectPathOf(reference, &operation.status);
  setNameSpace(path, nameSpace);
  returnObjectPath(operation.result, path);
}

void deliverPathOnThisHost(Operation& operation, const CMPIInstance* reference, const std::string& nameSpace) {
  CMPIObjectPath* path = objectPathOf(reference, &operation.status);
  setNameSpaceAndHost(path, nameSpace);
  returnObjectPath(operation.result, path);
}

unsigned short failBuilder(const Operation& operation, const char* text, const Place& place) {
  complain(operation, text, place);
  return 1;
}

unsigned short failAndLeaveBuilder(const Operation& operation, const char* text, const Place& place) {
  complain(operation, text, place);
  markExit(operation, place);
  return 1;
}

void returnBuilt(const Operation& operation, Builder build, const char** properties) {
  std::vector<CMPIInstance*> instances;
  if (build(operation.context, operation.ref, properties, instances) == 0) returnAll(operation.result, instances);
}

void returnPathsOfBuilt(Operation& operation, Builder build) {
  std::vector<CMPIInstance*> instances;
  if (build(operation.context, operation.ref, nullptr, instances) != 0) return;
  returnPathsOf(operation.result, instances, &operation.status);
}

void returnEqualBuilt(Operation& operation, Builder build, const char** properties, const Place& place) {
  std::vector<CMPIInstance*> instances;
  if (keyCountOf(operation.ref, &operation.status) == 0) {
    complain(operation, "At least one key should be passed", place);
  } else if (build(operation.context, operation.ref, properties, instances) == 0) {
    returnFirstEqual(operation.result, operation.ref, instances, true, &operation.status);
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
