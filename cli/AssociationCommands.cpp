// associators, associator-names, references, reference-names.
#include "cli/Commands.h"
#include "cli/Failure.h"
#include "cli/Paths.h"
#include "cli/ResultWriter.h"
#include "cli/Session.h"

namespace zorva::cli {

namespace {

/// The filter of the command line, its class names tested and in the schema's spelling. What the options of references
/// call the result class is the association itself.
broker::AssociationFilter filterOf(Session& session, const Arguments& arguments) {
  const auto spelled = [&session](const std::string& name) {
    return name.empty() ? name : session.classNamed(name).name();
  };
  broker::AssociationFilter filter;
  filter.associationClass = spelled(arguments.associationClass);
  filter.resultClass = spelled(arguments.resultClass);
  filter.role = arguments.role;
  filter.resultRole = arguments.resultRole;
  return filter;
}

/// One of the four operations, its results on their way to a writer.
using Operation = std::function<broker::Status(broker::Broker& broker, const broker::ObjectPath& path,
                                               const broker::AssociationFilter& filter, ResultWriter& writer)>;

void follow(const Arguments& arguments, Results results, const char* what, const Operation& operation) {
  Session session(arguments);
  const auto writer = makeResultWriter(arguments.output, session.layout(), Count::Many, results);
  const broker::AssociationFilter filter = filterOf(session, arguments);
  const broker::ObjectPath path = resolvePath(session, arguments.target);
  const broker::Status status = operation(session.broker(), path, filter, *writer);
  writer->finish();
  requireDone(std::string(what) + " of " + arguments.target, status);
}

template <class Result>
auto into(ResultWriter& writer) {
  return [&writer](const Result& result) {
    writer.add(result);
    return true;
  };
}

}  // namespace

void showAssociators(const Arguments& arguments) {
  follow(arguments, Results::Instances, "associators",
         [&arguments](auto& broker, const auto& path, const auto& filter, ResultWriter& writer) {
           return broker.associators(path, filter, selectionOf(arguments), into<broker::Instance>(writer));
         });
}

void showAssociatorNames(const Arguments& arguments) {
  follow(arguments, Results::Names, "associator names",
         [](auto& broker, const auto& path, const auto& filter, ResultWriter& writer) {
           return broker.associatorNames(path, filter, into<broker::ObjectPath>(writer));
         });
}

void showReferences(const Arguments& arguments) {
  follow(arguments, Results::Instances, "references",
         [&arguments](auto& broker, const auto& path, const auto& filter, ResultWriter& writer) {
           return broker.references(path, filter, selectionOf(arguments), into<broker::Instance>(writer));
         });
}

void showReferenceNames(const Arguments& arguments) {
  follow(arguments, Results::Names, "reference names",
         [](auto& broker, const auto& path, const auto& filter, ResultWriter& writer) {
           return broker.referenceNames(path, filter, into<broker::ObjectPath>(writer));
         });
}

}  // namespace zorva::cli
