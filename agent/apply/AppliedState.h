#pragma once

// What the owners of DNS settings had before something was applied.

#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "agent/apply/DnsWriter.h"

namespace zorva::agent {

/// The DNS settings of an interface as the tree shows them.
struct ShownDns {
  DnsSettings lists;
  std::string domain;
  bool operator==(const ShownDns&) const = default;
};

/// What one owner had for an interface.
struct SavedDns {
  std::string interface;
  std::string owner;
  std::string profile;
  std::string saved;  ///< for DnsWriter::restore
  ShownDns shown;
};

/// What is needed to take changes back.
struct AppliedMemory {
  std::vector<SavedDns> first;  ///< before the first change, once for each interface, owner and profile
  /// By interface: the domain that was put before its suffixes, which nobody asked for as a suffix.
  std::map<std::string, std::string> addedDomains;

  const SavedDns* find(const std::string& interface, const std::string& owner, const std::string& profile) const;
};

/// Changes that are taken back unless somebody confirms them.
struct AppliedTrial {
  std::uint64_t until = 0;      ///< seconds since 1970
  std::vector<SavedDns> saved;  ///< before the trial
  AppliedMemory before;         ///< the memory before the trial
};

struct AppliedState {
  AppliedMemory memory;
  std::optional<AppliedTrial> trial;
  /// By interface: the wanted settings, as textOf() has them, that were taken back. They are not applied automatically.
  std::map<std::string, std::string> heldBack;
};

/// The directory of a data directory, "applied/", that only those who apply may write to: the data directory itself may
/// belong to the user of a server. It is made if it is missing. Throws std::runtime_error, with one line, if it cannot
/// be made, is a link, or others may write to it.
std::string appliedDirectory(const std::string& dataDir);

/// The file "applied/state.json" of a data directory. A reader sees the old file or the new one.
class AppliedStateFile {
 public:
  /// The directory ends in a slash.
  explicit AppliedStateFile(std::string dataDir) : dataDir_(std::move(dataDir)) {}

  /// Nothing where there is no file. Throws ConfigError where it is wrong. What root restores from it is the host's, so
  /// it must belong to root or to the user of this process, and nobody else may write to it.
  AppliedState read() const;

  /// Throws std::runtime_error, with one line; the old file is then unchanged.
  void write(const AppliedState& state) const;

 private:
  std::string dataDir_;
};

}  // namespace zorva::agent
