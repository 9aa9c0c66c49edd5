#include "cimxml/ElementReader.h"

#include <charconv>
#include <cstdint>
#include <limits>
#include <optional>

#include "util/Utf8.h"

namespace zorva::cimxml {

namespace {

using pugi::xml_node;

// How deep embedded instances may be nested, each as a text within the other's.
constexpr int kDeepestEmbedded = 8;

constexpr std::size_t kNoLimit = std::numeric_limits<std::size_t>::max();

/// A response has no limits of its own: its whole size is limited before it is read.
const ReaderLimits& noLimits() {
  static const ReaderLimits limits{{}, kNoLimit, kNoLimit, kNoLimit, kNoLimit, kNoLimit, kNoLimit, kNoLimit, kNoLimit};
  return limits;
}

/// A number in one of the other bases of DSP0201 5.3.1; else the text itself, for the broker to convert.
broker::Scalar numberOrText(std::string_view text) {
  std::uint64_t number = 0;
  if (text.size() > 2 && text[0] == '0' && (text[1] == 'x' || text[1] == 'X')) {
    const auto result = std::from_chars(text.data() + 2, text.data() + text.size(), number, 16);
    if (result.ec == std::errc() && result.ptr == text.data() + text.size()) return number;
  }
  return std::string(text);
}

/// The name of the element that contains the value at `place`.
std::string holderOf(xml_node place) {
  while (std::string_view(place.name()).starts_with("VALUE")) place = place.parent();
  return place.name();
}

[[noreturn]] void refuseValue(xml_node place, std::string_view text, const char* what) {
  refuse(place, "'" + std::string(text.substr(0, 60)) + "' in " + holderOf(place) + " is no " + what);
}

template <typename Number>
broker::Scalar wholeNumber(xml_node place, std::string_view text) {
  std::string digits(trimmed(text));
  const bool isNegative = digits.starts_with('-');
  if (isNegative || digits.starts_with('+')) digits.erase(0, 1);
  const bool isHex = digits.starts_with("0x") || digits.starts_with("0X");
  if (isHex) digits.erase(0, 2);
  if (isNegative) digits.insert(digits.begin(), '-');
  Number number = 0;
  const char* const end = digits.data() + digits.size();
  const auto read = std::from_chars(digits.data(), end, number, isHex ? 16 : 10);
  if (read.ec == std::errc() && read.ptr == end) return number;
  refuseValue(place, text, "whole number");
}

broker::Scalar realNumber(xml_node place, std::string_view text) {
  const std::string_view digits = trimmed(text);
  double number = 0;
  const auto read = std::from_chars(digits.data(), digits.data() + digits.size(), number);
  if (read.ec == std::errc() && read.ptr == digits.data() + digits.size()) return number;
  refuseValue(place, text, "number");
}

/// A response's value, in the type that it has.
broker::Scalar responseScalar(xml_node place, std::string text, schema::Type type) {
  if (schema::isUnsigned(type)) return wholeNumber<std::uint64_t>(place, text);
  if (schema::isSigned(type)) return wholeNumber<std::int64_t>(place, text);
  if (schema::isReal(type)) return realNumber(place, text);
  if (type == schema::Type::Boolean) return util::sameName(trimmed(text), "TRUE");
  if (type == schema::Type::Char16) {
    const std::size_t length = util::utf8Length(text);
    return static_cast<char16_t>(length == 0 || length > 3 ? 0xFFFD : util::utf8Decode(text));
  }
  return text;
}

/// The type of a key whose element only says that it is a number.
schema::Type numericType(std::string_view text) {
  const bool isHex = text.find_first_of("xX") != std::string_view::npos;
  if (!isHex && text.find_first_of(".eE") != std::string_view::npos) return schema::Type::Real64;
  return text.starts_with('-') ? schema::Type::Sint64 : schema::Type::Uint64;
}

}  // namespace

ElementReader::ElementReader(const ReaderLimits& limits) : reading_(limits), classes_(nullptr) {}

ElementReader::ElementReader(const schema::ClassRepository& classes) : reading_(noLimits()), classes_(&classes) {}

std::string_view ElementReader::attribute(xml_node node, const char* name) const {
  const pugi::xml_attribute found = node.attribute(name);
  if (!found && isRequest()) refuse(node, std::string(node.name()) + " lacks the attribute " + name);
  const std::string_view text = found.value();
  if (text.size() <= reading_.limits.nameBytes) return text;
  refuse(node, std::string(node.name()) + " has the attribute " + name + " with more than " +
                   std::to_string(reading_.limits.nameBytes) + " bytes");
}

xml_node ElementReader::child(xml_node node, std::initializer_list<const char*> names) const {
  return isRequest() ? required(node, names) : firstOf(node, names);
}

const schema::Class* ElementReader::classOf(std::string_view name) const noexcept {
  return classes_ == nullptr ? nullptr : classes_->find(name);
}

std::string ElementReader::content(xml_node node) const {
  std::string text;
  for (const xml_node piece : node.children()) {
    if (piece.type() == pugi::node_pcdata || piece.type() == pugi::node_cdata) text += piece.value();
    if (!isElement(piece) || !isRequest()) continue;
    refuse(piece, std::string(piece.name()) + " within " + node.name() + ", which holds text");
  }
  return text;
}

schema::Type ElementReader::typeOf(xml_node node, const char* attribute) const {
  const pugi::xml_attribute said = node.attribute(attribute);
  const std::string_view text = said.value();
  if (!said || (text.empty() && !isRequest())) return schema::Type::String;
  if (util::sameName(text, "reference")) return schema::Type::Reference;
  if (text == "object" || text == "instance") return schema::Type::String;
  if (const auto type = schema::typeFromName(text)) return *type;
  refuse(node, (isRequest() ? quoted(text) : "'" + std::string(text) + "'") + " is no CIM type");
}

ValueKind ElementReader::kindOf(xml_node node, const char* typeAttribute) const {
  ValueKind kind{typeOf(node, typeAttribute), false};
  // The attribute has two spellings (DSP0201 5.2.5.7).
  const std::string_view type = node.attribute(typeAttribute).value();
  kind.isEmbedded =
      node.attribute("EmbeddedObject") || node.attribute("EMBEDDEDOBJECT") || type == "object" || type == "instance";
  return kind;
}

std::string ElementReader::nameSpace(xml_node node) const {
  std::string path;
  Count parts(reading_.limits.namespaces, "namespaces");
  for (const xml_node part : node.children("NAMESPACE")) {
    parts.add(part, node);
    if (!path.empty()) path += '/';
    path += attribute(part, "NAME");
  }
  if (path.empty() && isRequest()) refuse(node, "LOCALNAMESPACEPATH names no namespace");
  return path;
}

broker::ObjectPath ElementReader::path(xml_node node) {
  broker::ObjectPath path;
  const bool isClass = isOneOf(node, {"CLASSNAME", "LOCALCLASSPATH", "CLASSPATH"});
  const bool isName = isOneOf(node, {"INSTANCENAME", "CLASSNAME"});
  if (!isName) {
    const bool isLocal = isOneOf(node, {"LOCALINSTANCEPATH", "LOCALCLASSPATH"});
    const xml_node around = isLocal ? node : child(node, {"NAMESPACEPATH"});
    if (!isLocal) path.host = trimmed(content(child(around, {"HOST"})));
    path.nameSpace = nameSpace(child(around, {"LOCALNAMESPACEPATH"}));
  }
  const xml_node name = isName ? node : child(node, {isClass ? "CLASSNAME" : "INSTANCENAME"});
  if (isClass) {
    path.className = attribute(name, "NAME");
  } else {
    instanceName(name, path);
  }
  if (path.className.empty() && !isRequest()) {
    refuse(node, std::string("an element ") + node.name() + " names no class");
  }
  return path;
}

void ElementReader::instanceName(xml_node node, broker::ObjectPath& path) {
  path.className = attribute(node, "CLASSNAME");
  const schema::Class* const declared = classOf(path.className);
  Count count(reading_.limits.keys, "keys");
  UniqueNames names;
  for (const xml_node each : node.children()) {
    if (!isElement(each)) continue;
    reading_.step();
    if (is(each, "KEYBINDING")) {
      count.add(each, node);
      const std::string_view name = attribute(each, "NAME");
      if (isRequest()) names.add(each, "key", name);
      const xml_node value = child(each, {"KEYVALUE", "VALUE.REFERENCE"});
      path.keys.push_back(
          {std::string(name), key(value, declared == nullptr ? nullptr : declared->findProperty(name))});
    } else if (isOneOf(each, {"KEYVALUE", "VALUE.REFERENCE"}) && path.keys.empty()) {
      unnamedKey(each, declared, path);
    }
  }
}

void ElementReader::unnamedKey(xml_node node, const schema::Class* declared, broker::ObjectPath& path) {
  if (isRequest()) {
    path.keys.push_back({"", key(node, nullptr)});
  } else if (declared != nullptr && declared->keys().size() == 1) {
    const schema::ClassProperty* const only = declared->keys().front();
    path.keys.push_back({only->name, key(node, only)});
  }
}

broker::Value ElementReader::key(xml_node node, const schema::ClassProperty* declared) {
  if (is(node, "VALUE.REFERENCE")) return broker::Value::reference(reference(node));
  return keyValue(node, declared);
}

broker::Value ElementReader::keyValue(xml_node node, const schema::ClassProperty* declared) {
  const std::string_view said = node.attribute("VALUETYPE").value();
  ValueKind kind{typeOf(node, "TYPE"), false};
  std::string text = content(node);
  if (!node.attribute("TYPE") && said == "boolean") kind.type = schema::Type::Boolean;
  if (!node.attribute("TYPE") && said == "numeric") kind.type = numericType(trimmed(text));
  if (isRequest() && !said.empty() && said != "boolean" && said != "numeric" && said != "string") {
    refuse(node, "VALUETYPE is " + quoted(said) + ", where string, boolean or numeric is taken");
  }
  if (declared != nullptr && declared->type != schema::Type::Reference) kind.type = declared->type;
  broker::Value value = broker::Value::null(kind.type);
  value.isNull = false;
  value.scalar = scalar(node, std::move(text), kind, 0);
  return value;
}

broker::ObjectPath ElementReader::reference(xml_node node) {
  return path(
      child(node, {"INSTANCENAME", "LOCALINSTANCEPATH", "INSTANCEPATH", "CLASSNAME", "LOCALCLASSPATH", "CLASSPATH"}));
}

broker::Instance ElementReader::instance(xml_node node, int nesting) {
  broker::Instance instance;
  instance.path.className = attribute(node, "CLASSNAME");
  instance.declaration = classOf(instance.path.className);
  Count count(reading_.limits.properties, "properties");
  UniqueNames names;
  for (const xml_node each : node.children()) {
    if (!isElement(each) || !isOneOf(each, {"PROPERTY", "PROPERTY.ARRAY", "PROPERTY.REFERENCE"})) continue;
    reading_.step();
    count.add(each, node);
    if (isRequest()) names.add(each, "property", attribute(each, "NAME"));
    instance.properties.push_back(property(each, instance.declaration, nesting));
  }
  return instance;
}

broker::Property ElementReader::property(xml_node node, const schema::Class* declared, int nesting) {
  const bool isReference = is(node, "PROPERTY.REFERENCE");
  const bool isArray = is(node, "PROPERTY.ARRAY");
  const ValueKind kind = isReference ? ValueKind{schema::Type::Reference, false} : kindOf(node, "TYPE");
  broker::Property property;
  property.name = attribute(node, "NAME");
  const xml_node held = firstOf(node, {isReference ? "VALUE.REFERENCE" : isArray ? "VALUE.ARRAY" : "VALUE"});
  property.value = held ? value(held, kind, nesting) : broker::Value::null(kind.type, isArray);
  property.declaration = declared == nullptr ? nullptr : declared->findProperty(property.name);
  return property;
}

broker::Value ElementReader::valueIn(xml_node holder, const ValueKind& kind) {
  const xml_node held = firstOf(holder, {"VALUE", "VALUE.ARRAY", "VALUE.REFERENCE", "VALUE.REFARRAY"});
  return held ? value(held, kind) : broker::Value::null(kind.type);
}

broker::Value ElementReader::value(xml_node node, const ValueKind& kind, int nesting) {
  broker::Value value = broker::Value::null(kind.type);
  value.isNull = false;
  if (is(node, "VALUE")) {
    value.scalar = scalar(node, content(node), kind, nesting);
    value.isNull = std::holds_alternative<std::monostate>(value.scalar);
    return value;
  }
  if (is(node, "VALUE.REFERENCE")) return broker::Value::reference(reference(node));
  value.isArray = true;
  if (is(node, "VALUE.REFARRAY")) value.type = schema::Type::Reference;
  Count elements(reading_.limits.values, "values");
  for (const xml_node each : node.children()) {
    if (!isElement(each)) continue;
    reading_.step();
    elements.add(each, node);
    if (is(each, "VALUE.NULL")) {
      value.elements.emplace_back();
    } else if (is(each, "VALUE") && is(node, "VALUE.ARRAY")) {
      value.elements.push_back(scalar(each, content(each), kind, nesting));
    } else if (is(each, "VALUE.REFERENCE") && is(node, "VALUE.REFARRAY")) {
      value.elements.emplace_back(broker::Boxed<broker::ObjectPath>(reference(each)));
    } else if (isRequest()) {
      refuse(each, std::string(each.name()) + " within " + node.name());
    }
  }
  return value;
}

broker::Scalar ElementReader::scalar(xml_node place, std::string text, const ValueKind& kind, int nesting) {
  if (isRequest()) return requestScalar(place, std::move(text), kind, nesting);
  return responseScalar(place, std::move(text), kind.type);
}

broker::Scalar ElementReader::requestScalar(xml_node place, std::string text, const ValueKind& kind, int nesting) {
  if (kind.isEmbedded) return embedded(place, text, nesting);
  switch (kind.type) {
    case schema::Type::String:
      return text;
    case schema::Type::Char16: {
      const std::size_t length = util::utf8Length(text);
      const std::uint32_t code = length == 0 ? 0 : util::utf8Decode(text);
      if (length == 0 || length != text.size() || code > 0xFFFF) refuse(place, quoted(text) + " is no char16");
      return static_cast<char16_t>(code);
    }
    case schema::Type::DateTime:
    case schema::Type::Boolean:
      return std::string(trimmed(text));
    default:
      return numberOrText(trimmed(text));
  }
}

/// The instance whose element is the text of a value (DSP0201 5.3.2). Empty texts are null.
broker::Scalar ElementReader::embedded(xml_node place, const std::string& text, int nesting) {
  if (trimmed(text).empty()) return {};
  if (nesting >= kDeepestEmbedded) {
    refuse(place, "instances embedded deeper than " + std::to_string(kDeepestEmbedded));
  }
  std::string buffer;
  pugi::xml_document document;
  try {
    parse(text, reading_, buffer, document);
    const xml_node root = document.document_element();
    if (!is(root, "INSTANCE")) {
      refuse(place, "the embedded object is " + elementName(root) + ", where INSTANCE is taken");
    }
    return broker::Boxed<broker::Instance>(instance(root, nesting + 1));
  } catch (Refusal& inner) {
    refuse(place, "in the embedded instance: " + inner.message, inner.fault);
  }
}

}  // namespace zorva::cimxml
