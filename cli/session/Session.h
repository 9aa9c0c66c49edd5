#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "agent/config/Config.h"
#include "agent/tree/TreeSnapshot.h"
#include "cli/operations/Operations.h"
#include "cli/output/Failure.h"
#include "cli/output/Table.h"
#include "cli/output/Text.h"
#include "cli/session/Globals.h"
#include "frontend/SettingsClaims.h"

// One run of the program: the agent with its configuration, and who does the CIM operations, each set up when a command
// first needs it. Belongs to one thread.

namespace zorva::cli {

class Session {
 public:
  /// Reads the agent's configuration, unless a server is to be asked. Throws Failure (wrong usage) where that is wrong,
  /// or where a log cannot be opened.
  explicit Session(const Globals& globals);
  Session(const Session&) = delete;
  Session& operator=(const Session&) = delete;
  ~Session();

  const Layout& layout() const noexcept { return layout_; }

  /// True where a server is asked, and not the providers in this process: then nothing is known of the host but what
  /// CIM says, and tree() must not be called.
  bool isRemote() const noexcept { return !url_.empty(); }

  /// The server's URL as it was given.
  const std::string& url() const noexcept { return url_; }

  /// The tree of the host as it is now. Throws Failure where it, or the file that stands for it, cannot be read.
  std::shared_ptr<const zorva::agent::TreeSnapshot> tree() const;

  /// True where a path with this host in it means the host that is asked; a server judges of that itself.
  bool isThisHost(std::string_view name) const;

  /// Who does the CIM operations; providers are loaded when they are first asked. Throws Failure where the tree of the
  /// host, or the file that stands for it, cannot be read: the providers would only say that there is nothing.
  Operations& cim();

  /// The classes alone, for commands that ask nothing of a provider.
  const std::shared_ptr<const schema::ClassRepository>& classes();

  /// The class of that name, in any case. Throws Failure (wrong usage) with names that are like it where there is none.
  const schema::Class& classNamed(std::string_view name);

  /// While it lives, neither what the broker tells of libraries that cannot be loaded is shown, nor what the providers
  /// log on standard error, unless a log level was asked for: for commands that ask many things and say themselves what
  /// they did not get.
  class Quiet {
   public:
    explicit Quiet(Session& session);
    ~Quiet();
    Quiet(const Quiet&) = delete;
    Quiet& operator=(const Quiet&) = delete;

   private:
    Session& session_;
  };

  /// While it lives, nobody else changes settings of this host: for commands that read, decide and then change. It has
  /// no lock where a server is asked or on a dry run. Such commands say themselves what failed: it is quiet, too.
  /// Throws Failure where the lock of the data directory cannot be had.
  class Changing {
   public:
    explicit Changing(Session& session, bool isDryRun = false);

   private:
    const Quiet quiet_;
    std::optional<frontend::SettingsClaims::Hold> hold_;
  };

 private:
  void log(broker::LogLevel level, std::string_view text) const;
  bool isQuiet() const noexcept { return quiet_ > 0 && !wantsLog_; }
  void placeLogSink() const;

  Layout layout_;
  std::string url_;
  int logLevel_;
  bool wantsLog_;
  int quiet_ = 0;  // how many Quiet live
  std::string providerDirectory_;
  std::shared_ptr<const schema::ClassRepository> classes_;
  frontend::SettingsClaims claims_;
  std::unique_ptr<Operations> cim_;
};

/// Throws Failure (wrong usage) where a server is to be asked: `subcommand` reads or writes files of this host.
void requireLocal(const Globals& globals, const char* subcommand);

/// Does the work with what the agent throws turned into Failure: wrong files are the user's to mend, all else is a
/// failure.
template <class Work>
auto asFailure(Work work) {
  try {
    return work();
  } catch (const zorva::agent::ConfigError& error) {
    throw Failure(ExitCode::WrongUsage, error.what());
  } catch (const Failure&) {
    throw;
  } catch (const std::runtime_error& error) {
    throw Failure(ExitCode::Failed, printable(error.what()));
  }
}

/// Of each instance only these properties; all of them where none is named. Throws Failure (wrong usage) where neither
/// `top` nor a class below it, or, without one, no class at all, has a property of such a name.
broker::Selection selectionOf(Session& session, const std::vector<std::string>& properties, const schema::Class* top);

}  // namespace zorva::cli
