#include "http/HttpServer.h"

#include <arpa/inet.h>
#include <gnutls/abstract.h>
#include <microhttpd.h>
#include <netinet/in.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <cstdarg>
#include <cstdio>
#include <cstring>
#include <iterator>
#include <mutex>
#include <optional>
#include <stdexcept>
#include <thread>
#include <utility>

#include "http/AddressText.h"
#include "http/ClientIdentity.h"
#include "http/Connections.h"
#include "http/HostNames.h"
#include "http/HttpExchange.h"
#include "http/JoinedRecords.h"
#include "http/Log.h"
#include "http/LoginQueue.h"
#include "http/Reception.h"
#include "http/RequestHead.h"
#include "http/TlsIdentity.h"
#include "http/Workers.h"
#include "util/FileDescriptor.h"
#include "util/Names.h"
#include "util/ServiceHost.h"

namespace zorva::http {

namespace {

constexpr std::string_view kLogin = "Basic realm=\"zorvacimd\", charset=\"UTF-8\"";

/// Nothing if the client is let in.
std::optional<Refusal> refusalOf(access::Decision& decision) {
  using Kind = access::Decision::Kind;
  switch (decision.kind) {
    case Kind::Admitted:
      return std::nullopt;
    case Kind::NeedsLogin:
      return Refusal{401, std::move(decision.why), {}, {}, kLogin};
    case Kind::TooEarly: {
      const auto seconds = std::chrono::ceil<std::chrono::seconds>(decision.delay).count();
      return Refusal{503, std::move(decision.why), {}, {}, {}, static_cast<int>(seconds)};
    }
    case Kind::MustVerify:
    case Kind::Refused:
      break;
  }
  return Refusal{403, std::move(decision.why), {}};
}

/// What the HTTP library stores for a request.
using Holder = std::shared_ptr<HttpExchange>;

/// What the HTTP library stores for a connection.
struct OpenConnection {
  std::shared_ptr<Connection> client;
  std::shared_ptr<const TlsIdentity> tls;       ///< null: no TLS
  bool isSecured = false;                       ///< the handshake of TLS is complete
  bool isIdentified = false;                    ///< its certificate was looked at
  std::string refusal = {};                     ///< what is wrong with the client's certificate
  std::unique_ptr<JoinedRecords> records = {};  ///< null: no TLS
};

OpenConnection& openConnectionOf(MHD_Connection* connection) {
  const MHD_ConnectionInfo* info = MHD_get_connection_info(connection, MHD_CONNECTION_INFO_SOCKET_CONTEXT);
  return *static_cast<OpenConnection*>(info->socket_context);
}

/// Null for a connection without TLS.
gnutls_session_t sessionOf(MHD_Connection* connection) {
  const MHD_ConnectionInfo* info = MHD_get_connection_info(connection, MHD_CONNECTION_INFO_GNUTLS_SESSION);
  return info == nullptr ? nullptr : static_cast<gnutls_session_t>(info->tls_session);
}

/// Called when the last message of a handshake was sent or received.
int onHandshakeFinished(gnutls_session_t session, unsigned int, unsigned int, unsigned int, const gnutls_datum_t*) {
  static_cast<OpenConnection*>(gnutls_session_get_ptr(session))->isSecured = true;
  return 0;
}

/// Lines of the library that say nothing useful: a Unix socket has no options of TCP, and onConnection() reports failed
/// handshakes with the address.
bool isNoise(std::string_view line) {
  constexpr std::string_view kNoise[] = {"Setting TCP_", "Failed to push the data from buffers",
                                         "Error: received handshake message out of context"};
  return std::any_of(std::begin(kNoise), std::end(kNoise), [&](auto each) { return line.starts_with(each); });
}

/// The library asks for a certificate if a session has none of its own: then it fails.
int noCertificate(gnutls_session_t, const gnutls_cert_retr_st*, gnutls_pcert_st**, unsigned int*, gnutls_ocsp_data_st**,
                  unsigned int*, gnutls_privkey_t*, unsigned int*) {
  return -1;
}

access::AuditRecord recordOf(const HttpExchange& exchange, const Refusal& refusal) {
  const HeaderList& headers = exchange.request.headers;
  const std::string* operation = findHeader(headers, "CIMMethod");
  const std::string* object = findHeader(headers, "CIMObject");
  access::AuditRecord record;
  record.from = exchange.client->peer();
  record.operation = operation != nullptr ? *operation : exchange.request.method;
  record.object = object != nullptr ? *object : exchange.request.path;
  record.result = std::to_string(refusal.status) + " " + refusal.why;
  record.isRefusal = true;
  return record;
}

std::string withoutLineEnd(std::string text) {
  while (!text.empty() && (text.back() == '\n' || text.back() == '\r')) text.pop_back();
  return text;
}

}  // namespace

class HttpServer::Core {
 public:
  Core(const HttpLimits& limits, int threads, Handler handler, Pages pages, std::shared_ptr<access::Gate> gate);
  ~Core();

  void take(int socket, const sockaddr_storage& peer, socklen_t peerSize, Door door);
  int newcomers() const { return reception_.descriptor(); }
  void look() { reception_.look(); }
  void setTls(std::shared_ptr<const TlsIdentity> identity);
  void setHostNames(const std::vector<std::string>& names);
  void setAudit(access::AuditHook audit) { audit_ = std::move(audit); }
  void setRequestHook(RequestHook hook) { requestHook_ = std::move(hook); }
  void setLimits(const HttpLimits& limits);
  void sweep();
  bool hasWork() const;
  std::size_t streams() const { return streamCount_.load(std::memory_order_relaxed); }
  bool stop();

  std::size_t connectionCount() const { return connections_.count(); }
  std::size_t inFlight() const { return workers_.inFlight(); }
  std::size_t requestsTaken() const { return requests_.load(std::memory_order_relaxed); }

 private:
  // Called by the HTTP library.
  static MHD_Result onRequest(void* core, MHD_Connection* connection, const char* url, const char* method,
                              const char* version, const char* data, std::size_t* size, void** holder);
  static void* onRequestLine(void* core, const char* uri, MHD_Connection* connection);
  static void onCompleted(void* core, MHD_Connection* connection, void** holder, MHD_RequestTerminationCode code);
  static void onConnection(void* core, MHD_Connection* connection, void** context, MHD_ConnectionNotificationCode code);
  static void onLog(void* core, const char* format, va_list arguments);

  MHD_Result readHead(Holder& exchange, MHD_Connection* connection, const char* method, const char* version);
  void admitNewcomer(Newcomer&& newcomer);
  std::optional<Refusal> identify(OpenConnection& connection, gnutls_session_t session);
  std::optional<Refusal> checkWebPage(OpenConnection& connection, const HeaderList& headers);
  std::optional<Refusal> checkRequest(MHD_Connection* connection, HttpExchange& exchange, const char* version);
  std::optional<Refusal> admit(HttpExchange& exchange);
  MHD_Result loginIsDecided(HttpExchange& exchange, MHD_Connection* connection);
  static std::optional<Refusal> letIn(HttpExchange& exchange, access::Decision decision);
  void readBody(HttpExchange& exchange, std::string_view data);
  void releaseBody(HttpExchange& exchange);
  bool answersAtOnce(HttpExchange& exchange) const;
  MHD_Result requestIsWhole(const Holder& exchange, MHD_Connection* connection);
  void startStream(const Holder& exchange);
  void endStreams();
  void report(const HttpExchange& exchange) const;
  static MHD_Result respond(HttpExchange& exchange, MHD_Connection* connection);
  void logRefusal(const HttpExchange& exchange, const Refusal& refusal) const;
  void logAnswer(const HttpExchange& exchange) const;
  MHD_Daemon* startDaemon(Door door) const;
  void stopDaemons();
  HttpLimits limits() const;
  template <typename Value>
  std::shared_ptr<const Value> shared(const std::shared_ptr<const Value>& value) const;

  mutable std::mutex limitsMutex_;
  HttpLimits limits_;
  std::shared_ptr<const TlsIdentity> tls_;  ///< of new connections
  std::shared_ptr<const HostNames> names_ = std::make_shared<const HostNames>();
  const int threads_;
  const Pages pages_;
  const std::shared_ptr<access::Gate> gate_;
  Connections connections_;
  Workers workers_;
  LoginQueue logins_;
  access::AuditHook audit_;
  RequestHook requestHook_;
  std::mutex streamsMutex_;
  std::vector<std::weak_ptr<HttpExchange>> streams_;
  bool takesStreams_ = true;
  std::atomic<std::size_t> streamCount_ = 0;
  std::atomic<std::size_t> bodies_ = 0;  ///< bytes of unfinished requests
  std::atomic<std::size_t> requests_ = 0;
  MHD_Daemon* daemon_ = nullptr;
  MHD_Daemon* tlsDaemon_ = nullptr;
  Reception reception_;
};

HttpServer::Core::Core(const HttpLimits& limits, int threads, Handler handler, Pages pages,
                       std::shared_ptr<access::Gate> gate)
    : limits_(limits),
      threads_(threads),
      pages_(std::move(pages)),
      gate_(std::move(gate)),
      workers_(limits,
               [work = std::move(handler)](HttpExchange& exchange) {
                 const Page* page = exchange.page;
                 page != nullptr ? page->answer(exchange.request, exchange) : work(exchange.request, exchange);
               }),
      logins_(gate_),
      reception_(connections_, [this](Newcomer&& newcomer) { admitNewcomer(std::move(newcomer)); }) {
  daemon_ = startDaemon(Door::Http);
}

MHD_Daemon* HttpServer::Core::startDaemon(Door door) const {
  constexpr unsigned kFlags = MHD_USE_NO_LISTEN_SOCKET | MHD_ALLOW_SUSPEND_RESUME | MHD_USE_ERROR_LOG;
  constexpr unsigned kPlainFlags = MHD_USE_EPOLL_INTERNAL_THREAD;
  // With epoll the library spins while a handshake waits for its client.
  constexpr unsigned kTlsFlags = MHD_USE_POLL_INTERNAL_THREAD | MHD_USE_TLS;
  // take() counts the connections; connections that are cut off and not yet closed must not keep new ones out.
  constexpr unsigned kMostConnections = 1U << 20;
  // Strings are compared by the header's rules for each: strict where leniency would let requests be smuggled.
  constexpr int kStrict = 1;
  MHD_OptionItem tls[] = {{MHD_OPTION_HTTPS_PRIORITIES, 0, const_cast<char*>(kTlsPriorities)},
                          {MHD_OPTION_HTTPS_CERT_CALLBACK2, 0, reinterpret_cast<void*>(&noCertificate)},
                          {MHD_OPTION_END, 0, nullptr}};
  const bool isTls = door == Door::Https;
  auto* self = const_cast<Core*>(this);
  MHD_Daemon* daemon = MHD_start_daemon(                             //
      kFlags | (isTls ? kTlsFlags : kPlainFlags),                    //
      0, nullptr, nullptr, &Core::onRequest, self,                   //
      MHD_OPTION_EXTERNAL_LOGGER, &Core::onLog, self,                //
      MHD_OPTION_THREAD_POOL_SIZE, static_cast<unsigned>(threads_),  //
      MHD_OPTION_CONNECTION_LIMIT, kMostConnections,                 //
      MHD_OPTION_CONNECTION_MEMORY_LIMIT, limits_.headerBytes,       //
      MHD_OPTION_STRICT_FOR_CLIENT, kStrict,                         //
      MHD_OPTION_SIGPIPE_HANDLED_BY_APP, 1,                          //
      MHD_OPTION_URI_LOG_CALLBACK, &Core::onRequestLine, self,       //
      MHD_OPTION_NOTIFY_COMPLETED, &Core::onCompleted, self,         //
      MHD_OPTION_NOTIFY_CONNECTION, &Core::onConnection, self,       //
      MHD_OPTION_ARRAY, isTls ? tls : tls + std::size(tls) - 1, MHD_OPTION_END);
  if (daemon == nullptr) throw std::runtime_error("the HTTP threads cannot be started");
  return daemon;
}

HttpServer::Core::~Core() {
  endStreams();
  workers_.giveUpAll();
  logins_.giveUpAll();
  stopDaemons();
}

void HttpServer::Core::stopDaemons() {
  for (MHD_Daemon** each : {&tlsDaemon_, &daemon_}) {
    if (*each != nullptr) MHD_stop_daemon(std::exchange(*each, nullptr));
  }
}

HttpLimits HttpServer::Core::limits() const {
  const std::lock_guard lock(limitsMutex_);
  return limits_;
}

void HttpServer::Core::setLimits(const HttpLimits& limits) {
  const std::lock_guard lock(limitsMutex_);
  limits_ = limits;
  workers_.setLimits(limits);
}

template <typename Value>
std::shared_ptr<const Value> HttpServer::Core::shared(const std::shared_ptr<const Value>& value) const {
  const std::lock_guard lock(limitsMutex_);
  return value;
}

void HttpServer::Core::setTls(std::shared_ptr<const TlsIdentity> identity) {
  if (tlsDaemon_ == nullptr) tlsDaemon_ = startDaemon(Door::Https);
  const std::lock_guard lock(limitsMutex_);
  tls_ = std::move(identity);
}

void HttpServer::Core::setHostNames(const std::vector<std::string>& names) {
  auto fresh = std::make_shared<const HostNames>(names);
  const std::lock_guard lock(limitsMutex_);
  names_ = std::move(fresh);
}

void HttpServer::Core::take(int socket, const sockaddr_storage& from, socklen_t peerSize, Door door) {
  const sockaddr_storage peer = unmapped(from);
  Newcomer newcomer{util::FileDescriptor(socket), from, peerSize, door, nullptr};
  if (connections_.count() >= limits().connections && !connections_.cutIdlest()) {
    ZORVA_LOG_CLIENT(Warning, peerText(socket, peer) + ": refused, since all connections have a request in work");
    return;
  }
  // Added here because the library reports a new connection later, on its own thread.
  newcomer.connection = connections_.add(socket, peerText(socket, peer), clientOf(socket, peer),
                                         originOf(socket, peer, door == Door::Https));
  if (peer.ss_family == AF_UNIX) {
    admitNewcomer(std::move(newcomer));
  } else {
    reception_.add(std::move(newcomer));
  }
}

void HttpServer::Core::admitNewcomer(Newcomer&& newcomer) {
  MHD_Daemon* daemon = newcomer.door == Door::Https ? tlsDaemon_ : daemon_;
  const auto* peer = reinterpret_cast<const sockaddr*>(&newcomer.peer);
  // The library closes the socket, also if it refuses it.
  if (MHD_add_connection(daemon, newcomer.socket.release(), peer, newcomer.peerSize) == MHD_YES) return;
  ZORVA_LOG_CLIENT(Error, newcomer.connection->peer() + ": refused: " + std::strerror(errno));
  connections_.remove(*newcomer.connection);
}

void HttpServer::Core::sweep() {
  connections_.sweep(limits());
  workers_.sweep();
  logins_.sweep();
}

bool HttpServer::Core::hasWork() const {
  return workers_.inFlight() > 0 ||
         connections_.countIn(Phase::Working) + connections_.countIn(Phase::Sending) > streams();
}

bool HttpServer::Core::stop() {
  using Clock = std::chrono::steady_clock;
  constexpr std::chrono::milliseconds kStep{5};
  constexpr std::chrono::milliseconds kLastAnswers{500};
  const auto waitUntil = [&](Clock::time_point deadline) {
    while (hasWork() && Clock::now() < deadline) std::this_thread::sleep_for(kStep);
  };
  endStreams();
  // A client that is not known yet has no request in work.
  logins_.giveUpAll();
  waitUntil(Clock::now() + limits().drain);
  workers_.giveUpAll();
  waitUntil(Clock::now() + kLastAnswers);
  stopDaemons();
  const bool isLoginDone = logins_.join(kLastAnswers);
  return workers_.join(kLastAnswers) && isLoginDone;
}

// ---- Called by the HTTP library ----

void HttpServer::Core::onConnection(void* self, MHD_Connection* connection, void** context,
                                    MHD_ConnectionNotificationCode code) {
  Core& core = *static_cast<Core*>(self);
  auto** own = reinterpret_cast<OpenConnection**>(context);
  if (code == MHD_CONNECTION_NOTIFY_STARTED) {
    const int socket = MHD_get_connection_info(connection, MHD_CONNECTION_INFO_CONNECTION_FD)->connect_fd;
    *own = new OpenConnection{core.connections_.find(socket), nullptr};
    if (gnutls_session_t session = sessionOf(connection); session != nullptr) {
      (*own)->tls = core.shared(core.tls_);
      (*own)->tls->attach(session);
      (*own)->records = std::make_unique<JoinedRecords>(socket);
      (*own)->records->attach(session);
      gnutls_session_set_ptr(session, *own);
      gnutls_handshake_set_hook_function(session, GNUTLS_HANDSHAKE_FINISHED, GNUTLS_HOOK_POST, &onHandshakeFinished);
    }
  } else if (*own != nullptr) {
    // The library has freed the session.
    if ((*own)->tls != nullptr && !(*own)->isSecured) {
      ZORVA_LOG_CLIENT(Warning, (*own)->client->peer() + ": its TLS handshake failed");
    }
    core.connections_.remove(*(*own)->client);
    delete std::exchange(*own, nullptr);
  }
}

void* HttpServer::Core::onRequestLine(void*, const char* uri, MHD_Connection* connection) {
  std::shared_ptr<Connection> client = openConnectionOf(connection).client;
  // The first request's time has run since the connection was made.
  if (client->phase() == Phase::Idle) client->enter(Phase::Arriving);
  return new Holder(std::make_shared<HttpExchange>(connection, std::move(client), uri));
}

MHD_Result HttpServer::Core::onRequest(void* self, MHD_Connection* connection, const char*, const char* method,
                                       const char* version, const char* data, std::size_t* size, void** holder) {
  Core& core = *static_cast<Core*>(self);
  Holder& exchange = *static_cast<Holder*>(*holder);
  if (!exchange->headIsRead) return core.readHead(exchange, connection, method, version);
  if (exchange->awaitsLogin) return core.loginIsDecided(*exchange, connection);
  if (*size > 0) {
    core.readBody(*exchange, {data, *size});
    *size = 0;
    return MHD_YES;
  }
  if (exchange->isPublished()) return respond(*exchange, connection);
  return core.requestIsWhole(exchange, connection);
}

MHD_Result HttpServer::Core::readHead(Holder& exchange, MHD_Connection* connection, const char* method,
                                      const char* version) {
  exchange->headIsRead = true;
  requests_.fetch_add(1, std::memory_order_relaxed);
  HttpRequest& request = exchange->request;
  request.method = method;
  request.client = exchange->client->client();
  request.headers.reserve(8);
  MHD_get_connection_values_n(
      connection, MHD_HEADER_KIND,
      [](void* headers, MHD_ValueKind, const char* name, std::size_t nameSize, const char* value,
         std::size_t valueSize) {
        static_cast<HeaderList*>(headers)->emplace_back(
            std::string(name, nameSize), value == nullptr ? std::string() : std::string(value, valueSize));
        return MHD_YES;
      },
      &request.headers);
  exchange->isHttp11 = std::strcmp(version, "HTTP/1.1") == 0;

  if (const auto refusal = checkRequest(connection, *exchange, version)) {
    logRefusal(*exchange, *refusal);
    exchange->client->enter(Phase::Sending);
    exchange->refusedWith = refusal->status;
    return respondWith(connection, *refusal);
  }
  exchange->takesGzip = limits().gzip && listHas(request.headers, "Accept-Encoding", "gzip");
  request.takesTrailers = exchange->isHttp11 && listHas(request.headers, "TE", "trailers");
  return MHD_YES;
}

/// Whether the request may go on to its body.
std::optional<Refusal> HttpServer::Core::checkRequest(MHD_Connection* connection, HttpExchange& exchange,
                                                      const char* version) {
  const HttpRequest& request = exchange.request;
  OpenConnection& open = openConnectionOf(connection);
  if (auto refusal = checkWebPage(open, request.headers)) return refusal;
  const Page* page = pageAt(pages_, request.path);
  const RequestHead head{request.method, request.path, version, request.headers, page != nullptr};
  if (auto refusal = checkHead(head, limits().bodyBytes)) return refusal;
  if (isForPages(request.method)) exchange.page = page;
  if (auto refusal = identify(open, sessionOf(connection))) return refusal;
  return admit(exchange);
}

/// No web page reaches a Unix socket, and programs that use one name any host.
std::optional<Refusal> HttpServer::Core::checkWebPage(OpenConnection& connection, const HeaderList& headers) {
  Connection& client = *connection.client;
  if (client.origin().way == access::Origin::Way::UnixSocket) return std::nullopt;
  const std::string* host = findHeader(headers, MHD_HTTP_HEADER_HOST);
  if (host != nullptr && *host != client.knownHost) {
    const bool isOwn = shared(names_)->has(*host) ||
                       (connection.tls != nullptr && connection.tls->covers(std::string(util::withoutPort(*host))));
    if (!isOwn) return foreignHost(*host);
    client.knownHost = *host;
  }
  return checkOrigin(headers, connection.tls != nullptr ? "https" : "http");
}

/// Looks at the client's certificate when the first request comes: the handshake is over then.
std::optional<Refusal> HttpServer::Core::identify(OpenConnection& connection, gnutls_session_t session) {
  if (connection.tls == nullptr) return std::nullopt;
  if (!connection.isIdentified) {
    PeerCertificate peer = connection.tls->checkPeer(session);
    if (peer.certificate.has_value()) connection.client->setCertificate(std::move(*peer.certificate));
    connection.refusal = std::move(peer.refusal);
    connection.isIdentified = true;
  }
  if (connection.refusal.empty()) return std::nullopt;
  return Refusal{403, connection.refusal, {}};
}

/// Finds out who the client is. Public pages are shown to everybody. The body is not read before the client is known.
std::optional<Refusal> HttpServer::Core::admit(HttpExchange& exchange) {
  if (exchange.page != nullptr && exchange.page->isPublic) return std::nullopt;
  const std::string* authorization = findHeader(exchange.request.headers, MHD_HTTP_HEADER_AUTHORIZATION);
  access::Decision decision = gate_->decide(exchange.client->origin(), authorization);
  const bool mustVerify = decision.kind == access::Decision::Kind::MustVerify;
  if (!mustVerify && decision.kind != access::Decision::Kind::TooEarly) return letIn(exchange, std::move(decision));
  access::Origin origin = exchange.client->origin();
  exchange.awaitsLogin = true;
  exchange.client->enter(Phase::Working);
  exchange.suspend();
  Applicant applicant{std::move(origin), authorization == nullptr ? std::string() : *authorization,
                      [held = exchange.shared_from_this()](access::Decision later) { held->decide(std::move(later)); }};
  mustVerify ? logins_.submit(std::move(applicant)) : logins_.hold(std::move(applicant), std::move(decision));
  return std::nullopt;
}

/// The password in the header field is needed no longer.
std::optional<Refusal> HttpServer::Core::letIn(HttpExchange& exchange, access::Decision decision) {
  std::erase_if(exchange.request.headers,
                [](const auto& field) { return util::sameName(field.first, MHD_HTTP_HEADER_AUTHORIZATION); });
  auto refusal = refusalOf(decision);
  if (!refusal) exchange.request.who = std::move(decision.client);
  return refusal;
}

MHD_Result HttpServer::Core::loginIsDecided(HttpExchange& exchange, MHD_Connection* connection) {
  exchange.awaitsLogin = false;
  access::Decision decision = exchange.takeDecision();
  const auto refusal = letIn(exchange, std::move(decision));
  exchange.client->enter(refusal ? Phase::Sending : Phase::Arriving);
  if (!refusal) return MHD_YES;
  logRefusal(exchange, *refusal);
  exchange.refusedWith = refusal->status;
  return respondWith(connection, *refusal);
}

void HttpServer::Core::readBody(HttpExchange& exchange, std::string_view data) {
  if (exchange.refusal.has_value()) return;  // the rest is read and dropped, for as long as a request may take
  const HttpLimits now = limits();
  std::string& body = exchange.request.body;
  if (data.size() > now.bodyBytes - std::min(body.size(), now.bodyBytes)) {
    exchange.refusal =
        Refusal{413, "the body is longer than the " + std::to_string(now.bodyBytes) + " bytes allowed", {}};
    releaseBody(exchange);
    return;
  }
  body += data;
  exchange.client->hold(body.size());
  if (bodies_.fetch_add(data.size()) + data.size() > now.bodiesBytes) connections_.cutSlowestBody();
}

/// Its body no longer counts as unfinished.
void HttpServer::Core::releaseBody(HttpExchange& exchange) {
  bodies_ -= exchange.client->held();
  exchange.client->hold(0);
}

/// Requests that need no worker.
bool HttpServer::Core::answersAtOnce(HttpExchange& exchange) const {
  const HttpRequest& request = exchange.request;
  if (request.method == "OPTIONS") {
    exchange.begin(200, capabilities(pageAt(pages_, request.path) != nullptr));
  } else if (exchange.page != nullptr && exchange.page->isPublic) {
    exchange.page->answer(request, exchange);
  } else {
    return false;
  }
  exchange.finish({});
  return true;
}

MHD_Result HttpServer::Core::requestIsWhole(const Holder& exchange, MHD_Connection* connection) {
  releaseBody(*exchange);
  if (answersAtOnce(*exchange)) return respond(*exchange, connection);
  exchange->client->enter(Phase::Working);
  exchange->suspend();
  if (!exchange->refusal.has_value() && exchange->page != nullptr && exchange->page->stream) {
    startStream(exchange);
    return MHD_YES;
  }
  if (!exchange->refusal.has_value()) exchange->refusal = workers_.submit(exchange, connections_);
  if (exchange->refusal.has_value()) {
    logRefusal(*exchange, *exchange->refusal);
    exchange->finish(*exchange->refusal);
  }
  return MHD_YES;
}

void HttpServer::Core::startStream(const Holder& exchange) {
  if (exchange->request.method == MHD_HTTP_METHOD_HEAD) {
    exchange->begin(200, {});
    return exchange->finish({});
  }
  const std::lock_guard lock(streamsMutex_);
  exchange->refusal =
      takesStreams_ ? exchange->page->stream(exchange->request, exchange) : Refusal{503, "the server is ending", {}};
  if (exchange->refusal.has_value()) {
    logRefusal(*exchange, *exchange->refusal);
    return exchange->finish(*exchange->refusal);
  }
  exchange->isStream = true;
  std::erase_if(streams_, [](const auto& each) { return each.expired(); });
  streams_.push_back(exchange);
  ++streamCount_;
}

/// The HTTP library must not be stopped while connections are suspended.
void HttpServer::Core::endStreams() {
  const std::lock_guard lock(streamsMutex_);
  takesStreams_ = false;
  for (const auto& each : streams_) {
    if (const auto exchange = each.lock()) exchange->end();
  }
}

MHD_Result HttpServer::Core::respond(HttpExchange& exchange, MHD_Connection* connection) {
  const MHD_Result queued = exchange.respond();
  JoinedRecords* records = openConnectionOf(connection).records.get();
  if (records != nullptr && queued == MHD_YES && exchange.hasWholeBody()) records->joinNextTwo();
  return queued;
}

void HttpServer::Core::onCompleted(void* self, MHD_Connection*, void** holder, MHD_RequestTerminationCode code) {
  auto* exchange = static_cast<Holder*>(std::exchange(*holder, nullptr));
  if (exchange == nullptr) return;
  Core& core = *static_cast<Core*>(self);
  (*exchange)->ended();
  core.releaseBody(**exchange);
  if ((*exchange)->isStream) --core.streamCount_;
  if (code == MHD_REQUEST_TERMINATED_COMPLETED_OK || (*exchange)->isStream) core.report(**exchange);
  if (code == MHD_REQUEST_TERMINATED_COMPLETED_OK) {
    (*exchange)->client->prove();
    core.logAnswer(**exchange);
  } else {
    ZORVA_LOG_CLIENT(Warning, (*exchange)->client->peer() + ": the connection ended within a request");
  }
  (*exchange)->client->enter(Phase::Idle);
  delete exchange;
}

void HttpServer::Core::report(const HttpExchange& exchange) const {
  const int status = exchange.status() != 0 ? exchange.status() : exchange.refusedWith;
  if (!requestHook_ || status == 0) return;
  const auto time = HttpExchange::Clock::now() - exchange.arrived();
  requestHook_({status, exchange.page != nullptr, exchange.isStream, exchange.wasGivenUp(),
                std::chrono::duration_cast<std::chrono::microseconds>(time)});
}

void HttpServer::Core::logRefusal(const HttpExchange& exchange, const Refusal& refusal) const {
  if (audit_ && (refusal.status == 401 || refusal.status == 403)) return audit_(recordOf(exchange, refusal));
  ZORVA_LOG_CLIENT(Warning, exchange.client->peer() + " " + exchange.request.method + " " + exchange.request.path +
                                ": " + std::to_string(refusal.status) + " " + refusal.why);
}

void HttpServer::Core::logAnswer(const HttpExchange& exchange) const {
  if (!isLogged(Level::Request) || exchange.status() == 0) return;
  const std::string* operation = findHeader(exchange.request.headers, "CIMMethod");
  const auto time =
      std::chrono::duration_cast<std::chrono::microseconds>(HttpExchange::Clock::now() - exchange.arrived());
  ZORVA_LOG(Request, exchange.client->peer() + " " + exchange.request.method + " " + exchange.request.path + " " +
                         (operation == nullptr ? "-" : *operation) + ": " + std::to_string(exchange.status()) + ", " +
                         std::to_string(exchange.bytesSent()) + " bytes, " + std::to_string(time.count()) + " us");
}

void HttpServer::Core::onLog(void*, const char* format, va_list arguments) {
  if (!isLogged(Level::Warning)) return;
  char text[512];
  std::vsnprintf(text, sizeof text, format, arguments);
  if (!isNoise(text)) ZORVA_LOG_CLIENT(Warning, withoutLineEnd(text));
}

// ---- HttpServer ----

HttpServer::HttpServer(const HttpLimits& limits, int threads, Handler handler, Pages pages,
                       std::shared_ptr<access::Gate> gate)
    : core_(std::make_unique<Core>(limits, threads, std::move(handler), std::move(pages), std::move(gate))) {}

HttpServer::~HttpServer() = default;

void HttpServer::take(int socket, const sockaddr_storage& peer, socklen_t peerSize, Door door) {
  core_->take(socket, peer, peerSize, door);
}

int HttpServer::newcomers() const { return core_->newcomers(); }

void HttpServer::look() { core_->look(); }

void HttpServer::setTls(std::shared_ptr<const TlsIdentity> identity) { core_->setTls(std::move(identity)); }

void HttpServer::setHostNames(const std::vector<std::string>& names) { core_->setHostNames(names); }

void HttpServer::setAudit(access::AuditHook audit) { core_->setAudit(std::move(audit)); }

void HttpServer::setRequestHook(RequestHook hook) { core_->setRequestHook(std::move(hook)); }

void HttpServer::setLimits(const HttpLimits& limits) { core_->setLimits(limits); }

void HttpServer::sweep() { core_->sweep(); }

bool HttpServer::isBusy() const { return core_->connectionCount() > core_->streams() || core_->inFlight() > 0; }

std::size_t HttpServer::streams() const { return core_->streams(); }

std::size_t HttpServer::connections() const { return core_->connectionCount(); }

std::size_t HttpServer::requestsInWork() const { return core_->inFlight(); }

std::size_t HttpServer::requestsTaken() const { return core_->requestsTaken(); }

bool HttpServer::hasWork() const { return core_->hasWork(); }

bool HttpServer::stop() { return core_->stop(); }

}  // namespace zorva::http
