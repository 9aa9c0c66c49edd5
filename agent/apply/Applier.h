#pragma once

// Applies the settings of a data directory to the host, and takes them back.

#include <functional>
#include <string>
#include <vector>

#include "agent/apply/AppliedState.h"
#include "agent/apply/Apply.h"
#include "agent/apply/HostDns.h"
#include "agent/apply/WantedSettings.h"
#include "agent/tree/Overlay.h"

namespace zorva::agent {

/// One call of the functions in Apply.h. Belongs to one thread.
class Applier {
 public:
  /// bmcFile is what zorva-bmc keeps.
  Applier(const std::string& dataDir, HostDns::Look look, OverlayValues overlay, const std::string& bmcFile);

  std::vector<ApplyResult> apply(const std::vector<std::string>& names, const ApplyOptions& options);
  std::vector<ApplyResult> revert(const std::vector<std::string>& names, const ApplyOptions& options);
  std::vector<ApplyResult> endTrial();

 private:
  /// What is to be done for one interface.
  struct Plan {
    HostInterface interface;
    ApplyResult result;
    bool hasSettings = false;  ///< in the data directory, and not held back
    DnsTarget target;
    DnsSettings settings;  ///< to be written
    ShownDns before;
    ShownDns after;           ///< as the owner will show it
    std::string addedDomain;  ///< see AppliedMemory
    std::string saved;        ///< by the writer, before the change

    bool mustWrite() const { return result.problem.empty() && !result.changes.empty(); }
    SavedDns savedDns() const { return {interface.name, result.owner, result.profile, saved, before}; }
  };

  std::vector<HostInterface> choose(const std::vector<std::string>& names,
                                    const std::function<bool(const HostInterface&)>& isMeant) const;
  Expected<WantedSettings, std::string> wantedOf(const HostInterface& interface) const;
  Plan planFor(const HostInterface& interface, bool automatic);
  void holdBack(const std::string& interface);
  void planOwner(Plan& plan);
  void planSettings(Plan& plan, const WantedSettings& wanted);
  void planSuffixes(Plan& plan, const WantedSettings& wanted, const std::string& ownDomain) const;
  void refuseSharedStores(std::vector<Plan>& plans) const;
  void execute(Plan& plan);
  bool putBack(Plan& plan);
  bool isAsBefore(Plan& plan);
  void remember(const Plan& plan);
  std::string notTaken(const Plan& plan);

  std::vector<SavedDns> entriesOf(const std::string& interface) const;
  ApplyResult revertOne(const HostInterface& interface, bool dryRun);
  ApplyResult restore(const SavedDns& saved, bool dryRun);
  std::string otherOwnerThan(const SavedDns& saved, const HostInterface& interface);
  void restoreElsewhere(ApplyResult& result, const SavedDns& saved, const DnsTarget& target,
                        const std::string& otherOwner);
  void forget(const SavedDns& saved);
  SavedDns saveNow(const SavedDns& entry);

  void readState(bool mayChange);
  void beginTrial(std::vector<SavedDns> saved, std::chrono::seconds length);
  std::vector<ApplyResult> takeBackTrial();

  std::string dataDir_;
  AppliedStateFile file_;
  OverlayValues overlay_;
  AppliedState state_;
  HostDns host_;
};

/// The trial of that data directory that has not been confirmed; and its confirmation.
std::optional<std::chrono::system_clock::time_point> pendingTrialIn(const std::string& dataDir);
void confirmTrialIn(const std::string& dataDir);

}  // namespace zorva::agent
