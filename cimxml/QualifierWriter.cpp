#include "cimxml/QualifierWriter.h"

#include "cimxml/XmlText.h"

namespace zorva::cimxml {

namespace {

void appendScalar(std::string& out, const schema::Scalar& scalar) {
  if (std::holds_alternative<std::monostate>(scalar)) {
    out += "<VALUE.NULL/>";
    return;
  }
  out += "<VALUE>";
  std::visit(PlainContent(out), scalar);
  out += "</VALUE>";
}

void appendFlavor(std::string& out, const schema::Flavor& flavor) {
  appendFlag(out, "OVERRIDABLE", flavor.overridable, true);
  appendFlag(out, "TOSUBCLASS", flavor.toSubclass, true);
  appendFlag(out, "TRANSLATABLE", flavor.translatable, false);
}

}  // namespace

void appendFlag(std::string& out, std::string_view name, bool value, bool unlessSaid) {
  if (value != unlessSaid) appendAttribute(out, name, value ? "true" : "false");
}

void appendSchemaValue(std::string& out, const schema::Value& value, schema::Type type) {
  if (value.isNull || type == schema::Type::Reference) return;
  if (!value.isArray) {
    appendScalar(out, value.scalar);
    return;
  }
  out += "<VALUE.ARRAY>";
  for (const schema::Scalar& element : value.elements) appendScalar(out, element);
  out += "</VALUE.ARRAY>";
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
