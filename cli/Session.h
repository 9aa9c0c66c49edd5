#pragma once

#include <functional>
#include <memory>
#include <stdexcept>
#include <string>
#include <string_view>

#include "agent/config/Config.h"
#include "agent/tree/TreeSnapshot.h"
#include "broker/Broker.h"
#include "cli/Arguments.h"
#include "cli/Failure.h"
#include "cli/Table.h"
#include "cli/Text.h"

// One run of the program: the agent with its configuration, and the broker with the providers, each set up when a
// command first needs it. Belongs to one thread.

namespace zorva::cli {

class Session {
 public:
  /// Reads the agent's configuration. Throws Failure (wrong usage) where that is wrong, or where a log cannot be
  /// opened.
  explicit Session(const Arguments& arguments);
  Session(const Session&) = delete;
  Session& operator=(const Session&) = delete;
  ~Session();

  const Layout& layout() const noexcept { return layout_; }

  /// The tree of the host as it is now. Throws Failure where it, or the file that stands for it, cannot be read.
  std::shared_ptr<const zorvagent::TreeSnapshot> tree() const;

  /// The broker; the providers are loaded when they are first asked. Throws Failure where the tree of the host, or the
  /// file that stands for it, cannot be read: the providers would only say that there is nothing.
  broker::Broker& broker();

  /// The classes alone, for commands that ask nothing of a provider.
  const std::shared_ptr<const schema::ClassRepository>& classes();

  /// The class of that name, in any case. Throws Failure (wrong usage) with names that are like it where there is none.
  const schema::Class& classNamed(std::string_view name);

  /// While it lives, what the broker tells of libraries that cannot be loaded is not shown: the command shows it
  /// itself.
  class Quiet {
   public:
    explicit Quiet(Session& session) : session_(session) { ++session_.quiet_; }
    ~Quiet() { --session_.quiet_; }
    Quiet(const Quiet&) = delete;
    Quiet& operator=(const Quiet&) = delete;

   private:
    Session& session_;
  };

 private:
  void log(broker::LogLevel level, std::string_view text) const;

  Layout layout_;
  int logLevel_;
  int quiet_ = 0;
  std::string providerDirectory_;
  std::shared_ptr<const schema::ClassRepository> classes_;
  std::unique_ptr<broker::Broker> broker_;
};

/// Does the work with what the agent throws turned into Failure: wrong files are the user's to mend, all else is a
/// failure.
template <class Work>
auto asFailure(Work work) {
  try {
    return work();
  } catch (const zorvagent::ConfigError& error) {
    throw Failure(ExitCode::WrongUsage, error.what());
  } catch (const Failure&) {
    throw;
  } catch (const std::runtime_error& error) {
    throw Failure(ExitCode::Failed, printable(error.what()));
  }
}

/// What of each instance the arguments want.
broker::Selection selectionOf(const Arguments& arguments);

/// The lines of an error on stderr: what, and what to do next.
void tellError(std::string_view what, std::string_view hint = {});

/// A line that tells what a person should know although the command was done.
void tellWarning(std::string_view what);

/// A line of the same kind that is no warning.
void tellNote(std::string_view what);

/// Writes to standard output. Throws Failure where that cannot be written.
void write(std::string_view text);

/// Writes what is still held back. Throws Failure as write does.
void flushOutput();

}  // namespace zorva::cli
