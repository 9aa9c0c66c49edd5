#include "CaseFile.h"

#include <functional>

#include "tests/support/Matchers.h"

namespace ZV::Test {

namespace {

const std::string kCase =
    "provider: P\ncase: It works\nrequest: Cleanup\nhappens: nothing\nends: CMPI_RC_OK, left open\n";

CaseFile read(const std::string& text) { return readCases(text, "P.cases", {}); }

std::string errorOf(const std::function<void()>& action) {
  try {
    action();
  } catch (const CaseError& error) {
    return error.what();
  }
  return "no error";
}
std::string errorOf(const std::string& text) {
  return errorOf([&] { read(text); });
}

std::vector<std::string> writtenOut(const std::string& phrases, const std::string& line) {
  Phrases all;
  readPhrases(phrases, "p.phrases", all);
  std::vector<std::string> texts;
  for (const WrittenLine& written : all.writeOut({{line, "P.cases", 7}})) texts.push_back(written.text);
  return texts;
}

}  // namespace

TEST(CaseFiles, HaveAProviderAndCasesOfParts) {
  const CaseFile file = read(
      "# of the endpoints\nprovider: DNSClientProvider\nassociation: ZORVA_X\nshows: getKey\n\n"
      "case: Names come, sorted\nworld:\n  nic a\n  # a comment\n\n  nic b\nrequest: EnumInstances of X\nhappens:\n"
      "  returnDone()\nends: CMPI_RC_OK, done, marked\n");

  EXPECT_EQ("DNSClientProvider", file.provider);
  EXPECT_EQ("ZORVA_X", file.association);
  ASSERT_EQ(1U, file.cases.size());
  const Case& one = file.cases.front();
  EXPECT_EQ("NamesComeSorted", one.testName());
  ASSERT_EQ(2U, one.world.size());
  EXPECT_EQ("nic b", one.world[1].text);
  EXPECT_EQ("P.cases:11", placeOf(one.world[1]));
  EXPECT_EQ("EnumInstances of X", one.request.front().text);
  EXPECT_EQ("CMPI_RC_OK, done, marked", one.ends.front().text);
}

TEST(CaseFiles, NameTheLineOfWhatIsNotUnderstood) {
  EXPECT_THAT(errorOf(kCase + "wrold:\n  nic a\n"), StartsWith("P.cases:6: unknown heading 'wrold'"));
  EXPECT_THAT(errorOf("providers: P\n"), StartsWith("P.cases:1: unknown heading 'providers'"));
  EXPECT_THAT(errorOf(kCase + "no heading\n"), StartsWith("P.cases:6: a heading has no colon"));
  EXPECT_THAT(errorOf("  nic a\n"), StartsWith("P.cases:1: an indented line without a heading"));
  EXPECT_THAT(errorOf(kCase + "world:\tnic a\n"), StartsWith("P.cases:6: a tab"));
}

TEST(CaseFiles, HaveEachPartOnceAndEachTitleOnce) {
  EXPECT_THAT(errorOf(kCase + "request: Cleanup\n"), StartsWith("P.cases:6: the case has a part 'request' already"));
  EXPECT_THAT(errorOf(kCase + "world:\n"), StartsWith("P.cases:6: the part 'world' is empty"));
  EXPECT_THAT(errorOf(kCase + "case: it, works\n"), StartsWith("P.cases:6: a case of this title is there already"));
  EXPECT_THAT(errorOf(kCase + "case: !\n"), StartsWith("P.cases:6: a case has no title"));
}

TEST(CaseFiles, HaveWholeCasesAndAProvider) {
  EXPECT_THAT(errorOf(kCase + "case: B\nhappens: nothing\nends: x\n"),
              StartsWith("P.cases:6: the case has no request"));
  EXPECT_THAT(errorOf(kCase + "case: B\nrequest: x\nends: x\n"), HasSubstr("does not say what happens"));
  EXPECT_THAT(errorOf(kCase + "case: B\nrequest: x\nhappens: x\n"), HasSubstr("does not say in one line how"));
  EXPECT_THAT(errorOf("case: B\nrequest: x\nhappens: x\nends: x\n"), HasSubstr("does not name its provider"));
}

TEST(PhrasesOfCases, AreReplacedByTheirLinesWithPlacesFilled) {
  EXPECT_THAT(writtenOut("phrase: path <path> of <class>\n  newObjectPath(\"<class>\")\n  <path>.setHostname(\"h\")\n",
                         "path OP1 of X"),
              ElementsAre("newObjectPath(\"X\")", "OP1.setHostname(\"h\")"));
}

TEST(PhrasesOfCases, MayBeMadeOfPhrases) {
  EXPECT_THAT(writtenOut("phrase: a pair <x>\n  a one <x>\n  a one more\nphrase: a one <y>\n  call(<y>)\n", "a pair 1"),
              ElementsAre("call(1)", "call(more)"));
}

TEST(PhrasesOfCases, TakeOneWordOrATextOrAListInAPlaceAndTheRestAtTheEnd) {
  const std::string phrases = "phrase: set <what> in <where>\n  call(<what>, <where>)\n";

  EXPECT_THAT(writtenOut(phrases, "set a in b c"), ElementsAre("call(a, b c)"));
  EXPECT_THAT(writtenOut(phrases, "set \"a \\\" in b\" in c"), ElementsAre("call(\"a \\\" in b\", c)"));
  EXPECT_THAT(writtenOut(phrases, "set {\"a}\", \"b\"} in c"), ElementsAre("call({\"a}\", \"b\"}, c)"));
  EXPECT_THAT(writtenOut(phrases, "set a b in c"), ElementsAre("set a b in c"));
  EXPECT_THAT(writtenOut(phrases, "set  in c"), ElementsAre("set  in c"));
}

TEST(PhrasesOfCases, LeaveCallsAndLinesOfTheLogAlone) {
  EXPECT_THAT(writtenOut("phrase: <x>.getKey\n  call()\n", "ref.getKey(\"a\")"), ElementsAre("ref.getKey(\"a\")"));
  EXPECT_TRUE(isPlainStep("log 4000 x y: banner"));
  EXPECT_TRUE(isPlainStep("E1.hasNext()"));
  EXPECT_TRUE(isPlainStep("newObjectPath(\"a\", \"b\") fails: null"));
  EXPECT_FALSE(isPlainStep("new path OP1 (of X)"));
  EXPECT_FALSE(isPlainStep("returnDone"));
}

TEST(PhrasesOfCases, ReportTheirPlaceInErrors) {
  Phrases all;
  readPhrases("phrase: done\n  returnDone()\n", "p.phrases", all);

  const std::vector<WrittenLine> lines = all.writeOut({{"done", "P.cases", 7}, {"returnDone()", "P.cases", 8}});

  EXPECT_EQ("P.cases:7 (by p.phrases:2)", placeOf(lines.at(0)));
  EXPECT_EQ("P.cases:8", placeOf(lines.at(1)));
}

TEST(PhrasesOfCases, ThatFitOneLineAreAnError) {
  EXPECT_EQ("P.cases:7: two phrases fit: p.phrases:1 and p.phrases:3",
            errorOf([] { writtenOut("phrase: a <x>\n  c()\nphrase: <y> b\n  d()\n", "a b"); }));
}

TEST(PhrasesOfCases, ThatContainOneAnotherAreAnError) {
  EXPECT_THAT(errorOf([] { writtenOut("phrase: a\n  b\nphrase: b\n  a\n", "a"); }),
              HasSubstr("contain one another without an end"));
}

TEST(PhrasesOfCases, AreRefusedWhereTheyCannotBeUsed) {
  const auto add = [](const std::string& text) { return errorOf([&] { writtenOut(text, "x"); }); };

  EXPECT_THAT(add("phrase: a <x>\n  c()\nphrase: a <y>\n  c()\n"), StartsWith("p.phrases:3: the phrase is already at"));
  EXPECT_THAT(add("phrase: a\n"), HasSubstr("the phrase has no lines"));
  EXPECT_THAT(add("phrase:\n  c()\n"), HasSubstr("has no words"));
  EXPECT_THAT(add("phrase: call(<x>)\n  c()\n"), HasSubstr("cannot look like a call"));
  EXPECT_THAT(add("phrase: a <x\n  c()\n"), HasSubstr("has no '>'"));
  EXPECT_THAT(add("phrase: a <x><y>\n  c()\n"), HasSubstr("touch"));
  EXPECT_THAT(add("case: a\n"), StartsWith("p.phrases:1: unknown heading 'case'"));
}

}  // namespace ZV::Test
