#include "cimxml/ClassWriter.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "cimxml/QualifierWriter.h"
#include "schema/Mof.h"

namespace zorva::cimxml {
namespace {

using ::testing::HasSubstr;
using ::testing::Not;

constexpr const char* kMof = R"mof(
Qualifier Key : boolean = false, Scope(property, reference), Flavor(DisableOverride, ToSubclass);
Qualifier Association : boolean = false, Scope(association), Flavor(DisableOverride, ToSubclass);
Qualifier EmbeddedInstance : string = null, Scope(property, method, parameter);
Qualifier Description : string = null, Scope(any), Flavor(EnableOverride, ToSubclass, Translatable);
Qualifier Values : string[], Scope(property, method, parameter), Flavor(EnableOverride, ToSubclass);
Qualifier Version : string = null, Scope(class, association, indication), Flavor(Restricted);

[Description("<base>"), Version("1.0")] class T_Base {
  [Key] string Name;
  uint16 Sizes[4];
  [EmbeddedInstance("T_Base")] string Inner;
  uint32 Do([Description("what")] string What, T_Base REF Whom, uint8 Numbers[], T_Base REF Many[]);
};
[Version("2.0")] class T_Derived : T_Base { [Values {"a", "b"}] uint16 Kind = 7; };
[Association] class T_Link { [Key] T_Base REF Left; [Key] T_Derived REF Right; };
)mof";

class ClassWriterTest : public ::testing::Test {
 protected:
  ClassWriterTest() {
    schema::RepositorySink sink(classes_);
    const auto outcome = schema::parseMof(kMof, "test.mof", sink);
    EXPECT_TRUE(outcome) << outcome.error().text();
  }

  std::string written(const char* name, const ClassDetail& detail) {
    std::string out;
    appendClass(out, *classes_.find(name), detail, classes_);
    return out;
  }

  schema::ClassRepository classes_;
};

TEST_F(ClassWriterTest, WritesWhatTheClassItselfDeclares) {
  EXPECT_EQ(written("T_Derived", {true, false, false, {}}),
            R"(<CLASS NAME="T_Derived" SUPERCLASS="T_Base"><PROPERTY NAME="Kind" TYPE="uint16">)"
            R"(<VALUE>7</VALUE></PROPERTY></CLASS>)");
}

TEST_F(ClassWriterTest, MarksWhatIsInheritedAndItsOrigin) {
  const std::string text = written("T_Derived", {false, false, true, std::vector<std::string>{"name", "KIND"}});
  EXPECT_THAT(text,
              HasSubstr(R"(<PROPERTY NAME="Name" TYPE="string" CLASSORIGIN="T_Base" PROPAGATED="true"></PROPERTY>)"));
  EXPECT_THAT(text, HasSubstr(R"(<PROPERTY NAME="Kind" TYPE="uint16" CLASSORIGIN="T_Derived"><VALUE>7</VALUE>)"));
  EXPECT_THAT(text, Not(HasSubstr("Sizes")));
  EXPECT_THAT(text, HasSubstr(R"(<METHOD NAME="Do" TYPE="uint32" CLASSORIGIN="T_Base" PROPAGATED="true">)"));
}

TEST_F(ClassWriterTest, WritesArraysMethodsAndTheirParameters) {
  EXPECT_EQ(written("T_Base", {true, false, false, std::vector<std::string>{"Sizes"}}),
            R"(<CLASS NAME="T_Base"><PROPERTY.ARRAY NAME="Sizes" TYPE="uint16" ARRAYSIZE="4"></PROPERTY.ARRAY>)"
            R"(<METHOD NAME="Do" TYPE="uint32"><PARAMETER NAME="What" TYPE="string"></PARAMETER>)"
            R"(<PARAMETER.REFERENCE NAME="Whom" REFERENCECLASS="T_Base"></PARAMETER.REFERENCE>)"
            R"(<PARAMETER.ARRAY NAME="Numbers" TYPE="uint8"></PARAMETER.ARRAY>)"
            R"(<PARAMETER.REFARRAY NAME="Many" REFERENCECLASS="T_Base"></PARAMETER.REFARRAY></METHOD></CLASS>)");
}

TEST_F(ClassWriterTest, WritesQualifiersWithTheirTypesAndFlavors) {
  const std::string base = written("T_Base", {true, true, false, std::vector<std::string>{"Name", "Inner"}});
  EXPECT_THAT(
      base,
      HasSubstr(R"(<QUALIFIER NAME="Description" TYPE="string" TRANSLATABLE="true"><VALUE>&lt;base&gt;</VALUE>)"));
  EXPECT_THAT(base, HasSubstr(R"(<QUALIFIER NAME="Version" TYPE="string" TOSUBCLASS="false"><VALUE>1.0</VALUE>)"));
  EXPECT_THAT(base, HasSubstr(R"(<QUALIFIER NAME="Key" TYPE="boolean" OVERRIDABLE="false"><VALUE>TRUE</VALUE>)"));
  EXPECT_THAT(base, HasSubstr(R"(NAME="Inner" TYPE="string" EmbeddedObject="instance")"));
  const std::string derived = written("T_Derived", {false, true, false, {}});
  EXPECT_THAT(derived,
              HasSubstr(R"(<QUALIFIER NAME="Description" TYPE="string" PROPAGATED="true" TRANSLATABLE="true">)"));
  EXPECT_THAT(derived, HasSubstr("<VALUE.ARRAY><VALUE>a</VALUE><VALUE>b</VALUE></VALUE.ARRAY>"));
  EXPECT_THAT(written("T_Derived", {true, true, false, {}}), Not(HasSubstr("Description")));
}

TEST_F(ClassWriterTest, WritesReferences) {
  EXPECT_THAT(written("T_Link", {true, false, false, {}}),
              HasSubstr(R"(<PROPERTY.REFERENCE NAME="Right" REFERENCECLASS="T_Derived"></PROPERTY.REFERENCE>)"));
}

TEST_F(ClassWriterTest, WritesQualifierTypes) {
  std::string out;
  appendQualifierType(out, *classes_.findQualifierType("key"));
  EXPECT_EQ(out, R"(<QUALIFIER.DECLARATION NAME="Key" TYPE="boolean" ISARRAY="false" OVERRIDABLE="false">)"
                 R"(<SCOPE REFERENCE="true" PROPERTY="true"/><VALUE>FALSE</VALUE></QUALIFIER.DECLARATION>)");
}

TEST_F(ClassWriterTest, WritesNamesAndPathsOfClasses) {
  std::string out;
  appendClassPath(out, "h", "root/cimv2", "T_Base");
  EXPECT_EQ(out,
            R"(<CLASSPATH><NAMESPACEPATH><HOST>h</HOST><LOCALNAMESPACEPATH><NAMESPACE NAME="root"/>)"
            R"(<NAMESPACE NAME="cimv2"/></LOCALNAMESPACEPATH></NAMESPACEPATH><CLASSNAME NAME="T_Base"/></CLASSPATH>)");
}

}  // namespace
}  // namespace zorva::cimxml
