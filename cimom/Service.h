#pragma once

// CIM operations over HTTP (DSP0200 1.4) without the HTTP: reads a request's XML, executes it on the broker, and writes
// the response's XML while the results arrive.

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <string_view>

#include "access/Audit.h"
#include "broker/Broker.h"
#include "http/Exchange.h"
#include "util/NotCopied.h"

namespace zorva::cimom {

struct ServiceOptions {
  /// The host name in the server's description of its own namespaces; may be empty.
  std::string hostName;
  /// Takes log lines; may be empty. Called on any thread.
  broker::LogHook log;
  /// Takes a record of each change, done or not, and of each refusal. May be empty.
  access::AuditHook audit;
  /// Takes the name and the CIM status of each operation that was carried out. May be empty.
  std::function<void(const std::string& operation, int status)> operationEnded;

  std::size_t maxDepth = 128;       ///< the deepest nesting of elements in a request
  std::size_t maxOperations = 100;  ///< the most operations in one multiple request
  std::size_t unsentText = 65536;   ///< response text that is gathered before it is written

  /// Enumerations that are pulled (DSP0200 5.3.2.24).
  std::chrono::seconds pullDefaultTimeout{60};
  std::chrono::seconds pullMaxTimeout{600};  ///< a longer one is refused, and also a timeout of 0, which means none
  std::size_t maxPulls = 100;                ///< open at once
  std::size_t maxPullsOfClient = 25;         ///< of these, of one client
  std::size_t maxPullObjects = 10000;        ///< the most objects that one pull may request
  std::size_t maxPullBytes = 64U << 20;      ///< what all open enumerations hold together, as response text
};

class ServiceCore;

class Service : util::NotCopied {
 public:
  /// `broker` outlives the service.
  explicit Service(broker::Broker& broker, ServiceOptions options = {});
  ~Service();

  /// Executes one request and writes its response. It always calls sink.begin, unless the sink throws ClientGone, the
  /// only exception that this function throws. Any number of threads may call it at once; a provider that does not
  /// return blocks only the calling thread. `caller` is the client, as far as it is known. Once the request is read,
  /// the sink gets a late answer: each operation has failed, for the given reason. If the client no longer waits, the
  /// request is not read to its end.
  void handle(const http::HttpRequest& request, http::ResponseSink& sink, const broker::Caller& caller = {});

  /// Ends pulled enumerations whose client did not continue them in time; cheap. Each request does this too.
  void reclaim();

 private:
  std::unique_ptr<ServiceCore> core_;
};

}  // namespace zorva::cimom
