// HTTPS with the tests' own authorities, by curl and openssl.

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>

#include <atomic>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

#include "http/TlsIdentity.h"
#include "http/testing/TestCertificates.h"
#include "http/testing/TestServer.h"
#include "http/testing/TestWire.h"

namespace zorva::http {
namespace {

using ::testing::AllOf;
using ::testing::HasSubstr;
using testing::IssuedFiles;
using testing::outputOf;
using testing::Server;
using testing::TestAuthority;
using testing::Wanted;

/// Lets everybody in, and keeps where the last client came from.
class KeepingGate final : public access::Gate {
 public:
  access::Decision decide(const access::Origin& origin, const std::string*) override {
    const std::lock_guard lock(mutex_);
    last_ = origin;
    return {access::Decision::Kind::Admitted, client_};
  }
  access::Decision verify(const access::Origin&, const std::string&) override { return {}; }

  access::Origin last() const {
    const std::lock_guard lock(mutex_);
    return last_;
  }

 private:
  mutable std::mutex mutex_;
  access::Origin last_;
  const access::ClientPtr client_ = std::make_shared<const access::Client>();
};

class Https : public ::testing::Test {
 protected:
  /// What curl gets for a CIM request: the status and the text.
  std::string ask(const Server& server, const std::string& options = {}) const {
    return outputOf("curl -sS -w ' %{http_code} %{ssl_verify_result}' --cacert " + authority_.file() +
                    " -H 'Content-Type: application/xml' --data-binary text " + options +
                    " https://localhost:" + std::to_string(server.tlsPort()) + "/cimom");
  }

  std::string askAs(const Server& server, const IssuedFiles& client) const {
    return ask(server, "--cert " + client.certificate + " --key " + client.key);
  }

  std::unique_ptr<Server> serve(const std::string& clientCa = {}) {
    return std::make_unique<Server>(
        [](const HttpRequest& request, ResponseSink& sink) {
          sink.begin(200, {{"Content-Type", "application/xml"}});
          sink.write(request.body);
        },
        HttpLimits(), Pages{{"/", textPage("This is a server.\n")}}, gate_,
        TlsIdentity::load({server_.certificate, server_.key, clientCa}));
  }

  const agent::testing::TemporaryDirectory directory_;
  const TestAuthority authority_{directory_, "ca"};
  const TestAuthority foreign_{directory_, "foreign"};
  const IssuedFiles server_ = authority_.issue("server");
  const std::shared_ptr<KeepingGate> gate_ = std::make_shared<KeepingGate>();
};

TEST_F(Https, AnswersByTls12AndTls13) {
  const auto server = serve();
  EXPECT_EQ(ask(*server, "--tlsv1.2 --tls-max 1.2"), "text 200 0");
  EXPECT_EQ(ask(*server, "--tlsv1.3"), "text 200 0");
  EXPECT_TRUE(gate_->last().isEncrypted);
  EXPECT_EQ(gate_->last().way, access::Origin::Way::Loopback);
  EXPECT_EQ(gate_->last().address, "127.0.0.1");
  EXPECT_FALSE(gate_->last().certificate.has_value());
}

TEST_F(Https, RefusesOlderProtocolsAndWeakCiphers) {
  const auto server = serve();
  // Security level 0 makes openssl offer what it would not use by itself.
  const auto offer = [&](const std::string& options) {
    return outputOf("openssl s_client -connect localhost:" + std::to_string(server->tlsPort()) + " " + options +
                    " </dev/null");
  };
  EXPECT_THAT(offer("-tls1_2 -cipher ECDHE+AESGCM"), HasSubstr("Cipher is ECDHE-ECDSA-AES"));
  for (const char* options :
       {"-tls1_1 -cipher ALL:@SECLEVEL=0", "-tls1 -cipher ALL:@SECLEVEL=0", "-tls1_2 -cipher AES128-SHA:@SECLEVEL=0",
        "-tls1_2 -cipher ECDHE-ECDSA-AES128-SHA:@SECLEVEL=0"}) {
    EXPECT_THAT(offer(options), AllOf(HasSubstr("CONNECTED"), HasSubstr("Cipher is (NONE)"))) << options;
  }
}

TEST_F(Https, AConnectionStaysForTheNextRequest) {
  const auto server = serve();
  const std::string url = "https://localhost:" + std::to_string(server->tlsPort()) + "/";
  EXPECT_EQ(outputOf("curl -sS -o /dev/null -o /dev/null -w '%{http_code} %{num_connects}\\n' --cacert " +
                     authority_.file() + " " + url + " " + url),
            "200 1\n200 0\n");
}

TEST_F(Https, SendsLongResponsesWhole) {
  const std::string text(3'000'000, 'x');
  Server server(
      [&](const HttpRequest&, ResponseSink& sink) {
        sink.begin(200, {{"Content-Type", "application/xml"}});
        sink.write(text);
      },
      {}, {}, gate_, TlsIdentity::load({server_.certificate, server_.key, {}}));
  EXPECT_EQ(ask(server), text + " 200 0");
}

TEST_F(Https, ANameOfTheCertificateIsAnOwnName) {
  Wanted wanted;
  wanted.names = {"localhost", "cim.example.org"};
  const IssuedFiles named = authority_.issue("named", wanted);
  const auto server = serve();
  EXPECT_THAT(ask(*server, "-H 'Host: cim.example.org:5989'"), HasSubstr(" 403 "));
  server->http().setTls(TlsIdentity::load({named.certificate, named.key, {}}));
  EXPECT_EQ(ask(*server, "-H 'Host: cim.example.org:5989'"), "text 200 0");
  EXPECT_THAT(ask(*server, "-H 'Host: other.example.org'"), HasSubstr(" 403 "));
}

// ---- Certificates of clients ----

TEST_F(Https, AGoodClientCertificateIsKnownByItsSubjectAndFingerprint) {
  const auto server = serve(authority_.file());
  const IssuedFiles client = authority_.issue("client", {"alice", {}, true});
  EXPECT_EQ(askAs(*server, client), "text 200 0");
  const access::Origin origin = gate_->last();
  ASSERT_TRUE(origin.certificate.has_value());
  EXPECT_EQ(origin.certificate->subject, "CN=alice");
  EXPECT_EQ(origin.certificate->fingerprint, testing::fingerprintByOpenssl(client.certificate));
  EXPECT_EQ(origin.certificate->fingerprint.size(), 64U);
}

TEST_F(Https, AClientWithoutACertificateGoesOnToTheGate) {
  const auto server = serve(authority_.file());
  EXPECT_EQ(ask(*server), "text 200 0");
  EXPECT_FALSE(gate_->last().certificate.has_value());
}

TEST_F(Https, AClientCertificateThatDoesNotVerifyIsRefusedWithTheReason) {
  const auto server = serve(authority_.file());
  Wanted expired{"old", {}, true};
  expired.from = -864000;
  expired.until = -3600;
  Wanted later{"later", {}, true};
  later.from = 3600;
  const struct {
    IssuedFiles files;
    const char* why;
  } kCases[] = {{authority_.issue("expired", expired), "expired"},
                {authority_.issue("later", later), "not yet valid"},
                {foreign_.issue("stranger", {"alice", {}, true}), "issuer is unknown"},
                {authority_.issue("purpose", {"alice", {}, false}), "purpose"}};
  for (const auto& each : kCases) {
    for (const char* version : {"--tlsv1.3", "--tls-max 1.2"}) {
      const std::string said =
          ask(*server, std::string(version) + " --cert " + each.files.certificate + " --key " + each.files.key);
      EXPECT_THAT(said,
                  AllOf(HasSubstr("the client certificate is refused: "), HasSubstr(each.why), HasSubstr(" 403 ")));
    }
  }
}

TEST_F(Https, NoCertificateIsAskedForWithoutAnAuthority) {
  const auto server = serve();
  EXPECT_EQ(askAs(*server, foreign_.issue("stranger", {"alice", {}, true})), "text 200 0");
  EXPECT_FALSE(gate_->last().certificate.has_value());
}

TEST_F(Https, NewAuthoritiesCountForNewConnections) {
  const auto server = serve(authority_.file());
  const IssuedFiles stranger = foreign_.issue("stranger", {"alice", {}, true});
  EXPECT_THAT(askAs(*server, stranger), HasSubstr(" 403 "));
  server->http().setTls(TlsIdentity::load({server_.certificate, server_.key, foreign_.file()}));
  EXPECT_EQ(askAs(*server, stranger), "text 200 0");
}

TEST_F(Https, ConnectionsOutliveTheIdentityThatTheyBeganWith) {
  const auto server = serve(authority_.file());
  const IssuedFiles client = authority_.issue("client", {"alice", {}, true});
  std::atomic<int> running = 2;
  std::string codes[2];
  std::vector<std::thread> clients;
  for (int i = 0; i < 2; ++i) {
    clients.emplace_back([&, i] {
      codes[i] = outputOf("curl -sS -o /dev/null -w '%{http_code} ' --cacert " + authority_.file() + " --cert " +
                          client.certificate + " --key " + client.key + (i == 0 ? "" : " -H Connection:close") +
                          " 'https://localhost:" + std::to_string(server->tlsPort()) + "/{,,,,,,,,,,,,,,,,,,,}'");
      --running;
    });
  }
  while (running > 0) {
    server->http().setTls(TlsIdentity::load({server_.certificate, server_.key, authority_.file()}));
  }
  for (std::thread& each : clients) each.join();
  std::string all;
  for (int i = 0; i < 20; ++i) all += "200 ";
  for (const std::string& each : codes) EXPECT_EQ(each, all);
}

// ---- Files ----

/// Why the files are refused.
std::string problemOf(const TlsFiles& files) {
  try {
    TlsIdentity::load(files);
  } catch (const std::runtime_error& error) {
    return error.what();
  }
  return "nothing";
}

TEST_F(Https, FilesThatDoNotFitAreRefused) {
  const IssuedFiles other = authority_.issue("other");
  const std::string text = directory_.write("text", "no PEM");
  ::chmod(text.c_str(), 0600);
  EXPECT_EQ(problemOf({server_.certificate, server_.key, authority_.file()}), "nothing");
  EXPECT_EQ(problemOf({server_.certificate, other.key, {}}),
            other.key + ": is not the key of the certificate " + server_.certificate);
  EXPECT_THAT(problemOf({text, server_.key, {}}), HasSubstr("text: has no certificate in PEM"));
  EXPECT_THAT(problemOf({server_.certificate, text, {}}), HasSubstr("text: has no private key in PEM"));
  EXPECT_THAT(problemOf({server_.certificate, server_.key, text}), HasSubstr("text: has no certificate"));
  EXPECT_THAT(problemOf({directory_ / "none", server_.key, {}}), HasSubstr("none: cannot be read: "));
}

TEST_F(Https, AKeyThatAllUsersMayReadIsRefused) {
  ::chmod(server_.key.c_str(), 0644);
  EXPECT_THAT(problemOf({server_.certificate, server_.key, {}}),
              HasSubstr("all users may read this private key (mode 0644)"));
  ::chmod(server_.key.c_str(), 0640);
  EXPECT_EQ(problemOf({server_.certificate, server_.key, {}}), "nothing");
}

}  // namespace
}  // namespace zorva::http
