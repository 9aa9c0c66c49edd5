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

TEST(Toml, AValueThatIsNotThereStaysAsItIs) {
  for (const char* text : {"", "[t]\n"}) {
    const TomlDocument document(text);
    TomlTable table(document, "t");
    std::string name = "a";
    bool flag = true;
    int number = 3;
    std::optional<std::vector<std::string>> list;
    table.take("name", name);
    table.take("flag", flag);
    table.take("number", number);
    table.take("number", number, 0, 1);
    table.take("list", list, "expected a list");
    table.finish();
    EXPECT_EQ(name, "a");
    EXPECT_TRUE(flag);
    EXPECT_EQ(number, 3);
    EXPECT_EQ(list, std::nullopt);
  }
}

TEST(Toml, ValuesAreTaken) {
  const TomlDocument document("[t]\nname = 'b'\nflag = false\nnumber = -7\nsmall = 1\nlist = ['x', 'y']\n");
  TomlTable table(document, "t");
  std::string name;
  bool flag = true;
  int number = 0;
  int small = 0;
  std::optional<std::vector<std::string>> list;
  table.take("name", name);
  table.take("flag", flag);
  table.take("number", number);
  table.take("small", small, 0, 1);
  table.take("list", list, "expected a list");
  table.finish();
  EXPECT_EQ(name, "b");
  EXPECT_FALSE(flag);
  EXPECT_EQ(number, -7);
  EXPECT_EQ(small, 1);
  EXPECT_EQ(list, (std::vector<std::string>{"x", "y"}));
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
