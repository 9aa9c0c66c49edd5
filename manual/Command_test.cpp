#include "manual/Command.h"

#include <gtest/gtest.h>

#include <stdexcept>

namespace zorva::manual {
namespace {

Command command() {
  const DeclaredOption help{"--help", "-h", {}, "Print this help message and exit"};
  const DeclaredOption dry{"--dry-run", {}, {}, "Show what would be done"};
  Command set{"prog dns set", "Replace them", {"s"}, {}, {help, dry}, {}, "  prog dns set eth0 a       one", {}};
  set.arguments = {{"INTERFACE", {}, {}, "The interface", true}, {"SERVER", {}, {}, "The servers", false, true}};
  Command clear{"prog dns clear", "Take them back", {}, {}, {help, dry, {"--file", "-f", "FILE", "Which"}}, {}, {}, {}};
  return {"prog dns",       "The servers", {}, {}, {help}, {set, clear}, "  prog dns set eth0 a       one",
          {"table", "json"}};
}

TEST(CommandPage, HasAllThatTheCommandLineDeclares) {
  EXPECT_EQ(
      textOf(commandPage(command(), "About it.\n\n## COMMANDS\n= `set`\nTwice is wrong.\n\n## SEE ALSO\n`x`(1)\n"), 70),
      R"(prog-dns - the servers

SYNOPSIS
    prog dns set [--dry-run] INTERFACE [SERVER...]

    prog dns clear [--dry-run] [--file FILE]

DESCRIPTION
    About it.

COMMANDS
    set, s INTERFACE [SERVER...]
        Replace them. Twice is wrong.

    clear
        Take them back.

OPTIONS
    --dry-run
        Show what would be done.

    -f, --file FILE
        Which.

OUTPUT
    --output FORMAT is one of table, json.

EXAMPLES
        prog dns set eth0 a   # one

SEE ALSO
    x(1)
)");
}

TEST(CommandPage, ProseAboutWhatTheCommandLineDoesNotHaveIsAnError) {
  EXPECT_THROW(commandPage(command(), "## OPTIONS\n= `--gone`\nIs gone.\n"), std::logic_error);
  EXPECT_THROW(commandPage(command(), "## COMMANDS\n= `se`\nNone.\n"), std::logic_error);
}

}  // namespace
}  // namespace zorva::manual
