#include <array>
#include <charconv>
#include <cmath>

#include "schema/Mof.h"
#include "util/Utf8.h"

namespace zorva::schema {

namespace {

constexpr std::size_t kLineWidth = 100;

void appendEscaped(std::string& out, std::string_view character) {
  constexpr std::string_view controls = "\b\t\n\f\r\"\\";
  constexpr std::string_view letters = "btnfr\"\\";
  if (const std::size_t which = controls.find(character[0]); which != std::string_view::npos) {
    out.push_back('\\');
    out.push_back(letters[which]);
    return;
  }
  const auto byte = static_cast<unsigned char>(character[0]);
  if (byte >= ' ' && byte != 127) {
    out.append(character);
    return;
  }
  // Four digits, so that a hexadecimal digit that follows is not read as part of the escape.
  constexpr std::string_view digits = "0123456789ABCDEF";
  out.append("\\x00");
  out.push_back(digits[byte >> 4U]);
  out.push_back(digits[byte & 15U]);
}

// The text with its escapes, without quotes. Bytes that are not UTF-8 become U+FFFD: MOF cannot express them.
std::string escaped(std::string_view text) {
  std::string out;
  out.reserve(text.size());
  while (!text.empty()) {
    const std::size_t length = util::utf8Length(text);
    if (length == 0 || text[0] == '\0') {
      out.append("\xEF\xBF\xBD");
    } else {
      appendEscaped(out, text.substr(0, length));
    }
    text.remove_prefix(length == 0 ? 1 : length);
  }
  return out;
}

// Where to cut an escaped text so that the piece has at most `width` bytes: after the last possible blank, else within
// a word, but never within an escape or a character.
std::size_t cutAt(std::string_view text, std::size_t width) {
  if (text.size() <= width) return text.size();
  if (const std::size_t blank = text.rfind(' ', width - 1); blank != std::string_view::npos) return blank + 1;
  std::size_t cut = 0;
  for (std::size_t next = 0; next <= width;
       next += text[next] == '\\' ? (text[next + 1] == 'x' ? 6 : 2) : util::utf8Length(text.substr(next))) {
    cut = next;
  }
  return cut;
}

// A text in quotes; one that is too long for its line continues in further lines at `indent`.
std::string quoted(std::string_view text, std::size_t indent) {
  const std::string all = escaped(text);
  std::string_view rest = all;
  const std::size_t width = kLineWidth - indent - 8;
  std::string out;
  do {
    const std::size_t cut = cutAt(rest, width);
    if (!out.empty()) out += "\n" + std::string(indent, ' ');
    out += "\"" + std::string(rest.substr(0, cut)) + "\"";
    rest.remove_prefix(cut);
  } while (!rest.empty());
  return out;
}

std::string realText(double value) {
  if (!std::isfinite(value)) return "null";  // MOF has no word for these
  std::array<char, 400> buffer{};
  const auto [end, error] = std::to_chars(buffer.data(), buffer.data() + buffer.size(), value);
  std::string text(buffer.data(), end);
  if (text.find('.') != std::string::npos) return text;
  const std::size_t exponent = text.find('e');
  return exponent == std::string::npos ? text + ".0" : text.substr(0, exponent) + ".0" + text.substr(exponent);
}

std::string characterText(char16_t value) {
  if (value == u'\'') return "'\\''";
  if (value == u'"') return "'\"'";
  if (value == 0 || (value >= 0xD800 && value <= 0xDFFF)) return "'\xEF\xBF\xBD'";
  std::string character;
  util::utf8Append(character, value);
  return "'" + escaped(character) + "'";
}

std::string scalarText(const Scalar& scalar, std::size_t indent) {
  if (const auto* b = std::get_if<bool>(&scalar)) return *b ? "true" : "false";
  if (const auto* u = std::get_if<std::uint64_t>(&scalar)) return std::to_string(*u);
  if (const auto* i = std::get_if<std::int64_t>(&scalar)) return std::to_string(*i);
  if (const auto* d = std::get_if<double>(&scalar)) return realText(*d);
  if (const auto* c = std::get_if<char16_t>(&scalar)) return characterText(*c);
  if (const auto* s = std::get_if<std::string>(&scalar)) return quoted(*s, indent);
  return "null";
}

// The elements of an array, as many to a line as fit.
std::string arrayText(const Value& value, std::size_t indent) {
  if (value.elements.empty()) return "{ }";
  std::string out = "{ ";
  std::size_t column = indent + 2;
  for (std::size_t i = 0; i < value.elements.size(); ++i) {
    const std::string element = scalarText(value.elements[i], indent);
    if (i > 0 && column + element.size() + 4 > kLineWidth) {
      out += "\n" + std::string(indent, ' ');
      column = indent;
    }
    out += element + (i + 1 < value.elements.size() ? ", " : " ");
    column += element.size() + 2;
  }
  return out + "}";
}

std::string valueText(const Value& value, std::size_t indent) {
  if (value.isNull) return "null";
  return value.isArray ? arrayText(value, indent) : scalarText(value.scalar, indent);
}

std::string qualifierText(const Qualifier& qualifier, std::size_t indent) {
  std::string out = qualifier.name;
  // [Key] means the same as [Key(true)].
  if (qualifier.value && !(isTrue(*qualifier.value))) {
    const Value& value = *qualifier.value;
    if (value.isArray && !value.isNull) {
      out += " " + valueText(value, indent + 3);
    } else if (!value.isArray) {
      const std::string text = valueText(value, indent + 3);
      out += text.find('\n') == std::string::npos && indent + out.size() + text.size() + 2 <= kLineWidth
                 ? "(" + text + ")"
                 : "(\n" + std::string(indent + 3, ' ') + text + ")";
    }
  }
  std::string flavors;
  if (qualifier.stated.toSubclass) flavors += *qualifier.stated.toSubclass ? " ToSubclass" : " Restricted";
  if (qualifier.stated.overridable) flavors += *qualifier.stated.overridable ? " EnableOverride" : " DisableOverride";
  if (qualifier.stated.translatable) flavors += " Translatable";
  return flavors.empty() ? out : out + " :" + flavors;
}

std::string qualifiersText(const Qualifiers& qualifiers, std::size_t indent) {
  if (qualifiers.empty()) return {};
  std::string out = std::string(indent, ' ') + "[";
  for (std::size_t i = 0; i < qualifiers.size(); ++i) {
    if (i > 0) out += ",\n" + std::string(indent + 1, ' ');
    out += qualifierText(qualifiers[i], indent + 1);
  }
  return out + "]\n";
}

std::string typeText(Type type, const std::string& referenceClass) {
  return type == Type::Reference ? referenceClass + " REF" : std::string(typeName(type));
}

std::string arrayMark(bool isArray, const std::optional<std::uint32_t>& size) {
  if (!isArray) return {};
  return size ? "[" + std::to_string(*size) + "]" : "[]";
}

std::string propertyText(const Property& property) {
  std::string out = qualifiersText(property.qualifiers, 2) + "  " + typeText(property.type, property.referenceClass) +
                    " " + property.name + arrayMark(property.isArray, property.arraySize);
  if (!property.defaultValue.isNull) out += " = " + valueText(property.defaultValue, 6);
  return out + ";\n";
}

std::string methodText(const Method& method) {
  std::string out =
      qualifiersText(method.qualifiers, 2) + "  " + std::string(typeName(method.returnType)) + " " + method.name + "(";
  for (std::size_t i = 0; i < method.parameters.size(); ++i) {
    const Parameter& parameter = method.parameters[i];
    out += std::string(i > 0 ? "," : "") + "\n" + qualifiersText(parameter.qualifiers, 6) + "      " +
           typeText(parameter.type, parameter.referenceClass) + " " + parameter.name +
           arrayMark(parameter.isArray, parameter.arraySize);
  }
  return out + ");\n";
}

std::string scopeText(std::uint16_t scope) {
  if ((scope & ScopeAny) == ScopeAny) return "any";
  constexpr std::array<std::string_view, 7> names = {"class",     "association", "indication", "property",
                                                     "reference", "method",      "parameter"};
  std::string out;
  for (std::size_t i = 0; i < names.size(); ++i) {
    if ((scope >> i & 1) != 0) out += (out.empty() ? "" : ", ") + std::string(names[i]);
  }
  return out;
}

}  // namespace

std::string writeMof(const QualifierType& type) {
  std::string out =
      "Qualifier " + type.name + " : " + std::string(typeName(type.type)) + arrayMark(type.isArray, type.arraySize);
  if (!type.defaultValue.isNull) out += " = " + valueText(type.defaultValue, 4);
  out += ", Scope(" + scopeText(type.scope) + "), Flavor(";
  out += type.flavor.overridable ? "EnableOverride" : "DisableOverride";
  out += type.flavor.toSubclass ? ", ToSubclass" : ", Restricted";
  if (type.flavor.translatable) out += ", Translatable";
  return out + ");\n";
}

std::string writeMof(const ClassDeclaration& declaration) {
  std::string out = qualifiersText(declaration.qualifiers, 0) + "class " + declaration.name;
  if (!declaration.superclass.empty()) out += " : " + declaration.superclass;
  out += " {\n";
  bool first = true;
  for (const Property& property : declaration.properties) {
    out += (first ? "" : "\n") + propertyText(property);
    first = false;
  }
  for (const Method& method : declaration.methods) {
    out += (first ? "" : "\n") + methodText(method);
    first = false;
  }
  return out + "};\n";
}

std::string writeMof(const InstanceDeclaration& instance) {
  std::string out = qualifiersText(instance.qualifiers, 0) + "instance of " + instance.className;
  if (!instance.alias.empty()) out += " as " + instance.alias;
  out += " {\n";
  for (const InstanceProperty& property : instance.properties) {
    out += qualifiersText(property.qualifiers, 2) + "  " + property.name + " = " + valueText(property.value, 6) + ";\n";
  }
  return out + "};\n";
}

std::string writeMofValue(const Value& value) { return valueText(value, 0); }

}  // namespace zorva::schema
