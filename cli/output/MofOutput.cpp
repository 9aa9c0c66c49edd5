#include "cli/output/MofOutput.h"

#include "broker/objects/PathText.h"
#include "cli/output/Text.h"
#include "schema/Mof.h"

namespace zorva::cli {

namespace {

struct MofScalar {
  schema::Scalar operator()(const std::string& text) const { return asUtf8(text); }
  schema::Scalar operator()(const broker::Boxed<broker::ObjectPath>& path) const {
    return asUtf8(broker::pathText(*path));
  }
  schema::Scalar operator()(const broker::Boxed<broker::Instance>& instance) const { return instanceMof(*instance); }
  template <typename Plain>
  schema::Scalar operator()(const Plain& plain) const {
    return plain;
  }
};

schema::Value mofValue(const broker::Value& value) {
  if (value.isNull) return schema::Value::null(value.isArray);
  if (!value.isArray) return schema::Value::of(std::visit(MofScalar(), value.scalar));
  std::vector<schema::Scalar> elements;
  for (const broker::Scalar& element : value.elements) elements.push_back(std::visit(MofScalar(), element));
  return schema::Value::array(std::move(elements));
}

}  // namespace

std::string instanceMof(const broker::Instance& instance) {
  schema::InstanceDeclaration declaration;
  declaration.className = instance.path.className;
  for (const broker::Property& property : instance.properties) {
    schema::InstanceProperty& written = declaration.properties.emplace_back();
    written.name = property.name;
    written.value = mofValue(property.value);
  }
  return schema::writeMof(declaration);
}

}  // namespace zorva::cli
