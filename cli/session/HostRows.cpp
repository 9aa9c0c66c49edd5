#include "cli/session/HostRows.h"

#include "agent/files/SettingFiles.h"

namespace zorva::cli {

const char* sourceName(SettingSource source) noexcept {
  switch (source) {
    case SettingSource::File:
      return "file";
    case SettingSource::Host:
      return "host";
    case SettingSource::Set:
      return "set";
    case SettingSource::None:
      break;
  }
  return "-";
}

std::string BmcReading::text() const {
  constexpr std::uint64_t kMinute = 60;
  constexpr std::uint64_t kHour = 60 * kMinute;
  constexpr std::uint64_t kDay = 24 * kHour;
  std::string text;
  if (age < 2 * kMinute) {
    text = std::to_string(age) + " s ago";
  } else if (age < 2 * kHour) {
    text = std::to_string(age / kMinute) + " min ago";
  } else {
    text = age < 2 * kDay ? std::to_string(age / kHour) + " h ago" : std::to_string(age / kDay) + " days ago";
  }
  return text + (isUnknown ? "; what it has now is not known" : "");
}

bool InterfaceRow::hasDns() const {
  return !servers.empty() || !suffixes.empty() || !facts.routingDomains.empty() || source == SettingSource::File ||
         source == SettingSource::Set;
}

std::string InterfaceRow::from() const {
  if (source == SettingSource::File) return zorva::agent::settingFileName(name);
  if (source == SettingSource::Set) return "overlay.json";
  if (source == SettingSource::None && facts.owner.empty()) return {};
  if (facts.owner.empty()) return sourceName(SettingSource::Host);
  if (facts.profile.empty()) return facts.owner;
  // A file is named without its folder, a profile as what it is.
  const std::size_t slash = facts.profile.rfind('/');
  const bool isPath = facts.profile.starts_with('/');
  return facts.owner + ", " + (isPath ? facts.profile.substr(slash + 1) : "profile " + facts.profile);
}

std::string placeOfHostSettings(const std::string& interface, bool hasFile) {
  if (interface.empty()) return {};
  const std::string file = zorva::agent::settingFileName(interface);
  constexpr const char* kWhy = "the settings of the host are in the file of the first interface";
  if (hasFile) return "kept in " + file + ": " + kWhy;
  return std::string("from the host; ") + file + ", which does not exist, would replace them: " + kWhy;
}

std::string HostRow::place() const { return placeOfHostSettings(interface, hasFile); }

}  // namespace zorva::cli
