#include "providers/Operation.h"

namespace ZV {

static LogSite siteOf(const Operation& operation, const Place& place) {
  return {operation.name, place.file, place.line};
}

Operation enter(const Operation& operation, const Place& place) {
  markProviderEntry(operation.category, operation.name, place.file, place.line);
  return operation;
}

bool complain(const Operation& operation, const char* text, const Place& place) {
  logError(operation.category, siteOf(operation, place), text);
  return false;
}

CMPIStatus fail(const Operation& operation, const char* text, const Place& place) {
  complain(operation, text, place);
  return operation.status;
}

void logValue(const Operation& operation, const char* name, const std::string& value, const Place& place) {
  logVariable(operation.category, siteOf(operation, place), name, value);
}

void markExit(const Operation& operation, const Place& place) {
  markProviderExit(operation.category, operation.name, place.file, place.line);
}

CMPIStatus end(const Operation& operation, const Place& place) {
  returnDone(operation.result);
  markExit(operation, place);
  return operation.status;
}

}  // namespace ZV
