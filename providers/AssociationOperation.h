// The steps that the eight association providers share. Each provider's source spells out its own walks with them.
#pragma once

#include <string>
#include <vector>

#include "factory/DNSClientObjFactory.h"
#include "providers/Operation.h"

namespace ZV {

// --- The far end.

// Whether the path or its handle is null; then the text is written as an error.
bool isMissing(const Operation& operation, const CMPIObjectPath* path, const char* text,
               const Place& place = Place::here());

struct FarEnd {
  CMPIObjectPath* path = nullptr;  // of the far end's class, without keys; null or bad where there is none
  std::string className;
};

// The association that a request means: an omitted one is the provider's own.
inline const char* associationOr(const char* assocClass, const char* ownClass) {
  return assocClass != nullptr ? assocClass : ownClass;
}

// The far end of associators. The text is written as an error where there is none.
FarEnd resolveFarEnd(Operation& operation, DNSClientObjFactory& factory, const char* associationClass,
                     const char* resultClass, const char* noFarEnd, const Place& place = Place::here());

// What the references of a source are made from.
struct ReferenceParts {
  FarEnd farEnd;
  std::string nameSpace;                  // of the source
  CMPIObjectPath* association = nullptr;  // the path that each reference is made of
};

using MakePath = CMPIObjectPath* (*)(const CMPIBroker*, const std::string& nameSpace, const char* className,
                                     CMPIStatus*);

// Looks up the far end in ownClass and makes a path of madeClass; only then the text is written where there is no far
// end.
ReferenceParts resolveReferences(Operation& operation, DNSClientObjFactory& factory, const char* ownClass,
                                 MakePath makePath, const char* madeClass, const char* noFarEnd,
                                 const Place& place = Place::here());

// Whether a request that names resultClass takes objects of this far end. It does without a name, by the class's own
// name and by that of the CIM class that it stands for, in any case; not by a base class.
bool passesResultClass(const char* resultClass, const char* ownName, const char* cimName);

// --- What is found at the ends.

// Ask the broker for what another provider serves. False, with an error, where the status has a failing code. The
// second and the third ask with a new path of the class, and say noPath where it cannot be made.
bool askForNames(Operation& operation, const CMPIObjectPath* classPath, const CMPIEnumeration*& names,
                 const Place& place = Place::here());
bool askForNames(Operation& operation, const std::string& nameSpace, const char* className, const char* noPath,
                 const CMPIEnumeration*& names, const Place& place = Place::here());
bool askForInstances(Operation& operation, const std::string& nameSpace, const char* className, const char* noPath,
                     const CMPIEnumeration*& instances, const Place& place = Place::here());
bool askForInstances(Operation& operation, const CMPIObjectPath* classPath, const char* failed,
                     const CMPIEnumeration*& instances, const Place& place = Place::here());

// A key of the source.
std::string sourceKey(Operation& operation, const char* name);

// --- Pairs.

// Sets both references of an instance.
void setPair(const CMPIInstance* instance, const char* firstName, const CMPIObjectPath* first, const char* secondName,
             const CMPIObjectPath* second);

// A new instance of an association with its two references; what the broker gave, good or not.
CMPIInstance* newPair(Operation& operation, const CMPIObjectPath* association, const char* firstName,
                      const CMPIObjectPath* first, const char* secondName, const CMPIObjectPath* second);

// A new instance on this host for a builder; what the broker gave, good or not. False, with the text as an error, where
// its path cannot be made.
bool newBuilt(Operation& operation, const std::string& nameSpace, const char* className, const char* noPath,
              CMPIInstance*& instance, const Place& place = Place::here());

// Hands out an association's path with its two references as keys.
void returnPairPath(const Operation& operation, CMPIObjectPath* path, const char* firstName,
                    const CMPIObjectPath* first, const char* secondName, const CMPIObjectPath* second);

// --- What goes out.

// How a walk over references hands each one out: the instance itself, or its path with the namespace of the source.
using Deliver = void (*)(Operation& operation, const CMPIInstance* reference, const std::string& nameSpace);

void deliverInstance(Operation& operation, const CMPIInstance* reference, const std::string& nameSpace);
void deliverPath(Operation& operation, const CMPIInstance* reference, const std::string& nameSpace);
void deliverPathOnThisHost(Operation& operation, const CMPIInstance* reference, const std::string& nameSpace);

// Gathers all instances of a provider's class. It is an operation of its own in the log, with a status of its own, so
// that its failures do not reach the client. Returns 0, or 1 where it failed.
using Builder = unsigned short (*)(const CMPIContext* context, const CMPIObjectPath* ref, const char** properties,
                                   std::vector<CMPIInstance*>& instances);

// An error that ends a builder; always 1, its result. The second marks the exit too: five builders do where the
// settings cannot be fetched.
unsigned short failBuilder(const Operation& operation, const char* text, const Place& place = Place::here());
unsigned short failAndLeaveBuilder(const Operation& operation, const char* text, const Place& place = Place::here());

// All that is built; nothing where the builder fails.
void returnBuilt(const Operation& operation, Builder build, const char** properties);
void returnPathsOfBuilt(Operation& operation, Builder build);

// The first that is built whose path equals that of the request.
void returnEqualBuilt(Operation& operation, Builder build, const char** properties, const Place& place = Place::here());

// The end of the association operations of three providers: marked as left, never done.
CMPIStatus endWithoutDone(const Operation& operation, const Place& place = Place::here());

// Appends to tokens each longest run of text without a character of delimiters, left to right; never an empty one.
void Tokenize(const std::string& text, std::vector<std::string>& tokens, const std::string& delimiters);

}  // namespace ZV
