#include "tests/support/RecordingLogger.h"

#include "agent/interface/ZALogger.h"
#include "tests/support/Matchers.h"

namespace ZV::Test {
namespace {

void logOnly(int level, const std::string& text) {
  ZALog::ZALogger::logLevelMessage("f", "model/File.cpp", 7, "Zorvagent.X", level, nullptr, 0, 0, text);
}

void traceOnly(int level, const std::string& text) {
  ZALog::ZALogger::traceLevelMessage("f", "model/File.cpp", 7, "Zorvagent.X", level, nullptr, 0, 0, text);
}

void pair(int level, const std::string& text) {
  logOnly(level, text);
  traceOnly(level, text);
}

TEST(RecordingLogger, TakesTheLinesOfBothStreams) {
  RecordingLogger logger;
  pair(6000, "MESSAGE [File: model/File.cpp, Line: 7]: No ObjectPath Found");
  const LogLines lines = logger.lines();
  ASSERT_EQ(2U, lines.size());
  EXPECT_EQ(zorva::agent::LogStream::Log, lines[0].stream);
  EXPECT_EQ(zorva::agent::LogStream::Trace, lines[1].stream);
  EXPECT_EQ("f", lines[0].function);
  EXPECT_EQ("model/File.cpp", lines[0].file);
  EXPECT_EQ(7, lines[0].line);
  EXPECT_EQ("Zorvagent.X", lines[0].category);
  EXPECT_EQ(6000, lines[0].level);
  EXPECT_LT(lines[0].place, lines[1].place);
  EXPECT_THAT(logger.pairs().errors(), ElementsAre("No ObjectPath Found"));
}

TEST(RecordingLogger, LineWithoutItsPartnerIsAnError) {
  RecordingLogger logger;
  logOnly(4000, "a");
  EXPECT_THROW(logger.pairs(), BrokenPair);
  traceOnly(3000, "a");
  EXPECT_THROW(logger.pairs(), BrokenPair);
  logger.clear();
  traceOnly(4000, "a");
  logOnly(4000, "a");
  EXPECT_THROW(logger.pairs(), BrokenPair);
}

TEST(RecordingLogger, ReservedArgumentsMustBeEmpty) {
  RecordingLogger logger;
  ZALog::ZALogger::logLevelMessage("f", "x", 7, "Zorvagent.X", 4000, nullptr, 1, 0, "a");
  ZALog::ZALogger::traceLevelMessage("f", "x", 7, "Zorvagent.X", 4000, nullptr, 1, 0, "a");
  EXPECT_THROW(logger.pairs(), BrokenPair);
}

TEST(RecordingLogger, RecognizesEachFormatOfLine) {
  RecordingLogger logger;
  pair(4000, std::string(78, '='));
  pair(4000, "ENTERING: DNSClient_EnumInstances() in providers/DNSClientProvider.cpp [Line: 12]");
  pair(3000, "EXITING: getAll() in factory/F.cpp [Line: 9],Parameters List:  broker=0x7ffe01ab ref=0 isObjPath=1");
  pair(4000, "METHOD: f() was invoked in a.cpp [Line: 3]");
  pair(4000, "VARIABLE: 'string' has Value 'it's at line 4 in b' at line 5 in model/DNSClient.cpp");
  pair(6000, "MESSAGE [File: a.cpp, Line: 3]: ***No instance found***");
  pair(4000, "something else");
  const LogLines lines = logger.pairs();
  EXPECT_THAT(lines.briefs(), ElementsAre("4000 banner", "4000 ENTERING DNSClient_EnumInstances",
                                          "3000 EXITING getAll, broker=ADDR ref=0 isObjPath=1", "4000 METHOD f",
                                          "4000 VARIABLE string = it's at line 4 in b",
                                          "6000 MESSAGE ***No instance found***", "4000 OTHER something else"));
  EXPECT_EQ("Zorvagent.X 4000 banner", lines[0].briefWithCategory());
  EXPECT_TRUE(lines.entered("DNSClient_EnumInstances", "providers/DNSClientProvider.cpp"));
  EXPECT_FALSE(lines.entered("DNSClient_EnumInstances", "providers/Other.cpp"));
  EXPECT_TRUE(lines.exited("getAll"));
  EXPECT_EQ(12, lines[1].lineInText());
  EXPECT_EQ(5, lines[4].lineInText());
  EXPECT_EQ("model/DNSClient.cpp", lines[4].fileInText());
  EXPECT_EQ("a.cpp", lines[5].fileInText());
}

TEST(RecordingLogger, LinesAreSelectedByWhereTheyComeFrom) {
  RecordingLogger logger;
  pair(4000, "VARIABLE: 'a' has Value 'b' at line 5 in c");
  EXPECT_EQ(1U, logger.pairs().ofCategory("Zorvagent.X").size());
  EXPECT_THAT(logger.pairs().ofCategory("Zorvagent.Y"), IsEmpty());
  EXPECT_EQ(1U, logger.pairs().ofFunction("f").size());
  EXPECT_THAT(logger.pairs().ofKind(LineKind::Message), IsEmpty());
}

TEST(RecordingLogger, TakesNothingAfterItsEnd) {
  {
    RecordingLogger logger;
    EXPECT_EQ(&logger, RecordingLogger::active());
  }
  EXPECT_EQ(nullptr, RecordingLogger::active());
}

}  // namespace
}  // namespace ZV::Test
