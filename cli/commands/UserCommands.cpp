// user add, user passwd, user role, user certificate, user remove, user list.

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <functional>
#include <optional>
#include <stdexcept>

#include "access/UsersFile.h"
#include "agent/files/FileLock.h"
#include "cli/commands/Commands.h"
#include "cli/commands/ViewJson.h"
#include "cli/output/Console.h"
#include "cli/output/Failure.h"
#include "cli/output/Table.h"
#include "cli/output/Terminal.h"
#include "cli/output/Text.h"
#include "util/InstalledPlaces.h"
#include "util/ReadFile.h"
#include "util/Secret.h"
#include "util/Text.h"
#include "util/Toml.h"
#include "util/Utf8.h"

namespace zorva::cli {

namespace {

using access::Users;

constexpr std::size_t kShortestPassword = 8;

struct UserOptions {
  std::string file;
  std::string name;
  std::string role = "read";
  std::vector<std::string> nameSpaces;
  std::vector<std::string> fingerprints;
  std::string subject;
  bool passwordFromInput = false;
  bool hasNoPassword = false;
  bool hasNoCertificate = false;
};

Failure wrongUsage(const std::string& what, const std::string& hint = {}) { return {ExitCode::WrongUsage, what, hint}; }

// ---- The file ----

/// Where the server expects its users.
struct Place {
  std::string file = access::defaultUsersFile();
  std::string group = access::kDefaultGroup;
};

/// Reads only what is needed of the server's configuration.
Place placeOfServer() {
  Place place;
  const std::string serverConfig = util::installedPlaces().config + "zorvacimd.toml";
  const util::FileText config = util::readFile(serverConfig, std::size_t{256} << 10);
  if (config.error == ENOENT) return place;
  const std::string hint = "--file names the file of users";
  if (config.error != 0) {
    throw Failure(ExitCode::Failed, serverConfig + ": cannot be read: " + util::fileErrorText(config.error), hint);
  }
  try {
    const util::TomlDocument document(config.text);
    util::TomlTable table(document, "access");
    table.take("users", place.file);
    table.take("group", place.group);
  } catch (const util::TomlError& error) {
    throw Failure(ExitCode::Failed, serverConfig + ":" + std::to_string(error.line()) + ": " + printable(error.what()),
                  hint);
  }
  place.file = util::pathFrom(serverConfig, place.file);
  return place;
}

Place placeOf(const UserOptions& options) {
  if (options.file.empty()) return placeOfServer();
  Place place;
  place.file = options.file;
  return place;
}

/// For errors of rights.
std::string whoMay() { return ::geteuid() == 0 ? std::string() : "run it as root, who owns this file"; }

Users read(const Place& place) {
  try {
    return access::readUsersFile(place.file);
  } catch (const access::UsersError& error) {
    const bool isClosed = ::access(place.file.c_str(), R_OK) != 0 && errno == EACCES;
    throw Failure(ExitCode::Failed, printable(error.what()), isClosed ? whoMay() : std::string());
  }
}

/// A fresh installation may have no such directory. A missing one with another name is probably misspelt.
void makeDefaultDirectory(const Place& place) {
  if (place.file == access::defaultUsersFile()) ::mkdir(util::installedPlaces().config.c_str(), 0755);
}

/// Changes the file, which nobody else changes meanwhile.
void change(const Place& place, const std::function<void(Users& users)>& how) {
  makeDefaultDirectory(place);
  try {
    const agent::FileLock alone(place.file + ".lock");
    Users users = read(place);
    how(users);
    const std::string warning = access::writeUsersFile(place.file, users, place.group);
    if (!warning.empty()) tellWarning(printable(warning));
  } catch (const Failure&) {
    throw;
  } catch (const std::invalid_argument& error) {
    throw Failure(ExitCode::Failed, error.what());
  } catch (const std::runtime_error& error) {
    throw Failure(ExitCode::Failed, printable(error.what()), whoMay());
  }
}

const access::User& requiredUser(const Users& users, const Place& place, const std::string& name) {
  const access::User* user = users.find(name);
  if (user != nullptr) return *user;
  throw Failure(ExitCode::Failed, printable(place.file) + ": there is no user " + printable(name),
                "zorvactl user list shows those that there are");
}

// ---- What is given ----

void requireName(const std::string& name) {
  if (access::isUserName(name)) return;
  throw wrongUsage("'" + printable(name) + "' cannot be the name of a user",
                   "a name has 1 to 64 of A-Z a-z 0-9 . _ @ - and begins with a letter or a digit");
}

access::Role requiredRole(const std::string& word) {
  if (const auto role = access::roleOf(word)) return *role;
  throw wrongUsage("'" + printable(word) + "' is no role", "the roles are read, operate and none");
}

access::Grants grantsOf(const UserOptions& options) {
  access::Grants grants(requiredRole(options.role));
  for (const std::string& each : options.nameSpaces) {
    const std::size_t equals = each.find('=');
    const std::string name = each.substr(0, equals);
    if (equals == std::string::npos || !access::isNameSpaceName(name)) {
      throw wrongUsage("'" + printable(each) + "' is not NAMESPACE=ROLE", "for example root/cimv2=operate");
    }
    grants.set(name, requiredRole(each.substr(equals + 1)));
  }
  return grants;
}

/// Puts the certificates that are given into the user.
void takeCertificates(const UserOptions& options, access::User& user) {
  user.fingerprints.clear();
  for (const std::string& each : options.fingerprints) {
    user.fingerprints.push_back(access::canonicalFingerprint(each));
    if (!user.fingerprints.back().empty()) continue;
    throw wrongUsage("'" + printable(each) + "' is no fingerprint of SHA-256: it has 64 hexadecimal digits",
                     "openssl x509 -in client.crt -noout -fingerprint -sha256 prints it");
  }
  user.subject = access::canonicalSubject(options.subject);
  if (options.subject.empty() || !user.subject.empty()) return;
  throw wrongUsage("'" + printable(options.subject) + "' is no distinguished name",
                   "openssl x509 -in client.crt -noout -subject -nameopt RFC2253 prints it");
}

bool namesCertificates(const UserOptions& options) { return !options.fingerprints.empty() || !options.subject.empty(); }

// ---- Passwords ----

/// One line of standard input, with or without its end.
std::string lineOfInput() {
  std::string line;
  line.reserve(access::kLongestPassword + 1);  // a secret leaves no copies where it grew
  for (char c = 0; line.size() <= access::kLongestPassword;) {
    const ssize_t count = ::read(STDIN_FILENO, &c, 1);
    if (count < 0 && errno == EINTR) continue;
    if (count <= 0 || c == '\n') break;
    line += c;
  }
  return line;
}

std::string askTwice(const std::string& name) {
  const auto ask = [](const std::string& question) {
    auto line = askTerminal(question, Echo::Hidden);
    if (!line) throw Failure(ExitCode::Failed, "no password was typed");
    return std::move(*line);
  };
  std::string first = ask("Password of " + name + ": ");
  std::string again = ask("The same again: ");
  const bool isSame = first == again;
  util::Secret::wipe(again);
  if (isSame) return first;
  util::Secret::wipe(first);
  throw Failure(ExitCode::Failed, "the two passwords differ", "nothing was changed; try again");
}

void requireGood(const std::string& password, const std::string& name) {
  const char* problem = nullptr;
  if (password.empty()) {
    problem = "the password is empty";
  } else if (password.size() < kShortestPassword) {
    problem = "the password is shorter than 8 characters";
  } else if (password.size() > access::kLongestPassword) {
    problem = "the password is longer than 256 bytes";
  } else if (password == name) {
    problem = "the password is the user's name";
  } else if (!util::isUtf8(password) ||
             std::any_of(password.begin(), password.end(), [](unsigned char c) { return c < 0x20 || c == 0x7F; })) {
    problem = "the password has control characters or is not UTF-8";
  }
  if (problem != nullptr) throw Failure(ExitCode::Failed, problem, "nothing was changed");
}

/// Asks at the terminal, or reads standard input if that is no terminal.
std::string newHash(const UserOptions& options) {
  const bool asks = !options.passwordFromInput && ::isatty(STDIN_FILENO) == 1;
  std::string text = asks ? askTwice(options.name) : lineOfInput();
  const util::Secret password(text);
  requireGood(password.text(), options.name);
  try {
    return access::hashPassword(password.text());
  } catch (const std::runtime_error& error) {
    throw Failure(ExitCode::Failed, error.what());
  }
}

// ---- The commands ----

std::vector<std::string> nameSpacesOf(const access::User& user) {
  std::vector<std::string> texts;
  for (const auto& [name, role] : user.grants.byNameSpace()) {
    texts.push_back(name + "=" + std::string(access::wordOf(role)));
  }
  return texts;
}

/// What a user may, after a change.
void report(const Globals& globals, const char* done, const access::User& user) {
  if (globals.output == OutputFormat::Json) {
    write(usersJson({&user}) + "\n");
    return;
  }
  std::string line = std::string(done) + " " + user.name + ": " + std::string(access::wordOf(user.grants.everywhere()));
  for (const std::string& each : nameSpacesOf(user)) line += ", " + each;
  write(line + "\n");
}

void requireAbsent(const Users& users, const Place& place, const std::string& name) {
  if (users.find(name) == nullptr) return;
  throw Failure(ExitCode::Failed, printable(place.file) + ": the user " + name + " exists already",
                "zorvactl user passwd, role and certificate change it");
}

void addUser(const Globals& globals, const UserOptions& options) {
  requireName(options.name);
  access::User user{options.name};
  user.grants = grantsOf(options);
  takeCertificates(options, user);
  if (options.hasNoPassword && !namesCertificates(options)) {
    throw wrongUsage("without a password, the user needs a certificate", "--fingerprint or --subject names it");
  }
  const Place place = placeOf(options);
  requireAbsent(read(place), place, user.name);
  if (!options.hasNoPassword) user.hash = newHash(options);
  change(place, [&](Users& users) {
    requireAbsent(users, place, user.name);
    users.put(user);
  });
  report(globals, "added", user);
}

/// Changes a user that there is.
void changeUser(const Globals& globals, const UserOptions& options, const std::function<void(access::User&)>& how) {
  const Place place = placeOf(options);
  access::User changed;
  change(place, [&](Users& users) {
    changed = requiredUser(users, place, options.name);
    how(changed);
    users.put(changed);
  });
  report(globals, "changed", changed);
}

void changePassword(const Globals& globals, const UserOptions& options) {
  const Place place = placeOf(options);
  requiredUser(read(place), place, options.name);
  const std::string hash = newHash(options);
  changeUser(globals, options, [&](access::User& user) { user.hash = hash; });
}

void changeRole(const Globals& globals, const UserOptions& options) {
  const access::Grants grants = grantsOf(options);
  changeUser(globals, options, [&](access::User& user) { user.grants = grants; });
}

void changeCertificate(const Globals& globals, const UserOptions& options) {
  if (namesCertificates(options) == options.hasNoCertificate) {
    throw wrongUsage("zorvactl user certificate needs either --fingerprint or --subject, or --none");
  }
  changeUser(globals, options, [&](access::User& user) { takeCertificates(options, user); });
}

void removeUser(const Globals& globals, const UserOptions& options) {
  const Place place = placeOf(options);
  access::User removed;
  change(place, [&](Users& users) {
    removed = requiredUser(users, place, options.name);
    users.remove(options.name);
  });
  report(globals, "removed", removed);
}

std::vector<std::string> waysIn(const access::User& user) {
  std::vector<std::string> ways;
  if (user.hash != access::kNoPassword) ways.emplace_back("password");
  if (!user.fingerprints.empty()) ways.push_back(counted(user.fingerprints.size(), "fingerprint"));
  if (!user.subject.empty()) ways.push_back(user.subject);
  return ways;
}

void listUsers(const Globals& globals, const UserOptions& options) {
  const Place place = placeOf(options);
  const Users users = read(place);
  if (globals.output == OutputFormat::Json) {
    write(usersJson(users.all()) + "\n");
    return;
  }
  if (users.isEmpty()) {
    tellNote(printable(place.file) + " has no users; zorvactl user add makes one");
    return;
  }
  Table table({"USER", "ROLE", "IN NAMESPACES", "LOGS IN BY"});
  for (const access::User* user : users.all()) {
    table.add({user->name, std::string(access::wordOf(user->grants.everywhere())), Cell::list(nameSpacesOf(*user)),
               joined(waysIn(*user), ", ")});
  }
  write(table.text(Layout::ofStandardOutput()));
}

// ---- Their words ----

using OptionsPtr = std::shared_ptr<UserOptions>;

/// A subcommand that writes both formats and takes --file.
Subcommand addOne(Subcommand& user, const char* name, const char* description, const char* examples,
                  const OptionsPtr& options) {
  Subcommand one = user.add(name, description);
  one.writesJson().local().examples(examples);
  one.option("--file", "FILE", "The file of users (default: as zorvacimd.toml says, else /etc/zorvagent/users)",
             options->file);
  return one;
}

Subcommand& takeName(Subcommand& one, const OptionsPtr& options) {
  return one.word("NAME", "The user's name", options->name);
}

Subcommand& takeNameSpaces(Subcommand& one, const OptionsPtr& options) {
  return one.repeatable("--namespace", "NAMESPACE=ROLE", "Another role in this namespace; may be repeated",
                        options->nameSpaces);
}

Subcommand& takeCertificateOptions(Subcommand& one, const OptionsPtr& options) {
  return one
      .repeatable("--fingerprint", "HEX", "SHA-256 of a client certificate of the user; may be repeated",
                  options->fingerprints)
      .option("--subject", "DN", "Subject of a client certificate of the user, such as CN=alice,O=Example",
              options->subject);
}

Subcommand& takePasswordSource(Subcommand& one, const OptionsPtr& options) {
  return one.flag("--password-stdin", "Read the password from standard input, a line, also if that is a terminal",
                  options->passwordFromInput);
}

void addAdd(Subcommand& user) {
  const auto options = std::make_shared<UserOptions>();
  Subcommand one = addOne(user, "add", "Add a user; the password is asked for",
                          "  zorvactl user add alice --role operate\n"
                          "  zorvactl user add bob --namespace root/cimv2=operate <password.txt\n"
                          "  zorvactl user add carol --no-password --subject CN=carol,O=Example",
                          options);
  takeName(one, options).option("--role", "ROLE", "read (the default), operate or none", options->role);
  takeNameSpaces(one, options);
  takeCertificateOptions(one, options);
  takePasswordSource(one, options)
      .flag("--no-password", "The user logs in by a certificate only", options->hasNoPassword)
      .runs<UserOptions>(addUser, options);
}

void addPasswd(Subcommand& user) {
  const auto options = std::make_shared<UserOptions>();
  Subcommand one =
      addOne(user, "passwd", "Change a password, which is asked for", "  zorvactl user passwd alice", options);
  takeName(one, options);
  takePasswordSource(one, options).runs<UserOptions>(changePassword, options);
}

void addRole(Subcommand& user) {
  const auto options = std::make_shared<UserOptions>();
  Subcommand one = addOne(user, "role", "Change what a user may do",
                          "  zorvactl user role alice read\n"
                          "  zorvactl user role alice none --namespace root/cimv2=operate    there and nowhere else",
                          options);
  takeName(one, options)
      .word("ROLE", "read, operate or none; in all namespaces but those of --namespace", options->role);
  takeNameSpaces(one, options).runs<UserOptions>(changeRole, options);
}

void addCertificate(Subcommand& user) {
  const auto options = std::make_shared<UserOptions>();
  Subcommand one = addOne(user, "certificate", "Change the client certificates of a user: those given replace all",
                          "  zorvactl user certificate alice --subject CN=alice,O=Example\n"
                          "  zorvactl user certificate alice --none",
                          options);
  takeName(one, options);
  takeCertificateOptions(one, options)
      .flag("--none", "The user has none", options->hasNoCertificate)
      .runs<UserOptions>(changeCertificate, options);
}

}  // namespace

void addUserCommands(CommandLine& line) {
  Subcommand user = line.add("user", "The users of the CIM server of this host");
  user.writesJson().examples(
      "  zorvactl user add alice --role operate\n  zorvactl user list\n"
      "  zorvactl user remove alice");
  addAdd(user);
  addPasswd(user);
  addRole(user);
  addCertificate(user);

  const auto removed = std::make_shared<UserOptions>();
  Subcommand remove = addOne(user, "remove", "Remove a user", "  zorvactl user remove alice", removed);
  takeName(remove, removed).runs<UserOptions>(removeUser, removed);

  const auto listed = std::make_shared<UserOptions>();
  addOne(user, "list", "List the users and what they may do", "  zorvactl user list", listed)
      .runs<UserOptions>(listUsers, listed);
}

}  // namespace zorva::cli
