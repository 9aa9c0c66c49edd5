#pragma once

#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "broker/core/BrokerOptions.h"
#include "broker/objects/Value.h"
#include "broker/requests/Operations.h"
#include "schema/ClassRepository.h"

// A CMPI 2.0 broker in this process: it loads providers, asks them what a client asks, and is what they call back to.
//
// Threads: after its construction one Broker may be used by any number of threads at once; each request runs on the
// thread that makes it, with memory of its own that is gone when the request ends. Sinks are called on that thread
// (save where a provider delivers from an attached thread: then one call at a time). The log hook may be called on any
// thread.
//
// Names of classes, properties, keys, methods, parameters and namespaces are taken in any case and handed on, and given
// back, in the schema's own spelling. An empty namespace stands for the registry's default.
//
// Failures are values: no function here throws, except for want of memory in building what the caller holds.

struct _CMPIBroker;

namespace zorva::broker {

class BrokerCore;

class Broker {
 public:
  /// `classes` are those of every namespace of the registry.
  Broker(std::shared_ptr<const schema::ClassRepository> classes, BrokerOptions options);

  /// Tells the providers that they end and closes their libraries. No request may be running.
  ~Broker();
  Broker(const Broker&) = delete;
  Broker& operator=(const Broker&) = delete;

  /// The instances of a class and of the classes below it that are served, the class itself first.
  /// CIM_ERR_NOT_SUPPORTED where nobody serves any of them. The status comes after all results; results may have come
  /// before a failure. A provider library that cannot be loaded fails the request where the class asked for is its own;
  /// a request for a superclass passes over it with a line in the log, unless nothing else is left.
  Status enumerateInstances(std::string_view nameSpace, std::string_view className, const Selection& selection,
                            const InstanceSink& sink, const Caller& caller = {});
  Status enumerateInstanceNames(std::string_view nameSpace, std::string_view className, const PathSink& sink,
                                const Caller& caller = {});

  /// One instance. Key values may be texts where the schema says otherwise (an untyped KEYVALUE, a path text): they are
  /// turned into the key's type; a text at a reference is read as a path text. Keys may be missing: the provider
  /// decides. CIM_ERR_NOT_FOUND where the provider returns nothing.
  Status getInstance(const ObjectPath& path, const Selection& selection, Instance& instance, const Caller& caller = {});

  /// `instance.path` names class and namespace. `created` gets the name of what was made.
  Status createInstance(const Instance& instance, ObjectPath& created, const Caller& caller = {});

  /// `instance.path` names what is to be changed; `propertyList` what of it (absent: all that `instance` has). The
  /// instance is read first: what the client does not name, or names with the value that it has, stays as it is, and
  /// where that is all the provider is not called. Before anything is written, these are refused: a listed name that
  /// the class lacks, and a key with another value than in the path (CIM_ERR_INVALID_PARAMETER); another value for a
  /// property without the qualifier Write (CIM_ERR_NOT_SUPPORTED). `effect`, where it is not null, gets what came of
  /// it. A control character other than tab in a text, here and in invokeMethod, is
  /// CIM_ERR_INVALID_PARAMETER.
  Status modifyInstance(const Instance& instance, const std::optional<std::vector<std::string>>& propertyList,
                        const Caller& caller = {}, ModificationEffect* effect = nullptr);

  Status deleteInstance(const ObjectPath& path, const Caller& caller = {});

  /// The objects at the far ends of the associations of `path`. Every concrete served association that fits the filter
  /// is asked under its own name; what comes back is checked against `resultClass`. A class that does not exist, of
  /// `path` or in the filter, is CIM_ERR_INVALID_PARAMETER. Where several associations are asked, one that answers "not
  /// supported" or whose library cannot be loaded is passed over (the latter with a line in the log) unless all are so;
  /// after any other failure the rest are still asked, and the first failure is the status.
  Status associators(const ObjectPath& path, const AssociationFilter& filter, const Selection& selection,
                     const InstanceSink& sink, const Caller& caller = {});
  Status associatorNames(const ObjectPath& path, const AssociationFilter& filter, const PathSink& sink,
                         const Caller& caller = {});

  /// The associations themselves.
  Status references(const ObjectPath& path, const AssociationFilter& filter, const Selection& selection,
                    const InstanceSink& sink, const Caller& caller = {});
  Status referenceNames(const ObjectPath& path, const AssociationFilter& filter, const PathSink& sink,
                        const Caller& caller = {});

  /// Calls an extrinsic method. Parameters are turned into the types that the schema declares. CIM_ERR_NOT_FOUND where
  /// the class does not exist. CIM_ERR_INVALID_PARAMETER for a parameter that the method lacks, that does not fit its
  /// type or is there twice, for a required one that is missing, and for a path without keys, unless the method is
  /// static.
  Status invokeMethod(const ObjectPath& path, std::string_view method, const std::vector<NamedValue>& input,
                      MethodResult& result, const Caller& caller = {});

  /// Opens the provider libraries now, which requests do otherwise when they first need them. A sentence for each one
  /// that cannot be opened.
  std::vector<std::string> openLibraries();

  const schema::ClassRepository& classes() const noexcept;
  const ProviderRegistry& registry() const noexcept;

  /// `path` as the providers would see it: names in the schema's spelling, key values in the schema's types, in the
  /// order of the schema's keys. The same failures as a request with that path has.
  Status canonicalPath(const ObjectPath& path, ObjectPath& canonical) const;

  /// The broker as providers see it, for what speaks CMPI itself. CMPI objects can be made only while a Scope is open
  /// on the thread (broker/objects/Scope.h).
  const _CMPIBroker* handle() const noexcept;

 private:
  std::unique_ptr<BrokerCore> core_;
};

}  // namespace zorva::broker
