// One operation of a provider: what it works on, the status that it hands to each CMPI call, and its name in the log.
#pragma once

#include <cmpidt.h>
#include <cmpift.h>

#include <string>

#include "factory/CmpiSupport.h"
#include "trace/Trace.h"

namespace ZV {

struct Operation {
  const CMPIBroker* broker;
  const std::string& category;  // of its lines in the log
  const char* name;
  const CMPIContext* context;
  const CMPIResult* result;
  const CMPIObjectPath* ref;
  CMPIStatus status;
};

// The operation of the function that says so, with the broker of its source. The first marks the entry; the second is
// for functions that write an entry line of their own.
#define ZV_OPERATION(logger, context, result, ref) (::ZV::enter(ZV_UNMARKED_OPERATION(logger, context, result, ref)))
#define ZV_UNMARKED_OPERATION(logger, context, result, ref) \
  (::ZV::Operation{::ZV::broker, logger, static_cast<const char*>(__func__), context, result, ref, ::ZV::kStatusOk})

// Each line has the operation's name and the place of the statement that calls.

Operation enter(const Operation& operation, const Place& place = Place::here());

// An error; always false, for a step that ends with it.
bool complain(const Operation& operation, const char* text, const Place& place = Place::here());

// An error that ends the operation and leaves it open: neither done nor marked as left.
CMPIStatus fail(const Operation& operation, const char* text, const Place& place = Place::here());

void logValue(const Operation& operation, const char* name, const std::string& value,
              const Place& place = Place::here());

void markExit(const Operation& operation, const Place& place = Place::here());

// The end of most operations: done, then marked as left.
CMPIStatus end(const Operation& operation, const Place& place = Place::here());

}  // namespace ZV
