#include "http/Workers.h"

#include <pthread.h>

#include <algorithm>
#include <condition_variable>
#include <deque>
#include <exception>
#include <iterator>
#include <mutex>
#include <semaphore>
#include <system_error>
#include <thread>
#include <utility>
#include <vector>

#include "http/Log.h"

namespace zorva::http {

namespace {

using Clock = HttpExchange::Clock;

constexpr std::chrono::seconds kIdleThread{10};
constexpr std::chrono::milliseconds kMayWait{500};
constexpr std::chrono::milliseconds kLook{20};
constexpr std::size_t kMostStuck = 64;

Refusal overloaded(std::string why) { return {503, std::move(why), {}}; }

std::string nameOf(const HttpExchange& exchange) {
  const std::string* operation = findHeader(exchange.request.headers, "CIMMethod");
  std::string name = exchange.client->peer() + " " + exchange.request.method + " " + exchange.request.path;
  if (operation != nullptr) name += " " + *operation;
  return name;
}

}  // namespace

/// Outlives the Workers for as long as a thread is stuck.
using Sleeper = std::binary_semaphore;

class Workers::Core : public WaitListener, public std::enable_shared_from_this<Core> {
 public:
  Core(const HttpLimits& limits, Work work) : limits_(limits), work_(std::move(work)) {}

  void setLimits(const HttpLimits& limits) {
    const std::lock_guard lock(mutex_);
    limits_ = limits;
  }

  std::optional<Refusal> submit(const std::shared_ptr<HttpExchange>& exchange, Connections& connections);
  void sweep();
  void giveUp(const std::shared_ptr<HttpExchange>& exchange, const Refusal& answer);
  std::vector<std::shared_ptr<HttpExchange>> exchanges() const;
  std::size_t inFlight() const;
  void stop();
  bool join(std::chrono::milliseconds most);

  void waitsForClient() override;
  void goesOn() override;

 private:
  bool makesRoom(Connections& connections);
  bool startThread();
  void run();
  bool answer(std::unique_lock<std::mutex>& lock);
  void forget(HttpExchange& exchange);
  bool sleep(std::unique_lock<std::mutex>& lock);
  void watch(std::unique_lock<std::mutex>& lock);
  void leaveOneForTheRest();
  bool needsThread() const;
  Sleeper* nextSleeper();
  void wakeOne();
  std::ptrdiff_t countHanging() const;
  /// How many requests more may run.
  std::ptrdiff_t places() const { return static_cast<std::ptrdiff_t>(limits_.workers) - active_ + hanging_; }

  mutable std::mutex mutex_;
  std::vector<Sleeper*> sleepers_;  ///< the last one fell asleep last and has the warmest cache
  std::condition_variable thread_ended_;
  HttpLimits limits_;
  const Work work_;
  std::deque<std::shared_ptr<HttpExchange>> queue_;
  std::vector<std::shared_ptr<HttpExchange>> inFlight_;  ///< including those of queue_
  std::size_t threads_ = 0;
  std::size_t idle_ = 0;  ///< threads that wait for work
  /// Requests that run and do not wait for their client. Below 0 for a moment when a waiting one is abandoned.
  std::ptrdiff_t active_ = 0;
  std::ptrdiff_t hanging_ = 0;  ///< of active_, at the last look
  bool isWatched_ = false;      ///< a thread looks for places for the queue
  std::size_t stuck_ = 0;       ///< threads whose request was abandoned
  bool stopping_ = false;
};

std::optional<Refusal> Workers::Core::submit(const std::shared_ptr<HttpExchange>& exchange, Connections& connections) {
  std::size_t room = 0;
  {
    const std::lock_guard lock(mutex_);
    if (stuck_ >= kMostStuck) return overloaded("too many providers do not return; the server takes no more requests");
    room = limits_.requests;
    room = room > inFlight_.size() ? room - inFlight_.size() : 0;
  }
  if (room == 0 && !makesRoom(connections)) return overloaded("the server has as many requests in work as it may");

  std::unique_lock lock(mutex_);
  if (stopping_) return overloaded("the server is ending");
  if (needsThread() && !startThread() && threads_ == stuck_) {
    return overloaded("the server cannot start a thread for the request");
  }
  exchange->place = inFlight_.size();
  inFlight_.push_back(exchange);
  queue_.push_back(exchange);
  Sleeper* const woken = nextSleeper();
  lock.unlock();
  if (woken != nullptr) woken->release();
  return std::nullopt;
}

/// Besides the threads for queued requests that may run, there is one for the next request, or to watch while it waits.
bool Workers::Core::needsThread() const {
  const std::size_t answering = inFlight_.size() - queue_.size();
  const auto spare = static_cast<std::ptrdiff_t>(threads_ - stuck_ - answering);
  return spare <= std::min(std::ssize(queue_), std::max(places(), std::ptrdiff_t{0}));
}

/// Abandons the request whose client has let its response wait for longest.
bool Workers::Core::makesRoom(Connections& connections) {
  std::shared_ptr<HttpExchange> slowest;
  Clock::duration longest = kMayWait;
  for (const auto& each : exchanges()) {
    const Clock::duration waiting = each->waiting();
    if (waiting < longest) continue;
    longest = waiting;
    slowest = each;
  }
  if (slowest == nullptr) return false;
  connections.cut(*slowest->client, "let its response wait while others have no room");
  return true;
}

bool Workers::Core::startThread() {
  try {
    std::thread([core = shared_from_this()] {
      ::pthread_setname_np(::pthread_self(), "worker");
      core->run();
    }).detach();
  } catch (const std::system_error& error) {
    ZORVA_LOG_CLIENT(Error, std::string("no thread can be started for a request: ") + error.what());
    return false;
  }
  ++threads_;
  return true;
}

void Workers::Core::run() {
  std::unique_lock lock(mutex_);
  bool goesOn = true;
  while (goesOn) {
    if (!queue_.empty() && places() > 0) {
      goesOn = answer(lock);
    } else if (!queue_.empty() && !isWatched_ && !stopping_) {
      watch(lock);
    } else if (stopping_ || !sleep(lock)) {
      break;
    }
  }
  --threads_;
  thread_ended_.notify_all();
}

/// False: there was no work for so long that the thread should end.
bool Workers::Core::sleep(std::unique_lock<std::mutex>& lock) {
  // The thread's own: the waking thread may still be in release() when this thread already runs again.
  static thread_local Sleeper self(0);
  sleepers_.push_back(&self);
  ++idle_;
  lock.unlock();
  bool woken = self.try_acquire_for(kIdleThread);
  lock.lock();
  if (!woken && std::erase(sleepers_, &self) == 0) {
    self.acquire();  // another thread is about to wake this one
    woken = true;
  }
  --idle_;
  return woken;
}

/// Waits a moment for a place for the queued requests. A request that hangs by then loses its place.
void Workers::Core::watch(std::unique_lock<std::mutex>& lock) {
  isWatched_ = true;
  lock.unlock();
  std::this_thread::sleep_for(kLook);
  const std::ptrdiff_t hanging = countHanging();
  lock.lock();
  hanging_ = hanging;
  isWatched_ = false;
  // This thread takes one request, others take what else may run, and one more watches the rest.
  const std::ptrdiff_t others = std::min(std::ssize(queue_), places() + 1) - 1;
  for (std::ptrdiff_t i = 0; i < others; ++i) {
    if (Sleeper* const next = nextSleeper()) {
      next->release();
    } else if (!needsThread() || !startThread()) {
      return;
    }
  }
}

/// A thread that takes a request may hang in it. While others wait, one more thread answers or watches them.
void Workers::Core::leaveOneForTheRest() {
  if (queue_.empty() || isWatched_) return;
  if (Sleeper* const next = nextSleeper()) {
    next->release();
  } else if (needsThread()) {
    startThread();
  }
}

/// Takes the locks of the exchanges, so it must not be called under this one's.
std::ptrdiff_t Workers::Core::countHanging() const {
  const std::vector<std::shared_ptr<HttpExchange>> all = exchanges();
  return std::count_if(all.begin(), all.end(), [](const auto& each) { return each->hangs(); });
}

/// The thread to wake; it sleeps until it is woken.
Sleeper* Workers::Core::nextSleeper() {
  if (sleepers_.empty()) return nullptr;
  Sleeper* const next = sleepers_.back();
  sleepers_.pop_back();
  return next;
}

void Workers::Core::wakeOne() {
  if (Sleeper* const next = nextSleeper()) next->release();
}

/// Answers the next request. False: the request was abandoned meanwhile, and another thread has this one's place.
bool Workers::Core::answer(std::unique_lock<std::mutex>& lock) {
  const std::shared_ptr<HttpExchange> exchange = std::move(queue_.front());
  queue_.pop_front();
  ++active_;
  leaveOneForTheRest();
  lock.unlock();

  Refusal otherwise{500, "the server has no answer to this request", {}};
  exchange->start(*this);
  try {
    work_(*exchange);
  } catch (const ClientGone&) {
    // The cause was already logged when the client was cut off.
  } catch (const std::exception& error) {
    ZORVA_LOG(Error, nameOf(*exchange) + ": " + error.what());
    otherwise.why = std::string("the server could not answer: ") + error.what();
  }

  lock.lock();
  const bool wasGivenUp = exchange->place == std::string::npos;
  if (wasGivenUp) {
    --stuck_;
    ZORVA_LOG(Warning, nameOf(*exchange) + ": its provider has returned at last");
    return false;
  }
  forget(*exchange);
  --active_;
  // The client may send its next request as soon as it has the response, so this thread must already count as free.
  ++idle_;
  lock.unlock();
  exchange->finish(otherwise);
  lock.lock();
  --idle_;
  return true;
}

void Workers::Core::forget(HttpExchange& exchange) {
  const std::size_t place = std::exchange(exchange.place, std::string::npos);
  inFlight_.back()->place = place;
  // The last element may be this one.
  if (inFlight_.back().get() == &exchange) exchange.place = std::string::npos;
  std::swap(inFlight_[place], inFlight_.back());
  inFlight_.pop_back();
}

void Workers::Core::waitsForClient() {
  const std::lock_guard lock(mutex_);
  --active_;
  if (queue_.empty()) return;
  if (idle_ > 0) {
    wakeOne();
  } else {
    startThread();
  }
}

void Workers::Core::goesOn() {
  const std::lock_guard lock(mutex_);
  ++active_;
}

std::vector<std::shared_ptr<HttpExchange>> Workers::Core::exchanges() const {
  const std::lock_guard lock(mutex_);
  return inFlight_;
}

std::size_t Workers::Core::inFlight() const {
  const std::lock_guard lock(mutex_);
  return inFlight_.size();
}

void Workers::Core::sweep() {
  std::chrono::milliseconds most;
  {
    const std::ptrdiff_t hanging = countHanging();
    const std::lock_guard lock(mutex_);
    most = limits_.provider;
    hanging_ = hanging;
  }
  for (const auto& each : exchanges()) {
    const auto worked = each->worked();
    const bool waits = worked == Clock::duration();
    if (worked > most) {
      giveUp(each, {500, "the provider did not return within " + std::to_string(most.count()) + " ms", {}});
    } else if (waits && each->client->inPhase() > most) {
      giveUp(each, overloaded("no worker was free for it"));
    }
  }
}

void Workers::Core::giveUp(const std::shared_ptr<HttpExchange>& exchange, const Refusal& answer) {
  if (!exchange->giveUp(answer)) return;
  ZORVA_LOG(Error, nameOf(*exchange) + ": " + answer.why + "; given up");
  const std::lock_guard lock(mutex_);
  if (exchange->place == std::string::npos) return;  // it ended a moment ago
  forget(*exchange);
  for (auto queued = queue_.begin(); queued != queue_.end(); ++queued) {
    if (*queued != exchange) continue;
    queue_.erase(queued);
    return;
  }
  --active_;
  ++stuck_;
  if (hanging_ > 0) --hanging_;
  if (queue_.empty()) return;
  if (idle_ == 0) startThread();
  wakeOne();
}

void Workers::Core::stop() {
  const std::lock_guard lock(mutex_);
  stopping_ = true;
  while (!sleepers_.empty()) wakeOne();
}

bool Workers::Core::join(std::chrono::milliseconds most) {
  std::unique_lock lock(mutex_);
  return thread_ended_.wait_for(lock, most, [this] { return threads_ == 0; });
}

Workers::Workers(const HttpLimits& limits, Work work) : core_(std::make_shared<Core>(limits, std::move(work))) {}

Workers::~Workers() {
  giveUpAll();
  join(std::chrono::hours(24));
}

void Workers::setLimits(const HttpLimits& limits) { core_->setLimits(limits); }

std::optional<Refusal> Workers::submit(const std::shared_ptr<HttpExchange>& exchange, Connections& connections) {
  return core_->submit(exchange, connections);
}

void Workers::sweep() { core_->sweep(); }

std::size_t Workers::inFlight() const { return core_->inFlight(); }

void Workers::giveUpAll() {
  core_->stop();
  for (const auto& each : core_->exchanges()) core_->giveUp(each, overloaded("the server is ending"));
}

bool Workers::join(std::chrono::milliseconds most) { return core_->join(most); }

}  // namespace zorva::http
