#pragma once

// The page /watch: the changes of the host as they happen, a JSON object on each line.

#include <chrono>
#include <cstddef>
#include <deque>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <thread>
#include <vector>

#include "access/Audit.h"
#include "agent/HostWatch.h"
#include "http/Exchange.h"
#include "http/Pages.h"
#include "util/FileDescriptor.h"
#include "util/NotCopied.h"

namespace zorva::server {

/// One thread watches the host while there is any client that watches, and sleeps in the kernel. A client needs no
/// thread; one that does not read what comes is dropped.
class Watchers : util::NotCopied {
 public:
  /// An empty line is sent after that time without changes, so that clients and the server notice that the other is
  /// gone.
  static constexpr std::chrono::seconds kHeartbeat{30};

  /// `most` clients watch at once. Throws std::runtime_error if there is no descriptor.
  explicit Watchers(std::size_t most);
  ~Watchers();

  /// For clients that may read. This object must outlive it.
  http::Page page();

  void setMost(std::size_t most);

  /// A client has changed something: a change of the host that is seen a moment later is said to be by its user.
  /// Thread-safe; never waits.
  void note(const access::AuditRecord& record) noexcept;

 private:
  using Streams = std::vector<std::shared_ptr<http::Stream>>;
  struct Done {
    std::chrono::steady_clock::time_point at;
    std::string user;
    std::string object;
  };

  std::optional<http::Refusal> take(const http::HttpRequest& request, const std::shared_ptr<http::Stream>& stream);
  void run();
  void watch(Streams& streams);
  bool takeNewcomers(Streams& streams, Streams& newcomers);
  std::string linesOf(std::vector<agent::HostChange> changes);
  std::string userOf(const agent::HostChange& change);
  void offer(Streams& streams, const std::string& text);
  void wake() const;

  const util::FileDescriptor wake_;
  std::mutex mutex_;
  std::size_t most_;
  std::size_t count_ = 0;
  bool isRunning_ = false;
  bool isEnding_ = false;
  Streams newcomers_;
  std::deque<Done> done_;
  std::thread thread_;
};

}  // namespace zorva::server
