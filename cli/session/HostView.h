#pragma once

// The first view for a person: the DNS client configuration of the host, read from the providers, and where it comes
// from (Origins.h).

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "cli/output/Progress.h"
#include "cli/session/HostRows.h"
#include "cli/session/Problems.h"
#include "cli/session/Session.h"
#include "frontend/SettingsClaims.h"

namespace zorva::cli {

using frontend::kEndpointClass;
using frontend::kGeneralSettingClass;
using frontend::kSettingClass;
inline constexpr const char* kSystemClass = "ZORVA_ComputerSystem";

struct HostView {
  std::string systemName;
  std::vector<InterfaceRow> interfaces;  ///< in the order of their names
  HostRow host;
  std::optional<BmcReading> bmc;  ///< nothing where zorva-bmc read none
  bool hasSources = true;         ///< false: a server does not tell the owners and the settings' sources
  std::vector<Problem> problems;  ///< the failed queries; their parts of the view are empty

  bool couldAsk(std::string_view className) const;
};

/// Queries the providers, each class once. A part that cannot be read is left empty and reported in `problems`.
HostView readHostView(Session& session, Progress& progress);

/// Leaves only the interfaces of these names. Throws Failure if there is none of such a name.
void keepOnly(HostView& view, const std::vector<std::string>& names);

/// The instances of a class. Throws Failure if they cannot be read.
std::vector<broker::Instance> instancesOf(Session& session, std::string_view className);

/// The interface of an instance of ZORVA_DNSSettingData: the text after the "%" of its InstanceID.
std::string interfaceOfSetting(const broker::Instance& setting);

/// The interface whose file has the settings of the host as a whole: that of the first configuration outside a service
/// processor. Nothing if there is none, and with a server: there Origins.h has it.
std::optional<std::string> interfaceOfHostSettings(const Session& session);

}  // namespace zorva::cli
