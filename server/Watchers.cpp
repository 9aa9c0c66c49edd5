#include "server/Watchers.h"

#include <poll.h>
#include <pthread.h>
#include <sys/eventfd.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdint>
#include <cstring>
#include <exception>
#include <stdexcept>
#include <utility>

#include "http/Log.h"
#include "server/Reading.h"

namespace zorva::server {

namespace {

using std::chrono::steady_clock;

// The record of a client's change comes a moment after the change.
constexpr std::chrono::milliseconds kForTheRecord{100};
constexpr std::chrono::seconds kRecent{5};
constexpr std::size_t kMostRecords = 64;

util::FileDescriptor makeEvent() {
  util::FileDescriptor event(::eventfd(0, EFD_NONBLOCK | EFD_CLOEXEC));
  if (!event) throw std::runtime_error(std::string("no descriptor for clients that watch: ") + std::strerror(errno));
  return event;
}

/// Whether a path is that of an object of the interface: Name="eth0", InstanceID="Computer%eth0".
bool isOf(const std::string& object, const std::string& interface) {
  return object.find('"' + interface + '"') != std::string::npos ||
         object.find('%' + interface + '"') != std::string::npos;
}

}  // namespace

Watchers::Watchers(std::size_t most) : wake_(makeEvent()), most_(most) {}

Watchers::~Watchers() {
  {
    const std::lock_guard lock(mutex_);
    isEnding_ = true;
  }
  wake();
  if (thread_.joinable()) thread_.join();
}

http::Page Watchers::page() {
  return {{}, false, [this](const http::HttpRequest& request, const std::shared_ptr<http::Stream>& stream) {
            return take(request, stream);
          }};
}

void Watchers::setMost(std::size_t most) {
  const std::lock_guard lock(mutex_);
  most_ = most;
}

void Watchers::wake() const {
  const std::uint64_t one = 1;
  (void)!::write(wake_.get(), &one, sizeof one);
}

std::optional<http::Refusal> Watchers::take(const http::HttpRequest& request,
                                            const std::shared_ptr<http::Stream>& stream) {
  if (!mayRead(request)) return http::Refusal{403, kMayNotRead, {}};
  const std::lock_guard lock(mutex_);
  if (count_ >= most_) {
    return http::Refusal{503, "as many clients watch as may, which are " + std::to_string(most_), {}};
  }
  stream->beginStream({{"Content-Type", "application/x-ndjson; charset=utf-8"}, {"Cache-Control", "no-store"}});
  newcomers_.push_back(stream);
  ++count_;
  if (!std::exchange(isRunning_, true)) {
    if (thread_.joinable()) thread_.join();  // it has nothing left to do
    thread_ = std::thread([this] {
      ::pthread_setname_np(::pthread_self(), "watch");
      run();
    });
  }
  wake();
  return std::nullopt;
}

void Watchers::note(const access::AuditRecord& record) noexcept try {
  if (record.isRefusal || record.result != "done") return;
  const std::lock_guard lock(mutex_);
  if (!isRunning_) return;
  if (done_.size() >= kMostRecords) done_.pop_front();
  done_.push_back({steady_clock::now(), record.user.empty() ? "anonymous" : record.user, record.object});
} catch (...) {
  // Then the change is by its owner.
}

void Watchers::run() {
  Streams streams;
  try {
    watch(streams);
  } catch (const std::exception& error) {
    // Clients may come again.
    ZORVA_LOG_CLIENT(Warning, std::string("the host cannot be watched: ") + error.what());
    for (const auto& each : streams) each->end();
    const std::lock_guard lock(mutex_);
    for (const auto& each : std::exchange(newcomers_, {})) each->end();
    count_ = 0;
    isRunning_ = false;
  }
}

/// Returns when nobody watches any more.
void Watchers::watch(Streams& streams) {
  agent::HostWatch host;
  std::vector<pollfd> waits{{wake_.get(), POLLIN, 0}};
  Streams newcomers;
  auto heard = steady_clock::now();
  while (takeNewcomers(streams, newcomers)) {
    const std::string lines = linesOf(host.changes());
    const bool isSilent = steady_clock::now() - heard >= kHeartbeat;
    if (!lines.empty() || isSilent) {
      offer(streams, isSilent && lines.empty() ? "\n" : lines);
      heard = steady_clock::now();
    }
    // The first line says that from now on changes are reported.
    offer(newcomers, "\n");
    streams.insert(streams.end(), newcomers.begin(), newcomers.end());
    newcomers.clear();
    waits.front().revents = 0;
    host.wait(waits, std::chrono::duration_cast<std::chrono::milliseconds>(kHeartbeat));
    if (waits.front().revents == 0) {
      ::poll(waits.data(), waits.size(), static_cast<int>(kForTheRecord.count()));
    }
    std::uint64_t ignored = 0;
    (void)!::read(wake_.get(), &ignored, sizeof ignored);
  }
}

/// False: nobody watches, or the server ends.
bool Watchers::takeNewcomers(Streams& streams, Streams& newcomers) {
  const std::lock_guard lock(mutex_);
  newcomers = std::exchange(newcomers_, {});
  if (!isEnding_ && !(streams.empty() && newcomers.empty())) return true;
  for (const Streams* each : {&streams, &newcomers}) {
    for (const auto& stream : *each) stream->end();
  }
  isRunning_ = false;
  done_.clear();
  return false;
}

std::string Watchers::linesOf(std::vector<agent::HostChange> changes) {
  std::string lines;
  for (agent::HostChange& change : changes) {
    if (std::string user = userOf(change); !user.empty()) change.by = std::move(user);
    lines += agent::jsonLine(change);
  }
  return lines;
}

std::string Watchers::userOf(const agent::HostChange& change) {
  const std::lock_guard lock(mutex_);
  while (!done_.empty() && steady_clock::now() - done_.front().at > kRecent) done_.pop_front();
  for (auto each = done_.rbegin(); !change.interface.empty() && each != done_.rend(); ++each) {
    if (isOf(each->object, change.interface)) return each->user;
  }
  return {};
}

/// Without those that are over.
void Watchers::offer(Streams& streams, const std::string& text) {
  const std::size_t before = streams.size();
  std::erase_if(streams, [&](const auto& each) { return !each->offer(text); });
  const std::lock_guard lock(mutex_);
  count_ -= before - streams.size();
}

}  // namespace zorva::server
