#pragma once

// For tests: hosts made of files, and zorvactl run on them as a person runs it.

#include <functional>
#include <string>
#include <utility>
#include <vector>

#include "agent/testing/TemporaryDirectory.h"

namespace zorva::cli {

/// The end of a run of the program.
struct Outcome {
  int exitCode = -1;  ///< 128 and the number if a signal ended it
  std::string out;
  std::string err;
};

/// The target of a run's standard output. With ErrorTerminal standard error is a terminal, and standard output a pipe.
enum class OutputTo { Pipe, Terminal, FullDevice, ErrorTerminal };

/// A host that is a tree in a file, with its own data directory.
class TestHost {
 public:
  /// `interfaces` are JSON texts, each a Port node; see port().
  explicit TestHost(const std::vector<std::string>& interfaces = twoInterfaces());

  /// Replaces the configuration by this text. DIR in it means the host's directory.
  void configure(std::string toml) const;

  /// Runs zorvactl with these words.
  Outcome run(const std::vector<std::string>& words, OutputTo output = OutputTo::Pipe) const;
  Outcome runWith(const std::vector<std::pair<std::string, std::string>>& environment,
                  const std::vector<std::string>& words, OutputTo output = OutputTo::Pipe) const;

  /// Runs it with this standard input, of a few kilobytes at most.
  Outcome runWithInput(const std::string& input, const std::vector<std::string>& words) const;

  /// If root runs the tests, runs it as a user who owns nothing here; else as the same user, with the host's
  /// directories closed to writing. The data directory has these rights. Exit code 127: that user cannot run the
  /// program.
  Outcome runUnprivileged(const std::vector<std::string>& words, unsigned mode = 0755) const;

  /// Runs it at a terminal of its own, where a person types the answers when the questions are shown. `out` is what the
  /// terminal shows.
  Outcome runAtTerminal(const std::vector<std::string>& words, const std::vector<std::string>& questions,
                        const std::vector<std::string>& answers) const;

  /// The effect of writing more than a file may hold.
  enum class AtLimit { WriteFails, IsKilled };

  /// Runs it with a limit on the size of files, as on a full disk.
  Outcome runLimited(std::size_t bytes, AtLimit atLimit, const std::vector<std::string>& words) const;

  /// Runs it as before an installation: /var/lib is empty, and its new contents are removed afterwards. Exit code 127:
  /// no such place can be made here.
  Outcome runOnFreshMachine(const std::vector<std::string>& words) const;

  const zorva::agent::testing::TemporaryDirectory& directory() const { return directory_; }
  std::string dataFile(const std::string& name) const { return directory_ / "data/" + name; }
  void writeTree(const std::string& json) const;

  /// A port of that name with the usual properties, and these, which replace or extend them: R"("domain_name": "x")".
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
