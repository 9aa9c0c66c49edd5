#include "cimxml/RequestReader.h"

#include "cimxml/ElementReader.h"
#include "cimxml/XmlTree.h"
#include "util/Names.h"

namespace zorva::cimxml {

namespace {

using pugi::xml_node;

TextList readTexts(xml_node node, ElementReader& reader) {
  TextList texts;
  Count count(reader.reading().limits.values, "values");
  for (const xml_node child : node.children()) {
    if (!isElement(child)) continue;
    reader.reading().step();
    count.add(child, node);
    if (is(child, "VALUE")) texts.emplace_back(reader.content(child));
    if (is(child, "VALUE.NULL")) texts.emplace_back();
  }
  return texts;
}

ParameterValue readParameterValue(xml_node node, ElementReader& reader) {
  const xml_node value = firstOf(node, {"VALUE", "VALUE.ARRAY", "VALUE.REFERENCE", "CLASSNAME", "INSTANCENAME",
                                        "INSTANCE", "VALUE.NAMEDINSTANCE", "CLASS", "QUALIFIER.DECLARATION"});
  if (!value) return {};
  if (is(value, "VALUE")) return reader.content(value);
  if (is(value, "VALUE.ARRAY")) return readTexts(value, reader);
  if (is(value, "CLASSNAME")) return ClassName{std::string(reader.attribute(value, "NAME"))};
  if (is(value, "INSTANCENAME")) return reader.path(value);
  if (is(value, "VALUE.REFERENCE")) return reader.reference(value);
  if (is(value, "INSTANCE")) return reader.instance(value);
  if (!is(value, "VALUE.NAMEDINSTANCE")) return Declaration{};
  broker::Instance instance = reader.instance(required(value, {"INSTANCE"}));
  const std::string madeOf = instance.path.className;
  reader.instanceName(required(value, {"INSTANCENAME"}), instance.path);
  if (!util::sameName(madeOf, instance.path.className)) {
    refuse(value, "INSTANCENAME and INSTANCE are of the classes " + quoted(instance.path.className) + " and " +
                      quoted(madeOf));
  }
  return instance;
}

void readIntrinsic(xml_node node, ElementReader& reader, Call& call) {
  call.name = reader.attribute(node, "NAME");
  call.target.nameSpace = reader.nameSpace(required(node, {"LOCALNAMESPACEPATH"}));
  Count count(reader.reading().limits.parameters, "parameters");
  for (const xml_node child : node.children("IPARAMVALUE")) {
    count.add(child, node);
    call.parameters.push_back({std::string(reader.attribute(child, "NAME")), readParameterValue(child, reader)});
  }
}

broker::Value readArgument(xml_node node, ElementReader& reader) {
  const ValueKind kind = reader.kindOf(node, "PARAMTYPE");
  const xml_node value = firstOf(node, {"VALUE", "VALUE.ARRAY", "VALUE.REFERENCE", "VALUE.REFARRAY", "CLASSNAME",
                                        "INSTANCENAME", "CLASS", "INSTANCE", "VALUE.NAMEDINSTANCE"});
  if (!value) return broker::Value::null(kind.type);
  if (is(value, "INSTANCENAME")) return broker::Value::reference(reader.path(value));
  if (is(value, "INSTANCE")) {
    broker::Value instance = broker::Value::null(schema::Type::String);
    instance.isNull = false;
    instance.scalar = broker::Boxed<broker::Instance>(reader.instance(value));
    return instance;
  }
  if (isOneOf(value, {"CLASSNAME", "CLASS", "VALUE.NAMEDINSTANCE"})) {
    refuse(value, std::string(value.name()) + " is no value that a method takes");
  }
  return reader.value(value, kind);
}

/// The type that PARAMTYPE names; nothing if it is missing.
std::optional<schema::Type> saidType(xml_node node, const ElementReader& reader) {
  if (!node.attribute("PARAMTYPE")) return std::nullopt;
  return reader.typeOf(node, "PARAMTYPE");
}

void readExtrinsic(xml_node node, ElementReader& reader, Call& call) {
  call.isExtrinsic = true;
  call.name = reader.attribute(node, "NAME");
  const xml_node target = required(node, {"LOCALINSTANCEPATH", "LOCALCLASSPATH"});
  call.target = reader.path(target);
  call.onClass = is(target, "LOCALCLASSPATH");
  Count count(reader.reading().limits.parameters, "parameters");
  for (const xml_node child : node.children("PARAMVALUE")) {
    count.add(child, node);
    call.input.push_back({std::string(reader.attribute(child, "NAME")), readArgument(child, reader)});
    call.saidTypes.push_back(saidType(child, reader));
  }
}

Call readCall(xml_node simple, ElementReader& reader) {
  Call call;
  const xml_node node = required(simple, {"IMETHODCALL", "METHODCALL"});
  if (is(node, "IMETHODCALL")) {
    readIntrinsic(node, reader, call);
  } else {
    readExtrinsic(node, reader, call);
  }
  return call;
}

void checkVersion(xml_node node, ElementReader& reader, const char* name, std::string_view major, Fault fault) {
  const std::string_view version = reader.attribute(node, name);
  if (version.starts_with(major) && version.size() > major.size()) return;
  refuse(node, std::string(name) + " is " + quoted(version) + ", where " + std::string(major) + "x is taken", fault);
}

void readMessage(xml_node message, ElementReader& reader, CimRequest& request) {
  request.id = reader.attribute(message, "ID");
  checkVersion(message, reader, "PROTOCOLVERSION", "1.", Fault::UnsupportedProtocolVersion);
  if (firstOf(message, {"SIMPLEEXPREQ", "MULTIEXPREQ"})) {
    refuse(message, "indications are not taken here", Fault::UnsupportedOperation);
  }
  const xml_node body = required(message, {"SIMPLEREQ", "MULTIREQ"});
  request.isMultiple = is(body, "MULTIREQ");
  if (!request.isMultiple) {
    request.calls.push_back(readCall(body, reader));
    return;
  }
  Count count(reader.reading().limits.calls, "requests");
  for (const xml_node simple : body.children("SIMPLEREQ")) {
    count.add(simple, body);
    request.calls.push_back(readCall(simple, reader));
  }
  if (request.calls.size() < 2) refuse(body, "MULTIREQ has fewer than two SIMPLEREQs");
}

}  // namespace

Expected<CimRequest, RequestError> readRequest(std::string_view text, const ReaderLimits& limits) {
  std::string buffer;
  pugi::xml_document document;
  ElementReader reader(limits);
  try {
    parse(text, reader.reading(), buffer, document);
    const xml_node root = document.document_element();
    if (!is(root, "CIM")) refuse(root, "the root element is " + elementName(root) + ", where CIM is taken");
    checkVersion(root, reader, "CIMVERSION", "2.", Fault::UnsupportedCimVersion);
    checkVersion(root, reader, "DTDVERSION", "2.", Fault::UnsupportedDtdVersion);
    CimRequest request;
    readMessage(required(root, {"MESSAGE"}), reader, request);
    return request;
  } catch (Refusal& refusal) {
    if (refusal.position < 0) return unexpected(RequestError{refusal.fault, std::move(refusal.message)});
    const auto position = static_cast<std::size_t>(refusal.position);
    return unexpected(RequestError{refusal.fault, placeText(text, position) + ": " + refusal.message});
  }
}

}  // namespace zorva::cimxml
