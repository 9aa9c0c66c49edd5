#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstdlib>
#include <fstream>
#include <map>
#include <random>
#include <string>
#include <utility>
#include <vector>

#include "schema/BuiltInMof.h"
#include "schema/Mof.h"

namespace zorva::schema {
namespace {

using Cases = std::vector<std::pair<std::string, std::string>>;
using ::testing::HasSubstr;

// Keeps the declarations of a text.
class Collector : public MofSink {
 public:
  Expected<void, SchemaError> qualifierType(QualifierType type, std::string_view) override {
    qualifierTypes.push_back(std::move(type));
    return {};
  }
  Expected<void, SchemaError> classDeclaration(ClassDeclaration declaration, std::string_view file) override {
    classes.push_back(std::move(declaration));
    files.emplace_back(file);
    return {};
  }
  Expected<void, SchemaError> instance(InstanceDeclaration one, std::string_view) override {
    instances.push_back(std::move(one));
    return {};
  }

  std::vector<QualifierType> qualifierTypes;
  std::vector<ClassDeclaration> classes;
  std::vector<std::string> files;  // of the classes
  std::vector<InstanceDeclaration> instances;
};

Collector read(std::string_view text) {
  Collector collector;
  const auto outcome = parseMof(text, "t.mof", collector);
  EXPECT_EQ(outcome ? "" : outcome.error().text(), "");
  return collector;
}

std::string errorOf(std::string_view text) {
  Collector collector;
  const auto outcome = parseMof(text, "t.mof", collector);
  return outcome ? "no error" : outcome.error().text();
}

// The value of a property's initializer, untyped.
Value valueOf(const std::string& initializer) {
  const Collector all = read("instance of X { P = " + initializer + "; };");
  return all.instances.empty() ? Value() : all.instances.at(0).properties.at(0).value;
}

std::string valueError(const std::string& initializer) {
  return errorOf("instance of X {\nP = " + initializer + "; };");
}

TEST(MofReader, ReadsAQualifierType) {
  const Collector all = read(
      "Qualifier Values : string[], Scope(property, method), Flavor(DisableOverride, Restricted, Translatable);\n"
      "qualifier MaxLen : uint32 = 7, scope(any);");
  ASSERT_EQ(all.qualifierTypes.size(), 2U);
  const QualifierType& values = all.qualifierTypes[0];
  EXPECT_EQ(values.name, "Values");
  EXPECT_EQ(values.type, Type::String);
  EXPECT_TRUE(values.isArray);
  EXPECT_TRUE(values.defaultValue.isNull);
  EXPECT_EQ(values.scope, ScopeProperty | ScopeMethod);
  EXPECT_EQ(values.flavor, (Flavor{false, false, true}));
  EXPECT_EQ(all.qualifierTypes[1].defaultValue, Value::of(std::uint64_t{7}));
  EXPECT_EQ(all.qualifierTypes[1].scope, ScopeAny);
  EXPECT_EQ(all.qualifierTypes[1].flavor, (Flavor{true, true, false}));
}

TEST(MofReader, ReadsAClassWithAllKindsOfElements) {
  const Collector all = read(
      "// a comment\n"
      "[Association, Version(\"1.0\" /* here too */ \".0\") : ToSubclass]\n"
      "class A_X : A_Y {\n"
      "  [Key] string Name = \"n\";\n"
      "  uint16 Numbers[4] = { 1, 2 };\n"
      "  A_Y REF Antecedent;\n"
      "  [Deprecated { \"A.B\", \"C\" }] uint32 Go([In] string To[], [In(false), Out] A_Y REF Job);\n"
      "  sint8 Stop();\n"
      "};");
  ASSERT_EQ(all.classes.size(), 1U);
  const ClassDeclaration& x = all.classes[0];
  EXPECT_EQ(x.name, "A_X");
  EXPECT_EQ(x.superclass, "A_Y");
  EXPECT_EQ(x.place.line, 3U);
  EXPECT_EQ(x.place.column, 7U);
  ASSERT_EQ(x.qualifiers.size(), 2U);
  EXPECT_EQ(x.qualifiers[0].value, std::nullopt);
  EXPECT_EQ(textOf(x.qualifiers[1].value.value()), "1.0.0");
  EXPECT_EQ(x.qualifiers[1].stated.toSubclass, true);
  EXPECT_EQ(x.qualifiers[1].stated.overridable, std::nullopt);

  ASSERT_EQ(x.properties.size(), 3U);
  EXPECT_TRUE(hasQualifier(x.properties[0].qualifiers, "Key"));
  EXPECT_EQ(textOf(x.properties[0].defaultValue), "n");
  EXPECT_TRUE(x.properties[1].isArray);
  EXPECT_EQ(x.properties[1].arraySize, 4U);
  EXPECT_EQ(x.properties[1].defaultValue, Value::array({std::uint64_t{1}, std::uint64_t{2}}));
  EXPECT_EQ(x.properties[2].type, Type::Reference);
  EXPECT_EQ(x.properties[2].referenceClass, "A_Y");

  ASSERT_EQ(x.methods.size(), 2U);
  EXPECT_EQ(x.methods[0].returnType, Type::Uint32);
  ASSERT_EQ(x.methods[0].parameters.size(), 2U);
  EXPECT_TRUE(x.methods[0].parameters[0].isArray);
  EXPECT_EQ(x.methods[0].parameters[1].referenceClass, "A_Y");
  EXPECT_EQ(x.methods[0].parameters[1].qualifiers[0].value, Value::of(false));
  EXPECT_EQ(x.methods[1].returnType, Type::Sint8);
}

TEST(MofReader, TakesKeywordsInAnyCaseAndAsNames) {
  const Collector all = read("CLASS Class { STRING Qualifier; Instance ref Scope; BOOLEAN Ref = TRUE; };");
  ASSERT_EQ(all.classes.size(), 1U);
  EXPECT_EQ(all.classes[0].name, "Class");
  EXPECT_EQ(all.classes[0].properties[1].referenceClass, "Instance");
  EXPECT_EQ(all.classes[0].properties[2].name, "Ref");
}

TEST(MofReader, ReadsAnInstanceWithAnAlias) {
  const Collector all = read("instance of X as $x1 { Name = \"n\"; [Key] Next = $x1; List = { }; Gone = null; };");
  ASSERT_EQ(all.instances.size(), 1U);
  EXPECT_EQ(all.instances[0].className, "X");
  EXPECT_EQ(all.instances[0].alias, "$x1");
  ASSERT_EQ(all.instances[0].properties.size(), 4U);
  EXPECT_EQ(textOf(all.instances[0].properties[1].value), "$x1");
  EXPECT_EQ(all.instances[0].properties[2].value, Value::array({}));
  EXPECT_TRUE(all.instances[0].properties[3].value.isNull);
}

TEST(MofReader, AnEmptyTextDeclaresNothing) {
  EXPECT_TRUE(read("").classes.empty());
  EXPECT_TRUE(read(" \t\r\n\f// only this").classes.empty());
  EXPECT_TRUE(read("\xEF\xBB\xBF/* and that */").classes.empty());
}

TEST(MofReader, ReadsIntegersOfEveryBase) {
  EXPECT_EQ(valueOf("0"), Value::of(std::uint64_t{0}));
  EXPECT_EQ(valueOf("+42"), Value::of(std::uint64_t{42}));
  EXPECT_EQ(valueOf("-42"), Value::of(std::int64_t{-42}));
  EXPECT_EQ(valueOf("0x1Fe"), Value::of(std::uint64_t{0x1FE}));
  EXPECT_EQ(valueOf("0xABB"), Value::of(std::uint64_t{0xABB}));
  EXPECT_EQ(valueOf("017"), Value::of(std::uint64_t{15}));
  EXPECT_EQ(valueOf("101b"), Value::of(std::uint64_t{5}));
  EXPECT_EQ(valueOf("-101B"), Value::of(std::int64_t{-5}));
  EXPECT_EQ(valueOf("18446744073709551615"), Value::of(std::uint64_t{UINT64_MAX}));
  EXPECT_EQ(valueOf("-9223372036854775808"), Value::of(std::int64_t{INT64_MIN}));
}

TEST(MofReader, RefusesNumbersThatAreNone) {
  EXPECT_EQ(valueError("18446744073709551616"),
            "t.mof:2:5: expected a number of at most 64 bits, found '18446744073709551616'");
  EXPECT_EQ(valueError("-9223372036854775809"),
            "t.mof:2:5: expected a number of at most 64 bits, found '-9223372036854775809'");
  for (const char* number : {"08", "0x", "12a", "1.", "1.e5", "1.5e", ".", "+", "--1", "0xg", "2b", "1..2", "1e5"}) {
    EXPECT_THAT(valueError(number), HasSubstr("t.mof:2:5: expected a number, found ")) << number;
  }
}

TEST(MofReader, ReadsReals) {
  EXPECT_EQ(valueOf("1.5"), Value::of(1.5));
  EXPECT_EQ(valueOf("-.25"), Value::of(-0.25));
  EXPECT_EQ(valueOf("+2.5E-3"), Value::of(0.0025));
  EXPECT_EQ(valueOf("1.0e+2"), Value::of(100.0));
  EXPECT_THAT(valueError("1.0e999"), HasSubstr("expected a number"));
}

TEST(MofReader, ReadsTextsWithEscapes) {
  EXPECT_EQ(textOf(valueOf(R"("a\"b\\c\'d\n\t\r\f\b")")), "a\"b\\c'd\n\t\r\f\b");
  EXPECT_EQ(textOf(valueOf(R"("\x41\xe9\x20AC\X263ag")")), "A\xC3\xA9\xE2\x82\xAC\xE2\x98\xBAg");
  EXPECT_EQ(textOf(valueOf("\"one \" // c\n\"two\"\n/* c */\"\" \" three\"")), "one two three");
  EXPECT_EQ(textOf(valueOf("\"gr\xC3\xBC\xC3\x9F\"")), "gr\xC3\xBC\xC3\x9F");
  EXPECT_EQ(textOf(valueOf("\"a // b /* c\"")), "a // b /* c");
}

TEST(MofReader, RefusesBrokenTexts) {
  const Cases cases = {
      {"\"abc", "t.mof:2:5: expected '\"' that closes this text before the end of the line"},
      {"\"ab\nc\"", "t.mof:2:5: expected '\"' that closes this text before the end of the line"},
      {"\"a\\q\"", "t.mof:2:7: expected one of b t n f r \" ' \\ x after '\\'"},
      {"\"a\\xg\"", "t.mof:2:7: expected one to four hexadecimal digits after '\\x'"},
      {"\"\\x0\"", "t.mof:2:6: expected a character, found an escape for none"},
      {"\"\\xD800\"", "t.mof:2:6: expected a character, found an escape for none"},
      {"\"\x01\"", "t.mof:2:6: expected '\"' or a printable character, found byte 0x01"},
      {"\"a\xC3(\"", "t.mof:2:7: expected UTF-8, found byte 0xc3"},
      {"\"\xED\xA0\x80\"", "t.mof:2:6: expected UTF-8, found byte 0xed"},
      {"\"\xC0\x80\"", "t.mof:2:6: expected UTF-8, found byte 0xc0"},
      {"\"\xF4\x90\x80\x80\"", "t.mof:2:6: expected UTF-8, found byte 0xf4"},
  };
  for (const auto& [text, error] : cases) EXPECT_EQ(valueError(text), error) << text;
}

TEST(MofReader, ReadsCharacters) {
  EXPECT_EQ(valueOf("'a'"), Value::of(u'a'));
  EXPECT_EQ(valueOf("'\\''"), Value::of(u'\''));
  EXPECT_EQ(valueOf("'\\x20AC'"), Value::of(u'\u20AC'));
  EXPECT_EQ(valueOf("'\xE2\x82\xAC'"), Value::of(u'\u20AC'));
  EXPECT_EQ(valueError("''"), "t.mof:2:5: expected one character between single quotes");
  EXPECT_EQ(valueError("'ab'"), "t.mof:2:5: expected one character between single quotes");
  EXPECT_EQ(valueError("'\xF0\x9F\x98\x80'"), "t.mof:2:5: expected a character that 16 bits can hold");
}

// Each row: a text, and the error that says what a person must change.
TEST(MofReader, SaysWhatWasExpectedAndWhatWasFound) {
  const std::pair<const char*, const char*> rows[] = {
      {"klass X {};", "t.mof:1:1: expected 'class', 'instance', 'qualifier', '[' or '#pragma', found 'klass'"},
      {"[Key] qualifier", "t.mof:1:7: expected 'class' or 'instance', found 'qualifier'"},
      {"class", "t.mof:1:6: expected the name of a class, found the end of the text"},
      {"class 5 {};", "t.mof:1:7: expected the name of a class, found '5'"},
      {"class X : {};", "t.mof:1:11: expected the name of a superclass after ':', found '{'"},
      {"class X ;", "t.mof:1:9: expected '{' that opens class 'X', found ';'"},
      {"class X {}", "t.mof:1:11: expected ';' after class 'X', found the end of the text"},
      {"class X {\n  string Name\n};", "t.mof:3:1: expected ';' after property 'Name', found '}'"},
      {"class X { string; };", "t.mof:1:17: expected the name of a property or method, found ';'"},
      {"class X { 7 };", "t.mof:1:11: expected '}', '[', a data type or the class of a reference, found '7'"},
      {"class X { strin Name; };",
       "t.mof:1:11: expected a data type, or a class with 'REF' after it, found 'strin' and 'Name'"},
      {"class X { string Name[0]; };", "t.mof:1:23: expected the size of an array, from 1 to 4294967295, found '0'"},
      {"class X { string Name[; };", "t.mof:1:23: expected ']' that closes the array's size, found ';'"},
      {"class X { uint8 N = 300; };",
       "t.mof:1:21: expected a default value of property 'N' of type uint8: 300 does not fit in uint8"},
      {"class X { uint8 N[] = 3; };",
       "t.mof:1:23: expected a default value of property 'N' of type uint8[]: a single value is given where an array "
       "of "
       "uint8 belongs"},
      {"class X { datetime T = \"now\"; };",
       "t.mof:1:24: expected a default value of property 'T' of type datetime: \"now\" is no datetime"},
      {"class X { uint8 N = ; };", "t.mof:1:21: expected a default value of property 'N', found ';'"},
      {"class X { uint8 F(string a,); };", "t.mof:1:28: expected a parameter after ',', found ')'"},
      {"class X { uint8 F(string a string b); };",
       "t.mof:1:28: expected ')' after the parameters of method 'F', found 'string'"},
      {"class X { uint8 F() };", "t.mof:1:21: expected ';' after method 'F', found '}'"},
      {"[Key string", "t.mof:1:6: expected ',' or ']' after qualifier 'Key', found 'string'"},
      {"[]", "t.mof:1:2: expected the name of a qualifier, found ']'"},
      {"[Key(]", "t.mof:1:6: expected a value of qualifier 'Key', found ']'"},
      {"[Key(true]", "t.mof:1:10: expected ')' after the value of qualifier 'Key', found ']'"},
      {"[Values {\"a\" \"b\" 5}]", "t.mof:1:18: expected ',' or '}', found '5'"},
      {"[Values {\"a\",}]", "t.mof:1:14: expected a value of qualifier 'Values', found '}'"},
      {"[Key : Sticky] class X {};",
       "t.mof:1:8: expected one of EnableOverride, DisableOverride, ToSubclass, Restricted, Translatable, found "
       "'Sticky'"},
      {"qualifier Key boolean", "t.mof:1:15: expected ':' after the name of a qualifier, found 'boolean'"},
      {"qualifier Key : bool", "t.mof:1:17: expected a data type, found 'bool'"},
      {"qualifier Key : boolean = 1",
       "t.mof:1:27: expected a default value of qualifier 'Key' of type boolean: 1 is no value of type boolean"},
      {"qualifier Key : boolean, scope(thing);",
       "t.mof:1:32: expected one of class, association, indication, property, reference, method, parameter, any, found "
       "'thing'"},
      {"qualifier Key : boolean;", "t.mof:1:24: expected ',' before the scope of qualifier 'Key', found ';'"},
      {"instance X {};", "t.mof:1:10: expected 'of' after 'instance', found 'X'"},
      {"instance of X as Y {};", "t.mof:1:18: expected an alias, like $x, after 'as', found 'Y'"},
      {"instance of X { A 1; };", "t.mof:1:19: expected '=' after property 'A', found '1'"},
      {"instance of X { A = class; };", "t.mof:1:21: expected a value of property 'A', found 'class'"},
      {"instance of X { A = {{1}}; };", "t.mof:1:22: expected a value of property 'A', found '{'"},
      {"#pragmatic", "t.mof:1:1: expected '#pragma', found '#pragmatic'"},
      {"#include", "t.mof:1:1: expected '#pragma', found '#include'"},
      {"#pragma locale \"en\"", "t.mof:1:16: expected '(' after the name of a directive, found \"en\""},
      {"#pragma locale (en)", "t.mof:1:17: expected a text in double quotes, found 'en'"},
      {"#pragma locale (\"en\"", "t.mof:1:21: expected ')' that closes the directive, found the end of the text"},
      {"class X {};\n/* open", "t.mof:2:1: expected '*/' that closes this comment, found the end of the text"},
      {"+", "t.mof:1:1: expected a number, found '+'"},
      {"$", "t.mof:1:1: expected the name of an alias after '$'"},
      {"class X { /", "t.mof:1:11: expected a word, a value or a mark, found '/'"},
      {"class X { @", "t.mof:1:11: expected a word, a value or a mark, found '@'"},
      {"class \xFF", "t.mof:1:7: expected UTF-8, found byte 0xff"},
      {"class X {\r\n\tstring A B;};", "t.mof:2:11: expected ';' after property 'A', found 'B'"},
  };
  for (const auto& [text, error] : rows) EXPECT_EQ(errorOf(text), error) << text;
}

TEST(MofReader, NamesANulByte) {
  EXPECT_EQ(errorOf(std::string_view("class X\0{};", 11)),
            "t.mof:1:8: expected a word, a value or a mark, found byte 0x00");
}

TEST(MofReader, ShortensWhatWasFoundWithoutBreakingACharacter) {
  std::string word;
  for (int i = 0; i < 100; ++i) word += "\xC3\xA4";
  const std::string error = errorOf("class X " + word);
  EXPECT_THAT(error, HasSubstr("..."));
  EXPECT_LT(error.size(), 120U);
  EXPECT_THAT(error, HasSubstr("\xC3\xA4...'"));
}

TEST(MofReader, DeliversTheDeclarationsBeforeTheError) {
  Collector collector;
  EXPECT_FALSE(parseMof("class A {}; class B {}; class", "t.mof", collector));
  EXPECT_EQ(collector.classes.size(), 2U);
}

TEST(MofReader, PassesOverOtherDirectives) {
  EXPECT_EQ(read("#pragma locale (\"en_US\")\n#PRAGMA Namespace(\"root\")\nclass X {};").classes.size(), 1U);
}

// Texts by name, as a tree of files would have them.
Expected<void, SchemaError> readTexts(const std::map<std::string, std::string>& texts, Collector& collector,
                                      const MofLimits& limits = {}) {
  return parseMof(
      texts.at("top"), "top", collector,
      [&](std::string_view name, std::string_view) {
        const auto found = texts.find(std::string(name));
        if (found == texts.end()) return MofInclude{std::string(name), {}, "there is no such text"};
        return MofInclude{found->first, found->second, {}};
      },
      limits);
}

TEST(MofInclude, BringsTheTextToItsPlace) {
  Collector collector;
  EXPECT_TRUE(
      readTexts({{"top", "class A {};\n#pragma include (\"b\")\nclass C {};"}, {"b", "class B {};"}}, collector));
  ASSERT_EQ(collector.classes.size(), 3U);
  EXPECT_EQ(collector.classes[1].name, "B");
  EXPECT_EQ(collector.files[1], "b");
  EXPECT_EQ(collector.files[2], "top");
}

TEST(MofInclude, NamesTheIncludedFileInItsErrors) {
  Collector collector;
  EXPECT_EQ(readTexts({{"top", "#pragma include (\"b\")"}, {"b", "\nclass {"}}, collector).error().text(),
            "b:2:7: expected the name of a class, found '{'");
}

TEST(MofInclude, IsAnErrorIfTheTextCannotBeRead) {
  Collector collector;
  EXPECT_EQ(readTexts({{"top", "\n #pragma include (\"b\")"}}, collector).error().text(),
            "top:2:10: cannot include \"b\": there is no such text");
  EXPECT_EQ(errorOf("#pragma include (\"b\")"),
            "t.mof:1:9: cannot include \"b\": this text is read without included files");
}

TEST(MofInclude, IsBoundedInDepthNumberAndSize) {
  Collector collector;
  EXPECT_EQ(readTexts({{"top", "#pragma include (\"top\")"}}, collector).error().message,
            "includes are nested deeper than 16 files");
  // Doubles at each level: 65,536 files if their number were not limited.
  EXPECT_EQ(readTexts({{"top", "#pragma include (\"a\")"},
                       {"a", "#pragma include (\"b\")\n#pragma include (\"b\")"},
                       {"b", "#pragma include (\"c\")\n#pragma include (\"c\")"},
                       {"c", ""}},
                      collector, {.includedFiles = 5})
                .error()
                .message,
            "more than 5 files are included");
  EXPECT_EQ(
      readTexts({{"top", "#pragma include (\"a\")"}, {"a", "class A {};"}}, collector, {.bytes = 30}).error().text(),
      "a: the text, with what it includes, is longer than the 30 bytes allowed");
}

class MofFile : public ::testing::Test {
 protected:
  MofFile() {
    char pattern[] = "/tmp/zorva-mof-XXXXXX";
    folder_ = mkdtemp(pattern);
  }
  ~MofFile() override { EXPECT_EQ(std::system(("rm -r '" + folder_ + "'").c_str()), 0); }
  std::string write(const std::string& name, const std::string& text) {
    std::ofstream(folder_ + "/" + name) << text;
    return folder_ + "/" + name;
  }
  std::string folder_;
};

TEST_F(MofFile, IsReadWithItsIncludesBesideIt) {
  ASSERT_EQ(mkdir((folder_ + "/sub").c_str(), 0700), 0);
  write("sub/b.mof", "#pragma include (\"c.mof\")\nclass B {};");
  write("sub/c.mof", "class C {};");
  Collector collector;
  const auto outcome = parseMofFile(write("a.mof", "#pragma include (\"sub/b.mof\")\nclass A {};"), collector);
  EXPECT_TRUE(outcome) << outcome.error().text();
  ASSERT_EQ(collector.classes.size(), 3U);
  EXPECT_EQ(collector.classes[0].name, "C");
  EXPECT_EQ(collector.files[0], folder_ + "/sub/c.mof");
}

TEST_F(MofFile, ThatCannotBeReadIsAnError) {
  Collector collector;
  EXPECT_EQ(parseMofFile(folder_ + "/none.mof", collector).error().text(),
            folder_ + "/none.mof: cannot read the file: No such file or directory");
  EXPECT_EQ(parseMofFile(folder_, collector).error().text(), folder_ + ": cannot read the file: it is no regular file");
  ASSERT_EQ(mkfifo((folder_ + "/fifo").c_str(), 0600), 0);
  EXPECT_EQ(parseMofFile(folder_ + "/fifo", collector).error().text(),
            folder_ + "/fifo: cannot read the file: it is no regular file");
  EXPECT_EQ(parseMofFile("/dev/zero", collector).error().text(),
            "/dev/zero: cannot read the file: it is no regular file");
}

TEST_F(MofFile, ThatIsTooLongIsAnError) {
  Collector collector;
  const std::string path = write("a.mof", std::string(200000, ' '));
  EXPECT_EQ(parseMofFile(path, collector, {.bytes = 100000}).error().text(),
            path + ": the text, with what it includes, is longer than the 100000 bytes allowed");
}

// For any bytes the reader ends, and an error points into the text.
void readAnything(std::string_view text) {
  ClassRepository repository;
  RepositorySink sink(repository);
  const auto outcome = parseMof(text, "t.mof", sink);
  if (outcome) return;
  EXPECT_FALSE(outcome.error().message.empty());
  EXPECT_GE(outcome.error().line, 1U);
  EXPECT_LE(outcome.error().column, text.size() + 1);
}

std::string allBuiltInText() {
  std::string all;
  for (std::size_t i = 0; i < kBuiltInMofCount; ++i) {
    const std::string_view text = kBuiltInMof[i].text;
    if (text.find("#pragma") == std::string_view::npos) all += text;
  }
  return all;
}

TEST(MofReader, SurvivesATextCutAnywhere) {
  const std::string all = allBuiltInText();
  for (std::size_t length = 0; length < all.size(); length += 389)
    readAnything(std::string_view(all).substr(0, length));
}

TEST(MofReader, SurvivesChangedBytes) {
  const std::string all = allBuiltInText();
  std::mt19937 random(20240229);
  for (int round = 0; round < 500; ++round) {
    std::string changed = all.substr(random() % (all.size() / 2), 6000);
    for (int i = 0; i < 6; ++i) {
      const std::size_t at = random() % changed.size();
      if (random() % 2 == 0) {
        changed[at] = static_cast<char>(random() % 256);
      } else {
        changed.insert(at, changed, random() % changed.size(), random() % 50);
      }
    }
    readAnything(changed);
  }
}

TEST(MofReader, SurvivesNoise) {
  std::mt19937 random(7);
  constexpr std::string_view marks = "[]{}(),;:=\"'\\$#/*-+.0xb classref";
  for (int round = 0; round < 2000; ++round) {
    std::string noise;
    for (int i = 0; i < 200; ++i) noise += marks[random() % marks.size()];
    readAnything(noise);
  }
}

TEST(MofReader, TakesLongTextsInStride) {
  const std::string many(1U << 20U, '[');
  EXPECT_EQ(errorOf(many), "t.mof:1:2: expected the name of a qualifier, found '['");
  EXPECT_EQ(textOf(valueOf("\"" + std::string(1U << 20U, 'x') + "\"")).size(), 1U << 20U);
  std::string pieces;
  for (int i = 0; i < 100000; ++i) pieces += "\"x\" ";
  EXPECT_EQ(textOf(valueOf(pieces)).size(), 100000U);
  std::string elements = "{ 0";
  for (int i = 0; i < 100000; ++i) elements += ",1";
  EXPECT_EQ(valueOf(elements + "}").elements.size(), 100001U);
}

}  // namespace
}  // namespace zorva::schema
