#include "cli/output/Table.h"

#include <gtest/gtest.h>

#include <sstream>

#include "cli/output/Text.h"

namespace zorva::cli {
namespace {

TEST(Table, LinesUpItsColumns) {
  Table table({"NAME", "STATE"}, 2);
  table.add({"eth0", "up"});
  table.add({"longer-name", "down"});
  EXPECT_EQ(table.text({}),
            "  NAME         STATE\n"
            "  eth0         up\n"
            "  longer-name  down\n");
}

TEST(Table, LinesUpWideCharacters) {
  Table table;
  table.add({"\xE7\xB6\xB2", "x"});
  table.add({"abcd", "y"});
  EXPECT_EQ(table.text({}), "\xE7\xB6\xB2    x\nabcd  y\n");
}

TEST(Table, HasNoBlanksAtTheEndOfALine) {
  Table table({"A", "B", "C"});
  table.add({"1", "", ""});
  table.add({"", "", "3"});
  table.add({"1", "blank "});
  EXPECT_EQ(table.text({}), "A  B       C\n1\n           3\n1  blank\n");
}

TEST(Table, WrapsTheWidestColumnToFitTheTerminal) {
  Table table;
  table.add({"DNSSuffixesToAppend", "a.example b.example c.example d.example e.example"});
  const std::string text = table.text({40, false});
  std::istringstream lines(text);
  for (std::string line; std::getline(lines, line);) EXPECT_LE(displayWidth(line), 40U) << line;
  EXPECT_EQ(text,
            "DNSSuffixesToAppend  a.example b.example\n"
            "                     c.example d.example\n"
            "                     e.example\n");
}

TEST(Table, StaysReadableOnATerminalThatIsTooNarrow) {
  Table table;
  table.add({"aaaaaaaaaaaa", "bbbbbbbbbbbb"});
  EXPECT_EQ(table.text({3, false}), "aaaaaaaa  bbbbbbbb\naaaa      bbbb\n");
}

TEST(Table, EscapesWhatItIsGiven) {
  Table table;
  table.add(
      {"a\x1B]0;title\x07"
       "b"});
  EXPECT_EQ(table.text({}), "a\\x1B]0;title\\x07b\n");
}

TEST(Table, ColoursOnlyWhereColoursAreShown) {
  Table table({"H"});
  table.add({Cell("ok", Style::Good)});
  EXPECT_EQ(table.text({0, true}), "\033[1mH\033[0m\n\033[32mok\033[0m\n");
  EXPECT_EQ(table.text({0, false}), "H\nok\n");
}

TEST(Table, CutsRowsToOneLine) {
  Table table({"NAME", "SERVERS", "FROM"});
  table.keepRowsOnOneLine({{2, 8}});
  table.add({"eth0", Cell::list({"192.0.2.1", "192.0.2.2", "192.0.2.3", "192.0.2.4"}), "a long description"});
  table.add({"eth1", Cell::list({}), "x"});
  EXPECT_EQ(table.text({40, false}),
            "NAME  SERVERS                   FROM\n"
            "eth0  192.0.2.1 and 3 more      a long \u2026\n"
            "eth1  -                         x\n");
}

TEST(Table, CutsALongListAlsoWhereThereIsNoTerminal) {
  Table table;
  table.keepRowsOnOneLine({});
  table.add({Cell::list(std::vector<std::string>(1000, "192.0.2.1")), std::string(100, 'x')});
  EXPECT_EQ(table.text({}),
            "192.0.2.1 192.0.2.1 192.0.2.1 192.0.2.1 and 996 more          " + std::string(100, 'x') + "\n");
}

}  // namespace
}  // namespace zorva::cli
