#include "schema/Schema.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <set>

namespace zorva::schema {
namespace {

using ::testing::ElementsAre;
using ::testing::UnorderedElementsAre;

std::vector<std::string> names(const std::vector<const ClassProperty*>& properties) {
  std::vector<std::string> all;
  for (const ClassProperty* one : properties) all.push_back(one->name);
  return all;
}

class BuiltInClasses : public ::testing::TestWithParam<ClassSet> {
 protected:
  const std::shared_ptr<const ClassRepository> classes_ = loadBuiltInClasses(GetParam());
};

INSTANTIATE_TEST_SUITE_P(Both, BuiltInClasses, ::testing::Values(ClassSet::Profile, ClassSet::Interop),
                         [](const auto& set) { return set.param == ClassSet::Profile ? "Profile" : "Interop"; });

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
    EXPECT_EQ(findQualifier(get(name).qualifiers(), "Abstract"), nullptr) << name;
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
    EXPECT_EQ(association.findProperty(row.left)->reference, &get(row.leftClass)) << row.name;
    EXPECT_EQ(association.findProperty(row.right)->reference, &get(row.rightClass)) << row.name;
  }
}

// The properties that the providers set: the client would never get a property that the class lacks.
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
    std::vector<std::string> writable;
    for (const ClassProperty* property : get(name).properties()) {
      if (hasQualifier(property->qualifiers, "Write")) writable.push_back(property->name);
    }
    EXPECT_THAT(writable, ::testing::UnorderedElementsAreArray(properties)) << name;
  }
}

TEST_F(ZorvaClasses, EndpointHasItsThreeMethods) {
  const struct {
    const char *name, *parameter;
    bool isArray;
  } rows[] = {
      {"SetDNSDomain", "DNSDomain", false},
      {"SetDNSServerSearchOrder", "DNSServerSearchOrder", true},
      {"SetDNSSuffixSearchOrder", "DNSDomainSuffixSearchOrder", true},
  };
  for (const auto& [name, parameter, isArray] : rows) {
    const ClassMethod* method = get("ZORVA_DNSProtocolEndPoint").findMethod(name);
    ASSERT_NE(method, nullptr) << name;
    EXPECT_EQ(method->returnType, Type::Uint32);
    ASSERT_EQ(method->parameters.size(), 1U) << name;
    EXPECT_EQ(method->parameters[0].name, parameter);
    EXPECT_EQ(method->parameters[0].type, Type::String) << name;
    EXPECT_EQ(method->parameters[0].isArray, isArray) << name;
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

}  // namespace
}  // namespace zorva::schema
