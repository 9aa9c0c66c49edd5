#include "cli/registration/RegistrationText.h"

#include <algorithm>
#include <cstdint>
#include <utility>

#include "schema/Mof.h"

namespace zorva::cli {

namespace {

using broker::ProviderEntry;

/// A kind of provider in the words of both servers (OpenPegasus: PG_ProviderCapabilities.ProviderType).
struct Kind {
  broker::MiKind kind;
  const char* sfcb;
  std::uint64_t pegasus;
};

constexpr Kind kKinds[] = {
    {broker::InstanceMi, "instance", 2},
    {broker::AssociationMi, "association", 3},
    {broker::MethodMi, "method", 5},
};

void addOnce(std::vector<std::string>& texts, const std::string& text) {
  if (std::find(texts.begin(), texts.end(), text) == texts.end()) texts.push_back(text);
}

std::string sfcbKinds(unsigned kinds) {
  std::string words;
  for (const Kind& each : kKinds) {
    if ((kinds & each.kind) != 0) words += std::string(words.empty() ? "" : " ") + each.sfcb;
  }
  return words;
}

schema::Value pegasusKinds(unsigned kinds) {
  std::vector<schema::Scalar> numbers;
  for (const Kind& each : kKinds) {
    if ((kinds & each.kind) != 0) numbers.emplace_back(each.pegasus);
  }
  return schema::Value::array(std::move(numbers));
}

/// An instance as MOF, after an empty line.
std::string instanceOf(const char* className, std::vector<std::pair<const char*, schema::Value>> properties) {
  schema::InstanceDeclaration instance;
  instance.className = className;
  for (auto& [name, value] : properties) instance.properties.push_back({{}, name, std::move(value), {}});
  return "\n" + schema::writeMof(instance);
}

schema::Value text(const std::string& value) { return schema::Value::of(value); }

std::string pegasusModule(const std::string& library, const std::string& version) {
  return instanceOf("PG_ProviderModule", {{"Name", text(library)},
                                          {"Vendor", text("Zorva")},
                                          {"Version", text(version)},
                                          {"InterfaceType", text("CMPI")},
                                          {"InterfaceVersion", text("2.0.0")},
                                          {"Location", text(library)}});
}

std::string pegasusCapabilities(const ProviderEntry& entry) {
  return instanceOf("PG_ProviderCapabilities", {{"ProviderModuleName", text(entry.library)},
                                                {"ProviderName", text(entry.prefix)},
                                                {"CapabilityID", text(entry.className)},
                                                {"ClassName", text(entry.className)},
                                                {"Namespaces", schema::Value::array({entry.nameSpace})},
                                                {"ProviderType", pegasusKinds(entry.kinds)},
                                                {"SupportedProperties", schema::Value::null(true)},
                                                {"SupportedMethods", schema::Value::null(true)}});
}

}  // namespace

std::string sfcbRegistration(const broker::ProviderRegistry& registry, std::string_view firstLine) {
  std::string out = "# " + std::string(firstLine) + "\n";
  for (const ProviderEntry& entry : registry.entries()) {
    out += "\n[" + entry.className + "]\n";
    out += "   provider: " + entry.prefix + "\n";
    out += "   location: " + entry.library + "\n";
    out += "   type: " + sfcbKinds(entry.kinds) + "\n";
    out += "   namespace: " + entry.nameSpace + "\n";
  }
  return out;
}

std::string pegasusRegistration(const broker::ProviderRegistry& registry, std::string_view firstLine,
                                const std::string& version) {
  std::string out = "// " + std::string(firstLine) + "\n";
  for (const std::string& library : librariesOf(registry)) out += pegasusModule(library, version);
  std::vector<std::string> prefixes;  // one provider may serve several classes
  for (const ProviderEntry& entry : registry.entries()) {
    if (std::find(prefixes.begin(), prefixes.end(), entry.prefix) != prefixes.end()) continue;
    prefixes.push_back(entry.prefix);
    out += instanceOf("PG_Provider", {{"ProviderModuleName", text(entry.library)}, {"Name", text(entry.prefix)}});
  }
  for (const ProviderEntry& entry : registry.entries()) out += pegasusCapabilities(entry);
  return out;
}

std::vector<std::string> librariesOf(const broker::ProviderRegistry& registry) {
  std::vector<std::string> libraries;
  for (const ProviderEntry& entry : registry.entries()) addOnce(libraries, entry.library);
  return libraries;
}

std::vector<std::string> nameSpacesOf(const broker::ProviderRegistry& registry) {
  std::vector<std::string> names;
  for (const ProviderEntry& entry : registry.entries()) addOnce(names, entry.nameSpace);
  return names;
}

}  // namespace zorva::cli
