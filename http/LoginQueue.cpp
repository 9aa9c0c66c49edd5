#include "http/LoginQueue.h"

#include <pthread.h>
#include <sys/resource.h>

#include <algorithm>
#include <condition_variable>
#include <deque>
#include <exception>
#include <map>
#include <mutex>
#include <optional>
#include <system_error>
#include <thread>
#include <utility>
#include <vector>

#include "access/FailedLogins.h"
#include "http/Log.h"

namespace zorva::http {

namespace {

using access::Decision;
using Clock = std::chrono::steady_clock;

Decision comeAgain(std::string why) {
  return {Decision::Kind::TooEarly, nullptr, std::move(why), std::chrono::seconds(1)};
}

void lowerPriority() {
  // A tenth of the share of a thread that answers: less would let a busy host starve a login.
  constexpr int kNicer = 10;
  ::pthread_setname_np(::pthread_self(), "login");
  // On Linux, of this thread alone. Where it may not be, hashing competes.
  ::setpriority(PRIO_PROCESS, 0, ::getpriority(PRIO_PROCESS, 0) + kNicer);
}

}  // namespace

/// Outlives the LoginQueue while its thread checks a login.
class LoginQueue::Core : public std::enable_shared_from_this<Core> {
 public:
  explicit Core(std::shared_ptr<access::Gate> gate) : gate_(std::move(gate)) {}

  void submit(Applicant applicant);
  void hold(Applicant applicant, Decision decision);
  void sweep(Clock::time_point now);
  std::size_t count() const;
  void giveUpAll();
  bool join(std::chrono::milliseconds most);

 private:
  struct Waiting {
    Applicant applicant;
    Clock::time_point since;
  };
  struct Held {
    Applicant applicant;
    Decision decision;
    Clock::time_point until;
  };
  using Queue = std::deque<Waiting>;

  /// Decisions that are handed out once the lock is released.
  using Decided = std::vector<std::pair<Applicant, Decision>>;
  static void handOut(Decided decided);

  bool hasRoom(const std::string& client, Decided& decided);
  void dropEmpty(const std::string& client);
  bool startThread();
  void run();
  void checkNext(std::unique_lock<std::mutex>& lock);
  Decision check(const Applicant& applicant) noexcept;
  bool holdBack(const Applicant& applicant, const Decision& decision);
  void takeOverdue(Clock::time_point now, Decided& decided);
  void takeHeld(Clock::time_point now, Decided& decided);

  const std::shared_ptr<access::Gate> gate_;
  mutable std::mutex mutex_;
  std::condition_variable changed_;
  std::map<std::string, Queue> queues_;  ///< by client; none is empty
  std::deque<std::string> turns_;        ///< the keys of queues_, the next one first
  std::size_t waiting_ = 0;
  std::optional<Waiting> checked_;  ///< nothing: none, or it was given up
  std::vector<Held> held_;
  bool hasThread_ = false;
  bool stopping_ = false;
};

void LoginQueue::Core::handOut(Decided decided) {
  for (auto& [applicant, decision] : decided) applicant.decided(std::move(decision));
}

void LoginQueue::Core::submit(Applicant applicant) {
  const std::string client = access::clientGroup(applicant.origin);
  Decided decided;
  std::unique_lock lock(mutex_);
  if (stopping_) {
    decided.emplace_back(std::move(applicant), comeAgain("the server is ending"));
  } else if (!startThread()) {
    decided.emplace_back(std::move(applicant), comeAgain("the server cannot start a thread for logins"));
  } else if (!hasRoom(client, decided)) {
    decided.emplace_back(std::move(applicant), comeAgain("too many logins wait to be checked"));
  } else {
    Queue& queue = queues_[client];
    if (queue.empty()) turns_.push_back(client);
    queue.push_back({std::move(applicant), Clock::now()});
    ++waiting_;
    changed_.notify_all();
  }
  lock.unlock();
  handOut(std::move(decided));
}

/// If the queue is full, the client with most logins loses its last one to a client with fewer.
bool LoginQueue::Core::hasRoom(const std::string& client, Decided& decided) {
  const auto own = queues_.find(client);
  const std::size_t has = own == queues_.end() ? 0 : own->second.size();
  if (has >= kMostOfClient) return false;
  if (waiting_ < kMost) return true;
  const auto most = std::max_element(queues_.begin(), queues_.end(),
                                     [](const auto& a, const auto& b) { return a.second.size() < b.second.size(); });
  if (most->second.size() <= has + 1) return false;
  decided.emplace_back(std::move(most->second.back().applicant), comeAgain("too many logins wait to be checked"));
  most->second.pop_back();
  --waiting_;
  dropEmpty(most->first);
  return true;
}

void LoginQueue::Core::dropEmpty(const std::string& client) {
  const auto found = queues_.find(client);
  if (found == queues_.end() || !found->second.empty()) return;
  std::erase(turns_, client);
  queues_.erase(found);
}

/// Most servers never have a login to check, so the thread is started by the first one.
bool LoginQueue::Core::startThread() {
  if (hasThread_) return true;
  try {
    std::thread([core = shared_from_this()] {
      lowerPriority();
      core->run();
    }).detach();
  } catch (const std::system_error& error) {
    ZORVA_LOG_CLIENT(Error, std::string("no thread can be started for logins: ") + error.what());
    return false;
  }
  hasThread_ = true;
  return true;
}

void LoginQueue::Core::run() {
  std::unique_lock lock(mutex_);
  for (;;) {
    changed_.wait(lock, [this] { return stopping_ || waiting_ > 0; });
    if (stopping_) break;
    checkNext(lock);
  }
  hasThread_ = false;
  changed_.notify_all();
}

void LoginQueue::Core::checkNext(std::unique_lock<std::mutex>& lock) {
  const std::string client = turns_.front();
  Queue& queue = queues_[client];
  checked_ = std::move(queue.front());
  queue.pop_front();
  --waiting_;
  turns_.pop_front();
  if (queue.empty()) {
    queues_.erase(client);
  } else {
    turns_.push_back(client);
  }
  // A copy: the other may be given up while it is checked.
  const Applicant applicant = checked_->applicant;
  lock.unlock();
  Decision decision = check(applicant);
  lock.lock();
  if (!checked_) return;
  checked_.reset();
  if (holdBack(applicant, decision)) return;
  lock.unlock();
  applicant.decided(std::move(decision));
  lock.lock();
}

/// False: it is handed out at once.
bool LoginQueue::Core::holdBack(const Applicant& applicant, const Decision& decision) {
  const bool isTooEarly = decision.kind == Decision::Kind::TooEarly;
  if (!isTooEarly && decision.kind != Decision::Kind::NeedsLogin) return false;
  const auto sameKind = [&](const Held& each) { return each.decision.kind == decision.kind; };
  const auto held = static_cast<std::size_t>(std::count_if(held_.begin(), held_.end(), sameKind));
  if (stopping_ || decision.delay.count() <= 0 || held >= (isTooEarly ? kMostHeldTooEarly : kMostHeld)) return false;
  const auto delay = isTooEarly ? std::min(decision.delay, kTooEarlyIsHeld) : decision.delay;
  held_.push_back({applicant, decision, Clock::now() + delay});
  return true;
}

void LoginQueue::Core::hold(Applicant applicant, Decision decision) {
  {
    const std::lock_guard lock(mutex_);
    if (holdBack(applicant, decision)) return;
  }
  applicant.decided(std::move(decision));
}

Decision LoginQueue::Core::check(const Applicant& applicant) noexcept try {
  Decision decision = gate_->verify(applicant.origin, applicant.authorization);
  if (decision.kind != Decision::Kind::MustVerify) return decision;
  return comeAgain("who may log in has just changed");
} catch (const std::exception& error) {
  ZORVA_LOG_CLIENT(Error, std::string("a login could not be checked: ") + error.what());
  return comeAgain("the server could not check the login");
}

void LoginQueue::Core::sweep(Clock::time_point now) {
  Decided decided;
  {
    const std::lock_guard lock(mutex_);
    takeHeld(now, decided);
    takeOverdue(now - kLongestWait, decided);
  }
  handOut(std::move(decided));
}

/// The answers whose delay is over at that time.
void LoginQueue::Core::takeHeld(Clock::time_point now, Decided& decided) {
  std::erase_if(held_, [&](Held& each) {
    if (each.until > now) return false;
    decided.emplace_back(std::move(each.applicant), std::move(each.decision));
    return true;
  });
}

/// The logins that have waited since that time.
void LoginQueue::Core::takeOverdue(Clock::time_point since, Decided& decided) {
  const Decision late = comeAgain("the login could not be checked in time");
  if (checked_ && checked_->since < since) {
    decided.emplace_back(std::move(checked_->applicant), late);
    checked_.reset();
  }
  const std::deque<std::string> clients = turns_;
  for (const std::string& client : clients) {
    Queue& queue = queues_[client];
    while (!queue.empty() && queue.front().since < since) {
      decided.emplace_back(std::move(queue.front().applicant), late);
      queue.pop_front();
      --waiting_;
    }
    dropEmpty(client);
  }
}

std::size_t LoginQueue::Core::count() const {
  const std::lock_guard lock(mutex_);
  return waiting_ + held_.size() + (checked_ ? 1 : 0);
}

void LoginQueue::Core::giveUpAll() {
  Decided decided;
  {
    const std::lock_guard lock(mutex_);
    stopping_ = true;
    takeHeld(Clock::time_point::max(), decided);
    takeOverdue(Clock::time_point::max(), decided);
    changed_.notify_all();
  }
  handOut(std::move(decided));
}

bool LoginQueue::Core::join(std::chrono::milliseconds most) {
  std::unique_lock lock(mutex_);
  return changed_.wait_for(lock, most, [this] { return !hasThread_; });
}

LoginQueue::LoginQueue(std::shared_ptr<access::Gate> gate) : core_(std::make_shared<Core>(std::move(gate))) {}

LoginQueue::~LoginQueue() {
  giveUpAll();
  join(std::chrono::hours(24));
}

void LoginQueue::submit(Applicant applicant) { core_->submit(std::move(applicant)); }

void LoginQueue::hold(Applicant applicant, access::Decision decision) {
  core_->hold(std::move(applicant), std::move(decision));
}

void LoginQueue::sweep(Clock::time_point now) { core_->sweep(now); }

std::size_t LoginQueue::count() const { return core_->count(); }

void LoginQueue::giveUpAll() { core_->giveUpAll(); }

bool LoginQueue::join(std::chrono::milliseconds most) { return core_->join(most); }

}  // namespace zorva::http
