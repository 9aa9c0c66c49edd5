// dns, domain, suffixes: short commands for people, made of CIM operations.

#include <ProviderUtilities.h>
#include <arpa/inet.h>
#include <netinet/in.h>

#include <algorithm>
#include <cstring>

#include "cli/commands/Commands.h"
#include "cli/output/Failure.h"
#include "cli/output/JsonOutput.h"
#include "cli/output/ResultWriter.h"
#include "cli/output/Text.h"
#include "cli/output/ValueText.h"
#include "cli/session/Assignments.h"
#include "cli/session/Change.h"
#include "cli/session/HostView.h"
#include "cli/session/Session.h"
#include "util/Names.h"

namespace zorva::cli {

namespace {

constexpr const char* kServers = "DNSServerAddresses";
constexpr const char* kSuffixes = "DNSSuffixesToAppend";

/// The settings of an interface. If the host and its service processor have one of the same name, the host's: both use
/// the same file.
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

/// An address in a form that is equal for all its spellings.
struct Address {
  int family = AF_UNSPEC;  ///< AF_UNSPEC: the text is no address
  std::string bytes;
  std::string zone;  ///< the text after "%" in an IPv6 address

  bool operator==(const Address&) const = default;
};

/// An address for inet_pton; an IPv6 one may have a zone.
Address addressOf(const std::string& text) {
  const std::string address = text.substr(0, text.find('%'));
  const bool hasZone = address.size() < text.size();
  in6_addr bytes{};
  if (!hasZone && ::inet_pton(AF_INET, address.c_str(), &bytes) == 1) {
    return {AF_INET, {reinterpret_cast<const char*>(&bytes), sizeof(in_addr)}, {}};
  }
  if (::inet_pton(AF_INET6, address.c_str(), &bytes) != 1 || text.back() == '%' ||
      text.find(' ') != std::string::npos) {
    return {};
  }
  const char* from = reinterpret_cast<const char*>(&bytes);
  if (IN6_IS_ADDR_V4MAPPED(&bytes)) return {AF_INET, {from + sizeof(in6_addr) - sizeof(in_addr), sizeof(in_addr)}, {}};
  return {AF_INET6, {from, sizeof(in6_addr)}, hasZone ? text.substr(address.size() + 1) : std::string()};
}

bool isMulticast(const Address& address) {
  const auto first = static_cast<unsigned char>(address.bytes.front());
  return address.family == AF_INET ? (first & 0xF0U) == 0xE0U : first == 0xFFU;
}

bool isUnspecified(const Address& address) { return address.bytes.find_first_not_of('\0') == std::string::npos; }

Failure refused(const std::string& word, const std::string& why, const std::string& hint = {}) {
  return {ExitCode::WrongUsage, "'" + printable(word) + "' " + why, hint};
}

void requireServer(const std::string& text) {
  requirePlainText("SERVER", text);
  const Address address = addressOf(text);
  if (address.family == AF_UNSPEC) {
    throw refused(text, "is no IP address", "a server is given by its address: 192.0.2.53 or 2001:db8::53");
  }
  if (isMulticast(address)) throw refused(text, "is a multicast address; no server has one");
  if (isUnspecified(address)) throw refused(text, "is the unspecified address; no server has it");
}

/// Checked as in the providers, because a server might check too.
bool isName(const std::string& text) { return ZV::ProviderUtilities::ValidateInput(text, {}) != 0; }

constexpr const char* kNameRule =
    "letters, digits, '-' and '_' between single dots, at most 63 in each part and 253 in all";

void requireSuffix(const std::string& text) {
  requirePlainText("SUFFIX", text);
  if (text.empty() || !isName(text)) throw refused(text, "is no suffix", std::string("a suffix is ") + kNameRule);
}

bool sameServer(const std::string& a, const std::string& b) {
  const Address address = addressOf(a);
  return a == b || (address.family != AF_UNSPEC && address == addressOf(b));
}

bool sameSuffix(const std::string& a, const std::string& b) {
  const auto plain = [](std::string_view text) { return text.substr(0, text.size() - (text.ends_with('.') ? 1 : 0)); };
  return util::sameName(plain(a), plain(b));
}

using Same = bool (*)(const std::string& a, const std::string& b);

bool isAmong(const std::string& text, const std::vector<std::string>& texts, Same same) {
  return std::any_of(texts.begin(), texts.end(), [&](const std::string& each) { return same(each, text); });
}

/// Checks each word, and that none is given twice.
void requireEach(const std::vector<std::string>& words, void (*require)(const std::string& word), Same same) {
  std::vector<std::string> before;
  for (const std::string& word : words) {
    require(word);
    if (isAmong(word, before, same)) throw refused(word, "is given twice");
    before.push_back(word);
  }
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

std::vector<std::string> with(std::vector<std::string> texts, const std::vector<std::string>& added, Same same) {
  for (const std::string& text : added) {
    if (!isAmong(text, texts, same)) texts.push_back(text);
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
  requireEach(arguments.values, requireServer, sameServer);
  Session session(arguments);
  const Session::Changing alone(session, arguments.dryRun);
  change(session, arguments, settingOfInterface(session, arguments.target), kServers,
         broker::Value::textArray(arguments.values));
}

void addServers(const Arguments& arguments) {
  requireReadable(arguments, "dns add");
  requireEach(arguments.values, requireServer, sameServer);
  Session session(arguments);
  const Session::Changing alone(session, arguments.dryRun);
  const broker::Instance setting = settingOfInterface(session, arguments.target);
  change(session, arguments, setting, kServers,
         broker::Value::textArray(with(listOf(setting, kServers), arguments.values, sameServer)));
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
  const std::string& name = arguments.values.front();
  requirePlainText("NAME", name);
  if (!isName(name)) throw refused(name, std::string("is no domain name: it has ") + kNameRule);
  Session session(arguments);
  const Session::Changing alone(session, arguments.dryRun);
  change(session, arguments, settingOfInterface(session, arguments.target), "DomainName", broker::Value::text(name));
}

void showSuffixes(const Arguments& arguments) {
  requireReadable(arguments, "suffixes show");
  Session session(arguments);
  showList(arguments, listOf(settingOfHost(session), kSuffixes));
}

void setSuffixes(const Arguments& arguments) {
  requireReadable(arguments, "suffixes set");
  requireEach(arguments.values, requireSuffix, sameSuffix);
  Session session(arguments);
  const Session::Changing alone(session, arguments.dryRun);
  change(session, arguments, settingOfHost(session), kSuffixes, broker::Value::textArray(arguments.values));
}

void addSuffixes(const Arguments& arguments) {
  requireReadable(arguments, "suffixes add");
  requireEach(arguments.values, requireSuffix, sameSuffix);
  Session session(arguments);
  const Session::Changing alone(session, arguments.dryRun);
  const broker::Instance setting = settingOfHost(session);
  change(session, arguments, setting, kSuffixes,
         broker::Value::textArray(with(listOf(setting, kSuffixes), arguments.values, sameSuffix)));
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
