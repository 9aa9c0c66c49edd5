// enumerate, names, get.
#include "broker/Broker.h"
#include "cli/Commands.h"
#include "cli/Failure.h"
#include "cli/Paths.h"
#include "cli/ResultWriter.h"
#include "cli/Session.h"

namespace zorva::cli {

void enumerateNames(const Arguments& arguments) {
  Session session(arguments);
  const broker::ObjectPath wanted = readClassName(arguments.target);
  const schema::Class& declared = session.classNamed(wanted.className);
  const auto writer = makeResultWriter(arguments.output, session.layout(), Count::Many, Results::Names);
  const broker::Status status =
      session.broker().enumerateInstanceNames(wanted.nameSpace, declared.name(), [&](const broker::ObjectPath& path) {
        writer->add(path);
        return true;
      });
  writer->finish();
  requireDone("enumerating the names of " + declared.name(), status);
}

void enumerateInstances(const Arguments& arguments) {
  Session session(arguments);
  const broker::ObjectPath wanted = readClassName(arguments.target);
  const schema::Class& declared = session.classNamed(wanted.className);
  const auto writer = makeResultWriter(arguments.output, session.layout(), Count::Many, Results::Instances);
  const broker::Status status = session.broker().enumerateInstances(
      wanted.nameSpace, declared.name(), selectionOf(arguments), [&](const broker::Instance& instance) {
        writer->add(instance);
        return true;
      });
  writer->finish();
  requireDone("enumerating " + declared.name(), status);
}

void getInstance(const Arguments& arguments) {
  Session session(arguments);
  const auto writer = makeResultWriter(arguments.output, session.layout(), Count::One, Results::Instances);
  const broker::ObjectPath path = resolvePath(session, arguments.target);
  broker::Instance instance;
  const broker::Status status = session.broker().getInstance(path, selectionOf(arguments), instance);
  if (!status.ok()) {
    throw operationFailure(arguments.target, status, "zorvactl names " + path.className + " lists what there is");
  }
  writer->add(instance);
  writer->finish();
}

}  // namespace zorva::cli
