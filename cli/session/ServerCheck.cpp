#include "cli/session/ServerCheck.h"

#include <algorithm>
#include <chrono>
#include <unordered_map>
#include <unordered_set>
#include <utility>

#include "cli/output/Text.h"

namespace zorva::cli {

namespace {

constexpr std::chrono::milliseconds kPatience{2000};
constexpr std::size_t kServersForSuffix = 3;  // as many as the C library asks
constexpr std::size_t kNamedUsers = 5;

/// Something that asks servers in its turn: an interface's resolver, or the host's.
struct Client {
  std::string name;
  std::vector<std::string> servers;   ///< with ports
  std::vector<std::string> notAsked;  ///< beyond those that it asks
  std::vector<std::string> suffixes;
};

std::vector<Client> clientsOf(const HostView& view, bool asksHost) {
  std::vector<Client> clients;
  for (const InterfaceRow& row : view.interfaces) {
    clients.push_back({row.name, dns::withPorts(row.servers, row.facts.serversInFull), {}, row.suffixes});
  }
  if (!asksHost) return clients;
  const HostRow& host = view.host;
  clients.push_back({"host", host.resolverServers, host.resolverNotAsked, host.resolverSearch});
  if (!host.servers.empty()) {
    clients.push_back({host.facts.owner, dns::withPorts(host.servers, host.facts.serversInFull), {}, host.ownSuffixes});
  }
  return clients;
}

std::string usersText(const std::vector<std::string>& users) {
  std::vector<std::string> named;
  for (std::size_t i = 0; i < std::min(users.size(), kNamedUsers); ++i) named.push_back(printable(users[i]));
  const std::size_t left = users.size() - named.size();
  return joined(named, ", ") + (left > 0 ? " and " + std::to_string(left) + " more" : "");
}

/// Gathers what is to be asked, each question to each server once, and then what came of it.
class Check {
 public:
  explicit Check(const dns::Question& question) { result_.question = question; }

  void add(const Client& client) {
    std::unordered_set<std::string> before;
    for (const std::string& text : client.servers) {
      CheckedServer& server = serverOf(text);
      if (before.insert(server.server).second) {
        server.usedBy.push_back(client.name);
      } else {
        result_.problems.push_back(printable(client.name) + " has " + printable(server.server) +
                                   " twice; it is never asked a second time in its turn");
      }
    }
    for (const std::string& text : client.notAsked) addNotAsked(client, text, before);
  }

  void addSuffixes(const Client& client, const std::vector<std::string>& servers) {
    for (const std::string& suffix : client.suffixes) {
      if (suffix == "." || !dns::isName(suffix)) continue;
      const auto [found, isNew] = suffixes_.try_emplace(suffix, result_.suffixes.size());
      if (isNew) result_.suffixes.push_back({suffix, {}, std::nullopt});
      result_.suffixes[found->second].usedBy.push_back(client.name);
      for (std::size_t i = 0; i < std::min(servers.size(), kServersForSuffix); ++i) {
        askAbout(found->second, servers[i]);
      }
    }
  }

  CheckResult finish() {
    const std::vector<dns::Answer> answers = dns::ask(inquiries_, kPatience);
    for (std::size_t i = 0; i < answers.size(); ++i) {
      const Target& target = targets_[i];
      if (target.isSuffix) {
        note(answers[i], result_.suffixes[target.index]);
      } else {
        result_.servers[target.index].answer = answers[i];
      }
    }
    for (const CheckedServer& server : result_.servers) judge(server);
    for (const CheckedSuffix& suffix : result_.suffixes) {
      if (suffix.resolves != std::optional(false)) continue;
      result_.problems.push_back("the suffix " + printable(suffix.suffix) + " (" + usersText(suffix.usedBy) +
                                 ") does not resolve");
    }
    return std::move(result_);
  }

 private:
  /// The row that an answer belongs to.
  struct Target {
    bool isSuffix;
    std::size_t index;
  };

  CheckedServer& serverOf(const std::string& text) {
    const auto address = dns::parseServer(text);
    const std::string name = address ? address->text() : text;
    const auto [found, isNew] = servers_.try_emplace(name, result_.servers.size());
    if (isNew) {
      CheckedServer& server = result_.servers.emplace_back();
      server.server = name;
      server.answer.kind = dns::Answer::Kind::Unreachable;
      server.answer.problem = "this is no address";
      if (address) {
        inquiries_.push_back({*address, result_.question});
        targets_.push_back({false, found->second});
      }
    }
    return result_.servers[found->second];
  }

  void addNotAsked(const Client& client, const std::string& text, const std::unordered_set<std::string>& asked) {
    CheckedServer& server = serverOf(text);
    if (!asked.contains(server.server)) {
      server.usedBy.push_back(client.name);
      server.neverAskedBy.push_back(client.name);
    }
    result_.problems.push_back(printable(server.server) +
                               " is never asked: /etc/resolv.conf has it after the first three servers");
  }

  void askAbout(std::size_t suffix, const std::string& server) {
    const auto address = dns::parseServer(server);
    const std::string& name = result_.suffixes[suffix].suffix;
    if (!address || !asked_.insert(address->text() + " " + name).second) return;
    inquiries_.push_back({*address, {name, dns::Type::Soa}});
    targets_.push_back({true, suffix});
  }

  static void note(const dns::Answer& answer, CheckedSuffix& suffix) {
    if (answer.kind != dns::Answer::Kind::Response) return;
    if (answer.response.code == dns::ResponseCode::NoError) suffix.resolves = true;
    if (answer.response.code == dns::ResponseCode::NXDomain && !suffix.resolves) suffix.resolves = false;
  }

  void judge(const CheckedServer& server) {
    if (server.isGood()) return;
    const bool isResponse = server.answer.kind == dns::Answer::Kind::Response;
    result_.problems.push_back(printable(server.server) + " (" + usersText(server.usedBy) +
                               "): " + (isResponse ? "it says " : "") + server.answerText());
  }

  CheckResult result_;
  std::unordered_map<std::string, std::size_t> servers_;
  std::unordered_map<std::string, std::size_t> suffixes_;
  std::unordered_set<std::string> asked_;
  std::vector<dns::Inquiry> inquiries_;
  std::vector<Target> targets_;
};

}  // namespace

std::string CheckedServer::answerText() const {
  switch (answer.kind) {
    case dns::Answer::Kind::Response:
      return dns::codeName(answer.response.code);
    case dns::Answer::Kind::Malformed:
      return "unreadable answer: " + answer.problem;
    case dns::Answer::Kind::Unreachable:
      return "unreachable: " + printable(answer.problem);
    case dns::Answer::Kind::None:
      break;
  }
  return "no answer";
}

CheckResult checkServers(const HostView& view, bool asksHost, const dns::Question& question) {
  const std::vector<Client> clients = clientsOf(view, asksHost);
  Check check(question);
  for (const Client& client : clients) check.add(client);
  for (const Client& client : clients) {
    check.addSuffixes(client, client.servers.empty() ? view.host.resolverServers : client.servers);
  }
  return check.finish();
}

}  // namespace zorva::cli
