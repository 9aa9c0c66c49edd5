#pragma once

#include <chrono>
#include <functional>
#include <memory>
#include <optional>
#include <string>

#include "http/HttpExchange.h"
#include "http/HttpLimits.h"

// The threads that answer requests. They are made when they are needed and end when they are not.
//
// A request that waits for its client to take what is ready does not count as running. Neither does one that hangs (see
// HttpExchange::hangs): it keeps its thread, and others run beside it, up to the limit on requests. One whose provider
// does not return within its limit is given up: its client gets an answer, another thread takes the place of its own,
// and its thread ends whenever the provider lets it. So neither slow clients nor hanging providers keep others from a
// worker.

namespace zorva::http {

class Workers {
 public:
  using Work = std::function<void(HttpExchange&)>;

  Workers(const HttpLimits& limits, Work work);

  /// Waits for all threads that are not stuck in a provider; these must not outlive what `work` uses: see drain().
  ~Workers();
  Workers(const Workers&) = delete;
  Workers& operator=(const Workers&) = delete;

  void setLimits(const HttpLimits& limits);

  /// Takes a request on, whose connection is suspended; or tells why not, and then leaves it alone. Where all places
  /// are taken, a client that has let its response wait for longest gives way to `exchange`.
  std::optional<Refusal> submit(const std::shared_ptr<HttpExchange>& exchange, Connections& connections);

  /// Gives up the requests whose time is over.
  void sweep();

  /// How many requests are in work or waiting for it.
  std::size_t inFlight() const;

  /// Gives up what is still in work, because the server ends.
  void giveUpAll();

  /// Waits for the threads to end. False: some are still stuck in providers when the time is over.
  bool join(std::chrono::milliseconds most);

 private:
  class Core;
  std::shared_ptr<Core> core_;
};

}  // namespace zorva::http
