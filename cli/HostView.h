#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "cli/Session.h"

// What a person reads first: the DNS client configuration of the host in one view, asked of the providers.

namespace zorva::cli {

inline constexpr const char* kEndpointClass = "ZORVA_DNSProtocolEndPoint";
inline constexpr const char* kServerClass = "ZORVA_RemoteServiceAccessPoint";
inline constexpr const char* kSettingClass = "ZORVA_DNSSettingData";
inline constexpr const char* kGeneralSettingClass = "ZORVA_DNSGeneralSettingData";

/// Where the value of a setting comes from: the interface's file, the host, or nowhere.
enum class SettingSource { File, Host, None };

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
  std::string interface;  ///< whose file and host settings count
  std::string setting;    ///< the property's name
  bool isList = false;
  std::vector<std::string> values;
  SettingSource source = SettingSource::None;
};

struct ClassRow {
  std::string name;
  std::string provider;  ///< the prefix of its create functions
  std::string library;
  std::optional<std::uint64_t> count;  ///< absent: the provider cannot be asked
  std::string problem;                 ///< then: why
};

struct HostView {
  std::string systemName;
  std::vector<EndpointRow> endpoints;  ///< in the order of their names
  std::vector<ServerRow> servers;      ///< in search order
  std::vector<SettingRow> interfaceSettings;
  std::vector<SettingRow> hostSettings;
  std::vector<ClassRow> classes;
  std::vector<std::string> problems;  ///< what could not be asked; its part of the view is empty
};

/// Asks the providers. What one of them does not answer is left empty and told in `problems`.
HostView readHostView(Session& session);

/// The classes that the registry knows, with their instances counted.
std::vector<ClassRow> readClassRows(Session& session);

/// The instances of a class. Throws Failure where they cannot be had.
std::vector<broker::Instance> instancesOf(Session& session, std::string_view className);

/// The interface whose settings an instance of ZORVA_DNSSettingData tells: what stands behind the "%" of its
/// InstanceID.
std::string interfaceOfSetting(const broker::Instance& setting);

/// The interface whose file holds the settings of the host as a whole: that of the first configuration outside a
/// service processor. Nothing where there is none.
std::optional<std::string> interfaceOfHostSettings(const Session& session);

}  // namespace zorva::cli
