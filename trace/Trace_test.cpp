#include "trace/Trace.h"

#include <cmpift.h>

#include <cstdio>
#include <iterator>
#include <map>
#include <thread>
#include <vector>

#include "tests/support/Matchers.h"
#include "tests/support/RecordingLogger.h"

namespace ZV::Test {
namespace {

const std::string kLogger = "Zorvagent.Sample";
const LogSite kSite = {"walk", "model/Sample.cpp", 42};

TEST(TraceForms, EachMessageTypeHasItsForm) {
  EXPECT_STREQ("ENTERING: walk() in a.cpp [Line: 7]", trace("walk", "a.cpp", 7, MSG_ENTERING));
  EXPECT_STREQ("EXITING: walk() in a.cpp [Line: 7]", trace("walk", "a.cpp", 7, MSG_EXITING));
  EXPECT_STREQ("METHOD: walk() was invoked in a.cpp [Line: 7]", trace("walk", "a.cpp", 7, MSG_METHOD));
  EXPECT_STREQ("MESSAGE [File: a.cpp, Line: 7]: No ObjectPath Found",
               trace("No ObjectPath Found", "a.cpp", 7, MSG_MESSAGE));
}

TEST(TraceForms, EachMessageTypeHasItsFormWithParameters) {
  EXPECT_STREQ("ENTERING: walk() in a.cpp [Line: 7],Parameters List:  ref=0x1",
               tracepara("walk", "a.cpp", 7, " ref=0x1", MSG_ENTERING));
  EXPECT_STREQ("EXITING: walk() in a.cpp [Line: 7],Parameters List:  ref=0x1",
               tracepara("walk", "a.cpp", 7, " ref=0x1", MSG_EXITING));
  EXPECT_STREQ("METHOD: walk() was invoked in a.cpp [Line: 7],Parameters List:  ref=0x1",
               tracepara("walk", "a.cpp", 7, " ref=0x1", MSG_METHOD));
  EXPECT_STREQ("MESSAGE [File: a.cpp, Line: 7]: walk,Parameters List:  ref=0x1",
               tracepara("walk", "a.cpp", 7, " ref=0x1", MSG_MESSAGE));
}

TEST(TraceForms, MessageTypesHaveTheirNumbers) {
  EXPECT_THAT((std::vector<int>{MSG_ENTERING, MSG_EXITING, MSG_METHOD, MSG_MESSAGE}), ElementsAre(0, 1, 2, 3));
}

TEST(TraceForms, TypeOutsideTheListGivesTheEnteringForm) {
  // The enumeration's underlying type is fixed, so every int is a value of it.
  for (const int type : {4, -1, 512}) {
    EXPECT_STREQ("ENTERING: walk() in a.cpp [Line: 7]", trace("walk", "a.cpp", 7, static_cast<MessageType>(type)));
    EXPECT_STREQ("ENTERING: walk() in a.cpp [Line: 7],Parameters List:  x=1",
                 tracepara("walk", "a.cpp", 7, " x=1", static_cast<MessageType>(type)));
  }
}

TEST(TraceForms, VariablesAreShownAsTextOrNumber) {
  EXPECT_STREQ("VARIABLE: 'name' has Value 'eth0' at line 7 in a.cpp", trace("name", "a.cpp", 7, "eth0"));
  EXPECT_STREQ("VARIABLE: 'name' has Value '' at line 7 in a.cpp", trace("name", "a.cpp", 7, ""));
  EXPECT_STREQ("VARIABLE: 'size' has Value '3' at line 7 in a.cpp", trace("size", "a.cpp", 7, 3U));
  EXPECT_STREQ("VARIABLE: 'size' has Value '-1' at line 7 in a.cpp", trace("size", "a.cpp", 7, 0xffffffffU));
}

TEST(TraceForms, NullTextPrintsAsSuch) {
  const char* const none = nullptr;
  EXPECT_STREQ("ENTERING: (null)() in (null) [Line: 7]", trace(none, none, 7, MSG_ENTERING));
  EXPECT_STREQ("VARIABLE: 'name' has Value '(null)' at line 7 in a.cpp", trace("name", "a.cpp", 7, none));
}

TEST(TraceForms, EachFormatterKeepsALineOfItsOwn) {
  const char* const plain = trace("one", "a.cpp", 1, MSG_ENTERING);
  const char* const withParameters = tracepara("two", "a.cpp", 2, " x=1", MSG_ENTERING);
  const char* const number = trace("three", "a.cpp", 3, 3U);
  const char* const text = trace("four", "a.cpp", 4, "iv");
  EXPECT_STREQ("ENTERING: one() in a.cpp [Line: 1]", plain);
  EXPECT_STREQ("ENTERING: two() in a.cpp [Line: 2],Parameters List:  x=1", withParameters);
  EXPECT_STREQ("VARIABLE: 'three' has Value '3' at line 3 in a.cpp", number);
  EXPECT_STREQ("VARIABLE: 'four' has Value 'iv' at line 4 in a.cpp", text);
}

TEST(TraceForms, EachFormatterUsesItsLineAgain) {
  const char* const first = trace("a name that is long", "a.cpp", 1, MSG_MESSAGE);
  const char* const second = trace("x", "a.cpp", 1, MSG_MESSAGE);
  EXPECT_EQ(first, second);
  EXPECT_STREQ("MESSAGE [File: a.cpp, Line: 1]: x", second);
}

TEST(TraceForms, BytesAfterALineAreZero) {
  trace(std::string(600, 'x').c_str(), "a.cpp", 1, MSG_MESSAGE);
  for (const char* text : {"a name", "another name that is longer", ""}) {
    const char* const line = trace(text, "a.cpp", 1, MSG_MESSAGE);
    const std::string rest(line + std::strlen(line), line + kMessageBufferSize);
    EXPECT_EQ(std::string(rest.size(), '\0'), rest) << text;
  }
}

// The length of a line whose text has that many characters.
std::size_t lengthWith(std::size_t textLength) {
  return std::strlen(trace(std::string(textLength, 'x').c_str(), "a.cpp", 1, MSG_MESSAGE));
}

TEST(TraceForms, LineIsCutAt511Characters) {
  const std::size_t around = lengthWith(0);
  EXPECT_EQ(510U, lengthWith(510 - around));
  EXPECT_EQ(511U, lengthWith(511 - around));
  EXPECT_EQ(511U, lengthWith(512 - around));
  const std::string longText(100000, 'x');
  EXPECT_EQ(511U, lengthWith(longText.size()));
  EXPECT_EQ(511U, std::strlen(tracepara("walk", "a.cpp", 1, longText.c_str(), MSG_EXITING)));
  EXPECT_EQ(511U, std::strlen(trace("name", "a.cpp", 1, longText.c_str())));
  EXPECT_EQ(511U, std::strlen(trace(longText.c_str(), "a.cpp", 1, 1U)));
}

/// What printf makes of it in as many bytes.
template <typename... Values>
std::string printed(const char* format, Values... values) {
  char line[kMessageBufferSize];
  std::snprintf(line, sizeof line, format, values...);
  return line;
}

TEST(TraceForms, AreWhatPrintfMakesOfThemAtEachLengthOfATextAndForEachNumber) {
  const unsigned numbers[] = {0, 7, 0x7fffffff, 0x80000000, 0xffffffff};
  for (std::size_t length = 0; length <= 520; ++length) {
    const std::string text(length, 'x');
    const char* const t = text.c_str();
    const unsigned line = numbers[length % std::size(numbers)];
    ASSERT_EQ(printed("METHOD: %s() was invoked in %s [Line: %d]", t, "a.cpp", line),
              trace(t, "a.cpp", line, MSG_METHOD));
    ASSERT_EQ(printed("MESSAGE [File: %s, Line: %d]: %s", t, line, "text"), trace("text", t, line, MSG_MESSAGE));
    ASSERT_EQ(printed("EXITING: %s() in %s [Line: %d]", "walk", t, line), trace("walk", t, line, MSG_EXITING));
    ASSERT_EQ(printed("ENTERING: %s() in %s [Line: %d],Parameters List: %s", t, t, line, "p"),
              tracepara(t, t, line, "p", MSG_ENTERING));
    ASSERT_EQ(printed("MESSAGE [File: %s, Line: %d]: %s,Parameters List: %s", "a.cpp", line, t, t),
              tracepara(t, "a.cpp", line, t, MSG_MESSAGE));
    ASSERT_EQ(printed("VARIABLE: '%s' has Value '%d' at line %d in %s", t, line, line, "a.cpp"),
              trace(t, "a.cpp", line, line));
    ASSERT_EQ(printed("VARIABLE: '%s' has Value '%s' at line %d in %s", t, t, line, "a.cpp"),
              trace(t, "a.cpp", line, t));
  }
}

TEST(TraceForms, ThreadsDoNotWriteIntoEachOthersLines) {
  const char* const here = trace("here", "a.cpp", 1, MSG_ENTERING);
  const char* there = nullptr;
  std::thread([&there] { there = trace("there", "b.cpp", 2, MSG_ENTERING); }).join();
  EXPECT_NE(here, there);
  EXPECT_STREQ("ENTERING: here() in a.cpp [Line: 1]", here);
}

// Everything but the text.
std::string siteOf(const LogLine& line) {
  return line.category + " " + line.function + " " + line.file + ":" + std::to_string(line.line) + " " +
         std::to_string(line.level);
}

TEST(LogPair, GoesToTheLogAndThenToTheTraceWithTheSameArguments) {
  const RecordingLogger logger;
  logError(kLogger, kSite, "No ObjectPath Found");
  const LogLines lines = logger.lines();
  ASSERT_EQ(2U, lines.size());
  EXPECT_EQ(zorva::agent::LogStream::Log, lines[0].stream);
  EXPECT_EQ(zorva::agent::LogStream::Trace, lines[1].stream);
  for (const LogLine& line : lines) {
    EXPECT_EQ("Zorvagent.Sample walk model/Sample.cpp:42 6000", siteOf(line));
    EXPECT_EQ("MESSAGE [File: model/Sample.cpp, Line: 42]: No ObjectPath Found", line.text);
    EXPECT_TRUE(line.reservedAreEmpty);
  }
}

TEST(LogPair, IsFormattedAfreshForItsSecondHalf) {
  const RecordingLogger logger;
  int calls = 0;
  logPair(kLogger, kSite, LOG_LEVEL_DETAIL, [&calls] { return trace("calls", "a.cpp", 1, ++calls == 1 ? "1" : "2"); });
  EXPECT_THAT(logger.lines().texts(LOG_LEVEL_DETAIL), ElementsAre("calls", "calls"));
  EXPECT_EQ("1", logger.lines().at(0).value());
  EXPECT_EQ("2", logger.lines().at(1).value());
}

TEST(LogPair, LevelsAreFixed) {
  const RecordingLogger logger;
  logError(kLogger, kSite, "error");
  logMessage(kLogger, kSite, LOG_LEVEL_DETAIL, "detail");
  logVariable(kLogger, kSite, "text", std::string("value"));
  logVariable(kLogger, kSite, "number", 3U);
  logEntry(kLogger, kSite, " x=", true);
  logExit(kLogger, kSite, " x=", false);
  EXPECT_THAT(logger.pairs().briefs(),
              ElementsAre("6000 MESSAGE error", "4000 MESSAGE detail", "4000 VARIABLE text = value",
                          "4000 VARIABLE number = 3", "3000 ENTERING walk, x=1", "3000 EXITING walk, x=0"));
}

TEST(ParameterList, ShowsAddressesAndNeverTheirContent) {
  const RecordingLogger logger;
  const CMPIBroker broker{};
  const CMPIBroker* const noBroker = nullptr;
  const std::map<std::string, int> map = {{"secret", 1}};
  const std::vector<int> vector = {4711};
  const char* names[] = {"secret", nullptr};
  const char** properties = names;
  logEntry(kLogger, kSite, " broker=", &broker, " none=", noBroker, " map=", &map, " vector=", &vector,
           " properties=", properties);
  std::ostringstream wanted;
  wanted << " broker=" << static_cast<const void*>(&broker) << " none=" << static_cast<const void*>(nullptr)
         << " map=" << static_cast<const void*>(&map) << " vector=" << static_cast<const void*>(&vector)
         << " properties=" << static_cast<const void*>(properties);
  EXPECT_EQ("ENTERING: walk() in model/Sample.cpp [Line: 42],Parameters List: " + wanted.str(),
            logger.pairs().at(0).text);
}

TEST(ParameterList, LongOneIsCutWithTheLine) {
  const RecordingLogger logger;
  const std::string label(600, 'x');
  logExit(kLogger, kSite, label.c_str(), true);
  EXPECT_EQ(511U, logger.pairs().at(0).text.size());
  EXPECT_THAT(logger.pairs().at(0).text,
              StartsWith("EXITING: walk() in model/Sample.cpp [Line: 42],Parameters List: xxx"));
}

TEST(FlowLog, ExitHasTheParametersOfTheEntryAndThePlaceOfItsOwnStatement) {
  const RecordingLogger logger;
  const char* text = "told";
  const FlowLog flow(kLogger, kSite, " text=", text, " x=", true);
  EXPECT_THAT(logger.pairs().briefs(), ElementsAre("3000 ENTERING walk, text=told x=1"));
  flow.exit();
  const unsigned int line = __LINE__ - 1;
  EXPECT_EQ(
      "EXITING: walk() in trace/Trace_test.cpp [Line: " + std::to_string(line) + "],Parameters List:  text=told x=1",
      logger.pairs().at(1).text);
}

TEST(FlowLog, MarksNoExitThatItIsNotAskedFor) {
  const RecordingLogger logger;
  { const FlowLog flow(kLogger, kSite, " x=", false); }
  EXPECT_THAT(logger.pairs().briefs(), ElementsAre("3000 ENTERING walk, x=0"));
}

TEST(ProviderMark, EntryIsTheBannerAndThenTheEnteringLine) {
  const RecordingLogger logger;
  markProviderEntry(kLogger, "DNSClient_EnumInstances", "providers/P.cpp", 9);
  const LogLines lines = logger.pairs();
  ASSERT_EQ(2U, lines.size());
  EXPECT_EQ(std::string(78, '='), lines[0].text);
  EXPECT_EQ("ENTERING: DNSClient_EnumInstances() in providers/P.cpp [Line: 9]", lines[1].text);
}

TEST(ProviderMark, ExitIsTheExitingLineAndThenTheBanner) {
  const RecordingLogger logger;
  markProviderExit(kLogger, "DNSClient_EnumInstances", "providers/P.cpp", 9);
  const LogLines lines = logger.pairs();
  ASSERT_EQ(2U, lines.size());
  EXPECT_EQ("EXITING: DNSClient_EnumInstances() in providers/P.cpp [Line: 9]", lines[0].text);
  EXPECT_EQ(std::string(78, '='), lines[1].text);
}

TEST(ProviderMark, LoggerGetsThePlaceOfTheMarkerAndNotOfTheProvider) {
  const RecordingLogger logger;
  markProviderEntry(kLogger, "DNSClient_EnumInstances", "providers/P.cpp", 9);
  markProviderExit(kLogger, "DNSClient_EnumInstances", "providers/P.cpp", 9);
  const LogLines lines = logger.pairs();
  ASSERT_EQ(4U, lines.size());
  for (const LogLine& line : lines) {
    EXPECT_EQ(LOG_LEVEL_DETAIL, line.level);
    EXPECT_EQ(kLogger, line.category);
    EXPECT_EQ("trace/Trace.h", line.file);
    EXPECT_GT(line.line, 0);
  }
  EXPECT_EQ("markProviderEntry", lines[0].function);
  EXPECT_EQ("markProviderEntry", lines[1].function);
  EXPECT_EQ("markProviderExit", lines[2].function);
  EXPECT_EQ("markProviderExit", lines[3].function);
}

void sampleOperation() {
  ZV_PROVIDER_ENTRY(kLogger);
  logError(kLogger, ZV_HERE, "inside");
  ZV_PROVIDER_EXIT(kLogger);
}

TEST(ProviderMark, SiteIsTheFunctionItsFileAndItsLine) {
  const RecordingLogger logger;
  sampleOperation();
  const LogLines lines = logger.pairs();
  EXPECT_TRUE(lines.entered("sampleOperation", "trace/Trace_test.cpp"));
  EXPECT_TRUE(lines.exited("sampleOperation", "trace/Trace_test.cpp"));
  const LogLines inside = lines.ofFunction("sampleOperation");
  ASSERT_EQ(1U, inside.size());
  EXPECT_EQ("trace/Trace_test.cpp", inside[0].file);
  EXPECT_EQ(inside[0].line, inside[0].lineInText());
  EXPECT_EQ(inside[0].line, lines.at(1).lineInText() + 1);
}

TEST(ProviderMark, LinesOfThreadsStayWhole) {
  const RecordingLogger logger;
  std::vector<std::thread> threads;
  for (const char* name : {"one", "two", "three", "four"}) {
    threads.emplace_back([name] {
      for (unsigned int i = 0; i < 200; ++i) markProviderEntry(kLogger, name, name, i);
    });
  }
  for (std::thread& thread : threads) thread.join();
  EXPECT_EQ(4U * 200 * 4, logger.size());
  for (const LogLine& line : logger.lines()) {
    if (line.kind() != LineKind::Banner) {
      ASSERT_EQ(line.subject(), line.fileInText());
    }
  }
}

}  // namespace
}  // namespace ZV::Test
