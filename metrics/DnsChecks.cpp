#include "metrics/DnsChecks.h"

#include <pthread.h>

#include <condition_variable>
#include <exception>
#include <mutex>
#include <set>
#include <thread>
#include <utility>

#include "dns/Questions.h"

namespace zorva::metrics {

namespace {

using agent::Node;
using agent::StringList;

void addServers(const std::vector<std::string>& servers, std::set<std::string>& seen,
                std::vector<std::string>& result) {
  for (const std::string& each : servers) {
    const auto address = dns::parseServer(each);
    if (!address || result.size() >= kMostChecked) continue;
    if (seen.insert(address->text()).second) result.push_back(address->text());
  }
}

struct Checked {
  bool isGood = false;
  double seconds = 0;
};

struct Round {
  std::chrono::system_clock::time_point at;
  std::map<std::string, Checked> servers;
};

Round askAll(const std::vector<std::string>& servers) {
  std::vector<dns::Inquiry> inquiries;
  for (const std::string& each : servers) inquiries.push_back({*dns::parseServer(each), {}});
  const std::vector<dns::Answer> answers = dns::ask(inquiries, DnsChecks::kPatience);
  Round round{std::chrono::system_clock::now(), {}};
  for (std::size_t i = 0; i < answers.size(); ++i) {
    const dns::Answer& answer = answers[i];
    const bool isGood =
        answer.kind == dns::Answer::Kind::Response && answer.response.code == dns::ResponseCode::NoError;
    round.servers[servers[i]] = {isGood, std::chrono::duration<double>(answer.time).count()};
  }
  return round;
}

}  // namespace

std::vector<std::string> serversToAsk(const agent::TreeSnapshot& tree) {
  std::vector<std::string> result;
  std::set<std::string> seen;
  if (const Node* own = tree.ownSystem()) addServers(own->listOrEmpty(agent::kResolverServers), seen, result);
  for (const Node& node : tree.nodes()) {
    if (node.type() != agent::NodeType::NetworkIPConfig || tree.systemOf(node).isServiceProcessor()) continue;
    const StringList& servers = node.listOrEmpty(ZV::NodeLexicon::PROP_DNS_SERVER_ADDRESSES);
    addServers(dns::withPorts(servers, node.listOrEmpty(agent::kDnsServersInFull)), seen, result);
  }
  return result;
}

struct DnsChecks::State {
  const Look look;
  mutable std::mutex mutex{};
  std::condition_variable changed{};
  std::chrono::seconds interval{0};
  bool isStale = false;  ///< the interval is new: ask at once
  bool isEnding = false;
  std::shared_ptr<const Round> latest{};
  std::thread thread{};
};

DnsChecks::DnsChecks(Look look) : state_(new State{std::move(look)}) {}

DnsChecks::~DnsChecks() {
  {
    const std::lock_guard lock(state_->mutex);
    state_->isEnding = true;
  }
  state_->changed.notify_all();
  if (state_->thread.joinable()) state_->thread.join();
}

void DnsChecks::setInterval(std::chrono::seconds interval) {
  const std::lock_guard lock(state_->mutex);
  if (interval == state_->interval) return;
  state_->interval = interval;
  state_->isStale = true;
  if (interval.count() == 0) state_->latest = nullptr;
  if (interval.count() > 0 && !state_->thread.joinable()) {
    state_->thread = std::thread([state = state_.get()] {
      ::pthread_setname_np(::pthread_self(), "dns checks");
      run(*state);
    });
  }
  state_->changed.notify_all();
}

void DnsChecks::run(State& state) {
  std::unique_lock lock(state.mutex);
  const auto isWoken = [&state] { return state.isEnding || state.isStale; };
  while (!state.isEnding) {
    if (state.interval.count() == 0) {
      state.isStale = false;
      state.changed.wait(lock, isWoken);
      continue;
    }
    state.isStale = false;
    lock.unlock();
    std::shared_ptr<const Round> round;
    try {
      round = std::make_shared<const Round>(askAll(serversToAsk(*state.look())));
    } catch (const std::exception&) {
      // The tree cannot be read, which the agent has logged: there are no answers.
    }
    lock.lock();
    if (state.interval.count() > 0) state.latest = std::move(round);
    state.changed.wait_for(lock, state.interval, isWoken);
  }
}

void DnsChecks::write(Exposition& out) const {
  std::shared_ptr<const Round> round;
  {
    const std::lock_guard lock(state_->mutex);
    round = state_->latest;
  }
  if (round == nullptr) return;
  out.family("zorva_dns_check_success", Type::Gauge,
             "Whether the DNS server answered the latest question without an error.");
  for (const auto& [server, checked] : round->servers) out.sample({{"address", server}}, checked.isGood ? 1 : 0);
  out.family("zorva_dns_check_duration_seconds", Type::Gauge, "How long the DNS server took for that answer.");
  for (const auto& [server, checked] : round->servers) {
    if (checked.isGood) out.sample({{"address", server}}, checked.seconds);
  }
  const auto at = std::chrono::duration<double>(round->at.time_since_epoch()).count();
  out.single("zorva_dns_check_timestamp_seconds", Type::Gauge,
             "When the servers were asked last, in seconds since 1970.", at);
}

}  // namespace zorva::metrics
