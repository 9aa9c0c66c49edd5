#include "cimom/Interop.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "broker/objects/PathText.h"
#include "cimom/InteropModel.h"
#include "schema/Schema.h"

namespace zorva::cimom {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::SizeIs;

InteropWorld world() {
  InteropWorld known;
  known.nameSpace = "interop";
  known.profileNameSpace = "interop";
  known.nameSpaces = {"root/cimv2", "interop"};
  known.hostName = "h";
  known.systems = {{"", "root/cimv2", "ZORVA_ComputerSystem", {{"Name", broker::Value::text("s")}}}};
  known.endpoints = {{"", "root/cimv2", "ZORVA_DNSProtocolEndPoint", {{"Name", broker::Value::text("eth0")}}},
                     {"", "root/cimv2", "ZORVA_DNSProtocolEndPoint", {{"Name", broker::Value::text("eth1")}}}};
  return known;
}

std::vector<std::string> namesOf(const std::vector<broker::Instance>& instances) {
  std::vector<std::string> names;
  for (const broker::Instance& one : instances) names.push_back(broker::pathText(one.path));
  return names;
}

TEST(InteropModel, HasAnInstanceForEachNamespace) {
  EXPECT_THAT(namesOf(interopInstances(world(), "cim_namespace")),
              ElementsAre(HasSubstr("Name=\"root/cimv2\""), HasSubstr("Name=\"interop\"")));
  EXPECT_THAT(interopInstances(world(), "CIM_NamespaceInManager"), SizeIs(2));
}

TEST(InteropModel, LinksTheProfileToWhatConformsToIt) {
  const auto links = interopInstances(world(), "CIM_ElementConformsToProfile");
  EXPECT_THAT(namesOf(links), ElementsAre(HasSubstr("eth0"), HasSubstr("eth1")));
}

TEST(InteropModel, TheProfileIsInTheNamespaceOfItsRegistration) {
  InteropWorld elsewhere = world();
  elsewhere.nameSpace = "root/cimv2";
  EXPECT_THAT(
      namesOf(interopInstances(elsewhere, "CIM_ElementConformsToProfile")),
      ElementsAre(HasSubstr("\"interop:CIM_RegisteredProfile."), HasSubstr("\"interop:CIM_RegisteredProfile.")));
}

TEST(InteropModel, TheProfileIsOfTheProjectsOwn) {
  const broker::Instance profile = interopInstances(world(), "CIM_RegisteredProfile").at(0);
  EXPECT_EQ(*profile.property("RegisteredOrganization"), broker::Value::unsignedNumber(1, schema::Type::Uint16));
  EXPECT_EQ(profile.property("OtherRegisteredOrganization")->asText(), "Zorva");
}

TEST(InteropModel, NamesTheHostIfNoProviderReturnsASystem) {
  InteropWorld bare = world();
  bare.systems.clear();
  EXPECT_THAT(namesOf(interopInstances(bare, "CIM_ObjectManager")),
              ElementsAre(HasSubstr("SystemCreationClassName=\"CIM_ComputerSystem\",SystemName=\"h\"")));
}

TEST(InteropModel, HasNothingOfOtherClasses) { EXPECT_TRUE(interopInstances(world(), "CIM_System").empty()); }

TEST(InteropModel, ComparesInstancesByClassAndKeysAlone) {
  const broker::ObjectPath a{"h", "interop", "C", {{"K", broker::Value::text("v")}, {"L", broker::Value::text("w")}}};
  broker::ObjectPath b{"", "", "c", {{"l", broker::Value::text("w")}, {"k", broker::Value::text("v")}}};
  EXPECT_TRUE(sameInstance(a, b));
  b.keys[0].value = broker::Value::text("W");
  EXPECT_FALSE(sameInstance(a, b));
  b.keys.pop_back();
  EXPECT_FALSE(sameInstance(a, b));
}

/// Uses a broker without provider libraries: the server must describe itself even so.
class InteropTest : public ::testing::Test {
 protected:
  InteropTest() {
    broker::BrokerOptions options;
    options.providerDirectory = "/nonexistent";
    serveInterop(options);
    broker_.emplace(schema::loadBuiltInClasses(schema::ClassSet::Interop), std::move(options));
  }

  std::vector<std::string> names(const std::string& nameSpace, const std::string& className) {
    std::vector<std::string> found;
    status_ = broker_->enumerateInstanceNames(nameSpace, className, [&](const broker::ObjectPath& path) {
      found.push_back(broker::pathText(path));
      return true;
    });
    return found;
  }

  static broker::ObjectPath profile(const std::string& id = "ZORVA:DNSClient:1.0.0") {
    return {"", "interop", "CIM_RegisteredProfile", {{"InstanceID", broker::Value::text(id)}}};
  }

  std::optional<broker::Broker> broker_;
  broker::Status status_;
};

TEST_F(InteropTest, IsServedInBothNamespacesAndInNoOther) {
  EXPECT_THAT(names("interop", "CIM_Namespace"), SizeIs(3));
  EXPECT_THAT(names("ROOT/Interop", "CIM_Namespace"), SizeIs(3));
  EXPECT_THAT(names("interop", "CIM_RegisteredSpecification"), SizeIs(1));
  names("root/cimv2", "CIM_Namespace");
  EXPECT_EQ(status_.rc, 7);
  names("root/cimv2", "CIM_ElementConformsToProfile");
  EXPECT_EQ(status_.rc, 0) << "but from an endpoint there is a way to its profile";
}

TEST_F(InteropTest, SetsNothingThatTheSchemaLacks) {
  for (const char* className : {"CIM_ObjectManager", "CIM_CIMXMLCommunicationMechanism", "CIM_Namespace",
                                "CIM_NamespaceInManager", "CIM_RegisteredProfile"}) {
    const std::vector<broker::Instance> wanted = interopInstances(world(), className);
    std::vector<broker::Instance> found;
    const auto take = [&](const broker::Instance& instance) {
      found.push_back(instance);
      return true;
    };
    EXPECT_TRUE(broker_->enumerateInstances("interop", className, {}, take).ok()) << className;
    ASSERT_FALSE(found.empty()) << className;
    const auto isSet = [](const broker::Property& property) { return !property.value.isNull; };
    const std::vector<broker::Property>& properties = found.front().properties;
    EXPECT_EQ(std::count_if(properties.begin(), properties.end(), isSet), wanted.front().properties.size())
        << className;
  }
}

TEST_F(InteropTest, GetsTheProfileByItsName) {
  const auto found = broker_->getInstance(profile(), {});
  ASSERT_TRUE(found) << found.error().message;
  EXPECT_EQ(found->property("RegisteredName")->asText(), "Zorva DNS Client");
  const auto none = broker_->getInstance(profile("another"), {});
  ASSERT_FALSE(none);
  EXPECT_EQ(none.error().rc, 6);
  EXPECT_EQ(broker_->deleteInstance(profile()).rc, 7);
}

TEST_F(InteropTest, LinksNamespacesToTheManager) {
  const broker::ObjectPath manager = broker::parsePathText(names("interop", "CIM_ObjectManager").at(0)).value();
  std::size_t found = 0;
  const auto count = [&](const broker::Instance&) {
    ++found;
    return true;
  };
  EXPECT_TRUE(broker_->associators(manager, {"", "CIM_Namespace", "", ""}, {}, count).ok());
  EXPECT_EQ(found, 3U);
  EXPECT_TRUE(broker_->references(manager, {"CIM_NamespaceInManager", "", "Antecedent", ""}, {}, count).ok());
  EXPECT_EQ(found, 6U);
  EXPECT_TRUE(broker_->references(manager, {"CIM_NamespaceInManager", "", "Dependent", ""}, {}, count).ok());
  EXPECT_EQ(found, 6U);
}

TEST_F(InteropTest, ReturnsTheCentralInstances) {
  const auto result = broker_->invokeMethod(profile(), "GetCentralInstances", {});
  ASSERT_TRUE(result) << result.error().message;
  EXPECT_EQ(std::get<std::uint64_t>(result->returnValue.scalar), 0U);
  ASSERT_EQ(result->output.size(), 1U);
  EXPECT_TRUE(result->output[0].value.isArray);
  const auto refused = broker_->invokeMethod(profile(), "CloseConformantInstances", {});
  ASSERT_FALSE(refused);
  EXPECT_EQ(refused.error().rc, 16);
}

}  // namespace
}  // namespace zorva::cimom
