#include "cimxml/ClassWriter.h"

#include <algorithm>

#include "cimxml/ElementWriter.h"
#include "cimxml/QualifierWriter.h"
#include "cimxml/XmlText.h"

namespace zorva::cimxml {

namespace {

/// The attributes that a property or a method has for the class that contains it.
void appendOrigin(std::string& out, const schema::Class* origin, const schema::Class& at, const ClassDetail& detail) {
  if (detail.classOrigin && origin != nullptr) appendAttribute(out, "CLASSORIGIN", origin->name());
  appendFlag(out, "PROPAGATED", origin != &at, false);
}

/// An EmbeddedObject or EmbeddedInstance qualifier is also an attribute of the element (DSP0201 5.3.1).
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
  // Some clients refuse the attribute on an array, because DTDs before 2.3 did not have it. The qualifier says the
  // same.
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
                     [name](const std::string& listed) { return util::sameName(listed, name); });
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

}  // namespace zorva::cimxml
