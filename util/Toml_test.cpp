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

std::string problemOf(const std::string& text, const std::function<void(TomlTable&)>& read) {
  return problem([&] {
    const TomlDocument document(text);
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
  const TomlDocument document(text);
  TomlTable table(document, "t");
  Values values;
  table.take("name", values.name);
  table.take("flag", values.flag);
  table.take("number", values.number);
  table.take("small", values.small, 0, 1);
  table.take("list", values.list, "expected a list");
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

TEST(Toml, AValueOfAnotherTypeIsRefusedWithLineAndKey) {
  const auto text = [](TomlTable& table) {
    std::string value;
    table.take("k", value);
  };
  const auto number = [](TomlTable& table) {
    int value = 0;
    table.take("k", value);
  };
  const auto ranged = [](TomlTable& table) {
    int value = 0;
    table.take("k", value, 1, 9);
  };
  const auto flag = [](TomlTable& table) {
    bool value = false;
    table.take("k", value);
  };
  const auto list = [](TomlTable& table) {
    std::optional<std::vector<std::string>> value;
    table.take("k", value, "expected a list of names");
  };
  EXPECT_EQ(problemOf("[t]\n\nk = 1\n", text), "3 t.k: expected a text in quotes");
  EXPECT_EQ(problemOf("[t]\nk = \"a\\u0000b\"\n", text), "2 t.k: must not hold a NUL");
  EXPECT_EQ(problemOf("[t]\nk = 'a'\n", number), "2 t.k: expected a whole number");
  EXPECT_EQ(problemOf("[t]\nk = 2147483648\n", number), "2 t.k: is out of range");
  EXPECT_EQ(problemOf("[t]\nk = 1.5\n", ranged), "2 t.k: expected a whole number from 1 to 9");
  EXPECT_EQ(problemOf("[t]\nk = 10\n", ranged), "2 t.k: must be from 1 to 9");
  EXPECT_EQ(problemOf("[t]\nk = 1\n", flag), "2 t.k: expected true or false");
  EXPECT_EQ(problemOf("[t]\nk = []\n", list), "2 t.k: expected a list of names");
  EXPECT_EQ(problemOf("[t]\nk = [1]\n", list), "2 t.k: expected a text in quotes");
}

TEST(Toml, UnknownKeysAreRefused) {
  EXPECT_EQ(problemOf("[t]\nk = 1\n", [](TomlTable&) {}), "2 t.k: is not a known key");
  EXPECT_EQ(problemOf("t = 1\n", [](TomlTable&) {}), "1 t: expected a table");
  EXPECT_EQ(problem([] { TomlDocument("[a]\n[b]\n").refuseAllBut({"a"}); }), "2 b: is not a known table or key");
  EXPECT_EQ(problem([] { TomlDocument("[a]\n").refuseAllBut({"a"}); }), "");
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
