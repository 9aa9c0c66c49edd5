// Compares the classes here with the published CIM Schema: with its facts, which are kept beside this test, and, in a
// build that has them, with its own files.

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdio>
#include <ostream>
#include <set>

#include "schema/Mof.h"
#include "schema/Schema.h"

namespace zorva::schema {
namespace {

struct Source {
  const char* name;
  const char* file;
};

void PrintTo(const Source& source, std::ostream* out) { *out << source.file; }

const Source kFacts = {"Facts", ZORVA_SOURCE_DIR "/schema/testing/cim-facts.mof"};
#ifdef ZORVA_CIM_SCHEMA_DIR
const Source kOriginal = {"Original", ZORVA_CIM_SCHEMA_DIR "/subset.mof"};
const std::vector<Source> kSources = {kFacts, kOriginal};
#else
const std::vector<Source> kSources = {kFacts};
#endif

void read(const Source& source, ClassRepository& classes) {
  RepositorySink sink(classes);
  const auto outcome = parseMofFile(source.file, sink);
  ASSERT_TRUE(outcome) << outcome.error().text();
}

// The replacement for a text in the facts: FNV-1a with 32 bits.
std::string checksum(std::string_view text) {
  std::uint32_t sum = 0x811C9DC5;
  for (const char c : text) sum = (sum ^ static_cast<unsigned char>(c)) * 0x01000193;
  char digits[10];
  std::snprintf(digits, sizeof digits, "#%08x", static_cast<unsigned>(sum));
  return digits;
}

// The checksum of a qualifier's texts; the facts contain only the checksum.
std::string checksum(const Value& value) {
  std::string text;
  if (!value.isArray) text = textOf(value);
  for (const Scalar& element : value.elements) {
    if (&element != value.elements.data()) text += '\n';
    text += std::get<std::string>(element);
  }
  return text.size() == 9 && text[0] == '#' ? text : checksum(text);
}

// Names, types, keys and default values of a class, as MOF.
std::string outline(const Class& one) {
  ClassDeclaration declared = one.declaration();
  const auto strip = [](Qualifiers& qualifiers) {
    std::erase_if(qualifiers, [](const Qualifier& qualifier) {
      return qualifier.name != "Key" && qualifier.name != "Abstract" && qualifier.name != "Association";
    });
    std::ranges::sort(qualifiers, {}, &Qualifier::name);
  };
  strip(declared.qualifiers);
  for (Property& property : declared.properties) strip(property.qualifiers);
  for (Method& method : declared.methods) {
    strip(method.qualifiers);
    for (Parameter& parameter : method.parameters) strip(parameter.qualifiers);
  }
  std::ranges::sort(declared.properties, {}, &Property::name);
  std::ranges::sort(declared.methods, {}, &Method::name);
  return writeMof(declared);
}

// Qualifiers that a class here must have exactly if the published class has them.
constexpr const char* kWithMeaning[] = {"Key",           "Abstract", "Association", "Aggregation", "Aggregate",
                                        "Override",      "Write",    "Weak",        "Required",    "ArrayType",
                                        "MaxLen",        "Min",      "Max",         "Out",         "Version",
                                        "MinValue",      "MaxValue", "Propagated",  "Deprecated",  "EmbeddedInstance",
                                        "EmbeddedObject"};

void compare(const Qualifiers& ours, const Qualifiers& theirs, const std::string& where) {
  for (const Qualifier& qualifier : ours) {
    if (qualifier.name == "Description") continue;  // the descriptions here are the project's own
    const Qualifier* published = findQualifier(theirs, qualifier.name);
    ASSERT_NE(published, nullptr) << where << " " << qualifier.name;
    if (qualifier.name == "Values") {
      EXPECT_EQ(checksum(*qualifier.value), checksum(*published->value)) << where << " " << qualifier.name;
    } else {
      EXPECT_EQ(*qualifier.value, *published->value) << where << " " << qualifier.name;
    }
  }
  for (const char* name : kWithMeaning) {
    EXPECT_EQ(findQualifier(ours, name) != nullptr, findQualifier(theirs, name) != nullptr) << where << " " << name;
  }
}

void compareMethods(const ClassMethod& ours, const ClassMethod& theirs, const std::string& where) {
  compare(ours.qualifiers, theirs.qualifiers, where);
  ASSERT_EQ(ours.parameters.size(), theirs.parameters.size()) << where;
  for (std::size_t i = 0; i < ours.parameters.size(); ++i) {
    compare(ours.parameters[i].qualifiers, theirs.parameters[i].qualifiers, where + " " + ours.parameters[i].name);
  }
}

// The checksums of all descriptions.
std::multiset<std::string> descriptions(const std::vector<const Class*>& classes) {
  std::multiset<std::string> sums;
  const auto keep = [&](const Qualifiers& qualifiers) {
    if (const Qualifier* text = findQualifier(qualifiers, "Description")) sums.insert(checksum(*text->value));
  };
  for (const Class* one : classes) {
    keep(one->qualifiers());
    for (const ClassProperty* property : one->properties()) keep(property->qualifiers);
    for (const ClassMethod* method : one->methods()) {
      keep(method->qualifiers);
      for (const Parameter& parameter : method->parameters) keep(parameter.qualifiers);
    }
  }
  return sums;
}

class PublishedSchema : public ::testing::TestWithParam<Source> {
 protected:
  void SetUp() override {
    read(GetParam(), published_);
    for (const Class* one : classes_->classes()) {
      if (!one->name().starts_with("ZORVA_")) common_.push_back(one);
    }
  }

  const std::shared_ptr<const ClassRepository> classes_ = loadBuiltInClasses(ClassSet::Interop);
  std::vector<const Class*> common_;  // the classes here that are in the published schema too
  ClassRepository published_;
};

INSTANTIATE_TEST_SUITE_P(Of, PublishedSchema, ::testing::ValuesIn(kSources),
                         [](const auto& source) { return source.param.name; });

TEST_P(PublishedSchema, HasTheClassesThatAreHere) {
  EXPECT_EQ(common_.size(), 39U);
  for (const Class* one : common_) {
    const Class* published = published_.find(one->name());
    ASSERT_NE(published, nullptr) << one->name();
    EXPECT_EQ(outline(*one), outline(*published));
  }
}

TEST_P(PublishedSchema, HasTheQualifierTypesThatAreHere) {
  for (const QualifierType* type : classes_->qualifierTypes()) {
    const QualifierType* published = published_.findQualifierType(type->name);
    ASSERT_NE(published, nullptr) << type->name;
    EXPECT_EQ(writeMof(*type), writeMof(*published));
  }
}

TEST_P(PublishedSchema, HasTheQualifiersThatAreHere) {
  for (const Class* one : common_) {
    const Class& published = *published_.find(one->name());
    compare(one->qualifiers(), published.qualifiers(), one->name());
    for (const ClassProperty* property : one->properties()) {
      compare(property->qualifiers, published.findProperty(property->name)->qualifiers,
              one->name() + "." + property->name);
    }
    for (const ClassMethod* method : one->methods()) {
      compareMethods(*method, *published.findMethod(method->name), one->name() + "." + method->name);
    }
  }
}

TEST_P(PublishedSchema, SharesNoDescriptionWithTheClassesHere) {
  const std::multiset<std::string> published = descriptions(published_.classes());
  EXPECT_GT(published.size(), 1000U);
  for (const std::string& sum : descriptions(classes_->classes())) EXPECT_FALSE(published.contains(sum)) << sum;
}

// So a server that has the published schema accepts zorva.mof.
TEST_P(PublishedSchema, TakesTheZorvaClassesOnTop) {
  read({"Zorva", ZORVA_SOURCE_DIR "/schema/zorva.mof"}, published_);
  EXPECT_NE(published_.find("ZORVA_DNSProtocolEndPoint"), nullptr);
}

TEST_P(PublishedSchema, IsWrittenAndReadBackTheSame) {
  ClassRepository again;
  for (const QualifierType* type : published_.qualifierTypes()) ASSERT_TRUE(again.add(*type));
  RepositorySink sink(again);
  for (const Class* one : published_.classes()) {
    const std::string text = writeMof(one->declaration());
    const auto outcome = parseMof(text, one->name(), sink);
    ASSERT_TRUE(outcome) << outcome.error().text();
    EXPECT_EQ(writeMof(again.find(one->name())->declaration()), text);
  }
}

#ifdef ZORVA_CIM_SCHEMA_DIR
// Another reader extracted the facts than the one that reads the original here.
TEST(PublishedSchemaFacts, AreThoseOfTheOriginal) {
  ClassRepository facts;
  ClassRepository original;
  read(kFacts, facts);
  read(kOriginal, original);
  EXPECT_EQ(facts.classes().size(), original.classes().size());
  EXPECT_EQ(facts.qualifierTypes().size(), original.qualifierTypes().size());
  EXPECT_EQ(descriptions(facts.classes()), descriptions(original.classes()));
  for (const Class* one : original.classes()) {
    const Class* kept = facts.find(one->name());
    ASSERT_NE(kept, nullptr) << one->name();
    EXPECT_EQ(outline(*kept), outline(*one));
  }
}
#endif

}  // namespace
}  // namespace zorva::schema
