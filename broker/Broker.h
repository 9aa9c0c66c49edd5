#pragma once

// A CMPI 2.0 broker in this process: it loads providers, passes a client's requests to them, and serves their up-calls.
//
// Threads: once constructed, one Broker may be used by any number of threads at once. Each request runs on the thread
// that makes it. Its memory is its own and is freed when the request ends. Sinks are called on that thread; if a
// provider delivers from an attached thread, on that one, one call at a time. The log hook may be called on any thread.
//
// Names of classes, properties, keys, methods, parameters and namespaces are accepted in any case. Providers and
// clients get them in the schema's spelling. An empty namespace means the registry's default.
//
// Failures are returned as values. Functions throw only std::bad_alloc, and only while they build the caller's values.

#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "broker/core/BrokerOptions.h"
#include "broker/objects/Value.h"
#include "broker/requests/Operations.h"
#include "schema/ClassRepository.h"
#include "util/Expected.h"
#include "util/NotCopied.h"

struct _CMPIBroker;

namespace zorva::broker {

class BrokerCore;

class Broker : util::NotCopied {
 public:
  /// `classes` are the classes of all namespaces of the registry.
  Broker(std::shared_ptr<const schema::ClassRepository> classes, BrokerOptions options);

  /// Calls the providers' cleanup functions and closes their libraries. No request may be running.
  ~Broker();

  /// The instances of a class and of its served subclasses, the class itself first. CIM_ERR_NOT_SUPPORTED if no
  /// provider serves any of them. The status comes after all results; results may have come before a failure. If the
  /// library of the requested class cannot be loaded, the request fails. If the library of a subclass cannot be loaded,
  /// that subclass is skipped with a line in the log, unless no other class is left.
  Status enumerateInstances(std::string_view nameSpace, std::string_view className, const Selection& selection,
                            const InstanceSink& sink, const Caller& caller = {});
  Status enumerateObjects(std::string_view nameSpace, std::string_view className, const Selection& selection,
                          const ObjectSink& sink, const Caller& caller = {});
  Status enumerateInstanceNames(std::string_view nameSpace, std::string_view className, const PathSink& sink,
                                const Caller& caller = {});

  /// One instance. Key values may be texts where the schema declares another type (an untyped KEYVALUE, a path text).
  /// They are converted to the key's type; a text for a reference is read as a path text. Keys may be missing: the
  /// provider decides. CIM_ERR_NOT_FOUND if the provider returns nothing.
  Expected<Instance, Status> getInstance(const ObjectPath& path, const Selection& selection, const Caller& caller = {});

  /// `instance.path` names class and namespace. Returns the name of the new instance.
  Expected<ObjectPath, Status> createInstance(const Instance& instance, const Caller& caller = {});

  /// Modifies the instance that `instance.path` names. `propertyList` limits the change (absent: all properties that
  /// `instance` has). The instance is read first. A property that the client does not name, or names with its current
  /// value, is left unchanged; if nothing else is left, the provider is not called. Before anything is written, these
  /// are refused: a listed name that the class lacks, and a key with another value than in the path
  /// (CIM_ERR_INVALID_PARAMETER); a new value for a property without the qualifier Write (CIM_ERR_NOT_SUPPORTED).
  /// `effect`, if not null, gets what was changed. A control character other than tab in a text, here and in
  /// invokeMethod, is CIM_ERR_INVALID_PARAMETER.
  Status modifyInstance(const Instance& instance, const std::optional<std::vector<std::string>>& propertyList,
                        const Caller& caller = {}, ModificationEffect* effect = nullptr);

  Status deleteInstance(const ObjectPath& path, const Caller& caller = {});

  /// The objects at the far ends of the associations of `path`. The providers of all concrete association classes that
  /// match the filter are asked, each under its own class name. Results are checked against `resultClass`. A class that
  /// does not exist, in `path` or in the filter, is CIM_ERR_INVALID_PARAMETER. When several associations are asked, one
  /// that answers "not supported" or whose library cannot be loaded is skipped (the latter with a line in the log),
  /// unless this is true of all. After any other failure the rest are still asked, and the first failure is the status.
  Status associators(const ObjectPath& path, const AssociationFilter& filter, const Selection& selection,
                     const InstanceSink& sink, const Caller& caller = {});
  Status associatorNames(const ObjectPath& path, const AssociationFilter& filter, const PathSink& sink,
                         const Caller& caller = {});

  /// The associations themselves.
  Status references(const ObjectPath& path, const AssociationFilter& filter, const Selection& selection,
                    const InstanceSink& sink, const Caller& caller = {});
  Status referenceNames(const ObjectPath& path, const AssociationFilter& filter, const PathSink& sink,
                        const Caller& caller = {});

  /// Calls an extrinsic method. Parameters are converted to the types that the schema declares. CIM_ERR_NOT_FOUND if
  /// the class does not exist. CIM_ERR_INVALID_PARAMETER for a parameter that the method lacks, that does not fit its
  /// type or is given twice, for a missing required one, and for a path without keys, unless the method is static.
  Expected<MethodResult, Status> invokeMethod(const ObjectPath& path, std::string_view method,
                                              const std::vector<NamedValue>& input, const Caller& caller = {});

  /// Opens all provider libraries now. Otherwise a request opens a library when it first needs it. Returns one sentence
  /// for each library that cannot be opened.
  std::vector<std::string> openLibraries();

  const schema::ClassRepository& classes() const noexcept;
  const ProviderRegistry& registry() const noexcept;

  /// `path` as the providers would see it: names in the schema's spelling, key values in the schema's types, in the
  /// order of the schema's keys. Fails as a request with that path does.
  Expected<ObjectPath, Status> canonicalPath(const ObjectPath& path) const;

  /// The broker as providers see it. Its functions make CMPI objects only within a request: this is for providers and
  /// for the tests of the function tables.
  const _CMPIBroker* handle() const noexcept;

 private:
  std::unique_ptr<BrokerCore> core_;
};

}  // namespace zorva::broker
