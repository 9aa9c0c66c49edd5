#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "broker/Broker.h"

// The CIM operations (DSP0200) that the subcommands are made of, wherever they are done: by the providers in this
// process, or by a server. Used by one thread.

namespace zorva::cli {

class Operations {
 public:
  virtual ~Operations() = default;

  /// As the Broker's functions of the same names do it. An empty namespace is the usual one of whoever answers. What a
  /// sink is given holds until it returns. A status that is no success may also tell that nobody could be asked.
  virtual broker::Status enumerateInstances(std::string_view nameSpace, std::string_view className,
                                            const broker::Selection& selection, const broker::InstanceSink& sink) = 0;
  virtual broker::Status enumerateInstanceNames(std::string_view nameSpace, std::string_view className,
                                                const broker::PathSink& sink) = 0;
  /// The instance gets the keys that were asked for, all of them.
  virtual broker::Status getInstance(const broker::ObjectPath& path, const broker::Selection& selection,
                                     broker::Instance& instance) = 0;
  /// Here, the providers' success is checked by reading again; a server may do so or not.
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
  virtual broker::Status invokeMethod(const broker::ObjectPath& path, std::string_view method,
                                      const std::vector<broker::NamedValue>& input, broker::MethodResult& result) = 0;

  /// The path with names in the schema's spelling, key values in the schema's types and the namespace that counts.
  virtual broker::Status canonicalPath(const broker::ObjectPath& path, broker::ObjectPath& canonical) = 0;

  /// The class of that name, in any case; null where there is none.
  virtual const schema::Class* classNamed(std::string_view name) = 0;

  /// The classes of the DNS client profile and its companions, with who provides them where that is known.
  virtual const std::vector<broker::ProviderEntry>& served() const = 0;
};

}  // namespace zorva::cli
