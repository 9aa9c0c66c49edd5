#include "schema/Schema.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <fstream>
#include <nlohmann/json.hpp>
#include <set>

#include "schema/Mof.h"

namespace zorva::schema {
namespace {

using nlohmann::json;
using ::testing::ElementsAre;
using ::testing::UnorderedElementsAre;

std::vector<std::string> names(const std::vector<const ClassProperty*>& properties) {
  std::vector<std::string> all;
  for (const ClassProperty* one : properties) all.push_back(one->name);
  return all;
}

// The facts of a type as cim-facts.json has them.
template <typename Element>
json typeFacts(const Element& element) {
  json facts = {{"type", typeName(element.type)}};
  if (element.type == Type::Reference) facts["class"] = element.referenceClass;
  if (element.isArray) facts["array"] = true;
  return facts;
}

// The facts of a class that its own text declares.
json classFacts(const Class& one) {
  const ClassDeclaration declared = one.declaration();
  json facts = {{"superclass", nullptr},
                {"abstract", hasQualifier(declared.qualifiers, "Abstract")},
                {"association", hasQualifier(declared.qualifiers, "Association")},
                {"properties", json::object()},
                {"methods", json::object()}};
  if (!declared.superclass.empty()) facts["superclass"] = declared.superclass;
  for (const Property& property : declared.properties) {
    facts["properties"][property.name] = typeFacts(property);
    if (hasQualifier(property.qualifiers, "Key")) facts["properties"][property.name]["key"] = true;
  }
  for (const Method& method : declared.methods) {
    json parameters = json::object();
    for (const Parameter& parameter : method.parameters) parameters[parameter.name] = typeFacts(parameter);
    facts["methods"][method.name] = {{"type", typeName(method.returnType)}, {"parameters", parameters}};
  }
  return facts;
}

json readFacts() { return json::parse(std::ifstream(ZORVA_SOURCE_DIR "/schema/cim-facts.json")); }

class BuiltInClasses : public ::testing::TestWithParam<ClassSet> {
 protected:
  const std::shared_ptr<const ClassRepository> classes_ = loadBuiltInClasses(GetParam());
};

INSTANTIATE_TEST_SUITE_P(Both, BuiltInClasses, ::testing::Values(ClassSet::Profile, ClassSet::Interop),
                         [](const auto& set) { return set.param == ClassSet::Profile ? "Profile" : "Interop"; });

// Superclass, property names, types, keys and methods of each CIM_ class are those of the published schema.
TEST_P(BuiltInClasses, AgreeWithTheCimSchema) {
  const json facts = readFacts();
  std::size_t compared = 0;
  for (const Class* one : classes_->classes()) {
    if (one->name().starts_with("ZORVA_")) continue;
    ASSERT_TRUE(facts.contains(one->name())) << one->name();
    EXPECT_EQ(classFacts(*one), facts[one->name()]) << one->name();
    ++compared;
  }
  EXPECT_EQ(compared, GetParam() == ClassSet::Profile ? 27U : 39U);
}

TEST_P(BuiltInClasses, AreDescribed) {
  for (const Class* one : classes_->classes()) {
    EXPECT_FALSE(textOf(*findQualifier(one->qualifiers(), "Description")->value).empty()) << one->name();
    for (const ClassProperty* property : one->properties()) {
      EXPECT_NE(findQualifier(property->qualifiers, "Description"), nullptr) << one->name() << "." << property->name;
    }
    for (const ClassMethod* method : one->methods()) {
      EXPECT_NE(findQualifier(method->qualifiers, "Description"), nullptr) << one->name() << "." << method->name;
    }
  }
}

TEST_P(BuiltInClasses, DeclareNoQualifierThatIsNotUsed) {
  std::set<std::string> used;
  const auto use = [&](const Qualifiers& qualifiers) {
    for (const Qualifier& qualifier : qualifiers) used.insert(qualifier.name);
  };
  for (const Class* one : classes_->classes()) {
    const ClassDeclaration declared = one->declaration();
    use(declared.qualifiers);
    for (const Property& property : declared.properties) use(property.qualifiers);
    for (const Method& method : declared.methods) {
      use(method.qualifiers);
      for (const Parameter& parameter : method.parameters) use(parameter.qualifiers);
    }
  }
  for (const QualifierType* type : classes_->qualifierTypes()) EXPECT_TRUE(used.contains(type->name)) << type->name;
}

TEST_P(BuiltInClasses, EmbedOnlyClassesThatAreThere) {
  const auto check = [&](const Qualifiers& qualifiers, const std::string& where) {
    if (const Qualifier* embedded = findQualifier(qualifiers, "EmbeddedInstance")) {
      EXPECT_NE(classes_->find(textOf(*embedded->value)), nullptr) << where;
    }
  };
  for (const Class* one : classes_->classes()) {
    for (const ClassProperty* property : one->properties()) check(property->qualifiers, property->name);
    for (const ClassMethod* method : one->methods()) {
      for (const Parameter& parameter : method->parameters) check(parameter.qualifiers, parameter.name);
    }
  }
}

class ZorvaClasses : public ::testing::Test {
 protected:
  const Class& get(std::string_view name) {
    const Class* found = classes_->find(name);
    if (found == nullptr) throw std::runtime_error("no class " + std::string(name));
    return *found;
  }
  const std::shared_ptr<const ClassRepository> classes_ = loadBuiltInClasses();
};

TEST_F(ZorvaClasses, AreSixteenAndDeriveFromTheCimClassOfTheirName) {
  const std::pair<const char*, const char*> rows[] = {
      {"ZORVA_ComputerSystem", "CIM_ComputerSystem"},
      {"ZORVA_SPComputerSystem", "ZORVA_ComputerSystem"},
      {"ZORVA_IPProtocolEndpoint", "CIM_IPProtocolEndpoint"},
      {"ZORVA_IPAssignmentSettingData", "CIM_IPAssignmentSettingData"},
      {"ZORVA_DNSProtocolEndPoint", "CIM_DNSProtocolEndpoint"},
      {"ZORVA_RemoteServiceAccessPoint", "CIM_RemoteServiceAccessPoint"},
      {"ZORVA_DNSSettingData", "CIM_DNSSettingData"},
      {"ZORVA_DNSGeneralSettingData", "CIM_DNSGeneralSettingData"},
      {"ZORVA_RemoteAccessAvailableToElement", "CIM_RemoteAccessAvailableToElement"},
      {"ZORVA_DNSSAPSAPDependency", "CIM_SAPSAPDependency"},
      {"ZORVA_DNSHostedAccessPoint", "CIM_HostedAccessPoint"},
      {"ZORVA_DNSGeneralElementSettingData", "CIM_ElementSettingData"},
      {"ZORVA_DNSGenEndPointElementSettingData", "CIM_ElementSettingData"},
      {"ZORVA_DNSEndPointElementSettingData", "CIM_ElementSettingData"},
      {"ZORVA_DNSGenOrderedComponent", "CIM_OrderedComponent"},
      {"ZORVA_DNSOrderedComponent", "CIM_OrderedComponent"},
  };
  for (const auto& [name, superclass] : rows) {
    EXPECT_EQ(get(name).name(), name);
    EXPECT_EQ(get(name).superclass()->name(), superclass);
    EXPECT_FALSE(get(name).isAbstract()) << name;
    EXPECT_FALSE(get(name).keys().empty()) << name;
  }
  std::size_t ours = 0;
  for (const Class* one : classes_->classes()) ours += one->name().starts_with("ZORVA_") ? 1 : 0;
  EXPECT_EQ(ours, std::size(rows));
}

TEST_F(ZorvaClasses, HaveTheKeysOfTheirPaths) {
  for (const char* name : {"ZORVA_DNSProtocolEndPoint", "ZORVA_RemoteServiceAccessPoint", "ZORVA_IPProtocolEndpoint"}) {
    EXPECT_THAT(names(get(name).keys()),
                UnorderedElementsAre("SystemCreationClassName", "CreationClassName", "SystemName", "Name"));
  }
  for (const char* name : {"ZORVA_DNSSettingData", "ZORVA_DNSGeneralSettingData", "ZORVA_IPAssignmentSettingData"}) {
    EXPECT_THAT(names(get(name).keys()), ElementsAre("InstanceID"));
  }
  for (const char* name : {"ZORVA_ComputerSystem", "ZORVA_SPComputerSystem"}) {
    EXPECT_THAT(names(get(name).keys()), UnorderedElementsAre("CreationClassName", "Name"));
  }
}

TEST_F(ZorvaClasses, AssociationsHaveTheirTwoEnds) {
  const struct {
    const char *name, *left, *leftClass, *right, *rightClass;
  } rows[] = {
      {"ZORVA_RemoteAccessAvailableToElement", "Antecedent", "ZORVA_RemoteServiceAccessPoint", "Dependent",
       "ZORVA_DNSProtocolEndPoint"},
      {"ZORVA_DNSSAPSAPDependency", "Antecedent", "ZORVA_IPProtocolEndpoint", "Dependent", "ZORVA_DNSProtocolEndPoint"},
      {"ZORVA_DNSHostedAccessPoint", "Antecedent", "ZORVA_ComputerSystem", "Dependent", "ZORVA_DNSProtocolEndPoint"},
      {"ZORVA_DNSGeneralElementSettingData", "ManagedElement", "ZORVA_ComputerSystem", "SettingData",
       "ZORVA_DNSGeneralSettingData"},
      {"ZORVA_DNSGenEndPointElementSettingData", "ManagedElement", "ZORVA_DNSProtocolEndPoint", "SettingData",
       "ZORVA_DNSGeneralSettingData"},
      {"ZORVA_DNSEndPointElementSettingData", "ManagedElement", "ZORVA_DNSProtocolEndPoint", "SettingData",
       "ZORVA_DNSSettingData"},
      {"ZORVA_DNSGenOrderedComponent", "GroupComponent", "ZORVA_IPAssignmentSettingData", "PartComponent",
       "ZORVA_DNSGeneralSettingData"},
      {"ZORVA_DNSOrderedComponent", "GroupComponent", "ZORVA_IPAssignmentSettingData", "PartComponent",
       "ZORVA_DNSSettingData"},
  };
  for (const auto& row : rows) {
    const Class& association = get(row.name);
    EXPECT_TRUE(association.isAssociation()) << row.name;
    EXPECT_THAT(names(association.references()), ElementsAre(row.left, row.right));
    EXPECT_THAT(names(association.keys()), ElementsAre(row.left, row.right));
    EXPECT_EQ(association.findReference(row.left)->reference, &get(row.leftClass)) << row.name;
    EXPECT_EQ(association.findReference(row.right)->reference, &get(row.rightClass)) << row.name;
  }
}

// What the providers set: a property that the class lacks would be lost on its way to the client.
TEST_F(ZorvaClasses, DeclareWhatTheProvidersSet) {
  const struct {
    const char *name, *type;
    std::vector<const char*> properties;
  } rows[] = {
      {"ZORVA_DNSProtocolEndPoint",
       "string",
       {"SystemCreationClassName", "CreationClassName", "SystemName", "Name", "Caption", "Description", "ElementName",
        "Hostname", "NameFormat", "OtherTypeDescription", "DomainName"}},
      {"ZORVA_DNSProtocolEndPoint", "uint16", {"ProtocolIFType", "EnabledState", "RequestedState"}},
      {"ZORVA_DNSProtocolEndPoint", "string[]", {"DNSSuffixesToAppend"}},
      {"ZORVA_RemoteServiceAccessPoint",
       "string",
       {"SystemCreationClassName", "CreationClassName", "SystemName", "Name", "Caption", "Description", "NameFormat",
        "AccessInfo", "ElementName"}},
      {"ZORVA_RemoteServiceAccessPoint", "uint16", {"AccessContext", "InfoFormat", "OrderOfAccess"}},
      {"ZORVA_DNSSettingData",
       "string",
       {"InstanceID", "Caption", "Description", "ElementName", "DomainName", "RequestedHostname", "ConfigurationName"}},
      {"ZORVA_DNSSettingData", "uint16", {"AddressOrigin"}},
      {"ZORVA_DNSSettingData", "boolean", {"UseSuffixWhenRegistering", "RegisterThisConnectionsAddress"}},
      {"ZORVA_DNSSettingData", "string[]", {"DNSServerAddresses"}},
      {"ZORVA_DNSSettingData", "uint16[]", {"DHCPOptionsToUse"}},
      {"ZORVA_DNSGeneralSettingData",
       "string",
       {"InstanceID", "Caption", "Description", "ElementName", "ConfigurationName"}},
      {"ZORVA_DNSGeneralSettingData", "uint16", {"AddressOrigin"}},
      {"ZORVA_DNSGeneralSettingData", "boolean", {"AppendPrimarySuffixes", "AppendParentSuffixes"}},
      {"ZORVA_DNSGeneralSettingData", "string[]", {"DNSSuffixesToAppend"}},
      {"ZORVA_RemoteAccessAvailableToElement", "uint16", {"OrderOfAccess"}},
      {"ZORVA_DNSGeneralElementSettingData", "uint16", {"IsCurrent", "IsDefault"}},
      {"ZORVA_DNSGenEndPointElementSettingData", "uint16", {"IsCurrent", "IsDefault"}},
      {"ZORVA_DNSEndPointElementSettingData", "uint16", {"IsCurrent", "IsDefault"}},
      {"ZORVA_DNSGenOrderedComponent", "uint64", {"AssignedSequence"}},
      {"ZORVA_DNSOrderedComponent", "uint64", {"AssignedSequence"}},
      {"ZORVA_ComputerSystem", "string", {"CreationClassName", "Name", "NameFormat", "ElementName"}},
      {"ZORVA_ComputerSystem", "uint16", {"EnabledState"}},
      {"ZORVA_ComputerSystem", "uint16[]", {"OperationalStatus", "Dedicated"}},
      {"ZORVA_ComputerSystem", "string[]", {"OtherIdentifyingInfo", "IdentifyingDescriptions"}},
      {"ZORVA_IPProtocolEndpoint", "string", {"Name", "SystemName", "IPv4Address", "IPv6Address", "SubnetMask"}},
      {"ZORVA_IPProtocolEndpoint", "uint8", {"PrefixLength"}},
      {"ZORVA_IPProtocolEndpoint", "uint16", {"ProtocolIFType", "AddressOrigin", "EnabledState"}},
      {"ZORVA_IPAssignmentSettingData", "string", {"InstanceID", "ElementName"}},
      {"ZORVA_IPAssignmentSettingData", "uint16", {"AddressOrigin", "ProtocolIFType"}},
  };
  for (const auto& row : rows) {
    for (const char* name : row.properties) {
      const ClassProperty* property = get(row.name).findProperty(name);
      ASSERT_NE(property, nullptr) << row.name << "." << name;
      EXPECT_EQ(property->name, name);
      EXPECT_EQ(std::string(typeName(property->type)) + (property->isArray ? "[]" : ""), row.type)
          << row.name << "." << name;
    }
  }
}

TEST_F(ZorvaClasses, MarkWhatModifyInstanceChanges) {
  const std::pair<const char*, std::vector<const char*>> rows[] = {
      {"ZORVA_DNSProtocolEndPoint", {"DNSSuffixesToAppend", "DomainName", "Hostname"}},
      {"ZORVA_DNSSettingData", {"RequestedHostname", "DomainName", "DNSServerAddresses", "ConfigurationName"}},
      {"ZORVA_DNSGeneralSettingData", {"DNSSuffixesToAppend", "ConfigurationName"}},
  };
  for (const auto& [name, properties] : rows) {
    for (const char* property : properties) {
      EXPECT_TRUE(hasQualifier(get(name).findProperty(property)->qualifiers, "Write")) << name << "." << property;
    }
  }
}

TEST_F(ZorvaClasses, EndpointHasItsThreeMethods) {
  const std::pair<const char*, json> rows[] = {
      {"SetDNSDomain", {{"DNSDomain", {{"type", "string"}}}}},
      {"SetDNSServerSearchOrder", {{"DNSServerSearchOrder", {{"type", "string"}, {"array", true}}}}},
      {"SetDNSSuffixSearchOrder", {{"DNSDomainSuffixSearchOrder", {{"type", "string"}, {"array", true}}}}},
  };
  for (const auto& [name, parameters] : rows) {
    const ClassMethod* method = get("ZORVA_DNSProtocolEndPoint").findMethod(name);
    ASSERT_NE(method, nullptr) << name;
    EXPECT_EQ(method->returnType, Type::Uint32);
    json found = json::object();
    for (const Parameter& parameter : method->parameters) found[parameter.name] = typeFacts(parameter);
    EXPECT_EQ(found, parameters);
  }
}

TEST_F(ZorvaClasses, AreReachedFromTheirEnds) {
  const auto of = [&](std::string_view source, const Class* ancestor = nullptr) {
    std::vector<std::string> found;
    for (const Class* one : classes_->associationsOf(get(source), ancestor)) {
      if (one->name().starts_with("ZORVA_")) found.push_back(one->name());
    }
    return found;
  };
  EXPECT_THAT(of("ZORVA_DNSProtocolEndPoint"),
              UnorderedElementsAre("ZORVA_RemoteAccessAvailableToElement", "ZORVA_DNSSAPSAPDependency",
                                   "ZORVA_DNSHostedAccessPoint", "ZORVA_DNSGenEndPointElementSettingData",
                                   "ZORVA_DNSEndPointElementSettingData"));
  EXPECT_THAT(of("ZORVA_SPComputerSystem"),
              UnorderedElementsAre("ZORVA_DNSHostedAccessPoint", "ZORVA_DNSGeneralElementSettingData"));
  EXPECT_THAT(of("ZORVA_DNSProtocolEndPoint", &get("CIM_Dependency")),
              UnorderedElementsAre("ZORVA_RemoteAccessAvailableToElement", "ZORVA_DNSSAPSAPDependency",
                                   "ZORVA_DNSHostedAccessPoint"));
}

TEST(Namespaces, AreTheSameInAnyCaseAndWithSlashesAround) {
  EXPECT_TRUE(sameNamespace("root/cimv2", "/Root/CIMV2/"));
  EXPECT_FALSE(sameNamespace("root/cimv2", "rootcimv2"));
  EXPECT_FALSE(sameNamespace("root/cimv2", "root//cimv2"));
}

// The published schema itself, read with this reader, where a build is told where it lies.
class PublishedSchema : public ::testing::Test {
 protected:
  void SetUp() override {
    if (std::string_view(ZORVA_CIM_SCHEMA_DIR).empty()) GTEST_SKIP() << "ZORVA_CIM_SCHEMA_DIR is not set";
    RepositorySink sink(published_);
    const auto error = parseMofFile(ZORVA_CIM_SCHEMA_DIR "/subset.mof", sink);
    ASSERT_FALSE(error) << error->text();
  }
  ClassRepository published_;
};

TEST_F(PublishedSchema, AgreesWithTheFactsKeptHere) {
  const json facts = readFacts();
  EXPECT_EQ(published_.classes().size(), facts.size());
  for (const Class* one : published_.classes()) EXPECT_EQ(classFacts(*one), facts[one->name()]) << one->name();
}

TEST_F(PublishedSchema, HasTheQualifierTypesDeclaredHere) {
  const auto classes = loadBuiltInClasses(ClassSet::Interop);
  for (const QualifierType* type : classes->qualifierTypes()) {
    const QualifierType* published = published_.findQualifierType(type->name);
    ASSERT_NE(published, nullptr) << type->name;
    EXPECT_EQ(writeMof(*type), writeMof(*published));
  }
}

// Qualifiers with a meaning for clients and servers; the texts are this project's own.
TEST_F(PublishedSchema, HasTheQualifiersThatStandHere) {
  const auto classes = loadBuiltInClasses(ClassSet::Interop);
  const auto compare = [](const Qualifiers& ours, const Qualifiers& theirs, const std::string& where) {
    for (const Qualifier& qualifier : ours) {
      if (qualifier.name == "Description") continue;
      const Qualifier* published = findQualifier(theirs, qualifier.name);
      ASSERT_NE(published, nullptr) << where << " " << qualifier.name;
      EXPECT_EQ(*qualifier.value, *published->value) << where << " " << qualifier.name;
    }
    for (const char* name : {"Key",      "Abstract", "Association",      "Aggregation",    "Aggregate",  "Override",
                             "Write",    "Required", "ArrayType",        "MaxLen",         "Min",        "Max",
                             "Weak",     "Out",      "EmbeddedInstance", "EmbeddedObject", "Propagated", "Deprecated",
                             "MinValue", "MaxValue", "Version"}) {
      EXPECT_EQ(findQualifier(ours, name) != nullptr, findQualifier(theirs, name) != nullptr) << where << " " << name;
    }
  };
  for (const Class* one : classes->classes()) {
    if (one->name().starts_with("ZORVA_")) continue;
    const Class& published = *published_.find(one->name());
    compare(one->qualifiers(), published.qualifiers(), one->name());
    for (const ClassProperty* property : one->properties()) {
      const ClassProperty& theirs = *published.findProperty(property->name);
      compare(property->qualifiers, theirs.qualifiers, one->name() + "." + property->name);
      EXPECT_EQ(property->defaultValue, theirs.defaultValue) << one->name() << "." << property->name;
    }
    for (const ClassMethod* method : one->methods()) {
      const ClassMethod& theirs = *published.findMethod(method->name);
      compare(method->qualifiers, theirs.qualifiers, one->name() + "." + method->name);
      for (std::size_t i = 0; i < method->parameters.size(); ++i) {
        EXPECT_EQ(method->parameters[i].name, theirs.parameters[i].name);
        compare(method->parameters[i].qualifiers, theirs.parameters[i].qualifiers, method->name);
      }
    }
  }
}

// No description was taken over from the published schema.
TEST_F(PublishedSchema, SharesNoDescriptionWithTheClassesHere) {
  std::set<std::string> texts;
  const auto keep = [&](const Qualifiers& qualifiers) {
    if (const Qualifier* description = findQualifier(qualifiers, "Description"))
      texts.emplace(textOf(*description->value));
  };
  for (const Class* one : published_.classes()) {
    keep(one->qualifiers());
    for (const ClassProperty* property : one->properties()) keep(property->qualifiers);
    for (const ClassMethod* method : one->methods()) keep(method->qualifiers);
  }
  const auto classes = loadBuiltInClasses(ClassSet::Interop);
  for (const Class* one : classes->classes()) {
    EXPECT_FALSE(texts.contains(std::string(textOf(*findQualifier(one->qualifiers(), "Description")->value))));
    for (const ClassProperty* property : one->properties()) {
      const std::string text(textOf(*findQualifier(property->qualifiers, "Description")->value));
      EXPECT_FALSE(texts.contains(text)) << property->name << ": " << text;
    }
  }
}

// A server that has the published schema takes zorva.mof on top of it.
TEST_F(PublishedSchema, TakesTheZorvaClassesOnTop) {
  RepositorySink sink(published_);
  const auto error = parseMofFile(ZORVA_SOURCE_DIR "/schema/zorva.mof", sink);
  EXPECT_FALSE(error) << error->text();
}

TEST_F(PublishedSchema, IsWrittenAndReadBackTheSame) {
  ClassRepository again;
  for (const QualifierType* type : published_.qualifierTypes()) ASSERT_FALSE(again.add(*type));
  RepositorySink sink(again);
  for (const Class* one : published_.classes()) {
    const std::string text = writeMof(one->declaration());
    const auto error = parseMof(text, one->name(), sink);
    ASSERT_FALSE(error) << error->text();
    EXPECT_EQ(writeMof(again.find(one->name())->declaration()), text);
  }
}

}  // namespace
}  // namespace zorva::schema
