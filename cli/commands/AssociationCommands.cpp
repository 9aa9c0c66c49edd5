// associators, associator-names, references, reference-names.

#include <algorithm>

#include "cli/commands/Commands.h"
#include "cli/output/Failure.h"
#include "cli/output/ResultWriter.h"
#include "cli/session/Paths.h"
#include "cli/session/Session.h"

namespace zorva::cli {

namespace {

struct AssociationOptions {
  std::string path;  ///< of the near end
  std::string associationClass;
  std::string resultClass;
  std::string role;
  std::string resultRole;
  std::vector<std::string> properties;  ///< of those wanted; empty: all
};

std::string endsOf(const schema::Class& association) {
  std::vector<std::string> ends;
  for (const schema::ClassProperty* each : association.references()) {
    ends.push_back(each->name + " (" + each->referenceClass + ")");
  }
  return "its ends are " + joined(ends, " and ");
}

void requireRole(const char* option, const std::string& role, const std::vector<const schema::Class*>& associations) {
  std::vector<std::string> names;
  for (const schema::Class* association : associations) {
    for (const schema::ClassProperty* each : association->references()) {
      if (role.empty() || util::sameName(each->name, role)) return;
      if (std::find(names.begin(), names.end(), each->name) == names.end()) names.push_back(each->name);
    }
  }
  throw Failure(ExitCode::WrongUsage,
                std::string(option) + ": no association that is meant has a reference " + printable(role),
                nearestOr(role, names, "there are " + joined(names, ", ")));
}

/// The filter of the command line, with its class names checked and in the schema's spelling. The result class in the
/// options of references is the association itself.
broker::AssociationFilter filterOf(Session& session, const AssociationOptions& options) {
  const auto spelled = [&session](const std::string& name) {
    return name.empty() ? name : session.classNamed(name).name();
  };
  broker::AssociationFilter filter;
  filter.associationClass = spelled(options.associationClass);
  filter.resultClass = spelled(options.resultClass);
  filter.role = options.role;
  filter.resultRole = options.resultRole;
  return filter;
}

/// Throws Failure if no association matches: CIM would answer with an empty result, which looks like "there are none".
void requireAnAssociation(Session& session, const broker::ObjectPath& path, const broker::AssociationFilter& filter) {
  const schema::ClassRepository& classes = *session.classes();
  const schema::Class* source = classes.find(path.className);
  const schema::Class* ancestor = classes.find(filter.associationClass);
  if (source == nullptr || (ancestor == nullptr && !filter.associationClass.empty())) return;  // a server's own
  if (ancestor != nullptr && !ancestor->isAssociation()) {
    throw Failure(ExitCode::WrongUsage, ancestor->name() + " is no association",
                  "zorvactl classes lists what there is");
  }
  const std::vector<const schema::Class*> associations = classes.associationsOf(*source, ancestor);
  if (associations.empty()) {
    throw Failure(ExitCode::WrongUsage,
                  source->name() + " is at no end of " + (ancestor == nullptr ? "any association" : ancestor->name()),
                  ancestor == nullptr ? "zorvactl graph shows what is associated" : endsOf(*ancestor));
  }
  requireRole("--role", filter.role, associations);
  requireRole("--result-role", filter.resultRole, associations);
}

/// One of the four operations, which passes its results to a writer.
using Operation = std::function<broker::Status(Operations& cim, const broker::ObjectPath& path,
                                               const broker::AssociationFilter& filter,
                                               const broker::Selection& selection, ResultWriter& writer)>;

/// `top` is the class of the results, from the command line.
void follow(const Globals& globals, const AssociationOptions& options, Results results, const char* what,
            const std::string& top, const Operation& operation) {
  Session session(globals);
  const auto writer = makeResultWriter(globals.output, session.layout(), Count::Many, results);
  const broker::AssociationFilter filter = filterOf(session, options);
  const broker::Selection selection = selectionOf(session, options.properties, session.classes()->find(top));
  const broker::ObjectPath path = resolvePath(session, options.path);
  requireAnAssociation(session, path, filter);
  const broker::Status status = operation(session.cim(), path, filter, selection, *writer);
  writer->finish();
  requireDone(std::string(what) + " of " + options.path, status);
}

template <typename Result>
auto into(ResultWriter& writer) {
  return [&writer](const Result& result) {
    writer.add(result);
    return true;
  };
}

void followToInstances(const Globals& globals, const AssociationOptions& options, const char* what,
                       const std::string& top, decltype(&Operations::associators) operation) {
  follow(globals, options, Results::Instances, what, top,
         [operation](auto& cim, const auto& path, const auto& filter, const auto& selection, ResultWriter& writer) {
           return (cim.*operation)(path, filter, selection, into<broker::Instance>(writer));
         });
}

void followToNames(const Globals& globals, const AssociationOptions& options, const char* what,
                   decltype(&Operations::associatorNames) operation) {
  follow(globals, options, Results::Names, what, {},
         [operation](auto& cim, const auto& path, const auto& filter, const auto&, ResultWriter& writer) {
           return (cim.*operation)(path, filter, into<broker::ObjectPath>(writer));
         });
}

void showAssociators(const Globals& globals, const AssociationOptions& options) {
  followToInstances(globals, options, "associators", options.resultClass, &Operations::associators);
}

void showAssociatorNames(const Globals& globals, const AssociationOptions& options) {
  followToNames(globals, options, "associator names", &Operations::associatorNames);
}

void showReferences(const Globals& globals, const AssociationOptions& options) {
  followToInstances(globals, options, "references", options.associationClass, &Operations::references);
}

void showReferenceNames(const Globals& globals, const AssociationOptions& options) {
  followToNames(globals, options, "reference names", &Operations::referenceNames);
}

void addFarEnd(Subcommand& subcommand, AssociationOptions& options) {
  subcommand.option("--assoc-class", "CLASS", "Only through this association", options.associationClass)
      .option("--result-class", "CLASS", "Only objects of this class", options.resultClass)
      .option("--result-role", "ROLE", "Only where the far end is this reference", options.resultRole);
}

void addAssociation(Subcommand& subcommand, AssociationOptions& options) {
  subcommand.option("--result-class,--assoc-class", "CLASS", "Only associations of this class",
                    options.associationClass);
}

struct Naming {
  const char* name;
  const char* alias;
  const char* description;
};

/// Registers one of the four; `addFilter` adds the options that it does not share with all of them.
Subcommand addOne(CommandLine& line, const Naming& naming, Results results,
                  void (*addFilter)(Subcommand& subcommand, AssociationOptions& options),
                  void (*command)(const Globals& globals, const AssociationOptions& options)) {
  const auto options = std::make_shared<AssociationOptions>();
  Subcommand subcommand = line.add(naming.name, naming.description);
  subcommand.alias(naming.alias)
      .readsNames()
      .gathers()
      .word("PATH", "The object path at the near end", options->path)
      .option("--role", "ROLE", "Only where the near end is this reference", options->role);
  addFilter(subcommand, *options);
  if (results == Results::Instances) subcommand.readsInstances(options->properties);
  subcommand.runs<AssociationOptions>(command, options);
  return subcommand;
}

}  // namespace

void addAssociationCommands(CommandLine& line) {
  addOne(line, {"associators", "ai", "The objects that an object is associated with"}, Results::Instances, addFarEnd,
         showAssociators)
      .examples(
          "  zorvactl ai 'ZORVA_DNSProtocolEndPoint.Name=\"eth0\"' --result-class CIM_RemoteServiceAccessPoint\n"
          "  zorvactl ai 'ZORVA_DNSProtocolEndPoint.Name=\"eth0\"' --assoc-class ZORVA_DNSEndPointElementSettingData");
  addOne(line, {"associator-names", "ain", "The names of the objects that an object is associated with"},
         Results::Names, addFarEnd, showAssociatorNames)
      .examples(
          "  zorvactl ain 'ZORVA_DNSSettingData.InstanceID=\"Computer%eth0\"'\n"
          "  zorvactl ain 'ZORVA_DNSProtocolEndPoint.Name=\"eth0\"' --role Dependent --result-role Antecedent");
  addOne(line, {"references", "ri", "The associations of an object"}, Results::Instances, addAssociation,
         showReferences)
      .examples("  zorvactl ri 'ZORVA_RemoteServiceAccessPoint.Name=\"192.0.2.53\"'");
  addOne(line, {"reference-names", "rin", "The names of the associations of an object"}, Results::Names, addAssociation,
         showReferenceNames)
      .examples("  zorvactl rin 'ZORVA_DNSProtocolEndPoint.Name=\"eth0\"' --result-class ZORVA_DNSHostedAccessPoint");
}

}  // namespace zorva::cli
