#include "server/Daemon.h"

#include <malloc.h>
#include <poll.h>
#include <signal.h>
#include <sys/resource.h>
#include <sys/signalfd.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <filesystem>
#include <stdexcept>
#include <system_error>
#include <tuple>
#include <utility>
#include <vector>

#include "access/LoginGate.h"
#include "agent/Agent.h"
#include "cimom/Interop.h"
#include "cimom/Service.h"
#include "frontend/AddedProviders.h"
#include "frontend/SettingsClaims.h"
#include "http/HttpServer.h"
#include "http/Listener.h"
#include "http/Log.h"
#include "schema/Schema.h"
#include "server/AuditLog.h"
#include "server/BrokerLog.h"
#include "server/CertificateInUse.h"
#include "server/ConsolePages.h"
#include "server/Entrances.h"
#include "server/MakeCertificate.h"
#include "server/MetricsPage.h"
#include "server/ServerChecks.h"
#include "server/SettingOrigins.h"
#include "server/Systemd.h"
#include "server/Watchers.h"
#include "util/FileDescriptor.h"

namespace zorva::server {

namespace {

constexpr int kServed = 0;
constexpr int kCannotServe = 1;
constexpr int kWrongUsage = 2;

constexpr int kSweepMilliseconds = 200;
constexpr int kQuietMilliseconds = 10'000;
constexpr int kDayMilliseconds = 24 * 60 * 60 * 1000;
constexpr std::chrono::milliseconds kBeforeTrim{400};
constexpr std::chrono::milliseconds kNoDescriptors{100};

void tellError(const std::string& text) { std::fprintf(stderr, "zorvacimd: %s\n", text.c_str()); }

/// Each connection needs a descriptor, so the limit on connections must fit the limit on descriptors.
void makeRoomForConnections(http::HttpLimits& limits) {
  constexpr rlim_t kOthers = 64;
  rlimit files{};
  if (::getrlimit(RLIMIT_NOFILE, &files) != 0) return;
  if (files.rlim_cur < files.rlim_max) {
    rlimit more = files;
    more.rlim_cur = std::min<rlim_t>(files.rlim_max, std::max<rlim_t>(files.rlim_cur, limits.connections + kOthers));
    if (::setrlimit(RLIMIT_NOFILE, &more) == 0) files = more;
  }
  const rlim_t room = files.rlim_cur > kOthers ? files.rlim_cur - kOthers : 1;
  if (limits.connections <= room) return;
  ZORVA_LOG(Warning, "of the connections configured, this process may have only " + std::to_string(room) + " open");
  limits.connections = static_cast<std::size_t>(room);
}

sigset_t handledSignals() {
  sigset_t signals;
  ::sigemptyset(&signals);
  for (const int each : {SIGTERM, SIGINT, SIGHUP}) ::sigaddset(&signals, each);
  return signals;
}

void applyLog(const Config& config) {
  zorva::agent::setLogTarget(zorva::agent::LogStream::Log,
                             config.logTarget.value_or(zorva::agent::currentConfig().logTarget));
  http::setLogLevel(config.logLevel);
}

AuditLog::Writer auditWriter(const Config& config) {
  return config.auditFile.empty() ? auditInLog() : auditFile(config.auditFile);
}

cimom::ServiceOptions serviceOptions(const Config& config) {
  cimom::ServiceOptions options;
  options.log = logServiceLine;
  options.maxDepth = static_cast<std::size_t>(config.nesting);
  options.pullDefaultTimeout = std::chrono::seconds(config.pullSeconds);
  options.pullMaxTimeout = std::chrono::seconds(config.pullLongestSeconds);
  options.maxPulls = static_cast<std::size_t>(config.pullContexts);
  options.maxPullsOfClient = static_cast<std::size_t>(config.pullClientContexts);
  options.maxPullBytes = static_cast<std::size_t>(config.pullMebibytes) << 20;
  return options;
}

std::shared_ptr<access::LoginGate> makeGate(const Config& config) {
  access::LoginServices services;
  services.log = [](const std::string& line) { ZORVA_LOG_CLIENT(Warning, line); };
  return std::make_shared<access::LoginGate>(config.access, std::move(services));
}

/// Whoever starts the server should know it.
void warnOfOpenAccess(const Config& config) {
  if (config.access.anonymous != access::Role::Operate) return;
  ZORVA_LOG(Warning, "access.anonymous is \"operate\": every user of this host may change settings without a login");
}

/// If a process was killed during a change, the next holder of the lock undoes the unfinished part.
void mendSettings() noexcept {
  try {
    const zorva::agent::SettingsLock lock(zorva::agent::dataDirectory(), zorva::agent::Access::Read);
  } catch (const std::exception& error) {
    ZORVA_LOG(Error, error.what());
  }
}

/// What GET returns.
http::Pages pagesOf(const Config& config, const std::vector<http::Listener>& listeners, MetricsPage& metrics,
                    Watchers& watchers) {
  http::Pages pages;
  pages.emplace("/metrics", metrics.page());
  pages.emplace("/watch", watchers.page());
  pages.emplace("/", http::textPage(pageOf(listeners)));
  if (config.hasConsole) addConsole(pages);
  return pages;
}

/// Whether they differ in what only a start applies.
bool needsRestart(const Config& before, const Config& after) {
  const auto fixed = [](const Config& config) {
    return std::tuple(config.addresses, config.port, config.socket, config.tls.certificate.empty(), config.tlsAddresses,
                      config.tlsPort, config.threads, config.nesting, config.hasConsole, config.providerDirectory);
  };
  return fixed(before) != fixed(after);
}

class Daemon {
 public:
  Daemon(CommandLine commandLine, Config config, const MakeBroker& makeBroker);

  /// Serves until a signal ends it. False: providers are stuck, and nothing may be destroyed.
  bool run();

 private:
  using Clock = std::chrono::steady_clock;

  void greet() const;
  void acceptFrom(const http::Listener& listener);
  bool handleSignal();
  void reload();
  void lookAfter();
  int timeout() const;

  const CommandLine commandLine_;
  Config config_;
  std::unique_ptr<AuditLog> audit_;  ///< outlives what writes to it
  util::FileDescriptor signals_;
  std::vector<http::Listener> listeners_;
  MetricsPage metrics_;                 ///< outlives what counts in it
  std::unique_ptr<Watchers> watchers_;  ///< outlives what tells it of changes
  std::unique_ptr<broker::Broker> broker_;
  std::unique_ptr<cimom::Service> service_;
  std::shared_ptr<access::LoginGate> gate_;
  std::unique_ptr<http::HttpServer> server_;
  CertificateInUse certificate_;
  Clock::time_point acceptAgain_{};
  std::size_t requestsSeen_ = 0;     ///< at the last look
  std::size_t requestsTrimmed_ = 0;  ///< when memory was last given back to the system
  Clock::time_point quietSince_ = Clock::now();
};

Daemon::Daemon(CommandLine commandLine, Config config, const MakeBroker& makeBroker)
    : commandLine_(std::move(commandLine)), config_(std::move(config)) {
  makeRoomForConnections(config_.limits);
  const sigset_t signals = handledSignals();
  ::pthread_sigmask(SIG_BLOCK, &signals, nullptr);  // inherited by all later threads
  ::signal(SIGPIPE, SIG_IGN);
  signals_ = util::FileDescriptor(::signalfd(-1, &signals, SFD_NONBLOCK | SFD_CLOEXEC));
  if (!signals_) throw std::runtime_error(std::string("cannot wait for signals: ") + std::strerror(errno));

  audit_ = std::make_unique<AuditLog>(auditWriter(config_));
  gate_ = makeGate(config_);
  listeners_ = openListeners(config_, gate_->hasUsers());
  watchers_ = std::make_unique<Watchers>(static_cast<std::size_t>(config_.watchers));
  broker_ = makeBroker(config_);
  cimom::ServiceOptions options = serviceOptions(config_);
  options.audit = [this](const access::AuditRecord& record) {
    audit_->take(record);
    watchers_->note(record);
  };
  options.operationEnded = [this](const std::string& operation, int status) {
    metrics_.counters().operationEnded(operation, status);
  };
  service_ = std::make_unique<cimom::Service>(*broker_, std::move(options));
  warnOfOpenAccess(config_);
  server_ = std::make_unique<http::HttpServer>(
      config_.limits, config_.threads,
      [service = service_.get()](const http::HttpRequest& request, http::ResponseSink& sink) {
        service->handle(request, sink);
      },
      pagesOf(config_, listeners_, metrics_, *watchers_), gate_);
  server_->setHostNames(config_.names);
  server_->setAudit([this](const access::AuditRecord& record) { audit_->take(record); });
  server_->setRequestHook([this](const http::RequestEnd& end) { metrics_.requestEnded(end); });
  metrics_.setServer(*server_);
  metrics_.setCheckInterval(std::chrono::seconds(config_.checkSeconds));
  if (!config_.tls.certificate.empty()) certificate_.use(config_.tls, *server_);
}

void Daemon::greet() const {
  const bool isTerminal = ::isatty(STDOUT_FILENO) == 1;
  const bool hasOwnPort = config_.port == 0 || (certificate_.exists() && config_.tlsPort == 0);
  if (!commandLine_.greet && !isTerminal && !hasOwnPort) return;
  const bool hasHints = commandLine_.greet || isTerminal;
  std::string text = greetingOf(listeners_, hasHints);
  if (hasHints && config_.access.anonymous == access::Role::Read) {
    text +=
        "It shows everything and changes nothing; with --anonymous operate every user of this host may change it.\n";
  }
  std::fputs(text.c_str(), stdout);
  std::fflush(stdout);
}

bool Daemon::run() {
  std::vector<pollfd> waits{{signals_.get(), POLLIN, 0}, {server_->newcomers(), POLLIN, 0}};
  const std::size_t others = waits.size();
  for (const http::Listener& each : listeners_) waits.push_back({each.socket.get(), POLLIN, 0});
  notifyServiceManager("READY=1");
  greet();
  for (;;) {
    const bool accepts = Clock::now() >= acceptAgain_;
    const int ready = ::poll(waits.data(), accepts ? waits.size() : others, timeout());
    if (ready > 0 && waits[0].revents != 0 && !handleSignal()) break;
    if (ready > 0 && waits[1].revents != 0) server_->look();
    for (std::size_t i = others; ready > 0 && accepts && i < waits.size(); ++i) {
      if (waits[i].revents != 0) acceptFrom(listeners_[i - others]);
    }
    lookAfter();
  }
  notifyServiceManager("STOPPING=1");
  listeners_.clear();
  return server_->stop();
}

void Daemon::acceptFrom(const http::Listener& listener) {
  constexpr int kAtOnce = 64;
  for (int i = 0; i < kAtOnce; ++i) {
    sockaddr_storage peer{};
    socklen_t size = sizeof peer;
    const int socket =
        ::accept4(listener.socket.get(), reinterpret_cast<sockaddr*>(&peer), &size, SOCK_NONBLOCK | SOCK_CLOEXEC);
    if (socket >= 0) {
      server_->take(socket, peer, size, listener.door);
      continue;
    }
    if (errno == EMFILE || errno == ENFILE || errno == ENOBUFS || errno == ENOMEM) {
      ZORVA_LOG_CLIENT(Error, std::string("no connection can be taken: ") + std::strerror(errno));
      acceptAgain_ = Clock::now() + kNoDescriptors;
    }
    return;
  }
}

/// False: the server must end.
bool Daemon::handleSignal() {
  signalfd_siginfo signal{};
  if (::read(signals_.get(), &signal, sizeof signal) != static_cast<ssize_t>(sizeof signal)) return true;
  if (signal.ssi_signo != SIGHUP) return false;
  reload();
  return true;
}

void Daemon::reload() try {
  const auto now = std::chrono::duration_cast<std::chrono::microseconds>(Clock::now().time_since_epoch());
  notifyServiceManager("RELOADING=1\nMONOTONIC_USEC=" + std::to_string(now.count()));
  Config fresh = configOf(commandLine_);
  zorva::agent::loadConfig(fresh.agentConfig);
  applyLog(fresh);
  audit_->setWriter(auditWriter(fresh));
  gate_->setOptions(fresh.access);
  warnOfOpenAccess(fresh);
  makeRoomForConnections(fresh.limits);
  server_->setLimits(fresh.limits);
  server_->setHostNames(fresh.names);
  watchers_->setMost(static_cast<std::size_t>(fresh.watchers));
  metrics_.setCheckInterval(std::chrono::seconds(fresh.checkSeconds));
  if (certificate_.exists() && !fresh.tls.certificate.empty()) certificate_.renew(fresh.tls, *server_);
  if (needsRestart(config_, fresh)) {
    ZORVA_LOG(Warning,
              "addresses, port, socket, threads, nesting, console and provider directory change with the next start");
  }
  config_ = std::move(fresh);
  ZORVA_LOG(Warning, "the configuration was read again");
  notifyServiceManager("READY=1");
} catch (const std::exception& error) {
  ZORVA_LOG(Error, std::string("the configuration stays as it was: ") + error.what());
  notifyServiceManager("READY=1");
}

/// Periodic work.
void Daemon::lookAfter() {
  server_->sweep();
  certificate_.lookAfter();
  service_->reclaim();
  gate_->refresh();
  const std::size_t requests = server_->requestsTaken();
  if (requests != requestsSeen_ || server_->hasWork()) {
    requestsSeen_ = requests;
    quietSince_ = Clock::now();
  } else if (requests != requestsTrimmed_ && Clock::now() - quietSince_ > kBeforeTrim) {
    // Memory of large responses is given back to the system.
    requestsTrimmed_ = requests;
    ::malloc_trim(0);
  }
}

int Daemon::timeout() const {
  if (server_->isBusy() || requestsTrimmed_ != server_->requestsTaken() || Clock::now() < acceptAgain_) {
    return kSweepMilliseconds;
  }
  if (requestsTrimmed_ != 0 || server_->streams() > 0) return kQuietMilliseconds;
  return certificate_.exists() ? kDayMilliseconds : -1;
}

/// Opens the log at its target. A file that did not exist is removed again: the server may run as another user.
void tryLog(const Config& config) {
  const std::string target = config.logTarget.value_or(zorva::agent::currentConfig().logTarget);
  const bool isFile = target.find('/') != std::string::npos;
  const bool isNew = isFile && ::access(target.c_str(), F_OK) != 0;
  applyLog(config);
  if (!isNew) return;
  zorva::agent::setLogTarget(zorva::agent::LogStream::Log, "off");
  ::unlink(target.c_str());
}

template <typename Step>
void attempt(std::vector<std::string>& problems, const std::string& what, Step&& step) {
  try {
    step();
  } catch (const std::exception& error) {
    problems.push_back(what + error.what());
  }
}

void tryProviders(const Config& config, const MakeBroker& makeBroker, std::vector<std::string>& problems) {
  const std::string& directory = config.providerDirectory;
  std::error_code error;
  if (!directory.empty()) std::filesystem::directory_iterator(directory, error);
  if (error) {
    problems.push_back("agent.provider_dir: " + directory + ": " + error.message());
    return;
  }
  attempt(problems, "", [&] {
    for (std::string& each : makeBroker(config)->openLibraries()) problems.push_back(std::move(each));
  });
}

/// Reads the certificate and warns if it expires soon.
void tryCertificate(const Config& config) {
  if (config.tls.certificate.empty()) return;
  const auto warning = expiryWarning(*http::TlsIdentity::load(config.tls), std::time(nullptr));
  if (warning.has_value()) tellError("warning: " + *warning);
}

/// Reads and opens what a start would, and reports all errors.
int check(const Config& config, const MakeBroker& makeBroker) {
  zorva::agent::loadConfig(config.agentConfig);
  std::vector<std::string> problems;
  attempt(problems, "log.target: ", [&] { tryLog(config); });
  attempt(problems, "audit.file: ", [&] { auditWriter(config); });
  attempt(problems, "", [&] { tryCertificate(config); });
  tryProviders(config, makeBroker, problems);
  attempt(problems, "access.users: ", [&] {
    const bool hasUsers = makeGate(config)->hasUsers();
    attempt(problems, "", [&] { checkLogins(config, hasUsers); });
  });
  for (const std::string& each : problems) tellError(each);
  if (!problems.empty()) return kCannotServe;
  std::printf("%s: good\n", config.file.empty() ? "the built-in configuration" : config.file.c_str());
  return kServed;
}

int serve(const CommandLine& commandLine, const MakeBroker& makeBroker) {
  Config config = configOf(commandLine);
  if (commandLine.checkConfig) return check(config, makeBroker);
  if (commandLine.makeCertificate) {
    makeCertificate(config);
    return kServed;
  }
  // Few heaps for all threads: with more, each thread would hold its own memory.
  ::mallopt(M_ARENA_MAX, 2);
  zorva::agent::loadConfig(config.agentConfig);
  applyLog(config);
  mendSettings();
  auto daemon = std::make_unique<Daemon>(commandLine, std::move(config), makeBroker);
  if (daemon->run()) return kServed;
  ZORVA_LOG(Error, "ended while providers had not returned");
  std::fflush(nullptr);
  ::_exit(kServed);
}

}  // namespace

std::unique_ptr<broker::Broker> makeBuiltInBroker(const Config& config) {
  broker::BrokerOptions options;
  options.providerDirectory =
      config.providerDirectory.empty() ? broker::ProviderRegistry::builtInDirectory() : config.providerDirectory;
  options.log = logBrokerLine;
  options.claim = frontend::SettingsClaims().hook();
  const auto classes = schema::loadBuiltInClasses(schema::ClassSet::Interop);
  frontend::addProviders(config.addedProviders, options.registry, *classes);
  serveSettingOrigins(options);
  serveServerChecks(options);
  cimom::serveInterop(options);
  return std::make_unique<broker::Broker>(classes, std::move(options));
}

int runServer(int argc, const char* const* argv, const MakeBroker& makeBroker) {
  const auto read = readCommandLine(argc, argv);
  if (const auto* telling = std::get_if<Telling>(&read)) {
    if (telling->isError) {
      tellError(telling->text);
      return kWrongUsage;
    }
    std::fputs(telling->text.c_str(), stdout);
    return kServed;
  }
  try {
    return serve(std::get<CommandLine>(read), makeBroker);
  } catch (const zorva::agent::ConfigError& error) {
    tellError(error.what());
    return kWrongUsage;
  } catch (const std::invalid_argument& error) {
    tellError(error.what());
    return kWrongUsage;
  } catch (const std::exception& error) {
    tellError(error.what());
    return kCannotServe;
  }
}

}  // namespace zorva::server
