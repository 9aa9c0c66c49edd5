#include "Request.h"

#include <array>
#include <initializer_list>

#include "LineScanner.h"

namespace ZV::Test {

namespace {

struct OperationWord {
  const char* word;
  Operation operation;
  bool hasPath;
};

constexpr std::array kOperations{
    OperationWord{"EnumInstanceNames", Operation::EnumInstanceNames, true},
    OperationWord{"EnumInstances", Operation::EnumInstances, true},
    OperationWord{"GetInstance", Operation::GetInstance, true},
    OperationWord{"CreateInstance", Operation::CreateInstance, true},
    OperationWord{"ModifyInstance", Operation::ModifyInstance, true},
    OperationWord{"DeleteInstance", Operation::DeleteInstance, true},
    OperationWord{"ExecQuery", Operation::ExecQuery, true},
    OperationWord{"Cleanup", Operation::Cleanup, false},
    OperationWord{"AssociatorNames", Operation::AssociatorNames, true},
    OperationWord{"Associators", Operation::Associators, true},
    OperationWord{"ReferenceNames", Operation::ReferenceNames, true},
    OperationWord{"References", Operation::References, true},
    OperationWord{"AssociationCleanup", Operation::AssociationCleanup, false},
    OperationWord{"InvokeMethod", Operation::InvokeMethod, true},
    OperationWord{"MethodCleanup", Operation::MethodCleanup, false},
};

bool isOneOf(Operation operation, std::initializer_list<Operation> operations) {
  for (const Operation one : operations) {
    if (one == operation) return true;
  }
  return false;
}

bool isAssociation(Operation operation) {
  return isOneOf(operation, {Operation::Associators, Operation::AssociatorNames, Operation::References,
                             Operation::ReferenceNames, Operation::AssociationCleanup});
}
bool isMethod(Operation operation) { return isOneOf(operation, {Operation::InvokeMethod, Operation::MethodCleanup}); }
bool takesInstance(Operation operation) {
  return isOneOf(operation, {Operation::CreateInstance, Operation::ModifyInstance});
}

// One of the clauses after the path, each with a comma before it.
void readClause(LineScanner& scanner, Request& request) {
  if (scanner.take("properties")) {
    request.properties = PropertyList(scanner.quotedList("a property's name"));
  } else if (scanner.take("class none")) {
    request.assocClass.reset();
  } else if (scanner.take("class")) {
    request.assocClass = scanner.quoted("the association class");
  } else if (scanner.take("result class")) {
    request.resultClass = scanner.quoted("the result class");
  } else if (scanner.take("role")) {
    request.role = scanner.quoted("the role");
  } else if (scanner.take("result role")) {
    request.resultRole = scanner.quoted("the result role");
  } else if (takesInstance(request.operation) && scanner.take("without an instance")) {
    request.withoutInstance = true;
  } else if (takesInstance(request.operation) && scanner.take("its instance without a handle")) {
    request.withoutHandle = true;
  } else {
    scanner.fail("an unknown clause");
  }
}

void readFirstLine(LineScanner& scanner, Request& request) {
  const OperationWord* found = nullptr;
  for (const OperationWord& word : kOperations) {
    if (found == nullptr && scanner.take(word.word)) found = &word;
  }
  if (found == nullptr) scanner.fail("an unknown operation");
  request.operation = found->operation;
  if (request.operation == Operation::InvokeMethod) request.method = scanner.word("the method's name");
  if (found->hasPath) {
    scanner.expect("of");
    request.path = scanner.path();
  }
  while (scanner.take(",")) readClause(scanner, request);
  scanner.expectEnd();
}

const char* textOrNull(const std::optional<std::string>& text) { return text.has_value() ? text->c_str() : nullptr; }

}  // namespace

Request readRequest(const std::vector<WrittenLine>& lines, const std::string& ownAssociation) {
  Request request;
  if (!ownAssociation.empty()) request.assocClass = ownAssociation;
  LineScanner first(lines.front());
  readFirstLine(first, request);
  for (std::size_t i = 1; i < lines.size(); ++i) {
    LineScanner scanner(lines[i]);
    if (!takesInstance(request.operation) && request.operation != Operation::InvokeMethod) {
      scanner.fail("the operation takes no values");
    }
    const std::string name = scanner.word("a name");
    scanner.expect("=");
    request.values.emplace_back(name, scanner.value());
    scanner.expectEnd();
  }
  return request;
}

RequestObjects::RequestObjects(RecordingBroker& broker, const Request& request)
    : context(broker.makeContext()),
      result(broker.makeResult()),
      ref(broker.make(request.path, "ref")),
      instance(nullptr),
      in(broker.makeArgs(request.values, "in")),
      out(broker.makeArgs({}, "out")) {
  if (request.withoutInstance) return;
  Instance content;
  content.path = request.path;
  content.properties = request.values;
  instance = broker.make(content);
  if (request.withoutHandle) instance->hdl = nullptr;
}

bool canAsk(const Provider& provider, Operation operation) {
  if (isAssociation(operation)) return provider.isAssociation();
  return !isMethod(operation) || provider.createMethodMI != nullptr;
}

CMPIStatus ask(const Provider& provider, RecordingBroker& broker, Request& request, const RequestObjects& with) {
  const Operation operation = request.operation;
  const char** properties = request.properties.cmpi();
  if (isMethod(operation)) {
    CMPIMethodMI* mi = provider.createMethodMI(broker.cmpi(), nullptr, nullptr);
    if (operation == Operation::MethodCleanup) return mi->ft->cleanup(mi, with.context, 1);
    return mi->ft->invokeMethod(mi, with.context, with.result, with.ref, request.method.c_str(), with.in, with.out);
  }
  if (isAssociation(operation)) {
    CMPIAssociationMI* mi = provider.createAssociationMI(broker.cmpi(), nullptr, nullptr);
    const char* assocClass = textOrNull(request.assocClass);
    const char* resultClass = textOrNull(request.resultClass);
    const char* role = textOrNull(request.role);
    const char* resultRole = textOrNull(request.resultRole);
    switch (operation) {
      case Operation::Associators:
        return mi->ft->associators(mi, with.context, with.result, with.ref, assocClass, resultClass, role, resultRole,
                                   properties);
      case Operation::AssociatorNames:
        return mi->ft->associatorNames(mi, with.context, with.result, with.ref, assocClass, resultClass, role,
                                       resultRole);
      case Operation::References:
        return mi->ft->references(mi, with.context, with.result, with.ref, resultClass, role, properties);
      case Operation::ReferenceNames:
        return mi->ft->referenceNames(mi, with.context, with.result, with.ref, resultClass, role);
      default:
        return mi->ft->cleanup(mi, with.context, 1);
    }
  }
  CMPIInstanceMI* mi = provider.createInstanceMI(broker.cmpi(), nullptr, nullptr);
  switch (operation) {
    case Operation::EnumInstanceNames:
      return mi->ft->enumerateInstanceNames(mi, with.context, with.result, with.ref);
    case Operation::EnumInstances:
      return mi->ft->enumerateInstances(mi, with.context, with.result, with.ref, properties);
    case Operation::GetInstance:
      return mi->ft->getInstance(mi, with.context, with.result, with.ref, properties);
    case Operation::CreateInstance:
      return mi->ft->createInstance(mi, with.context, with.result, with.ref, with.instance);
    case Operation::ModifyInstance:
      return mi->ft->modifyInstance(mi, with.context, with.result, with.ref, with.instance, properties);
    case Operation::DeleteInstance:
      return mi->ft->deleteInstance(mi, with.context, with.result, with.ref);
    case Operation::ExecQuery:
      return mi->ft->execQuery(mi, with.context, with.result, with.ref, "SELECT * FROM x", "WQL");
    default:
      return mi->ft->cleanup(mi, with.context, 1);
  }
}

}  // namespace ZV::Test
