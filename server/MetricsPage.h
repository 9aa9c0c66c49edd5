#pragma once

// The page /metrics: what Prometheus reads.

#include <memory>
#include <mutex>

#include "agent/tree/TreeSnapshot.h"
#include "http/HttpServer.h"
#include "http/Pages.h"
#include "metrics/DnsChecks.h"
#include "metrics/Exposition.h"
#include "metrics/ServerMetrics.h"
#include "util/NotCopied.h"

namespace zorva::server {

class MetricsPage : util::NotCopied {
 public:
  MetricsPage();

  /// For clients that may read. It is made on a worker, and waits for nobody but the agent. This object must outlive
  /// it.
  http::Page page();

  /// The server whose connections are counted; call it before the page is used.
  void setServer(const http::HttpServer& server) { server_ = &server; }

  /// The counters.
  metrics::ServerMetrics& counters() { return counters_; }
  void requestEnded(const http::RequestEnd& end);

  void setCheckInterval(std::chrono::seconds interval) { checks_.setInterval(interval); }

 private:
  void answer(const http::HttpRequest& request, http::ResponseSink& sink);
  void writeConnections(metrics::Exposition& out) const;
  void writeHost(metrics::Exposition& out);
  std::shared_ptr<const metrics::Exposition> textOf(const std::shared_ptr<const agent::TreeSnapshot>& tree);

  const http::HttpServer* server_ = nullptr;
  metrics::ServerMetrics counters_;
  metrics::DnsChecks checks_;

  std::mutex textMutex_;
  std::shared_ptr<const agent::TreeSnapshot> tree_;          ///< of which the next is the text
  std::shared_ptr<const metrics::Exposition> textOfTree_{};  ///< made again only after the tree has changed
};

}  // namespace zorva::server
