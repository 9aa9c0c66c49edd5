#include "cimxml/ElementWriter.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <cmath>
#include <cstdint>
#include <cstring>

#include "cimxml/ClassWriter.h"
#include "schema/Utf8.h"

namespace zorva::cimxml {

namespace {

constexpr std::string_view kReplacement = "\xEF\xBF\xBD";

/// Whether XML 1.0 (2.2) has the character at all.
bool isXmlCharacter(std::uint32_t code) noexcept {
  return code == '\t' || code == '\n' || code == '\r' || (code >= 0x20 && code != 0xFFFE && code != 0xFFFF);
}

/// Bytes that mean nothing to XML and are a character each.
constexpr std::array<bool, 256> kPlain = [] {
  std::array<bool, 256> plain{};
  for (std::size_t byte = 0x20; byte < 0x7F; ++byte) plain[byte] = true;
  for (const char special : std::string_view("&<>\"")) plain[static_cast<unsigned char>(special)] = false;
  return plain;
}();

/// What is written for a character that cannot stand as it is.
std::string_view standIn(char character) noexcept {
  switch (character) {
    case '&':
      return "&amp;";
    case '<':
      return "&lt;";
    case '>':
      return "&gt;";
    case '"':
      return "&quot;";
    // A reader would turn these into blanks in an attribute, and a carriage return into a line feed anywhere.
    case '\t':
      return "&#9;";
    case '\n':
      return "&#10;";
    case '\r':
      return "&#13;";
    case '\x7F':
      return "\x7F";
    default:
      return kReplacement;
  }
}

/// How many bytes at the beginning of `text` are surely plain, in whole words of eight: most texts are nothing else.
std::size_t plainWords(std::string_view text) noexcept {
  using Word = std::uint64_t;
  constexpr Word kOnes = 0x0101010101010101;
  constexpr Word kHighs = 0x8080808080808080;
  // Sets the high bit of each byte that is 0. Borrows may set others, but only in a word that has such a byte.
  const auto zeros = [](Word word) { return (word - kOnes) & ~word; };
  std::size_t done = 0;
  for (; text.size() - done >= sizeof(Word); done += sizeof(Word)) {
    Word word = 0;
    std::memcpy(&word, text.data() + done, sizeof word);
    const Word low = word - kOnes * 0x20;     // borrows from below 0x20
    const Word high = word | (word + kOnes);  // 0x7F and above
    const Word special =
        zeros(word ^ kOnes * '&') | zeros(word ^ kOnes * '<') | zeros(word ^ kOnes * '>') | zeros(word ^ kOnes * '"');
    if (((low | high | special) & kHighs) != 0) break;
  }
  return done;
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
class ContentWriter {
 public:
  explicit ContentWriter(std::string& text) : out(text) {}

  void operator()(std::monostate) const {}
  void operator()(bool value) const { out += value ? "TRUE" : "FALSE"; }
  void operator()(std::uint64_t value) const { number(value); }
  void operator()(std::int64_t value) const { number(value); }
  /// DSP0201 5.3.1 wants a decimal point, and has words of its own for what is no number.
  void operator()(double value) const {
    if (!std::isfinite(value)) {
      out += std::isnan(value) ? "NaN" : value > 0 ? "INF" : "-INF";
      return;
    }
    const std::size_t begin = out.size();
    number(value);
    if (out.find('.', begin) == std::string::npos) out.insert(std::min(out.find('e', begin), out.size()), ".0");
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

 private:
  template <class Number>
  void number(Number value) const {
    char text[32];
    out.append(text, std::to_chars(text, text + sizeof text, value).ptr);
  }

  std::string& out;
};

void appendScalar(std::string& out, const broker::Scalar& scalar, bool isReference) {
  if (std::holds_alternative<std::monostate>(scalar)) {
    out += "<VALUE.NULL/>";
    return;
  }
  out += isReference ? "<VALUE.REFERENCE>" : "<VALUE>";
  std::visit(ContentWriter(out), scalar);
  out += isReference ? "</VALUE.REFERENCE>" : "</VALUE>";
}

const char* keyValueType(schema::Type type) noexcept {
  if (type == schema::Type::Boolean) return "boolean";
  return schema::isUnsigned(type) || schema::isSigned(type) || schema::isReal(type) ? "numeric" : "string";
}

void appendKeyBinding(std::string& out, const broker::NamedValue& key) {
  out += "<KEYBINDING NAME=\"";
  appendEscaped(out, key.name);
  out += "\">";
  if (key.value.type == schema::Type::Reference) {
    appendValue(out, key.value);
  } else {
    out += "<KEYVALUE VALUETYPE=\"";
    out += keyValueType(key.value.type);
    out += "\" TYPE=\"";
    out += schema::typeName(key.value.type);
    out += "\">";
    std::visit(ContentWriter(out), key.value.scalar);
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

void appendProperty(std::string& out, const broker::Property& property, const broker::Instance& instance,
                    const InstanceDetail& detail) {
  const char* const element = propertyElement(property.value);
  out += '<';
  out += element;
  out += " NAME=\"";
  appendEscaped(out, property.name);
  out += '"';
  if (property.value.type != schema::Type::Reference) {
    out += " TYPE=\"";
    out += schema::typeName(property.value.type);
    out += '"';
  } else if (property.declaration != nullptr) {
    appendAttribute(out, "REFERENCECLASS", property.declaration->referenceClass);
  }
  if (detail.classOrigin && property.declaration != nullptr && property.declaration->origin != nullptr) {
    appendAttribute(out, "CLASSORIGIN", property.declaration->origin->name());
  }
  if (holdsInstance(property.value)) appendAttribute(out, "EmbeddedObject", "instance");
  out += '>';
  if (detail.qualifiers != nullptr && property.declaration != nullptr) {
    const bool inherited = property.declaration->origin != instance.declaration;
    appendQualifiers(out, property.declaration->qualifiers, inherited, *detail.qualifiers);
  }
  appendValue(out, property.value);
  out += "</";
  out += element;
  out += '>';
}

}  // namespace

void appendAttribute(std::string& out, std::string_view name, std::string_view value) {
  out += ' ';
  out += name;
  out += "=\"";
  appendEscaped(out, value);
  out += '"';
}

void appendEscaped(std::string& out, std::string_view text) {
  // Nearly all text is plain: it is copied in runs, and only what ends a run is looked at by itself.
  std::size_t begin = 0;
  std::size_t i = plainWords(text);
  while (i < text.size()) {
    const auto byte = static_cast<unsigned char>(text[i]);
    if (kPlain[byte]) {
      ++i;
      continue;
    }
    const std::string_view rest = text.substr(i);
    const std::size_t length = byte < 0x80 ? 1 : schema::utf8Length(rest);
    if (byte >= 0x80 && length > 0 && isXmlCharacter(schema::utf8Decode(rest))) {
      i += length;
      continue;
    }
    out.append(text, begin, i - begin);
    out += standIn(text[i]);
    i += length == 0 ? 1 : length;
    begin = i;
  }
  out.append(text, begin, text.size() - begin);
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

void appendNamespacePath(std::string& out, std::string_view host, std::string_view nameSpace) {
  out += "<NAMESPACEPATH><HOST>";
  appendEscaped(out, host);
  out += "</HOST>";
  appendLocalNamespacePath(out, nameSpace);
  out += "</NAMESPACEPATH>";
}

void appendInstancePath(std::string& out, const broker::ObjectPath& path) {
  if (path.nameSpace.empty()) {
    appendInstanceName(out, path);
  } else if (path.host.empty()) {
    out += "<LOCALINSTANCEPATH>";
    appendLocalNamespacePath(out, path.nameSpace);
    appendInstanceName(out, path);
    out += "</LOCALINSTANCEPATH>";
  } else {
    appendWholePath(out, path, path.host);
  }
}

void appendWholePath(std::string& out, const broker::ObjectPath& path, std::string_view host) {
  out += "<INSTANCEPATH>";
  appendNamespacePath(out, path.host.empty() ? host : std::string_view(path.host), path.nameSpace);
  appendInstanceName(out, path);
  out += "</INSTANCEPATH>";
}

namespace {

void appendParameterType(std::string& out, const broker::Value& value) {
  const bool isReference = value.type == schema::Type::Reference;
  appendAttribute(out, "PARAMTYPE", isReference ? "reference" : schema::typeName(value.type));
  if (holdsInstance(value)) appendAttribute(out, "EmbeddedObject", "instance");
}

}  // namespace

void appendParameter(std::string& out, const broker::NamedValue& parameter) {
  out += "<PARAMVALUE";
  appendAttribute(out, "NAME", parameter.name);
  appendParameterType(out, parameter.value);
  out += '>';
  appendValue(out, parameter.value);
  out += "</PARAMVALUE>";
}

void appendReturnValue(std::string& out, const broker::Value& value) {
  out += "<RETURNVALUE";
  appendParameterType(out, value);
  out += '>';
  appendValue(out, value);
  out += "</RETURNVALUE>";
}

void appendInstance(std::string& out, const broker::Instance& instance, const InstanceDetail& detail) {
  out += "<INSTANCE";
  appendAttribute(out, "CLASSNAME", instance.path.className);
  out += '>';
  if (detail.qualifiers != nullptr && instance.declaration != nullptr) {
    appendQualifiers(out, instance.declaration->qualifiers(), false, *detail.qualifiers);
  }
  for (const broker::Property& property : instance.properties) appendProperty(out, property, instance, detail);
  out += "</INSTANCE>";
}

}  // namespace zorva::cimxml
