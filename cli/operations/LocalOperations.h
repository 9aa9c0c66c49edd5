#pragma once

// The CIM operations done by the providers in this process.

#include "cli/operations/Operations.h"
#include "frontend/ReadBack.h"

namespace zorva::cli {

class LocalOperations : public Operations {
 public:
  /// A provider is loaded when it is first used.
  LocalOperations(std::shared_ptr<const schema::ClassRepository> classes, broker::BrokerOptions options)
      : broker_(std::move(classes), std::move(options)) {}

  broker::Status enumerateInstances(std::string_view nameSpace, std::string_view className,
                                    const broker::Selection& selection, const broker::InstanceSink& sink) override {
    return broker_.enumerateInstances(nameSpace, className, selection, sink);
  }
  broker::Status enumerateInstanceNames(std::string_view nameSpace, std::string_view className,
                                        const broker::PathSink& sink) override {
    return broker_.enumerateInstanceNames(nameSpace, className, sink);
  }
  Expected<broker::Instance, broker::Status> getInstance(const broker::ObjectPath& path,
                                                         const broker::Selection& selection) override {
    auto instance = broker_.getInstance(path, selection);
    // In the order of the request, not the provider's.
    if (instance) instance->path.keys = path.keys;
    return instance;
  }
  broker::Status modifyInstance(const broker::Instance& instance,
                                const std::optional<std::vector<std::string>>& propertyList) override {
    return frontend::modifyInstance(broker_, instance, propertyList);
  }
  broker::Status associators(const broker::ObjectPath& path, const broker::AssociationFilter& filter,
                             const broker::Selection& selection, const broker::InstanceSink& sink) override {
    return broker_.associators(path, filter, selection, sink);
  }
  broker::Status associatorNames(const broker::ObjectPath& path, const broker::AssociationFilter& filter,
                                 const broker::PathSink& sink) override {
    return broker_.associatorNames(path, filter, sink);
  }
  broker::Status references(const broker::ObjectPath& path, const broker::AssociationFilter& filter,
                            const broker::Selection& selection, const broker::InstanceSink& sink) override {
    return broker_.references(path, filter, selection, sink);
  }
  broker::Status referenceNames(const broker::ObjectPath& path, const broker::AssociationFilter& filter,
                                const broker::PathSink& sink) override {
    return broker_.referenceNames(path, filter, sink);
  }
  Expected<broker::MethodResult, broker::Status> invokeMethod(const broker::ObjectPath& path, std::string_view method,
                                                              const std::vector<broker::NamedValue>& input) override {
    return broker_.invokeMethod(path, method, input);
  }
  Expected<broker::ObjectPath, broker::Status> canonicalPath(const broker::ObjectPath& path) override {
    return broker_.canonicalPath(path);
  }
  const schema::Class* classNamed(std::string_view name) override { return broker_.classes().find(name); }
  const std::vector<broker::ProviderEntry>& served() const override { return broker_.registry().entries(); }

 private:
  broker::Broker broker_;
};

}  // namespace zorva::cli
