#include "util/ReadFile.h"

#include <gtest/gtest.h>

#include <cerrno>

#include "agent/testing/TemporaryDirectory.h"

namespace zorva::util {
namespace {

using zorva::agent::testing::TemporaryDirectory;

constexpr std::size_t kLimit = 10000;

TEST(ReadFile, GivesTheWholeFile) {
  const TemporaryDirectory directory;
  for (const std::size_t size : {std::size_t{0}, std::size_t{1}, std::size_t{4096}, std::size_t{4097}, kLimit}) {
    const std::string text(size, 'x');
    const FileText file = readFile(directory.write("file", text), kLimit);
    EXPECT_EQ(file.error, 0);
    EXPECT_FALSE(file.truncated);
    EXPECT_EQ(file.text, text);
  }
}

TEST(ReadFile, TellsThatAFileIsLongerThanTheLimit) {
  const TemporaryDirectory directory;
  const FileText file = readFile(directory.write("file", std::string(kLimit + 1, 'x')), kLimit);
  EXPECT_TRUE(file.truncated);
  EXPECT_EQ(file.text.size(), kLimit);
}

TEST(ReadFile, ReadsFilesThatDoNotTellTheirSize) {
  const FileText file = readFile("/proc/self/status", std::size_t{1} << 20);
  EXPECT_EQ(file.error, 0);
  EXPECT_NE(file.text.find("Pid:"), std::string::npos);
}

TEST(ReadFile, SaysWhatIsWrong) {
  const TemporaryDirectory directory;
  EXPECT_EQ(readFile(directory / "absent", kLimit).error, ENOENT);
  EXPECT_EQ(readFile(directory.path(), kLimit).error, EINVAL);
  EXPECT_EQ(readFile("/dev/zero", kLimit).error, EINVAL);
  EXPECT_EQ(fileErrorText(EINVAL), "not a regular file");
  EXPECT_EQ(fileErrorText(ENOENT), "No such file or directory");
}

}  // namespace
}  // namespace zorva::util
