#pragma once

// One operation of a provider: its arguments, the status for each CMPI call, and its name in the log.

#include <cmpidt.h>
#include <cmpift.h>

#include <string>

#include "factory/CmpiSupport.h"
#include "trace/Trace.h"

namespace ZV {

struct Operation {
  const CMPIBroker* broker;
  const std::string& category;  ///< of its log lines
  const char* name;
  const CMPIContext* context;
  const CMPIResult* result;
  const CMPIObjectPath* ref;
  CMPIStatus status;
};

/// The operation of the function that uses the macro, with the broker of its source. The first one logs the entry; the
/// second is for functions that write their own entry line.
#define ZV_OPERATION(logger, context, result, ref) (::ZV::enter(ZV_UNMARKED_OPERATION(logger, context, result, ref)))
#define ZV_UNMARKED_OPERATION(logger, context, result, ref) \
  (::ZV::Operation{::ZV::broker, logger, static_cast<const char*>(__func__), context, result, ref, ::ZV::kStatusOk})

// Each line has the operation's name and the place of the calling statement.

Operation enter(const Operation& operation, const Place& place = Place::here());

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
