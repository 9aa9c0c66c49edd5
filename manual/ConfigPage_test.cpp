#include "manual/ConfigPage.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "manual/testing/ConfigFiles.h"

namespace zorva::manual {
namespace {

using ::testing::HasSubstr;

constexpr util::TomlKey kKeys[] = {
    {.name = "port",
     .type = util::TomlType::Number,
     .standard = "80",
     .example = "8080",
     .meaning = "Where it `listens`.",
     .least = 0,
     .most = 65535},
    {.name = "names", .type = util::TomlType::Texts, .example = R"(["a"])", .meaning = "Names."},
    {.name = "mode",
     .standard = R"("a")",
     .example = R"("b")",
     .meaning = "How.",
     .words = "a|b|c",
     .installed = R"("b")"},
};
constexpr util::TomlSection kSections[] = {{"net", "The network.", kKeys}};
constexpr ConfigFile kFile{"x.toml", "the configuration of x", "Of x.", "What it is.\n\n## SEE ALSO\n`x`(1)\n",
                           kSections};

TEST(ConfigPage, TheSampleHasEveryKeyWithItsDefault) {
  EXPECT_EQ(sampleOf(kFile), R"(# Of x.

[net]
# The network.

# Where it listens. (number from 0 to 65535)
#port = 80

# Names. (list of texts)
#names = ["a"]

# How. (a, b or c)
#mode = "a"
mode = "b"
)");
}

TEST(ConfigPage, ATestCanTakeTheSamplesKeysInEffect) {
  EXPECT_EQ(testing::uncommented(sampleOf(kFile)), "[net]\nport = 80\nnames = [\"a\"]\nmode = \"a\"\n");
  EXPECT_EQ(testing::examplesWithout(kSections, {"net", "names"}), "[net]\nport = 8080\nmode = \"b\"\n");
}

TEST(ConfigPage, SaysOfEachKeyAllThatIsKnown) {
  const std::string text = textOf(configPage(kFile), 200);
  EXPECT_THAT(text, HasSubstr("    port (number from 0 to 65535)\n"
                              "        Where it listens. Default: 80. Example: port = 8080.\n"));
  EXPECT_THAT(text, HasSubstr("Default: none."));
  EXPECT_THAT(text, HasSubstr("mode (a, b or c)\n        How. Default: \"a\". The file that is installed has \"b\"."));
  EXPECT_LT(text.find("What it is."), text.find("[net]"));
  EXPECT_LT(text.find("[net]"), text.find("SEE ALSO"));
}

}  // namespace
}  // namespace zorva::manual
