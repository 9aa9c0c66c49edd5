#include <dlfcn.h>
#include <unistd.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <map>
#include <memory>
#include <set>
#include <sstream>

#include "broker/core/ProviderRegistry.h"
#include "cli/registration/Placement.h"
#include "cli/testing/Running.h"
#include "schema/Mof.h"
#include "schema/Schema.h"

namespace zorva::cli {
namespace {

namespace fs = std::filesystem;
using broker::ProviderEntry;
using broker::ProviderRegistry;
using testing::Contains;
using testing::ElementsAre;
using testing::IsSupersetOf;

std::vector<std::string> linesOf(const std::string& text) {
  std::vector<std::string> lines;
  std::istringstream in(text);
  for (std::string line; std::getline(in, line);) lines.push_back(line);
  return lines;
}

/// The registration as the program prints it.
std::string printed(const std::string& server) { return shown(TestHost(), {"register", server, "--print"}); }

/// The kinds that a library has create functions for.
unsigned exportedKinds(const std::string& library, const std::string& prefix) {
  const std::unique_ptr<void, int (*)(void*)> loaded(
      ::dlopen((ZORVA_LIB_DIR "/lib" + library + ".so.1").c_str(), RTLD_NOW | RTLD_LOCAL), ::dlclose);
  if (loaded == nullptr) return 0;
  unsigned kinds = 0;
  for (const auto& [kind, name] :
       {std::pair(broker::InstanceMi, "InstanceMI"), std::pair(broker::AssociationMi, "AssociationMI"),
        std::pair(broker::MethodMi, "MethodMI")}) {
    if (::dlsym(loaded.get(), (prefix + "_Create_" + name).c_str()) != nullptr) kinds |= kind;
  }
  return kinds;
}

// ---- The texts ----

TEST(Registration, OfSfcbHasASectionOfFiveLinesForEachClassAndNothingElse) {
  std::vector<std::string> expected{"# " + std::string(kOwnMark)};
  const ProviderRegistry registry = ProviderRegistry::builtIn();
  for (const ProviderEntry& entry : registry.entries()) {
    std::string kinds = "instance";
    const unsigned exported = exportedKinds(entry.library, entry.prefix);
    if ((exported & broker::AssociationMi) != 0) kinds += " association";
    if ((exported & broker::MethodMi) != 0) kinds += " method";
    for (const std::string& line :
         {std::string(), "[" + entry.className + "]", "   provider: " + entry.prefix, "   location: " + entry.library,
          "   type: " + kinds, std::string("   namespace: root/cimv2")}) {
      expected.push_back(line);
    }
  }
  EXPECT_EQ(linesOf(printed("sfcb")), expected);
  EXPECT_EQ(expected.size(), 1U + 6 * 16);
}

TEST(Registration, HasAllConcreteClassesOfTheSchemaAndTheKindsThatTheyNeed) {
  const auto classes = schema::loadBuiltInClasses();
  const ProviderRegistry registry = ProviderRegistry::builtIn();
  std::set<std::string> registered;
  for (const ProviderEntry& entry : registry.entries()) {
    registered.insert(entry.className);
    const schema::Class* declared = classes->find(entry.className);
    ASSERT_NE(declared, nullptr) << entry.className;
    EXPECT_EQ(declared->name(), entry.className) << "is spelt as in the schema";
    EXPECT_EQ(exportedKinds(entry.library, entry.prefix), entry.kinds) << entry.prefix;
    EXPECT_EQ((entry.kinds & broker::AssociationMi) != 0, declared->isAssociation()) << entry.className;
    EXPECT_EQ((entry.kinds & broker::MethodMi) != 0,
              !declared->methods().empty() && entry.className.find("DNSProtocol") != std::string::npos)
        << entry.className;
  }
  for (const schema::Class* each : classes->classes()) {
    if (!each->name().starts_with("ZORVA_")) continue;
    EXPECT_TRUE(registered.contains(each->name())) << each->name();
  }
}

/// The three classes of OpenPegasus, as far as a registration uses them.
constexpr const char* kPegasusClasses = R"(
Qualifier Key : boolean = false, Scope(property, reference), Flavor(DisableOverride, ToSubclass);
class PG_ProviderModule {
  [Key] string Name; string Vendor; string Version; string InterfaceType; string InterfaceVersion; string Location;
};
class PG_Provider { [Key] string ProviderModuleName; [Key] string Name; };
class PG_ProviderCapabilities {
  [Key] string ProviderModuleName; [Key] string ProviderName; [Key] string CapabilityID; string ClassName;
  string Namespaces[]; uint16 ProviderType[]; string SupportedProperties[]; string SupportedMethods[];
};
)";

using Properties = std::map<std::string, schema::Value>;

/// Checks each instance against its class, and keeps it.
class Instances : public schema::RepositorySink {
 public:
  explicit Instances(schema::ClassRepository& classes) : RepositorySink(classes), classes_(classes) {}

  Expected<void, schema::SchemaError> instance(schema::InstanceDeclaration instance,
                                               std::string_view /*file*/) override {
    const schema::Class* declared = classes_.find(instance.className);
    if (declared == nullptr) {
      ADD_FAILURE() << instance.className;
      return {};
    }
    Properties properties;
    for (schema::InstanceProperty& each : instance.properties) {
      const schema::ClassProperty* property = declared->findProperty(each.name);
      if (property == nullptr) {
        ADD_FAILURE() << instance.className << " has no " << each.name;
        continue;
      }
      EXPECT_EQ(schema::fitValue(each.value, property->type, property->isArray), std::nullopt) << each.name;
      properties[each.name] = each.value;
    }
    EXPECT_EQ(properties.size(), declared->properties().size()) << instance.className << " has each property once";
    all[instance.className].push_back(std::move(properties));
    return {};
  }

  std::map<std::string, std::vector<Properties>> all;

 private:
  schema::ClassRepository& classes_;
};

std::string textAt(const Properties& instance, const std::string& name) {
  return std::string(schema::textOf(instance.at(name)));
}

Instances readPegasus(schema::ClassRepository& classes) {
  Instances instances(classes);
  for (const std::string& text : {std::string(kPegasusClasses), printed("pegasus")}) {
    const auto outcome = schema::parseMof(text, "registration", instances);
    EXPECT_TRUE(outcome) << outcome.error().text();
  }
  return instances;
}

TEST(Registration, OfPegasusHasAModuleForEachLibraryAndAProviderForEachPrefix) {
  schema::ClassRepository classes;
  const Instances read = readPegasus(classes);
  std::vector<std::string> modules;
  for (const Properties& each : read.all.at("PG_ProviderModule")) {
    EXPECT_EQ(textAt(each, "Name"), textAt(each, "Location"));
    EXPECT_TRUE(fs::exists(ZORVA_LIB_DIR "/lib" + textAt(each, "Location") + ".so.1"));
    EXPECT_EQ(textAt(each, "InterfaceType") + " " + textAt(each, "InterfaceVersion"), "CMPI 2.0.0");
    EXPECT_EQ(textAt(each, "Vendor"), "Zorva");
    EXPECT_THAT(textAt(each, "Version"), testing::ContainsRegex("^[0-9]+\\.[0-9]+\\.[0-9]+$"));
    modules.push_back(textAt(each, "Name"));
  }
  EXPECT_THAT(modules, ElementsAre("zorvadnsclientprofileprovider", "zorvahostprofileprovider"));
  std::set<std::string> providers;
  for (const Properties& each : read.all.at("PG_Provider")) {
    EXPECT_NE(exportedKinds(textAt(each, "ProviderModuleName"), textAt(each, "Name")), 0U) << textAt(each, "Name");
    EXPECT_TRUE(providers.insert(textAt(each, "Name")).second) << textAt(each, "Name");
  }
  EXPECT_EQ(providers.size(), 15U) << "one of the companions serves two classes";
}

TEST(Registration, OfPegasusHasCapabilitiesForEachClassWithItsKinds) {
  schema::ClassRepository classes;
  const Instances read = readPegasus(classes);
  const ProviderRegistry registry = ProviderRegistry::builtIn();
  std::set<std::string> ids;
  for (const Properties& each : read.all.at("PG_ProviderCapabilities")) {
    const ProviderEntry* entry = registry.find("root/cimv2", textAt(each, "ClassName"));
    ASSERT_NE(entry, nullptr) << textAt(each, "ClassName");
    EXPECT_EQ(textAt(each, "ProviderModuleName"), entry->library);
    EXPECT_EQ(textAt(each, "ProviderName"), entry->prefix);
    EXPECT_TRUE(ids.insert(textAt(each, "CapabilityID")).second);
    EXPECT_EQ(each.at("Namespaces"), schema::Value::array({std::string("root/cimv2")}));
    std::vector<schema::Scalar> kinds{std::uint64_t{2}};
    const unsigned exported = exportedKinds(entry->library, entry->prefix);
    if ((exported & broker::AssociationMi) != 0) kinds.emplace_back(std::uint64_t{3});
    if ((exported & broker::MethodMi) != 0) kinds.emplace_back(std::uint64_t{5});
    EXPECT_EQ(each.at("ProviderType"), schema::Value::array(kinds)) << entry->className;
    EXPECT_TRUE(each.at("SupportedProperties").isNull);
    EXPECT_TRUE(each.at("SupportedMethods").isNull);
  }
  EXPECT_EQ(ids.size(), registry.entries().size());
}

// ---- What is put where ----

/// A machine with the directories of both servers.
class Register : public ::testing::Test {
 protected:
  Register() {
    for (const char* each : {"stage", "lib"}) fs::create_directory(at(each));
  }

  std::string at(const std::string& name) const { return host_.directory() / name; }
  Words words(const std::string& server, const Words& more = {}) const {
    Words all{"register", server, "--staging", at("stage"), "--library-dir", at("lib")};
    all.insert(all.end(), more.begin(), more.end());
    return all;
  }

  /// Every file and link below the two directories.
  std::set<std::string> present() const {
    std::set<std::string> names;
    for (const char* each : {"stage", "lib"}) {
      for (const fs::directory_entry& entry : fs::recursive_directory_iterator(at(each))) {
        if (entry.is_symlink() || entry.is_regular_file())
          names.insert(entry.path().lexically_relative(at("")).string());
      }
    }
    return names;
  }

  TestHost host_;
  const std::set<std::string> links_{"lib/libzorvadnsclientprofileprovider.so", "lib/libzorvahostprofileprovider.so"};
};

TEST_F(Register, PutsLinksClassesAndRegistrationInPlaceAndSaysWhatToRun) {
  const std::string out = shown(host_, words("sfcb"));
  EXPECT_THAT(present(), IsSupersetOf(links_));
  EXPECT_THAT(present(), IsSupersetOf({"stage/regs/zorva.reg", "stage/mofs/root/cimv2/zorva.mof"}));
  EXPECT_EQ(present().size(), 4U);
  EXPECT_EQ(fs::read_symlink(at("lib/libzorvahostprofileprovider.so")),
            ZORVA_LIB_DIR "/libzorvahostprofileprovider.so.1");
  EXPECT_EQ(contentsOf(at("stage/regs/zorva.reg")), printed("sfcb"));
  EXPECT_THAT(out, HasSubstr("put  " + at("stage/regs/zorva.reg") + "\n"));
  EXPECT_THAT(out, HasSubstr("\n  sfcbrepos -f -s " + at("stage")));
  EXPECT_THAT(out, HasSubstr("systemctl restart sblim-sfcb"));
  EXPECT_THAT(out, HasSubstr("providerDirs in /etc/sfcb/sfcb.cfg names " + at("lib")));
  EXPECT_THAT(out, HasSubstr("ZORVAGENT_CONFIG"));
}

TEST_F(Register, ItsClassesAreReadAfterThoseOfTheSchema) {
  shown(host_, words("pegasus"));
  EXPECT_THAT(contentsOf(at("stage/zorva.mof")), HasSubstr(contentsOf(ZORVA_SOURCE_DIR "/schema/zorva.mof")));
  schema::ClassRepository classes;
  schema::RepositorySink sink(classes);
  for (const std::string& file :
       {std::string(ZORVA_SOURCE_DIR "/schema/qualifiers.mof"), std::string(ZORVA_SOURCE_DIR "/schema/cim-core.mof"),
        std::string(ZORVA_SOURCE_DIR "/schema/cim-network.mof"), at("stage/zorva.mof")}) {
    const auto outcome = schema::parseMofFile(file, sink);
    ASSERT_TRUE(outcome) << outcome.error().text();
  }
  EXPECT_NE(classes.find("ZORVA_DNSProtocolEndPoint"), nullptr);
}

TEST_F(Register, NamesTheCommandsOfPegasusAndMarksThoseThatAreNotHere) {
  fs::create_directory(at("bin"));
  std::ofstream(at("bin/cimmof")) << "#!/bin/sh\n";
  fs::permissions(at("bin/cimmof"), fs::perms::all);
  const std::string out = host_.runWith({{"PATH", at("bin")}}, words("pegasus")).out;
  EXPECT_THAT(out, HasSubstr("  cimmof -nroot/cimv2 " + at("stage/zorva.mof") + "\n"));
  EXPECT_THAT(out, HasSubstr("  cimmof -nroot/PG_InterOp " + at("stage/zorva-pegasus.mof") + "\n"));
  const std::string offline = host_.runWith({{"PATH", at("bin")}}, words("pegasus", {"--repository", at("repo")})).out;
  EXPECT_THAT(offline, HasSubstr("  cimmofl -R" + at("repo") + " -nroot/PG_InterOp " + at("stage/zorva-pegasus.mof") +
                                 "    (cimmofl is not in PATH here)\n"));
  EXPECT_THAT(offline, HasSubstr("unchanged  " + at("stage/zorva.mof")));
  EXPECT_THAT(shown(host_, words("pegasus", {"--remove"})), HasSubstr("  cimprovider -r -m zorvahostprofileprovider"));
  EXPECT_THAT(present(), IsEmpty());
}

TEST_F(Register, ItsCommandsCanBePastedWhateverThePathsAre) {
  fs::create_directory(at("it's here"));
  const std::string out =
      shown(host_, {"register", "sfcb", "--staging", at("it's here"), "--library-dir", at("lib"), "--dry-run"});
  EXPECT_THAT(out, HasSubstr("  sfcbrepos -f -s '" + at("it'\\''s here") + "'"));
}

TEST_F(Register, ADryRunChangesNothing) {
  EXPECT_THAT(shown(host_, words("sfcb", {"--dry-run"})), HasSubstr("would be put  " + at("stage/regs/zorva.reg")));
  EXPECT_THAT(present(), IsEmpty());
  shown(host_, words("sfcb"));
  EXPECT_THAT(shown(host_, words("sfcb", {"--dry-run", "--remove"})), HasSubstr("would be removed  "));
  EXPECT_EQ(present().size(), 4U);
}

TEST_F(Register, AFileOfSomebodyElseIsNeitherReplacedNorRemoved) {
  fs::create_directories(at("stage/regs"));
  host_.directory().write("stage/regs/zorva.reg", "[Mine]\n");
  expectRefused(host_, words("sfcb"), 1, at("stage/regs/zorva.reg") + ": is there already and was not made by");
  EXPECT_THAT(present(), ElementsAre("stage/regs/zorva.reg"));
  EXPECT_THAT(shown(host_, words("sfcb", {"--remove"})), HasSubstr("left  " + at("stage/regs/zorva.reg")));
  EXPECT_EQ(contentsOf(at("stage/regs/zorva.reg")), "[Mine]\n");
}

TEST_F(Register, ALibraryOfSomebodyElseIsInTheWayAndALinkToTheSameOneIsNot) {
  fs::create_symlink("/usr/lib/libzorvahostprofileprovider.so", at("lib/libzorvahostprofileprovider.so"));
  expectRefused(host_, words("sfcb"), 1, "is there already");
  EXPECT_EQ(present().size(), 1U);
  fs::remove(at("lib/libzorvahostprofileprovider.so"));
  // As a package has it.
  fs::create_symlink(ZORVA_LIB_DIR "/libzorvahostprofileprovider.so.1", at("libzorvahostprofileprovider.so.1"));
  fs::create_symlink("../libzorvahostprofileprovider.so.1", at("lib/libzorvahostprofileprovider.so"));
  shown(host_, words("sfcb"));
  EXPECT_EQ(fs::read_symlink(at("lib/libzorvahostprofileprovider.so")), "../libzorvahostprofileprovider.so.1");
  shown(host_, words("sfcb", {"--remove"}));
  EXPECT_THAT(present(), ElementsAre("lib/libzorvahostprofileprovider.so"));
}

TEST_F(Register, ReplacesWhatAnotherVersionPutThere) {
  fs::create_directories(at("stage/regs"));
  host_.directory().write("stage/regs/zorva.reg", "# " + std::string(kOwnMark) + "\n[Old]\n");
  fs::create_symlink("/opt/old/libzorvahostprofileprovider.so.1", at("lib/libzorvahostprofileprovider.so"));
  EXPECT_THAT(shown(host_, words("sfcb")), HasSubstr("replaced  " + at("stage/regs/zorva.reg")));
  EXPECT_EQ(contentsOf(at("stage/regs/zorva.reg")), printed("sfcb"));
  EXPECT_EQ(fs::read_symlink(at("lib/libzorvahostprofileprovider.so")),
            ZORVA_LIB_DIR "/libzorvahostprofileprovider.so.1");
}

TEST_F(Register, WhatCannotBeDoneWhollyIsNotDone) {
  host_.directory().write("stage/mofs", "");  // a file where a directory must be
  expectRefused(host_, words("sfcb"), 1, at("stage/mofs"));
  EXPECT_THAT(present(), ElementsAre("stage/mofs"));
  EXPECT_FALSE(fs::exists(at("stage/regs")));
}

TEST_F(Register, NeedsTheServersDirectoryAndTheLibraries) {
  expectRefused(host_, {"register", "sfcb", "--staging", at("none"), "--library-dir", at("lib")}, 1,
                at("none") + ": there is no such directory; is sfcb installed?");
  expectRefused(host_, {"register", "pegasus", "--staging", at("stage"), "--library-dir", at("none")}, 1,
                "is OpenPegasus installed?");
  expectRefused(host_, words("sfcb", {"--provider-dir", at("none")}), 1, "there is no such library to be linked to");
  EXPECT_THAT(present(), IsEmpty());
}

TEST_F(Register, RemovesNothingWhereNothingIs) {
  const Outcome outcome = host_.run(words("pegasus", {"--remove"}));
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_THAT(outcome.err, HasSubstr("nothing of zorvactl register is there for OpenPegasus"));
}

}  // namespace
}  // namespace zorva::cli
