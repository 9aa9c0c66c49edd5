// Shared by the tests of ModifyInstance of the three classes.
#pragma once

#include <gmock/gmock.h>
#include <unistd.h>

#include <string>
#include <vector>

#include "ProviderCall.h"
#include "World.h"

namespace ZV::Test {

// The log lines of one value that is written to a file.
inline std::vector<std::string> writeLines(const std::string& file, const std::string& key, const std::string& value) {
  return {"log 4000 VARIABLE FileName = " + file, "log 4000 VARIABLE propertyName = " + key,
          "log 4000 VARIABLE propValue = " + value};
}

// Joins several pieces of a record.
inline std::vector<std::string> joined(const std::vector<std::vector<std::string>>& parts) {
  std::vector<std::string> all;
  for (const auto& part : parts) all.insert(all.end(), part.begin(), part.end());
  return all;
}

// A modification closes its result and logs no exit, even if it failed with its own code.
inline void expectDoneWithoutExit(const Outcome& outcome) {
  EXPECT_TRUE(outcome.markedEntry());
  EXPECT_EQ(1U, outcome.calls.count("returnDone"));
  EXPECT_FALSE(outcome.markedExit());
}

// Ends a test that waits; the providers never do.
class Deadline {
 public:
  Deadline() { ::alarm(20); }
  ~Deadline() { ::alarm(0); }
};

}  // namespace ZV::Test
