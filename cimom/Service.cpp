#include "cimom/Service.h"

#include <cmpidt.h>

#include <algorithm>
#include <chrono>
#include <exception>
#include <semaphore>

#include "broker/objects/PathText.h"
#include "cimom/Operations.h"
#include "cimom/Pull.h"
#include "cimom/ServiceHeaders.h"
#include "cimxml/RequestReader.h"
#include "cimxml/ResponseWriter.h"
#include "util/NotCopied.h"
#include "util/ServiceHost.h"

namespace zorva::cimom {

namespace {

using broker::LogLevel;
using broker::Status;

// Bodies above this size are read one at a time: reading one keeps a processor busy that others need as well.
constexpr std::size_t kLargeBody = 128U << 10U;
constexpr std::chrono::milliseconds kBetweenLooks{100};

// If a buffer has grown larger than this for a response of large objects, it is not kept for the next request.
constexpr std::size_t kMostKept = 256U << 10U;

HttpRefusal refusalOf(const cimxml::RequestError& error) {
  switch (error.fault) {
    case cimxml::Fault::NotWellFormed:
      return {400, "request-not-well-formed", error.message};
    case cimxml::Fault::NotLooselyValid:
      return {400, "request-not-loosely-valid", error.message};
    case cimxml::Fault::UnsupportedCimVersion:
      return {501, "unsupported-cim-version", error.message};
    case cimxml::Fault::UnsupportedDtdVersion:
      return {501, "unsupported-dtd-version", error.message};
    case cimxml::Fault::UnsupportedProtocolVersion:
      return {501, "unsupported-protocol-version", error.message};
    case cimxml::Fault::TimeIsOver:
      return {503, "", error.message};
    case cimxml::Fault::UnsupportedOperation:
      break;
  }
  return {501, "unsupported-operation", error.message};
}

PullLimits pullLimits(const ServiceOptions& options) {
  PullLimits limits;
  limits.defaultTimeout = options.pullDefaultTimeout;
  limits.maxTimeout = options.pullMaxTimeout;
  limits.maxOpen = options.maxPulls;
  limits.maxOpenOfClient = options.maxPullsOfClient;
  limits.maxObjects = options.maxPullObjects;
  limits.maxBytes = options.maxPullBytes;
  return limits;
}

/// The permission to read a large body; a small one needs none.
class Turn : util::NotCopied {
 public:
  Turn(std::binary_semaphore& turns, const http::HttpRequest& http, const http::ResponseSink& sink)
      : turns_(http.body.size() > kLargeBody ? &turns : nullptr) {
    while (turns_ != nullptr && !turns_->try_acquire_for(kBetweenLooks)) {
      if (!sink.isWanted()) throw http::ClientGone("the client no longer waits for the response");
    }
  }
  ~Turn() {
    if (turns_ != nullptr) turns_->release();
  }

 private:
  std::binary_semaphore* const turns_;
};

/// The parts of a request that its response repeats.
struct Outline {
  struct CallName {
    std::string name;
    bool isExtrinsic;
  };
  std::string id;
  bool isMultiple = false;
  std::vector<CallName> calls;
  CimHeaders headers;
};

/// Writes that each operation has failed.
void writeFailures(const Outline& outline, const std::string& why, http::ResponseSink& sink) {
  sink.begin(200, responseHeaders(outline.headers));
  std::string text;
  cimxml::ResponseWriter writer(text, std::string::npos, [&](std::string_view piece) { sink.write(piece); });
  writer.beginMessage(outline.id, outline.isMultiple);
  for (const Outline::CallName& call : outline.calls) {
    writer.beginResponse(call.name, call.isExtrinsic);
    writer.putError(CMPI_RC_ERR_FAILED, why);
    writer.endResponse();
  }
  writer.endMessage();
}

/// The late answer owns its data: the request may be destroyed while the answer is written.
http::LateAnswer lateAnswer(const cimxml::CimRequest& request, const CimHeaders& headers) {
  auto outline = std::make_shared<Outline>();
  outline->id = request.id;
  outline->isMultiple = request.isMultiple;
  outline->calls.reserve(request.calls.size());
  for (const cimxml::Call& call : request.calls) outline->calls.push_back({call.name, call.isExtrinsic});
  outline->headers.prefix = headers.prefix;
  outline->headers.isExtended = headers.isExtended;
  return [outline = std::move(outline)](const std::string& why, http::ResponseSink& sink) {
    writeFailures(*outline, why, sink);
  };
}

/// Log lines contain text from clients: a control character in it must not start a new line.
std::string withoutControls(std::string text) {
  std::replace_if(
      text.begin(), text.end(), [](unsigned char c) { return c < 0x20 || c == 0x7F; }, '?');
  return text;
}

/// "127.0.0.1:4711 (user 1000)"
std::string whoIs(const http::HttpRequest& http) {
  return http.client.empty() ? http.peer : http.peer + " (" + http.client + ")";
}

access::AuditRecord recordFor(const http::HttpRequest& http, const cimxml::Call& call) {
  access::AuditRecord record;
  if (http.who != nullptr) {
    record.user = http.who->user;
    record.proof = http.who->proof;
  }
  record.from = whoIs(http);
  record.operation = call.name;
  record.result = "done";
  return record;
}

std::string statusText(const Status& status) {
  const std::string name(broker::statusName(status.rc));
  return (name.empty() ? std::to_string(status.rc) : name) + ": " + status.message;
}

/// The buffer in which this thread's responses are gathered, reused for each request.
class Buffer : util::NotCopied {
 public:
  Buffer() = default;
  ~Buffer() {
    if (kept().capacity() > kMostKept) std::string().swap(kept());
  }

  std::string& text() noexcept { return kept(); }

 private:
  static std::string& kept() noexcept {
    thread_local std::string buffer;
    return buffer;
  }
};

}  // namespace

class ServiceCore {
 public:
  ServiceCore(broker::Broker& broker, ServiceOptions options)
      : broker_(broker), options_(std::move(options)), host_(options_.hostName), pulls_(pullLimits(options_)) {}

  void handle(const http::HttpRequest& http, http::ResponseSink& sink, broker::Caller caller) {
    const Expected<CimHeaders, HttpRefusal> headers = readHeaders(http);
    if (!headers) return refuse(headers.error(), sink);
    const Expected<cimxml::CimRequest, cimxml::RequestError> request = read(http, sink);
    if (!request) return refuse(refusalOf(request.error()), sink);
    const auto checked = checkHeaders(*headers, *request, broker_);
    if (!checked) return refuse(checked.error(), sink);
    caller.acceptLanguage = headers->acceptLanguage;
    caller.contentLanguage = headers->contentLanguage;
    sink.setLateAnswer(lateAnswer(*request, *headers));
    answer(*request, {*headers, caller, http}, sink);
  }

  void reclaim() { pulls_.reclaim(); }

  void log(LogLevel level, std::string text) const noexcept {
    if (!options_.log) return;
    try {
      options_.log(level, withoutControls(std::move(text)));
    } catch (...) {
      // A log that fails must not fail the request.
    }
  }

 private:
  Expected<cimxml::CimRequest, cimxml::RequestError> read(const http::HttpRequest& http,
                                                          const http::ResponseSink& sink) {
    cimxml::ReaderLimits limits;
    limits.xml.depth = options_.maxDepth;
    limits.xml.isOver = [&sink] { return !sink.isWanted(); };
    limits.calls = options_.maxOperations;
    const Turn turn(largeReads_, http, sink);
    return cimxml::readRequest(http.body, limits);
  }

  void refuse(const HttpRefusal& refusal, http::ResponseSink& sink) const {
    log(LogLevel::Warning, "a request was refused with HTTP status " + std::to_string(refusal.status) +
                               (refusal.cimError.empty() ? "" : ", " + refusal.cimError) + ": " + refusal.message);
    http::HeaderList fields{{"Content-Type", "text/plain; charset=\"utf-8\""}};
    if (!refusal.cimError.empty()) fields.emplace_back("CIMError", refusal.cimError);
    sink.begin(refusal.status, fields);
    sink.write(refusal.message + "\n");
  }

  /// The client, as far as the request identifies it.
  struct Client {
    const CimHeaders& headers;
    const broker::Caller& caller;
    const http::HttpRequest& http;
  };

  void answer(const cimxml::CimRequest& request, const Client& client, http::ResponseSink& sink) {
    Buffer buffer;
    cimxml::ResponseWriter writer(buffer.text(), options_.unsentText, [&](std::string_view text) {
      if (!sink.begun()) sink.begin(200, responseHeaders(client.headers));
      sink.write(text);
    });
    writer.beginMessage(request.id, request.isMultiple);
    for (const cimxml::Call& call : request.calls) {
      writer.beginResponse(call.name, call.isExtrinsic);
      access::AuditRecord record = recordFor(client.http, call);
      Operation operation{broker_, pulls_, writers_,           host_,           client.caller,
                          call,    writer, client.http.client, client.http.who, client.headers.host,
                          {},      record};
      const Status status = carryOutSafely(operation);
      audit(std::move(record), status);
      if (options_.operationEnded) options_.operationEnded(call.name, static_cast<int>(status.rc));
      if (!status.ok()) {
        log(LogLevel::Info,
            call.name + " in " + broker::quotedText(call.target.nameSpace.substr(0, 200)) + ": " + statusText(status));
        const auto code = static_cast<std::uint32_t>(status.rc);
        if (!writer.putError(code, status.message)) return sink.fail(code, status.message);
      }
      writer.endResponse();
    }
    writer.endMessage();
  }

  /// An operation that only reads, or changed nothing, leaves its record without an object.
  void audit(access::AuditRecord record, const Status& status) const noexcept try {
    if (record.object.empty() || !options_.audit) return;
    if (!status.ok()) record.result = statusText(status);
    record.isRefusal = status.rc == CMPI_RC_ERR_ACCESS_DENIED;
    options_.audit(std::move(record));
  } catch (...) {
    // A log that fails must not fail the request.
  }

  Status carryOutSafely(Operation& operation) const {
    try {
      return carryOut(operation);
    } catch (const http::ClientGone&) {
      throw;
    } catch (const std::exception& problem) {
      return {CMPI_RC_ERR_FAILED, std::string("the server cannot answer: ") + problem.what()};
    }
  }

  broker::Broker& broker_;
  const ServiceOptions options_;
  const util::ServiceHost host_;
  PullTable pulls_;
  cimxml::ObjectWriters writers_;
  std::binary_semaphore largeReads_{1};
};

Service::Service(broker::Broker& broker, ServiceOptions options)
    : core_(std::make_unique<ServiceCore>(broker, std::move(options))) {}

Service::~Service() = default;

void Service::handle(const http::HttpRequest& request, http::ResponseSink& sink, const broker::Caller& caller) {
  try {
    core_->handle(request, sink, caller);
  } catch (const http::ClientGone&) {
    throw;
  } catch (const std::exception& problem) {
    core_->log(LogLevel::Error, std::string("a request failed: ") + problem.what());
    if (sink.begun()) return sink.fail(CMPI_RC_ERR_FAILED, problem.what());
    sink.begin(500, {{"Content-Type", "text/plain; charset=\"utf-8\""}});
    sink.write("the server cannot answer\n");
  }
}

void Service::reclaim() { core_->reclaim(); }

}  // namespace zorva::cimom
