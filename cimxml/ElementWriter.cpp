#include "cimxml/ElementWriter.h"

#include <algorithm>

#include "cimxml/QualifierWriter.h"
#include "cimxml/XmlText.h"

namespace zorva::cimxml {

namespace {

/// The content of a VALUE or KEYVALUE element.
class ContentWriter : public PlainContent {
 public:
  using PlainContent::operator();
  using PlainContent::PlainContent;

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
  std::visit(ContentWriter(out), scalar);
  out += isReference ? "</VALUE.REFERENCE>" : "</VALUE>";
}

const char* keyValueType(schema::Type type) noexcept {
  if (type == schema::Type::Boolean) return "boolean";
  return schema::isUnsigned(type) || schema::isSigned(type) || schema::isReal(type) ? "numeric" : "string";
}

void appendKeyBindingBegin(std::string& out, const broker::NamedValue& key) {
  out += "<KEYBINDING";
  appendAttribute(out, "NAME", key.name);
  out += '>';
}

void appendKeyBinding(std::string& out, const broker::NamedValue& key) {
  if (key.value.type == schema::Type::Reference) {
    appendKeyBindingBegin(out, key);
    appendValue(out, key.value);
    out += "</KEYBINDING>";
  } else {
    appendKeyBegin(out, key);
    std::visit(ContentWriter(out), key.value.scalar);
    appendKeyEnd(out);
  }
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

void appendPropertyBegin(std::string& out, const broker::Property& property, const broker::Instance& instance,
                         const InstanceDetail& detail) {
  out += '<';
  out += propertyElement(property.value);
  appendAttribute(out, "NAME", property.name);
  if (property.value.type != schema::Type::Reference) {
    appendAttribute(out, "TYPE", schema::typeName(property.value.type));
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
}

/// Whether the declaration alone decides on the text around the value. A property with a declaration has its name.
bool isAsDeclared(const broker::Property& property) noexcept {
  return property.declaration != nullptr && property.value.type == property.declaration->type &&
         property.value.isArray == property.declaration->isArray && !holdsInstance(property.value);
}

void appendPropertyEnd(std::string& out, const broker::Property& property) {
  out += "</";
  out += propertyElement(property.value);
  out += '>';
}

}  // namespace

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

void appendKeyBegin(std::string& out, const broker::NamedValue& key) {
  appendKeyBindingBegin(out, key);
  out += "<KEYVALUE";
  appendAttribute(out, "VALUETYPE", keyValueType(key.value.type));
  appendAttribute(out, "TYPE", schema::typeName(key.value.type));
  out += '>';
}

void appendKeyEnd(std::string& out) { out += "</KEYVALUE></KEYBINDING>"; }

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
  InstanceWriter(detail).append(out, instance);
}

void InstanceWriter::append(std::string& out, const broker::Instance& instance) {
  const auto& [text, values] = formOf(instance);
  std::size_t done = 0;
  for (std::size_t i = 0; i < values.size(); ++i) {
    const broker::Value& value = instance.properties[i].value;
    if (value.isNull) continue;
    out.append(text, done, values[i].place - done);
    done = values[i].place;
    appendValue(out, value);
  }
  out.append(text, done);
}

const InstanceWriter::Form& InstanceWriter::formOf(const broker::Instance& instance) {
  if (!fits(instance)) makeForm(instance);
  return form_;
}

bool InstanceWriter::fits(const broker::Instance& instance) const noexcept {
  if (declaration_ == nullptr || instance.declaration != declaration_) return false;
  return std::equal(form_.values.begin(), form_.values.end(), instance.properties.begin(), instance.properties.end(),
                    [](const Form::ValuePlace& known, const broker::Property& property) {
                      return property.declaration == known.declaration && isAsDeclared(property);
                    });
}

void InstanceWriter::makeForm(const broker::Instance& instance) {
  declaration_ = nullptr;  // until the form is complete
  form_.values.clear();
  std::string& text = form_.text;
  text = "<INSTANCE";
  appendAttribute(text, "CLASSNAME", instance.path.className);
  text += '>';
  if (detail_.qualifiers != nullptr && instance.declaration != nullptr) {
    appendQualifiers(text, instance.declaration->qualifiers(), false, *detail_.qualifiers);
  }
  for (const broker::Property& property : instance.properties) {
    appendPropertyBegin(text, property, instance, detail_);
    form_.values.push_back({isAsDeclared(property) ? property.declaration : nullptr, text.size()});
    appendPropertyEnd(text, property);
  }
  text += "</INSTANCE>";
  declaration_ = instance.declaration;
}

}  // namespace zorva::cimxml
