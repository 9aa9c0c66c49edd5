#include "providers/Operation.h"

namespace ZV {

static LogSite siteOf(const Operation& operation, const Place& place) {
  return {operation.name, place.file, place.line};
}

Operation named(Operation operation, const std::string& category, const char* name) {
  operation.category = &category;
  operation.name = name;
  operation.status = kStatusOk;
  return operation;
}

Operation enter(Operation operation, const std::string& category, const char* name, const Place& place) {
  markProviderEntry(category, name, place.file, place.line);
  return named(operation, category, name);
}

bool complain(const Operation& operation, const char* text, const Place& place) {
  logError(*operation.category, siteOf(operation, place), text);
  return false;
}

CMPIStatus fail(const Operation& operation, const char* text, const Place& place) {
  complain(operation, text, place);
  return operation.status;
}

void logValue(const Operation& operation, const char* name, const std::string& value, const Place& place) {
  logVariable(*operation.category, siteOf(operation, place), name, value);
}

void markExit(const Operation& operation, const Place& place) {
  markProviderExit(*operation.category, operation.name, place.file, place.line);
}

CMPIStatus end(const Operation& operation, const Place& place) {
  returnDone(operation.result);
  markExit(operation, place);
  return operation.status;
}

}  // namespace ZV
