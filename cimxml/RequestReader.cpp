#include "cimxml/RequestReader.h"

#include <algorithm>
#include <charconv>
#include <cstring>
#include <pugixml.hpp>
#include <set>

#include "schema/Names.h"
#include "schema/Utf8.h"

namespace zorva::cimxml {

namespace {

using pugi::xml_node;

// How deep embedded instances may lie within one another, each a text of its own within the other's.
constexpr int kDeepestEmbedded = 8;
// After so many steps the reader asks whether its time is over.
constexpr unsigned kStepsBetweenLooks = 256;

/// Leaves the reading; readRequest makes a RequestError of it.
struct Refusal {
  Fault fault;
  std::ptrdiff_t position;  ///< in bytes; negative: unknown
  std::string message;
};

[[noreturn]] void refuse(xml_node node, std::string message, Fault fault = Fault::NotLooselyValid) {
  throw Refusal{fault, node.offset_debug(), std::move(message)};
}

/// What holds for the reading of one request, embedded instances included.
class Reading {
 public:
  explicit Reading(const ReaderLimits& most) : limits(most) {}

  /// To be called for each element, so that the reading ends soon after its time is over.
  void step() {
    if (++steps_ % kStepsBetweenLooks != 0 || !limits.xml.isOver || !limits.xml.isOver()) return;
    throw Refusal{Fault::TimeIsOver, -1, kTimeIsOver};
  }

  const ReaderLimits& limits;

 private:
  unsigned steps_ = 0;
};

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

/// Counts what an element repeats, and refuses one too many.
class Count {
 public:
  Count(std::size_t most, const char* what) : most_(most), what_(what) {}

  /// `node` is one more, within `outer`.
  void add(xml_node node, xml_node outer) {
    if (++count_ <= most_) return;
    refuse(node, std::string(outer.name()) + " has more than " + std::to_string(most_) + " " + what_);
  }

 private:
  const std::size_t most_;
  const char* const what_;
  std::size_t count_ = 0;
};

/// Names that may stand only once in one element.
class UniqueNames {
 public:
  /// `name` lives as long as this.
  void add(xml_node node, const char* what, std::string_view name) {
    if (!names_.insert(name).second) refuse(node, std::string("the ") + what + " " + quoted(name) + " stands twice");
  }

 private:
  // An order, not a hash: whoever knows the hash could choose names that collide.
  std::set<std::string_view, schema::NameLess> names_;
};

/// The value of an attribute that must be there.
std::string_view attribute(const Reading& reading, xml_node node, const char* name) {
  const pugi::xml_attribute found = node.attribute(name);
  if (!found) refuse(node, std::string(node.name()) + " lacks the attribute " + name);
  const std::string_view value = found.value();
  if (value.size() <= reading.limits.nameBytes) return value;
  refuse(node, std::string(node.name()) + " has the attribute " + name + " with more than " +
                   std::to_string(reading.limits.nameBytes) + " bytes");
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

/// XML requires that each attribute of an element has a name of its own.
void checkAttributes(const Reading& reading, xml_node node) {
  std::size_t count = 0;
  for (pugi::xml_attribute one = node.first_attribute(); one; one = one.next_attribute()) {
    if (++count <= reading.limits.attributes) continue;
    refuse(node,
           std::string(node.name()) + " has more than " + std::to_string(reading.limits.attributes) + " attributes");
  }
  for (const pugi::xml_attribute one : node.attributes()) {
    for (pugi::xml_attribute other = one.next_attribute(); other; other = other.next_attribute()) {
      if (std::strcmp(one.name(), other.name()) == 0) {
        refuse(node, std::string(node.name()) + " has the attribute " + one.name() + " twice", Fault::NotWellFormed);
      }
    }
  }
}

class AttributeWalk : public pugi::xml_tree_walker {
 public:
  explicit AttributeWalk(Reading& reading) : reading_(reading) {}

  bool for_each(xml_node& node) override {
    reading_.step();
    checkAttributes(reading_, node);
    return true;
  }

 private:
  Reading& reading_;
};

/// Checks a text and parses it. `document` refers to `buffer`.
void parse(std::string_view text, Reading& reading, std::string& buffer, pugi::xml_document& document) {
  if (auto problem = checkXml(text, reading.limits.xml)) {
    if (problem->isOver) throw Refusal{Fault::TimeIsOver, -1, std::move(problem->message)};
    throw Refusal{Fault::NotWellFormed, static_cast<std::ptrdiff_t>(problem->position), std::move(problem->message)};
  }
  buffer.assign(text);
  constexpr unsigned kFlags = pugi::parse_cdata | pugi::parse_escapes | pugi::parse_eol | pugi::parse_wconv_attribute |
                              pugi::parse_ws_pcdata_single;
  const pugi::xml_parse_result result =
      document.load_buffer_inplace(buffer.data(), buffer.size(), kFlags, pugi::encoding_utf8);
  if (!result) throw Refusal{Fault::NotWellFormed, result.offset, result.description()};
  AttributeWalk walk(reading);
  document.traverse(walk);
}

broker::Instance readInstance(xml_node node, Reading& reading, int nesting);
broker::ObjectPath readReference(xml_node node, Reading& reading);

/// The instance whose element stands, as text, in a value (DSP0201 5.3.2). Empty texts are null.
broker::Scalar readEmbedded(xml_node place, const std::string& text, Reading& reading, int nesting) {
  if (trimmed(text).empty()) return {};
  if (nesting >= kDeepestEmbedded) {
    refuse(place, "instances embedded deeper than " + std::to_string(kDeepestEmbedded));
  }
  std::string buffer;
  pugi::xml_document document;
  try {
    parse(text, reading, buffer, document);
    const xml_node root = document.document_element();
    if (!is(root, "INSTANCE")) {
      refuse(place, "the embedded object is " + elementName(root) + ", where INSTANCE is taken");
    }
    return broker::Boxed<broker::Instance>(readInstance(root, reading, nesting + 1));
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

broker::Scalar scalarOf(xml_node place, std::string text, const ValueKind& kind, Reading& reading, int nesting) {
  if (kind.isEmbedded) return readEmbedded(place, text, reading, nesting);
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
broker::Value readValue(xml_node node, const ValueKind& kind, Reading& reading, int nesting) {
  broker::Value value = broker::Value::null(kind.type);
  value.isNull = false;
  if (is(node, "VALUE")) {
    value.scalar = scalarOf(node, contentOf(node), kind, reading, nesting);
    value.isNull = std::holds_alternative<std::monostate>(value.scalar);
    return value;
  }
  if (is(node, "VALUE.REFERENCE")) return broker::Value::reference(readReference(node, reading));
  value.isArray = true;
  if (is(node, "VALUE.REFARRAY")) value.type = schema::Type::Reference;
  Count elements(reading.limits.values, "values");
  for (const xml_node child : node.children()) {
    if (!isElement(child)) continue;
    reading.step();
    elements.add(child, node);
    if (is(child, "VALUE.NULL")) {
      value.elements.emplace_back();
    } else if (is(child, "VALUE") && is(node, "VALUE.ARRAY")) {
      value.elements.push_back(scalarOf(child, contentOf(child), kind, reading, nesting));
    } else if (is(child, "VALUE.REFERENCE") && is(node, "VALUE.REFARRAY")) {
      value.elements.emplace_back(broker::Boxed<broker::ObjectPath>(readReference(child, reading)));
    } else {
      refuse(child, std::string(child.name()) + " within " + node.name());
    }
  }
  return value;
}

std::string readNamespace(xml_node node, Reading& reading) {
  std::string path;
  Count parts(reading.limits.namespaces, "namespaces");
  for (const xml_node part : node.children("NAMESPACE")) {
    parts.add(part, node);
    if (!path.empty()) path += '/';
    path += attribute(reading, part, "NAME");
  }
  if (path.empty()) refuse(node, "LOCALNAMESPACEPATH names no namespace");
  return path;
}

broker::Value readKeyValue(xml_node node, Reading& reading) {
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
  value.scalar = scalarOf(node, std::move(text), kind, reading, 0);
  return value;
}

broker::Value readKey(xml_node value, Reading& reading) {
  if (is(value, "KEYVALUE")) return readKeyValue(value, reading);
  return broker::Value::reference(readReference(value, reading));
}

void readInstanceName(xml_node node, Reading& reading, broker::ObjectPath& path) {
  path.className = attribute(reading, node, "CLASSNAME");
  Count count(reading.limits.keys, "keys");
  UniqueNames names;
  for (const xml_node child : node.children()) {
    if (!isElement(child)) continue;
    reading.step();
    if (is(child, "KEYBINDING")) {
      count.add(child, node);
      const std::string_view name = attribute(reading, child, "NAME");
      names.add(child, "key", name);
      path.keys.push_back({std::string(name), readKey(required(child, {"KEYVALUE", "VALUE.REFERENCE"}), reading)});
    } else if (isOneOf(child, {"KEYVALUE", "VALUE.REFERENCE"}) && path.keys.empty()) {
      path.keys.push_back({"", readKey(child, reading)});
    }
  }
}

void readNamespacePath(xml_node node, Reading& reading, broker::ObjectPath& path) {
  path.host = trimmed(contentOf(required(node, {"HOST"})));
  path.nameSpace = readNamespace(required(node, {"LOCALNAMESPACEPATH"}), reading);
}

/// INSTANCENAME, LOCALINSTANCEPATH, INSTANCEPATH, and the same of a class.
broker::ObjectPath readPath(xml_node node, Reading& reading) {
  broker::ObjectPath path;
  if (is(node, "INSTANCENAME")) {
    readInstanceName(node, reading, path);
    return path;
  }
  if (is(node, "CLASSNAME")) {
    path.className = attribute(reading, node, "NAME");
    return path;
  }
  if (isOneOf(node, {"LOCALINSTANCEPATH", "LOCALCLASSPATH"})) {
    path.nameSpace = readNamespace(required(node, {"LOCALNAMESPACEPATH"}), reading);
  } else {
    readNamespacePath(required(node, {"NAMESPACEPATH"}), reading, path);
  }
  if (isOneOf(node, {"LOCALCLASSPATH", "CLASSPATH"})) {
    path.className = attribute(reading, required(node, {"CLASSNAME"}), "NAME");
  } else {
    readInstanceName(required(node, {"INSTANCENAME"}), reading, path);
  }
  return path;
}

broker::ObjectPath readReference(xml_node node, Reading& reading) {
  return readPath(
      required(node, {"INSTANCENAME", "LOCALINSTANCEPATH", "INSTANCEPATH", "CLASSNAME", "LOCALCLASSPATH", "CLASSPATH"}),
      reading);
}

broker::Property readProperty(xml_node node, Reading& reading, int nesting) {
  const bool isReference = is(node, "PROPERTY.REFERENCE");
  const bool isArray = is(node, "PROPERTY.ARRAY");
  const ValueKind kind = isReference ? ValueKind{schema::Type::Reference, false} : kindOf(node, "TYPE");
  const char* const wanted = isReference ? "VALUE.REFERENCE" : isArray ? "VALUE.ARRAY" : "VALUE";
  broker::Property property;
  property.name = attribute(reading, node, "NAME");
  const xml_node value = firstOf(node, {wanted});
  property.value = value ? readValue(value, kind, reading, nesting) : broker::Value::null(kind.type, isArray);
  return property;
}

broker::Instance readInstance(xml_node node, Reading& reading, int nesting) {
  broker::Instance instance;
  instance.path.className = attribute(reading, node, "CLASSNAME");
  Count count(reading.limits.properties, "properties");
  UniqueNames names;
  for (const xml_node child : node.children()) {
    if (!isElement(child) || !isOneOf(child, {"PROPERTY", "PROPERTY.ARRAY", "PROPERTY.REFERENCE"})) continue;
    reading.step();
    count.add(child, node);
    names.add(child, "property", attribute(reading, child, "NAME"));
    instance.properties.push_back(readProperty(child, reading, nesting));
  }
  return instance;
}

TextList readTexts(xml_node node, Reading& reading) {
  TextList texts;
  Count count(reading.limits.values, "values");
  for (const xml_node child : node.children()) {
    if (!isElement(child)) continue;
    reading.step();
    count.add(child, node);
    if (is(child, "VALUE")) texts.emplace_back(contentOf(child));
    if (is(child, "VALUE.NULL")) texts.emplace_back();
  }
  return texts;
}

ParameterValue readParameterValue(xml_node node, Reading& reading) {
  const xml_node value = firstOf(node, {"VALUE", "VALUE.ARRAY", "VALUE.REFERENCE", "CLASSNAME", "INSTANCENAME",
                                        "INSTANCE", "VALUE.NAMEDINSTANCE", "CLASS", "QUALIFIER.DECLARATION"});
  if (!value) return {};
  if (is(value, "VALUE")) return contentOf(value);
  if (is(value, "VALUE.ARRAY")) return readTexts(value, reading);
  if (is(value, "CLASSNAME")) return ClassName{std::string(attribute(reading, value, "NAME"))};
  if (is(value, "INSTANCENAME")) return readPath(value, reading);
  if (is(value, "VALUE.REFERENCE")) return readReference(value, reading);
  if (is(value, "INSTANCE")) return readInstance(value, reading, 0);
  if (!is(value, "VALUE.NAMEDINSTANCE")) return Declaration{};
  broker::Instance instance = readInstance(required(value, {"INSTANCE"}), reading, 0);
  const std::string madeOf = instance.path.className;
  readInstanceName(required(value, {"INSTANCENAME"}), reading, instance.path);
  if (!schema::sameName(madeOf, instance.path.className)) {
    refuse(value, "INSTANCENAME and INSTANCE are of the classes " + quoted(instance.path.className) + " and " +
                      quoted(madeOf));
  }
  return instance;
}

void readIntrinsic(xml_node node, Reading& reading, Call& call) {
  call.name = attribute(reading, node, "NAME");
  call.target.nameSpace = readNamespace(required(node, {"LOCALNAMESPACEPATH"}), reading);
  Count count(reading.limits.parameters, "parameters");
  for (const xml_node child : node.children("IPARAMVALUE")) {
    count.add(child, node);
    call.parameters.push_back({std::string(attribute(reading, child, "NAME")), readParameterValue(child, reading)});
  }
}

broker::Value readArgument(xml_node node, Reading& reading) {
  const ValueKind kind = kindOf(node, "PARAMTYPE");
  const xml_node value = firstOf(node, {"VALUE", "VALUE.ARRAY", "VALUE.REFERENCE", "VALUE.REFARRAY", "CLASSNAME",
                                        "INSTANCENAME", "CLASS", "INSTANCE", "VALUE.NAMEDINSTANCE"});
  if (!value) return broker::Value::null(kind.type);
  if (is(value, "INSTANCENAME")) return broker::Value::reference(readPath(value, reading));
  if (is(value, "INSTANCE")) {
    broker::Value instance = broker::Value::null(schema::Type::String);
    instance.isNull = false;
    instance.scalar = broker::Boxed<broker::Instance>(readInstance(value, reading, 0));
    return instance;
  }
  if (isOneOf(value, {"CLASSNAME", "CLASS", "VALUE.NAMEDINSTANCE"})) {
    refuse(value, std::string(value.name()) + " is no value that a method takes");
  }
  return readValue(value, kind, reading, 0);
}

/// The type that PARAMTYPE names; nothing where it is left out.
std::optional<schema::Type> saidType(xml_node node) {
  if (!node.attribute("PARAMTYPE")) return std::nullopt;
  return typeOf(node, "PARAMTYPE");
}

void readExtrinsic(xml_node node, Reading& reading, Call& call) {
  call.isExtrinsic = true;
  call.name = attribute(reading, node, "NAME");
  const xml_node target = required(node, {"LOCALINSTANCEPATH", "LOCALCLASSPATH"});
  call.target = readPath(target, reading);
  call.onClass = is(target, "LOCALCLASSPATH");
  Count count(reading.limits.parameters, "parameters");
  for (const xml_node child : node.children("PARAMVALUE")) {
    count.add(child, node);
    call.input.push_back({std::string(attribute(reading, child, "NAME")), readArgument(child, reading)});
    call.saidTypes.push_back(saidType(child));
  }
}

Call readCall(xml_node simple, Reading& reading) {
  Call call;
  const xml_node node = required(simple, {"IMETHODCALL", "METHODCALL"});
  if (is(node, "IMETHODCALL")) {
    readIntrinsic(node, reading, call);
  } else {
    readExtrinsic(node, reading, call);
  }
  return call;
}

void checkVersion(xml_node node, Reading& reading, const char* name, std::string_view major, Fault fault) {
  const std::string_view version = attribute(reading, node, name);
  if (version.starts_with(major) && version.size() > major.size()) return;
  refuse(node, std::string(name) + " is " + quoted(version) + ", where " + std::string(major) + "x is taken", fault);
}

void readMessage(xml_node message, Reading& reading, CimRequest& request) {
  request.id = attribute(reading, message, "ID");
  checkVersion(message, reading, "PROTOCOLVERSION", "1.", Fault::UnsupportedProtocolVersion);
  if (firstOf(message, {"SIMPLEEXPREQ", "MULTIEXPREQ"})) {
    refuse(message, "indications are not taken here", Fault::UnsupportedOperation);
  }
  const xml_node body = required(message, {"SIMPLEREQ", "MULTIREQ"});
  request.isMultiple = is(body, "MULTIREQ");
  request.calls.clear();
  if (!request.isMultiple) {
    request.calls.push_back(readCall(body, reading));
    return;
  }
  Count count(reading.limits.calls, "requests");
  for (const xml_node simple : body.children("SIMPLEREQ")) {
    count.add(simple, body);
    request.calls.push_back(readCall(simple, reading));
  }
  if (request.calls.size() < 2) refuse(body, "MULTIREQ has fewer than two SIMPLEREQs");
}

}  // namespace

std::optional<RequestError> readRequest(std::string_view text, const ReaderLimits& limits, CimRequest& request) {
  std::string buffer;
  pugi::xml_document document;
  Reading reading(limits);
  try {
    parse(text, reading, buffer, document);
    const xml_node root = document.document_element();
    if (!is(root, "CIM")) refuse(root, "the root element is " + elementName(root) + ", where CIM is taken");
    checkVersion(root, reading, "CIMVERSION", "2.", Fault::UnsupportedCimVersion);
    checkVersion(root, reading, "DTDVERSION", "2.", Fault::UnsupportedDtdVersion);
    readMessage(required(root, {"MESSAGE"}), reading, request);
  } catch (Refusal& refusal) {
    if (refusal.position < 0) return RequestError{refusal.fault, std::move(refusal.message)};
    const auto position = static_cast<std::size_t>(refusal.position);
    return RequestError{refusal.fault, placeText(text, position) + ": " + refusal.message};
  }
  return std::nullopt;
}

}  // namespace zorva::cimxml
