// Compares what the providers set with the classes that they publish. A property that a class lacks, or has with
// another type, would be refused by the broker and never reach the client.
#include <ProviderCall.h>
#include <RecordingBroker.h>
#include <World.h>
#include <gtest/gtest.h>

#include <memory>
#include <set>
#include <string>

#include "schema/ClassRepository.h"
#include "schema/Schema.h"

#define ZV_CREATE(prefix) \
  extern "C" CMPIInstanceMI* prefix##_Create_InstanceMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*)
ZV_CREATE(DNSClientProvider);
ZV_CREATE(DNSRemoteServiceAccessPointProvider);
ZV_CREATE(DNSSettingDataProvider);
ZV_CREATE(DNSGeneralSettingDataProvider);
ZV_CREATE(DNSRemoteAccessAvailableToElementProvider);
ZV_CREATE(DNSSAPSAPDependencyProvider);
ZV_CREATE(DNSHostedAccessPointProvider);
ZV_CREATE(DNSGeneralElementSettingDataProvider);
ZV_CREATE(DNSGenEndPointElementSettingDataProvider);
ZV_CREATE(DNSEndPointElementSettingDataProvider);
ZV_CREATE(DNSGeneralOrderedComponentProvider);
ZV_CREATE(DNSOrderedComponentProvider);
#undef ZV_CREATE

namespace ZV::Test {
namespace {

struct Published {
  const char* className;
  InstanceProvider::Create create;
  std::size_t instances;   // on the host below
  std::size_t properties;  // that the provider sets, keys included
};

const Published kPublished[] = {
    {"ZORVA_DNSProtocolEndPoint", DNSClientProvider_Create_InstanceMI, 3, 15},
    {"ZORVA_RemoteServiceAccessPoint", DNSRemoteServiceAccessPointProvider_Create_InstanceMI, 3, 12},
    {"ZORVA_DNSSettingData", DNSSettingDataProvider_Create_InstanceMI, 3, 11},
    {"ZORVA_DNSGeneralSettingData", DNSGeneralSettingDataProvider_Create_InstanceMI, 1, 7},
    {"ZORVA_RemoteAccessAvailableToElement", DNSRemoteAccessAvailableToElementProvider_Create_InstanceMI, 9, 3},
    {"ZORVA_DNSSAPSAPDependency", DNSSAPSAPDependencyProvider_Create_InstanceMI, 2, 2},
    {"ZORVA_DNSHostedAccessPoint", DNSHostedAccessPointProvider_Create_InstanceMI, 3, 2},
    {"ZORVA_DNSGeneralElementSettingData", DNSGeneralElementSettingDataProvider_Create_InstanceMI, 1, 4},
    {"ZORVA_DNSGenEndPointElementSettingData", DNSGenEndPointElementSettingDataProvider_Create_InstanceMI, 3, 4},
    {"ZORVA_DNSEndPointElementSettingData", DNSEndPointElementSettingDataProvider_Create_InstanceMI, 3, 4},
    {"ZORVA_DNSGenOrderedComponent", DNSGeneralOrderedComponentProvider_Create_InstanceMI, 1, 3},
    {"ZORVA_DNSOrderedComponent", DNSOrderedComponentProvider_Create_InstanceMI, 1, 3},
};

void PrintTo(const Published& published, std::ostream* out) { *out << published.className; }

// CMPI's name of the type that a class declares, as describe() writes it. A text is set as chars, which the broker
// converts to a string.
std::string setAs(const zorva::schema::ClassProperty& property) {
  if (property.type == zorva::schema::Type::Reference) return "ref";
  const std::string name(zorva::schema::typeName(property.type));
  if (property.isArray) return name + "[]";
  return name == "string" ? "chars" : name;
}

class Publishing : public ::testing::TestWithParam<Published> {
 protected:
  Publishing() {
    const auto nic = [](const char* server, const char* suffix) {
      NicProperties properties = usualNic();
      properties.servers = {server};
      properties.suffixes = {suffix};
      return properties;
    };
    world_.host("host1").nic("eth0", nic("192.0.2.1", "example.org")).nic("eth1", nic("192.0.2.2", "example.net"));
    world_.bmc().nic("bmc0", nic("2001:db8::1", "example.com")).install();
    world_.file("eth0",
                "BOOTPROTO=static\nDOMAINNAME=example.org\nHOSTNAME=host1\nCONFIG_NAME=lab\n"
                "DNSSERVERS=192.0.2.1,192.0.2.9\nDNSSUFFIXES=example.org,example.net\n");
    broker_.serve("ZORVA_ComputerSystem",
                  {object("ZORVA_ComputerSystem", "host1"), object("ZORVA_SPComputerSystem", "BMC:-1")});
    broker_.serve("ZORVA_IPProtocolEndpoint", {onSystem("eth0"), onSystem("eth1")});
    broker_.serve("ZORVA_IPAssignmentSettingData",
                  {Instance("ZORVA_IPAssignmentSettingData").with("InstanceID", "Computer%eth0%ipv4")});
  }

  static Instance object(const char* className, const char* name) {
    return Instance(className).with("CreationClassName", className).with("Name", name);
  }
  static Instance onSystem(const char* name) {
    return object("ZORVA_IPProtocolEndpoint", name)
        .with("SystemCreationClassName", "ZORVA_ComputerSystem")
        .with("SystemName", "host1");
  }

  const zorva::schema::Class& publishedClass() const { return *classes_->find(GetParam().className); }

  World world_;
  RecordingBroker broker_;
  std::shared_ptr<const zorva::schema::ClassRepository> classes_ =
      zorva::schema::loadBuiltInClasses(zorva::schema::ClassSet::Profile);
};

INSTANTIATE_TEST_SUITE_P(Of, Publishing, ::testing::ValuesIn(kPublished),
                         [](const auto& one) { return std::string(one.param.className).substr(6); });

TEST_P(Publishing, EveryPropertyThatIsSetIsDeclaredWithThatType) {
  InstanceProvider provider(GetParam().create, broker_);
  const Outcome outcome = provider.enumerateInstances(Path(GetParam().className));
  EXPECT_EQ(outcome.instances().size(), GetParam().instances);
  std::set<std::string> all;
  for (const Instance& instance : outcome.instances()) {
    EXPECT_EQ(instance.path.className, GetParam().className);
    for (const auto& [name, value] : instance.properties) {
      const zorva::schema::ClassProperty* property = publishedClass().findProperty(name);
      ASSERT_NE(property, nullptr) << name;
      EXPECT_EQ(property->name, name);
      EXPECT_EQ(nameOfType(value.type), setAs(*property)) << name;
      all.insert(name);
    }
  }
  EXPECT_EQ(all.size(), GetParam().properties) << ::testing::PrintToString(all);
}

TEST_P(Publishing, EveryPathHasTheKeysOfItsClass) {
  InstanceProvider provider(GetParam().create, broker_);
  const Outcome outcome = provider.enumerateInstanceNames(Path(GetParam().className));
  std::set<std::string> declared;
  for (const zorva::schema::ClassProperty* key : publishedClass().keys()) declared.insert(key->name);
  EXPECT_EQ(outcome.paths().size(), GetParam().instances);
  for (const Path& path : outcome.paths()) {
    std::set<std::string> keys;
    for (const auto& [name, value] : path.keys) keys.insert(name);
    EXPECT_EQ(keys, declared) << path;
  }
}

}  // namespace
}  // namespace ZV::Test
