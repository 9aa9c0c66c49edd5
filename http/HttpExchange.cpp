#include "http/HttpExchange.h"

#include <pthread.h>

#include <algorithm>
#include <utility>

namespace zorva::http {

namespace {

constexpr std::size_t kWorthWaking = std::size_t{32} << 10;
constexpr std::size_t kWorthCompressing = 1024;
constexpr std::size_t kBlock = std::size_t{16} << 10;

/// The processor time that a thread has used; nothing if the thread has ended.
std::optional<HttpExchange::Clock::duration> processorTime(clockid_t clock) {
  timespec used{};
  if (::clock_gettime(clock, &used) != 0) return std::nullopt;
  return std::chrono::seconds(used.tv_sec) + std::chrono::nanoseconds(used.tv_nsec);
}

/// A description as a header field's value: printable ASCII, the rest percent-encoded (DSP0200 7.3.7).
std::string fieldText(std::string_view text) {
  constexpr char kDigits[] = "0123456789ABCDEF";
  constexpr std::size_t kLongest = 1000;
  std::string value;
  for (const char c : text.substr(0, kLongest)) {
    const auto byte = static_cast<unsigned char>(c);
    if (byte >= 0x20 && byte < 0x7F && c != '%') {
      value += c;
    } else {
      value += '%';
      value += kDigits[byte >> 4];
      value += kDigits[byte & 0x0F];
    }
  }
  return value;
}

}  // namespace

HttpExchange::HttpExchange(MHD_Connection* connection, std::shared_ptr<Connection> client_, std::string path)
    : client(std::move(client_)), connection_(connection) {
  request.path = std::move(path);
  request.peer = client->peer();
}

// ---- The worker ----

void HttpExchange::start(WaitListener& waits) {
  const std::lock_guard lock(mutex_);
  waits_ = &waits;
  started_ = Clock::now();
  clockid_t clock{};
  if (::pthread_getcpuclockid(::pthread_self(), &clock) != 0) return;
  processorClock_ = clock;
  processorAtStart_ = processorTime(clock).value_or(Clock::duration());
}

void HttpExchange::begin(int status, const HeaderList& headers) {
  const std::lock_guard lock(mutex_);
  if (gone_ || givenUp_) throw ClientGone("the client no longer waits for the response");
  status_ = status;
  headers_ = headers;
  begun_ = true;
}

void HttpExchange::write(std::string_view text) {
  std::unique_lock lock(mutex_);
  while (!text.empty()) {
    if (gone_ || givenUp_) throw ClientGone("the client no longer waits for the rest of the response");
    const std::string_view piece = text.substr(0, kWhole);
    text.remove_prefix(piece.size());
    append(piece);
    if (!streaming_ && held_.size() > kWhole) startStreaming();
    if (!streaming_) continue;
    if (held_.size() >= kWorthWaking) wake();
    waitForClient(lock);
  }
}

void HttpExchange::fail(std::uint32_t cimStatus, std::string_view description) {
  const std::lock_guard lock(mutex_);
  if (gone_ || givenUp_ || complete_) return;
  failed_ = true;
  cimStatus_ = cimStatus;
  description_ = description;
  if (!streaming_) startStreaming();
}

bool HttpExchange::begun() const {
  const std::lock_guard lock(mutex_);
  return begun_;
}

void HttpExchange::setLateAnswer(LateAnswer answer) {
  const std::lock_guard lock(mutex_);
  lateAnswer_ = std::move(answer);
}

bool HttpExchange::isWanted() const {
  const std::lock_guard lock(mutex_);
  return !gone_ && !givenUp_;
}

void HttpExchange::finish(const Refusal& orElse) {
  const std::lock_guard lock(mutex_);
  if (gone_ || complete_) return;
  if (!begun_) {
    status_ = orElse.status;
    headers_ = headersOf(orElse);
    held_ = textOf(orElse);
  }
  complete();
}

void HttpExchange::beginStream(const HeaderList& headers) {
  begin(200, headers);
  // What a client waits for must not wait in a compressor.
  takesGzip = false;
}

bool HttpExchange::offer(std::string_view text) {
  const std::lock_guard lock(mutex_);
  if (gone_ || givenUp_ || complete_) return false;
  if (text.size() > kMostHeld - std::min(held_.size(), kMostHeld)) {
    failed_ = true;
    complete();
    return false;
  }
  append(text);
  streaming_ ? wake() : startStreaming();
  return true;
}

void HttpExchange::end() {
  const std::lock_guard lock(mutex_);
  if (!gone_ && !complete_) complete();
}

bool HttpExchange::wasGivenUp() const {
  const std::lock_guard lock(mutex_);
  return givenUp_;
}

void HttpExchange::append(std::string_view text) {
  if (gzip_ != nullptr) {
    gzip_->add(text, held_);
  } else {
    held_ += text;
  }
}

void HttpExchange::startStreaming() {
  streaming_ = true;
  // Both have the same capacity, so they can be swapped and neither has to grow.
  held_.reserve(kMostHeld + kWhole);
  outgoing_.reserve(kMostHeld + kWhole);
  if (takesGzip) {
    gzip_ = std::make_unique<Gzip>();
    const std::string plain = held_;
    held_.clear();
    gzip_->add(plain, held_);
  }
  publish();
}

// At most one thread waits here: the one that works on this request.
void HttpExchange::waitForClient(std::unique_lock<std::mutex>& lock) {
  if (held_.size() < kMostHeld || gone_ || givenUp_) return;
  waitingSince_ = Clock::now();
  if (waits_ != nullptr) waits_->waitsForClient();
  room_.wait(lock, [this] { return held_.size() < kMostHeld || gone_ || givenUp_; });
  if (started_.has_value()) *started_ += Clock::now() - *waitingSince_;
  waitingSince_.reset();
  if (waits_ != nullptr) waits_->goesOn();
}

void HttpExchange::complete() {
  complete_ = true;
  if (!streaming_ && takesGzip && held_.size() >= kWorthCompressing) {
    gzip_ = std::make_unique<Gzip>();
    const std::string plain = std::exchange(held_, {});
    gzip_->add(plain, held_);
  }
  if (gzip_ != nullptr) gzip_->finish(held_);
  published_ ? wake() : publish();
}

void HttpExchange::publish() {
  published_ = true;
  wake();
}

void HttpExchange::wake() {
  if (!suspended_ || gone_) return;
  suspended_ = false;
  MHD_resume_connection(connection_);
}

// ---- Any thread ----

HttpExchange::Clock::duration HttpExchange::worked() const {
  const std::lock_guard lock(mutex_);
  if (!started_.has_value() || complete_) return {};
  return waitingSince_.value_or(Clock::now()) - *started_;
}

HttpExchange::Clock::duration HttpExchange::waiting() const {
  const std::lock_guard lock(mutex_);
  if (!waitingSince_.has_value()) return {};
  return Clock::now() - *waitingSince_;
}

bool HttpExchange::hangs() const {
  constexpr std::chrono::milliseconds kShort{40};
  constexpr std::chrono::seconds kLong{1};
  constexpr int kLeastShare = 100;
  const std::lock_guard lock(mutex_);
  if (!started_.has_value() || complete_ || waitingSince_.has_value()) return false;
  const Clock::duration time = Clock::now() - *started_;
  if (time < kShort || time > kLong) return time > kLong;
  const auto used = processorClock_.has_value() ? processorTime(*processorClock_) : std::nullopt;
  return used.has_value() && (*used - processorAtStart_) * kLeastShare < time;
}

namespace {

/// Keeps a short response.
class TextSink : public ResponseSink {
 public:
  void begin(int status, const HeaderList& headers) override {
    status_ = status;
    headers_ = headers;
  }
  void write(std::string_view text) override { text_ += text; }
  void fail(std::uint32_t, std::string_view) override {}
  bool begun() const override { return status_ != 0; }

  int status_ = 0;
  HeaderList headers_;
  std::string text_;
};

}  // namespace

bool HttpExchange::giveUp(const Refusal& orElse) {
  const std::lock_guard lock(mutex_);
  if (gone_ || complete_ || givenUp_) return false;
  givenUp_ = true;
  if (published_) {
    constexpr std::uint32_t kFailed = 1;  // CIM_ERR_FAILED
    failed_ = true;
    cimStatus_ = kFailed;
    description_ = "the request was given up";
  } else {
    takeLateAnswer(orElse);
  }
  complete();
  room_.notify_all();
  return true;
}

void HttpExchange::takeLateAnswer(const Refusal& orElse) {
  TextSink answer;
  if (lateAnswer_) lateAnswer_(orElse.why, answer);
  const bool hasAnswer = answer.begun();
  begun_ = true;
  status_ = hasAnswer ? answer.status_ : orElse.status;
  headers_ = hasAnswer ? std::move(answer.headers_) : headersOf(orElse);
  held_ = hasAnswer ? std::move(answer.text_) : textOf(orElse);
}

// ---- The event thread ----

void HttpExchange::suspend() {
  const std::lock_guard lock(mutex_);
  suspended_ = true;
  MHD_suspend_connection(connection_);
}

void HttpExchange::decide(access::Decision decision) {
  const std::lock_guard lock(mutex_);
  decision_ = std::move(decision);
  wake();
}

access::Decision HttpExchange::takeDecision() {
  const std::lock_guard lock(mutex_);
  return std::move(decision_);
}

bool HttpExchange::isPublished() const { return published_.load(std::memory_order_acquire); }

MHD_Result HttpExchange::respond() {
  response_ = makeResponse();
  if (response_ == nullptr) return MHD_NO;
  addHeaders(*response_);
  client->enter(Phase::Sending);
  const MHD_Result queued = MHD_queue_response(connection_, static_cast<unsigned int>(status_), response_);
  MHD_destroy_response(response_);  // the connection has a share of its own
  return queued;
}

MHD_Response* HttpExchange::makeResponse() {
  const std::lock_guard lock(mutex_);
  if (streaming_) {
    return MHD_create_response_from_callback(MHD_SIZE_UNKNOWN, kBlock, &HttpExchange::fillResponse, this, nullptr);
  }
  // No writer adds to it any more, and it lives until the HTTP library is done.
  bytesSent_ = held_.size();
  return MHD_create_response_from_buffer(held_.size(), held_.data(), MHD_RESPMEM_PERSISTENT);
}

void HttpExchange::addHeaders(MHD_Response& response) const {
  for (const auto& [name, value] : headers_) addHeader(response, name, value);
  if (gzip_ != nullptr) MHD_add_response_header(&response, MHD_HTTP_HEADER_CONTENT_ENCODING, "gzip");
  if (streaming_ && request.takesTrailers && isHttp11) {
    MHD_add_response_header(&response, MHD_HTTP_HEADER_TRAILER, "CIMStatusCode, CIMStatusCodeDescription");
  }
}

ssize_t HttpExchange::fillResponse(void* exchange, std::uint64_t, char* buffer, std::size_t most) {
  return static_cast<HttpExchange*>(exchange)->fill(buffer, most);
}

ssize_t HttpExchange::fill(char* buffer, std::size_t most) {
  if (taken_ == outgoing_.size()) {
    const std::lock_guard lock(mutex_);
    outgoing_.clear();
    taken_ = 0;
    outgoing_.swap(held_);
    if (outgoing_.empty()) {
      if (complete_) return endOfStream();
      // The worker wakes it under the same lock.
      suspended_ = true;
      client->enter(Phase::Working);
      MHD_suspend_connection(connection_);
      return 0;
    }
    room_.notify_all();
  }
  client->enter(Phase::Sending);
  const std::size_t size = std::min(most, outgoing_.size() - taken_);
  outgoing_.copy(buffer, size, taken_);
  taken_ += size;
  bytesSent_ += size;
  return static_cast<ssize_t>(size);
}

ssize_t HttpExchange::endOfStream() {
  if (!failed_) return MHD_CONTENT_READER_END_OF_STREAM;
  if (!request.takesTrailers || !isHttp11) return MHD_CONTENT_READER_END_WITH_ERROR;
  MHD_add_response_footer(response_, "CIMStatusCode", std::to_string(cimStatus_).c_str());
  MHD_add_response_footer(response_, "CIMStatusCodeDescription", fieldText(description_).c_str());
  return MHD_CONTENT_READER_END_OF_STREAM;
}

void HttpExchange::ended() {
  const std::lock_guard lock(mutex_);
  gone_ = true;
  room_.notify_all();
}

// ---- Refusals ----

HeaderList headersOf(const Refusal& refusal) {
  HeaderList headers{{MHD_HTTP_HEADER_CONTENT_TYPE, "text/plain; charset=utf-8"}};
  if (!refusal.cimError.empty()) headers.emplace_back("CIMError", refusal.cimError);
  if (!refusal.allow.empty()) headers.emplace_back(MHD_HTTP_HEADER_ALLOW, refusal.allow);
  if (!refusal.login.empty()) headers.emplace_back(MHD_HTTP_HEADER_WWW_AUTHENTICATE, refusal.login);
  if (refusal.status == 503) {
    headers.emplace_back(MHD_HTTP_HEADER_RETRY_AFTER, std::to_string(refusal.retrySeconds));
  }
  return headers;
}

std::string textOf(const Refusal& refusal) { return refusal.why + "\n"; }

void addHeader(MHD_Response& response, const std::string& name, const std::string& value) {
  MHD_add_response_header(&response, name.c_str(), value.empty() ? " " : value.c_str());
}

MHD_Result respondWith(MHD_Connection* connection, const Refusal& refusal) {
  const std::string text = textOf(refusal);
  MHD_Response* response =
      MHD_create_response_from_buffer(text.size(), const_cast<char*>(text.data()), MHD_RESPMEM_MUST_COPY);
  if (response == nullptr) return MHD_NO;
  for (const auto& [name, value] : headersOf(refusal)) addHeader(*response, name, value);
  MHD_add_response_header(response, MHD_HTTP_HEADER_CONNECTION, "close");
  const MHD_Result queued = MHD_queue_response(connection, static_cast<unsigned int>(refusal.status), response);
  MHD_destroy_response(response);
  return queued;
}

}  // namespace zorva::http
