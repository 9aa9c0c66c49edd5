#include "cli/operations/RemoteOperations.h"

#include <algorithm>
#include <charconv>

#include "broker/objects/PathText.h"
#include "cimxml/HeaderFields.h"
#include "cimxml/RequestWriter.h"
#include "cli/output/Failure.h"
#include "cli/output/Text.h"
#include "util/Text.h"

namespace zorva::cli {

namespace {

using cimxml::CimResponse;
using cimxml::fieldText;
using cimxml::fieldValue;
using cimxml::IntrinsicCall;

/// A header field with an error text; empty if it is missing.
std::string fieldOf(const HttpReply& reply, const char* name) {
  const std::string_view value = reply.field(name);
  return value.empty() ? std::string() : ": " + printable(fieldText(value));
}

/// What a server says to a person in a reply without CIM-XML; empty if it says nothing, or writes a page.
std::string sentenceOf(const HttpReply& reply) {
  constexpr std::size_t kLongest = 500;
  if (!reply.field("Content-Type").starts_with("text/plain")) return {};
  const std::string_view line = std::string_view(reply.body).substr(0, reply.body.find('\n'));
  return printable(util::trimmed(line.substr(0, kLongest), util::kWhiteSpace));
}

Failure refusedLogin(const ServerUrl& server, const HttpReply& reply) {
  const std::string why = sentenceOf(reply);
  const std::string reason = why.empty() ? "" : ": " + why;
  if (!server.user.empty()) {
    return {ExitCode::Failed, server.shown() + " refused the login of " + printable(server.user) + reason,
            "is the password right? 'zorvactl user list', run on that host, names its users"};
  }
  return {
      ExitCode::Failed, server.shown() + " asks for a login" + reason,
      "give the user: --url https://USER@" + (server.isEncrypted() ? server.host + ":" + server.port : "HOST:5989")};
}

/// The error of a reply that is no success and has no CIM-XML in it.
void requireSuccess(const ServerUrl& server, const HttpReply& reply) {
  if (reply.status == 200) return;
  if (reply.status == 401) throw refusedLogin(server, reply);
  if (reply.status == 403) {
    const std::string why = sentenceOf(reply);
    throw Failure(ExitCode::Failed, server.shown() + " refuses this client" + (why.empty() ? "" : ": " + why));
  }
  const std::string who = server.shown() + " answered HTTP " + std::to_string(reply.status);
  const std::string why = sentenceOf(reply);
  throw Failure(ExitCode::Failed, who + (why.empty() ? fieldOf(reply, "CIMError") : ": " + why),
                "is that a CIM server (CIM-XML over HTTP)?");
}

/// A failure after the response had begun is reported in trailers (DSP0200 6.2).
broker::Status lateStatus(const HttpReply& reply) {
  const std::string_view code = reply.field("CIMStatusCode");
  broker::Status status;
  if (code.empty() || code == "0") return status;
  const auto read = std::from_chars(code.data(), code.data() + code.size(), status.rc);
  if (read.ec != std::errc() || status.rc <= 0) status.rc = 1;  // CIM_ERR_FAILED
  status.message = fieldText(reply.field("CIMStatusCodeDescription"));
  return status;
}

/// The part before such a failure: all of it if the server has completed the document, as some do; else nothing.
CimResponse failedResponse(const ServerUrl& server, const HttpReply& reply, broker::Status status,
                           const schema::ClassRepository& classes) {
  Expected<CimResponse, cimxml::ResponseError> response = cimxml::readResponse(reply.body, classes);
  if (response && !response->status.ok()) return std::move(*response);
  if (!response) {
    status.message = "the answer of " + server.shown() + " broke off: " + status.message;
    response = CimResponse();
  }
  response->status = std::move(status);
  return std::move(*response);
}

/// A repository with one class, which contains its inherited elements.
std::unique_ptr<schema::ClassRepository> repositoryOf(schema::ClassDeclaration declared,
                                                      const schema::ClassRepository& known) {
  auto repository = std::make_unique<schema::ClassRepository>();
  for (const char* name : {"Key", "Association", "ValueMap", "Values"}) {
    if (const schema::QualifierType* type = known.findQualifierType(name)) repository->add(*type);
  }
  declared.superclass.clear();
  const auto addReferred = [&](const std::string& name) {
    if (name.empty() || util::sameName(name, declared.name) || repository->find(name) != nullptr) return;
    schema::ClassDeclaration referred;
    referred.name = name;
    repository->add(std::move(referred));
  };
  for (const schema::Property& each : declared.properties) addReferred(each.referenceClass);
  for (const schema::Method& method : declared.methods) {
    for (const schema::Parameter& each : method.parameters) addReferred(each.referenceClass);
  }
  const std::string name = declared.name;
  if (const auto added = repository->add(std::move(declared)); !added) {
    throw Failure(ExitCode::Failed, "the class " + printable(name) +
                                        ", as the server has it, cannot be used: " + printable(added.error().message));
  }
  return repository;
}

/// A key's value as the class declares it; a text for a reference is a path.
std::optional<broker::Value> keyValue(const broker::Value& given, const schema::ClassProperty& declared) {
  broker::Value value = given;
  if (declared.type == schema::Type::Reference && given.type == schema::Type::String) {
    auto path = broker::parsePathText(given.asText());
    if (!path) return std::nullopt;
    return broker::Value::reference(std::move(*path));
  }
  const bool isNumber = std::holds_alternative<std::uint64_t>(given.scalar);
  if (schema::isSigned(declared.type) && isNumber) {
    value.scalar = static_cast<std::int64_t>(std::get<std::uint64_t>(given.scalar));
  }
  value.type = declared.type;
  return value;
}

}  // namespace

void followChanges(const Server& server, const std::function<bool(std::string_view line)>& take) {
  HttpClient http(server);
  const HttpReply reply = http.follow("/watch", take);
  if (reply.status == 405 || reply.status == 404) {
    throw Failure(ExitCode::Failed, server.url.shown() + " does not report changes",
                  "zorvacimd does; other CIM servers do not");
  }
  requireSuccess(server.url, reply);
}

RemoteOperations::RemoteOperations(const Server& server, std::shared_ptr<const schema::ClassRepository> classes)
    : server_(server.url), classes_(std::move(classes)), served_(broker::ProviderRegistry::builtIn()), http_(server) {}

RemoteOperations::~RemoteOperations() = default;

std::string RemoteOperations::nameSpaceOr(std::string_view given) const {
  return given.empty() ? server_.nameSpace : std::string(given);
}

CimResponse RemoteOperations::ask(std::string_view operation, const std::string& object, const std::string& message) {
  const HttpReply reply =
      http_.post({"Content-Type: application/xml; charset=\"utf-8\"", "Accept: application/xml, text/xml",
                  "TE: trailers", "Expect:", "CIMOperation: MethodCall", "CIMMethod: " + fieldValue(operation),
                  "CIMObject: " + fieldValue(object)},
                 message);
  requireSuccess(server_, reply);
  const broker::Status late = lateStatus(reply);
  if (!late.ok()) return failedResponse(server_, reply, late, *classes_);
  Expected<CimResponse, cimxml::ResponseError> response = cimxml::readResponse(reply.body, *classes_);
  if (response) return std::move(*response);
  throw Failure(ExitCode::Failed,
                "the answer of the server is no CIM-XML response: " + printable(response.error().message),
                "does --url name a CIM server (CIM-XML over HTTP, DSP0200)?");
}

broker::Status RemoteOperations::handOut(CimResponse response, const std::string& nameSpace,
                                         const broker::InstanceSink& sink) const {
  for (broker::Instance& instance : response.instances) {
    if (instance.path.nameSpace.empty()) instance.path.nameSpace = nameSpace;
    if (!sink(instance)) break;
  }
  return response.status;
}

broker::Status RemoteOperations::handOut(CimResponse response, const std::string& nameSpace,
                                         const broker::PathSink& sink) const {
  for (broker::ObjectPath& path : response.paths) {
    if (path.nameSpace.empty()) path.nameSpace = nameSpace;
    if (!sink(path)) break;
  }
  return response.status;
}

broker::Status RemoteOperations::enumerateInstances(std::string_view nameSpace, std::string_view className,
                                                    const broker::Selection& selection,
                                                    const broker::InstanceSink& sink) {
  const std::string in = nameSpaceOr(nameSpace);
  IntrinsicCall call("EnumerateInstances", in);
  call.className("ClassName", className).boolean("LocalOnly", selection.localOnly);
  call.boolean("DeepInheritance", selection.deepInheritance).propertyList(selection.propertyList);
  return handOut(ask("EnumerateInstances", in, call.message()), in, sink);
}

broker::Status RemoteOperations::enumerateInstanceNames(std::string_view nameSpace, std::string_view className,
                                                        const broker::PathSink& sink) {
  const std::string in = nameSpaceOr(nameSpace);
  IntrinsicCall call("EnumerateInstanceNames", in);
  call.className("ClassName", className);
  return handOut(ask("EnumerateInstanceNames", in, call.message()), in, sink);
}

Expected<broker::Instance, broker::Status> RemoteOperations::getInstance(const broker::ObjectPath& path,
                                                                         const broker::Selection& selection) {
  const std::string in = nameSpaceOr(path.nameSpace);
  IntrinsicCall call("GetInstance", in);
  call.instanceName("InstanceName", path)
      .boolean("LocalOnly", selection.localOnly)
      .propertyList(selection.propertyList);
  CimResponse response = ask("GetInstance", in, call.message());
  if (!response.status.ok()) return unexpected(std::move(response.status));
  if (response.instances.empty()) return unexpected(broker::Status{6, "the server gave no instance"});
  broker::Instance instance = std::move(response.instances.front());
  // The response does not repeat the requested name.
  const std::string className = instance.path.className;
  instance.path = path;
  instance.path.className = className;
  instance.path.nameSpace = in;
  return instance;
}

broker::Status RemoteOperations::modifyInstance(const broker::Instance& instance,
                                                const std::optional<std::vector<std::string>>& propertyList) {
  const std::string in = nameSpaceOr(instance.path.nameSpace);
  IntrinsicCall call("ModifyInstance", in);
  call.modifiedInstance(instance).propertyList(propertyList);
  return ask("ModifyInstance", in, call.message()).status;
}

broker::Status RemoteOperations::associators(const broker::ObjectPath& path, const broker::AssociationFilter& filter,
                                             const broker::Selection& selection, const broker::InstanceSink& sink) {
  const std::string in = nameSpaceOr(path.nameSpace);
  IntrinsicCall call("Associators", in);
  call.instanceName("ObjectName", path).className("AssocClass", filter.associationClass);
  call.className("ResultClass", filter.resultClass).text("Role", filter.role).text("ResultRole", filter.resultRole);
  call.propertyList(selection.propertyList);
  return handOut(ask("Associators", in, call.message()), in, sink);
}

broker::Status RemoteOperations::associatorNames(const broker::ObjectPath& path,
                                                 const broker::AssociationFilter& filter,
                                                 const broker::PathSink& sink) {
  const std::string in = nameSpaceOr(path.nameSpace);
  IntrinsicCall call("AssociatorNames", in);
  call.instanceName("ObjectName", path).className("AssocClass", filter.associationClass);
  call.className("ResultClass", filter.resultClass).text("Role", filter.role).text("ResultRole", filter.resultRole);
  return handOut(ask("AssociatorNames", in, call.message()), in, sink);
}

broker::Status RemoteOperations::references(const broker::ObjectPath& path, const broker::AssociationFilter& filter,
                                            const broker::Selection& selection, const broker::InstanceSink& sink) {
  const std::string in = nameSpaceOr(path.nameSpace);
  IntrinsicCall call("References", in);
  call.instanceName("ObjectName", path).className("ResultClass", filter.associationClass).text("Role", filter.role);
  call.propertyList(selection.propertyList);
  return handOut(ask("References", in, call.message()), in, sink);
}

broker::Status RemoteOperations::referenceNames(const broker::ObjectPath& path, const broker::AssociationFilter& filter,
                                                const broker::PathSink& sink) {
  const std::string in = nameSpaceOr(path.nameSpace);
  IntrinsicCall call("ReferenceNames", in);
  call.instanceName("ObjectName", path).className("ResultClass", filter.associationClass).text("Role", filter.role);
  return handOut(ask("ReferenceNames", in, call.message()), in, sink);
}

Expected<broker::MethodResult, broker::Status> RemoteOperations::invokeMethod(
    const broker::ObjectPath& path, std::string_view method, const std::vector<broker::NamedValue>& input) {
  broker::ObjectPath object = path;
  object.host.clear();
  object.nameSpace = nameSpaceOr(path.nameSpace);
  CimResponse response = ask(method, broker::pathText(object), cimxml::methodCall(object, method, input));
  if (!response.status.ok()) return unexpected(std::move(response.status));
  return std::move(response.method);
}

Expected<broker::ObjectPath, broker::Status> RemoteOperations::canonicalPath(const broker::ObjectPath& path) {
  const schema::Class* declared = classNamed(path.className);
  if (declared == nullptr) return unexpected(broker::Status{5, "there is no class " + path.className});
  broker::ObjectPath canonical = path;
  canonical.nameSpace = nameSpaceOr(path.nameSpace);
  canonical.className = declared->name();
  canonical.keys.clear();
  for (const schema::ClassProperty* key : declared->keys()) {
    const broker::Value* given = path.key(key->name);
    if (given == nullptr) continue;
    const std::optional<broker::Value> value = keyValue(*given, *key);
    if (!value) return unexpected(broker::Status{4, declared->name() + "." + key->name + ": its value is no path"});
    canonical.keys.push_back({key->name, *value});
  }
  for (const broker::NamedValue& key : path.keys) {
    if (canonical.key(key.name) == nullptr) {
      return unexpected(broker::Status{4, declared->name() + " has no key " + key.name});
    }
  }
  return canonical;
}

const schema::Class* RemoteOperations::classNamed(std::string_view name) {
  if (const schema::Class* known = classes_->find(name)) return known;
  auto fetched = fetched_.find(std::string(name));
  if (fetched == fetched_.end()) {
    IntrinsicCall call("GetClass", server_.nameSpace);
    call.className("ClassName", name).boolean("LocalOnly", false).boolean("IncludeQualifiers", true);
    CimResponse response = ask("GetClass", server_.nameSpace, call.message());
    fetched = fetched_.emplace(name, nullptr).first;
    if (response.status.ok() && !response.classes.empty()) {
      fetched->second = repositoryOf(std::move(response.classes.front()), *classes_);
    }
  }
  return fetched->second == nullptr ? nullptr : fetched->second->find(name);
}

}  // namespace zorva::cli
