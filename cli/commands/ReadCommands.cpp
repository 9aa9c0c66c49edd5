// enumerate, names, get.
#include "broker/Broker.h"
#include "cli/commands/Commands.h"
#include "cli/output/Failure.h"
#include "cli/output/ResultWriter.h"
#include "cli/session/Paths.h"
#include "cli/session/Session.h"

namespace zorva::cli {

void enumerateNames(const Arguments& arguments) {
  Session session(arguments);
  const broker::ObjectPath wanted = resolveClass(session, arguments.target);
  const auto writer = makeResultWriter(arguments.output, session.layout(), Count::Many, Results::Names);
  const broker::Status status =
      session.cim().enumerateInstanceNames(wanted.nameSpace, wanted.className, [&](const broker::ObjectPath& path) {
        writer->add(path);
        return true;
      });
  writer->finish();
  requireDone("enumerating the names of " + wanted.className, status);
}

void enumerateInstances(const Arguments& arguments) {
  Session session(arguments);
  const broker::ObjectPath wanted = resolveClass(session, arguments.target);
  const broker::Selection selection = selectionOf(session, arguments, &session.classNamed(wanted.className));
  const auto writer = makeResultWriter(arguments.output, session.layout(), Count::Many, Results::Instances);
  const broker::Status status = session.cim().enumerateInstances(wanted.nameSpace, wanted.className, selection,
                                                                 [&](const broker::Instance& instance) {
                                                                   writer->add(instance);
                                                                   return true;
                                                                 });
  writer->finish();
  requireDone("enumerating " + wanted.className, status);
}

void getInstance(const Arguments& arguments) {
  Session session(arguments);
  const auto writer = makeResultWriter(arguments.output, session.layout(), Count::One, Results::Instances);
  const broker::ObjectPath path = resolvePath(session, arguments.target);
  const broker::Selection selection = selectionOf(session, arguments, &session.classNamed(path.className));
  broker::Instance instance;
  const broker::Status status = session.cim().getInstance(path, selection, instance);
  if (!status.ok()) {
    throw operationFailure(arguments.target, status, "zorvactl names " + path.className + " lists what there is");
  }
  writer->add(instance);
  writer->finish();
}

}  // namespace zorva::cli
