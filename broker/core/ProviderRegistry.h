#pragma once

#include <string>
#include <string_view>
#include <vector>

// Which provider serves which class. A registry is filled by one thread, then only read.

namespace zorva::broker {

/// The kinds of management instrumentation (CMPI 2.0) that a provider offers for its class: one bit each.
enum MiKind : unsigned {
  InstanceMi = 1,
  AssociationMi = 2,
  MethodMi = 4,
};

/// One class and who serves it.
struct ProviderEntry {
  std::string className;
  std::string prefix;  ///< the create functions are <prefix>_Create_InstanceMI, _AssociationMI, _MethodMI
  /// "x" stands for libx.so.1, or else libx.so, in the provider directory; or a path with "/"; or empty: the program
  std::string library;
  unsigned kinds = 0;  ///< MiKind bits
  std::string nameSpace = "root/cimv2";
  /// The properties that the provider leaves as they are where a modification lacks them. All others may be lost then,
  /// so it is handed their current values.
  std::vector<std::string> keeps = {};
};

class ProviderRegistry {
 public:
  /// The twelve classes of the DNS client profile and the four companions.
  static ProviderRegistry builtIn();

  /// The directory with the libraries of builtIn(): beside the running program, as built or as installed. Empty where
  /// they are not there, which leaves it to the dynamic loader.
  static std::string builtInDirectory();

  /// Adds an entry; one for a class and namespace that is there already takes its place.
  void add(ProviderEntry entry);

  /// The entry of a class, name and namespace in any case; null where nobody serves it.
  const ProviderEntry* find(std::string_view nameSpace, std::string_view className) const noexcept;

  /// A namespace in the registry's spelling, found without regard to case and to slashes at either end. Empty where the
  /// registry knows no such namespace.
  std::string_view nameSpace(std::string_view spelling) const noexcept;

  /// The namespace that an omitted one stands for: that of the first entry, or "root/cimv2".
  std::string_view defaultNameSpace() const noexcept;

  /// Makes a namespace known although no entry has it.
  void addNameSpace(std::string nameSpace);

  /// In the order in which they were added.
  const std::vector<ProviderEntry>& entries() const noexcept { return entries_; }
  const std::vector<std::string>& nameSpaces() const noexcept { return nameSpaces_; }

 private:
  std::vector<ProviderEntry> entries_;
  std::vector<std::string> nameSpaces_;
};

}  // namespace zorva::broker
