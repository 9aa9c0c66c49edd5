#include "providers/AssociationOperation.h"

#include "tests/support/Matchers.h"
#include "tests/support/RecordingBroker.h"
#include "tests/support/RecordingLogger.h"
#include "tests/support/World.h"

namespace ZV::Test {
namespace {

std::vector<std::string> tokensOf(const std::string& text, const std::string& delimiters = "_") {
  std::vector<std::string> tokens;
  Tokenize(text, tokens, delimiters);
  return tokens;
}

// --- Tokens

TEST(Tokenize, TwoPartsJoinedByOneDelimiterAreTwoTokens) { EXPECT_THAT(tokensOf("eth0_1"), ElementsAre("eth0", "1")); }

TEST(Tokenize, DelimitersAroundOneWordGiveThatWord) { EXPECT_THAT(tokensOf("__eth0___"), ElementsAre("eth0")); }

TEST(Tokenize, DelimitersAloneAndTheEmptyTextGiveNothing) {
  EXPECT_THAT(tokensOf("_"), IsEmpty());
  EXPECT_THAT(tokensOf("____"), IsEmpty());
  EXPECT_THAT(tokensOf(""), IsEmpty());
}

TEST(Tokenize, TextWithoutADelimiterIsOneToken) {
  EXPECT_THAT(tokensOf("eth0"), ElementsAre("eth0"));
  EXPECT_THAT(tokensOf("eth0", ""), ElementsAre("eth0"));
}

TEST(Tokenize, AdjacentDelimitersLeaveNoEmptyTokens) { EXPECT_THAT(tokensOf("a__b_c"), ElementsAre("a", "b", "c")); }

TEST(Tokenize, EachCharacterOfTheSetDelimits) { EXPECT_THAT(tokensOf("%a_b%_c", "_%"), ElementsAre("a", "b", "c")); }

TEST(Tokenize, TokensAreAppendedToWhatIsThere) {
  std::vector<std::string> tokens = {"before"};
  Tokenize("a_b", tokens, "_");
  EXPECT_THAT(tokens, ElementsAre("before", "a", "b"));
}

TEST(Tokenize, BytesBeyondAsciiAndNulsAreContent) {
  EXPECT_THAT(tokensOf(std::string("a\0b_\xC3\xBC", 6)), ElementsAre(std::string("a\0b", 3), "\xC3\xBC"));
}

TEST(Tokenize, MegabyteOfSingleTokensIsSplitWhole) {
  std::string text;
  for (int i = 0; i < 1 << 19; ++i) text += "a_";
  EXPECT_EQ(1U << 19, tokensOf(text).size());
}

// --- Result classes and association classes

TEST(PassesResultClass, TakesNoneTheOwnNameAndTheCimNameInAnyCase) {
  for (const char* name : {static_cast<const char*>(nullptr), "ZORVA_A", "zorva_a", "CIM_A", "cim_A"}) {
    EXPECT_TRUE(passesResultClass(name, "ZORVA_A", "CIM_A"));
  }
  for (const char* name : {"", "ZORVA_B", "CIM_B", "CIM_ManagedElement", "ZORVA_A ", "ZORVA_", "A"}) {
    EXPECT_FALSE(passesResultClass(name, "ZORVA_A", "CIM_A")) << name;
  }
}

TEST(AssociationOr, IsTheProvidersOwnOnlyIfNoneIsGiven) {
  EXPECT_STREQ("ZORVA_A", associationOr(nullptr, "ZORVA_A"));
  EXPECT_STREQ("", associationOr("", "ZORVA_A"));
  EXPECT_STREQ("ZORVA_B", associationOr("ZORVA_B", "ZORVA_A"));
}

// --- Paths and pairs

TEST(IsMissing, LogsPathsThatAreNullOrWithoutHandleInTheOperationsNameAtTheCallersPlace) {
  RecordingLogger logger;
  RecordingBroker broker;
  const std::string category = "Zorvagent.SomeProvider";
  const Operation operation = named({.broker = broker.cmpi()}, category, "SomeProvider_References");
  CMPIObjectPath* path = broker.make(Path("ZORVA_X"));
  EXPECT_FALSE(isMissing(operation, path, "gone"));
  EXPECT_EQ(0U, logger.size());

  path->hdl = nullptr;
  EXPECT_TRUE(isMissing(operation, path, "gone"));
  const unsigned int firstLine = __LINE__ - 1;
  EXPECT_TRUE(isMissing(operation, nullptr, "gone"));
  const LogLines lines = logger.pairs();
  EXPECT_THAT(lines.briefsWithCategory(),
              ElementsAre("Zorvagent.SomeProvider 6000 MESSAGE gone", "Zorvagent.SomeProvider 6000 MESSAGE gone"));
  unsigned int expectedLine = firstLine;
  for (const LogLine& line : lines) {
    EXPECT_EQ("SomeProvider_References", line.function);
    EXPECT_EQ("providers/AssociationOperation_test.cpp", line.file);
    EXPECT_EQ(expectedLine, static_cast<unsigned int>(line.line));
    EXPECT_EQ("MESSAGE [File: " + line.file + ", Line: " + std::to_string(expectedLine) + "]: gone", line.text);
    expectedLine += 2;
  }
  EXPECT_THAT(broker.calls(), IsEmpty());
}

class NewPair : public ::testing::Test {
 protected:
  CMPIInstance* make(const CMPIObjectPath* path, const CMPIObjectPath* first, const CMPIObjectPath* second) {
    return newPair(operation, pairs, path, first, second);
  }

  RecordingBroker broker;
  const std::string category = "Zorvagent.SomeProvider";
  const Association pairs = {category, "ZORVA_X", kPathsWithoutHost, {"Left", "Right"}};
  Operation operation = named({.broker = broker.cmpi()}, category, "SomeProvider_References");
  CMPIObjectPath* association = broker.make(Path("ZORVA_X"), "association");
  CMPIObjectPath* left = broker.make(Path("ZORVA_L"), "left");
  CMPIObjectPath* right = broker.make(Path("ZORVA_R"), "right");
};

TEST_F(NewPair, SetsTheFirstReferenceAndThenTheSecond) {
  EXPECT_EQ(Path("ZORVA_L"), RecordingBroker::read(make(association, left, right))["Left"].path());
  EXPECT_THAT(broker.calls().lines(), ElementsAre("newInstance(association)", "I1.setProperty(\"Left\", ref left)",
                                                  "I1.setProperty(\"Right\", ref right)"));
}

TEST_F(NewPair, WithoutAnAssociationPathThereIsNone) {
  EXPECT_EQ(nullptr, make(nullptr, left, right));
  association->hdl = nullptr;
  EXPECT_EQ(nullptr, make(association, left, right));
  EXPECT_THAT(broker.calls(), IsEmpty());
}

TEST_F(NewPair, EndWithoutAHandleIsLeftOut) {
  left->hdl = nullptr;
  EXPECT_THAT(RecordingBroker::read(make(association, left, right)).names(), ElementsAre("Right"));
  EXPECT_THAT(RecordingBroker::read(make(association, nullptr, nullptr)).names(), IsEmpty());
}

TEST_F(NewPair, ThatCouldNotBeMadeIsWhatTheBrokerGave) {
  broker.failNext("newInstance", Mode::RcAndNull);
  EXPECT_EQ(nullptr, make(association, left, right));
  EXPECT_EQ(CMPI_RC_ERR_FAILED, operation.status.rc);
  broker.failNext("newInstance", Mode::NullHandle);
  const CMPIInstance* lost = make(association, left, right);
  ASSERT_NE(nullptr, lost);
  EXPECT_EQ(nullptr, lost->hdl);
  EXPECT_EQ(0U, broker.callsOf("setProperty"));
}

}  // namespace
}  // namespace ZV::Test
