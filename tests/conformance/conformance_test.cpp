// Makes a test of every case in the files of this folder, and for each file tests of all its cases over brokers that
// return wrong states. With ZORVA_CONFORMANCE_RECORD set in the environment a test also prints the result of its
// request, in the notation of a case.

#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <iterator>
#include <memory>
#include <set>
#include <string>
#include <utility>

#include "CaseFile.h"
#include "CaseRun.h"

namespace ZV::Test {

namespace {

class CaseTest : public ::testing::Test {
 public:
  CaseTest(std::shared_ptr<const CaseFile> file, const Case& one) : file_(std::move(file)), one_(one) {}

  void TestBody() override {
    try {
      if (std::getenv("ZORVA_CONFORMANCE_RECORD") != nullptr) std::cout << recordOf(*file_, one_);
      const std::string difference = differenceOf(*file_, one_);
      if (!difference.empty()) ADD_FAILURE() << one_.title.text << "\n" << difference;
    } catch (const CaseError& error) {
      ADD_FAILURE() << error.what();
    }
  }

 private:
  std::shared_ptr<const CaseFile> file_;
  const Case& one_;
};

// All cases of a file over a broker that returns wrong states.
class LyingStatesTest : public ::testing::Test {
 public:
  LyingStatesTest(std::shared_ptr<const CaseFile> file, CMPIValueState lie) : file_(std::move(file)), lie_(lie) {}

  void TestBody() override {
    for (const Case& one : file_->cases) {
      const std::string difference = differenceOf(*file_, one, lie_);
      EXPECT_TRUE(difference.empty()) << one.title.text << "\n" << difference;
    }
  }

 private:
  std::shared_ptr<const CaseFile> file_;
  CMPIValueState lie_;
};

struct Lie {
  const char* testName;
  CMPIValueState state;
};
constexpr Lie kLies[] = {{"HoldWhereGoodValuesAreMarkedNull", CMPI_nullValue},
                         {"HoldWhereGoodValuesAreMarkedAsKeys", CMPI_keyValue},
                         {"HoldWhereGoodValuesAreMarkedBad", CMPI_badValue}};

// A failing test for a file that cannot be read.
class UnreadableTest : public ::testing::Test {
 public:
  explicit UnreadableTest(std::string reason) : reason_(std::move(reason)) {}
  void TestBody() override { ADD_FAILURE() << reason_; }

 private:
  std::string reason_;
};

void addUnreadable(const std::string& suite, const std::string& reason) {
  ::testing::RegisterTest(suite.c_str(), "IsUnderstood", nullptr, nullptr, __FILE__, __LINE__,
                          [reason]() -> ::testing::Test* { return new UnreadableTest(reason); });
}

std::string contentOf(const std::filesystem::path& path) {
  std::ifstream in(path, std::ios::binary);
  return {std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>()};
}

// Whether a filter names one test only, of another suite. A run of one test then reads one file only.
bool isLeftOut(const std::string& suite) {
  const std::string filter = GTEST_FLAG_GET(filter);
  return filter.find_first_of("*?:-") == std::string::npos && filter.compare(0, suite.size() + 1, suite + ".") != 0;
}

void addCases(const std::filesystem::path& path, const Phrases& shared) {
  const std::string suite = path.stem().string() + "Cases";
  if (isLeftOut(suite)) return;
  try {
    const auto file = std::make_shared<const CaseFile>(readCases(contentOf(path), path.filename().string(), shared));
    for (const Case& one : file->cases) {
      ::testing::RegisterTest(suite.c_str(), one.testName().c_str(), nullptr, nullptr, path.c_str(), one.title.number,
                              [file, &one]() -> ::testing::Test* { return new CaseTest(file, one); });
    }
    for (const Lie& lie : kLies) {
      ::testing::RegisterTest(suite.c_str(), lie.testName, nullptr, nullptr, path.c_str(), 1,
                              [file, lie]() -> ::testing::Test* { return new LyingStatesTest(file, lie.state); });
    }
  } catch (const CaseError& error) {
    addUnreadable(suite, error.what());
  }
}

void addAllCases(const std::filesystem::path& folder) {
  Phrases shared;
  try {
    readPhrases(contentOf(folder / "shared.phrases"), "shared.phrases", shared);
  } catch (const CaseError& error) {
    addUnreadable("SharedPhrases", error.what());
    return;
  }
  std::set<std::filesystem::path> paths;
  for (const auto& entry : std::filesystem::directory_iterator(folder)) {
    if (entry.path().extension() == ".cases") paths.insert(entry.path());
  }
  for (const std::filesystem::path& path : paths) addCases(path, shared);
}

}  // namespace

}  // namespace ZV::Test

int main(int argc, char** argv) {
  ::testing::InitGoogleTest(&argc, argv);
  ZV::Test::addAllCases(std::filesystem::path(ZORVA_SOURCE_DIR) / "tests" / "conformance");
  return RUN_ALL_TESTS();
}
