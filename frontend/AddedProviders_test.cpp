#include "frontend/AddedProviders.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "agent/config/Config.h"
#include "agent/testing/TemporaryDirectory.h"
#include "schema/Schema.h"

namespace zorva::frontend {
namespace {

using broker::ProviderEntry;
using broker::ProviderRegistry;
using testing::HasSubstr;
using zorva::agent::testing::TemporaryDirectory;

constexpr const char* kMof = "class EXAMPLE_A : CIM_ManagedElement { [Key] string Name; };";
constexpr const char* kReg =
    "# a comment\n[EXAMPLE_A]\r\n  provider: AProvider\n  location: a # here\n  type: instance method\n"
    "  unload: never\n  namespace: root/cimv2 root/other\n";

struct Added {
  explicit Added(const std::string& directory) { addProviders(directory, registry, *classes); }
  ProviderRegistry registry = ProviderRegistry::builtIn();
  std::shared_ptr<schema::ClassRepository> classes = schema::loadBuiltInClasses();
};

std::string errorOf(const std::string& directory) {
  try {
    const Added added(directory);
  } catch (const agent::ConfigError& error) {
    return error.what();
  }
  return {};
}

TEST(AddedProviders, AreReadFromRegistrationsAndMof) {
  const TemporaryDirectory directory;
  directory.write("a.mof", kMof);
  directory.write("a.reg", kReg);
  directory.write("README", "[");
  const Added added(directory.path());
  EXPECT_NE(added.classes->find("EXAMPLE_A"), nullptr);
  for (const char* nameSpace : {"root/cimv2", "root/other"}) {
    const ProviderEntry* entry = added.registry.find(nameSpace, "example_a");
    ASSERT_NE(entry, nullptr) << nameSpace;
    EXPECT_EQ(entry->prefix, "AProvider");
    EXPECT_EQ(entry->library, "a");
    EXPECT_EQ(entry->kinds, unsigned{broker::InstanceMi} | broker::MethodMi);
  }
  EXPECT_NE(added.registry.find("root/cimv2", "ZORVA_DNSProtocolEndPoint"), nullptr);
}

TEST(AddedProviders, TakeTheLibraryThatIsBesideTheRegistration) {
  const TemporaryDirectory directory;
  directory.write("a.mof", kMof);
  directory.write("a.reg", kReg);
  const std::string library = directory.write("liba.so", "");
  EXPECT_EQ(Added(directory.path()).registry.find("root/cimv2", "EXAMPLE_A")->library, library);
}

TEST(AddedProviders, ErrorsNameFileAndLine) {
  const struct {
    const char* text;
    const char* error;
  } cases[] = {
      {"provider: A\n", "a.reg:1: expected the name of a class in brackets first"},
      {"[EXAMPLE_A\n", "a.reg:1: expected \"]\" at the end of the line"},
      {"[EXAMPLE_B]\n", "a.reg:1: EXAMPLE_B: there is no such class: a file .mof beside this must declare it"},
      {"[EXAMPLE_A]\nprovider\n", "a.reg:2: EXAMPLE_A: expected \"key: value\""},
      {"[EXAMPLE_A]\nprovider:\n", "a.reg:2: EXAMPLE_A: provider has no value"},
      {"[EXAMPLE_A]\ngroup: x\n", "a.reg:2: EXAMPLE_A: there is no key \"group\""},
      {"[EXAMPLE_A]\ntype: indication\n", "a.reg:2: EXAMPLE_A: type \"indication\" is not known here"},
      {"[EXAMPLE_A]\nprovider: A\ntype: instance\n", "a.reg:3: EXAMPLE_A: needs provider, location and type"},
      {"[ZORVA_DNSSettingData]\nprovider: A\nlocation: a\ntype: instance\n",
       "ZORVA_DNSSettingData: has a provider already"},
  };
  const TemporaryDirectory directory;
  directory.write("a.mof", kMof);
  for (const auto& each : cases) {
    directory.write("a.reg", each.text);
    EXPECT_THAT(errorOf(directory.path()), HasSubstr(each.error)) << each.text;
  }
  directory.write("a.reg", kReg);
  directory.write("b.mof", "\nclass");
  EXPECT_THAT(errorOf(directory.path()), HasSubstr("b.mof:2"));
}

TEST(AddedProviders, DirectoryThatIsNamedMustExist) {
  const TemporaryDirectory directory;
  EXPECT_THAT(errorOf(directory / "none"), HasSubstr("none: cannot be read: No such file or directory"));
  EXPECT_EQ(errorOf(usualProviders()), "");
}

}  // namespace
}  // namespace zorva::frontend
