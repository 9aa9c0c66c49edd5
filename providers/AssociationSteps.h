// Steps that the eight association providers share. Each provider's source spells out its own walk with them.
#pragma once

#include <cmpidt.h>

#include <string>
#include <vector>

#include "trace/Trace.h"

namespace ZV {

// Whether the path or its handle is null; that is told as an error of the provider whose category and place are given.
bool isMissing(const CMPIObjectPath* path, const std::string& logger, const LogSite& site, const char* text);

// Whether a request that names resultClass takes objects of this far end. It does without a name, by the class's own
// name and by that of the CIM class that it stands for, in any case; not by a base class.
bool passesResultClass(const char* resultClass, const char* ownName, const char* cimName);

// The association that a request means: an omitted one is the provider's own.
inline const char* associationOr(const char* assocClass, const char* ownClass) {
  return assocClass != nullptr ? assocClass : ownClass;
}

// A new instance of an association with its two references; what the broker gave, good or not.
CMPIInstance* newPair(const CMPIBroker* broker, const CMPIObjectPath* association, const char* firstName,
                      const CMPIObjectPath* first, const char* secondName, const CMPIObjectPath* second,
                      CMPIStatus* status);

// Appends to tokens each longest run of text without a character of delimiters, left to right; never an empty one.
void Tokenize(const std::string& text, std::vector<std::string>& tokens, const std::string& delimiters);

}  // namespace ZV
