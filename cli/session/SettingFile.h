#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "agent/tree/TreeSnapshot.h"
#include "cli/session/Session.h"

// The file of an interface's settings, "ifcfg-NAME" in the agent's data directory: lines of KEY=VALUE. While it stands,
// it is where the providers read the settings, whatever the host says; the providers change values in it but add no
// keys.

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
  /// The file of that interface, whether it stands or not. Throws Failure (wrong usage) for a name that no file can
  /// have.
  explicit SettingFile(const std::string& interface);

  const std::string& path() const noexcept { return path_; }

  /// What follows the first "=" of each line that has one and is no comment, in order. Throws Failure where the file
  /// cannot be read, is no regular file (so nothing blocks), or is larger than 16 MiB.
  std::vector<SettingLine> read() const;

  /// Puts a file of these lines in place, whole or not at all. Throws Failure where it cannot, where a line would not
  /// be one, or, without `replaces`, where the file stands already.
  void write(const std::vector<SettingLine>& lines, bool replaces) const;

 private:
  std::string contents() const;

  std::string path_;
};

/// The six keys with what the host says at present of the interface.
std::vector<SettingLine> settingsOfHost(const zorva::agent::Node& interface);

/// The configuration of the interface of that name. Throws Failure that lists the names there are.
const zorva::agent::Node& interfaceNode(const zorva::agent::TreeSnapshot& tree, const std::string& interface);

}  // namespace zorva::cli
