// associators, associator-names, references, reference-names.
#include <algorithm>

#include "cli/commands/Commands.h"
#include "cli/output/Failure.h"
#include "cli/output/ResultWriter.h"
#include "cli/session/Paths.h"
#include "cli/session/Session.h"

namespace zorva::cli {

namespace {

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
                "there are " + joined(names, ", "));
}

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

/// Throws Failure where no association can be meant: CIM's answer would be the empty one, which looks like "there are
/// none".
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

/// One of the four operations, its results on their way to a writer.
using Operation = std::function<broker::Status(Operations& cim, const broker::ObjectPath& path,
                                               const broker::AssociationFilter& filter,
                                               const broker::Selection& selection, ResultWriter& writer)>;

/// `top` is the class that the results are of, as the command line has it.
void follow(const Arguments& arguments, Results results, const char* what, const std::string& top,
            const Operation& operation) {
  Session session(arguments);
  const auto writer = makeResultWriter(arguments.output, session.layout(), Count::Many, results);
  const broker::AssociationFilter filter = filterOf(session, arguments);
  const broker::Selection selection = selectionOf(session, arguments, session.classes()->find(top));
  const broker::ObjectPath path = resolvePath(session, arguments.target);
  requireAnAssociation(session, path, filter);
  const broker::Status status = operation(session.cim(), path, filter, selection, *writer);
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
  follow(arguments, Results::Instances, "associators", arguments.resultClass,
         [](auto& cim, const auto& path, const auto& filter, const auto& selection, ResultWriter& writer) {
           return cim.associators(path, filter, selection, into<broker::Instance>(writer));
         });
}

void showAssociatorNames(const Arguments& arguments) {
  follow(arguments, Results::Names, "associator names", {},
         [](auto& cim, const auto& path, const auto& filter, const auto&, ResultWriter& writer) {
           return cim.associatorNames(path, filter, into<broker::ObjectPath>(writer));
         });
}

void showReferences(const Arguments& arguments) {
  follow(arguments, Results::Instances, "references", arguments.associationClass,
         [](auto& cim, const auto& path, const auto& filter, const auto& selection, ResultWriter& writer) {
           return cim.references(path, filter, selection, into<broker::Instance>(writer));
         });
}

void showReferenceNames(const Arguments& arguments) {
  follow(arguments, Results::Names, "reference names", {},
         [](auto& cim, const auto& path, const auto& filter, const auto&, ResultWriter& writer) {
           return cim.referenceNames(path, filter, into<broker::ObjectPath>(writer));
         });
}

}  // namespace zorva::cli
