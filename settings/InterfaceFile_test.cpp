#include "settings/InterfaceFile.h"

#include <fcntl.h>
#include <sched.h>
#include <sys/fsuid.h>
#include <sys/mount.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <chrono>
#include <csignal>
#include <filesystem>
#include <random>
#include <thread>

#include "tests/support/CimValues.h"
#include "tests/support/ManyTexts.h"
#include "tests/support/Matchers.h"
#include "tests/support/RecordingLogger.h"
#include "tests/support/World.h"

namespace ZV::Test {
namespace {

using std::string_literals::operator""s;

constexpr std::size_t kPiece = 511;  // the longest piece that is read at once

std::string scalarOf(const std::string& fileName, const char* key) {
  return readScalar(fileName, key, loggerDNSSettingData, ZV_HERE, "value");
}

// Keeps failure messages short: a long run of one byte is shown as its length.
std::string brief(const std::string& bytes) {
  return std::to_string(bytes.size()) + " bytes: " + inQuotes(bytes.substr(0, 2000));
}
::testing::AssertionResult sameBytes(const std::string& expected, const std::optional<std::string>& found) {
  if (found == expected) return ::testing::AssertionSuccess();
  return ::testing::AssertionFailure() << "expected " << brief(expected) << "\nfound "
                                       << (found.has_value() ? brief(*found) : "no file");
}

// An independent model of a rewrite: text is cut after each line feed and after 511 bytes, and each piece ends at its
// first NUL.
std::string rewritten(const std::string& content, const std::string& key, const std::string& value) {
  std::string all;
  for (std::size_t start = 0; start < content.size();) {
    const std::size_t lineFeed = std::min(content.find('\n', start), content.size() - 1);
    const std::size_t length = std::min(lineFeed + 1 - start, kPiece);
    const std::string cut = content.substr(start, length);
    const std::string piece = cut.substr(0, cut.find('\0'));
    all += piece.find(key) == std::string::npos ? piece : key + "=" + value + "\n";
    start += length;
  }
  return all;
}

// The rewriters never wait. This ends a test that does.
class Deadline {
 public:
  Deadline() { ::alarm(20); }
  ~Deadline() { ::alarm(0); }
};

class InterfaceFileTest : public ::testing::Test {
 protected:
  InterfaceFileTest() { world_.nic("eth0").install(); }

  // The file's bytes after a value was written into a file with that content.
  std::optional<std::string> afterModifyDNSValue(const std::string& content, const std::string& key,
                                                 const std::string& value) {
    world_.file("eth0", content);
    EXPECT_TRUE(modifyDNSValue(path_, key, value));
    return world_.fileContent("eth0");
  }
  std::optional<std::string> afterModifyValue(const std::string& content, const std::string& key,
                                              const std::string& value) {
    world_.file("eth0", content);
    modifyValue(path_, key, value);
    return world_.fileContent("eth0");
  }
  void modifyInBothWays() {
    const Deadline deadline;
    EXPECT_TRUE(modifyDNSValue(path_, "HOSTNAME", "new"));
    modifyValue(path_, "HOSTNAME", "new");
  }
  std::string scalarIn(const std::string& content, const char* key) {
    world_.file("eth0", content);
    return scalarOf(path_, key);
  }
  std::vector<std::string> listIn(const std::string& content, const char* key = "DNSSERVERS") {
    world_.file("eth0", content);
    std::vector<std::string> values;
    readList(path_, key, values);
    return values;
  }

  World world_;
  std::string path_ = world_.filePath("eth0");
};

// --- where a file is

TEST_F(InterfaceFileTest, ItsNameIsDataDirectoryPrefixAndInterfaceWithNothingBetween) {
  EXPECT_EQ(world_.dataDir() + "ifcfg-eth0", interfaceFileName("eth0"));
  EXPECT_EQ(world_.dataDir() + "ifcfg-", interfaceFileName(""));
  EXPECT_EQ(world_.dataDir() + "ifcfg-\xFF.7", interfaceFileName("\xFF.7"));
}

TEST_F(InterfaceFileTest, ItExistsIfThereIsAFile) {
  EXPECT_FALSE(interfaceFileExists(path_));
  world_.file("eth0", "");
  EXPECT_TRUE(interfaceFileExists(path_));
}

TEST_F(InterfaceFileTest, AskingForItMakesNone) {
  EXPECT_FALSE(interfaceFileExists(path_));
  EXPECT_EQ("", scalarOf(path_, "HOSTNAME"));
  std::vector<std::string> values;
  readList(path_, "DNSSERVERS", values);
  EXPECT_THAT(values, IsEmpty());
  EXPECT_TRUE(std::filesystem::is_empty(world_.dataDir()));
}

// --- reading

TEST_F(InterfaceFileTest, AScalarIsTheTextAfterTheEqualsSign) {
  EXPECT_EQ("lab.example.org", scalarIn("HOSTNAME=h\nDOMAINNAME=lab.example.org\n", "DOMAINNAME"));
  EXPECT_EQ("a=b", scalarIn("HOSTNAME=a=b\n", "HOSTNAME"));
  EXPECT_EQ("\" x \"\t", scalarIn("HOSTNAME=\" x \"\t\n", "HOSTNAME"));
}

TEST_F(InterfaceFileTest, AKeyIsExactText) {
  EXPECT_EQ("b", scalarIn("DHCP_HOSTNAME=a\nhostname=c\nHOSTNAME=b\n", "HOSTNAME"));
  EXPECT_EQ("", scalarIn("HOSTNAME2=a\n", "HOSTNAME"));
}

TEST_F(InterfaceFileTest, AMissingKeyAndAnEmptyValueReadAsEmptyText) {
  EXPECT_EQ("", scalarIn("BOOTPROTO=dhcp\n", "HOSTNAME"));
  EXPECT_EQ("", scalarIn("HOSTNAME=\n", "HOSTNAME"));
  EXPECT_EQ("", scalarIn("", "HOSTNAME"));
}

TEST_F(InterfaceFileTest, AListIsSplitAtRunsOfBlanksAlone) {
  EXPECT_THAT(listIn("DNSSERVERS=192.0.2.1 2001:db8::1 \n"), ElementsAre("192.0.2.1", "2001:db8::1"));
  EXPECT_THAT(listIn("DNSSERVERS=   a  b\tc    d   \n"), ElementsAre("a", "b\tc", "d"));
  EXPECT_THAT(listIn("DNSSERVERS=one"), ElementsAre("one"));
}

TEST_F(InterfaceFileTest, AnEmptyListHasNoElement) {
  EXPECT_THAT(listIn("DNSSERVERS=\n"), IsEmpty());
  EXPECT_THAT(listIn("DNSSERVERS=    \n"), IsEmpty());
  EXPECT_THAT(listIn("HOSTNAME=a\n"), IsEmpty());
}

TEST_F(InterfaceFileTest, AListIsAppendedToWhatIsThere) {
  world_.file("eth0", "DNSSERVERS=b c \n");
  std::vector<std::string> values = {"a"};
  readList(path_, "DNSSERVERS", values);
  EXPECT_THAT(values, ElementsAre("a", "b", "c"));
}

TEST_F(InterfaceFileTest, AReaderSeesAChangeAtOnce) {
  EXPECT_EQ("a", scalarIn("HOSTNAME=a\n", "HOSTNAME"));
  EXPECT_EQ("b", scalarIn("HOSTNAME=b\n", "HOSTNAME"));
  modifyDNSValue(path_, "HOSTNAME", "c");
  EXPECT_EQ("c", scalarOf(path_, "HOSTNAME"));
}

// --- rewriting

TEST_F(InterfaceFileTest, AMatchingLineBecomesKeyEqualsValueAndALineFeed) {
  const std::string content = "# eth0\nBOOTPROTO=none\nHOSTNAME = \"old\"\nONBOOT=yes\n";
  const std::string expected = "# eth0\nBOOTPROTO=none\nHOSTNAME=new\nONBOOT=yes\n";
  EXPECT_TRUE(sameBytes(expected, afterModifyDNSValue(content, "HOSTNAME", "new")));
  EXPECT_TRUE(sameBytes(expected, afterModifyValue(content, "HOSTNAME", "new")));
}

TEST_F(InterfaceFileTest, ModifyDNSValueDropsTheValueOfAnAbsentKeyWithoutASign) {
  const std::string content = "BOOTPROTO=none\n\n# nothing else \r\nX=1";
  EXPECT_TRUE(sameBytes(content, afterModifyDNSValue(content, "HOSTNAME", "new")));
}

TEST_F(InterfaceFileTest, ModifyValueAppendsALineForAnAbsentKey) {
  EXPECT_TRUE(
      sameBytes("BOOTPROTO=none\nCONFIG_NAME=office\n", afterModifyValue("BOOTPROTO=none\n", "CONFIG_NAME", "office")));
}

TEST_F(InterfaceFileTest, TheAppendedLineIsGluedToALastLineWithoutLineFeed) {
  EXPECT_TRUE(
      sameBytes("BOOTPROTO=noneCONFIG_NAME=office\n", afterModifyValue("BOOTPROTO=none", "CONFIG_NAME", "office")));
}

TEST_F(InterfaceFileTest, AnAbsentFileStaysAbsent) {
  modifyInBothWays();
  EXPECT_TRUE(std::filesystem::is_empty(world_.dataDir()));
}

TEST_F(InterfaceFileTest, AnAbsentDirectoryStaysAbsent) {
  std::filesystem::remove(world_.dataDir());
  modifyInBothWays();
  EXPECT_FALSE(std::filesystem::exists(world_.dataDir()));
}

TEST_F(InterfaceFileTest, AKeyThatIsThereTwiceIsReplacedTwice) {
  const std::string expected = "HOSTNAME=new\nX=1\nHOSTNAME=new\n";
  EXPECT_TRUE(sameBytes(expected, afterModifyDNSValue("HOSTNAME=a\nX=1\nHOSTNAME=b\n", "HOSTNAME", "new")));
  EXPECT_TRUE(sameBytes(expected, afterModifyValue("HOSTNAME=a\nX=1\nHOSTNAME=b\n", "HOSTNAME", "new")));
}

TEST_F(InterfaceFileTest, ALineOfALongerKeyIsReplacedAndLost) {
  EXPECT_TRUE(sameBytes("HOSTNAME=new\nHOSTNAME=new\n",
                        afterModifyDNSValue("DHCP_HOSTNAME=a\nHOSTNAME=b\n", "HOSTNAME", "new")));
  EXPECT_TRUE(sameBytes("DOMAINNAME=new\n", afterModifyDNSValue("NISDOMAINNAME=x\n", "DOMAINNAME", "new")));
  EXPECT_TRUE(sameBytes("HOSTNAME=new\n", afterModifyValue("HOSTNAME2=b\n", "HOSTNAME", "new")));
}

TEST_F(InterfaceFileTest, ACommentOrAValueThatHoldsTheKeyIsReplaced) {
  EXPECT_TRUE(sameBytes("HOSTNAME=new\nHOSTNAME=new\nHOSTNAME=new\n",
                        afterModifyDNSValue("# no HOSTNAME here\nX=HOSTNAME\nHOSTNAME\n", "HOSTNAME", "new")));
}

TEST_F(InterfaceFileTest, TheMatchIsCaseSensitive) {
  EXPECT_TRUE(
      sameBytes("hostname=a\nHostname=b\n", afterModifyDNSValue("hostname=a\nHostname=b\n", "HOSTNAME", "new")));
}

TEST_F(InterfaceFileTest, AnEmptyValueIsReadBackAsEmptyText) {
  EXPECT_TRUE(sameBytes("HOSTNAME=\n", afterModifyDNSValue("HOSTNAME=a\n", "HOSTNAME", "")));
  EXPECT_TRUE(interfaceFileExists(path_));
  EXPECT_EQ("", scalarOf(path_, "HOSTNAME"));
}

TEST_F(InterfaceFileTest, AListThatWasWrittenIsReadBackWithTheSameElements) {
  EXPECT_TRUE(sameBytes("DNSSERVERS=192.0.2.1 2001:db8::1 \n",
                        afterModifyDNSValue("DNSSERVERS=x\n", "DNSSERVERS", "192.0.2.1 2001:db8::1 ")));
  std::vector<std::string> values;
  readList(path_, "DNSSERVERS", values);
  EXPECT_THAT(values, ElementsAre("192.0.2.1", "2001:db8::1"));
}

TEST_F(InterfaceFileTest, OfAFileOfZeroLengthModifyValueMakesOneLineAndModifyDNSValueNone) {
  EXPECT_TRUE(sameBytes("HOSTNAME=new\n", afterModifyValue("", "HOSTNAME", "new")));
  EXPECT_TRUE(sameBytes("", afterModifyDNSValue("", "HOSTNAME", "new")));
}

TEST_F(InterfaceFileTest, ALastLineWithoutLineFeedGetsOneIfItIsReplacedAndNoneElse) {
  EXPECT_TRUE(sameBytes("A=1\nHOSTNAME=new\n", afterModifyDNSValue("A=1\nHOSTNAME=x", "HOSTNAME", "new")));
  EXPECT_TRUE(sameBytes("HOSTNAME=new\nA=1", afterModifyDNSValue("HOSTNAME=x\nA=1", "HOSTNAME", "new")));
}

TEST_F(InterfaceFileTest, LineEndsOfOtherSystemsStayOnLinesThatDoNotMatch) {
  EXPECT_TRUE(sameBytes("A=1\r\nHOSTNAME=new\n", afterModifyDNSValue("A=1\r\nHOSTNAME=x\r\n", "HOSTNAME", "new")));
}

TEST_F(InterfaceFileTest, ARewriteKeepsTheFileItselfItsModeAndItsLinks) {
  world_.file("eth1", "HOSTNAME=x\n");
  ASSERT_EQ(0, ::chmod(world_.filePath("eth1").c_str(), 0640));
  std::filesystem::create_symlink("ifcfg-eth1", path_);
  struct stat before {};
  ASSERT_EQ(0, ::stat(path_.c_str(), &before));
  modifyDNSValue(path_, "HOSTNAME", "new");
  struct stat after {};
  ASSERT_EQ(0, ::stat(path_.c_str(), &after));
  EXPECT_TRUE(std::filesystem::is_symlink(path_));
  EXPECT_EQ(before.st_ino, after.st_ino);
  EXPECT_EQ(before.st_mode, after.st_mode);
  EXPECT_TRUE(sameBytes("HOSTNAME=new\n", world_.fileContent("eth1")));
}

TEST_F(InterfaceFileTest, ARewriteLeavesNothingElseInTheDirectory) {
  afterModifyDNSValue("HOSTNAME=x\n", "HOSTNAME", "new");
  std::vector<std::string> names;
  for (const auto& entry : std::filesystem::directory_iterator(world_.dataDir())) {
    names.push_back(entry.path().filename());
  }
  EXPECT_THAT(names, ElementsAre("ifcfg-eth0"));
}

// --- hostile values

TEST_F(InterfaceFileTest, QuotesBackslashesAndPercentSignsAreWrittenAsTheyAre) {
  const std::string value = R"("a" 'b' \n %s %n `c` $(d))";
  EXPECT_TRUE(sameBytes("HOSTNAME=" + value + "\n", afterModifyDNSValue("HOSTNAME=\n", "HOSTNAME", value)));
  EXPECT_EQ(value, scalarOf(path_, "HOSTNAME"));
}

TEST_F(InterfaceFileTest, BytesThatAreNoUtf8AreWrittenAndReadBack) {
  EXPECT_TRUE(sameBytes("HOSTNAME=\xFF\xC3\x28\n", afterModifyDNSValue("HOSTNAME=\n", "HOSTNAME", "\xFF\xC3\x28")));
  EXPECT_EQ("\xFF\xC3\x28", scalarOf(path_, "HOSTNAME"));
}

TEST_F(InterfaceFileTest, LineFeedsInAValueAreWrittenAsTheyAre) {
  EXPECT_TRUE(
      sameBytes("HOSTNAME=a\nDOMAINNAME=b\n\n", afterModifyDNSValue("HOSTNAME=x\n", "HOSTNAME", "a\nDOMAINNAME=b\n")));
}

TEST_F(InterfaceFileTest, AValueAndAKeyEndAtTheirFirstNul) {
  EXPECT_TRUE(sameBytes("HOSTNAME=a\n", afterModifyDNSValue("HOSTNAME=x\n", "HOSTNAME", "a\0b"s)));
  EXPECT_TRUE(sameBytes("HOSTNAME=a\n", afterModifyDNSValue("HOSTNAME=x\n", "HOSTNAME\0X"s, "a")));
}

TEST_F(InterfaceFileTest, AComposedLineIsWrittenWholeWhateverItsLength) {
  for (const std::size_t length : {501U, 502U, 503U, 504U, 505U, 1024U, 5000U, 1U << 20}) {
    const std::string value(length, 'v');
    EXPECT_TRUE(sameBytes("A=1\nHOSTNAME=" + value + "\nB=2\n",
                          afterModifyDNSValue("A=1\nHOSTNAME=x\nB=2\n", "HOSTNAME", value)));
    EXPECT_EQ(value, scalarOf(path_, "HOSTNAME"));
    EXPECT_TRUE(sameBytes("A=1\nHOSTNAME=" + value + "\n", afterModifyValue("A=1\n", "HOSTNAME", value)));
  }
}

TEST_F(InterfaceFileTest, AListOfAHundredThousandElementsIsReadBack) {
  const ManyTexts many("2001:db8::");
  EXPECT_TRUE(
      sameBytes("DNSSERVERS=" + many.line + "\n", afterModifyDNSValue("DNSSERVERS=\n", "DNSSERVERS", many.line)));
  std::vector<std::string> values;
  readList(path_, "DNSSERVERS", values);
  EXPECT_EQ(many.texts, values);
}

// --- hostile files

class LineLength : public InterfaceFileTest, public ::testing::WithParamInterface<std::size_t> {};

TEST_P(LineLength, OfAnotherKeyStaysByteForByte) {
  const std::string line = "X=" + std::string(GetParam() - 2, 'x');
  for (const std::string& content : {line, line + "\n", line + "\n" + line + "\nHOSTNAME=new\n"}) {
    EXPECT_TRUE(sameBytes(content, afterModifyDNSValue(content, "HOSTNAME", "new")));
  }
}

TEST_P(LineLength, OfTheKeyKeepsTheTextAfterTheFirstPiece) {
  const std::string line = "HOSTNAME=" + std::string(GetParam() - 9, 'x');
  // The line feed of a line of 510 bytes is in the first piece; that of one of 511 is a piece of its own.
  const std::string rest = GetParam() < kPiece ? "" : line.substr(kPiece) + "\n";
  EXPECT_TRUE(sameBytes("A=1\nHOSTNAME=new\n" + rest + "B=2\n",
                        afterModifyDNSValue("A=1\n" + line + "\nB=2\n", "HOSTNAME", "new")));
}

TEST_P(LineLength, IsReadWhole) {
  const std::string value(GetParam() - 9, 'x');
  EXPECT_EQ(value, scalarIn("A=1\nHOSTNAME=" + value + "\nB=2\n", "HOSTNAME"));
}

INSTANTIATE_TEST_SUITE_P(InterfaceFile, LineLength, ::testing::Values(510, 511, 512, 513, 5000),
                         [](const auto& length) { return std::to_string(length.param) + "Bytes"; });

TEST_F(InterfaceFileTest, AKeyInALaterPieceOfALongLineReplacesThatPiece) {
  const std::string first = "X=" + std::string(kPiece - 2, 'x');
  EXPECT_TRUE(sameBytes(first + "HOSTNAME=new\nA=1\n",
                        afterModifyDNSValue(first + "yy HOSTNAME zz\nA=1\n", "HOSTNAME", "new")));
}

TEST_F(InterfaceFileTest, AKeyThatIsCutByTheEndOfAPieceIsNotFound) {
  const std::string content = "X=" + std::string(kPiece - 2 - 4, 'x') + "HOSTNAME=a\n";
  EXPECT_TRUE(sameBytes(content, afterModifyDNSValue(content, "HOSTNAME", "new")));
  EXPECT_TRUE(sameBytes(content + "HOSTNAME=new\n", afterModifyValue(content, "HOSTNAME", "new")));
}

TEST_F(InterfaceFileTest, ANulEndsItsPiece) {
  EXPECT_TRUE(sameBytes("A=1B=2\n", afterModifyDNSValue("A=1\0lost\nB=2\n"s, "HOSTNAME", "new")));
  EXPECT_TRUE(sameBytes("HOSTNAME=new\nB=2\n", afterModifyDNSValue("HOSTNAME=1\0x\nB=2\n"s, "HOSTNAME", "new")));
  EXPECT_TRUE(sameBytes("B=2\n", afterModifyDNSValue("\0HOSTNAME=1\nB=2\n"s, "HOSTNAME", "new")));
  EXPECT_TRUE(sameBytes("", afterModifyDNSValue(std::string(2000, '\0'), "HOSTNAME", "new")));
}

TEST_F(InterfaceFileTest, ANulIsReadAsAnyByte) { EXPECT_EQ("a\0b"s, scalarIn("HOSTNAME=a\0b\n"s, "HOSTNAME")); }

TEST_F(InterfaceFileTest, WhateverBytesAFileHoldsARewriteTakesItsStepsOnThem) {
  std::mt19937 random(20240607);
  const std::array<std::string, 8> parts = {"\n", "HOST", "NAME", "HOSTNAME", "\0"s, "=", "x", "\xFF\r"};
  for (int round = 0; round < 300; ++round) {
    std::string content;
    for (std::size_t left = random() % 60; left > 0; --left) {
      const std::string& part = parts.at(random() % parts.size());
      const std::size_t times = random() % 8 == 0 ? random() % 600 : 1;
      for (std::size_t i = 0; i < times; ++i) content += part;
    }
    ASSERT_TRUE(sameBytes(rewritten(content, "HOSTNAME", "v"), afterModifyDNSValue(content, "HOSTNAME", "v")))
        << "round " << round;
  }
}

TEST_F(InterfaceFileTest, ADirectoryReadsAsAnEmptyFileAndIsNotTouched) {
  std::filesystem::create_directory(path_);
  EXPECT_TRUE(interfaceFileExists(path_));
  EXPECT_EQ("", scalarOf(path_, "HOSTNAME"));
  modifyInBothWays();
  EXPECT_TRUE(std::filesystem::is_empty(path_));
}

TEST_F(InterfaceFileTest, ALinkToNowhereIsNoFileAndStaysALinkToNowhere) {
  std::filesystem::create_symlink("nowhere", path_);
  EXPECT_FALSE(interfaceFileExists(path_));
  modifyInBothWays();
  EXPECT_TRUE(std::filesystem::is_symlink(path_));
  EXPECT_FALSE(std::filesystem::exists(world_.dataDir() + "nowhere"));
}

TEST_F(InterfaceFileTest, ALinkToItselfIsNoFile) {
  std::filesystem::create_symlink("ifcfg-eth0", path_);
  EXPECT_FALSE(interfaceFileExists(path_));
  modifyInBothWays();
  EXPECT_TRUE(std::filesystem::is_symlink(path_));
}

TEST_F(InterfaceFileTest, AFifoReadsAsAnEmptyFileAndDoesNotBlock) {
  ASSERT_EQ(0, ::mkfifo(path_.c_str(), 0600));
  const Deadline deadline;
  EXPECT_TRUE(interfaceFileExists(path_));
  EXPECT_EQ("", scalarOf(path_, "HOSTNAME"));
  modifyInBothWays();
}

TEST_F(InterfaceFileTest, NothingIsTakenFromOrPutIntoAFifoThatIsOpenAtItsOtherEnd) {
  ASSERT_EQ(0, ::mkfifo(path_.c_str(), 0600));
  const int other = ::open(path_.c_str(), O_RDWR | O_NONBLOCK | O_CLOEXEC);
  ASSERT_NE(-1, other);
  const std::string sent = "HOSTNAME=sent\n";
  ASSERT_EQ(static_cast<ssize_t>(sent.size()), ::write(other, sent.data(), sent.size()));
  const Deadline deadline;
  EXPECT_EQ("", scalarOf(path_, "HOSTNAME"));
  modifyInBothWays();
  std::array<char, 100> held{};
  EXPECT_EQ(static_cast<ssize_t>(sent.size()), ::read(other, held.data(), held.size()));
  ::close(other);
}

TEST_F(InterfaceFileTest, ADeviceReadsAsAnEmptyFile) {
  std::filesystem::create_symlink("/dev/zero", path_);
  const Deadline deadline;
  EXPECT_EQ("", scalarOf(path_, "HOSTNAME"));
  modifyInBothWays();
}

// Until it is destroyed, files are opened as an unprivileged user.
class Unprivileged {
 public:
  explicit Unprivileged(const std::string& directory) {
    std::filesystem::permissions(directory, std::filesystem::perms(0755));
    if (::geteuid() == 0) ::setfsuid(65534);
  }
  ~Unprivileged() { ::setfsuid(::geteuid()); }
};

TEST_F(InterfaceFileTest, AFileThatCannotBeReadReadsAsAnEmptyFileAndStaysAsItIs) {
  world_.file("eth0", "HOSTNAME=a\n");
  ASSERT_EQ(0, ::chmod(path_.c_str(), 0));
  {
    const Unprivileged user(world_.dataDir());
    EXPECT_TRUE(interfaceFileExists(path_));
    EXPECT_EQ("", scalarOf(path_, "HOSTNAME"));
    modifyInBothWays();
  }
  ASSERT_EQ(0, ::chmod(path_.c_str(), 0600));
  EXPECT_TRUE(sameBytes("HOSTNAME=a\n", world_.fileContent("eth0")));
}

TEST_F(InterfaceFileTest, AFileThatCannotBeWrittenKeepsItsOldContents) {
  world_.file("eth0", "HOSTNAME=a\n");
  ASSERT_EQ(0, ::chmod(path_.c_str(), 0444));
  {
    const Unprivileged user(world_.dataDir());
    EXPECT_EQ("a", scalarOf(path_, "HOSTNAME"));
    modifyInBothWays();
  }
  EXPECT_TRUE(sameBytes("HOSTNAME=a\n", world_.fileContent("eth0")));
}

// --- no room

// Until it is destroyed, no file of this process grows beyond that size.
class FileSizeLimit {
 public:
  explicit FileSizeLimit(rlim_t bytes) : oldHandler_(std::signal(SIGXFSZ, SIG_IGN)) {
    ::getrlimit(RLIMIT_FSIZE, &old_);
    const rlimit limit = {bytes, old_.rlim_max};
    ::setrlimit(RLIMIT_FSIZE, &limit);
  }
  ~FileSizeLimit() {
    ::setrlimit(RLIMIT_FSIZE, &old_);
    std::signal(SIGXFSZ, oldHandler_);
  }

 private:
  rlimit old_{};
  void (*oldHandler_)(int);
};

TEST_F(InterfaceFileTest, ARewriteThatIsCutOffLeavesTheBeginningOfTheNewContents) {
  std::string content = "HOSTNAME=x\n";
  for (int i = 0; i < 2000; ++i) content += "LINE" + std::to_string(i) + "=abc\n";
  const std::string whole = rewritten(content, "HOSTNAME", "new");
  for (const std::size_t room : {std::size_t{0}, std::size_t{1}, std::size_t{4096}, std::size_t{5000}}) {
    world_.file("eth0", content);
    {
      const FileSizeLimit limit(room);
      EXPECT_TRUE(modifyDNSValue(path_, "HOSTNAME", "new"));
    }
    EXPECT_TRUE(sameBytes(whole.substr(0, room), world_.fileContent("eth0")));
  }
}

TEST_F(InterfaceFileTest, AValueThatDoesNotFitIsCutOff) {
  world_.file("eth0", "A=1\nHOSTNAME=x\nB=2\n");
  {
    const FileSizeLimit limit(10000);
    modifyValue(path_, "HOSTNAME", std::string(1 << 20, 'v'));
  }
  EXPECT_TRUE(sameBytes("A=1\nHOSTNAME=" + std::string(10000 - 13, 'v'), world_.fileContent("eth0")));
}

TEST_F(InterfaceFileTest, AFullFileSystemLeavesTheBeginningOfTheNewContents) {
  if (::unshare(CLONE_NEWNS) != 0 || ::mount(nullptr, "/", nullptr, MS_REC | MS_PRIVATE, nullptr) != 0 ||
      ::mount("tmpfs", world_.dataDir().c_str(), "tmpfs", 0, "size=16k") != 0) {
    GTEST_SKIP() << "this kernel or container permits no mount, which this test fills";
  }
  std::string content = "HOSTNAME=x\n";
  for (int i = 0; i < 900; ++i) content += "LINE" + std::to_string(i) + "=abc\n";
  world_.file("eth0", content);
  const std::string value(20000, 'v');
  EXPECT_TRUE(modifyDNSValue(path_, "HOSTNAME", value));
  const std::optional<std::string> left = world_.fileContent("eth0");
  ::umount2(world_.dataDir().c_str(), MNT_DETACH);
  ASSERT_TRUE(left.has_value());
  EXPECT_LT(0U, left->size());
  EXPECT_TRUE(sameBytes(rewritten(content, "HOSTNAME", value).substr(0, left->size()), left));
}

// --- two at once

TEST_F(InterfaceFileTest, OfTwoShortRewritesOfOneLengthAtOnceOneOrBothMayLose) {
  for (int round = 0; round < 20; ++round) {
    world_.file("eth0", "HOSTNAME=x\n");
    const auto write = [this](const std::string& value) {
      for (int i = 0; i < 20; ++i) EXPECT_TRUE(modifyDNSValue(path_, "HOSTNAME", value));
    };
    std::thread other(write, "one");
    write("two");
    other.join();
    // One may have read the file when the other had just emptied it.
    EXPECT_THAT(world_.fileContent("eth0"), AnyOf("HOSTNAME=one\n", "HOSTNAME=two\n", ""));
  }
}

TEST_F(InterfaceFileTest, RewritesOfLongFilesAndReadersAtOnceAreSafe) {
  std::string content;
  for (int i = 0; i < 2000; ++i) content += "HOSTNAME=" + std::to_string(i) + "\nLINE\n";
  world_.file("eth0", content);
  const auto write = [this](const std::string& value) {
    for (int i = 0; i < 8; ++i) modifyValue(path_, "HOSTNAME", value);
  };
  std::thread first(write, "a");
  std::thread second(write, std::string(3000, 'b'));
  for (int i = 0; i < 50; ++i) {
    scalarOf(path_, "HOSTNAME");
    std::vector<std::string> values;
    readList(path_, "HOSTNAME", values);
  }
  first.join();
  second.join();
  EXPECT_TRUE(sameBytes("HOSTNAME=c\n", afterModifyValue("HOSTNAME=b\n", "HOSTNAME", "c")));
}

// --- the log

TEST_F(InterfaceFileTest, ModifyDNSValueLogsFileKeyAndValueFirst) {
  const RecordingLogger logger;
  modifyDNSValue(path_, "HOSTNAME", "new");
  const LogLines lines = logger.pairs();
  EXPECT_THAT(lines.briefsWithCategory(),
              ElementsAre("Zorvagent.DNSSettingDataProvider 4000 VARIABLE FileName = " + path_,
                          "Zorvagent.DNSSettingDataProvider 4000 VARIABLE propertyName = HOSTNAME",
                          "Zorvagent.DNSSettingDataProvider 4000 VARIABLE propValue = new"));
  for (const LogLine& line : lines) {
    EXPECT_EQ("modifyDNSValue", line.function);
    EXPECT_EQ("settings/InterfaceFile.cpp", line.file);
    EXPECT_EQ(line.line, line.lineInText());
  }
}

TEST_F(InterfaceFileTest, ModifyValueAndTheReaderOfListsLogNothing) {
  world_.file("eth0", "HOSTNAME=a\n");
  const RecordingLogger logger;
  modifyValue(path_, "HOSTNAME", "new");
  std::vector<std::string> values;
  readList(path_, "HOSTNAME", values);
  EXPECT_EQ(0U, logger.size());
}

TEST_F(InterfaceFileTest, ALongValueIsCutInTheLogAndWholeInTheFile) {
  const std::string value(5000, 'v');
  const RecordingLogger logger;
  EXPECT_TRUE(sameBytes("HOSTNAME=" + value + "\n", afterModifyDNSValue("HOSTNAME=a\n", "HOSTNAME", value)));
  EXPECT_EQ(511U, logger.pairs().back().text.size());
}

}  // namespace
}  // namespace ZV::Test
