#include "cli/Change.h"

#include <unistd.h>

#include <algorithm>
#include <optional>

#include "agent/Agent.h"
#include "cli/Failure.h"
#include "cli/HostView.h"
#include "cli/SettingFile.h"
#include "cli/Table.h"
#include "cli/Text.h"
#include "cli/ValueText.h"
#include "schema/Names.h"

namespace zorva::cli {

namespace {

/// The settings that go into the interface's file, and the key of each there.
struct FileSetting {
  const char* className;
  const char* property;
  const char* key;
};

constexpr FileSetting kFileSettings[] = {
    {kSettingClass, "RequestedHostname", "HOSTNAME"},
    {kSettingClass, "DomainName", "DOMAINNAME"},
    {kSettingClass, "DNSServerAddresses", "DNSSERVERS"},
    {kSettingClass, "ConfigurationName", "CONFIG_NAME"},
    {kGeneralSettingClass, "DNSSuffixesToAppend", "DNSSUFFIXES"},
    {kGeneralSettingClass, "ConfigurationName", "CONFIG_NAME"},
};

const FileSetting* fileSetting(const broker::Instance& instance, std::string_view property) {
  const auto found = std::find_if(std::begin(kFileSettings), std::end(kFileSettings), [&](const FileSetting& each) {
    return instance.path.className == each.className && schema::sameName(each.property, property);
  });
  return found == std::end(kFileSettings) ? nullptr : found;
}

bool isEmpty(const broker::Value& value) {
  if (value.isNull) return true;
  return value.isArray ? value.elements.empty() : scalarText(value.scalar).empty();
}

/// What a client of the providers sees as the same: null and empty are one to them.
bool sameEffect(const broker::Value& wanted, const broker::Value* now) {
  if (now == nullptr || isEmpty(*now)) return isEmpty(wanted);
  return wanted.isArray == now->isArray && wanted.scalar == now->scalar && wanted.elements == now->elements;
}

/// Why the providers, asked to change this setting, would find no place for it in the file; nothing where they would.
std::optional<std::string> missingPlace(const SettingFile& file, const std::string& interface, const char* key) {
  const std::string name = printable(interface);
  if (!file.exists()) {
    return printable(file.path()) + " does not exist; 'zorvactl ifcfg init " + name + "' makes it, then repeat this";
  }
  try {
    if (file.hasPlaceFor(key)) return std::nullopt;
  } catch (const Failure& failure) {
    return std::string(failure.what());
  }
  return printable(file.path()) + " has no line " + key + "=; add it, or let 'zorvactl ifcfg init " + name +
         " --force' write all six, then repeat this";
}

/// For each change the reason why it will come to nothing, where that can be told beforehand.
std::vector<std::string> foreseenProblems(const Session& session, const broker::Instance& instance,
                                          const std::vector<broker::Property>& changes) {
  std::vector<std::string> problems(changes.size());
  if (session.isRemote()) return problems;
  for (std::size_t i = 0; i < changes.size(); ++i) {
    const FileSetting* setting = fileSetting(instance, changes[i].name);
    if (setting == nullptr) continue;
    const bool isGeneral = instance.path.className == kGeneralSettingClass;
    const std::string interface =
        isGeneral ? interfaceOfHostSettings(session).value_or("") : interfaceOfSetting(instance);
    if (interface.empty()) {
      problems[i] = "the interface has no name, and so no file";
      continue;
    }
    problems[i] = missingPlace(SettingFile(interface), interface, setting->key).value_or("");
  }
  return problems;
}

/// Why a change did not take effect although nothing was foreseen.
std::string unforeseenProblem(const Session& session, const broker::Instance& instance,
                              const broker::Property& change) {
  if (change.value.isNull) return "null leaves the value as it is; " + change.name + "= empties it";
  if (session.isRemote()) {
    const FileSetting* setting = fileSetting(instance, change.name);
    if (setting == nullptr) return "the server took it and still says otherwise";
    return std::string("the interface's file of settings there is missing, or has no line ") + setting->key +
           "=; 'zorvactl ifcfg init', run on that host, makes it, then repeat this";
  }
  if (fileSetting(instance, change.name) != nullptr) {
    return "the file cannot be written, or does not hold the value as it was given";
  }
  if (instance.path.className == kEndpointClass &&
      (change.name == "DNSSuffixesToAppend" || change.name == "DomainName" || change.name == "Hostname")) {
    return "the agent could not store it in " + printable(zorvagent::dataDirectory()) + "; is that there and writable?";
  }
  return "the provider changes no " + change.name;
}

broker::Instance instanceToSend(const broker::Instance& found, const std::vector<broker::Property>& changes,
                                bool only) {
  broker::Instance sent;
  sent.path = found.path;
  sent.declaration = found.declaration;
  // What the endpoint's provider gets is stored, also an empty text where the host says nothing; that would hide what
  // the host says later.
  const bool storesAll = found.path.className == kEndpointClass;
  for (const broker::Property& property : found.properties) {
    const bool isChanged = std::any_of(changes.begin(), changes.end(), [&](const broker::Property& change) {
      return schema::sameName(change.name, property.name);
    });
    if (!only && !isChanged && !(storesAll && isEmpty(property.value))) sent.properties.push_back(property);
  }
  sent.properties.insert(sent.properties.end(), changes.begin(), changes.end());
  return sent;
}

broker::Instance fetched(Session& session, const broker::ObjectPath& path) {
  broker::Instance instance;
  const broker::Status status = session.cim().getInstance(path, {}, instance);
  if (!status.ok()) {
    throw operationFailure(shortPathText(path), status, "zorvactl names " + path.className + " lists what there is");
  }
  return instance;
}

void warnOfLostChanges(const Session& session, const broker::Instance& now,
                       const std::vector<broker::Property>& changes, const std::vector<std::string>& foreseen) {
  for (std::size_t i = 0; i < changes.size(); ++i) {
    const bool isThere = sameEffect(changes[i].value, now.property(changes[i].name));
    if (foreseen[i].empty() && isThere) continue;
    tellWarning(changes[i].name + " was not stored: " +
                (foreseen[i].empty() ? unforeseenProblem(session, now, changes[i]) : foreseen[i]));
  }
}

}  // namespace

broker::Instance changeInstance(Session& session, const broker::ObjectPath& path,
                                const std::vector<broker::Property>& changes, const ChangeOptions& options) {
  const broker::Instance found = fetched(session, path);
  broker::Instance sent = instanceToSend(found, changes, options.only);
  const std::vector<std::string> foreseen = foreseenProblems(session, found, changes);
  if (options.dryRun) {
    for (std::size_t i = 0; i < changes.size(); ++i) {
      if (!foreseen[i].empty()) tellWarning(changes[i].name + " would not be stored: " + foreseen[i]);
    }
    return sent;
  }
  std::optional<std::vector<std::string>> propertyList;
  if (options.only) {
    propertyList.emplace();
    for (const broker::Property& change : changes) propertyList->push_back(change.name);
  }
  const broker::Status status = session.cim().modifyInstance(sent, propertyList);
  if (!status.ok()) {
    throw operationFailure("modifying " + shortPathText(found.path), status,
                           status.rc == 4 ? "a host or domain name may hold letters, digits, '-', '_' and '.'; what "
                                            "else was to be changed may be stored already: zorvactl get shows it"
                                          : "");
  }
  broker::Instance now = fetched(session, found.path);
  warnOfLostChanges(session, now, changes, foreseen);
  return now;
}

void writeChanges(const Session& session, const broker::Instance& instance,
                  const std::vector<broker::Property>& changes, const ChangeOptions& options) {
  write(std::string(options.dryRun ? "would send " : "") + printable(shortPathText(instance.path)) + "\n");
  Table table({}, 2);
  if (options.dryRun) {
    for (const broker::Property& property : instance.properties) {
      table.add({property.name, valueText(property.value, property.declaration)});
    }
  } else {
    // An empty list is not among the properties that come back.
    for (const broker::Property& change : changes) {
      const broker::Value* value = instance.property(change.name);
      table.add({change.name, value == nullptr ? "" : valueText(*value, change.declaration)});
    }
  }
  write(table.text(session.layout()));
}

}  // namespace zorva::cli
