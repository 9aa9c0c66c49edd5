#pragma once

// For tests of commands: zorvactl run as a process on hosts that are tree files, and what such a run must come to.

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <nlohmann/json.hpp>
#include <string>
#include <vector>

#include "cli/testing/TestHost.h"

namespace zorva::cli {

using nlohmann::json;
using testing::AllOf;
using testing::EndsWith;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;
using testing::StartsWith;
using zorva::agent::testing::contentsOf;

using Words = std::vector<std::string>;

inline constexpr const char* kEndpoint = R"(ZORVA_DNSProtocolEndPoint.Name="eth0")";
inline constexpr const char* kSetting = R"(ZORVA_DNSSettingData.InstanceID="Computer%eth0")";
inline constexpr const char* kGeneral = "ZORVA_DNSGeneralSettingData";

/// The file of settings of eth0.
inline constexpr const char* kWholeFile =
    "BOOTPROTO=none\nHOSTNAME=host1\nDOMAINNAME=example.org\nCONFIG_NAME=\nDNSSERVERS=192.0.2.53 2001:db8::53 \n"
    "DNSSUFFIXES=example.org example.net \n";

/// Standard output of a run that must succeed.
inline std::string shown(const TestHost& host, const Words& words) {
  const Outcome outcome = host.run(words);
  EXPECT_EQ(outcome.exitCode, 0) << outcome.err;
  return outcome.out;
}

/// What a JSON document says: its list of results, or its members; without the version, which it must have.
inline json contentOf(const std::string& text) {
  json document = json::parse(text, nullptr, false);
  if (!document.is_object() || document.value("version", 0) != 1) {
    ADD_FAILURE() << "no document: " << text;
    return {};
  }
  document.erase("version");
  return document.contains("results") ? document["results"] : document;
}

inline json jsonShown(const TestHost& host, Words words) {
  words.insert(words.end(), {"--output", "json"});
  return contentOf(shown(host, words));
}

/// Checks that a run ends with this exit code and this message, without standard output.
inline void expectRefused(const TestHost& host, const Words& words, int exitCode, const std::string& told) {
  const Outcome outcome = host.run(words);
  EXPECT_EQ(outcome.exitCode, exitCode);
  EXPECT_EQ(outcome.out, "");
  EXPECT_THAT(outcome.err, HasSubstr(told));
}

/// Runs it; it must succeed without a warning.
inline std::string done(const TestHost& host, const Words& words) {
  const Outcome outcome = host.run(words);
  EXPECT_EQ(outcome.exitCode, 0) << outcome.err;
  EXPECT_EQ(outcome.err, "");
  return outcome.out;
}

/// Checks that a run ends with this exit code and this message.
inline void expectFailed(const TestHost& host, const Words& words, int exitCode, const std::string& told) {
  const Outcome outcome = host.run(words);
  EXPECT_EQ(outcome.exitCode, exitCode) << outcome.out;
  EXPECT_THAT(outcome.err, HasSubstr(told));
}

/// A host on which both interfaces have files.
class Changing : public testing::Test {
 protected:
  Changing() { host_.directory().write("data/ifcfg-eth0", kWholeFile); }

  std::string file() const { return contentsOf(host_.dataFile("ifcfg-eth0")); }

  /// The file with one line changed.
  static std::string wholeFileWith(const std::string& from, const std::string& to) {
    std::string text = kWholeFile;
    return text.replace(text.find(from), from.size(), to);
  }

  TestHost host_;
};

}  // namespace zorva::cli
