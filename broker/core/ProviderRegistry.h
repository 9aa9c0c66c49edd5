#pragma once

// Which provider serves which class. A registry is filled by one thread, then only read.

#include <string>
#include <string_view>
#include <vector>

namespace zorva::broker {

/// The kinds of management instrumentation (CMPI 2.0) that a provider offers for its class: one bit each.
enum MiKind : unsigned {
  InstanceMi = 1,
  AssociationMi = 2,
  MethodMi = 4,
};

/// One class and the provider that serves it.
struct ProviderEntry {
  std::string className;
  std::string prefix;  ///< the create functions are <prefix>_Create_InstanceMI, _AssociationMI, _MethodMI
  /// "x" means libx.so.1, or else libx.so, in the provider directory; a text with "/" is a path; empty: the program
  std::string library;
  unsigned kinds = 0;  ///< MiKind bits
  std::string nameSpace = "root/cimv2";
  /// The properties that the provider leaves unchanged if a modification lacks them. All other properties could be lost
  /// then, so the provider gets their current values.
  std::vector<std::string> keeps = {};
};

class ProviderRegistry {
 public:
  /// The twelve classes of the DNS client profile and the four companions.
  static ProviderRegistry builtIn();

  /// The directory with the libraries of builtIn(): beside the running program, as built or as installed. Empty if they
  /// are not there; then the dynamic loader searches.
  static std::string builtInDirectory();

  /// Adds an entry; it replaces an existing one for the same class and namespace.
  void add(ProviderEntry entry);

  /// The entry of a class, name and namespace in any case; null if no provider serves the class.
  const ProviderEntry* find(std::string_view nameSpace, std::string_view className) const noexcept;

  /// A namespace in the registry's spelling. Case and slashes at either end do not matter. Empty if the registry has no
  /// such namespace.
  std::string_view nameSpace(std::string_view spelling) const noexcept;

  /// The namespace of requests that name none: that of the first entry, or "root/cimv2".
  std::string_view defaultNameSpace() const noexcept;

  /// Adds a namespace that no entry has.
  void addNameSpace(std::string nameSpace);

  /// In the order in which they were added.
  const std::vector<ProviderEntry>& entries() const noexcept { return entries_; }
  const std::vector<std::string>& nameSpaces() const noexcept { return nameSpaces_; }

 private:
  std::vector<ProviderEntry> entries_;
  std::vector<std::string> nameSpaces_;
};

}  // namespace zorva::broker
