#include "agent/files/Rewrite.h"

#include <gtest/gtest.h>

#include <string>

namespace zorva::agent {
namespace {

const std::string kBefore = "# settings\nHOSTNAME=host1\nDOMAINNAME=example.org\nMTU=1500\nDNSSERVERS=192.0.2.53 \n";

std::string with(const std::string& from, const std::string& to) {
  std::string text = kBefore;
  return text.replace(text.find(from), from.size(), to);
}

TEST(CompareRewrite, AFileWithNewValuesIsWhole) {
  EXPECT_EQ(compareRewrite(kBefore, kBefore), Rewrite::Whole);
  EXPECT_EQ(compareRewrite(kBefore, with("HOSTNAME=host1", "HOSTNAME=another.host")), Rewrite::Whole);
  EXPECT_EQ(compareRewrite(kBefore, with("DNSSERVERS=192.0.2.53 ", "DNSSERVERS=")), Rewrite::Whole);
  EXPECT_EQ(compareRewrite("", ""), Rewrite::Whole);
}

TEST(CompareRewrite, ALineOfAnotherKeyMayBeTakenByOneThatItHolds) {
  EXPECT_EQ(compareRewrite("DHCP_HOSTNAME=x\n# HOSTNAME\n", "HOSTNAME=a\nHOSTNAME=a\n"), Rewrite::Whole);
}

TEST(CompareRewrite, EveryBeginningOfANewTextIsCutShort) {
  for (const std::string& text :
       {kBefore, with("DOMAINNAME=example.org", "DOMAINNAME=lab.example.org"), with("HOSTNAME=host1", "HOSTNAME=")}) {
    for (std::size_t size = 0; size < text.size(); ++size) {
      EXPECT_EQ(compareRewrite(kBefore, text.substr(0, size)), Rewrite::CutShort) << text.substr(0, size);
    }
  }
}

TEST(CompareRewrite, LinesLongerThanTheRewritersBufferCountAsSeveral) {
  const std::string line = "DNSSERVERS=" + std::string(600, '1') + "\n";
  const std::string rest = line.substr(511);
  EXPECT_EQ(compareRewrite(line, "DNSSERVERS=192.0.2.1 \n" + rest), Rewrite::Whole);
  EXPECT_EQ(compareRewrite(line, "DNSSERVERS=192.0.2.1 \n" + rest.substr(0, 5)), Rewrite::CutShort);
}

TEST(CompareRewrite, ALastLineWithoutAnEndMayKeepItOrGetOne) {
  EXPECT_EQ(compareRewrite("MTU=1500\nHOSTNAME=a", "MTU=1500\nHOSTNAME=b\n"), Rewrite::Whole);
  EXPECT_EQ(compareRewrite("MTU=1500\nHOSTNAME=a", "MTU=1500\nHOSTNAME=a"), Rewrite::Whole);
  EXPECT_EQ(compareRewrite("MTU=1500\nHOSTNAME=a", "MTU=1500\n"), Rewrite::CutShort);
}

TEST(CompareRewrite, WhatSomebodyElseWroteIsForeign) {
  EXPECT_EQ(compareRewrite(kBefore, "MTU=9000\n"), Rewrite::Foreign);
  EXPECT_EQ(compareRewrite(kBefore, kBefore + "EXTRA=1\n"), Rewrite::Foreign);
  EXPECT_EQ(compareRewrite(kBefore, with("MTU=1500\n", "")), Rewrite::Foreign);
  EXPECT_EQ(compareRewrite("", "x\n"), Rewrite::Foreign);
}

}  // namespace
}  // namespace zorva::agent
