// modify, invoke.

#include <algorithm>

#include "cli/commands/Commands.h"
#include "cli/output/Console.h"
#include "cli/output/Failure.h"
#include "cli/output/JsonOutput.h"
#include "cli/output/Text.h"
#include "cli/output/ValueText.h"
#include "cli/session/Assignments.h"
#include "cli/session/Change.h"
#include "cli/session/HostView.h"
#include "cli/session/Paths.h"
#include "cli/session/Session.h"

namespace zorva::cli {

namespace {

struct ModifyOptions {
  std::string path;
  std::vector<std::string> values;  ///< "NAME=VALUE"
  bool only = false;                ///< send the changed properties alone
};

struct InvokeOptions {
  std::string path;
  std::string method;
  std::vector<std::string> values;  ///< "NAME=VALUE"
};

template <typename Element>
std::vector<std::string> namesOf(const std::vector<Element>& elements) {
  std::vector<std::string> names;
  names.reserve(elements.size());
  for (const auto& element : elements) names.push_back(element->name);
  return names;
}

/// What to do about a method or parameter that is none of these few.
std::string nearestOrAll(const std::string& word, const std::vector<std::string>& known) {
  return nearestOr(word, known, known.empty() ? "it has none" : "it has " + joined(known, ", "));
}

broker::Property parseChange(const schema::Class& declared, const Assignment& assignment) {
  const schema::ClassProperty* property = declared.findProperty(assignment.name);
  if (property == nullptr) {
    throw Failure(ExitCode::WrongUsage,
                  "the class " + declared.name() + " has no property " + printable(assignment.name),
                  nearestOr(assignment.name, namesOf(declared.properties()), "zorvactl get shows those that it has"));
  }
  if (property->isKey) {
    throw Failure(ExitCode::WrongUsage, property->name + " is a key of " + declared.name() + " and cannot be changed");
  }
  return {property->name, parseValue({property->name, property->type, property->isArray}, assignment.texts), property};
}

const schema::ClassMethod& methodNamed(const schema::Class& declared, const std::string& name) {
  const schema::ClassMethod* method = declared.findMethod(name);
  if (method != nullptr) return *method;
  throw Failure(ExitCode::WrongUsage, "the class " + declared.name() + " has no method " + printable(name),
                nearestOrAll(name, namesOf(declared.methods())));
}

broker::NamedValue parseParameter(const schema::ClassMethod& method, const Assignment& assignment) {
  for (const schema::Parameter& parameter : method.parameters) {
    if (!util::sameName(parameter.name, assignment.name)) continue;
    return {parameter.name, parseValue({parameter.name, parameter.type, parameter.isArray}, assignment.texts)};
  }
  std::vector<std::string> names;
  for (const schema::Parameter& parameter : method.parameters) names.push_back(parameter.name);
  throw Failure(ExitCode::WrongUsage, method.name + " has no parameter " + printable(assignment.name),
                nearestOrAll(assignment.name, names));
}

/// "SetDNSDomain takes DNSDomain (string)".
std::string parametersOf(const schema::ClassMethod& method) {
  std::vector<std::string> parameters;
  for (const schema::Parameter& each : method.parameters) {
    parameters.push_back(each.name + " (" + std::string(schema::typeName(each.type)) +
                         (each.isArray ? ", repeated" : "") + ")");
  }
  return method.name + " takes " + (parameters.empty() ? "no parameters" : joined(parameters, ", "));
}

/// Values with their names; the object before them where there are several hosts.
Table valueTable(const broker::ObjectPath& path, const std::vector<broker::NamedValue>& values, const Layout& layout) {
  Table table(layout.rowsAlone ? std::vector<std::string>{"OBJECT", "NAME", "VALUE"} : std::vector<std::string>());
  for (const broker::NamedValue& each : values) {
    std::vector<Cell> row{each.name, valueText(each.value, nullptr)};
    if (layout.rowsAlone) row.insert(row.begin(), shortPathText(path));
    table.add(std::move(row));
  }
  return table;
}

Table resultTable(const broker::ObjectPath& path, const broker::MethodResult& result, const Layout& layout) {
  std::vector<broker::NamedValue> values{{"ReturnValue", result.returnValue}};
  values.insert(values.end(), result.output.begin(), result.output.end());
  return valueTable(path, values, layout);
}

/// What would be called.
void writeCall(const Globals& globals, const Session& session, const broker::ObjectPath& path,
               const schema::ClassMethod& method, const std::vector<broker::NamedValue>& input) {
  if (globals.output == OutputFormat::Json) {
    write(methodCallJson(path, method.name, input) + "\n");
    return;
  }
  std::vector<broker::NamedValue> values{{"method", broker::Value::text(method.name)}};
  values.insert(values.end(), input.begin(), input.end());
  if (!session.layout().rowsAlone) write("would call " + method.name + " of " + printable(shortPathText(path)) + "\n");
  writeTable(valueTable(path, values, session.layout()), session.layout());
}

void modifyInstance(const Globals& globals, const ModifyOptions& options) {
  Session session(globals);
  const std::vector<Assignment> assignments = parseAssignments(options.values);
  const broker::ObjectPath path = resolvePath(session, options.path);
  const schema::Class& declared = session.classNamed(path.className);
  std::vector<broker::Property> changes;
  changes.reserve(assignments.size());
  for (const Assignment& assignment : assignments) changes.push_back(parseChange(declared, assignment));

  const ChangeOptions change{options.only, globals.dryRun};
  const Session::Changing alone(session, change.dryRun);
  const broker::Instance instance = changeInstance(session, path, changes, change);
  if (globals.output == OutputFormat::Json) {
    write(instanceDocument(instance) + "\n");
  } else {
    writeChanges(session, instance, changes, change);
  }
}

void invokeMethod(const Globals& globals, const InvokeOptions& options) {
  Session session(globals);
  const std::vector<Assignment> assignments = parseAssignments(options.values);
  const broker::ObjectPath path = resolvePath(session, options.path);
  const schema::ClassMethod& method = methodNamed(session.classNamed(path.className), options.method);
  std::vector<broker::NamedValue> input;
  input.reserve(assignments.size());
  for (const Assignment& assignment : assignments) input.push_back(parseParameter(method, assignment));

  if (globals.dryRun) return writeCall(globals, session, path, method, input);
  const auto result = session.cim().invokeMethod(path, method.name, input);
  if (!result) {
    const std::string hint = nextStepIfDenied(session, result.error());
    throw operationFailure(method.name + " of " + shortPathText(path), result.error(),
                           hint.empty() ? parametersOf(method) : hint);
  }
  if (globals.output == OutputFormat::Json) {
    write(methodResultJson(*result) + "\n");
  } else {
    writeTable(resultTable(path, *result, session.layout()), session.layout());
  }
  if (const std::string value = valueText(result->returnValue, nullptr); value != "0" && !result->returnValue.isNull) {
    throw Failure(ExitCode::Failed, method.name + " returned " + value);
  }
  // A method that sets something was asked to store it.
  if (path.className == kEndpointClass && method.name.starts_with("Set")) {
    throw Failure(ExitCode::Failed, "nothing was stored: " + method.name + " checks and answers, and changes nothing",
                  "'zorvactl dns', 'domain', 'suffixes' and 'modify' change settings");
  }
}

}  // namespace

void addModifyCommand(CommandLine& line) {
  const auto options = std::make_shared<ModifyOptions>();
  line.add("modify", "Change properties of an instance")
      .alias("mi")
      .writesJson()
      .changes()
      .gathers()
      .examples(
          "  zorvactl modify 'ZORVA_DNSSettingData.InstanceID=\"Computer%eth0\"' DomainName=lab.example.org\n"
          "  zorvactl modify 'ZORVA_DNSSettingData.InstanceID=\"Computer%eth0\"' \\\n"
          "    DNSServerAddresses=192.0.2.1 DNSServerAddresses=192.0.2.2\n"
          "  zorvactl modify 'ZORVA_DNSProtocolEndPoint.Name=\"eth0\"' DomainName=node.example.org --dry-run")
      .word("PATH", "Its object path", options->path)
      .words("NAME=VALUE", "A property; repeat its name for an array, NAME= empties it, NAME=null is CIM's NULL",
             Many::Some, options->values, "PROPERTY=")
      .flag("--only", "Send these properties alone, and not the others as they were read", options->only)
      .dryRun("Show what would be sent, and send nothing")
      .runs<ModifyOptions>(modifyInstance, options);
}

void addInvokeCommand(CommandLine& line) {
  const auto options = std::make_shared<InvokeOptions>();
  line.add("invoke", "Call a method of an instance")
      .alias("cm")
      .writesJson()
      .changes()
      .gathers()
      .examples("  zorvactl invoke 'ZORVA_DNSProtocolEndPoint.Name=\"eth0\"' SetDNSDomain DNSDomain=x.example.org")
      .word("PATH", "Its object path", options->path)
      .word("METHOD", "The method", options->method)
      .words("NAME=VALUE", "A parameter; repeat its name for an array", Many::Any, options->values, "PARAMETER=")
      .dryRun("Show what would be called, and call nothing")
      .runs<InvokeOptions>(invokeMethod, options);
}

}  // namespace zorva::cli
