#pragma once

// The file of an interface's settings, "ifcfg-NAME" in the agent's data directory: lines of KEY=VALUE. While it exists,
// the providers read the settings from it and not from the host. The providers change values in it but add no keys.

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "agent/tree/TreeSnapshot.h"
#include "cli/session/Session.h"

namespace zorva::cli {

/// The keys that the providers know, in the order in which a new file has them.
inline constexpr const char* kSettingKeys[] = {"BOOTPROTO",   "HOSTNAME",   "DOMAINNAME",
                                               "CONFIG_NAME", "DNSSERVERS", "DNSSUFFIXES"};

struct SettingLine {
  std::string key;
  std::string value;
};

class SettingFile {
 public:
  /// The file of that interface, existing or not. Throws Failure (wrong usage) for a name that no file can have.
  explicit SettingFile(const std::string& interface);

  const std::string& path() const noexcept { return path_; }

  /// The text after the first "=" of each line that has one and is no comment, in order. Throws Failure if the file
  /// cannot be read, is no regular file (so nothing blocks), or is larger than 16 MiB.
  std::vector<SettingLine> read() const;

  /// Writes a file of these lines, completely or not at all. Throws Failure if it cannot, if a line would not be one,
  /// or, without `replaces`, if the file exists already.
  void write(const std::vector<SettingLine>& lines, bool replaces) const;

  /// Whether there is anything of that name.
  bool exists() const;

  /// Throws Failure if there is no such file, or it cannot be removed.
  void remove() const;

  /// Makes it the file of another interface. Throws Failure if that one has a file, or it cannot be done.
  void moveTo(const SettingFile& other) const;

 private:
  std::string contents() const;
  void syncFolder() const;

  std::string path_;
};

/// The six keys with the host's current values for the interface.
std::vector<SettingLine> settingsOfHost(const zorva::agent::Node& interface);

/// The configuration of the interface of that name. Throws Failure that lists the existing names.
const zorva::agent::Node& interfaceNode(const zorva::agent::TreeSnapshot& tree, const std::string& interface);

}  // namespace zorva::cli
