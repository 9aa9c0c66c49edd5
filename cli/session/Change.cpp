#include "cli/session/Change.h"

#include <cmpidt.h>

#include <algorithm>
#include <optional>

#include "cli/output/Console.h"
#include "cli/output/Failure.h"
#include "cli/output/Table.h"
#include "cli/output/Text.h"
#include "cli/output/ValueText.h"
#include "cli/session/HostView.h"
#include "frontend/HostApply.h"
#include "frontend/ReadBack.h"
#include "frontend/SettingPlace.h"
#include "util/Names.h"

namespace zorva::cli {

namespace {

bool isEmpty(const broker::Value& value) { return broker::hasSameEffect(value, broker::Value::null(value.type)); }

/// Why a server reports success although nothing was stored.
std::string reasonThere(const broker::Instance& now, const broker::Property& change) {
  if (change.value.isNull) return frontend::reasonOnThisHost(now, change);
  const char* key = frontend::settingKey(now.path.className, change.name);
  if (key == nullptr) return "the server took it and still says otherwise";
  return std::string("the interface's file of settings there is missing, or has no line ") + key +
         "=; 'zorvactl ifcfg init', run on that host, makes it, then repeat this";
}

broker::Instance instanceToSend(const broker::Instance& found, const std::vector<broker::Property>& changes,
                                bool only) {
  broker::Instance sent;
  sent.path = found.path;
  sent.declaration = found.declaration;
  // The endpoint's provider stores every value, even an empty text if the host has none; that would hide a later value
  // of the host.
  const bool storesAll = found.path.className == kEndpointClass;
  for (const broker::Property& property : found.properties) {
    const bool isChanged = std::any_of(changes.begin(), changes.end(), [&](const broker::Property& change) {
      return util::sameName(change.name, property.name);
    });
    if (only || isChanged || property.value.isNull || (storesAll && isEmpty(property.value))) continue;
    sent.properties.push_back(property);
  }
  sent.properties.insert(sent.properties.end(), changes.begin(), changes.end());
  return sent;
}

broker::Instance fetched(Session& session, const broker::ObjectPath& path) {
  auto instance = session.cim().getInstance(path, {});
  if (!instance) {
    throw operationFailure(shortPathText(path), instance.error(),
                           "zorvactl names " + path.className + " lists what there is");
  }
  return std::move(*instance);
}

/// A failure if there is no file for a change: then the value is equal only because the host has it too.
broker::Status checkFiles(const broker::Instance& now, const std::vector<broker::Property>& wanted) {
  std::vector<frontend::LostChange> lost;
  for (const broker::Property& change : wanted) {
    if (auto reason = frontend::missingFile(now, change.name)) lost.push_back({change.name, *reason});
  }
  return frontend::statusOf(lost);
}

void requireModified(const Session& session, const broker::ObjectPath& path, const broker::Status& status) {
  if (status.ok()) return;
  throw operationFailure("modifying " + shortPathText(path), status,
                         status.rc == CMPI_RC_ERR_INVALID_PARAMETER
                             ? "a host or domain name may hold letters, digits, '-', '_' and '.'; what else was to be "
                               "changed may be stored already: zorvactl get shows it"
                             : nextStepIfDenied(session, status));
}

}  // namespace

namespace {

/// The changed values, as rows to be put together with those of other hosts.
void writeChangedRows(const Session& session, const broker::Instance& instance,
                      const std::vector<broker::Property>& changes) {
  Table table({"OBJECT", "PROPERTY", "VALUE"});
  for (const broker::Property& change : changes) {
    const broker::Value* value = instance.property(change.name);
    const bool isNull = value == nullptr || value->isNull;
    table.add({shortPathText(instance.path), change.name, isNull ? "-" : valueText(*value, change.declaration)});
  }
  writeTable(table, session.layout());
}

}  // namespace

void bringToHost(const broker::ObjectPath& path) {
  const frontend::HostEffect effect = frontend::applyToHost(path, frontend::SettingsLockIs::Held);
  if (!effect.status.ok())
    throw Failure(ExitCode::Failed, printable(effect.status.message), "zorvactl apply tries again");
  if (!effect.done.empty()) tellNote(printable(effect.done));
}

broker::Instance changeInstance(Session& session, const broker::ObjectPath& path,
                                const std::vector<broker::Property>& changes, const ChangeOptions& options) {
  const broker::Instance found = fetched(session, path);
  broker::Instance sent = instanceToSend(found, changes, options.only);
  if (options.dryRun) {
    for (const broker::Property& change : changes) {
      const auto reason = session.isRemote() ? std::nullopt : frontend::missingPlace(found, change.name);
      if (reason) tellWarning(change.name + " would not be stored: " + printable(*reason));
    }
    return sent;
  }
  std::optional<std::vector<std::string>> propertyList;
  if (options.only) {
    propertyList.emplace();
    for (const broker::Property& change : changes) propertyList->push_back(change.name);
  }
  requireModified(session, found.path, session.cim().modifyInstance(sent, propertyList));
  broker::Instance now = fetched(session, found.path);
  // Local changes have been checked already, under the same lock.
  requireModified(session, found.path,
                  session.isRemote() ? frontend::checkChanges(now, changes, reasonThere) : checkFiles(now, changes));
  // A server that is asked does this itself.
  if (!session.isRemote()) bringToHost(found.path);
  return now;
}

void writeChanges(const Session& session, const broker::Instance& instance,
                  const std::vector<broker::Property>& changes, const ChangeOptions& options) {
  if (session.layout().rowsAlone) return writeChangedRows(session, instance, changes);
  write(std::string(options.dryRun ? "would send " : "") + printable(shortPathText(instance.path)) + "\n");
  Table table({}, 2);
  if (options.dryRun) {
    for (const broker::Property& property : instance.properties) {
      table.add({property.name, valueText(property.value, property.declaration)});
    }
  } else {
    // An empty list is returned as null.
    for (const broker::Property& change : changes) {
      const broker::Value* value = instance.property(change.name);
      const bool isNull = value == nullptr || value->isNull;
      table.add({change.name, isNull ? "" : valueText(*value, change.declaration)});
    }
  }
  write(table.text(session.layout()));
}

}  // namespace zorva::cli
