#include "cimxml/RequestReader.h"

#include <algorithm>
#include <charconv>
#include <cstring>
#include <pugixml.hpp>

#include "schema/Names.h"
#include "schema/Utf8.h"

namespace zorva::cimxml {

namespace {

using pugi::xml_node;

// How deep embedded instances may lie within one another, each a text of its own within the other's.
constexpr int kDeepestEmbedded = 8;
// More attributes on an element than this are no request; it bounds the search for duplicates.
constexpr std::size_t kMostAttributes = 32;

/// Leaves the reading; readRequest makes a RequestError of it.
struct Refusal {
  Fault fault;
  std::ptrdiff_t position;  ///< in bytes; negative: unknown
  std::string message;
};

[[noreturn]] void refuse(xml_node node, std::string message, Fault fault = Fault::NotLooselyValid) {
  throw Refusal{fault, node.offset_debug(), std::move(message)};
}

bool is(xml_node node, const char* name) noexcept { return std::strcmp(node.name(), name) == 0; }

bool isElement(xml_node node) noexcept { return node.type() == pugi::node_element; }

/// Whether the name of the element is one of several.
bool isOneOf(xml_node node, std::initializer_list<const char*> names) noexcept {
  return std::any_of(names.begin(), names.end(), [node](const char* name) { return is(node, name); });
}

std::string quoted(std::string_view text) {
  return "\"" + std::string(text.substr(0, schema::utf8Cut(text, 80))) + "\"";
}

std::string elementName(xml_node node) { return node ? node.name() : "nothing"; }

/// The value of an attribute that must be there.
std::string_view attribute(xml_node node, const char* name) {
  const pugi::xml_attribute found = node.attribute(name);
  if (!found) refuse(node, std::string(node.name()) + " lacks the attribute " + name);
  return found.value();
}

/// The first child element of one of these names; an element that is none of them is passed over.
xml_node firstOf(xml_node node, std::initializer_list<const char*> names) {
  for (const xml_node child : node.children()) {
    if (isElement(child) && isOneOf(child, names)) return child;
  }
  return {};
}

xml_node required(xml_node node, std::initializer_list<const char*> names) {
  const xml_node found = firstOf(node, names);
  if (found) return found;
  std::string wanted;
  for (const char* name : names) wanted += (wanted.empty() ? "" : " or ") + std::string(name);
  refuse(node, std::string(node.name()) + " has no " + wanted);
}

/// The text of an element, put together from its pieces.
std::string contentOf(xml_node node) {
  std::string text;
  for (const xml_node child : node.children()) {
    if (child.type() == pugi::node_pcdata || child.type() == pugi::node_cdata) text += child.value();
    if (isElement(child)) refuse(child, std::string(child.name()) + " within " + node.name() + ", which holds text");
  }
  return text;
}

std::string_view trimmed(std::string_view text) noexcept {
  constexpr std::string_view kBlanks = " \t\r\n";
  const std::size_t begin = text.find_first_not_of(kBlanks);
  if (begin == std::string_view::npos) return {};
  return text.substr(begin, text.find_last_not_of(kBlanks) - begin + 1);
}

/// Parses a text that is known to be within the limits. `document` refers to `buffer`.
void parse(std::string_view text, const XmlLimits& limits, std::string& buffer, pugi::xml_document& document) {
  if (auto problem = checkXml(text, limits)) {
    throw Refusal{Fault::NotWellFormed, static_cast<std::ptrdiff_t>(problem->position), std::move(problem->message)};
  }
  buffer.assign(text);
  constexpr unsigned kFlags = pugi::parse_cdata | pugi::parse_escapes | pugi::parse_eol | pugi::parse_wconv_attribute |
                              pugi::parse_ws_pcdata_single;
  const pugi::xml_parse_result result =
      document.load_buffer_inplace(buffer.data(), buffer.size(), kFlags, pugi::encoding_utf8);
  if (!result) throw Refusal{Fault::NotWellFormed, result.offset, result.description()};
}

/// XML wants each attribute of an element to have a name of its own.
void checkAttributes(xml_node node) {
  std::size_t count = 0;
  for (const pugi::xml_attribute one : node.attributes()) {
    if (++count > kMostAttributes) refuse(node, std::string(node.name()) + " has too many attributes");
    for (pugi::xml_attribute other = one.next_attribute(); other; other = other.next_attribute()) {
      if (std::strcmp(one.name(), other.name()) == 0) {
        refuse(node, std::string(node.name()) + " has the attribute " + one.name() + " twice", Fault::NotWellFormed);
      }
    }
  }
}

class AttributeWalk : public pugi::xml_tree_walker {
 public:
  bool for_each(xml_node& node) override {
    checkAttributes(node);
    return true;
  }
};

broker::Instance readInstance(xml_node node, const XmlLimits& limits, int nesting);
broker::ObjectPath readReference(xml_node node);

/// The instance whose element stands, as text, in a value (DSP0201 5.3.2). Empty texts are null.
broker::Scalar readEmbedded(xml_node place, const std::string& text, const XmlLimits& limits, int nesting) {
  if (trimmed(text).empty()) return {};
  if (nesting >= kDeepestEmbedded) {
    refuse(place, "instances embedded deeper than " + std::to_string(kDeepestEmbedded));
  }
  std::string buffer;
  pugi::xml_document document;
  try {
    parse(text, limits, buffer, document);
    const xml_node root = document.document_element();
    if (!is(root, "INSTANCE")) {
      refuse(place, "the embedded object is " + elementName(root) + ", where INSTANCE is taken");
    }
    return broker::Boxed<broker::Instance>(readInstance(root, limits, nesting + 1));
  } catch (Refusal& inner) {
    refuse(place, "in the embedded instance: " + inner.message, inner.fault);
  }
}

/// What the elements around a value say about it.
struct ValueKind {
  schema::Type type = schema::Type::String;
  bool isEmbedded = false;
};

schema::Type typeOf(xml_node node, const char* name) {
  const pugi::xml_attribute said = node.attribute(name);
  if (!said) return schema::Type::String;
  const std::string_view text = said.value();
  if (text == "reference") return schema::Type::Reference;
  if (text == "object" || text == "instance") return schema::Type::String;
  const auto type = schema::typeFromName(text);
  if (!type) refuse(node, quoted(text) + " is no CIM type");
  return *type;
}

ValueKind kindOf(xml_node node, const char* typeAttribute) {
  ValueKind kind{typeOf(node, typeAttribute), false};
  // The attribute is known in two spellings (DSP0201 5.2.5.7).
  const std::string_view type = node.attribute(typeAttribute).value();
  kind.isEmbedded =
      node.attribute("EmbeddedObject") || node.attribute("EMBEDDEDOBJECT") || type == "object" || type == "instance";
  return kind;
}

/// A number in one of the bases that DSP0201 5.3.1 knows beside ten; else the text itself, for the broker to convert.
broker::Scalar numberOf(std::string_view text) {
  std::uint64_t number = 0;
  if (text.size() > 2 && text[0] == '0' && (text[1] == 'x' || text[1] == 'X')) {
    const auto result = std::from_chars(text.data() + 2, text.data() + text.size(), number, 16);
    if (result.ec == std::errc() && result.ptr == text.data() + text.size()) return number;
  }
  return std::string(text);
}

broker::Scalar scalarOf(xml_node place, std::string text, const ValueKind& kind, const XmlLimits& limits, int nesting) {
  if (kind.isEmbedded) return readEmbedded(place, text, limits, nesting);
  switch (kind.type) {
    case schema::Type::String:
      return text;
    case schema::Type::Char16: {
      const std::size_t length = schema::utf8Length(text);
      const std::uint32_t code = length == 0 ? 0 : schema::utf8Decode(text);
      if (length == 0 || length != text.size() || code > 0xFFFF) refuse(place, quoted(text) + " is no char16");
      return static_cast<char16_t>(code);
    }
    case schema::Type::DateTime:
    case schema::Type::Boolean:
      return std::string(trimmed(text));
    default:
      return numberOf(trimmed(text));
  }
}

/// VALUE, VALUE.ARRAY, VALUE.REFERENCE or VALUE.REFARRAY.
broker::Value readValue(xml_node node, const ValueKind& kind, const XmlLimits& limits, int nesting) {
  broker::Value value = broker::Value::null(kind.type);
  value.isNull = false;
  if (is(node, "VALUE")) {
    value.scalar = scalarOf(node, contentOf(node), kind, limits, nesting);
    value.isNull = std::holds_alternative<std::monostate>(value.scalar);
    return value;
  }
  if (is(node, "VALUE.REFERENCE")) return broker::Value::reference(readReference(node));
  value.isArray = true;
  if (is(node, "VALUE.REFARRAY")) value.type = schema::Type::Reference;
  for (const xml_node child : node.children()) {
    if (!isElement(child)) continue;
    if (is(child, "VALUE.NULL")) {
      value.elements.emplace_back();
    } else if (is(child, "VALUE") && is(node, "VALUE.ARRAY")) {
      value.elements.push_back(scalarOf(child, contentOf(child), kind, limits, nesting));
    } else if (is(child, "VALUE.REFERENCE") && is(node, "VALUE.REFARRAY")) {
      value.elements.emplace_back(broker::Boxed<broker::ObjectPath>(readReference(child)));
    } else {
      refuse(child, std::string(child.name()) + " within " + node.name());
    }
  }
  return value;
}

std::string readNamespace(xml_node node) {
  std::string path;
  for (const xml_node part : node.children("NAMESPACE")) {
    if (!path.empty()) path += '/';
    path += attribute(part, "NAME");
  }
  if (path.empty()) refuse(node, "LOCALNAMESPACEPATH names no namespace");
  return path;
}

broker::Value readKeyValue(xml_node node) {
  const std::string_view told = node.attribute("VALUETYPE").value();
  ValueKind kind{typeOf(node, "TYPE"), false};
  std::string text = contentOf(node);
  if (!node.attribute("TYPE") && told == "boolean") kind.type = schema::Type::Boolean;
  if (!node.attribute("TYPE") && told == "numeric") {
    kind.type = trimmed(text).starts_with('-') ? schema::Type::Sint64 : schema::Type::Uint64;
  }
  if (!told.empty() && told != "boolean" && told != "numeric" && told != "string") {
    refuse(node, "VALUETYPE is " + quoted(told) + ", where string, boolean or numeric is taken");
  }
  broker::Value value = broker::Value::null(kind.type);
  value.isNull = false;
  value.scalar = scalarOf(node, std::move(text), kind, {}, 0);
  return value;
}

void readInstanceName(xml_node node, broker::ObjectPath& path) {
  path.className = attribute(node, "CLASSNAME");
  for (const xml_node child : node.children()) {
    if (!isElement(child)) continue;
    if (is(child, "KEYBINDING")) {
      const xml_node value = required(child, {"KEYVALUE", "VALUE.REFERENCE"});
      std::string name(attribute(child, "NAME"));
      if (path.key(name) != nullptr) refuse(child, "the key " + quoted(name) + " stands twice");
      path.keys.push_back({std::move(name), is(value, "KEYVALUE") ? readKeyValue(value)
                                                                  : broker::Value::reference(readReference(value))});
    } else if (is(child, "KEYVALUE") && path.keys.empty()) {
      path.keys.push_back({"", readKeyValue(child)});
    } else if (is(child, "VALUE.REFERENCE") && path.keys.empty()) {
      path.keys.push_back({"", broker::Value::reference(readReference(child))});
    }
  }
}

void readNamespacePath(xml_node node, broker::ObjectPath& path) {
  path.host = trimmed(contentOf(required(node, {"HOST"})));
  path.nameSpace = readNamespace(required(node, {"LOCALNAMESPACEPATH"}));
}

/// INSTANCENAME, LOCALINSTANCEPATH, INSTANCEPATH, and the same of a class.
broker::ObjectPath readPath(xml_node node) {
  broker::ObjectPath path;
  if (is(node, "INSTANCENAME")) {
    readInstanceName(node, path);
    return path;
  }
  if (is(node, "CLASSNAME")) {
    path.className = attribute(node, "NAME");
    return path;
  }
  if (isOneOf(node, {"LOCALINSTANCEPATH", "LOCALCLASSPATH"})) {
    path.nameSpace = readNamespace(required(node, {"LOCALNAMESPACEPATH"}));
  } else {
    readNamespacePath(required(node, {"NAMESPACEPATH"}), path);
  }
  if (isOneOf(node, {"LOCALCLASSPATH", "CLASSPATH"})) {
    path.className = attribute(required(node, {"CLASSNAME"}), "NAME");
  } else {
    readInstanceName(required(node, {"INSTANCENAME"}), path);
  }
  return path;
}

broker::ObjectPath readReference(xml_node node) {
  return readPath(required(
      node, {"INSTANCENAME", "LOCALINSTANCEPATH", "INSTANCEPATH", "CLASSNAME", "LOCALCLASSPATH", "CLASSPATH"}));
}

broker::Property readProperty(xml_node node, const XmlLimits& limits, int nesting) {
  const bool isReference = is(node, "PROPERTY.REFERENCE");
  const bool isArray = is(node, "PROPERTY.ARRAY");
  const ValueKind kind = isReference ? ValueKind{schema::Type::Reference, false} : kindOf(node, "TYPE");
  const char* const wanted = isReference ? "VALUE.REFERENCE" : isArray ? "VALUE.ARRAY" : "VALUE";
  broker::Property property;
  property.name = attribute(node, "NAME");
  const xml_node value = firstOf(node, {wanted});
  property.value = value ? readValue(value, kind, limits, nesting) : broker::Value::null(kind.type, isArray);
  return property;
}

broker::Instance readInstance(xml_node node, const XmlLimits& limits, int nesting) {
  broker::Instance instance;
  instance.path.className = attribute(node, "CLASSNAME");
  for (const xml_node child : node.children()) {
    if (!isElement(child) || !isOneOf(child, {"PROPERTY", "PROPERTY.ARRAY", "PROPERTY.REFERENCE"})) continue;
    broker::Property property = readProperty(child, limits, nesting);
    if (instance.property(property.name) != nullptr) {
      refuse(child, "the property " + quoted(property.name) + " stands twice");
    }
    instance.properties.push_back(std::move(property));
  }
  return instance;
}

TextList readTexts(xml_node node) {
  TextList texts;
  for (const xml_node child : node.children()) {
    if (is(child, "VALUE")) texts.emplace_back(contentOf(child));
    if (is(child, "VALUE.NULL")) texts.emplace_back();
  }
  return texts;
}

ParameterValue readParameterValue(xml_node node, const XmlLimits& limits) {
  const xml_node value = firstOf(node, {"VALUE", "VALUE.ARRAY", "VALUE.REFERENCE", "CLASSNAME", "INSTANCENAME",
                                        "INSTANCE", "VALUE.NAMEDINSTANCE", "CLASS", "QUALIFIER.DECLARATION"});
  if (!value) return {};
  if (is(value, "VALUE")) return contentOf(value);
  if (is(value, "VALUE.ARRAY")) return readTexts(value);
  if (is(value, "CLASSNAME")) return ClassName{std::string(attribute(value, "NAME"))};
  if (is(value, "INSTANCENAME")) return readPath(value);
  if (is(value, "VALUE.REFERENCE")) return readReference(value);
  if (is(value, "INSTANCE")) return readInstance(value, limits, 0);
  if (!is(value, "VALUE.NAMEDINSTANCE")) return Declaration{};
  broker::Instance instance = readInstance(required(value, {"INSTANCE"}), limits, 0);
  const std::string madeOf = instance.path.className;
  readInstanceName(required(value, {"INSTANCENAME"}), instance.path);
  if (!schema::sameName(madeOf, instance.path.className)) {
    refuse(value, "INSTANCENAME and INSTANCE are of the classes " + quoted(instance.path.className) + " and " +
                      quoted(madeOf));
  }
  return instance;
}

void readIntrinsic(xml_node node, const XmlLimits& limits, Call& call) {
  call.name = attribute(node, "NAME");
  call.target.nameSpace = readNamespace(required(node, {"LOCALNAMESPACEPATH"}));
  for (const xml_node child : node.children("IPARAMVALUE")) {
    Parameter parameter{std::string(attribute(child, "NAME")), readParameterValue(child, limits)};
    const auto same = [&](const Parameter& other) { return schema::sameName(other.name, parameter.name); };
    if (std::any_of(call.parameters.begin(), call.parameters.end(), same)) {
      refuse(child, "the parameter " + quoted(parameter.name) + " stands twice");
    }
    call.parameters.push_back(std::move(parameter));
  }
}

broker::Value readArgument(xml_node node, const XmlLimits& limits) {
  const ValueKind kind = kindOf(node, "PARAMTYPE");
  const xml_node value = firstOf(node, {"VALUE", "VALUE.ARRAY", "VALUE.REFERENCE", "VALUE.REFARRAY", "CLASSNAME",
                                        "INSTANCENAME", "CLASS", "INSTANCE", "VALUE.NAMEDINSTANCE"});
  if (!value) return broker::Value::null(kind.type);
  if (is(value, "INSTANCENAME")) return broker::Value::reference(readPath(value));
  if (is(value, "INSTANCE")) {
    broker::Value instance = broker::Value::null(schema::Type::String);
    instance.isNull = false;
    instance.scalar = broker::Boxed<broker::Instance>(readInstance(value, limits, 0));
    return instance;
  }
  if (isOneOf(value, {"CLASSNAME", "CLASS", "VALUE.NAMEDINSTANCE"})) {
    refuse(value, std::string(value.name()) + " is no value that a method takes");
  }
  return readValue(value, kind, limits, 0);
}

void readExtrinsic(xml_node node, const XmlLimits& limits, Call& call) {
  call.isExtrinsic = true;
  call.name = attribute(node, "NAME");
  const xml_node target = required(node, {"LOCALINSTANCEPATH", "LOCALCLASSPATH"});
  call.target = readPath(target);
  call.onClass = is(target, "LOCALCLASSPATH");
  for (const xml_node child : node.children("PARAMVALUE")) {
    broker::NamedValue argument{std::string(attribute(child, "NAME")), readArgument(child, limits)};
    const auto same = [&](const broker::NamedValue& other) { return schema::sameName(other.name, argument.name); };
    if (std::any_of(call.input.begin(), call.input.end(), same)) {
      refuse(child, "the parameter " + quoted(argument.name) + " stands twice");
    }
    call.input.push_back(std::move(argument));
  }
}

Call readCall(xml_node simple, const XmlLimits& limits) {
  Call call;
  const xml_node node = required(simple, {"IMETHODCALL", "METHODCALL"});
  if (is(node, "IMETHODCALL")) {
    readIntrinsic(node, limits, call);
  } else {
    readExtrinsic(node, limits, call);
  }
  return call;
}

void checkVersion(xml_node node, const char* name, std::string_view major, Fault fault) {
  const std::string_view version = attribute(node, name);
  if (version.starts_with(major) && version.size() > major.size()) return;
  refuse(node, std::string(name) + " is " + quoted(version) + ", where " + std::string(major) + "x is taken", fault);
}

void readMessage(xml_node message, const ReaderLimits& limits, CimRequest& request) {
  request.id = attribute(message, "ID");
  checkVersion(message, "PROTOCOLVERSION", "1.", Fault::UnsupportedProtocolVersion);
  if (firstOf(message, {"SIMPLEEXPREQ", "MULTIEXPREQ"})) {
    refuse(message, "indications are not taken here", Fault::UnsupportedOperation);
  }
  const xml_node body = required(message, {"SIMPLEREQ", "MULTIREQ"});
  request.isMultiple = is(body, "MULTIREQ");
  request.calls.clear();
  if (!request.isMultiple) {
    request.calls.push_back(readCall(body, limits.xml));
    return;
  }
  for (const xml_node simple : body.children("SIMPLEREQ")) {
    if (request.calls.size() == limits.calls) {
      refuse(simple, "more than " + std::to_string(limits.calls) + " requests in one MULTIREQ");
    }
    request.calls.push_back(readCall(simple, limits.xml));
  }
  if (request.calls.size() < 2) refuse(body, "MULTIREQ has fewer than two SIMPLEREQs");
}

}  // namespace

std::optional<RequestError> readRequest(std::string_view text, const ReaderLimits& limits, CimRequest& request) {
  std::string buffer;
  pugi::xml_document document;
  try {
    parse(text, limits.xml, buffer, document);
    AttributeWalk walk;
    document.traverse(walk);
    const xml_node root = document.document_element();
    if (!is(root, "CIM")) refuse(root, "the root element is " + elementName(root) + ", where CIM is taken");
    checkVersion(root, "CIMVERSION", "2.", Fault::UnsupportedCimVersion);
    checkVersion(root, "DTDVERSION", "2.", Fault::UnsupportedDtdVersion);
    readMessage(required(root, {"MESSAGE"}), limits, request);
  } catch (Refusal& refusal) {
    if (refusal.position < 0) return RequestError{refusal.fault, std::move(refusal.message)};
    const auto position = static_cast<std::size_t>(refusal.position);
    return RequestError{refusal.fault, placeText(text, position) + ": " + refusal.message};
  }
  return std::nullopt;
}

}  // namespace zorva::cimxml
