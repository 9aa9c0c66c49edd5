#include "cli/commands/CommandLine.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>

#include "cli/commands/Commands.h"

namespace zorva::cli {
namespace {

using testing::AllOf;
using testing::Contains;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::IsSupersetOf;
using testing::Not;

/// A command line as the program has it, or one that a test registers, with the words that it has read.
struct Read {
  CommandLine line;
  std::optional<Telling> telling;

  explicit Read(std::vector<const char*> words, void (*add)(CommandLine&) = addCommands) {
    add(line);
    words.insert(words.begin(), "zorvactl");
    telling = line.read(static_cast<int>(words.size()), words.data());
  }
};

Globals globalsOf(const std::vector<const char*>& words) {
  const Read read(words);
  if (read.telling) ADD_FAILURE() << read.telling->text;
  return read.line.globals();
}

Telling tellingOf(const std::vector<const char*>& words) { return Read(words).telling.value_or(Telling{}); }

Completion completionAfter(const std::vector<std::string>& words) {
  CommandLine line;
  addCommands(line);
  return line.completionAfter(words);
}

TEST(CommandLine, TakesItsOwnOptionsBeforeAndAfterTheSubcommand) {
  EXPECT_EQ(globalsOf({"--output", "json", "ei", "C"}).output, OutputFormat::Json);
  const Globals globals = globalsOf({"ei", "C", "-o", "mof", "--log-level=3000", "--config", "f"});
  EXPECT_EQ(globals.output, OutputFormat::Mof);
  EXPECT_EQ(globals.logLevel, 3000);
  EXPECT_EQ(globals.config, "f");
}

TEST(CommandLine, KnowsTheShortNamesOfItsSubcommands) {
  for (const char* name : {"ei", "ein", "gi", "ai", "ain", "ri", "rin"}) {
    EXPECT_FALSE(tellingOf({name, "X"}).isError) << name;
  }
  EXPECT_FALSE(tellingOf({"mi", "P", "a=b", "c="}).isError);
  EXPECT_FALSE(tellingOf({"cm", "P", "M"}).isError);
}

// The names of all subcommands, with short ones and hidden ones.
std::vector<std::string> allNames() {
  CommandLine line;
  addCommands(line);
  std::vector<std::string> names{"guard-trial"};  // hidden
  for (const manual::Command& command : line.description().commands) {
    names.push_back(command.name());
    names.insert(names.end(), command.aliases.begin(), command.aliases.end());
  }
  return names;
}

bool describesTheOthers(const std::string& name) { return name == "help" || name == "completion"; }

TEST(CommandLine, ASubcommandAloneIsWhatItIsAmongAll) {
  CommandLine all;
  addCommands(all);
  for (const std::string& name : allNames()) {
    CommandLine one;
    ASSERT_EQ(addNamedCommands(one, {"--output", "json", name, "C"}), !describesTheOthers(name)) << name;
    if (describesTheOthers(name)) continue;
    EXPECT_LT(one.description().commands.size(), 5U) << name << " is registered with its family";
    const std::vector<const char*> help{"zorvactl", name.c_str(), "--help"};
    EXPECT_EQ(one.read(3, help.data()).value().text, tellingOf({name.c_str(), "--help"}).text);
  }
}

TEST(CommandLine, WordsThatNameSeveralSubcommandsOrNoneLeaveNothingOut) {
  for (const std::vector<std::string_view>& words : {std::vector<std::string_view>{},
                                                     {"--help"},
                                                     {"frob"},
                                                     {"help"},
                                                     {"complete", "x"},
                                                     {"help", "show"},
                                                     {"overlay", "show"},
                                                     {"ei", "tree"}}) {
    CommandLine line;
    EXPECT_FALSE(addNamedCommands(line, words));
    EXPECT_TRUE(line.description().commands.empty());
  }
}

/// The values that a test's subcommand has read.
struct Seen {
  std::string path;
  std::string role;
  std::vector<std::string> properties;
  std::vector<std::string> values;
  bool force = false;
  int runs = 0;
};

Seen seen;

void addTestCommand(CommandLine& line) {
  line.add("try", "")
      .word("PATH", "", seen.path)
      .option("--role", "ROLE", "", seen.role)
      .repeatable("--property", "PROPERTY", "", seen.properties)
      .flag("--force", "", seen.force)
      .words("NAME", "", Many::Any, seen.values)
      .runs([](const Globals& /*globals*/) { ++seen.runs; });
}

/// The values that are read if these words follow "try".
Seen seenOf(std::vector<const char*> words) {
  seen = Seen();
  words.insert(words.begin(), "try");
  const Read read(words, addTestCommand);
  if (read.telling) {
    ADD_FAILURE() << read.telling->text;
  } else {
    read.line.run();
  }
  return seen;
}

TEST(CommandLine, ReadsWordsOptionsAndFlagsInAnyOrderAndRunsTheCommandOnce) {
  const Seen read = seenOf({"--property", "A", "P", "--force", "--property", "B", "--role", "R", "v", "w"});
  EXPECT_EQ(read.path, "P");
  EXPECT_EQ(read.role, "R");
  EXPECT_THAT(read.properties, ElementsAre("A", "B"));
  EXPECT_THAT(read.values, ElementsAre("v", "w"));
  EXPECT_TRUE(read.force);
  EXPECT_EQ(read.runs, 1);
}

TEST(CommandLine, LeavesWhatIsNotGivenAsItIs) {
  const Seen read = seenOf({"P"});
  EXPECT_THAT(read.properties, IsEmpty());
  EXPECT_THAT(read.values, IsEmpty());
  EXPECT_FALSE(read.force);
}

TEST(CommandLine, TakesAWordThatIsNamedLikeASubcommandAsTheWordThatItIs) {
  const Seen read = seenOf({"try", "show", "try"});
  EXPECT_EQ(read.path, "try");
  EXPECT_THAT(read.values, ElementsAre("show", "try"));
  EXPECT_FALSE(tellingOf({"dns", "set", "show", "set"}).isError);
}

TEST(CommandLine, TakesWordsThatBeginWithAHyphenAfterTwo) { EXPECT_EQ(seenOf({"--", "-x"}).path, "-x"); }

TEST(CommandLine, TakesTheEmptyTextAsAWord) {
  EXPECT_THAT(seenOf({"P", ""}).values, ElementsAre(""));
  EXPECT_FALSE(tellingOf({"domain", "eth0", ""}).isError);
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
                                                                                     {"completion", "tcsh"}}) {
    EXPECT_TRUE(tellingOf(words).isError) << (words.empty() ? "" : words.front());
  }
}

TEST(CommandLine, NamesTheFormatThatItDoesNotKnow) {
  EXPECT_THAT(tellingOf({"ei", "C", "--output", "y\x1Bml"}).text,
              HasSubstr("'y\\x1Bml' is no format; there are table, json, mof"));
}

TEST(CommandLine, HasHelpForItselfAndEachSubcommand) {
  EXPECT_THAT(tellingOf({"--help"}).text, HasSubstr("Examples:"));
  EXPECT_FALSE(tellingOf({"--help"}).isError);
  EXPECT_THAT(tellingOf({"modify", "--help"}).text, HasSubstr("zorvactl modify"));
  EXPECT_THAT(tellingOf({"dns", "add", "--help"}).text, HasSubstr("SERVER"));
  EXPECT_THAT(tellingOf({"--version"}).text, HasSubstr("zorvactl 1."));
}

TEST(Completion, OffersTheSubcommands) {
  EXPECT_THAT(completionAfter({}).words, IsSupersetOf({"show", "tree", "ifcfg", "--output"}));
  EXPECT_THAT(completionAfter({}).words, Not(Contains("complete")));
  EXPECT_THAT(completionAfter({"dns"}).words, IsSupersetOf({"show", "set", "add", "remove"}));
}

TEST(Completion, KnowsWhatAPlaceNeeds) {
  EXPECT_EQ(completionAfter({"ei"}).kind, "CLASS");
  EXPECT_EQ(completionAfter({"-o", "json", "gi"}).kind, "PATH");
  EXPECT_EQ(completionAfter({"dns", "set"}).kind, "INTERFACE");
  EXPECT_EQ(completionAfter({"dns", "set", "eth0"}).kind, "SERVER");
  EXPECT_EQ(completionAfter({"ai", "P", "--result-class"}).kind, "CLASS");
  EXPECT_EQ(completionAfter({"--config"}).kind, "FILE");
}

TEST(Completion, OffersTheFormats) { EXPECT_THAT(completionAfter({"--output"}).words, Contains("json")); }

TEST(CommandLine, NamesTheSubcommandThatIsNot) {
  EXPECT_EQ(tellingOf({"frob"}).text, "zorvactl has no subcommand 'frob'");
  EXPECT_THAT(tellingOf({"frob"}).hint, HasSubstr("zorvactl --help lists those that it has"));
  EXPECT_EQ(tellingOf({"dns", "fr\x1Bob"}).text, "zorvactl dns has no subcommand 'fr\\x1Bob'");
  EXPECT_EQ(tellingOf({"dns"}).text, "zorvactl dns needs a subcommand");
  EXPECT_EQ(tellingOf({"dns"}).hint, "it has show, set, add, remove; zorvactl dns --help tells more");
  EXPECT_EQ(tellingOf({"ei"}).hint, "zorvactl enumerate --help shows the usage");
  EXPECT_EQ(tellingOf({}).hint, "zorvactl --help lists them");
}

TEST(CommandLine, SuggestsTheNearestWordAndNotAllThatThereAre) {
  EXPECT_EQ(tellingOf({"shwo"}).hint, "did you mean show?");
  EXPECT_EQ(tellingOf({"dns", "sett", "eth0"}).hint, "did you mean set?");
  EXPECT_EQ(tellingOf({"show", "--ouput", "json"}).hint, "did you mean --output? zorvactl show --help shows the usage");
  EXPECT_EQ(tellingOf({"dns", "set", "eth0", "--dryrun"}).hint,
            "did you mean --dry-run? zorvactl dns set --help shows the usage");
  EXPECT_THAT(tellingOf({"show", "--output", "jsn"}).text, HasSubstr("'jsn' is no format; did you mean json?"));
  EXPECT_EQ(tellingOf({"show", "-x"}).hint,
            "a value that begins with '-' goes after --; zorvactl show --help shows the usage");
}

TEST(CommandLine, RequiresALevelThatIsANumber) {
  for (const char* word : {"x", "-1", "3000x", "", "99999999999"}) {
    EXPECT_THAT(tellingOf({"show", "--log-level", word}).text, HasSubstr("is no level")) << word;
  }
}

TEST(CommandLine, RequiresATimeThatIsANumberOfSeconds) {
  for (const char* word : {"x", "0", "-1", "1s", "", "3601", "nan", "inf"}) {
    EXPECT_THAT(tellingOf({"show", "--timeout", word}).text, HasSubstr("is no time")) << word;
  }
  EXPECT_EQ(globalsOf({"show", "--timeout", "0.5"}).servers.timeout, std::chrono::milliseconds(500));
}

TEST(CommandLine, TakesAServerOrWhatConcernsThisHost) {
  using Urls = std::vector<std::string>;
  EXPECT_EQ(globalsOf({"show", "--url", "http://h"}).servers.urls, Urls{"http://h"});
  EXPECT_EQ(globalsOf({"--url", "http://a", "show", "--url=http://b", "eth0"}).servers.urls,
            (Urls{"http://a", "http://b"}));
  EXPECT_TRUE(tellingOf({"show", "--hosts", "f", "--config", "f"}).isError);
  EXPECT_TRUE(tellingOf({"show", "--url", "https://h", "--ca", "f", "--fingerprint", "f"}).isError);
  EXPECT_TRUE(tellingOf({"show", "--url", "http://h", "--provider-dir", "d"}).isError);
  EXPECT_TRUE(tellingOf({"show", "--url", "http://h", "--config", "f"}).isError);
}

/// The possible words after these words: subcommands, or else options.
std::vector<std::string> subcommandsAfter(const std::vector<std::string>& words) {
  std::vector<std::string> found = completionAfter(words).words;
  std::erase_if(found, [](const std::string& word) { return word.starts_with("-") || word == "bash"; });
  return found;
}

/// "show", "dns", "dns set": every way to call the program.
std::vector<std::vector<std::string>> calls() {
  std::vector<std::vector<std::string>> all;
  for (const std::string& subcommand : subcommandsAfter({})) {
    all.push_back({subcommand});
    for (const std::string& below : subcommandsAfter({subcommand})) all.push_back({subcommand, below});
  }
  return all;
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
