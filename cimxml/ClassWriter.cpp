#include "cimxml/ClassWriter.h"

#include <algorithm>

#include "broker/objects/Value.h"
#include "cimxml/ElementWriter.h"

namespace zorva::cimxml {

namespace {

broker::Scalar scalarOf(const schema::Scalar& scalar) {
  return std::visit([](const auto& value) { return broker::Scalar(value); }, scalar);
}

/// VALUE or VALUE.ARRAY; nothing for null. Of a reference's default value, nothing: the DTD has no place for a path
/// that is a text.
void appendSchemaValue(std::string& out, const schema::Value& value, schema::Type type) {
  if (value.isNull || type == schema::Type::Reference) return;
  broker::Value plain = broker::Value::null(type, value.isArray);
  plain.isNull = false;
  if (!value.isArray) plain.scalar = scalarOf(value.scalar);
  for (const schema::Scalar& element : value.elements) plain.elements.push_back(scalarOf(element));
  appendValue(out, plain);
}

void appendFlag(std::string& out, std::string_view name, bool value, bool unlessSaid) {
  if (value != unlessSaid) appendAttribute(out, name, value ? "true" : "false");
}

void appendFlavor(std::string& out, const schema::Flavor& flavor) {
  appendFlag(out, "OVERRIDABLE", flavor.overridable, true);
  appendFlag(out, "TOSUBCLASS", flavor.toSubclass, true);
  appendFlag(out, "TRANSLATABLE", flavor.translatable, false);
}

/// The attributes that a property or a method has for the class in which it stands.
void appendOrigin(std::string& out, const schema::Class* origin, const schema::Class& at, const ClassDetail& detail) {
  if (detail.classOrigin && origin != nullptr) appendAttribute(out, "CLASSORIGIN", origin->name());
  appendFlag(out, "PROPAGATED", origin != &at, false);
}

/// An EmbeddedObject or EmbeddedInstance qualifier shows in the element too (DSP0201 5.3.1).
void appendEmbedded(std::string& out, const schema::Qualifiers& qualifiers) {
  if (schema::findQualifier(qualifiers, "EmbeddedInstance") != nullptr) {
    appendAttribute(out, "EmbeddedObject", "instance");
  } else if (schema::hasQualifier(qualifiers, "EmbeddedObject")) {
    appendAttribute(out, "EmbeddedObject", "object");
  }
}

void appendProperty(std::string& out, const schema::ClassProperty& property, const schema::Class& at,
                    const ClassDetail& detail, const schema::ClassRepository& classes) {
  const bool isReference = property.type == schema::Type::Reference;
  const char* const element = isReference ? "PROPERTY.REFERENCE" : property.isArray ? "PROPERTY.ARRAY" : "PROPERTY";
  out.append("<").append(element);
  appendAttribute(out, "NAME", property.name);
  if (isReference) {
    appendAttribute(out, "REFERENCECLASS", property.referenceClass);
  } else {
    appendAttribute(out, "TYPE", schema::typeName(property.type));
  }
  if (property.arraySize) appendAttribute(out, "ARRAYSIZE", std::to_string(*property.arraySize));
  appendOrigin(out, property.origin, at, detail);
  // Some clients refuse the attribute on an array, where DTDs before 2.3 did not have it. The qualifier says the same.
  if (!isReference && !property.isArray) appendEmbedded(out, property.qualifiers);
  out += '>';
  if (detail.qualifiers) appendQualifiers(out, property.qualifiers, property.origin != &at, classes);
  appendSchemaValue(out, property.defaultValue, property.type);
  out.append("</").append(element).append(">");
}

void appendParameter(std::string& out, const schema::Parameter& parameter, bool inherited, const ClassDetail& detail,
                     const schema::ClassRepository& classes) {
  const bool isReference = parameter.type == schema::Type::Reference;
  const char* const element = parameter.isArray ? (isReference ? "PARAMETER.REFARRAY" : "PARAMETER.ARRAY")
                                                : (isReference ? "PARAMETER.REFERENCE" : "PARAMETER");
  out.append("<").append(element);
  appendAttribute(out, "NAME", parameter.name);
  if (isReference) {
    appendAttribute(out, "REFERENCECLASS", parameter.referenceClass);
  } else {
    appendAttribute(out, "TYPE", schema::typeName(parameter.type));
  }
  if (parameter.arraySize) appendAttribute(out, "ARRAYSIZE", std::to_string(*parameter.arraySize));
  out += '>';
  if (detail.qualifiers) appendQualifiers(out, parameter.qualifiers, inherited, classes);
  out.append("</").append(element).append(">");
}

void appendMethod(std::string& out, const schema::ClassMethod& method, const schema::Class& at,
                  const ClassDetail& detail, const schema::ClassRepository& classes) {
  const bool inherited = method.origin != &at;
  out += "<METHOD";
  appendAttribute(out, "NAME", method.name);
  appendAttribute(out, "TYPE", schema::typeName(method.returnType));
  appendOrigin(out, method.origin, at, detail);
  out += '>';
  if (detail.qualifiers) appendQualifiers(out, method.qualifiers, inherited, classes);
  for (const schema::Parameter& parameter : method.parameters) {
    appendParameter(out, parameter, inherited, detail, classes);
  }
  out += "</METHOD>";
}

bool isListed(const ClassDetail& detail, std::string_view name) {
  return !detail.propertyList ||
         std::any_of(detail.propertyList->begin(), detail.propertyList->end(),
                     [name](const std::string& listed) { return schema::sameName(listed, name); });
}

}  // namespace

void appendClass(std::string& out, const schema::Class& declared, const ClassDetail& detail,
                 const schema::ClassRepository& classes) {
  out += "<CLASS";
  appendAttribute(out, "NAME", declared.name());
  if (declared.superclass() != nullptr) appendAttribute(out, "SUPERCLASS", declared.superclass()->name());
  out += '>';
  if (detail.qualifiers) {
    schema::Qualifiers shown;
    for (const schema::Qualifier& qualifier : declared.qualifiers()) {
      if (!detail.localOnly || !qualifier.propagated) shown.push_back(qualifier);
    }
    appendQualifiers(out, shown, false, classes);
  }
  for (const schema::ClassProperty* property : declared.properties()) {
    if (detail.localOnly && property->origin != &declared) continue;
    if (isListed(detail, property->name)) appendProperty(out, *property, declared, detail, classes);
  }
  for (const schema::ClassMethod* method : declared.methods()) {
    if (!detail.localOnly || method->origin == &declared) appendMethod(out, *method, declared, detail, classes);
  }
  out += "</CLASS>";
}

void appendClassName(std::string& out, std::string_view name) {
  out += "<CLASSNAME";
  appendAttribute(out, "NAME", name);
  out += "/>";
}

void appendClassPath(std::string& out, std::string_view host, std::string_view nameSpace, std::string_view name) {
  out += "<CLASSPATH>";
  appendNamespacePath(out, host, nameSpace);
  appendClassName(out, name);
  out += "</CLASSPATH>";
}

void appendQualifiers(std::string& out, const schema::Qualifiers& qualifiers, bool inherited,
                      const schema::ClassRepository& classes) {
  for (const schema::Qualifier& qualifier : qualifiers) {
    const schema::QualifierType* type = classes.findQualifierType(qualifier.name);
    if (type == nullptr) continue;  // none can be in a class of the repository
    out += "<QUALIFIER";
    appendAttribute(out, "NAME", type->name);
    appendAttribute(out, "TYPE", schema::typeName(type->type));
    appendFlag(out, "PROPAGATED", inherited || qualifier.propagated, false);
    appendFlavor(out, qualifier.flavor);
    out += '>';
    if (qualifier.value) appendSchemaValue(out, *qualifier.value, type->type);
    out += "</QUALIFIER>";
  }
}

void appendQualifierType(std::string& out, const schema::QualifierType& type) {
  out += "<QUALIFIER.DECLARATION";
  appendAttribute(out, "NAME", type.name);
  appendAttribute(out, "TYPE", schema::typeName(type.type));
  appendAttribute(out, "ISARRAY", type.isArray ? "true" : "false");
  if (type.arraySize) appendAttribute(out, "ARRAYSIZE", std::to_string(*type.arraySize));
  appendFlavor(out, type.flavor);
  out += "><SCOPE";
  constexpr std::pair<schema::Scope, std::string_view> kScopes[] = {
      {schema::ScopeClass, "CLASS"},          {schema::ScopeAssociation, "ASSOCIATION"},
      {schema::ScopeReference, "REFERENCE"},  {schema::ScopeProperty, "PROPERTY"},
      {schema::ScopeMethod, "METHOD"},        {schema::ScopeParameter, "PARAMETER"},
      {schema::ScopeIndication, "INDICATION"}};
  for (const auto& [bit, name] : kScopes) appendFlag(out, name, (type.scope & bit) != 0, false);
  out += "/>";
  appendSchemaValue(out, type.defaultValue, type.type);
  out += "</QUALIFIER.DECLARATION>";
}

}  // namespace zorva::cimxml
