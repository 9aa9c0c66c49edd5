#include "schema/Schema.h"

#include <stdexcept>

#include "schema/BuiltInMof.h"
#include "schema/Mof.h"
#include "util/Names.h"

namespace zorva::schema {

namespace {

MofInclude builtInFile(std::string_view name) {
  for (std::size_t i = 0; i < kBuiltInMofCount; ++i) {
    if (kBuiltInMof[i].name == name) return {std::string(name), std::string(kBuiltInMof[i].text), {}};
  }
  return {std::string(name), {}, "there is no such file in the program"};
}

std::string_view withoutSlashes(std::string_view name) noexcept {
  while (name.starts_with('/')) name.remove_prefix(1);
  while (name.ends_with('/')) name.remove_suffix(1);
  return name;
}

}  // namespace

std::shared_ptr<ClassRepository> loadBuiltInClasses(ClassSet set) {
  auto classes = std::make_shared<ClassRepository>();
  RepositorySink sink(*classes);
  const MofInclude top = builtInFile(set == ClassSet::Interop ? "interop.mof" : "profile.mof");
  const auto includer = [](std::string_view name, std::string_view) { return builtInFile(name); };
  if (const auto outcome = parseMof(top.text, top.file, sink, includer); !outcome) {
    throw std::logic_error("the built-in schema cannot be read: " + outcome.error().text());
  }
  return classes;
}

bool sameNamespace(std::string_view a, std::string_view b) noexcept {
  return util::sameName(withoutSlashes(a), withoutSlashes(b));
}

}  // namespace zorva::schema
