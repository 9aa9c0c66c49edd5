#include "cimxml/ObjectWriter.h"

#include <gtest/gtest.h>

#include <memory>
#include <utility>

#include "broker/objects/Arena.h"
#include "broker/objects/Data.h"
#include "schema/Mof.h"

namespace zorva::cimxml {
namespace {

using broker::Instance;
using broker::InstanceObject;
using broker::PropertyMask;
using broker::Value;

constexpr const char* kMof = R"(
Qualifier Key : boolean = false, Scope(property, reference), Flavor(DisableOverride, ToSubclass);
Qualifier Association : boolean = false, Scope(association), Flavor(DisableOverride, ToSubclass);
Qualifier EmbeddedInstance : string = null, Scope(property, method, parameter);
class A { [Key] string Name; [Key] uint16 Kind; string Text; uint16 State; boolean On; datetime Since; string List[];
          sint32 Delta; real64 Share; [EmbeddedInstance("A")] string Inner; };
class B : A { string More; };
class NoKeys { string Text; };
[Association] class Link { [Key] string Name; A REF Near; A REF Far; };
[Association] class Pair { [Key] A REF Near; [Key] A REF Far; };)";

/// Instances of a provider, made in one request.
class XmlObject : public testing::Test {
 protected:
  using Properties = std::vector<std::pair<const char*, Value>>;

  void SetUp() override {
    schema::RepositorySink sink(*repository_);
    const auto outcome = schema::parseMof(kMof, "t.mof", sink);
    ASSERT_TRUE(outcome) << outcome.error().text();
    classes_ = std::make_unique<broker::ClassTable>(repository_);
    arena_ = std::make_unique<broker::Arena>(classes_.get());
  }

  static Instance plain(const char* className, std::vector<broker::NamedValue> keys, Properties properties) {
    Instance instance;
    instance.path.nameSpace = "root/cimv2";
    instance.path.className = className;
    instance.path.keys = std::move(keys);
    for (auto& [name, value] : properties) instance.properties.push_back({name, std::move(value), nullptr});
    return instance;
  }

  static Instance endpoint(const char* className, const char* name, Properties properties) {
    return plain(className, {{"Name", Value::text(name)}, {"Kind", Value::unsignedNumber(7, schema::Type::Uint16)}},
                 std::move(properties));
  }

  const InstanceObject& object(const Instance& instance) {
    broker::PathObject* path = nullptr;
    InstanceObject* made = nullptr;
    broker::Status status = makePath(*arena_, instance.path, true, path);
    if (status.ok()) status = makeInstance(*arena_, *path, instance, made);
    EXPECT_TRUE(status.ok()) << status.message;
    return *made;
  }

  static std::string byPlainValues(const InstanceObject& object, const PropertyMask& wanted,
                                   const InstanceDetail& detail) {
    Instance instance;
    fillInstance(object, wanted, instance);
    std::string out = "<VALUE.NAMEDINSTANCE>";
    appendInstanceName(out, instance.path);
    appendInstance(out, instance, detail);
    return out + "</VALUE.NAMEDINSTANCE>";
  }

  std::vector<const InstanceObject*> all() {
    const Value none = Value::null(schema::Type::String);
    const Value state = Value::unsignedNumber(2, schema::Type::Uint16);
    const Value inner = [] {
      Value value = Value::text("");
      value.scalar = broker::Boxed<Instance>(endpoint("A", "within", {}));
      return value;
    }();
    const Value other = Value::reference(endpoint("B", "far", {}).path);
    Instance withoutKind = endpoint("A", "eth1", {{"Text", Value::text("x")}});
    withoutKind.path.keys.pop_back();
    const std::vector<Instance> instances = {
        endpoint("A", "eth0",
                 {{"Text", Value::text("a \"text\" <&>\n")}, {"State", state}, {"On", Value::boolean(true)}}),
        endpoint("A", "<eth1>", {{"Text", none}, {"State", state}, {"On", Value::boolean(false)}}),
        endpoint("A", "", {{"Text", Value::text("")}, {"State", state}, {"On", Value::null(schema::Type::Boolean)}}),
        endpoint("A", "eth0", {{"State", state}, {"Text", Value::text("1")}}),
        endpoint("A", "eth0", {{"List", Value::textArray({"x", "<y>"})}, {"Share", Value::null(schema::Type::Real64)}}),
        endpoint("A", "eth0",
                 {{"List", Value::null(schema::Type::String, true)}, {"Share", Value::null(schema::Type::Real64)}}),
        endpoint("A", "eth0", {{"Delta", Value::signedNumber(-5, schema::Type::Sint32)}}),
        endpoint("A", "eth0", {{"Since", Value::text("20260101000000.000000+000")}, {"Inner", inner}}),
        endpoint("A", "eth0", {{"Since", Value::text("20260101000000.000000+000")}, {"Inner", Value::text("plain")}}),
        endpoint("B", "eth0", {{"More", Value::text("more")}}),
        endpoint("B", "eth0", {}),
        withoutKind,
        plain("NoKeys", {}, {{"Text", Value::text("t")}}),
        plain("Link", {{"Name", Value::text("l")}}, {{"Far", other}}),
        plain("Link", {{"Name", Value::text("l")}}, {{"Far", Value::null(schema::Type::Reference)}}),
        plain("Pair", {{"Near", other}, {"Far", other}}, {}),
    };
    std::vector<const InstanceObject*> objects;
    for (const Instance& each : instances) objects.push_back(&object(each));
    return objects;
  }

  const std::shared_ptr<schema::ClassRepository> repository_ = std::make_shared<schema::ClassRepository>();
  std::unique_ptr<broker::ClassTable> classes_;
  std::unique_ptr<broker::Arena> arena_;
};

TEST_F(XmlObject, IsWhatItsPlainValuesAreAfterAnyOther) {
  const std::vector<const InstanceObject*> objects = all();
  const std::uint64_t bits = 0b101'0101'1011;
  for (const PropertyMask& wanted : {PropertyMask(), PropertyMask{&bits}}) {
    for (const InstanceDetail& detail : {InstanceDetail(), InstanceDetail{true, repository_.get()}}) {
      ObjectWriter writer(detail);
      for (const InstanceObject* before : objects) {
        for (const InstanceObject* after : objects) {
          std::string out;
          writer.append(out, *before, wanted);
          out.clear();
          writer.append(out, *after, wanted);
          EXPECT_EQ(out, byPlainValues(*after, wanted, detail));
        }
      }
    }
  }
}

TEST_F(XmlObject, AppendsToWhatIsThere) {
  const InstanceObject& one = object(endpoint("A", "eth0", {{"Text", Value::text("1")}}));
  ObjectWriter writer({});
  std::string out = "before";
  writer.append(out, one, {});
  writer.append(out, one, {});
  const std::string element = byPlainValues(one, {}, {});
  EXPECT_EQ(out, "before" + element + element);
}

TEST_F(XmlObject, IsTheSameFromAWriterThatWasUsedBefore) {
  ObjectWriters writers;
  const std::uint64_t bits = 0b101'0101'1011;
  std::uint64_t mask = 0;  // each request's mask may lie where the last one's lay
  for (const std::uint64_t wanted : {std::uint64_t{0}, bits, ~bits, std::uint64_t{0}}) {
    mask = wanted;
    for (const InstanceObject* object : all()) {
      const PropertyMask used = mask == 0 ? PropertyMask() : PropertyMask{&mask};
      ObjectWriters::Loan loan(writers, "A");
      ObjectWriters::Loan beside(writers, "a");
      EXPECT_NE(&*loan, &*beside);
      std::string out;
      (*loan).append(out, *object, used);
      EXPECT_EQ(out, byPlainValues(*object, used, {}));
    }
  }
}

TEST_F(XmlObject, FewWritersAreKept) {
  ObjectWriters writers;
  const InstanceObject& one = object(endpoint("A", "eth0", {{"Text", Value::text("1")}}));
  for (int i = 0; i < 100; ++i) {
    ObjectWriters::Loan loan(writers, "Class" + std::to_string(i));
    std::string out;
    (*loan).append(out, one, {});
    EXPECT_EQ(out, byPlainValues(one, {}, {}));
  }
  EXPECT_EQ(writers.size(), ObjectWriters::kMost);
}

TEST_F(XmlObject, AWriterOfAClassWithoutInstancesIsNotKept) {
  ObjectWriters writers;
  { const ObjectWriters::Loan loan(writers, std::string(1000, 'x')); }
  EXPECT_EQ(writers.size(), 0U);
}

}  // namespace
}  // namespace zorva::cimxml
