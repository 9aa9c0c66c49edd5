#include "agent/interface/ZALogger.h"

#include <gtest/gtest.h>
#include <sys/stat.h>

#include <algorithm>
#include <limits>
#include <regex>
#include <stdexcept>
#include <thread>
#include <vector>

#include "agent/Agent.h"
#include "agent/Seams.h"
#include "agent/testing/TemporaryDirectory.h"

namespace {

using ZALog::ZALogger;
using zorva::agent::LogStream;
using zorva::agent::testing::contentsOf;
using zorva::agent::testing::TemporaryDirectory;

class ZALoggerTest : public ::testing::Test {
 protected:
  ZALoggerTest() {
    config_.logTarget = directory_ / "log";
    config_.traceTarget = directory_ / "trace";
    zorva::agent::reset();  // another test's lines may have gone elsewhere already
    zorva::agent::setConfig(config_);
  }
  ~ZALoggerTest() override { zorva::agent::reset(); }

  static void log(int level, const std::string& message) {
    ZALogger::logLevelMessage("work", "agent/Work.cpp", 12, "Zorvagent.Test", level, nullptr, 0, 0, message);
  }
  static void trace(int level, const std::string& message) {
    ZALogger::traceLevelMessage("work", "agent/Work.cpp", 12, "Zorvagent.Test", level, nullptr, 0, 0, message);
  }
  std::string logged() { return contentsOf(directory_ / "log"); }
  std::string traced() { return contentsOf(directory_ / "trace"); }

  TemporaryDirectory directory_;
  zorva::agent::Config config_;
};

TEST_F(ZALoggerTest, ALineHasTimeLevelCategoryFunctionFileLineAndText) {
  log(6000, "what happened");
  const std::regex form(R"(\d{4}-\d\d-\d\dT\d\d:\d\d:\d\d\.\d{3}[+-]\d\d:\d\d )"
                        R"(6000 Zorvagent\.Test work agent/Work\.cpp:12 what happened\n)");
  EXPECT_TRUE(std::regex_match(logged(), form)) << logged();
}

TEST_F(ZALoggerTest, LinesBelowTheLevelAreDropped) {
  log(5999, "below");
  log(6000, "at");
  log(std::numeric_limits<int>::max(), "above");
  log(-1, "far below");
  EXPECT_EQ(logged().find("below"), std::string::npos);
  EXPECT_NE(logged().find(" at\n"), std::string::npos);
  EXPECT_NE(logged().find(" above\n"), std::string::npos);
}

TEST_F(ZALoggerTest, TheTwoStreamsHaveTargetsAndLevelsOfTheirOwn) {
  zorva::agent::setLogLevel(LogStream::Trace, 3000);
  log(3000, "to the log");
  trace(3000, "to the trace");
  EXPECT_EQ(logged(), "");
  EXPECT_NE(traced().find("to the trace"), std::string::npos);
}

TEST_F(ZALoggerTest, ControlCharactersAreWrittenEscapedAndALineStaysALine) {
  log(6000, std::string("a\nb\0c\x1B[2J\xFF", 10));
  EXPECT_NE(logged().find(" a\\nb\\x00c\\x1b[2J\\xff\n"), std::string::npos) << logged();
  const std::string text = logged();
  EXPECT_EQ(std::count(text.begin(), text.end(), '\n'), 1);
}

TEST_F(ZALoggerTest, NullForNamesCountsAsEmptyText) {
  ZALogger::logLevelMessage(nullptr, nullptr, 0, "", 6000, nullptr, 0, 0, "text");
  EXPECT_NE(logged().find(" 6000   :0 text\n"), std::string::npos) << logged();
}

TEST_F(ZALoggerTest, BracesAndPercentSignsAreText) {
  log(6000, "{} {0} %s %n {nonsense");
  EXPECT_NE(logged().find(" {} {0} %s %n {nonsense\n"), std::string::npos) << logged();
}

TEST_F(ZALoggerTest, ALongMessageIsOneLine) {
  log(6000, std::string(1000000, 'x'));
  EXPECT_GT(logged().size(), 1000000U);
}

TEST_F(ZALoggerTest, TargetAndLevelCanBeChangedAtRunTime) {
  zorva::agent::setLogTarget(LogStream::Log, directory_ / "other");
  zorva::agent::setLogLevel(LogStream::Log, 1);
  log(1, "low");
  EXPECT_NE(contentsOf(directory_ / "other").find("low"), std::string::npos);
  zorva::agent::setLogTarget(LogStream::Log, "off");
  log(6000, "dropped");
  EXPECT_EQ(contentsOf(directory_ / "other").find("dropped"), std::string::npos);
}

TEST_F(ZALoggerTest, ATargetThatCannotBeOpenedIsRefusedAndTheOldOneStays) {
  ASSERT_EQ(::mkfifo((directory_ / "fifo").c_str(), 0600), 0);
  for (const std::string& target : {directory_ / "absent/log", directory_.path(), directory_ / "fifo"}) {
    EXPECT_THROW(zorva::agent::setLogTarget(LogStream::Log, target), std::runtime_error) << target;
  }
  log(6000, "still here");
  EXPECT_NE(logged().find("still here"), std::string::npos);
}

TEST_F(ZALoggerTest, AConfiguredTargetThatCannotBeOpenedIsReportedOnceAndItsLinesAreLost) {
  config_.logTarget = directory_ / "absent/log";
  zorva::agent::setConfig(config_);
  zorva::agent::reset();
  zorva::agent::setConfig(config_);
  ::testing::internal::CaptureStderr();
  log(6000, "lost");
  log(6000, "lost too");
  const std::string told = ::testing::internal::GetCapturedStderr();
  EXPECT_EQ(told, "zorvagent: " + config_.logTarget +
                      ": cannot be opened as a log: No such file or directory; its lines are lost\n");
}

TEST_F(ZALoggerTest, StandardErrorIsATarget) {
  ::testing::internal::CaptureStderr();
  zorva::agent::setLogTarget(LogStream::Log, "stderr");
  log(6000, "seen");
  EXPECT_NE(::testing::internal::GetCapturedStderr().find("Zorvagent.Test work agent/Work.cpp:12 seen\n"),
            std::string::npos);
}

TEST_F(ZALoggerTest, SyslogIsATarget) {
  zorva::agent::setLogTarget(LogStream::Log, "syslog");
  log(6000, "to whom it may concern");
  EXPECT_EQ(logged(), "");
}

TEST_F(ZALoggerTest, AFullDiskLosesTheLineAndNothingElse) {
  zorva::agent::setLogTarget(LogStream::Log, "/dev/full");
  log(6000, "lost");
  zorva::agent::setLogTarget(LogStream::Log, directory_ / "log");
  log(6000, "kept");
  EXPECT_NE(logged().find("kept"), std::string::npos);
}

TEST_F(ZALoggerTest, LinesOfManyThreadsStayWhole) {
  std::vector<std::thread> threads;
  for (int number = 0; number < 4; ++number) {
    threads.emplace_back([] {
      for (int i = 0; i < 200; ++i) log(6000, std::string(300, 'x'));
    });
  }
  for (std::thread& thread : threads) thread.join();
  const std::string text = logged();
  const std::regex form(R"(\S+ 6000 Zorvagent\.Test work agent/Work\.cpp:12 x{300})");
  int lines = 0;
  for (std::size_t begin = 0, end = 0; begin < text.size(); begin = end + 1, ++lines) {
    end = text.find('\n', begin);
    ASSERT_TRUE(std::regex_match(text.substr(begin, end - begin), form));
  }
  EXPECT_EQ(lines, 800);
}

TEST_F(ZALoggerTest, ASinkTakesEveryCallWhateverItsLevelAndNoLineGoesOut) {
  struct Recorder : zorva::agent::LogSink {
    void record(const zorva::agent::LogCall& call) override {
      calls.push_back(std::to_string(static_cast<int>(call.stream)) + ' ' + call.function + ' ' + call.file + ':' +
                      std::to_string(call.line) + ' ' + call.category + ' ' + std::to_string(call.level) + ' ' +
                      call.message);
      reservedAreUnset = call.reserved1 == nullptr && call.reserved2 == 0 && call.reserved3 == 0;
    }
    std::vector<std::string> calls;
    bool reservedAreUnset = false;
  } recorder;
  zorva::agent::setLogSink(&recorder);
  log(1, "a");
  trace(9000, "b");
  zorva::agent::setLogSink(nullptr);
  log(1, "after");
  EXPECT_EQ(recorder.calls, (std::vector<std::string>{"0 work agent/Work.cpp:12 Zorvagent.Test 1 a",
                                                      "1 work agent/Work.cpp:12 Zorvagent.Test 9000 b"}));
  EXPECT_TRUE(recorder.reservedAreUnset);
  EXPECT_EQ(logged() + traced(), "");
}

TEST_F(ZALoggerTest, ASinkThatThrowsDoesNoHarm) {
  struct Thrower : zorva::agent::LogSink {
    void record(const zorva::agent::LogCall&) override { throw 42; }
  } thrower;
  zorva::agent::setLogSink(&thrower);
  EXPECT_NO_THROW(log(6000, "a"));
  zorva::agent::setLogSink(nullptr);
}

}  // namespace
