#pragma once

// The steps that the eight association providers share. Each provider's source contains its own walks, made of these.

#include <optional>
#include <string>
#include <type_traits>
#include <vector>

#include "factory/ClassNames.h"
#include "factory/DNSClientObjFactory.h"
#include "providers/Operation.h"
#include "providers/Results.h"

namespace ZV {

/// The errors of the four operations if a source has no far end.
struct NoFarEnd {
  const char* associators;
  const char* associatorNames;
  const char* references;
  const char* referenceNames;
};
constexpr NoFarEnd kNamesEachOperation = {
    "Object Path is NULL in Associators.", "Object Path is NULL in AssociatorNames.",
    "Object Path is NULL in References.", "Object Path is NULL in ReferenceNames."};
constexpr NoFarEnd kNamesTwoOperations = {"Object Path is NULL in Associators.", "Object Path is NULL in Associators.",
                                          "Object Path is NULL in References.", "Object Path is NULL in References."};

using MakePath = CMPIObjectPath* (*)(const CMPIBroker*, const std::string& nameSpace, const char* className,
                                     CMPIStatus*);

/// How the path of a reference is made, and the errors.
struct Family {
  MakePath makePath;
  NoFarEnd noFarEnd;
};
inline constexpr Family kPathsOnThisHost = {newHostPath, kNamesEachOperation};
inline constexpr Family kPathsWithoutHost = {newPath, kNamesTwoOperations};

/// The names of an association's two references.
struct References {
  const char* first;
  const char* second;
};
inline constexpr References kAntecedentAndDependent = {"Antecedent", "Dependent"};
inline constexpr References kElementAndSetting = {"ManagedElement", "SettingData"};
inline constexpr References kGroupAndPart = {"GroupComponent", "PartComponent"};

/// The class that a provider serves.
struct Association {
  std::string category;  ///< of the provider's log lines
  const char* className;
  const Family& family;
  References references;
  void (*setOthers)(const CMPIInstance* instance) = nullptr;  ///< sets the properties besides the references
  const char* namedClass = className;                         ///< of the paths that ReferenceNames returns
};

// --- Instances or their paths. Associators and References return the first, AssociatorNames and ReferenceNames the
// second. One walk serves both: it is a template on Found, which is CMPIInstance or CMPIObjectPath.

template <typename Found>
constexpr bool kReturnsInstances = std::is_same_v<Found, CMPIInstance>;

template <typename Found, typename Value>
constexpr Value either(Value forInstances, Value forPaths) {
  return kReturnsInstances<Found> ? forInstances : forPaths;
}

/// A property of an instance, or the key of that name.
inline std::string textIn(Operation& operation, const CMPIInstance* instance, const char* name) {
  return propertyText(instance, name, &operation.status);
}
inline std::string textIn(Operation& operation, const CMPIObjectPath* path, const char* name) {
  return keyText(path, name, &operation.status);
}

/// The path of an instance, or the path itself.
inline CMPIObjectPath* pathOf(Operation& operation, const CMPIInstance* instance) {
  return objectPathOf(instance, &operation.status);
}
inline CMPIObjectPath* pathOf(Operation&, CMPIObjectPath* path) { return path; }

template <typename Found>
Found* next(Operation& operation, const CMPIEnumeration* objects) {
  if constexpr (kReturnsInstances<Found>) {
    return nextInstance(objects, &operation.status);
  } else {
    return nextPath(objects, &operation.status);
  }
}

/// The namespace of the source, for returnOnThisHost; not read if instances are returned.
template <typename Found>
std::string nameSpaceForPaths(Operation& operation) {
  return kReturnsInstances<Found> ? std::string() : nameSpaceOf(operation.ref, &operation.status);
}

/// Returns an instance unchanged, or a path with that namespace and this host.
void returnOnThisHost(const Operation& operation, const CMPIInstance* instance, const std::string& nameSpace);
void returnOnThisHost(const Operation& operation, CMPIObjectPath* path, const std::string& nameSpace);

/// Returns a reference: as the instance, or as its path with the namespace of the source.
template <typename Found>
void deliver(Operation& operation, const CMPIInstance* reference, const std::string& nameSpace) {
  if constexpr (!kReturnsInstances<Found>) {
    CMPIObjectPath* path = objectPathOf(reference, &operation.status);
    setNameSpace(path, nameSpace);
    returnOne(operation, path);
  } else {
    returnOne(operation, reference);
  }
}

/// The same with this host in the path.
template <typename Found>
void deliverOnThisHost(Operation& operation, const CMPIInstance* reference, const std::string& nameSpace) {
  if constexpr (!kReturnsInstances<Found>) {
    returnOnThisHost(operation, objectPathOf(reference, &operation.status), nameSpace);
  } else {
    returnOne(operation, reference);
  }
}

// --- The far end.

/// Whether the path or its handle is null. If so, the text is written as an error.
bool isMissing(const Operation& operation, const CMPIObjectPath* path, const char* text,
               const Place& place = Place::here());

struct FarEnd {
  CMPIObjectPath* path = nullptr;  ///< of the far end's class, without keys
  std::string className;
};

/// The association of a request; if the request names none, the provider's own.
inline const char* associationOr(const char* assocClass, const char* ownClass) {
  return assocClass != nullptr ? assocClass : ownClass;
}

/// Whether a request that names resultClass accepts objects of this far end. It does if the request names no class, the
/// class itself, or the CIM class that it implements, in any case; not for a base class.
bool passesResultClass(const char* resultClass, const char* ownName, const char* cimName);

/// A provider's walk for Associators and AssociatorNames.
using Associate = CMPIStatus (*)(Operation& operation, DNSClientObjFactory& factory, const FarEnd& farEnd);

/// Looks up the far end and takes the walk. If there is no far end, the text is written, and the operation is left
/// open.
CMPIStatus associateWith(Associate walk, Operation operation, const Association& association, const char* noFarEnd,
                         const Place& place = Place::here());

/// The data from which the references of a source are made.
struct ReferenceParts {
  FarEnd farEnd;
  std::string nameSpace;                  ///< of the source
  CMPIObjectPath* association = nullptr;  ///< the path for each reference
};

/// A provider's walk for References and ReferenceNames.
using Refer = CMPIStatus (*)(Operation& operation, DNSClientObjFactory& factory, const ReferenceParts& parts);

/// The same for the references, with a path of madeClass. It is made before a missing far end is reported.
CMPIStatus referWith(Refer walk, Operation operation, const Association& association, const char* madeClass,
                     const char* noFarEnd, const Place& place = Place::here());

// --- Objects at the ends.

/// Ask the broker for another provider's objects; none, with an error, if the status has a failing code. The second
/// asks with a new path of the class, and writes noPath if it cannot be made.
template <typename Found>
std::optional<const CMPIEnumeration*> askFor(Operation& operation, const CMPIObjectPath* classPath,
                                             const char* failed = "CBEnumInstanceNames Failed for the target Class",
                                             const Place& place = Place::here()) {
  const auto enumerate = kReturnsInstances<Found> ? enumerateInstances : enumerateInstanceNames;
  const CMPIEnumeration* objects = enumerate(operation.broker, operation.context, classPath, &operation.status);
  if (operation.status.rc == CMPI_RC_OK) return objects;
  complain(operation, failed, place);
  return {};
}
template <typename Found>
std::optional<const CMPIEnumeration*> askForAll(Operation& operation, const std::string& nameSpace,
                                                const char* className, const char* noPath,
                                                const Place& place = Place::here()) {
  const CMPIObjectPath* classPath = newPath(operation.broker, nameSpace, className, &operation.status);
  if (isMissing(operation, classPath, noPath, place)) return {};
  return askFor<Found>(operation, classPath, "CBEnumInstanceNames Failed for the target Class", place);
}

/// A key of the source.
std::string sourceKey(Operation& operation, const char* name);

// --- Pairs.

/// Filters an instance by the request's properties, with both references as its keys.
void setPairFilter(const Operation& operation, const Association& association, CMPIInstance* instance);

/// Sets both references of an instance and the association's other properties.
void setPair(const CMPIInstance* instance, const Association& association, const CMPIObjectPath* first,
             const CMPIObjectPath* second);

/// A new instance with that path and both references; the broker's result, good or not.
CMPIInstance* newPair(Operation& operation, const Association& association, const CMPIObjectPath* path,
                      const CMPIObjectPath* first, const CMPIObjectPath* second);

/// Returns a new reference with both ends.
template <typename Found>
void deliverPair(Operation& operation, const Association& association, const ReferenceParts& parts,
                 const CMPIObjectPath* first, const CMPIObjectPath* second) {
  deliver<Found>(operation, newPair(operation, association, parts.association, first, second), parts.nameSpace);
}

/// Makes a builder's instance on this host, with the filter of the properties that the client asks for, and adds it
/// unless the broker makes no good one; notMade is the error then. False, with noPath as an error, if its path cannot
/// be made.
bool addBuilt(Operation& operation, const Association& association, const std::string& nameSpace, const char* noPath,
              const CMPIObjectPath* first, const CMPIObjectPath* second, std::vector<CMPIInstance*>& instances,
              const char* notMade = nullptr, const Place& place = Place::here());

/// Returns a path on this host with both references as keys. False, with the text as an error, if it cannot be made.
bool returnPair(Operation& operation, const Association& association, const std::string& nameSpace, const char* noPath,
                const CMPIObjectPath* first, const CMPIObjectPath* second, const Place& place = Place::here());

/// Returns the setting data of the host to a request that accepts it. False, with an error if it cannot be fetched, for
/// an operation that ends with it.
template <typename Found>
bool returnGeneralSettings(Operation& operation, const Place& place = Place::here()) {
  if (!passesResultClass(operation.resultClass, dnsGeneralSettingDataClass, "CIM_DNSGeneralSettingData")) return false;
  const auto settings = fetchGeneralSettings<Found>(operation, operation.ref, nullptr, place);
  if (settings) returnAll(operation, *settings);
  return settings.has_value();
}

// --- What is built.

/// Gathers all instances of a provider's class. In the log it is an operation of its own. It has its own status, so
/// that its failures do not reach the client. Returns 0, or 1 if it failed.
using Builder = unsigned short (*)(Operation operation, std::vector<CMPIInstance*>& instances);

/// An error that ends a builder; always 1, its result.
unsigned short failBuilder(const Operation& operation, const char* text, const Place& place = Place::here());

/// The end of a builder that made all: the exit is logged. Always 0.
unsigned short endBuilder(const Operation& operation, const Place& place = Place::here());

/// The end of five builders if the settings cannot be fetched: only they log the exit of a failure. Always 1.
unsigned short leaveBuilder(const Operation& operation, const Place& place = Place::here());

/// Returns all built instances, or nothing if the builder fails.
void returnBuilt(const Operation& operation, Builder build);
void returnPathsOfBuilt(Operation& operation, Builder build);

/// Returns the first built instance whose path equals that of the request.
void returnEqualBuilt(Operation& operation, Builder build, const Place& place = Place::here());

/// The end of the association operations of three providers: the exit is logged, returnDone is not called.
CMPIStatus endWithoutDone(const Operation& operation, const Place& place = Place::here());

/// Appends to tokens each longest part of text without a character of delimiters, left to right; never an empty one.
void Tokenize(const std::string& text, std::vector<std::string>& tokens, const std::string& delimiters);

}  // namespace ZV

/// EnumInstances and GetInstance of a provider, from its builder.
#define ZV_BUILT_INSTANCES(stem, association, build)            \
  static CMPIStatus stem##_EnumInstances(Operation operation) { \
    operation = enter(operation, association.category);         \
    returnBuilt(operation, build);                              \
    return end(operation);                                      \
  }                                                             \
  static CMPIStatus stem##_GetInstance(Operation operation) {   \
    operation = enter(operation, association.category);         \
    returnEqualBuilt(operation, build);                         \
    return end(operation);                                      \
  }

/// The association operations of a provider, by its walks associate<Found> and refer<Found>, and its tables and create
/// functions.
#define ZV_ASSOCIATION_PROVIDER(prefix, stem, association)                                                            \
  namespace ZV {                                                                                                      \
  static CMPIStatus stem##_Associators(Operation operation) {                                                         \
    return associateWith(associate<CMPIInstance>, enter(operation, association.category), association,                \
                         association.family.noFarEnd.associators);                                                    \
  }                                                                                                                   \
  static CMPIStatus stem##_AssociatorNames(Operation operation) {                                                     \
    return associateWith(associate<CMPIObjectPath>, enter(operation, association.category), association,              \
                         association.family.noFarEnd.associatorNames);                                                \
  }                                                                                                                   \
  static CMPIStatus stem##_References(Operation operation) {                                                          \
    return referWith(refer<CMPIInstance>, enter(operation, association.category), association, association.className, \
                     association.family.noFarEnd.references);                                                         \
  }                                                                                                                   \
  static CMPIStatus stem##_ReferenceNames(Operation operation) {                                                      \
    return referWith(refer<CMPIObjectPath>, enter(operation, association.category), association,                      \
                     association.namedClass, association.family.noFarEnd.referenceNames);                             \
  }                                                                                                                   \
  }                                                                                                                   \
  ZV_INSTANCE_MI(prefix, stem, refusedModification)                                                                   \
  ZV_ASSOCIATION_MI(prefix, stem)
