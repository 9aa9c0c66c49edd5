#pragma once

// A client's parameters of an operation, and the types that take its results.

#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "broker/objects/Value.h"

namespace zorva::broker {

struct InstanceObject;
struct PropertyMask;

/// What the providers get to know about the client, as entries of the CMPI context. Empty texts make no entry.
struct Caller {
  std::string principal;
  std::string role;
  std::string acceptLanguage;
  std::string contentLanguage;
};

/// The requested part of each instance (DSP0200 5.3.2.2, 5.3.2.11). Qualifiers and class origins are added by the code
/// that writes the response, from Property::declaration; here they are only passed to the provider.
struct Selection {
  bool localOnly = false;
  bool deepInheritance = true;
  bool includeQualifiers = false;
  bool includeClassOrigin = false;
  /// Absent: all properties. Names that the class lacks are ignored. Keys are included only if they are named; the path
  /// of the instance always has them.
  std::optional<std::vector<std::string>> propertyList;
};

/// The requested associations and far ends; an empty text means that the parameter is omitted. For references,
/// `associationClass` is the operation's ResultClass, and `resultClass` and `resultRole` are not used.
struct AssociationFilter {
  std::string associationClass;
  std::string resultClass;
  std::string role;
  std::string resultRole;
};

/// Takes results one by one while the provider makes them. The arguments belong to the broker and are valid until the
/// sink returns: copy what must be kept. False means that no more results are needed; the operation then ends as soon
/// as the provider does.
using InstanceSink = std::function<bool(const Instance& instance)>;
/// The instance as its provider made it, without a copy in plain values, and which of its properties were requested.
using ObjectSink = std::function<bool(const InstanceObject& object, const PropertyMask& wanted)>;
using PathSink = std::function<bool(const ObjectPath& path)>;

/// The result of a method.
struct MethodResult {
  Value returnValue;               ///< null if the provider returned none
  std::vector<NamedValue> output;  ///< in the order in which the provider set them
};

/// What a modification was to change, and its effect: a provider may report success and store nothing.
struct ModificationEffect {
  std::vector<Property> changes;  ///< what the provider was asked to change, in the types that the schema declares
  std::vector<Value> before;      ///< the value of each of these until then; null if the provider cannot be read
  Status reading;                 ///< status of reading the instance again, under the same claim; only after a success
  Instance now;                   ///< if that was a success, and there were changes
};

}  // namespace zorva::broker
