// enumerate, names, get.

#include "broker/Broker.h"
#include "cli/commands/Commands.h"
#include "cli/output/Failure.h"
#include "cli/output/ResultWriter.h"
#include "cli/session/Paths.h"
#include "cli/session/Session.h"

namespace zorva::cli {

namespace {

struct ReadOptions {
  std::string target;                   ///< a class, or the path of an instance
  std::vector<std::string> properties;  ///< of those wanted; empty: all
};

void enumerateNames(const Globals& globals, const ReadOptions& options) {
  Session session(globals);
  const broker::ObjectPath wanted = resolveClass(session, options.target);
  const auto writer = makeResultWriter(globals.output, session.layout(), Count::Many, Results::Names);
  const broker::Status status =
      session.cim().enumerateInstanceNames(wanted.nameSpace, wanted.className, [&](const broker::ObjectPath& path) {
        writer->add(path);
        return true;
      });
  writer->finish();
  requireDone("enumerating the names of " + wanted.className, status);
}

void enumerateInstances(const Globals& globals, const ReadOptions& options) {
  Session session(globals);
  const broker::ObjectPath wanted = resolveClass(session, options.target);
  const broker::Selection selection = selectionOf(session, options.properties, &session.classNamed(wanted.className));
  const auto writer = makeResultWriter(globals.output, session.layout(), Count::Many, Results::Instances);
  const broker::Status status = session.cim().enumerateInstances(wanted.nameSpace, wanted.className, selection,
                                                                 [&](const broker::Instance& instance) {
                                                                   writer->add(instance);
                                                                   return true;
                                                                 });
  writer->finish();
  requireDone("enumerating " + wanted.className, status);
}

void getInstance(const Globals& globals, const ReadOptions& options) {
  Session session(globals);
  const auto writer = makeResultWriter(globals.output, session.layout(), Count::One, Results::Instances);
  const broker::ObjectPath path = resolvePath(session, options.target);
  const broker::Selection selection = selectionOf(session, options.properties, &session.classNamed(path.className));
  const auto instance = session.cim().getInstance(path, selection);
  if (!instance) {
    throw operationFailure(options.target, instance.error(),
                           "zorvactl names " + path.className + " lists what there is");
  }
  writer->add(*instance);
  writer->finish();
}

/// Completes the registration of one of the three.
Subcommand addRead(Subcommand subcommand, Results results, const char* word, const char* meaning,
                   void (*command)(const Globals& globals, const ReadOptions& options)) {
  const auto options = std::make_shared<ReadOptions>();
  if (results == Results::Instances) {
    subcommand.readsInstances(options->properties);
  } else {
    subcommand.readsNames();
  }
  subcommand.gathers().word(word, meaning, options->target).runs<ReadOptions>(command, options);
  return subcommand;
}

}  // namespace

void addReadCommands(CommandLine& line) {
  addRead(line.add("enumerate", "All instances of a class").alias("ei"), Results::Instances, "CLASS",
          "The class, or one above it", enumerateInstances)
      .examples(
          "  zorvactl ei ZORVA_DNSProtocolEndPoint\n"
          "  zorvactl ei ZORVA_DNSSettingData --property DomainName --property DNSServerAddresses --output json\n"
          "  zorvactl ei CIM_SettingData                   and of all classes below it");
  addRead(line.add("names", "The names of all instances of a class").alias("ein"), Results::Names, "CLASS",
          "The class, or one above it", enumerateNames)
      .examples("  zorvactl ein ZORVA_DNSSettingData");
  addRead(line.add("get", "One instance").alias("gi"), Results::Instances, "PATH", "Its object path", getInstance)
      .examples(
          "  zorvactl gi 'ZORVA_DNSProtocolEndPoint.Name=\"eth0\"'\n"
          "  zorvactl gi 'ZORVA_DNSSettingData.InstanceID=\"Computer%eth0\"' --output mof\n"
          "  zorvactl gi ZORVA_DNSGeneralSettingData       the only one needs no keys");
}

}  // namespace zorva::cli
