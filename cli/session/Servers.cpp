#include "cli/session/Servers.h"

#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <map>
#include <set>

#include "cli/output/Failure.h"
#include "cli/output/Terminal.h"
#include "cli/output/Text.h"
#include "util/Names.h"
#include "util/ReadFile.h"
#include "util/Text.h"

namespace zorva::cli {

namespace {

constexpr std::size_t kLargestHostsFile = std::size_t{1} << 20U;
constexpr std::size_t kMostHosts = 10000;
constexpr std::size_t kLongestPassword = 1024;

/// Where a server is named, for the message of what is wrong with it.
Failure wrongAt(const std::string& place, const Failure& failure) {
  return {ExitCode::WrongUsage, place + ": " + failure.what(), failure.hint()};
}

Server serverOf(std::string_view url, const ServerOptions& options, const std::string& fingerprint) {
  Server server{readServerUrl(url)};
  if (server.url.user.empty() && !options.user.empty() && !server.url.isSocket()) {
    const std::size_t host = url.find("://") + 3;
    server.url = readServerUrl(std::string(url.substr(0, host)) + options.user + "@" + std::string(url.substr(host)));
  }
  if (!server.url.isEncrypted() && !fingerprint.empty()) {
    throw Failure(ExitCode::WrongUsage, "a fingerprint is about the certificate of an https server");
  }
  server.trust.fingerprint = fingerprint;
  if (server.url.isEncrypted() && fingerprint.empty()) server.trust.caFile = options.caFile;
  server.patience = options.timeout;
  return server;
}

/// A line of a hosts file: "host1", "https://host2:15989/interop", and after it a fingerprint.
Server serverOfLine(std::string_view line, const ServerOptions& options) {
  const std::size_t blank = std::min(line.find_first_of(util::kBlanksAndTabs), line.size());
  const std::string_view name = line.substr(0, blank);
  const std::string_view rest = util::trimmed(line.substr(blank));
  const bool isUrl = name.find("://") != std::string_view::npos || name.starts_with("unix:");
  return serverOf(isUrl ? std::string(name) : "https://" + std::string(name), options,
                  rest.empty() ? std::string() : readFingerprint(rest));
}

void addHostsOf(const ServerOptions& options, std::vector<Server>& servers) {
  const std::string place = "--hosts " + printable(options.hostsFile);
  const util::FileText file = util::readFile(options.hostsFile, kLargestHostsFile);
  if (file.error != 0) throw Failure(ExitCode::WrongUsage, place + ": " + util::fileErrorText(file.error));
  if (file.truncated) throw Failure(ExitCode::WrongUsage, place + ": the file is larger than 1 MiB");
  std::string_view text = file.text;
  for (std::size_t number = 1; !text.empty(); ++number) {
    const std::size_t end = std::min(text.find('\n'), text.size());
    std::string_view line = text.substr(0, end);
    text.remove_prefix(std::min(end + 1, text.size()));
    // A "#" within a word is part of a Unix socket's URL.
    for (std::size_t hash = line.find('#'); hash != std::string_view::npos; hash = line.find('#', hash + 1)) {
      if (hash == 0 || util::kBlanksAndTabs.find(line[hash - 1]) != std::string_view::npos) line = line.substr(0, hash);
    }
    line = util::trimmed(line, util::kWhiteSpace);
    if (line.empty()) continue;
    if (servers.size() >= kMostHosts) throw Failure(ExitCode::WrongUsage, place + ": there are more than 10000 hosts");
    try {
      servers.push_back(serverOfLine(line, options));
    } catch (const Failure& failure) {
      throw wrongAt(place + ", line " + std::to_string(number), failure);
    }
  }
}

/// The text of standard input, up to its first line feed.
std::string readStandardInput() {
  std::string line;
  line.reserve(kLongestPassword + 1);
  for (int c = std::getchar(); c != EOF && c != '\n' && line.size() <= kLongestPassword; c = std::getchar()) {
    line += static_cast<char>(c);
  }
  return line;
}

std::string readPasswordFile(const std::string& path) {
  util::FileText file = util::readFile(path, kLongestPassword + 2);
  const std::string place = "the password file " + printable(path);
  if (file.error != 0) throw Failure(ExitCode::WrongUsage, place + ": " + util::fileErrorText(file.error));
  if ((file.mode & 077U) != 0) {
    util::Secret::wipe(file.text);
    char mode[8];
    std::snprintf(mode, sizeof mode, "%04o", file.mode & 07777U);
    throw Failure(ExitCode::WrongUsage, place + " has mode " + mode + ": others than its owner may read or write it",
                  "chmod 600 " + printable(path));
  }
  std::string line = file.text.substr(0, file.text.find('\n'));
  util::Secret::wipe(file.text);
  return line;
}

/// The password, if a file has it.
std::optional<std::string> passwordOfFile(const ServerOptions& options) {
  if (options.passwordFile == "-") return readStandardInput();
  if (!options.passwordFile.empty()) return readPasswordFile(options.passwordFile);
  const char* path = std::getenv("ZORVACTL_PASSWORD_FILE");
  if (path != nullptr && *path != '\0') return readPasswordFile(path);
  return std::nullopt;
}

std::shared_ptr<const util::Secret> secretOf(std::string text) {
  if (text.ends_with('\r')) text.pop_back();
  const bool isWell = !text.empty() && text.size() <= kLongestPassword && text.find('\0') == std::string::npos;
  if (isWell) return std::make_shared<const util::Secret>(text);
  const bool isEmpty = text.empty();
  util::Secret::wipe(text);
  throw Failure(ExitCode::WrongUsage,
                isEmpty ? "the password is empty" : "the password is longer than 1024 bytes, or has a NUL in it");
}

std::shared_ptr<const util::Secret> askFor(const std::string& user, const std::string& where) {
  std::optional<std::string> typed = askTerminal("password of " + printable(user) + where + ": ", Echo::Hidden);
  if (typed) return secretOf(std::move(*typed));
  throw Failure(ExitCode::WrongUsage, "there is no terminal to ask for the password of " + printable(user),
                "--password-file FILE names a file that has it, or '-' for standard input; so does "
                "$ZORVACTL_PASSWORD_FILE");
}

void requireSensible(const ServerOptions& options, const std::vector<Server>& servers) {
  const auto wrong = [](const std::string& what, const std::string& hint) {
    return Failure(ExitCode::WrongUsage, what, hint);
  };
  if (options.any() && servers.empty()) {
    throw wrong("--hosts " + printable(options.hostsFile) + " names no host", "it has a host name or URL on each line");
  }
  const bool hasTls =
      std::any_of(servers.begin(), servers.end(), [](const Server& each) { return each.url.isEncrypted(); });
  if (!options.caFile.empty() && !hasTls) {
    throw wrong("--ca is about the certificate of an https server", "--url https://USER@HOST names one");
  }
  if (!options.fingerprint.empty() && options.many()) {
    throw wrong("--fingerprint fits one server, and several are named",
                "a file of hosts (--hosts) has the fingerprint after each name");
  }
  if (!options.fingerprint.empty() && !hasTls) {
    throw wrong("--fingerprint is about the certificate of an https server", "--url https://USER@HOST names one");
  }
}

using Spelling = std::string (*)(const ServerUrl& url);

}  // namespace

std::string readFingerprint(std::string_view text) {
  std::string digits;
  if (text.size() > 7 && util::sameName(text.substr(0, 7), "sha256:")) text.remove_prefix(7);
  for (const char c : text) {
    if (c == ':' || c == ' ') continue;
    digits += util::lowerAscii(c);
  }
  if (digits.size() == 64 && digits.find_first_not_of("0123456789abcdef") == std::string::npos) return digits;
  throw Failure(ExitCode::WrongUsage,
                "'" + printable(text) + "' is no SHA-256 fingerprint: it has 64 hexadecimal digits",
                "'zorvacimd --make-certificate' prints it on the server");
}

std::vector<Server> serversOf(const ServerOptions& options) {
  const std::string fingerprint = options.fingerprint.empty() ? "" : readFingerprint(options.fingerprint);
  std::vector<Server> servers;
  for (const std::string& url : options.urls) servers.push_back(serverOf(url, options, fingerprint));
  if (!options.hostsFile.empty()) addHostsOf(options, servers);
  requireSensible(options, servers);
  std::set<std::string> known;
  const auto isKnown = [&known](const Server& each) {
    return !known.insert(each.url.shown() + "#" + each.url.nameSpace).second;
  };
  servers.erase(std::remove_if(servers.begin(), servers.end(), isKnown), servers.end());
  return servers;
}

void readPasswords(std::vector<Server>& servers, const ServerOptions& options) {
  std::map<std::string, std::vector<Server*>> byUser;
  for (Server& each : servers) {
    if (!each.url.user.empty()) byUser[each.url.user].push_back(&each);
  }
  if (byUser.empty()) return;
  std::optional<std::string> text = passwordOfFile(options);
  const auto ofFile = text ? secretOf(std::move(*text)) : nullptr;
  for (const auto& [user, theirs] : byUser) {
    const bool isOne = theirs.size() == 1;
    const std::string where =
        isOne ? "@" + theirs.front()->url.host : " on " + std::to_string(theirs.size()) + " hosts";
    const auto password = ofFile != nullptr ? ofFile : askFor(user, where);
    for (Server* each : theirs) each->password = password;
  }
}

std::vector<std::string> labelsOf(const std::vector<Server>& servers) {
  static constexpr Spelling kSpellings[] = {
      [](const ServerUrl& url) { return url.isSocket() ? url.shown() : url.host; },
      [](const ServerUrl& url) { return url.isSocket() ? url.shown() : url.host + ":" + url.port; },
      [](const ServerUrl& url) { return url.shown(); },
  };
  std::vector<std::string> labels;
  for (const Spelling spelling : kSpellings) {
    labels.clear();
    for (const Server& each : servers) labels.push_back(spelling(each.url));
    if (std::set<std::string>(labels.begin(), labels.end()).size() == labels.size()) return labels;
  }
  for (std::size_t i = 0; i < labels.size(); ++i) {
    labels[i] += (servers[i].url.isSocket() ? "#" : "/") + servers[i].url.nameSpace;
  }
  return labels;
}

}  // namespace zorva::cli
