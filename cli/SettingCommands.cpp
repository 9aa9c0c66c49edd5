// dns, domain, suffixes: what a person wants to type, made of the CIM operations.
#include <arpa/inet.h>

#include <algorithm>
#include <cstring>
#include <optional>

#include "cli/Assignments.h"
#include "cli/Change.h"
#include "cli/Commands.h"
#include "cli/Failure.h"
#include "cli/HostView.h"
#include "cli/JsonOutput.h"
#include "cli/ResultWriter.h"
#include "cli/Session.h"
#include "cli/Text.h"
#include "cli/ValueText.h"

namespace zorva::cli {

namespace {

constexpr const char* kServers = "DNSServerAddresses";
constexpr const char* kSuffixes = "DNSSuffixesToAppend";

/// The settings of an interface. Where the host and its service processor have one of the same name, the host's: both
/// would be kept in the same file.
broker::Instance settingOfInterface(Session& session, const std::string& interface) {
  const std::vector<broker::Instance> all = instancesOf(session, kSettingClass);
  const broker::Instance* found = nullptr;
  std::vector<std::string> names;
  for (const broker::Instance& instance : all) {
    const std::string name = interfaceOfSetting(instance);
    if (name == interface && (found == nullptr || propertyText(instance, "InstanceID").starts_with("Computer%"))) {
      found = &instance;
    }
    if (names.size() < 20) names.push_back(printable(name));
  }
  if (found != nullptr) return *found;
  throw Failure(ExitCode::Failed, "there are no DNS settings of an interface " + printable(interface),
                names.empty() ? "this host has no interfaces" : "there are those of " + joined(names, ", "));
}

broker::Instance settingOfHost(Session& session) {
  const std::vector<broker::Instance> all = instancesOf(session, kGeneralSettingClass);
  if (!all.empty()) return all.front();
  throw Failure(ExitCode::Failed, "this host has no general DNS settings: it has no interface that could hold them");
}

std::vector<std::string> listOf(const broker::Instance& instance, std::string_view property) {
  std::vector<std::string> texts;
  const broker::Value* value = instance.property(property);
  if (value == nullptr) return texts;
  for (const broker::Scalar& element : value->elements) texts.push_back(scalarText(element));
  return texts;
}

void change(Session& session, const Arguments& arguments, const broker::Instance& instance, const char* property,
            broker::Value value) {
  const schema::Class& declared = session.classNamed(instance.path.className);
  const std::vector<broker::Property> changes{{property, std::move(value), declared.findProperty(property)}};
  const ChangeOptions options{false, arguments.dryRun};
  const broker::Instance now = changeInstance(session, instance.path, changes, options);
  if (arguments.output == OutputFormat::Json) {
    write(instanceJson(now, 0) + "\n");
  } else {
    writeChanges(session, now, changes, options);
  }
}

void showList(const Arguments& arguments, const std::vector<std::string>& texts) {
  if (arguments.output == OutputFormat::Json) {
    write(textsJson(texts) + "\n");
    return;
  }
  for (const std::string& text : texts) write(printable(text) + "\n");
}

void requireReadable(const Arguments& arguments, const char* subcommand) {
  requireFormat(arguments.output, {OutputFormat::Table, OutputFormat::Json}, subcommand);
}

/// An address as inet_pton has it, with a zone behind an IPv6 one or not.
void requireAddress(const std::string& text) {
  requirePlainText("SERVER", text);
  const std::string address = text.substr(0, text.find('%'));
  const bool hasZone = address.size() < text.size();
  unsigned char bytes[sizeof(in6_addr)];
  const bool isV4 = !hasZone && ::inet_pton(AF_INET, address.c_str(), bytes) == 1;
  const bool isV6 =
      ::inet_pton(AF_INET6, address.c_str(), bytes) == 1 && text.back() != '%' && text.find(' ') == std::string::npos;
  if (isV4 || isV6) return;
  throw Failure(ExitCode::WrongUsage, "'" + printable(text) + "' is no IP address",
                "a server is given by its address: 192.0.2.53 or 2001:db8::53");
}

void requireSuffix(const std::string& text) {
  requirePlainText("SUFFIX", text);
  if (!text.empty() && text.find(' ') == std::string::npos) return;
  throw Failure(ExitCode::WrongUsage, "'" + printable(text) + "' is no suffix: it is empty or holds a blank",
                "give each suffix as a word of its own");
}

std::vector<std::string> without(std::vector<std::string> texts, const std::vector<std::string>& removed,
                                 const char* what) {
  for (const std::string& text : removed) {
    const auto found = std::find(texts.begin(), texts.end(), text);
    if (found == texts.end()) {
      throw Failure(ExitCode::Failed, std::string("there is no ") + what + " " + printable(text) + " to remove",
                    texts.empty() ? "there are none" : "there are " + printable(joined(texts, ", ")));
    }
    texts.erase(std::remove(texts.begin(), texts.end(), text), texts.end());
  }
  return texts;
}

std::vector<std::string> with(std::vector<std::string> texts, const std::vector<std::string>& added) {
  for (const std::string& text : added) {
    if (std::find(texts.begin(), texts.end(), text) == texts.end()) texts.push_back(text);
  }
  return texts;
}

}  // namespace

void showServers(const Arguments& arguments) {
  requireReadable(arguments, "dns show");
  Session session(arguments);
  showList(arguments, listOf(settingOfInterface(session, arguments.target), kServers));
}

void setServers(const Arguments& arguments) {
  requireReadable(arguments, "dns set");
  for (const std::string& server : arguments.values) requireAddress(server);
  Session session(arguments);
  const Session::Changing alone(session, arguments.dryRun);
  change(session, arguments, settingOfInterface(session, arguments.target), kServers,
         broker::Value::textArray(arguments.values));
}

void addServers(const Arguments& arguments) {
  requireReadable(arguments, "dns add");
  for (const std::string& server : arguments.values) requireAddress(server);
  Session session(arguments);
  const Session::Changing alone(session, arguments.dryRun);
  const broker::Instance setting = settingOfInterface(session, arguments.target);
  change(session, arguments, setting, kServers,
         broker::Value::textArray(with(listOf(setting, kServers), arguments.values)));
}

void removeServers(const Arguments& arguments) {
  requireReadable(arguments, "dns remove");
  Session session(arguments);
  const Session::Changing alone(session, arguments.dryRun);
  const broker::Instance setting = settingOfInterface(session, arguments.target);
  change(session, arguments, setting, kServers,
         broker::Value::textArray(without(listOf(setting, kServers), arguments.values, "server")));
}

void setDomain(const Arguments& arguments) {
  requireReadable(arguments, "domain");
  requirePlainText("NAME", arguments.values.front());
  Session session(arguments);
  const Session::Changing alone(session, arguments.dryRun);
  change(session, arguments, settingOfInterface(session, arguments.target), "DomainName",
         broker::Value::text(arguments.values.front()));
}

void showSuffixes(const Arguments& arguments) {
  requireReadable(arguments, "suffixes show");
  Session session(arguments);
  showList(arguments, listOf(settingOfHost(session), kSuffixes));
}

void setSuffixes(const Arguments& arguments) {
  requireReadable(arguments, "suffixes set");
  for (const std::string& suffix : arguments.values) requireSuffix(suffix);
  Session session(arguments);
  const Session::Changing alone(session, arguments.dryRun);
  change(session, arguments, settingOfHost(session), kSuffixes, broker::Value::textArray(arguments.values));
}

void addSuffixes(const Arguments& arguments) {
  requireReadable(arguments, "suffixes add");
  for (const std::string& suffix : arguments.values) requireSuffix(suffix);
  Session session(arguments);
  const Session::Changing alone(session, arguments.dryRun);
  const broker::Instance setting = settingOfHost(session);
  change(session, arguments, setting, kSuffixes,
         broker::Value::textArray(with(listOf(setting, kSuffixes), arguments.values)));
}

void removeSuffixes(const Arguments& arguments) {
  requireReadable(arguments, "suffixes remove");
  Session session(arguments);
  const Session::Changing alone(session, arguments.dryRun);
  const broker::Instance setting = settingOfHost(session);
  change(session, arguments, setting, kSuffixes,
         broker::Value::textArray(without(listOf(setting, kSuffixes), arguments.values, "suffix")));
}

}  // namespace zorva::cli
