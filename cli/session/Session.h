#pragma once

// One run of the program: the agent with its configuration, and the executor of the CIM operations, each set up at its
// first use. Belongs to one thread.

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
#include "cli/session/AsFailure.h"
#include "cli/session/Globals.h"
#include "frontend/SettingsClaims.h"

namespace zorva::cli {

class Session {
 public:
  /// Reads the agent's configuration, unless a server is used. Throws Failure (wrong usage) if the configuration is
  /// wrong, or if a log cannot be opened.
  explicit Session(const Globals& globals);
  Session(const Session&) = delete;
  Session& operator=(const Session&) = delete;
  ~Session();

  const Layout& layout() const noexcept { return layout_; }

  /// True if a server is used, and not the providers in this process. Then the host is only known through CIM, and
  /// tree() must not be called.
  bool isRemote() const noexcept { return server_.has_value(); }

  /// The address of the server; there must be one.
  const ServerUrl& server() const { return server_->url; }

  /// The current tree of the host. Throws Failure if it, or the file that replaces it, cannot be read.
  std::shared_ptr<const zorva::agent::TreeSnapshot> tree() const;

  /// True if a path with this host means the queried host; with a server, the server decides that.
  bool isThisHost(std::string_view name) const;

  /// Executes the CIM operations; a provider is loaded at its first use. Throws Failure if the tree of the host, or the
  /// file that replaces it, cannot be read: the providers would only return nothing.
  Operations& cim();

  /// Only the classes, for commands that use no provider.
  const std::shared_ptr<const schema::ClassRepository>& classes();

  /// The class of that name, in any case. If there is none, throws Failure (wrong usage) with similar names.
  const schema::Class& classNamed(std::string_view name);

  /// While it lives, the broker's warnings about libraries and the providers' log lines are not shown on standard
  /// error, unless a log level was requested. For commands that make many queries and report the failed ones
  /// themselves.
  class Quiet {
   public:
    explicit Quiet(Session& session);
    ~Quiet();
    Quiet(const Quiet&) = delete;
    Quiet& operator=(const Quiet&) = delete;

   private:
    Session& session_;
  };

  /// While it lives, no other program changes settings of this host: for commands that read, decide and then change. It
  /// takes no lock with a server or on a dry run. Such commands report failures themselves, so it is quiet, too. Throws
  /// Failure if the lock of the data directory cannot be taken.
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
  std::optional<Server> server_;
  int logLevel_;
  bool wantsLog_;
  int quiet_ = 0;  ///< number of living Quiet objects
  std::string providerDirectory_;
  std::string addedProviders_;
  broker::ProviderRegistry registry_ = broker::ProviderRegistry::builtIn();
  std::shared_ptr<const schema::ClassRepository> classes_;
  frontend::SettingsClaims claims_;
  std::unique_ptr<Operations> cim_;
};

/// What to do where a server denies a change to this client; empty for any other status, and without a server.
std::string nextStepIfDenied(const Session& session, const broker::Status& status);

/// The properties to include of each instance; empty means all. Throws Failure (wrong usage) if neither `top` nor one
/// of its subclasses (without `top`: no class at all) has a property of such a name.
broker::Selection selectionOf(Session& session, const std::vector<std::string>& properties, const schema::Class* top);

}  // namespace zorva::cli
