#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "broker/ProviderRegistry.h"
#include "broker/Value.h"
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

enum class LogLevel { Debug, Info, Warning, Error };

/// Takes one line of the broker's or, through the broker, of a provider's log.
using LogHook = std::function<void(LogLevel level, std::string_view text)>;

/// What a request does to what other processes use as well.
enum class Access { Read, Change };

/// What a request holds while its provider reads or changes such things, so that others keep away from them.
class Claim {
 public:
  virtual ~Claim() = default;
  /// Asked after a change has been made: a failure that the provider did not notice.
  virtual Status finish() { return {}; }
};

/// Asked for a claim before a provider of that class is called; null: the class needs none. `changed` is the path of
/// what is to be changed, null for Access::Read. What it throws ends the request. Of a read the claim goes when the
/// provider returns its first result, or ends: it has read all by then, and a slow client must not hold up others.
/// Requests of a provider within one that has a claim do without. Called on any thread.
using ClaimHook =
    std::function<std::unique_ptr<Claim>(Access access, std::string_view className, const ObjectPath* changed)>;

/// A create function (CMPI 2.0) of a provider that is part of the program: "<prefix>_Create_InstanceMI" and so on.
struct LinkedFunction {
  std::string name;
  void (*function)();  ///< cast from its own type
};

struct BrokerOptions {
  ProviderRegistry registry = ProviderRegistry::builtIn();
  std::vector<LinkedFunction> linked = {};  ///< for the entries of the registry that name no library
  std::string providerDirectory =
      {};                ///< where libraries named without "/" lie; empty: the dynamic loader's own search
  LogHook log = {};      ///< may be empty
  ClaimHook claim = {};  ///< may be empty
};

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
  /// on the thread (broker/Scope.h).
  const _CMPIBroker* handle() const noexcept;

 private:
  std::unique_ptr<BrokerCore> core_;
};

}  // namespace zorva::broker
