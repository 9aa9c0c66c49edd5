#pragma once

// For tests of --url: ways to a server that speaks plain HTTP on loopback: TLS, and a Unix socket.

#include <list>
#include <memory>
#include <mutex>
#include <string>
#include <thread>

#include "http/GnutlsHandles.h"
#include "http/testing/TestCertificates.h"
#include "util/FileDescriptor.h"
#include "util/NotCopied.h"

namespace zorva::cli {

/// Hands each connection on to "http://127.0.0.1:PORT".
class Forwarder : util::NotCopied {
 public:
  /// A TLS server with this certificate, on a port of its own at this loopback address.
  Forwarder(const http::testing::IssuedFiles& certificate, const std::string& target,
            const std::string& address = "127.0.0.1");

  /// A Unix socket of that path.
  Forwarder(const std::string& socket, const std::string& target);
  ~Forwarder();

  /// "https://127.0.0.1:40000", or "unix:/path".
  const std::string& url() const { return url_; }
  std::string urlOf(const std::string& user) const { return "https://" + user + "@" + url_.substr(8); }

  /// What came from all clients so far, decrypted.
  std::string received() const;

  /// The number of connections so far.
  std::size_t connections() const;

 private:
  void serve();
  void forward(int client);

  util::FileDescriptor listener_;
  std::string target_;
  std::string url_;
  http::TlsCredentials credentials_;  ///< null: no TLS
  mutable std::mutex mutex_;
  std::string received_;
  std::list<int> open_;
  std::list<std::thread> clients_;
  std::thread thread_;
};

/// A port at which connections are taken, and nothing is ever answered.
class SilentServer : util::NotCopied {
 public:
  explicit SilentServer(const std::string& host = "127.0.0.1");
  const std::string& address() const { return address_; }  ///< "127.0.0.1:40000"

 private:
  util::FileDescriptor listener_;
  std::string address_;
};

}  // namespace zorva::cli
