#include "cli/Arguments.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>

namespace zorva::cli {
namespace {

using testing::Contains;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsSupersetOf;
using testing::Not;

std::variant<Invocation, Telling> read(std::vector<const char*> words) {
  words.insert(words.begin(), "zorvactl");
  return readArguments(static_cast<int>(words.size()), words.data());
}

Arguments argumentsOf(const std::vector<const char*>& words) {
  const auto result = read(words);
  const auto* invocation = std::get_if<Invocation>(&result);
  if (invocation == nullptr) {
    ADD_FAILURE() << std::get<Telling>(result).text;
    return {};
  }
  EXPECT_TRUE(invocation->command);
  return invocation->arguments;
}

Telling tellingOf(const std::vector<const char*>& words) {
  const auto result = read(words);
  const auto* telling = std::get_if<Telling>(&result);
  return telling == nullptr ? Telling{} : *telling;
}

TEST(CommandLine, TakesItsOwnOptionsBeforeAndBehindTheSubcommand) {
  EXPECT_EQ(argumentsOf({"--output", "json", "ei", "C"}).output, OutputFormat::Json);
  const Arguments arguments = argumentsOf({"ei", "C", "-o", "mof", "--log-level=3000", "--config", "f"});
  EXPECT_EQ(arguments.output, OutputFormat::Mof);
  EXPECT_EQ(arguments.logLevel, 3000);
  EXPECT_EQ(arguments.config, "f");
  EXPECT_EQ(arguments.target, "C");
}

TEST(CommandLine, KnowsTheShortNamesOfItsSubcommands) {
  for (const char* name : {"ei", "ein", "gi", "ai", "ain", "ri", "rin"})
    EXPECT_EQ(argumentsOf({name, "X"}).target, "X");
  EXPECT_THAT(argumentsOf({"mi", "P", "a=b", "c="}).values, ElementsAre("a=b", "c="));
  EXPECT_EQ(argumentsOf({"cm", "P", "M"}).method, "M");
}

TEST(CommandLine, TakesAWordThatIsNamedLikeASubcommandAsTheWordThatItIs) {
  EXPECT_EQ(argumentsOf({"ifcfg", "show", "tree"}).target, "tree");
  EXPECT_EQ(argumentsOf({"dns", "set", "show", "set"}).target, "show");
  EXPECT_THAT(argumentsOf({"dns", "set", "show", "set"}).values, ElementsAre("set"));
}

TEST(CommandLine, TakesWordsThatBeginWithAHyphenBehindTwo) {
  EXPECT_EQ(argumentsOf({"ifcfg", "show", "--", "-x"}).target, "-x");
}

TEST(CommandLine, TakesTheEmptyTextAsADomain) {
  EXPECT_THAT(argumentsOf({"domain", "eth0", ""}).values, ElementsAre(""));
}

TEST(CommandLine, ReadsTheFiltersOfAssociations) {
  const Arguments arguments =
      argumentsOf({"ai", "P", "--assoc-class", "A", "--result-class", "B", "--role", "R", "--result-role", "S"});
  EXPECT_EQ(arguments.associationClass, "A");
  EXPECT_EQ(arguments.resultClass, "B");
  EXPECT_EQ(arguments.role, "R");
  EXPECT_EQ(arguments.resultRole, "S");
  EXPECT_EQ(argumentsOf({"ri", "P", "--result-class", "A"}).associationClass, "A");
}

TEST(CommandLine, TakesSeveralPropertiesOneByOne) {
  EXPECT_THAT(argumentsOf({"gi", "--property", "A", "P", "--property", "B"}).properties, ElementsAre("A", "B"));
}

TEST(CommandLine, RefusesWhatItDoesNotKnow) {
  for (const std::vector<const char*>& words : std::vector<std::vector<const char*>>{{},
                                                                                     {"frob"},
                                                                                     {"ei"},
                                                                                     {"ei", "A", "B"},
                                                                                     {"dns"},
                                                                                     {"dns", "set"},
                                                                                     {"dns", "add", "eth0"},
                                                                                     {"mi", "P"},
                                                                                     {"ei", "C", "--log-level", "much"},
                                                                                     {"domain", "eth0"},
                                                                                     {"completion", "fish"}}) {
    EXPECT_TRUE(tellingOf(words).isError) << (words.empty() ? "" : words.front());
  }
}

TEST(CommandLine, NamesTheFormatThatItDoesNotKnow) {
  EXPECT_THAT(tellingOf({"ei", "C", "--output", "y\x1Bml"}).text, HasSubstr("'y\\x1Bml' is none of table, json, mof"));
}

TEST(CommandLine, HasHelpForItselfAndEachSubcommand) {
  EXPECT_THAT(tellingOf({"--help"}).text, HasSubstr("Examples:"));
  EXPECT_FALSE(tellingOf({"--help"}).isError);
  EXPECT_THAT(tellingOf({"modify", "--help"}).text, HasSubstr("zorvactl modify"));
  EXPECT_THAT(tellingOf({"dns", "add", "--help"}).text, HasSubstr("SERVER"));
  EXPECT_THAT(tellingOf({"--version"}).text, HasSubstr("zorvactl 1."));
}

TEST(Completion, OffersTheSubcommands) {
  EXPECT_THAT(completionBehind({}).words, IsSupersetOf({"show", "tree", "ifcfg", "--output"}));
  EXPECT_THAT(completionBehind({}).words, Not(Contains("complete")));
  EXPECT_THAT(completionBehind({"dns"}).words, IsSupersetOf({"show", "set", "add", "remove"}));
}

TEST(Completion, KnowsWhatAPlaceWants) {
  EXPECT_EQ(completionBehind({"ei"}).kind, "CLASS");
  EXPECT_EQ(completionBehind({"-o", "json", "gi"}).kind, "PATH");
  EXPECT_EQ(completionBehind({"dns", "set"}).kind, "INTERFACE");
  EXPECT_EQ(completionBehind({"dns", "set", "eth0"}).kind, "SERVER");
  EXPECT_EQ(completionBehind({"ai", "P", "--result-class"}).kind, "CLASS");
  EXPECT_EQ(completionBehind({"--config"}).kind, "FILE");
}

TEST(Completion, OffersTheFormats) { EXPECT_THAT(completionBehind({"--output"}).words, Contains("json")); }

}  // namespace
}  // namespace zorva::cli
