#pragma once

// The first view for a person: the DNS client configuration of the host, read from the providers.

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "cli/output/Progress.h"
#include "cli/session/ClassRows.h"
#include "cli/session/Session.h"
#include "frontend/SettingsClaims.h"

namespace zorva::cli {

using frontend::kEndpointClass;
using frontend::kGeneralSettingClass;
using frontend::kSettingClass;
inline constexpr const char* kServerClass = "ZORVA_RemoteServiceAccessPoint";
inline constexpr const char* kSystemClass = "ZORVA_ComputerSystem";

/// The source of a setting's value: the interface's file, the host, a value that was set and replaces the host's own,
/// or none.
enum class SettingSource { File, Host, Set, None };

const char* sourceName(SettingSource source) noexcept;

struct EndpointRow {
  std::string name;
  std::string system;
  std::optional<std::uint64_t> stateNumber;
  std::string state;  ///< "Enabled"
  std::string hostName;
  std::string domainName;
  std::vector<std::string> suffixes;
};

struct ServerRow {
  std::uint64_t order = 0;
  std::string address;
};

struct SettingRow {
  std::string interface;  ///< the interface whose file and host settings count
  std::string setting;    ///< the property's name
  bool isList = false;
  std::vector<std::string> values;
  SettingSource source = SettingSource::None;
};

struct HostView {
  std::string systemName;
  std::vector<EndpointRow> endpoints;  ///< in the order of their names
  std::vector<ServerRow> servers;      ///< in search order
  std::vector<SettingRow> interfaceSettings;
  std::vector<SettingRow> hostSettings;
  std::vector<ClassRow> classes;
  bool hasSources = true;         ///< false: the settings' sources are not known, for example with a server
  std::vector<Problem> problems;  ///< the failed queries; their parts of the view are empty

  bool couldAsk(std::string_view className) const;
};

/// Queries the providers. A part that cannot be read is left empty and reported in `problems`. Endpoints and settings
/// are in the order of their names.
HostView readHostView(Session& session, Progress& progress, bool countsAll);

/// The instances of a class. Throws Failure if they cannot be read.
std::vector<broker::Instance> instancesOf(Session& session, std::string_view className);

/// The interface of an instance of ZORVA_DNSSettingData: the text after the "%" of its InstanceID.
std::string interfaceOfSetting(const broker::Instance& setting);

/// The interface whose file has the settings of the host as a whole: that of the first configuration outside a service
/// processor. Nothing if there is none, and with a server, which does not say.
std::optional<std::string> interfaceOfHostSettings(const Session& session);

}  // namespace zorva::cli
