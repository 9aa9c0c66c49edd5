#include "server/MetricsPage.h"

#include <chrono>
#include <exception>
#include <string>
#include <utility>

#include "agent/Agent.h"
#include "agent/SettingsDrift.h"
#include "metrics/HostMetrics.h"
#include "server/Reading.h"

namespace zorva::server {

namespace {

using metrics::Exposition;
using metrics::Type;

std::uint64_t secondsNow() {
  const auto now = std::chrono::system_clock::now().time_since_epoch();
  return static_cast<std::uint64_t>(std::chrono::duration_cast<std::chrono::seconds>(now).count());
}

}  // namespace

MetricsPage::MetricsPage() : checks_(agent::currentTree) {}

http::Page MetricsPage::page() {
  return {[this](const http::HttpRequest& request, http::ResponseSink& sink) { answer(request, sink); }, false, {}};
}

void MetricsPage::requestEnded(const http::RequestEnd& end) {
  const metrics::Target target = end.isStream    ? metrics::Target::Stream
                                 : end.isForPage ? metrics::Target::Page
                                                 : metrics::Target::Cim;
  counters_.requestEnded(target, end.status, end.time);
  if (end.isLate && !end.isStream) counters_.providerIsLate();
}

void MetricsPage::answer(const http::HttpRequest& request, http::ResponseSink& sink) {
  if (!mayRead(request)) {
    sink.begin(403, {{"Content-Type", "text/plain; charset=utf-8"}});
    return sink.write(std::string(kMayNotRead) + "\n");
  }
  Exposition out;
  writeHost(out);
  checks_.write(out);
  counters_.write(out);
  writeConnections(out);
  metrics::writeProcess(out, ZORVA_VERSION);
  sink.begin(200, {{"Content-Type", metrics::kContentType}});
  sink.write(out.text());
}

void MetricsPage::writeConnections(Exposition& out) const {
  if (server_ == nullptr) return;
  out.single("zorva_http_connections", Type::Gauge, "Connections that are open.",
             static_cast<double>(server_->connections()));
  out.single("zorva_http_requests_in_work", Type::Gauge, "Requests that are in work.",
             static_cast<double>(server_->requestsInWork()));
  out.single("zorva_http_watchers", Type::Gauge, "Clients that watch.", static_cast<double>(server_->streams()));
}

/// A host that cannot be read must not hide the server's own values.
void MetricsPage::writeHost(Exposition& out) {
  constexpr const char* kReadable = "zorva_host_readable";
  constexpr const char* kHelp = "Whether the settings of the host could be read.";
  try {
    const std::shared_ptr<const agent::TreeSnapshot> tree = agent::currentTree();
    Exposition host;
    host.append(*textOf(tree));
    metrics::writeServiceProcessors(host, *tree, secondsNow());
    metrics::writeDrift(host, agent::settingsDrift());
    out.append(host);
    out.single(kReadable, Type::Gauge, kHelp, 1);
  } catch (const std::exception&) {
    // The agent has logged the reason.
    out.single(kReadable, Type::Gauge, kHelp, 0);
  }
}

std::shared_ptr<const Exposition> MetricsPage::textOf(const std::shared_ptr<const agent::TreeSnapshot>& tree) {
  {
    const std::lock_guard lock(textMutex_);
    if (tree_ == tree) return textOfTree_;
  }
  auto fresh = std::make_shared<Exposition>();
  metrics::writeTree(*fresh, *tree);
  const std::lock_guard lock(textMutex_);
  tree_ = tree;
  textOfTree_ = fresh;
  return fresh;
}

}  // namespace zorva::server
