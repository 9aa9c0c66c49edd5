#include "schema/CompiledClasses.h"

#include <gtest/gtest.h>

#include <algorithm>

#include "schema/BuiltInMof.h"
#include "schema/Mof.h"
#include "schema/Schema.h"

namespace zorva::schema {
namespace {

MofInclude embedded(std::string_view name) {
  const auto* const end = kBuiltInMof + kBuiltInMofCount;
  const auto* const found = std::find_if(kBuiltInMof, end, [&](const BuiltInMof& file) { return file.name == name; });
  if (found == end) return {std::string(name), {}, "there is no such file"};
  return {std::string(name), std::string(found->text), {}};
}

// All that a repository has, as MOF.
std::string contents(const ClassRepository& classes) {
  std::string text;
  for (const QualifierType* type : classes.qualifierTypes()) text += writeMof(*type);
  for (const Class* each : classes.classes()) text += writeMof(each->declaration());
  return text;
}

TEST(BuiltInClasses, AreThoseOfTheMofFiles) {
  for (const auto& [set, file] : {std::pair(ClassSet::Profile, "profile.mof"), {ClassSet::Interop, "interop.mof"}}) {
    ClassRepository expected;
    RepositorySink sink(expected);
    const auto outcome = parseMof(embedded(file).text, file, sink,
                                  [](std::string_view name, std::string_view) { return embedded(name); });
    ASSERT_TRUE(outcome) << outcome.error().text();
    EXPECT_GT(expected.classes().size(), 30U);
    EXPECT_EQ(contents(*loadBuiltInClasses(set)), contents(expected));
  }
}

std::string written(const Declarations& declarations) {
  std::string text;
  for (const QualifierType& type : declarations.qualifierTypes) text += writeMof(type);
  for (const ClassDeclaration& declaration : declarations.classes) text += writeMof(declaration);
  return text;
}

// Values of each type, and everything that may be left out.
constexpr std::string_view kUnusual = R"(
Qualifier Sizes : sint64[3] = {-1, 0}, Scope(any), Flavor(Restricted, EnableOverride, Translatable);
Qualifier Plain : string = null, Scope(class);
[Version("1") : Restricted EnableOverride, Abstract]
class T_Below : T_Above {
  uint64 Large = 18446744073709551615;
  sint64 Small = -9223372036854775808;
  real64 Real = -1.25e-300;
  char16 Character = '\x20AC';
  boolean Several[] = {true, false, null};
  string Text = "a\"\\\n";
  string None[] = {};
  [Bag{"x", "y"}] string Fixed[4];
  datetime Moment;
  sint8 Method([In] T_Other REF p, [Out] uint8 q[]);
};
)";

Declarations unusual() {
  DeclarationsSink sink;
  if (const auto outcome = parseMof(kUnusual, "unusual.mof", sink); !outcome) ADD_FAILURE() << outcome.error().text();
  return sink.declarations;
}

TEST(CompiledClasses, ComeBackAsTheyWere) {
  const Declarations back = readCompiledDeclarations(compileDeclarations(unusual()));
  EXPECT_EQ(written(back), written(unusual()));
  EXPECT_EQ(back.classes.at(0).properties.at(2).defaultValue, Value::of(-1.25e-300));
}

TEST(CompiledClasses, ThatBreakOffAreRefused) {
  const std::string whole = compileDeclarations(unusual());
  for (std::size_t length = 0; length < whole.size(); ++length) {
    EXPECT_THROW(readCompiledDeclarations(whole.substr(0, length)), std::logic_error) << length;
  }
}

}  // namespace
}  // namespace zorva::schema
