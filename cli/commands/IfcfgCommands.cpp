// ifcfg init, ifcfg show, ifcfg list, ifcfg remove, ifcfg adopt.

#include <pwd.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <iterator>

#include "agent/Agent.h"
#include "cli/commands/Commands.h"
#include "cli/commands/ViewJson.h"
#include "cli/output/Console.h"
#include "cli/output/Failure.h"
#include "cli/output/Text.h"
#include "cli/session/Change.h"
#include "cli/session/HostView.h"
#include "cli/session/Session.h"
#include "cli/session/SettingFile.h"
#include "cli/session/SettingFiles.h"
#include "util/InstalledPlaces.h"

namespace zorva::cli {

namespace {

struct InitOptions {
  std::string interface;
  bool force = false;
};

std::string settingTable(const std::vector<SettingLine>& lines, const Layout& layout) {
  Table table({}, 2);
  for (const SettingLine& line : lines) table.add({line.key, line.value});
  for (const char* key : kSettingKeys) {
    const bool isThere =
        std::any_of(lines.begin(), lines.end(), [key](const SettingLine& line) { return line.key == key; });
    if (!isThere) table.add({key, Cell("(no such line: counts as empty, and cannot be changed)", Style::Warning)});
  }
  return table.text(layout);
}

/// A fresh installation has no data directory yet. A missing one with another name is probably misspelt.
void makeDefaultDirectory() {
  const std::string directory = zorva::agent::dataDirectory();
  if (directory != util::installedPlaces().data || ::geteuid() != 0) return;
  // The user of the server, if there is one, owns it; then the rest of the host reads through the server.
  const passwd* const server = ::getpwnam("zorva");
  if (::mkdir(directory.c_str(), server != nullptr ? 0750 : 0755) == 0) {
    if (server == nullptr || ::chown(directory.c_str(), server->pw_uid, server->pw_gid) == 0) return;
  } else if (errno == EEXIST) {
    return;
  }
  throw Failure(ExitCode::Failed, directory + ": cannot be made: " + std::strerror(errno));
}

void initInterfaceFile(const Globals& globals, const InitOptions& options) {
  Session session(globals);
  const auto tree = session.tree();
  const SettingFile file(options.interface);
  const std::vector<SettingLine> lines = settingsOfHost(interfaceNode(*tree, options.interface));
  if (!globals.dryRun) {
    makeDefaultDirectory();
    const Session::Changing alone(session);
    file.write(lines, options.force);
  }
  if (globals.output == OutputFormat::Json) {
    write(settingFileJson(file.path(), lines) + "\n");
    return;
  }
  write((globals.dryRun ? "would write " : "") + printable(file.path()) + "\n" + settingTable(lines, session.layout()));
}

void showInterfaceFile(const Globals& globals, const std::string& interface) {
  const Session session(globals);
  const SettingFile file(interface);
  const std::vector<SettingLine> lines = file.read();
  if (globals.output == OutputFormat::Json) {
    write(settingFileJson(file.path(), lines) + "\n");
    return;
  }
  write(printable(file.path()) + "\n" + settingTable(lines, session.layout()));
}

/// Keys in the order of the file, each once. A file that cannot be read has a problem in their place.
ListedFile listed(const std::string& interface, bool isOrphan) {
  ListedFile file;
  const SettingFile there(interface);
  file.path = there.path();
  file.interface = interface;
  file.isOrphan = isOrphan;
  try {
    for (const SettingLine& line : there.read()) {
      if (std::find(file.keys.begin(), file.keys.end(), line.key) == file.keys.end()) file.keys.push_back(line.key);
    }
  } catch (const Failure& failure) {
    file.problem = failure.what();
  }
  return file;
}

std::vector<ListedFile> listedFiles(const Session& session) {
  const SettingFiles files = findSettingFiles(zorva::agent::dataDirectory());
  if (files.error != 0) {
    throw Failure(ExitCode::Failed,
                  printable(zorva::agent::dataDirectory()) + ": cannot be read: " + std::strerror(files.error));
  }
  const std::vector<std::string> orphans = orphansAmong(files, *session.tree());
  std::vector<ListedFile> rows;
  for (const std::string& interface : files.interfaces) {
    rows.push_back(listed(interface, std::binary_search(orphans.begin(), orphans.end(), interface)));
  }
  return rows;
}

void listInterfaceFiles(const Globals& globals) {
  const Session session(globals);
  const std::vector<ListedFile> files = listedFiles(session);
  if (globals.output == OutputFormat::Json) {
    write(listedFilesJson(files) + "\n");
    return;
  }
  if (files.empty()) {
    tellNote("there is no file of settings in " + printable(zorva::agent::dataDirectory()) +
             "; zorvactl ifcfg init makes one");
    return;
  }
  Table table({"FILE", "INTERFACE", "KEYS"});
  for (const ListedFile& file : files) {
    table.add({zorva::agent::settingFileName(file.interface),
               file.isOrphan ? Cell("gone: an orphan", Style::Bad) : Cell(file.interface),
               file.problem.empty() ? Cell::list(file.keys) : Cell(file.problem, Style::Bad)});
  }
  write(table.text(session.layout()));
}

struct RemoveOptions {
  std::string interface;
};

void removeInterfaceFile(const Globals& globals, const RemoveOptions& options) {
  Session session(globals);
  const SettingFile file(options.interface);
  const std::vector<SettingLine> lines = file.read();
  if (!globals.dryRun) {
    const Session::Changing alone(session);
    file.remove();
    if (zorva::agent::currentConfig().appliesToHost) {
      tellNote("what was applied to the host stays; zorvactl revert " + printable(options.interface) +
               " takes it back");
    }
  }
  if (globals.output == OutputFormat::Json) {
    write(settingFileJson(file.path(), lines) + "\n");
    return;
  }
  write((globals.dryRun ? "would remove " : "removed ") + printable(file.path()) + "\n" +
        settingTable(lines, session.layout()));
}

struct AdoptOptions {
  std::string from;
  std::string to;
};

/// The file of an interface that is there is in use; taking it away would change that interface's settings.
void requireOrphan(const zorva::agent::TreeSnapshot& tree, const std::string& interface) {
  const std::vector<std::string> orphans = orphansAmong({{interface}, 0}, tree);
  if (!orphans.empty()) return;
  throw Failure(ExitCode::Failed,
                "this host has an interface " + printable(interface) + ", whose settings the file has",
                "zorvactl ifcfg list shows which files are orphans");
}

void adoptInterfaceFile(const Globals& globals, const AdoptOptions& options) {
  Session session(globals);
  const Session::Changing alone(session, globals.dryRun);
  const auto tree = session.tree();
  const SettingFile from(options.from);
  const SettingFile to(options.to);
  const std::vector<SettingLine> lines = from.read();
  requireOrphan(*tree, options.from);
  interfaceNode(*tree, options.to);
  if (to.exists()) {
    throw Failure(ExitCode::Failed, printable(to.path()) + ": exists already, and is left as it is",
                  "zorvactl ifcfg remove " + printable(options.to) + " removes it");
  }
  if (!globals.dryRun) {
    from.moveTo(to);
    broker::ObjectPath changed;
    changed.className = kSettingClass;
    changed.keys.push_back({"InstanceID", broker::Value::text("Computer%" + options.to)});
    bringToHost(changed);
  }
  if (globals.output == OutputFormat::Json) {
    write(settingFileJson(to.path(), lines) + "\n");
    return;
  }
  write((globals.dryRun ? "would make " : "made ") + printable(from.path()) + " " + printable(to.path()) + "\n" +
        settingTable(lines, session.layout()));
}

/// About the files of all interfaces, also of those that are gone.
void addFileCommands(Subcommand& ifcfg) {
  ifcfg.add("list", "List the files that there are, and mark those whose interfaces are gone")
      .writesJson()
      .local()
      .examples("  zorvactl ifcfg list")
      .runs(listInterfaceFiles);

  const auto removed = std::make_shared<RemoveOptions>();
  ifcfg.add("remove", "Remove it; the interface then has what the host says")
      .writesJson()
      .local()
      .examples("  zorvactl ifcfg remove eth0 --dry-run\n  zorvactl ifcfg remove eth0")
      .interface(removed->interface)
      .dryRun()
      .runs<RemoveOptions>(removeInterfaceFile, removed);

  const auto adopted = std::make_shared<AdoptOptions>();
  ifcfg.add("adopt", "Give the file of an interface that is gone to another one")
      .writesJson()
      .local()
      .examples("  zorvactl ifcfg adopt eth0 enp1s0             eth0 is called enp1s0 now")
      .word("OLD", "The name of the interface that is gone", adopted->from)
      .word("INTERFACE", "The interface that gets its file", adopted->to)
      .dryRun()
      .runs<AdoptOptions>(adoptInterfaceFile, adopted);
}

}  // namespace

void addIfcfgCommands(CommandLine& line) {
  Subcommand ifcfg = line.add("ifcfg", "The file of an interface's settings");
  ifcfg.writesJson().examples("  zorvactl ifcfg init eth0\n  zorvactl ifcfg show eth0");

  const auto options = std::make_shared<InitOptions>();
  ifcfg.add("init", "Write it, with what the host says now")
      .writesJson()
      .local()
      .examples(
          "  zorvactl ifcfg init eth0 --dry-run            what it would write\n"
          "  zorvactl ifcfg init eth0 --force              puts a new file in the old one's place")
      .interface(options->interface)
      .dryRun()
      .flag("--force", "Replace a file that is there", options->force)
      .runs<InitOptions>(initInterfaceFile, options);

  const auto interface = std::make_shared<std::string>();
  ifcfg.add("show", "Show it")
      .writesJson()
      .local()
      .examples("  zorvactl ifcfg show eth0")
      .interface(*interface)
      .runs<std::string>(showInterfaceFile, interface);
  addFileCommands(ifcfg);
}

}  // namespace zorva::cli
