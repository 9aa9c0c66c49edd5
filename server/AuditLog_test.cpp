#include "server/AuditLog.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <future>
#include <optional>
#include <stdexcept>
#include <vector>

#include "agent/testing/TemporaryDirectory.h"
#include "util/ReadFile.h"

namespace zorva::server {
namespace {

using ::testing::EndsWith;
using ::testing::HasSubstr;
using ::testing::MatchesRegex;
using zorva::agent::testing::TemporaryDirectory;

access::AuditRecord record(int number) {
  access::AuditRecord made;
  made.operation = "Op" + std::to_string(number);
  made.result = "done";
  return made;
}

/// A disk that can be stopped.
struct Disk {
  std::promise<void> let;
  std::shared_future<void> isLet = let.get_future().share();
  std::atomic<int> calls = 0;
  std::vector<std::string> lines;  ///< read it when the log is gone

  AuditLog::Writer writer() {
    return [this](const std::string& line) {
      ++calls;
      isLet.wait();
      lines.push_back(line);
    };
  }
};

TEST(AuditLog, WritesTheLinesInTheirOrderBeforeItEnds) {
  Disk disk;
  disk.let.set_value();
  {
    AuditLog log(disk.writer());
    for (int i = 0; i < 100; ++i) log.take(record(i));
  }
  ASSERT_EQ(disk.lines.size(), 100U);
  EXPECT_THAT(disk.lines.front(), HasSubstr("operation=Op0 "));
  EXPECT_THAT(disk.lines.back(), HasSubstr("operation=Op99 "));
}

TEST(AuditLog, ADiskThatWaitsHoldsUpNobodyAndWhatIsLeftOutIsCounted) {
  Disk disk;
  {
    AuditLog log(disk.writer());
    log.take(record(0));
    while (disk.calls == 0) std::this_thread::yield();  // the writer has that one and waits
    constexpr int kMore = static_cast<int>(AuditLog::kMostWaiting) + 7;
    for (int i = 1; i <= kMore; ++i) log.take(record(i));
    disk.let.set_value();
  }
  ASSERT_EQ(disk.lines.size(), AuditLog::kMostWaiting + 2);
  EXPECT_THAT(disk.lines.back(), HasSubstr("7 lines of the audit were left out here"));
}

TEST(AuditLog, ManyRefusalsInASecondAreCountedAndChangesAreNot) {
  Disk disk;
  disk.let.set_value();
  {
    AuditLog log(disk.writer());
    access::AuditRecord refusal = record(0);
    refusal.isRefusal = true;
    for (int i = 0; i < 10 * AuditLog::kMostRefusals; ++i) log.take(refusal);
    for (int i = 0; i < 100; ++i) log.take(record(1));
  }
  const auto isChange = [](const std::string& line) { return line.find("Op1 ") != std::string::npos; };
  const auto isCount = [](const std::string& line) { return line.find("were left out here") != std::string::npos; };
  EXPECT_EQ(std::count_if(disk.lines.begin(), disk.lines.end(), isChange), 100);
  EXPECT_GE(std::count_if(disk.lines.begin(), disk.lines.end(), isCount), 1);
  EXPECT_LT(disk.lines.size(), 100U + 3 * AuditLog::kMostRefusals) << "in two seconds at most";
}

TEST(AuditLog, ALineThatCannotBeWrittenDoesNotEndTheRest) {
  std::vector<std::string> lines;
  {
    AuditLog log([&lines](const std::string& line) {
      if (line.find("Op0 ") != std::string::npos) throw std::runtime_error("no space left");
      lines.push_back(line);
    });
    log.take(record(0));
    log.take(record(1));
  }
  ASSERT_EQ(lines.size(), 1U);
}

TEST(AuditFile, LinesHaveATimeAndAreAppended) {
  const TemporaryDirectory directory;
  const std::string path = directory.path() + "/audit.log";
  for (int i = 0; i < 2; ++i) {
    AuditLog log(auditFile(path));
    log.take(record(i));
  }
  const util::FileText file = util::readFile(path, 10'000);
  EXPECT_THAT(file.text, MatchesRegex("20[0-9-]+T[0-9:.]+Z user=.*Op0 .*\n20[0-9-]+T[0-9:.]+Z user=.*Op1 .*\n"));
  EXPECT_EQ(file.mode & 07777U & ~0640U, 0U) << "only its owner and group may read it";
}

TEST(AuditFile, OnlyARegularFileIsTaken) {
  const TemporaryDirectory directory;
  const std::string link = directory.path() + "/link";
  ASSERT_EQ(::symlink("/dev/null", link.c_str()), 0);
  EXPECT_THROW(auditFile(link), std::runtime_error);
  const std::string fifo = directory.path() + "/fifo";
  ASSERT_EQ(::mkfifo(fifo.c_str(), 0600), 0);
  EXPECT_THROW(auditFile(fifo), std::runtime_error);
  EXPECT_THROW(auditFile(directory.path()), std::runtime_error);
}

}  // namespace
}  // namespace zorva::server
