#include "manual/Page.h"

#include <gtest/gtest.h>

#include "manual/Markup.h"

namespace zorva::manual {
namespace {

constexpr const char* kProse = R"(Shows <NAME>
with `--all`.

Second.

    literal  `as it is`
    .dot

## FILES
= <file.conf>
what it is,
in two lines
+ and more

= `-x`
an option
)";

Page page() {
  Page made{"zorvactl-x", 1, "User commands", "show it"};
  made.sections = sectionsOf(kProse);
  return made;
}

TEST(Page, ProseIsParagraphsItemsAndLiterals) {
  EXPECT_EQ(textOf(page(), 40), R"(zorvactl-x - show it

DESCRIPTION
    Shows NAME with --all.

    Second.

        literal  `as it is`
        .dot

FILES
    file.conf
        what it is, in two lines

        and more

    -x
        an option
)");
}

TEST(Page, RoffHasFontsAndNoRequestsFromText) {
  EXPECT_EQ(roffOf(page(), "1.0"), R"(.TH ZORVACTL\-X 1 "" "Zorva 1.0" "User commands"
.SH NAME
zorvactl\-x \- show it
.SH DESCRIPTION
Shows \fINAME\fR with \fB\-\-all\fR.
.PP
Second.
.PP
.RS 4
.nf
literal  \(gaas it is\(ga
\&.dot
.fi
.RE
.SH FILES
.TP
\fIfile.conf\fR
what it is, in two lines
.IP
and more
.TP
\fB\-x\fR
an option
)");
}

TEST(Markup, TextIsFilledToTheWidthAndLongWordsAreWhole) {
  EXPECT_EQ(filled("one two  three\nfourteen-chars", 10, "# "), "# one two\n# three\n# fourteen-chars\n");
  EXPECT_EQ(sentence("It is so"), "It is so.");
  EXPECT_EQ(sentence("Is it so?"), "Is it so?");
}

}  // namespace
}  // namespace zorva::manual
