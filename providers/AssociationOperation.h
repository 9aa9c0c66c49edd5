#pragma once

// The steps that the eight association providers share. Each provider's source contains its own walks, made of these.

#include <string>
#include <vector>

#include "factory/DNSClientObjFactory.h"
#include "providers/Operation.h"

namespace ZV {

// --- The far end.

/// Whether the path or its handle is null. If so, the text is written as an error.
bool isMissing(const Operation& operation, const CMPIObjectPath* path, const char* text,
               const Place& place = Place::here());

struct FarEnd {
  CMPIObjectPath* path = nullptr;  ///< of the far end's class, without keys; null or bad if there is none
  std::string className;
};

/// The association of a request; if the request names none, the provider's own.
inline const char* associationOr(const char* assocClass, const char* ownClass) {
  return assocClass != nullptr ? assocClass : ownClass;
}

/// The far end of associators. If there is none, the text is written as an error.
FarEnd resolveFarEnd(Operation& operation, DNSClientObjFactory& factory, const char* associationClass,
                     const char* resultClass, const char* noFarEnd, const Place& place = Place::here());

/// The data from which the references of a source are made.
struct ReferenceParts {
  FarEnd farEnd;
  std::string nameSpace;                  ///< of the source
  CMPIObjectPath* association = nullptr;  ///< the path for each reference
};

using MakePath = CMPIObjectPath* (*)(const CMPIBroker*, const std::string& nameSpace, const char* className,
                                     CMPIStatus*);

/// Looks up the far end in ownClass and makes a path of madeClass. If there is no far end, the text is written, but
/// only after the path is made.
ReferenceParts resolveReferences(Operation& operation, DNSClientObjFactory& factory, const char* ownClass,
                                 MakePath makePath, const char* madeClass, const char* noFarEnd,
                                 const Place& place = Place::here());

/// Whether a request that names resultClass accepts objects of this far end. It does if the request names no class, the
/// class itself, or the CIM class that it implements, in any case; not for a base class.
bool passesResultClass(const char* resultClass, const char* ownName, const char* cimName);

// --- Objects at the ends.

/// Ask the broker for another provider's objects. False, with an error, if the status has a failing code. The second
/// and the third ask with a new path of the class, and write noPath if it cannot be made.
bool askForNames(Operation& operation, const CMPIObjectPath* classPath, const CMPIEnumeration*& names,
                 const Place& place = Place::here());
bool askForNames(Operation& operation, const std::string& nameSpace, const char* className, const char* noPath,
                 const CMPIEnumeration*& names, const Place& place = Place::here());
bool askForInstances(Operation& operation, const std::string& nameSpace, const char* className, const char* noPath,
                     const CMPIEnumeration*& instances, const Place& place = Place::here());
bool askForInstances(Operation& operation, const CMPIObjectPath* classPath, const char* failed,
                     const CMPIEnumeration*& instances, const Place& place = Place::here());

/// A key of the source.
std::string sourceKey(Operation& operation, const char* name);

// --- Pairs.

/// Sets both references of an instance.
void setPair(const CMPIInstance* instance, const char* firstName, const CMPIObjectPath* first, const char* secondName,
             const CMPIObjectPath* second);

/// A new instance of an association with its two references; the broker's result, good or not.
CMPIInstance* newPair(Operation& operation, const CMPIObjectPath* association, const char* firstName,
                      const CMPIObjectPath* first, const char* secondName, const CMPIObjectPath* second);

/// A new instance on this host for a builder; the broker's result, good or not. False, with the text as an error, if
/// its path cannot be made.
bool newBuilt(Operation& operation, const std::string& nameSpace, const char* className, const char* noPath,
              CMPIInstance*& instance, const Place& place = Place::here());

/// Returns an association's path with its two references as keys.
void returnPairPath(const Operation& operation, CMPIObjectPath* path, const char* firstName,
                    const CMPIObjectPath* first, const char* secondName, const CMPIObjectPath* second);

// --- Results.

/// How a walk over references returns each one: as the instance, or as its path with the namespace of the source.
using Deliver = void (*)(Operation& operation, const CMPIInstance* reference, const std::string& nameSpace);

void deliverInstance(Operation& operation, const CMPIInstance* reference, const std::string& nameSpace);
void deliverPath(Operation& operation, const CMPIInstance* reference, const std::string& nameSpace);
void deliverPathOnThisHost(Operation& operation, const CMPIInstance* reference, const std::string& nameSpace);

/// Gathers all instances of a provider's class. In the log it is an operation of its own. It has its own status, so
/// that its failures do not reach the client. Returns 0, or 1 if it failed.
using Builder = unsigned short (*)(const CMPIContext* context, const CMPIObjectPath* ref, const char** properties,
                                   std::vector<CMPIInstance*>& instances);

/// An error that ends a builder; always 1, its result. The second also logs the exit: five builders do so if the
/// settings cannot be fetched.
unsigned short failBuilder(const Operation& operation, const char* text, const Place& place = Place::here());
unsigned short failAndLeaveBuilder(const Operation& operation, const char* text, const Place& place = Place::here());

/// Returns all built instances, or nothing if the builder fails.
void returnBuilt(const Operation& operation, Builder build, const char** properties);
void returnPathsOfBuilt(Operation& operation, Builder build);

/// Returns the first built instance whose path equals that of the request.
void returnEqualBuilt(Operation& operation, Builder build, const char** properties, const Place& place = Place::here());

/// The end of the association operations of three providers: the exit is logged, returnDone is not called.
CMPIStatus endWithoutDone(const Operation& operation, const Place& place = Place::here());

/// Appends to tokens each longest part of text without a character of delimiters, left to right; never an empty one.
void Tokenize(const std::string& text, std::vector<std::string>& tokens, const std::string& delimiters);

}  // namespace ZV
