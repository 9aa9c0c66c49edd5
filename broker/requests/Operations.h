#pragma once

#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "broker/objects/Value.h"

// What a client says of an operation, and what takes its results.

namespace zorva::broker {

/// What the providers learn of the client, as entries of the CMPI context. Empty texts make no entry.
struct Caller {
  std::string principal;
  std::string role;
  std::string acceptLanguage;
  std::string contentLanguage;
};

/// What of each instance is wanted (DSP0200 5.3.2.2, 5.3.2.11). Qualifiers and class origins are added by who writes
/// the answer, from Property::declaration; here they are only told to the provider.
struct Selection {
  bool localOnly = false;
  bool deepInheritance = true;
  bool includeQualifiers = false;
  bool includeClassOrigin = false;
  /// Absent: all properties. Names that the class lacks are passed over. Keys come only if they are named; the path of
  /// the instance has them all the same.
  std::optional<std::vector<std::string>> propertyList;
};

/// Which associations and far ends are wanted; empty texts stand for what is omitted. For references,
/// `associationClass` is the operation's ResultClass, and `resultClass` and `resultRole` are not used.
struct AssociationFilter {
  std::string associationClass;
  std::string resultClass;
  std::string role;
  std::string resultRole;
};

/// Takes results one by one while the provider makes them. What is referred to is the broker's and holds until the sink
/// returns: copy what is to be kept. false: no more are wanted; the operation then ends as soon as the provider does.
using InstanceSink = std::function<bool(const Instance& instance)>;
using PathSink = std::function<bool(const ObjectPath& path)>;

/// What a method gave back.
struct MethodResult {
  Value returnValue;               ///< null where the provider returned none
  std::vector<NamedValue> output;  ///< in the order in which the provider set them
};

/// What a modification was to change, and what came of it: providers may say success and have stored nothing.
struct ModificationEffect {
  std::vector<Property> changes;  ///< what the provider was asked to change, in the types that the schema declares
  Status reading;                 ///< of reading the instance again, under the same claim; only after a success
  Instance now;                   ///< where that was a success, and there were changes
};

}  // namespace zorva::broker
