#pragma once

#include <string>
#include <utility>
#include <vector>

#include "agent/testing/TemporaryDirectory.h"

// For tests: hosts that are made of files, and zorvactl run on them as a person runs it.

namespace zorva::cli {

/// How a run of the program ended.
struct Outcome {
  int exitCode = -1;  ///< 128 and the number where a signal ended it
  std::string out;
  std::string err;
};

/// Where a run's standard output goes.
enum class OutputTo { Pipe, Terminal, FullDevice };

/// A host that is a tree in a file, with a data directory of its own.
class TestHost {
 public:
  /// `interfaces` are JSON texts, each a Port node; see port().
  explicit TestHost(const std::vector<std::string>& interfaces = twoInterfaces());

  /// One whose configuration is this text. DIR in it stands for the directory.
  struct Configuration {
    explicit Configuration(std::string text) : toml(std::move(text)) {}
    std::string toml;
  };
  explicit TestHost(const Configuration& configuration);

  /// Runs zorvactl with these words.
  Outcome run(const std::vector<std::string>& words, OutputTo output = OutputTo::Pipe) const;
  Outcome runWith(const std::vector<std::pair<std::string, std::string>>& environment,
                  const std::vector<std::string>& words, OutputTo output = OutputTo::Pipe) const;

  const zorvagent::testing::TemporaryDirectory& directory() const { return directory_; }
  std::string dataFile(const std::string& name) const { return directory_ / "data/" + name; }
  void writeTree(const std::string& json) const;

  /// A port of that name with the usual properties, and these instead of them or besides: R"("domain_name": "x")".
  static std::string port(const std::string& name, const std::string& properties = {});
  static std::vector<std::string> twoInterfaces();

 private:
  zorvagent::testing::TemporaryDirectory directory_;
};

}  // namespace zorva::cli
