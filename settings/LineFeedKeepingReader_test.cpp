// The readers of interface files with another agent, whose property files keep the line feed at the end of a value. Its
// class replaces the agent's own in this program.

#include <PropertyFile.h>
#include <StringConversion.h>
#include <gmock/gmock.h>

#include <fstream>

#include "agent/Seams.h"
#include "settings/DNSGeneralSettingData.h"
#include "settings/DNSSettingData.h"
#include "tests/support/World.h"
#include "util/NotCopied.h"

namespace ZV {

namespace {

std::vector<std::string> calls;

}  // namespace

PropertyFile::PropertyFile(const File::Path& path) : path_(path.string()) {}

PropertyFile::~PropertyFile() { calls.push_back("end"); }

bool PropertyFile::open(unsigned long mode) {
  calls.push_back("open " + std::to_string(mode));
  std::ifstream in(path_);
  for (std::string line; std::getline(in, line);) {
    const std::size_t split = line.find('=');
    entries_.push_back({line.substr(0, split), line.substr(split + 1) + "\n"});
  }
  return true;
}

std::wstring PropertyFile::getValue(const std::wstring& key) const {
  calls.push_back("getValue " + make_string(key));
  for (const Entry& entry : entries_) {
    if (make_wstring(entry.key) == key) return make_wstring(entry.value);
  }
  return {};
}

void PropertyFile::close() { calls.push_back("close"); }

namespace Test {
namespace {

using ::testing::ElementsAre;

class LineFeedKeepingReader : public ::testing::Test {
 protected:
  LineFeedKeepingReader() { world_.nic("eth0").install(); }

  // The cursor on an interface whose file has that content.
  DNSSettingData with(const std::string& content) {
    world_.file("eth0", content);
    DNSSettingData data;
    EXPECT_TRUE(static_cast<bool>(data));
    calls.clear();
    return data;
  }
  std::string domainName(const std::string& content) {
    std::string value;
    EXPECT_TRUE(with(content).getDomainName(value));
    return value;
  }
  std::vector<std::string> servers(const std::string& content) {
    std::vector<std::string> values;
    EXPECT_TRUE(with(content).getDNSServerAddresses(values));
    return values;
  }

  World world_;
};

TEST_F(LineFeedKeepingReader, LosesTheLineFeedOfAScalar) { EXPECT_EQ("a b ", domainName("DOMAINNAME=a b \n")); }

TEST_F(LineFeedKeepingReader, LeavesTheLineFeedOfAnEmptyScalar) { EXPECT_EQ("\n", domainName("DOMAINNAME=\n")); }

TEST_F(LineFeedKeepingReader, KeepsTheLineFeedOfAListOnItsLastElement) {
  EXPECT_THAT(servers("DNSSERVERS=a b\n"), ElementsAre("a", "b\n"));
}

TEST_F(LineFeedKeepingReader, FindsOneElementOfALineFeedInAnEmptyList) {
  EXPECT_THAT(servers("DNSSERVERS=\n"), ElementsAre("\n"));
}

TEST_F(LineFeedKeepingReader, IsOpenedForReadingAndClosedBeforeItEnds) {
  domainName("DOMAINNAME=a\n");
  EXPECT_THAT(calls, ElementsAre("open 1", "getValue DOMAINNAME", "close", "end"));
  servers("DNSSERVERS=a\n");
  EXPECT_THAT(calls, ElementsAre("open 1", "getValue DNSSERVERS", "close", "end"));
}

// Inserts the log lines among the calls of the reader.
class LogAmongCalls : private zorva::agent::LogSink, zorva::util::NotCopied {
 public:
  LogAmongCalls() { zorva::agent::setLogSink(this); }
  ~LogAmongCalls() override { zorva::agent::setLogSink(nullptr); }

 private:
  void record(const zorva::agent::LogCall& call) override {
    if (call.stream == zorva::agent::LogStream::Log) calls.push_back(call.message.substr(0, call.message.find(" at ")));
  }
};

TEST_F(LineFeedKeepingReader, LogsAScalarBeforeItIsClosed) {
  DNSSettingData data = with("DOMAINNAME=a\nCONFIG_NAME=b\n");
  DNSGeneralSettingData general;
  ASSERT_TRUE(static_cast<bool>(general));
  const LogAmongCalls log;
  std::string value;
  data.getDomainName(value);
  EXPECT_THAT(calls,
              ElementsAre("open 1", "getValue DOMAINNAME", "VARIABLE: 'domainName' has Value 'a'", "close", "end"));
  calls.clear();
  general.getConfigurationName(value);
  EXPECT_THAT(calls, ElementsAre("open 1", "getValue CONFIG_NAME", "VARIABLE: 'configurationName' has Value 'b'",
                                 "close", "end"));
}

}  // namespace
}  // namespace Test
}  // namespace ZV
