#include "cli/testing/Forwarder.h"

#include <arpa/inet.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

#include <cstdint>
#include <stdexcept>

namespace zorva::cli {

namespace {

sockaddr_in loopback(const std::string& port, const std::string& host = "127.0.0.1") {
  sockaddr_in address{};
  address.sin_family = AF_INET;
  address.sin_port = htons(static_cast<std::uint16_t>(std::stoul(port)));
  ::inet_pton(AF_INET, host.c_str(), &address.sin_addr);
  return address;
}

/// `address` is the host first, and then with the port.
util::FileDescriptor listenOnLoopback(std::string& address) {
  util::FileDescriptor listener(::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0));
  sockaddr_in bound = loopback("0", address);
  socklen_t size = sizeof bound;
  if (::bind(listener.get(), reinterpret_cast<sockaddr*>(&bound), size) != 0 || ::listen(listener.get(), 64) != 0) {
    throw std::runtime_error("no port");
  }
  ::getsockname(listener.get(), reinterpret_cast<sockaddr*>(&bound), &size);
  address += ":" + std::to_string(ntohs(bound.sin_port));
  return listener;
}

/// One end of a connection.
class End {
 public:
  explicit End(int socket) : socket_(socket) {}
  virtual ~End() = default;
  End(const End&) = delete;
  End& operator=(const End&) = delete;

  int socket() const { return socket_; }
  virtual bool hasMore() const { return false; }
  virtual ssize_t read(char* data, std::size_t size) { return ::recv(socket_, data, size, 0); }
  virtual ssize_t write(const char* data, std::size_t size) { return ::send(socket_, data, size, MSG_NOSIGNAL); }

 private:
  int socket_;
};

class TlsEnd : public End {
 public:
  TlsEnd(int socket, gnutls_certificate_credentials_t credentials) : End(socket) {
    gnutls_init(&session_, GNUTLS_SERVER | GNUTLS_NO_SIGNAL);
    gnutls_set_default_priority(session_);
    gnutls_credentials_set(session_, GNUTLS_CRD_CERTIFICATE, credentials);
    gnutls_transport_set_int(session_, socket);
  }
  ~TlsEnd() override { gnutls_deinit(session_); }

  bool shakeHands() {
    int code = 0;
    do {
      code = gnutls_handshake(session_);
    } while (code < 0 && gnutls_error_is_fatal(code) == 0);
    return code == 0;
  }
  bool hasMore() const override { return gnutls_record_check_pending(session_) > 0; }
  ssize_t read(char* data, std::size_t size) override {
    ssize_t count = GNUTLS_E_AGAIN;
    while (count == GNUTLS_E_AGAIN || count == GNUTLS_E_INTERRUPTED) count = gnutls_record_recv(session_, data, size);
    return count;
  }
  ssize_t write(const char* data, std::size_t size) override { return gnutls_record_send(session_, data, size); }

 private:
  gnutls_session_t session_ = nullptr;
};

bool pass(End& from, End& to, std::string* seen, std::mutex& mutex) {
  char buffer[16384];
  const ssize_t count = from.read(buffer, sizeof buffer);
  if (count <= 0) return false;
  if (seen != nullptr) {
    const std::lock_guard lock(mutex);
    seen->append(buffer, static_cast<std::size_t>(count));
  }
  for (ssize_t sent = 0; sent < count;) {
    const ssize_t more = to.write(buffer + sent, static_cast<std::size_t>(count - sent));
    if (more <= 0) return false;
    sent += more;
  }
  return true;
}

}  // namespace

Forwarder::Forwarder(const http::testing::IssuedFiles& certificate, const std::string& target,
                     const std::string& address)
    : target_(target), url_(address) {
  gnutls_certificate_credentials_t credentials = nullptr;
  http::checkGnutls(gnutls_certificate_allocate_credentials(&credentials));
  credentials_.reset(credentials);
  http::checkGnutls(gnutls_certificate_set_x509_key_file(credentials, certificate.certificate.c_str(),
                                                         certificate.key.c_str(), GNUTLS_X509_FMT_PEM));
  listener_ = listenOnLoopback(url_);
  url_ = "https://" + url_;
  thread_ = std::thread([this] { serve(); });
}

Forwarder::Forwarder(const std::string& socket, const std::string& target)
    : listener_(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0)), target_(target), url_("unix:" + socket) {
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  socket.copy(address.sun_path, sizeof address.sun_path - 1);
  if (::bind(listener_.get(), reinterpret_cast<sockaddr*>(&address), sizeof address) != 0 ||
      ::chmod(socket.c_str(), 0666) != 0 || ::listen(listener_.get(), 64) != 0) {
    throw std::runtime_error("no socket");
  }
  thread_ = std::thread([this] { serve(); });
}

Forwarder::~Forwarder() {
  ::shutdown(listener_.get(), SHUT_RDWR);
  thread_.join();
  {
    const std::lock_guard lock(mutex_);
    for (const int each : open_) ::shutdown(each, SHUT_RDWR);
  }
  for (std::thread& each : clients_) each.join();
}

std::string Forwarder::received() const {
  const std::lock_guard lock(mutex_);
  return received_;
}

std::size_t Forwarder::connections() const {
  const std::lock_guard lock(mutex_);
  return clients_.size();
}

void Forwarder::serve() {
  for (;;) {
    const int client = ::accept4(listener_.get(), nullptr, nullptr, SOCK_CLOEXEC);
    if (client < 0) return;
    const std::lock_guard lock(mutex_);
    open_.push_back(client);
    clients_.emplace_back([this, client] { forward(client); });
  }
}

void Forwarder::forward(int client) {
  std::unique_ptr<End> near;
  bool isReady = true;
  if (credentials_ == nullptr) {
    near = std::make_unique<End>(client);
  } else {
    auto tls = std::make_unique<TlsEnd>(client, credentials_.get());
    isReady = tls->shakeHands();
    near = std::move(tls);
  }
  const util::FileDescriptor server(::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0));
  const sockaddr_in address = loopback(target_.substr(target_.rfind(':') + 1));
  isReady = isReady && ::connect(server.get(), reinterpret_cast<const sockaddr*>(&address), sizeof address) == 0;
  End far(server.get());
  while (isReady) {
    pollfd ready[] = {{client, POLLIN, 0}, {server.get(), POLLIN, 0}};
    if (!near->hasMore()) ::poll(ready, 2, -1);
    if (near->hasMore() || ready[0].revents != 0) isReady = pass(*near, far, &received_, mutex_);
    if (isReady && ready[1].revents != 0) isReady = pass(far, *near, nullptr, mutex_);
  }
  const std::lock_guard lock(mutex_);
  open_.remove(client);
  near.reset();
  ::close(client);
}

SilentServer::SilentServer(const std::string& host) : address_(host) { listener_ = listenOnLoopback(address_); }

}  // namespace zorva::cli
