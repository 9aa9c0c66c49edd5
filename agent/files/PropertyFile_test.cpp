#include "agent/interface/PropertyFile.h"

#include <gtest/gtest.h>
#include <sys/stat.h>

#include "agent/interface/File.h"
#include "agent/interface/StringConversion.h"
#include "agent/testing/TemporaryDirectory.h"

namespace {

using zorva::agent::testing::TemporaryDirectory;
using ZV::make_wstring;
using ZV::PropertyFile;

class PropertyFileTest : public ::testing::Test {
 protected:
  // The value of a key in a file with that text.
  std::wstring valueIn(const std::string& text, const std::wstring& key) {
    PropertyFile file(ZV::File::Path(directory_.write("ifcfg-eth0", text)));
    EXPECT_TRUE(file.open(1));
    return file.getValue(key);
  }

  bool opens(const std::string& path) { return PropertyFile(ZV::File::Path(path)).open(1); }

  TemporaryDirectory directory_;
};

TEST_F(PropertyFileTest, ALineIsSplitAtItsFirstEqualsSign) { EXPECT_EQ(valueIn("A=b=c\n", L"A"), L"b=c"); }

TEST_F(PropertyFileTest, OfAKeyThatOccursTwiceTheFirstCounts) { EXPECT_EQ(valueIn("A=1\nA=2\n", L"A"), L"1"); }

TEST_F(PropertyFileTest, CommentsAndBlankLinesArePassedOver) {
  EXPECT_EQ(valueIn("#A=1\n\n   \nA=2\n", L"A"), L"2");
  EXPECT_EQ(valueIn("#A=1\n", L"#A"), L"");
}

TEST_F(PropertyFileTest, QuotesAndBlanksStay) { EXPECT_EQ(valueIn("A= \"x y\" \n", L"A"), L" \"x y\" "); }

TEST_F(PropertyFileTest, BlanksBelongToTheKeyToo) {
  EXPECT_EQ(valueIn("A =1\n", L"A"), L"");
  EXPECT_EQ(valueIn("A =1\n", L"A "), L"1");
}

TEST_F(PropertyFileTest, TheLineEndIsNoPartOfTheValue) {
  EXPECT_EQ(valueIn("A=1\nB=2\r\nC=3", L"A"), L"1");
  EXPECT_EQ(valueIn("A=1\nB=2\r\nC=3", L"B"), L"2");
  EXPECT_EQ(valueIn("A=1\nB=2\r\nC=3", L"C"), L"3");
}

TEST_F(PropertyFileTest, AKeyIsItsWholeTextWithItsCase) {
  EXPECT_EQ(valueIn("DHCP_HOSTNAME=x\nhostname=y\nHOSTNAME=z\n", L"HOSTNAME"), L"z");
}

TEST_F(PropertyFileTest, AMissingKeyAnEmptyValueAndALineWithoutEqualsSignGiveEmptyText) {
  EXPECT_EQ(valueIn("A=1\n", L"B"), L"");
  EXPECT_EQ(valueIn("B=\n", L"B"), L"");
  EXPECT_EQ(valueIn("B\n", L"B"), L"");
  EXPECT_EQ(valueIn("", L"B"), L"");
}

TEST_F(PropertyFileTest, BytesThatAreNoUtf8AndNulComeBackAsTheyWere) {
  EXPECT_EQ(valueIn(std::string("A=\xFF\0\x80\n", 6), L"A"), make_wstring(std::string("\xFF\0\x80", 3)));
}

TEST_F(PropertyFileTest, AfterCloseThereAreNoKeys) {
  PropertyFile file(ZV::File::Path(directory_.write("ifcfg-eth0", "A=1\n")));
  ASSERT_TRUE(file.open(1));
  file.close();
  EXPECT_EQ(file.getValue(L"A"), L"");
}

TEST_F(PropertyFileTest, OpeningAgainReadsAgain) {
  PropertyFile file(ZV::File::Path(directory_.write("ifcfg-eth0", "A=1\n")));
  ASSERT_TRUE(file.open(1));
  directory_.write("ifcfg-eth0", "A=2\n");
  ASSERT_TRUE(file.open(1));
  EXPECT_EQ(file.getValue(L"A"), L"2");
}

TEST_F(PropertyFileTest, WhatIsNotThereOrIsNoRegularFileCannotBeOpened) {
  EXPECT_FALSE(opens(directory_ / "absent"));
  EXPECT_FALSE(opens(directory_.path()));
  EXPECT_FALSE(opens("/dev/zero"));
  EXPECT_FALSE(opens(""));
}

TEST_F(PropertyFileTest, AFifoWithoutAWriterDoesNotBlock) {
  ASSERT_EQ(::mkfifo((directory_ / "fifo").c_str(), 0600), 0);
  EXPECT_FALSE(opens(directory_ / "fifo"));
}

TEST_F(PropertyFileTest, APathWithANulInItNamesNoFile) {
  const std::string path = directory_.write("ifcfg-", "A=1\n");
  const std::string longer = path + std::string("\0eth0", 5);
  EXPECT_FALSE(opens(longer));
  EXPECT_FALSE(ZV::File::exists(make_wstring(longer)));
}

TEST_F(PropertyFileTest, AFileOfMoreThanFourMebibytesCannotBeOpened) {
  const std::string text = "A=1\n" + std::string(std::size_t{4} << 20, '\n');
  EXPECT_FALSE(opens(directory_.write("large", text)));
}

TEST_F(PropertyFileTest, AFailedOpenLeavesNoKeys) {
  const std::string path = directory_.write("ifcfg-eth0", "A=1\n");
  PropertyFile file{ZV::File::Path(path)};
  ASSERT_TRUE(file.open(1));
  ASSERT_EQ(::unlink(path.c_str()), 0);
  EXPECT_FALSE(file.open(1));
  EXPECT_EQ(file.getValue(L"A"), L"");
}

TEST(File, ExistsIsTrueForAFileOfAnyKindAndFollowsLinks) {
  const TemporaryDirectory directory;
  directory.write("file", "");
  directory.link("file", "link");
  directory.link("nowhere", "broken");
  EXPECT_TRUE(ZV::File::exists(make_wstring(directory.path())));
  EXPECT_TRUE(ZV::File::exists(make_wstring(directory / "file")));
  EXPECT_TRUE(ZV::File::exists(make_wstring(directory / "link")));
  EXPECT_FALSE(ZV::File::exists(make_wstring(directory / "broken")));
  EXPECT_FALSE(ZV::File::exists(L""));
}

TEST(File, NamesThatAreNoUtf8AreFound) {
  const TemporaryDirectory directory;
  directory.write("ifcfg-\xFF\xC0", "");
  EXPECT_TRUE(ZV::File::exists(make_wstring(directory / "ifcfg-\xFF\xC0")));
}

TEST(File, APathIsItsText) { EXPECT_EQ(ZV::File::Path("a/b").string(), "a/b"); }

}  // namespace
