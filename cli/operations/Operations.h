#pragma once

// The CIM operations (DSP0200) for the subcommands, executed by the providers in this process or by a server. Used by
// one thread.

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "broker/Broker.h"

namespace zorva::cli {

class Operations {
 public:
  virtual ~Operations() = default;

  /// Like the Broker's functions of the same names. An empty namespace means the usual one of the provider or server.
  /// Arguments of a sink are valid until it returns. A failure may also mean that no provider or server could be
  /// reached.
  virtual broker::Status enumerateInstances(std::string_view nameSpace, std::string_view className,
                                            const broker::Selection& selection, const broker::InstanceSink& sink) = 0;
  virtual broker::Status enumerateInstanceNames(std::string_view nameSpace, std::string_view className,
                                                const broker::PathSink& sink) = 0;
  /// The instance has all the keys of the request.
  virtual Expected<broker::Instance, broker::Status> getInstance(const broker::ObjectPath& path,
                                                                 const broker::Selection& selection) = 0;
  /// Here, success is checked by reading again; a server may do so or not.
  virtual broker::Status modifyInstance(const broker::Instance& instance,
                                        const std::optional<std::vector<std::string>>& propertyList) = 0;
  virtual broker::Status associators(const broker::ObjectPath& path, const broker::AssociationFilter& filter,
                                     const broker::Selection& selection, const broker::InstanceSink& sink) = 0;
  virtual broker::Status associatorNames(const broker::ObjectPath& path, const broker::AssociationFilter& filter,
                                         const broker::PathSink& sink) = 0;
  virtual broker::Status references(const broker::ObjectPath& path, const broker::AssociationFilter& filter,
                                    const broker::Selection& selection, const broker::InstanceSink& sink) = 0;
  virtual broker::Status referenceNames(const broker::ObjectPath& path, const broker::AssociationFilter& filter,
                                        const broker::PathSink& sink) = 0;
  virtual Expected<broker::MethodResult, broker::Status> invokeMethod(const broker::ObjectPath& path,
                                                                      std::string_view method,
                                                                      const std::vector<broker::NamedValue>& input) = 0;

  /// The path with names in the schema's spelling, key values in the schema's types and its namespace.
  virtual Expected<broker::ObjectPath, broker::Status> canonicalPath(const broker::ObjectPath& path) = 0;

  /// The class of that name, in any case; null if there is none.
  virtual const schema::Class* classNamed(std::string_view name) = 0;

  /// The classes of the DNS client profile and its companions, with their providers if known.
  virtual const std::vector<broker::ProviderEntry>& served() const = 0;
};

}  // namespace zorva::cli
