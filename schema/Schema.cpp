#include "schema/Schema.h"

#include <stdexcept>
#include <utility>

#include "schema/BuiltInClasses.h"
#include "schema/CompiledClasses.h"
#include "util/Names.h"

namespace zorva::schema {

namespace {

void addTo(ClassRepository& classes, std::string_view compiled) {
  Declarations declarations = readCompiledDeclarations(compiled);
  const auto require = [](const Expected<void, SchemaError>& outcome) {
    if (!outcome) throw std::logic_error("the built-in schema is wrong: " + outcome.error().text());
  };
  for (QualifierType& type : declarations.qualifierTypes) require(classes.add(std::move(type)));
  for (ClassDeclaration& declaration : declarations.classes) require(classes.add(std::move(declaration)));
}

std::string_view withoutSlashes(std::string_view name) noexcept {
  while (name.starts_with('/')) name.remove_prefix(1);
  while (name.ends_with('/')) name.remove_suffix(1);
  return name;
}

}  // namespace

std::shared_ptr<ClassRepository> loadBuiltInClasses(ClassSet set) {
  auto classes = std::make_shared<ClassRepository>();
  addTo(*classes, kProfileClasses);
  if (set == ClassSet::Interop) addTo(*classes, kInteropClasses);
  return classes;
}

bool sameNamespace(std::string_view a, std::string_view b) noexcept {
  return util::sameName(withoutSlashes(a), withoutSlashes(b));
}

}  // namespace zorva::schema
