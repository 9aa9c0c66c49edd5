#pragma once

// The threads that answer requests. They are started when they are needed and end when they are idle.
//
// A request that waits for its client to read the response does not count as running. Neither does one that hangs (see
// HttpExchange::hangs): it keeps its thread, and others run beside it, up to the limit on requests. A request whose
// provider does not return in time is abandoned: its client gets a response, another thread takes the place of its own,
// and its thread ends when the provider returns. So neither slow clients nor hanging providers keep others from a
// worker.

#include <chrono>
#include <functional>
#include <memory>
#include <optional>
#include <string>

#include "http/HttpExchange.h"
#include "http/HttpLimits.h"
#include "util/NotCopied.h"

namespace zorva::http {

class Workers : util::NotCopied {
 public:
  using Work = std::function<void(HttpExchange&)>;

  Workers(const HttpLimits& limits, Work work);

  /// Waits for all threads that are not stuck in a provider. Those must not outlive the objects that `work` uses: see
  /// drain().
  ~Workers();

  void setLimits(const HttpLimits& limits);

  /// Accepts a request whose connection is suspended, or says why not and does not touch it. If all places are taken,
  /// the request whose client has let its response wait for longest is abandoned for `exchange`.
  std::optional<Refusal> submit(const std::shared_ptr<HttpExchange>& exchange, Connections& connections);

  /// Abandons the requests whose time is over.
  void sweep();

  /// How many requests are in work or waiting for it.
  std::size_t inFlight() const;

  /// Abandons all requests in work, because the server ends.
  void giveUpAll();

  /// Waits for the threads to end. False: some are still stuck in providers when the time is over.
  bool join(std::chrono::milliseconds most);

 private:
  class Core;
  std::shared_ptr<Core> core_;
};

}  // namespace zorva::http
