#include "cimxml/ElementWriter.h"

#include <charconv>
#include <cstdint>

#include "schema/Utf8.h"

namespace zorva::cimxml {

namespace {

constexpr std::string_view kReplacement = "\xEF\xBF\xBD";

/// Whether XML 1.0 (2.2) has the character at all.
bool isXmlCharacter(std::uint32_t code) noexcept {
  return code == '\t' || code == '\n' || code == '\r' || (code >= 0x20 && code != 0xFFFE && code != 0xFFFF);
}

void appendAttribute(std::string& out, std::string_view name, std::string_view value) {
  out += ' ';
  out += name;
  out += "=\"";
  appendEscaped(out, value);
  out += '"';
}

void appendUtf16Unit(std::string& out, char16_t unit) {
  // A lone half of a surrogate pair is no character.
  if (unit >= 0xD800 && unit <= 0xDFFF) {
    out += kReplacement;
    return;
  }
  std::string text;
  schema::utf8Append(text, unit);
  appendEscaped(out, text);
}

/// The content of a VALUE or KEYVALUE element.
struct ContentWriter {
  std::string& out;

  void operator()(std::monostate) const {}
  void operator()(bool value) const { out += value ? "TRUE" : "FALSE"; }
  void operator()(std::uint64_t value) const { out += std::to_string(value); }
  void operator()(std::int64_t value) const { out += std::to_string(value); }
  void operator()(double value) const {
    char text[32];
    out.append(text, std::to_chars(text, text + sizeof text, value).ptr);
  }
  void operator()(char16_t value) const { appendUtf16Unit(out, value); }
  void operator()(const std::string& value) const { appendEscaped(out, value); }
  void operator()(const broker::Boxed<broker::ObjectPath>& value) const { appendInstancePath(out, *value); }
  /// An embedded instance is the text of its element, escaped like any text (DSP0201 5.3.2).
  void operator()(const broker::Boxed<broker::Instance>& value) const {
    std::string element;
    appendInstance(element, *value);
    appendEscaped(out, element);
  }
};

void appendScalar(std::string& out, const broker::Scalar& scalar, bool isReference) {
  if (std::holds_alternative<std::monostate>(scalar)) {
    out += "<VALUE.NULL/>";
    return;
  }
  out += isReference ? "<VALUE.REFERENCE>" : "<VALUE>";
  std::visit(ContentWriter{out}, scalar);
  out += isReference ? "</VALUE.REFERENCE>" : "</VALUE>";
}

const char* keyValueType(schema::Type type) noexcept {
  if (type == schema::Type::Boolean) return "boolean";
  return schema::isUnsigned(type) || schema::isSigned(type) || schema::isReal(type) ? "numeric" : "string";
}

void appendKeyBinding(std::string& out, const broker::NamedValue& key) {
  out += "<KEYBINDING";
  appendAttribute(out, "NAME", key.name);
  out += '>';
  if (key.value.type == schema::Type::Reference) {
    appendValue(out, key.value);
  } else {
    out += "<KEYVALUE";
    appendAttribute(out, "VALUETYPE", keyValueType(key.value.type));
    appendAttribute(out, "TYPE", schema::typeName(key.value.type));
    out += '>';
    std::visit(ContentWriter{out}, key.value.scalar);
    out += "</KEYVALUE>";
  }
  out += "</KEYBINDING>";
}

bool holdsInstance(const broker::Value& value) noexcept {
  const auto isInstance = [](const broker::Scalar& scalar) {
    return std::holds_alternative<broker::Boxed<broker::Instance>>(scalar);
  };
  return value.isArray ? !value.elements.empty() && isInstance(value.elements.front()) : isInstance(value.scalar);
}

const char* propertyElement(const broker::Value& value) noexcept {
  if (value.isArray) return "PROPERTY.ARRAY";
  return value.type == schema::Type::Reference ? "PROPERTY.REFERENCE" : "PROPERTY";
}

void appendProperty(std::string& out, const broker::Property& property, bool classOrigin) {
  const char* const element = propertyElement(property.value);
  out += '<';
  out += element;
  appendAttribute(out, "NAME", property.name);
  if (property.value.type != schema::Type::Reference) {
    appendAttribute(out, "TYPE", schema::typeName(property.value.type));
  } else if (property.declaration != nullptr) {
    appendAttribute(out, "REFERENCECLASS", property.declaration->referenceClass);
  }
  if (classOrigin && property.declaration != nullptr && property.declaration->origin != nullptr) {
    appendAttribute(out, "CLASSORIGIN", property.declaration->origin->name());
  }
  if (holdsInstance(property.value)) appendAttribute(out, "EmbeddedObject", "instance");
  out += '>';
  appendValue(out, property.value);
  out += "</";
  out += element;
  out += '>';
}

}  // namespace

void appendEscaped(std::string& out, std::string_view text) {
  while (!text.empty()) {
    const std::size_t length = schema::utf8Length(text);
    switch (text[0]) {
      case '&':
        out += "&amp;";
        break;
      case '<':
        out += "&lt;";
        break;
      case '>':
        out += "&gt;";
        break;
      case '"':
        out += "&quot;";
        break;
      // A reader would turn these into blanks in an attribute, and a carriage return into a line feed anywhere.
      case '\t':
        out += "&#9;";
        break;
      case '\n':
        out += "&#10;";
        break;
      case '\r':
        out += "&#13;";
        break;
      default:
        out += length > 0 && isXmlCharacter(schema::utf8Decode(text)) ? text.substr(0, length) : kReplacement;
    }
    text.remove_prefix(length == 0 ? 1 : length);
  }
}

void appendValue(std::string& out, const broker::Value& value) {
  if (value.isNull) return;
  const bool isReference = value.type == schema::Type::Reference;
  if (!value.isArray) {
    appendScalar(out, value.scalar, isReference);
    return;
  }
  out += isReference ? "<VALUE.REFARRAY>" : "<VALUE.ARRAY>";
  for (const broker::Scalar& element : value.elements) appendScalar(out, element, isReference);
  out += isReference ? "</VALUE.REFARRAY>" : "</VALUE.ARRAY>";
}

void appendInstanceName(std::string& out, const broker::ObjectPath& path) {
  out += "<INSTANCENAME";
  appendAttribute(out, "CLASSNAME", path.className);
  out += '>';
  for (const broker::NamedValue& key : path.keys) appendKeyBinding(out, key);
  out += "</INSTANCENAME>";
}

void appendLocalNamespacePath(std::string& out, std::string_view nameSpace) {
  out += "<LOCALNAMESPACEPATH>";
  while (!nameSpace.empty()) {
    const std::size_t slash = nameSpace.find('/');
    if (const std::string_view part = nameSpace.substr(0, slash); !part.empty()) {
      out += "<NAMESPACE";
      appendAttribute(out, "NAME", part);
      out += "/>";
    }
    nameSpace.remove_prefix(slash == std::string_view::npos ? nameSpace.size() : slash + 1);
  }
  out += "</LOCALNAMESPACEPATH>";
}

void appendInstancePath(std::string& out, const broker::ObjectPath& path) {
  if (path.nameSpace.empty()) {
    appendInstanceName(out, path);
    return;
  }
  const bool isLocal = path.host.empty();
  out += isLocal ? "<LOCALINSTANCEPATH>" : "<INSTANCEPATH><NAMESPACEPATH><HOST>";
  if (!isLocal) appendEscaped(out, path.host);
  if (!isLocal) out += "</HOST>";
  appendLocalNamespacePath(out, path.nameSpace);
  if (!isLocal) out += "</NAMESPACEPATH>";
  appendInstanceName(out, path);
  out += isLocal ? "</LOCALINSTANCEPATH>" : "</INSTANCEPATH>";
}

void appendInstance(std::string& out, const broker::Instance& instance, bool classOrigin) {
  out += "<INSTANCE";
  appendAttribute(out, "CLASSNAME", instance.path.className);
  out += '>';
  for (const broker::Property& property : instance.properties) appendProperty(out, property, classOrigin);
  out += "</INSTANCE>";
}

}  // namespace zorva::cimxml
