#pragma once

// One request and its response, shared by the event thread that owns the connection and the worker that answers.
//
// The connection is suspended while the worker computes. A response shorter than kWhole bytes is sent in one piece with
// its length. A longer one is streamed in chunks: the worker fills `held_`, the event thread empties `outgoing_` and
// swaps the two. The worker waits while it is more than kMostHeld ahead, so the unsent part is never more than a few
// times that size.

#include <microhttpd.h>
#include <time.h>

#include <atomic>
#include <chrono>
#include <condition_variable>
#include <cstdint>
#include <functional>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>

#include "access/Gate.h"
#include "http/Connections.h"
#include "http/Exchange.h"
#include "http/Gzip.h"
#include "http/Pages.h"
#include "http/RequestHead.h"

namespace zorva::http {

/// Called by an exchange when its worker begins and ends to wait for the client.
class WaitListener {
 public:
  virtual ~WaitListener() = default;
  virtual void waitsForClient() = 0;
  virtual void goesOn() = 0;
};

class HttpExchange final : public ResponseSink, public Stream, public std::enable_shared_from_this<HttpExchange> {
 public:
  using Clock = std::chrono::steady_clock;

  static constexpr std::size_t kWhole = std::size_t{64} << 10;
  static constexpr std::size_t kMostHeld = std::size_t{128} << 10;

  HttpExchange(MHD_Connection* connection, std::shared_ptr<Connection> client, std::string path);

  HttpRequest request;
  std::optional<Refusal> refusal;  ///< the response, if no work is needed
  const Page* page = nullptr;      ///< what GET or HEAD asks for; null for CIM operations
  bool headIsRead = false;
  bool awaitsLogin = false;  ///< decide() will be called; used by the event thread
  bool takesGzip = false;
  bool isHttp11 = true;
  bool isStream = false;
  int refusedWith = 0;  ///< the status of a response that was sent without respond()
  const std::shared_ptr<Connection> client;

  // ---- The event thread ----

  /// Suspends the connection until there is a response. Call it before the work may begin: then neither waits for the
  /// other.
  void suspend();

  /// The decision of decide().
  access::Decision takeDecision();

  /// Whether respond() may be called: there is a response, or its beginning.
  bool isPublished() const;

  /// Passes the response to the HTTP library.
  MHD_Result respond();

  /// After respond(): whether the head of the response is followed by all of its body at once.
  bool hasWholeBody() const noexcept { return bytesSent_ > 0 && request.method != MHD_HTTP_METHOD_HEAD; }

  /// The HTTP library is done with the request. A worker that still runs gets ClientGone.
  void ended();

  int status() const noexcept { return status_; }
  std::uint64_t bytesSent() const noexcept { return bytesSent_; }
  Clock::time_point arrived() const noexcept { return arrived_; }

  // ---- The worker ----

  /// The work begins; `waits` outlives the work.
  void start(WaitListener& waits);

  void begin(int status, const HeaderList& headers) override;
  void write(std::string_view text) override;
  void fail(std::uint32_t cimStatus, std::string_view description) override;
  bool begun() const override;
  void setLateAnswer(LateAnswer answer) override;
  bool isWanted() const override;

  // ---- Of a stream, on any thread ----

  /// No more than kMostHeld is unsent.
  void beginStream(const HeaderList& headers) override;
  bool offer(std::string_view text) override;
  void end() override;

  // ---- The worker ----

  /// The work is done. If it wrote nothing, `orElse` is the response.
  void finish(const Refusal& orElse);

  // ---- Any thread ----

  /// Takes the decision on who the client is, and lets its suspended connection go on.
  void decide(access::Decision decision);

  /// How long the work has run, without the time in which it waited for the client; 0 if it has not begun.
  Clock::duration worked() const;

  /// How long it has been waiting for the client now.
  Clock::duration waiting() const;

  /// True if the work waits for something other than its client: it has run for a while and its thread has used almost
  /// no processor time for it, or it has run for long.
  bool hangs() const;

  /// Whether it was abandoned.
  bool wasGivenUp() const;

  /// Abandons the work. If nothing of a response was sent yet, the late answer that was set is the response, else
  /// `orElse`. Later results are dropped. False: the work was done.
  bool giveUp(const Refusal& orElse);

  std::size_t place = 0;  ///< in the owner's list, guarded by the owner's lock

 private:
  void takeLateAnswer(const Refusal& orElse);
  void append(std::string_view text);
  void startStreaming();
  void waitForClient(std::unique_lock<std::mutex>& lock);
  void complete();
  void publish();
  void wake();
  ssize_t fill(char* buffer, std::size_t most);
  ssize_t endOfStream();
  MHD_Response* makeResponse();
  void addHeaders(MHD_Response& response) const;
  static ssize_t fillResponse(void* exchange, std::uint64_t position, char* buffer, std::size_t most);

  MHD_Connection* const connection_;
  const Clock::time_point arrived_ = Clock::now();
  MHD_Response* response_ = nullptr;  ///< used by the event thread
  std::string outgoing_;              ///< used by the event thread, while it streams
  std::size_t taken_ = 0;             ///< of outgoing_
  std::uint64_t bytesSent_ = 0;

  std::atomic<bool> published_ = false;  ///< set under the lock

  mutable std::mutex mutex_;
  access::Decision decision_;
  std::condition_variable room_;
  WaitListener* waits_ = nullptr;
  int status_ = 0;
  HeaderList headers_;
  std::string held_;
  std::unique_ptr<Gzip> gzip_;
  bool begun_ = false;
  bool streaming_ = false;
  bool suspended_ = false;  ///< the connection awaits wake()
  bool complete_ = false;   ///< nothing is added any more
  bool gone_ = false;       ///< the client has closed the connection
  bool givenUp_ = false;
  bool failed_ = false;
  std::uint32_t cimStatus_ = 0;
  std::string description_;
  LateAnswer lateAnswer_;
  std::optional<Clock::time_point> started_;  ///< moved forward by the time spent waiting for the client
  std::optional<clockid_t> processorClock_;   ///< of the thread that does the work
  Clock::duration processorAtStart_{};
  std::optional<Clock::time_point> waitingSince_;
};

/// The response header fields of a refusal; its reason is the body.
HeaderList headersOf(const Refusal& refusal);
std::string textOf(const Refusal& refusal);

/// Adds a header field to a response. The HTTP library refuses an empty value; a blank means the same (RFC 9110 5.5).
void addHeader(MHD_Response& response, const std::string& name, const std::string& value);

/// Queues the response of a refusal for a connection, which is closed after it.
MHD_Result respondWith(MHD_Connection* connection, const Refusal& refusal);

}  // namespace zorva::http
