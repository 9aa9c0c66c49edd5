// Compares what the providers set with the classes that they publish. A property that a class lacks, or has with
// another type, would be refused by the broker and never reach the client.

#include <gtest/gtest.h>

#include <memory>
#include <set>
#include <string>

#include "schema/ClassRepository.h"
#include "schema/Schema.h"
#include "tests/support/ProviderCall.h"
#include "tests/support/Providers.h"
#include "tests/support/RecordingBroker.h"
#include "tests/support/World.h"

namespace ZV::Test {
namespace {

struct Published {
  const char* prefix;      // of its provider
  std::size_t instances;   // on the host below
  std::size_t properties;  // that the provider sets, keys included

  const Provider& provider() const { return *findProvider(prefix); }
};

const Published kPublished[] = {
    {"DNSClientProvider", 3, 15},
    {"DNSRemoteServiceAccessPointProvider", 3, 12},
    {"DNSSettingDataProvider", 3, 11},
    {"DNSGeneralSettingDataProvider", 1, 7},
    {"DNSRemoteAccessAvailableToElementProvider", 9, 3},
    {"DNSSAPSAPDependencyProvider", 2, 2},
    {"DNSHostedAccessPointProvider", 3, 2},
    {"DNSGeneralElementSettingDataProvider", 1, 4},
    {"DNSGenEndPointElementSettingDataProvider", 3, 4},
    {"DNSEndPointElementSettingDataProvider", 3, 4},
    {"DNSGeneralOrderedComponentProvider", 1, 3},
    {"DNSOrderedComponentProvider", 1, 3},
};

void PrintTo(const Published& published, std::ostream* out) { *out << published.prefix; }

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
    broker_.serve(kSystemClass, {objectOf(systemPath("host1")), Instance("ZORVA_SPComputerSystem")
                                                                    .with("CreationClassName", "ZORVA_SPComputerSystem")
                                                                    .with("Name", "BMC:-1")});
    broker_.serve(kIpEndpointClass, objectsOf({ipEndpointPath("eth0"), ipEndpointPath("eth1")}));
    broker_.serve(kIpAssignmentClass, objectsOf({ipAssignmentPath("Computer%eth0%ipv4")}));
  }

  static std::string className() { return GetParam().provider().className; }
  const zorva::schema::Class& publishedClass() const { return *classes_->find(className()); }

  World world_;
  RecordingBroker broker_;
  std::shared_ptr<const zorva::schema::ClassRepository> classes_ =
      zorva::schema::loadBuiltInClasses(zorva::schema::ClassSet::Profile);
};

INSTANTIATE_TEST_SUITE_P(Of, Publishing, ::testing::ValuesIn(kPublished),
                         [](const auto& one) { return std::string(one.param.prefix); });

TEST_P(Publishing, EveryPropertyThatIsSetIsDeclaredWithThatType) {
  InstanceProvider provider(GetParam().provider().createInstanceMI, broker_);
  const Outcome outcome = provider.enumerateInstances(Path(className()));
  EXPECT_EQ(outcome.instances().size(), GetParam().instances);
  std::set<std::string> all;
  for (const Instance& instance : outcome.instances()) {
    EXPECT_EQ(instance.path.className, className());
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
  InstanceProvider provider(GetParam().provider().createInstanceMI, broker_);
  const Outcome outcome = provider.enumerateInstanceNames(Path(className()));
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
