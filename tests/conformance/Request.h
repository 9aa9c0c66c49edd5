#pragma once

// The request of a case.

#include <cmpift.h>

#include <optional>
#include <string>
#include <vector>

#include "CaseFile.h"
#include "tests/support/CimValues.h"
#include "tests/support/ProviderCall.h"
#include "tests/support/Providers.h"
#include "tests/support/RecordingBroker.h"

namespace ZV::Test {

enum class Operation {
  EnumInstanceNames,
  EnumInstances,
  GetInstance,
  CreateInstance,
  ModifyInstance,
  DeleteInstance,
  ExecQuery,
  Cleanup,
  Associators,
  AssociatorNames,
  References,
  ReferenceNames,
  AssociationCleanup,
  InvokeMethod,
  MethodCleanup,
};

struct Request {
  Operation operation = Operation::EnumInstances;
  Path path;
  PropertyList properties = nullptr;
  std::optional<std::string> assocClass;
  std::optional<std::string> resultClass;
  std::optional<std::string> role;
  std::optional<std::string> resultRole;
  std::string method;
  std::vector<NamedValue> values;  ///< of the instance or of the method's arguments
  bool withoutInstance = false;
  bool withoutHandle = false;  ///< of the instance
};

/// The request in a case's lines; the default association is the provider's own. Throws CaseError.
Request readRequest(const std::vector<WrittenLine>& lines, const std::string& ownAssociation);

/// The objects with which a provider is called; made before the call is recorded.
struct RequestObjects {
  RequestObjects(RecordingBroker& broker, const Request& request);

  const CMPIContext* context;
  CMPIResult* result;
  CMPIObjectPath* ref;
  CMPIInstance* instance;  ///< null if the request has none
  CMPIArgs* in;
  CMPIArgs* out;
};

/// Makes the provider and asks it. Exceptions pass.
CMPIStatus ask(const Provider& provider, RecordingBroker& broker, Request& request, const RequestObjects& objects);
/// Whether the provider has the function table of the operation.
bool canAsk(const Provider& provider, Operation operation);

}  // namespace ZV::Test
