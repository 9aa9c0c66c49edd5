// What a modification passes to the provider, and what is refused before that.

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <mutex>

#include "broker/Broker.h"
#include "broker/objects/PathText.h"
#include "broker/testing/TestClasses.h"

namespace zorva::broker {
namespace {

using ::testing::Contains;
using ::testing::HasSubstr;
using ::testing::Not;
using ::testing::StartsWith;

using Names = std::optional<std::vector<std::string>>;

/// The thing "a" has Size 7 and the Labels "x" and "y"; both can be changed.
class ModificationTest : public ::testing::Test {
 protected:
  ModificationTest() { start({}); }

  /// A broker whose provider leaves the properties `keeps` unchanged if a modification lacks them.
  void start(const std::vector<std::string>& keeps) {
    ProviderEntry things = testing::testProvider("T_Thing", "Thing", InstanceMi);
    things.keeps = keeps;
    BrokerOptions options =
        testing::testOptions(ZORVA_LIB_DIR, {things, testing::testProvider("T_Trouble", "Trouble", InstanceMi)});
    options.log = [this](LogLevel, std::string_view text) {
      const std::lock_guard lock(mutex_);
      lines_.emplace_back(text);
    };
    broker_.emplace(testing::testClasses(), std::move(options));
  }

  Status modify(std::vector<Property> properties, const Names& list = std::nullopt,
                const std::string& name = "T_Thing.Name=\"a\"") {
    Instance instance;
    instance.path = parsePathText(name).value();
    instance.properties = std::move(properties);
    effect_ = {};
    lines_.clear();
    return broker_->modifyInstance(instance, list, {}, &effect_);
  }

  void expectRefused(const Status& status, int rc, const std::string& told) {
    EXPECT_EQ(status.rc, rc);
    EXPECT_THAT(status.message, HasSubstr(told));
    EXPECT_THAT(lines_, Not(Contains(StartsWith("ModifyInstance"))));
  }

  void expectHanded(const Status& status, const std::string& what) {
    EXPECT_EQ(status.rc, 0) << status.message;
    EXPECT_THAT(lines_, Contains(StartsWith("ModifyInstance root/cimv2:T_Thing.Name " + what)));
  }

  std::mutex mutex_;
  std::vector<std::string> lines_;
  ModificationEffect effect_;
  std::optional<Broker> broker_;
};

Property size(std::uint64_t number) { return {"Size", Value::unsignedNumber(number, schema::Type::Uint16)}; }
Property labels(const std::vector<std::string>& texts) { return {"Labels", Value::textArray(texts)}; }

TEST_F(ModificationTest, PassesTheCurrentValuesOfPropertiesThatAreNotGiven) {
  expectHanded(modify({size(9)}), "all Size 9 Labels x y");
  expectHanded(modify({labels({"z"})}), "all Size 9 Labels z");
}

TEST_F(ModificationTest, PassesTheCurrentValuesOfPropertiesThatAreNotListed) {
  expectHanded(modify({size(8), labels({"z"})}, {{"LABELS"}}), "[Labels] Size 7 Labels z");
  expectHanded(modify({size(9)}, {{"Size", "Labels"}}), "[Size Labels] Size 9 Labels z");
}

TEST_F(ModificationTest, LeavesOutWhatTheProviderKeepsAnyway) {
  start({"labels", "Size"});
  expectHanded(modify({size(9)}), "all Size 9");
  EXPECT_THAT(lines_, Not(Contains(HasSubstr("Labels"))));
  expectHanded(modify({labels({"z"})}), "all Size null Labels z");
}

TEST_F(ModificationTest, AnEmptyListChangesNothing) {
  EXPECT_EQ(modify({size(9)}, Names(std::in_place)).rc, 0);
  EXPECT_THAT(lines_, Not(Contains(StartsWith("ModifyInstance"))));
}

TEST_F(ModificationTest, AWholeInstanceAsItIsChangesNothing) {
  const auto found = broker_->getInstance(parsePathText("T_Thing.Name=\"a\"").value(), {});
  ASSERT_TRUE(found);
  Instance instance = *found;
  EXPECT_EQ(modify(instance.properties).rc, 0);
  EXPECT_THAT(lines_, Not(Contains(StartsWith("ModifyInstance"))));
  for (Property& property : instance.properties) {
    if (property.name == "Size") property = size(8);
  }
  expectHanded(modify(instance.properties), "all Size 8 Labels x y");
}

TEST_F(ModificationTest, ReportsItsChangesInTheTypesOfTheSchema) {
  expectHanded(modify({{"SIZE", Value::text("9")}, labels({"x", "y"})}), "all Size 9");
  EXPECT_EQ(effect_.changes, std::vector<Property>{size(9)});
  EXPECT_EQ(effect_.before, std::vector<Value>{size(7).value});
}

TEST_F(ModificationTest, ReadsAgainWhatItChanged) {
  expectHanded(modify({size(9)}), "all Size 9");
  EXPECT_TRUE(effect_.reading.ok());
  EXPECT_EQ(*effect_.now.property("Size"), size(9).value);
  expectHanded(modify({size(9)}, std::nullopt, "T_Thing.Name=\"stubborn\""), "all Size 9");
  EXPECT_EQ(*effect_.now.property("Size"), size(7).value) << "this one takes everything and changes nothing";
}

TEST_F(ModificationTest, RefusesAnotherValueForWhatCannotBeChanged) {
  expectRefused(modify({size(9), {"Tiny", Value::text("1")}, {"good", Value::boolean(true)}}), 7,
                "these properties of T_Thing cannot be changed: Good, Tiny");
  expectRefused(modify({{"Tiny", Value::text("1")}}, {{"tiny"}}), 7,
                "these properties of T_Thing cannot be changed: Tiny");
  expectHanded(modify({size(9), {"Tiny", Value::text("1")}}, {{"size"}}), "[Size] Size 9");
  expectHanded(modify({size(8), {"Tiny", Value::null(schema::Type::Uint8)}}), "all Size 8");
}

TEST_F(ModificationTest, RefusesAKeyWithAnotherValue) {
  expectRefused(modify({size(9), {"name", Value::text("b")}}), 4, "the key Name of the instance");
  expectRefused(modify({size(9), {"Name", Value::text("A")}}, {{"Size"}}), 4, "the key Name of the instance");
  expectHanded(modify({size(9), {"NAME", Value::text("a")}}, {{"Size", "Name"}}), "[Size Name] Size 9");
}

TEST_F(ModificationTest, RefusesAListedNameThatTheClassLacks) {
  expectRefused(modify({size(9)}, {{"Size", "Weight"}}), 4, "PropertyList: T_Thing has no property \"Weight\"");
}

TEST_F(ModificationTest, ANullIsAValue) {
  expectHanded(modify({{"Size", Value::null(schema::Type::Uint16)}}), "all Size null Labels x y");
  EXPECT_EQ(modify({{"Size", Value::null(schema::Type::Uint16)}}).rc, 0);
  EXPECT_THAT(effect_.changes, ::testing::IsEmpty()) << "it has none already";
}

TEST_F(ModificationTest, WhatIsNotThereIsNotFound) {
  expectRefused(modify({size(9)}, std::nullopt, "T_Thing.Name=\"z\""), 6, "there is no instance");
}

TEST_F(ModificationTest, AFailureToReadIsTheAnswer) {
  expectRefused(modify({}, std::nullopt, "T_Trouble.Name=\"fail with text\""), 1, "the reason");
}

TEST(SameEffect, NullAndEmptyAreOne) {
  EXPECT_TRUE(hasSameEffect(Value::text(""), Value::null(schema::Type::String)));
  EXPECT_TRUE(hasSameEffect(Value::textArray({}), Value::null(schema::Type::String, true)));
  EXPECT_TRUE(hasSameEffect(Value::textArray({"a", "", "b"}), Value::textArray({"a", "b"})));
  EXPECT_FALSE(hasSameEffect(Value::textArray({"b", "a"}), Value::textArray({"a", "b"})));
  EXPECT_FALSE(hasSameEffect(Value::textArray({"a b"}), Value::textArray({"a", "b"})));
  EXPECT_FALSE(hasSameEffect(Value::text("A"), Value::text("a")));
  EXPECT_FALSE(hasSameEffect(Value::unsignedNumber(0), Value::null(schema::Type::Uint64)));
}

}  // namespace
}  // namespace zorva::broker
