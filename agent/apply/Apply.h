#pragma once

// Brings the settings of the data directory to the host, through the owner of each interface's DNS settings, and back.

#include <chrono>
#include <optional>
#include <string>
#include <vector>

#include "agent/interface/AgentApi.h"

namespace zorva::agent {

/// One property of an interface. Texts are lists of one.
struct PropertyChange {
  std::string property;  ///< as in the JSON tree: "dns_server_addresses", "dns_suffixes", "domain_name"
  std::vector<std::string> before;
  std::vector<std::string> after;
};

/// What became of one interface.
struct ApplyResult {
  std::string interface;
  std::string owner;                    ///< as the tree names it; empty where nobody owns it
  std::string profile;                  ///< the owner's profile or file
  std::vector<PropertyChange> changes;  ///< made, or on a dry run to be made; empty: the host has the settings already
  std::string problem;  ///< why it was not applied, one line with the owner and the next step; else empty
  std::string note;     ///< e.g. that it is gone when the host restarts
};

struct ApplyOptions {
  bool dryRun = false;
  /// As the service does that runs after each change of the data directory: settings that were taken back, by
  /// revertSettings() or the end of a trial, are left alone until they are changed or applied otherwise.
  bool automatic = false;
  /// On trial: unless confirmTrial() is called in that time, endTrial() takes it back.
  std::optional<std::chrono::seconds> trial;
};

/// All functions here: the caller holds the SettingsLock of the data directory (for reading at least). One process at a
/// time applies; another one waits, 30 s at most. The state before the first change, and that before a trial, is in
/// "applied/state.json" before the owner is touched. Thread-safe. Throw ConfigError for a wrong configuration or state
/// file, std::runtime_error, with one line, if the state cannot be read or written (then nothing was changed).

/// For these interfaces, or for all that have a file of settings or values in the overlay if none are named. One result
/// each, in tree order; unknown names first, with a problem.
ZORVA_AGENT_API std::vector<ApplyResult> applySettings(const std::vector<std::string>& interfaces,
                                                       const ApplyOptions& options = {});

/// Back to what the owner had before the first change; with no names for all that were ever changed. The files of
/// settings and the overlay are left alone.
ZORVA_AGENT_API std::vector<ApplyResult> revertSettings(const std::vector<std::string>& interfaces,
                                                        const ApplyOptions& options = {});

/// The trial that has not been confirmed: when it ends (system clock). Nothing if there is none.
ZORVA_AGENT_API std::optional<std::chrono::system_clock::time_point> pendingTrial();
ZORVA_AGENT_API void confirmTrial();
/// Takes the trial back: what the interfaces had before it. No results where there is none.
ZORVA_AGENT_API std::vector<ApplyResult> endTrial();

}  // namespace zorva::agent
