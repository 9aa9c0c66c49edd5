// The examples in README.md, on the host that it shows.

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <sstream>

#include "cli/testing/TestHost.h"

namespace zorva::cli {
namespace {

using testing::HasSubstr;
using zorva::agent::testing::contentsOf;

std::string readme() { return contentsOf(ZORVA_SOURCE_DIR "/README.md"); }

TestHost shownHost() {
  return TestHost({TestHost::port("eth0", R"("domain_name": "example.org", "dns_suffixes": ["example.org"],)"
                                          R"("dns_owner": "NetworkManager", "dns_profile": "lan")"),
                   TestHost::port("eth1", R"("dns_server_addresses": [])")});
}

/// The code block after that text.
std::string blockAfter(const std::string& text) {
  const std::string all = readme();
  const std::size_t from = all.find("```\n", all.find(text)) + 4;
  EXPECT_NE(all.find(text), std::string::npos) << text;
  return all.substr(from, all.find("```", from) - from);
}

/// The words of a line as a shell splits them, up to a comment; single quotes are supported.
std::vector<std::string> wordsOf(const std::string& line) {
  std::vector<std::string> words;
  bool isQuoted = false;
  bool isInWord = false;
  for (const char c : line) {
    if (c == '#' && !isQuoted && !isInWord) break;
    if (c == ' ' && !isQuoted) {
      isInWord = false;
      continue;
    }
    if (!isInWord) words.emplace_back();
    isInWord = true;
    if (c == '\'') {
      isQuoted = !isQuoted;
    } else {
      words.back() += c;
    }
  }
  return words;
}

/// Runs the lines "./run -- ..." of a block, one after the other; each must succeed.
void runAll(const TestHost& host, const std::string& block) {
  std::istringstream lines(block);
  int count = 0;
  for (std::string line; std::getline(lines, line);) {
    std::vector<std::string> words = wordsOf(line);
    if (words.size() < 3 || words[0] != "./run" || words[1] != "--") continue;
    words.erase(words.begin(), words.begin() + 2);
    const Outcome outcome = host.run(words);
    EXPECT_EQ(outcome.exitCode, 0) << line;
    EXPECT_EQ(outcome.err, "") << line;
    ++count;
  }
  EXPECT_GE(count, 4);
}

TEST(Readme, ShowsWhatShowSays) {
  const TestHost host = shownHost();
  EXPECT_EQ(blockAfter("## What you see"),
            "$ ./run\n" + host.run({"show"}).out + "\n$ ./run -- show eth0\n" + host.run({"show", "eth0"}).out);
}

TEST(Readme, ItsCommandsThatReadWork) {
  runAll(shownHost(), blockAfter("Arguments after `--` are passed to `zorvactl`"));
}

TEST(Readme, ItsCommandsThatChangeWorkInTheirOrder) {
  const TestHost host = shownHost();
  runAll(host, blockAfter("Settings are changed with"));
  EXPECT_THAT(contentsOf(host.dataFile("ifcfg-eth0")), HasSubstr("DOMAINNAME=lab.example.org\n"));
}

TEST(Readme, SaysOnItsFirstScreenWhenAChangeReachesTheHost) {
  EXPECT_LT(readme().find("`zorvactl apply`"), readme().find("\n## "));
  EXPECT_LT(readme().find("`[tree] apply = \"host\"`"), readme().find("\n## "));
}

}  // namespace
}  // namespace zorva::cli
