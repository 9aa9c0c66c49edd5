#include "util/Toml.h"

#include <gtest/gtest.h>

#include <functional>

namespace zorva::util {
namespace {

// "LINE KEY: what is wrong", or empty text.
std::string problem(const std::function<void()>& read) {
  try {
    read();
  } catch (const TomlError& error) {
    return std::to_string(error.line()) + " " + error.key() + ": " + error.what();
  }
  return {};
}

constexpr TomlKey kKeys[] = {
    {.name = "name"},
    {.name = "flag", .type = TomlType::Switch},
    {.name = "number", .type = TomlType::Number},
    {.name = "small", .type = TomlType::Number, .least = 1, .most = 9},
    {.name = "list", .type = TomlType::Texts, .example = "['a']"},
    {.name = "word", .words = "one|two|three"},
};
constexpr TomlSection kSections[] = {{.name = "t", .keys = kKeys}};

std::string problemOf(const std::string& text, const std::function<void(TomlTable&)>& read) {
  return problem([&] {
    const TomlDocument document(text, kSections);
    TomlTable table(document, "t");
    read(table);
    table.finish();
  });
}

struct Values {
  std::string name = "a";
  bool flag = true;
  int number = 3;
  int small = 4;
  std::optional<std::vector<std::string>> list;
};

Values valuesOf(const std::string& text) {
  const TomlDocument document(text, kSections);
  TomlTable table(document, "t");
  Values values;
  table.take("name", values.name);
  table.take("flag", values.flag);
  table.take("number", values.number);
  table.take("small", values.small);
  table.take("list", values.list);
  table.finish();
  return values;
}

TEST(Toml, AValueThatIsNotThereStaysAsItIs) {
  for (const char* text : {"", "[t]\n"}) {
    const Values values = valuesOf(text);
    EXPECT_EQ(values.name, "a");
    EXPECT_TRUE(values.flag);
    EXPECT_EQ(values.number, 3);
    EXPECT_EQ(values.small, 4);
    EXPECT_EQ(values.list, std::nullopt);
  }
}

TEST(Toml, ValuesAreTaken) {
  const Values values = valuesOf("[t]\nname = 'b'\nflag = false\nnumber = -7\nsmall = 1\nlist = ['x', 'y']\n");
  EXPECT_EQ(values.name, "b");
  EXPECT_FALSE(values.flag);
  EXPECT_EQ(values.number, -7);
  EXPECT_EQ(values.small, 1);
  EXPECT_EQ(values.list, (std::vector<std::string>{"x", "y"}));
}

/// The error of a document with this key of this value, which is taken as the variable's type.
template <typename Value>
std::string problemOfValue(const char* key, const std::string& value) {
  return problemOf("[t]\n" + std::string(key) + " = " + value + "\n", [key](TomlTable& table) {
    Value taken{};
    table.take(key, taken);
  });
}

TEST(Toml, AValueOfAnotherTypeIsRefusedWithLineAndKey) {
  using List = std::optional<std::vector<std::string>>;
  EXPECT_EQ(problemOfValue<std::string>("name", "1"), "2 t.name: expected a text in quotes");
  EXPECT_EQ(problemOfValue<std::string>("name", "\"a\\u0000b\""), "2 t.name: must not hold a NUL");
  EXPECT_EQ(problemOfValue<int>("number", "'a'"), "2 t.number: expected a whole number");
  EXPECT_EQ(problemOfValue<int>("number", "2147483648"), "2 t.number: is out of range");
  EXPECT_EQ(problemOfValue<int>("small", "1.5"), "2 t.small: expected a whole number from 1 to 9");
  EXPECT_EQ(problemOfValue<int>("small", "10"), "2 t.small: must be from 1 to 9");
  EXPECT_EQ(problemOfValue<bool>("flag", "1"), "2 t.flag: expected true or false");
  EXPECT_EQ(problemOfValue<List>("list", "[]"), "2 t.list: expected a list of texts such as ['a']");
  EXPECT_EQ(problemOfValue<List>("list", "[1]"), "2 t.list: expected a text in quotes");
}

TEST(Toml, AWordMustBeOneOfItsKey) {
  EXPECT_EQ(problemOfValue<std::string>("word", "'two'"), "");
  for (const char* word : {"'four'", "''", "'one|two'", "'tw'"}) {
    EXPECT_EQ(problemOfValue<std::string>("word", word), "2 t.word: must be \"one\", \"two\" or \"three\"") << word;
  }
}

TEST(Toml, UnknownKeysAreRefused) {
  EXPECT_EQ(problemOf("[t]\nk = 1\n", [](TomlTable&) {}), "2 t.k: is not a known key");
  EXPECT_EQ(problemOf("t = 1\n", [](TomlTable&) {}), "1 t: expected a table");
  EXPECT_EQ(problem([] { TomlDocument("[t]\n[b]\n", kSections); }), "2 b: is not a known table or key");
  EXPECT_EQ(problem([] { TomlDocument("[b]\n"); }), "");
}

TEST(Toml, AKeyThatIsNotDeclaredCannotBeTaken) {
  EXPECT_THROW(problemOfValue<std::string>("undeclared", "'a'"), std::logic_error);
}

TEST(Toml, TextThatIsNoTomlIsRefusedWithItsLine) {
  EXPECT_EQ(problem([] { TomlDocument("[t]\nk = \n"); }).substr(0, 4), "2 : ");
}

TEST(Toml, APathIsTakenFromTheDirectoryOfTheFileThatNamesIt) {
  EXPECT_EQ(pathFrom("/etc/zorvagent/agent.toml", "tree.json"), "/etc/zorvagent/tree.json");
  EXPECT_EQ(pathFrom("/etc/zorvagent/agent.toml", "/srv/tree.json"), "/srv/tree.json");
  EXPECT_EQ(pathFrom("/etc/zorvagent/agent.toml", ""), "");
}

}  // namespace
}  // namespace zorva::util
