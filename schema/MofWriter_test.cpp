#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "schema/BuiltInMof.h"
#include "schema/Mof.h"

namespace zorva::schema {
namespace {

using ::testing::HasSubstr;

// Writes the declarations that it gets; reading that text again must write the same.
class Rewriter : public MofSink {
 public:
  Expected<void, SchemaError> qualifierType(QualifierType type, std::string_view) override {
    text += writeMof(type);
    return {};
  }
  Expected<void, SchemaError> classDeclaration(ClassDeclaration declaration, std::string_view) override {
    text += writeMof(declaration);
    return {};
  }
  Expected<void, SchemaError> instance(InstanceDeclaration one, std::string_view) override {
    values.push_back(one.properties.empty() ? Value() : one.properties[0].value);
    text += writeMof(one);
    return {};
  }
  std::string text;
  std::vector<Value> values;
};

std::string rewritten(std::string_view text) {
  Rewriter rewriter;
  const auto outcome = parseMof(text, "t.mof", rewriter);
  EXPECT_EQ(outcome ? "" : outcome.error().text(), "");
  return rewriter.text;
}

// The value after writing and reading.
Value there(const Value& value) {
  InstanceDeclaration one;
  one.className = "X";
  one.properties.emplace_back();
  one.properties[0].name = "P";
  one.properties[0].value = value;
  const std::string text = writeMof(one);
  Rewriter rewriter;
  const auto outcome = parseMof(text, "t.mof", rewriter);
  EXPECT_EQ(outcome ? "" : outcome.error().text(), "") << text;
  return rewriter.values.empty() ? Value() : rewriter.values[0];
}

std::size_t longestLine(const std::string& text) {
  std::size_t longest = 0;
  for (std::size_t begin = 0; begin < text.size();) {
    const std::size_t end = std::min(text.find('\n', begin), text.size());
    longest = std::max(longest, end - begin);
    begin = end + 1;
  }
  return longest;
}

TEST(MofWriter, WritesAClass) {
  const std::string text =
      "[Association,\n"
      " Version(\"1.0\")]\n"
      "class A_X : A_Y {\n"
      "  [Key]\n"
      "  string Name = \"n\";\n"
      "\n"
      "  uint16 Numbers[4] = { 1, 2 };\n"
      "\n"
      "  A_Y REF Antecedent;\n"
      "\n"
      "  [Deprecated { \"A.B\" }]\n"
      "  uint32 Go(\n"
      "      [In]\n"
      "      string To[],\n"
      "      [In(false),\n"
      "       Out]\n"
      "      A_Y REF Job);\n"
      "};\n";
  EXPECT_EQ(rewritten(text), text);
}

TEST(MofWriter, WritesAnInstance) {
  const std::string text =
      "instance of X as $x {\n"
      "  Name = \"n\";\n"
      "  Numbers = { 1, -2 };\n"
      "  None = { };\n"
      "  Gone = null;\n"
      "  Yes = true;\n"
      "  Real = 0.5;\n"
      "  Letter = 'a';\n"
      "};\n";
  EXPECT_EQ(rewritten(text), text);
}

TEST(MofWriter, WritesAQualifierType) {
  const std::string text =
      "Qualifier Max : uint32 = 7, Scope(reference, method), Flavor(DisableOverride, Restricted, Translatable);\n"
      "Qualifier Values : string[], Scope(any), Flavor(EnableOverride, ToSubclass);\n";
  EXPECT_EQ(rewritten(text), text);
}

TEST(MofWriter, KeepsFlavorsThatAreStated) {
  EXPECT_THAT(rewritten("[Key : DisableOverride Restricted Translatable] class X {};"),
              HasSubstr("[Key : Restricted DisableOverride Translatable]"));
}

TEST(MofWriter, WhatItWritesReadsBackTheSame) {
  for (std::size_t i = 0; i < kBuiltInMofCount; ++i) {
    if (kBuiltInMof[i].text.find("#pragma") != std::string_view::npos) continue;
    const std::string once = rewritten(kBuiltInMof[i].text);
    EXPECT_EQ(rewritten(once), once) << kBuiltInMof[i].name;
    EXPECT_LE(longestLine(once), 140U) << kBuiltInMof[i].name;  // a declaration of a qualifier stays on one line
  }
}

TEST(MofWriter, EveryValueReadsBackTheSame) {
  const Value values[] = {
      Value::of(std::string()),
      Value::of(std::string("a\"b\\c'd\n\t\r\f\b\x01\x7F")),
      Value::of(std::string("\x01") + "1f"),
      Value::of(std::string("gr\xC3\xBC\xC3\x9F \xE2\x82\xAC \xF0\x9F\x98\x80")),
      Value::of(std::string(5000, 'x')),
      Value::of(std::string(500, '\\')),
      Value::of(std::string(500, '\x02')),
      Value::of(std::uint64_t{UINT64_MAX}),
      Value::of(std::int64_t{INT64_MIN}),
      Value::of(0.1),
      Value::of(1e300),
      Value::of(5e-324),
      Value::of(-3.0),
      Value::of(u'\''),
      Value::of(u'"'),
      Value::of(u'\\'),
      Value::of(u'\n'),
      Value::of(u'\u20AC'),
      Value::of(false),
      Value::array({}),
      Value::array({std::string("a"), std::monostate(), std::string(300, 'b')}),
  };
  for (const Value& value : values) EXPECT_EQ(there(value), value) << writeMofValue(value);
}

TEST(MofWriter, SplitsLongTextsAtBlanks) {
  std::string words;
  for (int i = 0; i < 100; ++i) words += "\xC3\xA4word" + std::to_string(i) + " ";
  InstanceDeclaration one;
  one.className = "X";
  one.properties.emplace_back();
  one.properties[0].name = "P";
  one.properties[0].value = Value::of(words);
  const std::string text = writeMof(one);
  EXPECT_LE(longestLine(text), 100U);
  EXPECT_THAT(text, HasSubstr(" \"\n      \"\xC3\xA4word"));
  EXPECT_EQ(textOf(there(Value::of(words))), words);
}

TEST(MofWriter, ReplacesWhatMofCannotCarry) {
  EXPECT_EQ(writeMofValue(Value::of(std::string("a\xFF"
                                                "b\0c",
                                                5))),
            "\"a\xEF\xBF\xBD"
            "b\xEF\xBF\xBD"
            "c\"");
  EXPECT_EQ(writeMofValue(Value::of(char16_t{0xD800})), "'\xEF\xBF\xBD'");
  EXPECT_EQ(writeMofValue(Value::of(std::numeric_limits<double>::infinity())), "null");
}

}  // namespace
}  // namespace zorva::schema
