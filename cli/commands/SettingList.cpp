#include "cli/commands/SettingList.h"

#include <algorithm>

#include "cli/output/Console.h"
#include "cli/output/JsonOutput.h"
#include "cli/output/Text.h"
#include "cli/output/ValueText.h"
#include "cli/session/Change.h"
#include "cli/session/HostView.h"
#include "cli/session/SettingFiles.h"

namespace zorva::cli {

namespace {

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

broker::Instance settingOf(Session& session, const ListSetting& setting, const SettingOptions& options) {
  return setting.isOfInterface ? settingOfInterface(session, options.interface) : settingOfHost(session);
}

/// In words, which file the settings of the host are in, and why.
std::string placeOf(const Session& session, const ListSetting& setting) {
  if (setting.isOfInterface || session.isRemote()) return {};
  const std::string interface = interfaceOfHostSettings(session).value_or("");
  return placeOfHostSettings(interface, findSettingFiles(zorva::agent::dataDirectory()).has(interface));
}

/// Replaces the list by the result of `changed`. No other program can change it in the meantime.
template <typename Changed>
void changeList(const ListSetting& setting, const Globals& globals, const SettingOptions& options, Changed changed) {
  Session session(globals);
  const Session::Changing alone(session, globals.dryRun);
  warnOfOrphans(session);
  const broker::Instance instance = settingOf(session, setting, options);
  changeSetting(session, globals, instance, setting.property,
                broker::Value::textArray(changed(listOf(instance, setting.property))));
  const std::string place = globals.output == OutputFormat::Json ? std::string() : placeOf(session, setting);
  if (!place.empty()) write("The suffixes are " + printable(place) + ".\n");
}

}  // namespace

void showList(const ListSetting& setting, const Globals& globals, const SettingOptions& options) {
  Session session(globals);
  warnOfOrphans(session);
  const std::vector<std::string> texts = listOf(settingOf(session, setting, options), setting.property);
  if (globals.output == OutputFormat::Json) {
    write(textsJson(texts) + "\n");
  } else if (session.layout().rowsAlone) {
    Table table({setting.word});
    for (const std::string& text : texts) table.add({text});
    writeTable(table, session.layout());
  } else {
    for (const std::string& text : texts) write(printable(text) + "\n");
  }
  // Not among the suffixes, which are for scripts, too.
  if (const std::string place = placeOf(session, setting); !place.empty()) {
    tellNote("the suffixes are " + printable(place));
  }
}

void setList(const ListSetting& setting, const Globals& globals, const SettingOptions& options) {
  requireEach(options.values, setting.require, setting.same);
  changeList(setting, globals, options, [&](const std::vector<std::string>& /*texts*/) { return options.values; });
}

void addToList(const ListSetting& setting, const Globals& globals, const SettingOptions& options) {
  requireEach(options.values, setting.require, setting.same);
  changeList(setting, globals, options,
             [&](const std::vector<std::string>& texts) { return with(texts, options.values, setting.same); });
}

void removeFromList(const ListSetting& setting, const Globals& globals, const SettingOptions& options) {
  changeList(setting, globals, options,
             [&](const std::vector<std::string>& texts) { return without(texts, options.values, setting.element); });
}

Subcommand addShow(Subcommand& parent, const ListSetting& setting) {
  const auto options = std::make_shared<SettingOptions>();
  Subcommand subcommand = parent.add("show", "Show them");
  subcommand.writesJson().gathers();
  if (setting.isOfInterface) subcommand.interface(options->interface);
  subcommand.runs([&setting, options](const Globals& globals) { showList(setting, globals, *options); });
  return subcommand;
}

Subcommand addChange(Subcommand& parent, const ListSetting& setting, const char* name, const char* description,
                     Many many, ListCommand command) {
  const auto options = std::make_shared<SettingOptions>();
  Subcommand subcommand = parent.add(name, description);
  subcommand.writesJson().changes().gathers();
  if (setting.isOfInterface) subcommand.interface(options->interface);
  subcommand.dryRun()
      .words(setting.word, setting.meaning, many, options->values)
      .runs([&setting, command, options](const Globals& globals) { command(setting, globals, *options); });
  return subcommand;
}

broker::Instance settingOfInterface(Session& session, const std::string& interface) {
  const std::vector<broker::Instance> all = instancesOf(session, kSettingClass);
  const broker::Instance* found = nullptr;
  std::vector<std::string> names;
  for (const broker::Instance& instance : all) {
    const std::string name = interfaceOfSetting(instance);
    if (name == interface && (found == nullptr || propertyText(instance, "InstanceID").starts_with("Computer%"))) {
      found = &instance;
    }
    names.push_back(name);
  }
  if (found != nullptr) return *found;
  throw Failure(ExitCode::Failed, "there are no DNS settings of an interface " + printable(interface),
                names.empty() ? "this host has no interfaces"
                              : nearestOr(interface, names, "zorvactl show --all lists the interfaces"));
}

void changeSetting(Session& session, const Globals& globals, const broker::Instance& instance, const char* property,
                   broker::Value value) {
  const schema::Class& declared = session.classNamed(instance.path.className);
  const std::vector<broker::Property> changes{{property, std::move(value), declared.findProperty(property)}};
  const ChangeOptions change{false, globals.dryRun};
  const broker::Instance now = changeInstance(session, instance.path, changes, change);
  if (globals.output == OutputFormat::Json) {
    write(instanceDocument(now) + "\n");
  } else {
    writeChanges(session, now, changes, change);
  }
}

Failure refused(const std::string& word, const std::string& why, const std::string& hint) {
  return {ExitCode::WrongUsage, "'" + printable(word) + "' " + why, hint};
}

}  // namespace zorva::cli
