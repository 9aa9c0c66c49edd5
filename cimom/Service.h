#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <string_view>

#include "broker/Broker.h"
#include "http/Exchange.h"

// CIM operations over HTTP (DSP0200 1.4) without the HTTP: reads a request's XML, has the broker carry it out, and
// writes the response's XML while it grows.

namespace zorva::cimom {

struct ServiceOptions {
  /// The namespaces of the server itself are described as reached here; may be empty.
  std::string hostName;
  /// Where log lines go; may be empty. Called on any thread.
  broker::LogHook log;
  /// Takes a line for each change that was made: who, which object, and what of it. May be empty. Called on any thread.
  std::function<void(const std::string& line)> changes;

  std::size_t maxDepth = 128;       ///< the most elements, one within another, in a request
  std::size_t maxOperations = 100;  ///< the most operations in one multiple request
  std::size_t unsentText = 65536;   ///< response text that is gathered before it is written

  // Enumerations that are pulled (DSP0200 5.3.2.24).
  std::chrono::seconds pullDefaultTimeout{60};
  std::chrono::seconds pullMaxTimeout{600};  ///< a longer one is refused, and so is none at all
  std::size_t maxPulls = 100;                ///< open at once
  std::size_t maxPullsOfClient = 25;         ///< of these, of one client
  std::size_t maxPullObjects = 10000;        ///< the most objects that one pull may ask for
  std::size_t maxPullBytes = 64U << 20;      ///< what all open enumerations hold together, as response text
};

class ServiceCore;

class Service {
 public:
  /// `broker` outlives the service.
  explicit Service(broker::Broker& broker, ServiceOptions options = {});
  ~Service();
  Service(const Service&) = delete;
  Service& operator=(const Service&) = delete;

  /// Carries out one request and writes its response: sink.begin is always called, or this ends by ClientGone from the
  /// sink, the only exception that comes out. Any number of threads may call it at once; a provider that does not
  /// return holds only the thread that called.
  /// `caller` is who asks, as far as that is known.
  /// Once the request is read, the sink gets a late answer: each operation has failed, for the reason given. A request
  /// that nobody waits for any more is not read to its end.
  void handle(const http::HttpRequest& request, http::ResponseSink& sink, const broker::Caller& caller = {});

  /// Ends pulled enumerations whose client has not come back in time; cheap. They are looked at with each request too.
  void reclaim();

 private:
  std::unique_ptr<ServiceCore> core_;
};

}  // namespace zorva::cimom
