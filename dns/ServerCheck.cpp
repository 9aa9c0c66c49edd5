#include "dns/ServerCheck.h"

#include <algorithm>
#include <chrono>
#include <unordered_map>
#include <unordered_set>
#include <utility>

namespace zorva::dns {

namespace {

constexpr std::chrono::milliseconds kPatience{2000};

/// Gathers what is to be asked, each question to each server once, and then what came of it.
class Check {
 public:
  explicit Check(const Question& question) { result_.question = question; }

  void add(const Asker& asker) {
    std::unordered_set<std::string> before;
    for (const std::string& text : asker.servers) {
      CheckedServer& server = serverOf(text);
      if (before.insert(server.server).second) {
        server.usedBy.push_back(asker.name);
      } else {
        result_.problems.push_back({CheckProblem::Kind::Twice, server.server, {asker.name}});
      }
    }
    for (const std::string& text : asker.notAsked) addNotAsked(asker, text, before);
  }

  void addSuffixes(const Asker& asker, const std::vector<std::string>& servers) {
    for (const std::string& suffix : asker.suffixes) {
      if (suffix == "." || !isName(suffix)) continue;
      const auto [found, isNew] = suffixes_.try_emplace(suffix, result_.suffixes.size());
      if (isNew) result_.suffixes.push_back({suffix, {}, std::nullopt});
      result_.suffixes[found->second].usedBy.push_back(asker.name);
      for (std::size_t i = 0; i < std::min(servers.size(), kServersForSuffix); ++i) {
        askAbout(found->second, servers[i]);
      }
    }
  }

  CheckResult finish() {
    const std::vector<Answer> answers = ask(inquiries_, kPatience);
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
      result_.problems.push_back({CheckProblem::Kind::DoesNotResolve, suffix.suffix, suffix.usedBy});
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
    const auto address = parseServer(text);
    const std::string name = address ? address->text() : text;
    const auto [found, isNew] = servers_.try_emplace(name, result_.servers.size());
    if (isNew) {
      CheckedServer& server = result_.servers.emplace_back();
      server.server = name;
      server.answer.kind = Answer::Kind::Unreachable;
      server.answer.problem = "this is no address";
      if (address) {
        inquiries_.push_back({*address, result_.question});
        targets_.push_back({false, found->second});
      }
    }
    return result_.servers[found->second];
  }

  void addNotAsked(const Asker& asker, const std::string& text, const std::unordered_set<std::string>& asked) {
    CheckedServer& server = serverOf(text);
    if (!asked.contains(server.server)) {
      server.usedBy.push_back(asker.name);
      server.neverAskedBy.push_back(asker.name);
    }
    result_.problems.push_back({CheckProblem::Kind::NeverAsked, server.server, {asker.name}});
  }

  void askAbout(std::size_t suffix, const std::string& server) {
    const auto address = parseServer(server);
    const std::string& name = result_.suffixes[suffix].suffix;
    if (!address || !asked_.insert(address->text() + " " + name).second) return;
    inquiries_.push_back({*address, {name, Type::Soa}});
    targets_.push_back({true, suffix});
  }

  static void note(const Answer& answer, CheckedSuffix& suffix) {
    if (answer.kind != Answer::Kind::Response) return;
    if (answer.response.code == ResponseCode::NoError) suffix.resolves = true;
    if (answer.response.code == ResponseCode::NXDomain && !suffix.resolves) suffix.resolves = false;
  }

  void judge(const CheckedServer& server) {
    if (server.isGood()) return;
    const bool isResponse = server.answer.kind == Answer::Kind::Response;
    result_.problems.push_back({CheckProblem::Kind::NoGoodAnswer, server.server, server.usedBy,
                                (isResponse ? "it says " : "") + server.answerText()});
  }

  CheckResult result_;
  std::unordered_map<std::string, std::size_t> servers_;
  std::unordered_map<std::string, std::size_t> suffixes_;
  std::unordered_set<std::string> asked_;
  std::vector<Inquiry> inquiries_;
  std::vector<Target> targets_;
};

}  // namespace

std::string CheckedServer::answerText() const {
  switch (answer.kind) {
    case Answer::Kind::Response:
      return codeName(answer.response.code);
    case Answer::Kind::Malformed:
      return "unreadable answer: " + answer.problem;
    case Answer::Kind::Unreachable:
      return "unreachable: " + answer.problem;
    case Answer::Kind::None:
      break;
  }
  return "no answer";
}

CheckResult checkServers(const std::vector<Asker>& askers, const std::vector<std::string>& hostServers,
                         const Question& question) {
  Check check(question);
  for (const Asker& asker : askers) check.add(asker);
  for (const Asker& asker : askers) check.addSuffixes(asker, asker.servers.empty() ? hostServers : asker.servers);
  return check.finish();
}

}  // namespace zorva::dns
