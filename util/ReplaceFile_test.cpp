#include "util/ReplaceFile.h"

#include <gtest/gtest.h>
#include <sys/stat.h>

#include "agent/testing/TemporaryDirectory.h"
#include "util/ReadFile.h"

namespace zorva::util {
namespace {

using zorva::agent::testing::TemporaryDirectory;

TEST(ReplaceFile, ANewFileIsReadByWhoMayEnterItsDirectory) {
  const TemporaryDirectory directory;
  for (const auto& [ofDirectory, ofFile] : {std::pair{0755U, 0644U}, {0750U, 0640U}, {0711U, 0644U}, {0700U, 0600U}}) {
    ASSERT_EQ(::chmod(directory.path().c_str(), ofDirectory), 0);
    EXPECT_EQ(rightsIn(directory.path()), ofFile);
    EXPECT_EQ(replaceFile(directory.path() + "/", "file", "text"), "");
    const FileText file = readFile(directory / "file", 100);
    EXPECT_EQ(file.text, "text");
    EXPECT_EQ(file.mode & 0777U, ofFile);
  }
}

TEST(ReplaceFile, ARightIsNotGivenForADirectoryThatIsNotThere) { EXPECT_EQ(rightsIn("/no/such/directory"), 0600U); }

}  // namespace
}  // namespace zorva::util
