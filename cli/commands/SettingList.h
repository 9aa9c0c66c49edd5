#pragma once

// Shared by dns, domain and suffixes: settings, and lists among them, are read, changed and written.

#include <string>
#include <string_view>
#include <vector>

#include "broker/objects/Value.h"
#include "cli/commands/CommandLine.h"
#include "cli/output/Failure.h"
#include "cli/session/Globals.h"
#include "cli/session/Session.h"

namespace zorva::cli {

/// The arguments of such a command.
struct SettingOptions {
  std::string interface;            ///< not for the settings of the host
  std::vector<std::string> values;  ///< servers, suffixes, the name of a domain
};

/// A property that is a list, and how a person names and changes it.
struct ListSetting {
  const char* property;                                      ///< its name in the schema
  const char* element;                                       ///< "server"
  const char* word;                                          ///< "SERVER": an element in the help
  const char* meaning;                                       ///< of that word, for the help
  bool isOfInterface;                                        ///< false: of the host
  void (*require)(const std::string& word);                  ///< throws Failure for a word that can be no element
  bool (*same)(const std::string& a, const std::string& b);  ///< whether two words mean the same element
};

using ListCommand = void (*)(const ListSetting& setting, const Globals& globals, const SettingOptions& options);

void showList(const ListSetting& setting, const Globals& globals, const SettingOptions& options);

/// Replaces the list by the words. Throws Failure if one of them is no valid element or is given twice.
void setList(const ListSetting& setting, const Globals& globals, const SettingOptions& options);

/// Adds those that are not there yet at the end. Throws Failure as setList does.
void addToList(const ListSetting& setting, const Globals& globals, const SettingOptions& options);

/// Throws Failure if one of them is not in the list.
void removeFromList(const ListSetting& setting, const Globals& globals, const SettingOptions& options);

/// Registers a subcommand that shows the list, or one that changes it by words. `setting` must last.
Subcommand addShow(Subcommand& parent, const ListSetting& setting);
Subcommand addChange(Subcommand& parent, const ListSetting& setting, const char* name, const char* description,
                     Many many, ListCommand command);

/// The instance with the settings of an interface. If the host and its service processor have one of the same name, the
/// host's: both use the same file. Throws Failure if there is none.
broker::Instance settingOfInterface(Session& session, const std::string& interface);

/// Changes one property and shows what came of it.
void changeSetting(Session& session, const Globals& globals, const broker::Instance& instance, const char* property,
                   broker::Value value);

/// A Failure (wrong usage) about a word: "'WORD' WHY".
Failure refused(const std::string& word, const std::string& why, const std::string& hint = {});

}  // namespace zorva::cli
