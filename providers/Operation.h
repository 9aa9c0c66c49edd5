#pragma once

// One operation of a provider: its arguments, the status for each CMPI call, and its name in the log.

#include <cmpidt.h>
#include <cmpift.h>

#include <string>

#include "factory/CmpiSupport.h"
#include "trace/Trace.h"

namespace ZV {

struct Operation {
  const CMPIBroker* broker = nullptr;
  const CMPIContext* context = nullptr;
  const CMPIResult* result = nullptr;
  const CMPIObjectPath* ref = nullptr;
  const char** properties = nullptr;  ///< of the instances to return; null for all, and if the client asks for names
  const char* assocClass = nullptr;   ///< of a request for associators; null if it names none
  const char* resultClass = nullptr;  ///< likewise
  const char* name = nullptr;         ///< of its log lines
  const std::string* category = nullptr;
  CMPIStatus status = kStatusOk;
};

/// The operation with the name of the calling function, that category and a status of its own. The second one also logs
/// the entry.
Operation named(Operation operation, const std::string& category, const char* name = __builtin_FUNCTION());
Operation enter(Operation operation, const std::string& category, const char* name = __builtin_FUNCTION(),
                const Place& place = Place::here());

// Each line has the operation's name and the place of the calling statement.

/// Writes an error; always false, for a step that ends with it.
bool complain(const Operation& operation, const char* text, const Place& place = Place::here());

/// Writes an error that ends the operation and leaves it open: no returnDone and no exit in the log.
CMPIStatus fail(const Operation& operation, const char* text, const Place& place = Place::here());

void logValue(const Operation& operation, const char* name, const std::string& value,
              const Place& place = Place::here());

void markExit(const Operation& operation, const Place& place = Place::here());

/// The end of most operations: returnDone, then the exit is logged.
CMPIStatus end(const Operation& operation, const Place& place = Place::here());

}  // namespace ZV
