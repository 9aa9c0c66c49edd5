#pragma once

#include <functional>
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

/// Where a run's standard output goes. With ErrorTerminal standard error is a terminal, and standard output a pipe.
enum class OutputTo { Pipe, Terminal, FullDevice, ErrorTerminal };

/// A host that is a tree in a file, with a data directory of its own.
class TestHost {
 public:
  /// `interfaces` are JSON texts, each a Port node; see port().
  explicit TestHost(const std::vector<std::string>& interfaces = twoInterfaces());

  /// Puts this text in the place of the configuration. DIR in it stands for the host's directory.
  void configure(std::string toml) const;

  /// Runs zorvactl with these words.
  Outcome run(const std::vector<std::string>& words, OutputTo output = OutputTo::Pipe) const;
  Outcome runWith(const std::vector<std::pair<std::string, std::string>>& environment,
                  const std::vector<std::string>& words, OutputTo output = OutputTo::Pipe) const;

  /// Runs it as a user who owns nothing here, where the tests are run by root; else as who runs them, with the host's
  /// directories closed to them for writing. Exit code 127: that user cannot run the program.
  Outcome runAsNobody(const std::vector<std::string>& words) const;

  /// What becomes of a run that writes past the most that a file may hold.
  enum class AtLimit { WriteFails, IsKilled };

  /// Runs it so that no file can grow past that many bytes, as on a full disk.
  Outcome runLimited(std::size_t bytes, AtLimit atLimit, const std::vector<std::string>& words) const;

  /// Runs it where nothing was installed yet: /var/lib is empty, and what is written there is gone again afterwards.
  /// Exit code 127: no such place can be made here.
  Outcome runOnFreshMachine(const std::vector<std::string>& words) const;

  const zorva::agent::testing::TemporaryDirectory& directory() const { return directory_; }
  std::string dataFile(const std::string& name) const { return directory_ / "data/" + name; }
  void writeTree(const std::string& json) const;

  /// A port of that name with the usual properties, and these instead of them or besides: R"("domain_name": "x")".
  static std::string port(const std::string& name, const std::string& properties = {});
  static std::vector<std::string> twoInterfaces();
  /// "eth0", "eth1" and so on.
  static std::vector<std::string> manyInterfaces(int count);

 private:
  using Environment = std::vector<std::pair<std::string, std::string>>;
  Outcome runPrepared(const std::function<bool()>& prepare, const Environment& environment,
                      const std::vector<std::string>& words, OutputTo output) const;

  zorva::agent::testing::TemporaryDirectory directory_;
};

}  // namespace zorva::cli
