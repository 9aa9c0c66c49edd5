#pragma once

// The DNS settings that the data directory has for an interface.

#include <optional>
#include <string>

#include "agent/apply/DnsWriter.h"
#include "agent/tree/Overlay.h"
#include "util/Expected.h"

namespace zorva::agent {

/// What is not there stays as the host has it.
struct WantedSettings {
  std::optional<StringList> servers;
  std::optional<StringList> suffixes;
  std::optional<std::string> domain;

  bool any() const { return servers.has_value() || suffixes.has_value() || domain.has_value(); }
};

/// The settings as a text that is equal for equal settings.
std::string textOf(const WantedSettings& wanted);

inline constexpr std::size_t kMostApplied = 64;  ///< servers, and suffixes

/// The path of an interface's file of settings.
std::string settingsFileOf(const std::string& dataDir, const std::string& interface);

/// Each value is that of the interface's file if it has the key, else that of the overlay for the node at that path.
/// Without a name of an interface no file counts. The error is one line.
Expected<WantedSettings, std::string> readWanted(const std::string& dataDir, const std::string& interface,
                                                 const OverlayValues& overlay, const std::string& path);

/// The same settings, each once and in the form in which every owner takes them: link-local addresses have the
/// interface as their zone, names have no final dot. The error is one line that names each property with a value that
/// is no unicast address or no DNS name, or with too many values.
Expected<WantedSettings, std::string> checked(const WantedSettings& wanted, const std::string& interface);

/// The search list of an owner who shows its first name as the domain. ownDomain is the domain that the interface has
/// where the owner names none.
StringList searchListOf(const StringList& suffixes, const std::string& domain, const std::string& ownDomain);

}  // namespace zorva::agent
