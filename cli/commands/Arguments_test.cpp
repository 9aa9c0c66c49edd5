#include "cli/commands/Arguments.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>

#include "agent/testing/TemporaryDirectory.h"

namespace zorva::cli {
namespace {

using testing::AllOf;
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

TEST(CommandLine, NamesTheSubcommandThatIsNot) {
  EXPECT_EQ(tellingOf({"frob"}).text, "zorvactl has no subcommand 'frob'");
  EXPECT_THAT(tellingOf({"frob"}).hint, HasSubstr("it has show, tree, "));
  EXPECT_EQ(tellingOf({"dns", "fr\x1Bob"}).text, "zorvactl dns has no subcommand 'fr\\x1Bob'");
  EXPECT_EQ(tellingOf({"dns"}).text, "zorvactl dns needs a subcommand");
  EXPECT_EQ(tellingOf({"dns"}).hint, "it has show, set, add, remove; zorvactl dns --help tells more");
  EXPECT_EQ(tellingOf({"ei"}).hint, "zorvactl enumerate --help shows the usage");
}

TEST(CommandLine, WantsALevelThatIsANumber) {
  for (const char* word : {"x", "-1", "3000x", "", "99999999999"}) {
    EXPECT_THAT(tellingOf({"show", "--log-level", word}).text, HasSubstr("is no level")) << word;
  }
}

TEST(CommandLine, TakesAServerOrWhatConcernsThisHost) {
  EXPECT_EQ(argumentsOf({"show", "--url", "http://h"}).url, "http://h");
  EXPECT_TRUE(tellingOf({"show", "--url", "http://h", "--provider-dir", "d"}).isError);
  EXPECT_TRUE(tellingOf({"show", "--url", "http://h", "--config", "f"}).isError);
}

/// What can stand behind these words: subcommands, or else options.
std::vector<std::string> subcommandsBehind(const std::vector<std::string>& words) {
  std::vector<std::string> found = completionBehind(words).words;
  std::erase_if(found, [](const std::string& word) { return word.starts_with("-") || word == "bash"; });
  return found;
}

/// "show", "dns", "dns set": every way to call the program.
std::vector<std::vector<std::string>> calls() {
  std::vector<std::vector<std::string>> all;
  for (const std::string& subcommand : subcommandsBehind({})) {
    all.push_back({subcommand});
    for (const std::string& below : subcommandsBehind({subcommand})) all.push_back({subcommand, below});
  }
  return all;
}

TEST(ManualPage, HasEverySubcommandAndOption) {
  std::string page = zorva::agent::testing::contentsOf(ZORVA_SOURCE_DIR "/cli/zorvactl.1");
  for (std::size_t at = page.find("\\-"); at != std::string::npos; at = page.find("\\-")) page.replace(at, 2, "-");
  EXPECT_EQ(calls().size(), 31U);
  for (const std::vector<std::string>& call : calls()) {
    EXPECT_THAT(page, testing::ContainsRegex("[ \"]" + call.back() + "[ \"\n]")) << call.front();
    for (const std::string& word : completionBehind(call).words) EXPECT_THAT(page, HasSubstr(word)) << call.back();
  }
}

TEST(Help, OfEverySubcommandHasAnExample) {
  for (const std::vector<std::string>& call : calls()) {
    std::vector<const char*> words;
    for (const std::string& word : call) words.push_back(word.c_str());
    words.push_back("--help");
    const Telling help = tellingOf(words);
    EXPECT_FALSE(help.isError);
    EXPECT_THAT(help.text, AllOf(HasSubstr("\nExamples:\n  "), HasSubstr("zorvactl "))) << call.back();
  }
}

}  // namespace
}  // namespace zorva::cli
