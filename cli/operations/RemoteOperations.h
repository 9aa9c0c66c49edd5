#pragma once

// The CIM operations on a server: CIM-XML over HTTP (DSP0200 1.4).

#include <functional>
#include <map>
#include <memory>
#include <string>
#include <string_view>

#include "cimxml/ResponseReader.h"
#include "cli/operations/HttpClient.h"
#include "cli/operations/Operations.h"
#include "cli/operations/Server.h"
#include "util/Names.h"

namespace zorva::cli {

/// Reads what the server reports at /watch, line by line, until it ends that or `take` returns false. Empty lines only
/// say that the connection is alive. Throws Failure if the server does not let this client watch, or cannot be reached.
void followChanges(const Server& server, const std::function<bool(std::string_view line)>& take);

class RemoteOperations : public Operations {
 public:
  /// Connects at the first operation. `classes` are known in advance; others are requested. Throws Failure as
  /// HttpClient does. The operations throw Failure if the server does not answer with CIM-XML.
  RemoteOperations(const Server& server, std::shared_ptr<const schema::ClassRepository> classes);
  ~RemoteOperations() override;

  broker::Status enumerateInstances(std::string_view nameSpace, std::string_view className,
                                    const broker::Selection& selection, const broker::InstanceSink& sink) override;
  broker::Status enumerateInstanceNames(std::string_view nameSpace, std::string_view className,
                                        const broker::PathSink& sink) override;
  Expected<broker::Instance, broker::Status> getInstance(const broker::ObjectPath& path,
                                                         const broker::Selection& selection) override;
  broker::Status modifyInstance(const broker::Instance& instance,
                                const std::optional<std::vector<std::string>>& propertyList) override;
  broker::Status associators(const broker::ObjectPath& path, const broker::AssociationFilter& filter,
                             const broker::Selection& selection, const broker::InstanceSink& sink) override;
  broker::Status associatorNames(const broker::ObjectPath& path, const broker::AssociationFilter& filter,
                                 const broker::PathSink& sink) override;
  broker::Status references(const broker::ObjectPath& path, const broker::AssociationFilter& filter,
                            const broker::Selection& selection, const broker::InstanceSink& sink) override;
  broker::Status referenceNames(const broker::ObjectPath& path, const broker::AssociationFilter& filter,
                                const broker::PathSink& sink) override;
  Expected<broker::MethodResult, broker::Status> invokeMethod(const broker::ObjectPath& path, std::string_view method,
                                                              const std::vector<broker::NamedValue>& input) override;
  Expected<broker::ObjectPath, broker::Status> canonicalPath(const broker::ObjectPath& path) override;
  const std::vector<broker::ProviderEntry>& served() const override { return served_.entries(); }
  const schema::Class* classNamed(std::string_view name) override;

 private:
  std::string nameSpaceOr(std::string_view given) const;
  cimxml::CimResponse ask(std::string_view operation, const std::string& object, const std::string& message);
  broker::Status handOut(cimxml::CimResponse response, const std::string& nameSpace,
                         const broker::InstanceSink& sink) const;
  broker::Status handOut(cimxml::CimResponse response, const std::string& nameSpace,
                         const broker::PathSink& sink) const;

  ServerUrl server_;
  std::shared_ptr<const schema::ClassRepository> classes_;
  broker::ProviderRegistry served_;
  HttpClient http_;
  /// Requested classes, each with its own repository; null: the server has none of that name.
  std::map<std::string, std::unique_ptr<schema::ClassRepository>, util::NameLess> fetched_;
};

}  // namespace zorva::cli
