// register sfcb, register pegasus.

#include <unistd.h>

#include <algorithm>
#include <cctype>
#include <cstdlib>
#include <filesystem>
#include <sstream>

#include "cli/commands/Commands.h"
#include "cli/output/Console.h"
#include "cli/output/Failure.h"
#include "cli/output/Text.h"
#include "cli/registration/Placement.h"
#include "cli/registration/RegistrationText.h"
#include "schema/BuiltInMof.h"

namespace zorva::cli {

namespace {

namespace fs = std::filesystem;
using broker::ProviderRegistry;

struct RegisterOptions {
  std::string libraryDirectory;  ///< where the server looks for libraries
  std::string staging;           ///< where the registration and the MOF file are put
  std::string repository;        ///< of the server; empty: its usual one
  bool remove = false;
  bool print = false;
};

/// A server: where it looks, and what makes it look there.
struct OtherServer {
  const char* name;
  std::string libraryDirectory;
  std::string staging;
  const char* whereItSays;  ///< what names the directory of libraries in its configuration
  bool stagesHere;          ///< the staging directory is this project's, and not the server's
  std::string (*registration)();
  std::vector<Placed> (*files)(const std::string& staging);
  std::vector<std::string> (*steps)(const RegisterOptions& options);
};

/// A path as a word of a shell.
std::string shellWord(const std::string& path) {
  const bool isPlain = std::all_of(path.begin(), path.end(), [](char c) {
    return std::isalnum(static_cast<unsigned char>(c)) != 0 ||
           std::string_view("/._-+").find(c) != std::string_view::npos;
  });
  if (isPlain) return path;
  std::string word = "'";
  for (const char c : path) word += c == '\'' ? std::string("'\\''") : std::string(1, c);
  return word + "'";
}

// ---- The Small Footprint CIM Broker ----

std::string sfcbText() { return sfcbRegistration(ProviderRegistry::builtIn(), kOwnMark); }

/// The classes of the providers, which derive from those that the server has.
std::string classesText() {
  for (std::size_t i = 0; i < schema::kBuiltInMofCount; ++i) {
    if (schema::kBuiltInMof[i].name == "zorva.mof") {
      return "// " + std::string(kOwnMark) + "\n" + std::string(schema::kBuiltInMof[i].text);
    }
  }
  throw std::logic_error("zorva.mof is not in the program");
}

std::vector<Placed> sfcbFiles(const std::string& staging) {
  std::vector<Placed> files;
  for (const std::string& nameSpace : nameSpacesOf(ProviderRegistry::builtIn())) {
    files.push_back(
        {Placed::Kind::File, (fs::path(staging) / "mofs" / nameSpace / "zorva.mof").string(), classesText()});
  }
  files.push_back({Placed::Kind::File, staging + "/regs/zorva.reg", sfcbText()});
  return files;
}

std::vector<std::string> sfcbSteps(const RegisterOptions& options) {
  std::string rebuild = "sfcbrepos -f -s " + shellWord(options.staging);
  if (!options.repository.empty()) rebuild += " -r " + shellWord(options.repository);
  return {rebuild, "systemctl restart sblim-sfcb"};
}

// ---- OpenPegasus ----

std::string pegasusText() { return pegasusRegistration(ProviderRegistry::builtIn(), kOwnMark, ZORVA_VERSION); }

std::vector<Placed> pegasusFiles(const std::string& staging) {
  return {{Placed::Kind::File, staging + "/zorva.mof", classesText()},
          {Placed::Kind::File, staging + "/zorva-pegasus.mof", pegasusText()}};
}

/// With a repository, the files are compiled into it while the server does not run.
std::vector<std::string> pegasusSteps(const RegisterOptions& options) {
  std::vector<std::string> steps;
  if (options.remove) {
    for (const std::string& library : librariesOf(ProviderRegistry::builtIn())) {
      steps.push_back("cimprovider -r -m " + library);
    }
    return steps;
  }
  const std::string compile = options.repository.empty() ? "cimmof" : "cimmofl -R" + shellWord(options.repository);
  const auto compileInto = [&](const std::string& nameSpace, const char* file) {
    return compile + " -n" + nameSpace + " " + shellWord(options.staging + "/" + file);
  };
  for (const std::string& nameSpace : nameSpacesOf(ProviderRegistry::builtIn())) {
    steps.push_back(compileInto(nameSpace, "zorva.mof"));
  }
  steps.push_back(compileInto("root/PG_InterOp", "zorva-pegasus.mof"));
  if (!options.repository.empty()) steps.emplace_back("systemctl restart tog-pegasus");
  return steps;
}

OtherServer sfcb() {
  return {"sfcb",
          "/usr/" ZORVA_INSTALL_LIBDIR "/cmpi",
          "/var/lib/sfcb/stage",
          "providerDirs in /etc/sfcb/sfcb.cfg",
          false,
          sfcbText,
          sfcbFiles,
          sfcbSteps};
}

OtherServer pegasus() {
  return {"OpenPegasus",
          "/usr/" ZORVA_INSTALL_LIBDIR "/Pegasus/providers",
          "/var/lib/zorva-providers/pegasus",
          "providerDir of cimconfig",
          true,
          pegasusText,
          pegasusFiles,
          pegasusSteps};
}

// ---- Both ----

/// The links under the name that servers look for, each to the library that this program would load.
std::vector<Placed> linksIn(const std::string& directory, const Globals& globals) {
  const std::string given =
      globals.providerDirectory.empty() ? ProviderRegistry::builtInDirectory() : globals.providerDirectory;
  const std::string libraries = given.empty() ? given : fs::absolute(given).lexically_normal().string();
  std::vector<Placed> links;
  for (const std::string& library : librariesOf(ProviderRegistry::builtIn())) {
    const std::string file = "lib" + library + ".so";
    links.push_back(
        {Placed::Kind::Link, (fs::path(directory) / file).string(), (fs::path(libraries) / (file + ".1")).string()});
  }
  return links;
}

void requireLibraries(const std::vector<Placed>& links) {
  for (const Placed& link : links) {
    if (::access(link.content.c_str(), R_OK) == 0) continue;
    throw Failure(ExitCode::Failed, printable(link.content) + ": there is no such library to be linked to",
                  "--provider-dir names the directory of the provider libraries");
  }
}

void requireDirectory(const std::string& path, const OtherServer& server, const std::string& hint) {
  std::error_code ignored;
  if (fs::is_directory(path, ignored)) return;
  throw Failure(ExitCode::Failed, printable(path) + ": there is no such directory; is " + server.name + " installed?",
                hint);
}

/// The directory that only the server itself makes must be there.
void requireServer(const OtherServer& server, const RegisterOptions& options) {
  if (server.stagesHere) {
    requireDirectory(options.libraryDirectory, server,
                     std::string("--library-dir names the directory of its provider libraries: ") + server.whereItSays);
  } else {
    requireDirectory(options.staging, server, "--staging names its staging directory");
  }
}

bool isInPath(const std::string& program) {
  const char* const path = std::getenv("PATH");
  std::istringstream directories(path == nullptr ? "" : path);
  for (std::string directory; std::getline(directories, directory, ':');) {
    if (!directory.empty() && ::access((fs::path(directory) / program).c_str(), X_OK) == 0) return true;
  }
  return false;
}

/// What a person does next; a program that is not found here is marked.
std::string nextSteps(const OtherServer& server, const RegisterOptions& options) {
  std::string text =
      std::string("Then, as root, so that ") + server.name + (options.remove ? " forgets it:\n" : " reads it:\n");
  for (const std::string& step : server.steps(options)) {
    const std::string program = step.substr(0, step.find(' '));
    text += "  " + printable(step) + (isInPath(program) ? "" : "    (" + program + " is not in PATH here)") + "\n";
  }
  if (options.remove) return text;
  return text + "It finds the libraries if " + server.whereItSays + " names " + printable(options.libraryDirectory) +
         ".\nZORVAGENT_CONFIG in the environment of the server names the agent's configuration.\n";
}

std::string shownTarget(const Placed& placed) {
  return printable(placed.path) + (placed.kind == Placed::Kind::Link ? " -> " + printable(placed.content) : "");
}

const char* wordOf(Found found) {
  switch (found) {
    case Found::Nothing:
      return "put";
    case Found::Another:
      return "replaced";
    default:
      return "unchanged";
  }
}

void place(const OtherServer& server, const RegisterOptions& options, const std::vector<Placed>& all, bool isDryRun) {
  requireServer(server, options);
  std::string text;
  for (const Placed& each : all) {
    const Found found = findPlaced(each);
    if (found == Found::Foreign) {
      throw Failure(
          ExitCode::Failed,
          printable(each.path) + ": is there already and was not made by zorvactl register; nothing was changed",
          "move it away, or name other directories");
    }
    const bool isNew = found == Found::Nothing || found == Found::Another;
    text += std::string(isDryRun && isNew ? "would be " : "") + wordOf(found) + "  " + shownTarget(each) + "\n";
  }
  if (!isDryRun) placeAll(all);
  write(text + nextSteps(server, options));
}

/// The usual directory of this project for another server's files, once it is empty.
void removeOwnStaging(const OtherServer& server, const RegisterOptions& options) {
  if (!server.stagesHere || options.staging != server.staging) return;
  if (::rmdir(options.staging.c_str()) == 0) ::rmdir(fs::path(options.staging).parent_path().c_str());
}

void takeAway(const OtherServer& server, const RegisterOptions& options, const std::vector<Placed>& all,
              bool isDryRun) {
  std::string text;
  for (const Placed& each : all) {
    const Found found = findPlaced(each);
    if (found == Found::Same || found == Found::Another) {
      text += std::string(isDryRun ? "would be " : "") + "removed  " + shownTarget(each) + "\n";
    } else if (found != Found::Nothing) {
      text += "left  " + printable(each.path) + ": it was not made by zorvactl register\n";
    }
  }
  if (text.empty()) {
    tellNote(std::string("nothing of zorvactl register is there for ") + server.name);
    return;
  }
  if (!isDryRun) {
    removeAll(all);
    removeOwnStaging(server, options);
  }
  write(text + nextSteps(server, options));
}

std::string absolute(const std::string& directory) {
  std::string path = fs::absolute(directory).lexically_normal().string();
  while (path.size() > 1 && path.ends_with('/')) path.pop_back();
  return path;
}

void registerAt(const OtherServer& server, const Globals& globals, RegisterOptions options) {
  if (options.print) return write(server.registration());
  options.libraryDirectory =
      absolute(options.libraryDirectory.empty() ? server.libraryDirectory : options.libraryDirectory);
  options.staging = absolute(options.staging.empty() ? server.staging : options.staging);
  if (!options.repository.empty()) options.repository = absolute(options.repository);
  std::vector<Placed> all = linksIn(options.libraryDirectory, globals);
  if (!options.remove) requireLibraries(all);
  for (Placed& file : server.files(options.staging)) all.push_back(std::move(file));
  try {
    (options.remove ? takeAway : place)(server, options, all, globals.dryRun);
  } catch (const Failure&) {
    throw;
  } catch (const std::runtime_error& error) {
    throw Failure(ExitCode::Failed, printable(error.what()), ::geteuid() == 0 ? "" : "run it as root");
  }
}

void addServer(Subcommand& parent, const char* name, const char* description, const char* examples,
               OtherServer (*server)()) {
  const auto options = std::make_shared<RegisterOptions>();
  const OtherServer usual = server();
  parent.add(name, description)
      .local()
      .examples(examples)
      .option("--library-dir", "DIR", "Where the server looks for libraries (default: " + usual.libraryDirectory + ")",
              options->libraryDirectory)
      .option("--staging", "DIR", "Where the registration and the classes are put (default: " + usual.staging + ")",
              options->staging)
      .option("--repository", "DIR", "The server's repository, if it is not the usual one", options->repository)
      .flag("--remove", "Take away what this command has put in place", options->remove)
      .flag("--print", "Write the registration to standard output, and do nothing else", options->print)
      .dryRun()
      .runs([server, options](const Globals& globals) { registerAt(server(), globals, *options); });
}

}  // namespace

void addRegisterCommands(CommandLine& line) {
  Subcommand parent = line.add("register", "Give the providers to another CIM server of this host");
  parent.examples("  zorvactl register sfcb --dry-run\n  zorvactl register pegasus");
  addServer(parent, "sfcb", "To the Small Footprint CIM Broker",
            "  zorvactl register sfcb --dry-run              what it would put where\n"
            "  zorvactl register sfcb\n"
            "  zorvactl register sfcb --remove               takes its own files away again",
            sfcb);
  addServer(parent, "pegasus", "To OpenPegasus",
            "  zorvactl register pegasus --library-dir /opt/pegasus/lib --dry-run\n"
            "  zorvactl register pegasus --repository /var/lib/Pegasus",
            pegasus);
}

}  // namespace zorva::cli
