// zorvacimd with HTTPS: certificates that change while it serves, and --make-certificate.

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <signal.h>
#include <sys/stat.h>

#include <algorithm>
#include <chrono>
#include <filesystem>
#include <memory>
#include <thread>
#include <vector>

#include "http/testing/TestCertificates.h"
#include "http/testing/TestWire.h"
#include "server/CertificateInUse.h"
#include "server/SelfSigned.h"
#include "server/testing/TestDaemon.h"
#include "util/HostName.h"

namespace zorva::server {
namespace {

using agent::testing::contentsOf;
using agent::testing::TemporaryDirectory;
using http::testing::fingerprintByOpenssl;
using http::testing::IssuedFiles;
using http::testing::outputOf;
using http::testing::TestAuthority;
using http::testing::Wanted;
using http::testing::Wire;
using std::chrono::milliseconds;
using std::chrono::seconds;
using ::testing::AllOf;
using testing::DaemonOutcome;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;
using testing::TestDaemon;

const std::string kTlsTail = "addresses = [\"127.0.0.1\"]\nport = 0\n";

class Https : public ::testing::Test {
 protected:
  std::string config(const IssuedFiles& files) const {
    return "[tls]\ncertificate = \"" + files.certificate + "\"\nkey = \"" + files.key + "\"\n" + kTlsTail;
  }

  /// The file is one that a later start or reload reads.
  void copy(const IssuedFiles& from, const IssuedFiles& to) const {
    std::filesystem::copy_file(from.certificate, to.certificate, std::filesystem::copy_options::overwrite_existing);
    std::filesystem::copy_file(from.key, to.key, std::filesystem::copy_options::overwrite_existing);
  }

  std::string curl(const TestDaemon& daemon, const std::string& rest) const {
    return outputOf("curl -sS --cacert " + authority_.file() + " " + rest +
                    " https://localhost:" + std::to_string(daemon.tlsPort()));
  }

  /// The fingerprint of the certificate that a new connection gets.
  std::string served(const TestDaemon& daemon) const {
    const std::string file = directory_ / "served.crt";
    outputOf("openssl s_client -connect 127.0.0.1:" + std::to_string(daemon.tlsPort()) +
             " </dev/null 2>/dev/null | openssl x509 -out " + file);
    return fingerprintByOpenssl(file);
  }

  const TemporaryDirectory directory_;
  const TestAuthority authority_{directory_, "ca"};
  const IssuedFiles files_ = authority_.issue("server");
};

TEST_F(Https, AnswersCurlAndWbemcli) {
  const TestDaemon daemon(config(files_));
  ASSERT_NE(daemon.tlsPort(), 0);
  EXPECT_THAT(curl(daemon, ""), AllOf(HasSubstr("This is zorvacimd "),
                                      HasSubstr("https://USER@localhost:" + std::to_string(daemon.tlsPort()))));
  const std::string path = "localhost:" + std::to_string(daemon.tlsPort()) + "/root/cimv2:ZORVA_DNSProtocolEndPoint";
  const std::string names = outputOf("wbemcli ein -cacert " + authority_.file() + " https://" + path);
  EXPECT_THAT(names, HasSubstr("Name=\"eth0\""));
  EXPECT_EQ(outputOf("wbemcli ein -noverify https://" + path), names);
}

TEST_F(Https, TakesANewCertificateAndKeepsItWhereTheNextIsBroken) {
  const IssuedFiles first = authority_.issue("first");
  const IssuedFiles second = authority_.issue("second");
  copy(first, files_);
  const TestDaemon daemon(config(files_));
  EXPECT_EQ(served(daemon), fingerprintByOpenssl(first.certificate));

  copy(second, files_);
  daemon.signal(SIGHUP);
  ASSERT_TRUE(
      daemon.logs("the certificate was read again: SHA-256 fingerprint " + fingerprintByOpenssl(second.certificate)))
      << daemon.log();
  EXPECT_EQ(served(daemon), fingerprintByOpenssl(second.certificate));

  copy({first.certificate, second.key}, files_);
  daemon.signal(SIGHUP);
  ASSERT_TRUE(daemon.logs("the certificate stays as it was: " + files_.key + ": is not the key of the certificate"));
  EXPECT_EQ(served(daemon), fingerprintByOpenssl(second.certificate));
}

/// How many of that many requests are answered with 200, on one connection or on one each.
int answered(const std::string& authority, int port, const std::string& request, int count, bool keepsConnection) {
  const std::string codes = outputOf(
      "curl -sS -o /dev/null -w '%{http_code}\\n' --cacert " + authority +
      (keepsConnection ? "" : " -H Connection:close") +
      " -H 'Content-Type: application/xml' -H 'CIMOperation: MethodCall' -H 'CIMMethod: EnumerateInstanceNames'" +
      " -H 'CIMObject: root/cimv2' --data-binary @" + request + " 'https://localhost:" + std::to_string(port) +
      "/cimom/[1-" + std::to_string(count) + "]'");
  int good = 0;
  for (std::size_t at = codes.find("200\n"); at != std::string::npos; at = codes.find("200\n", at + 1)) ++good;
  if (good != count) ADD_FAILURE() << codes;
  return good;
}

/// How often the server has read its certificate again.
int reloads(const TestDaemon& daemon) {
  const std::string text = "the certificate was read again";
  const std::string log = daemon.log();
  int count = 0;
  for (std::size_t at = log.find(text); at != std::string::npos; at = log.find(text, at + 1)) ++count;
  return count;
}

TEST_F(Https, NoRequestIsLostWhileCertificatesChange) {
  constexpr int kRequests = 150;
  constexpr int kReloads = 20;
  const IssuedFiles kinds[] = {authority_.issue("first"), authority_.issue("second")};
  const TestDaemon daemon(config(files_));
  const std::string whole = http::testing::enumeration("EnumerateInstanceNames", "ZORVA_DNSProtocolEndPoint");
  const std::string request = directory_.write("request", whole.substr(whole.find("\r\n\r\n") + 4));
  std::vector<std::thread> clients;
  for (const bool keeps : {true, false, true, false}) {
    clients.emplace_back(
        [&, keeps] { EXPECT_EQ(answered(authority_.file(), daemon.tlsPort(), request, kRequests, keeps), kRequests); });
  }
  for (int i = 0; i < kReloads; ++i) {
    copy(kinds[i % 2], files_);
    daemon.signal(SIGHUP);
    // The next files must not come while these are read.
    for (int k = 0; k < 2000 && reloads(daemon) <= i; ++k) std::this_thread::sleep_for(milliseconds(5));
    EXPECT_EQ(reloads(daemon), i + 1);
  }
  for (std::thread& each : clients) each.join();
  EXPECT_THAT(daemon.log(), Not(HasSubstr("the certificate stays as it was")));
}

TEST_F(Https, HundredsOfHalfHandshakesDoNotKeepAClientFromItsAnswer) {
  const TestDaemon daemon(config(files_));
  const std::string hello = std::string("\x16\x03\x01\x02\x00\x01\x00\x01\xfc\x03\x03", 11) + std::string(32, 'r');
  std::vector<std::unique_ptr<Wire>> half;
  for (int i = 0; i < 200; ++i) {
    half.push_back(std::make_unique<Wire>(daemon.tlsPort()));
    if (i % 4 != 0) half.back()->send(hello.substr(0, static_cast<std::size_t>(i) % hello.size()));
  }
  for (int i = 0; i < 20; ++i) {
    EXPECT_THAT(curl(daemon, "-m 20"), HasSubstr("This is zorvacimd "));
    for (const auto& each : half) each->send(std::string(1, '\0'));
  }
  EXPECT_TRUE(curl(daemon, "-m 20").starts_with("This is zorvacimd "));
}

/// The processor time that a process has used, in clock ticks.
long ticksOf(pid_t process) {
  const std::string text = contentsOf("/proc/" + std::to_string(process) + "/stat");
  long user = 0;
  long kernel = 0;
  std::sscanf(text.c_str() + text.rfind(')'), ") %*c %*d %*d %*d %*d %*d %*u %*u %*u %*u %*u %ld %ld", &user, &kernel);
  return user + kernel;
}

TEST_F(Https, HalfHandshakesCostNoProcessorTimeWhileTheyWait) {
  const TestDaemon daemon(config(files_));
  std::vector<std::unique_ptr<Wire>> half;
  for (int i = 0; i < 50; ++i) {
    half.push_back(std::make_unique<Wire>(daemon.tlsPort()));
    half.back()->send(std::string("\x16\x03\x01\x02\x00\x01\x00\x01\xfc\x03\x03", 11));
  }
  const long before = ticksOf(daemon.process());
  std::this_thread::sleep_for(milliseconds(500));
  // A thread that spins uses 50 ticks in this time.
  EXPECT_LT(ticksOf(daemon.process()) - before, 15);
}

// ---- The configuration ----

DaemonOutcome checkConfig(const TemporaryDirectory& directory, const std::string& text) {
  return TestDaemon::run(
      {"--config", directory.write("zorvacimd.toml", text), "--provider-dir", ZORVA_LIB_DIR, "--check-config"});
}

TEST_F(Https, CheckingAConfigurationReadsTheCertificate) {
  EXPECT_EQ(checkConfig(directory_, config(files_)).exitCode, 0);
  const IssuedFiles other = authority_.issue("other");
  const auto mixed = checkConfig(directory_, config({files_.certificate, other.key}));
  EXPECT_EQ(mixed.exitCode, 1);
  EXPECT_THAT(mixed.err, HasSubstr("other.key: is not the key of the certificate"));
  ::chmod(files_.key.c_str(), 0644);
  const auto open = checkConfig(directory_, config(files_));
  EXPECT_EQ(open.exitCode, 1);
  EXPECT_THAT(open.err, HasSubstr("server.key: all users may read this private key (mode 0644)"));
}

TEST_F(Https, CheckingAConfigurationWarnsOfACertificateThatExpiresSoon) {
  Wanted soon;
  soon.until = 3 * 24 * 3600 + 60;
  const auto outcome = checkConfig(directory_, config(authority_.issue("soon", soon)));
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_THAT(outcome.err, AllOf(HasSubstr("warning: the certificate expires on "), HasSubstr("days left: 3")));
  Wanted over;
  over.from = -200'000;
  over.until = -100'000;
  EXPECT_THAT(checkConfig(directory_, config(authority_.issue("over", over))).err,
              HasSubstr("warning: the certificate has expired on "));
}

TEST_F(Https, TheLogSaysThatACertificateExpiresSoon) {
  const IssuedFiles soon = authority_.issue("soon");  // ten days
  const TestDaemon daemon(config(soon));
  EXPECT_TRUE(daemon.logs("the certificate expires on ")) << daemon.log();
}

TEST(CertificateDates, AreWarnedOfInTheLastThirtyDays) {
  constexpr std::time_t kDay = 24 * 3600;
  const TemporaryDirectory directory;
  const SelfSigned made = makeSelfSigned({"localhost"}, std::time(nullptr));
  writeNewFiles({{directory / "crt", made.certificate, 0644, {}}, {directory / "key", made.key, 0600, {}}});
  const auto identity = http::TlsIdentity::load({directory / "crt", directory / "key", {}});
  const std::time_t end = identity->validUntil();
  EXPECT_EQ(expiryWarning(*identity, end - 31 * kDay), std::nullopt);
  EXPECT_THAT(expiryWarning(*identity, end - 30 * kDay + 60).value_or(""), HasSubstr("days left: 29"));
  EXPECT_THAT(expiryWarning(*identity, end + 1).value_or(""), HasSubstr("has expired on "));
  EXPECT_THAT(expiryWarning(*identity, identity->validFrom() - 1).value_or(""), HasSubstr("is not valid before "));
}

TEST_F(Https, AnAddressThatOthersReachNeedsLogins) {
  const std::string reachable =
      "[tls]\ncertificate = \"" + files_.certificate + "\"\nkey = \"" + files_.key +
      "\"\naddresses = [\"127.0.0.1\", \"0.0.0.0\"]\nport = 0\n[listen]\nport = 0\nsocket = \"\"\n";
  const auto start =
      TestDaemon::run({"--config", directory_.write("zorvacimd.toml", reachable), "--provider-dir", ZORVA_LIB_DIR});
  EXPECT_EQ(start.exitCode, 2);
  EXPECT_THAT(start.err,
              AllOf(HasSubstr("tls.addresses: '0.0.0.0' can be reached from other hosts, and nobody can log in"),
                    HasSubstr("tls.client_ca is not set")));
  EXPECT_THAT(checkConfig(directory_, reachable).err, HasSubstr("nobody can log in"));
  EXPECT_EQ(
      checkConfig(directory_, "[tls]\nclient_ca = \"" + authority_.file() + "\"\n" + reachable.substr(6)).exitCode, 0);
}

// ---- --make-certificate ----

class MakeCertificate : public ::testing::Test {
 protected:
  DaemonOutcome make() const {
    return TestDaemon::run(
        {"--config",
         directory_.write("zorvacimd.toml",
                          "[listen]\nnames = [\"cim.example.org\"]\n[tls]\ncertificate = \"tls/server.crt\"\n"
                          "key = \"tls/server.key\"\n"),
         "--make-certificate"});
  }

  const TemporaryDirectory directory_;
  const std::string certificate_ = directory_ / "tls/server.crt";
  const std::string key_ = directory_ / "tls/server.key";
};

TEST_F(MakeCertificate, WritesBothFilesAndPrintsTheFingerprint) {
  const DaemonOutcome outcome = make();
  ASSERT_EQ(outcome.exitCode, 0) << outcome.err;
  EXPECT_THAT(outcome.out, HasSubstr("SHA-256 fingerprint: " + fingerprintByOpenssl(certificate_) + "\n"));
  struct stat key {};
  ASSERT_EQ(::stat(key_.c_str(), &key), 0);
  EXPECT_EQ(key.st_mode & 07777U, 0640U);
  const std::string text = outputOf("openssl x509 -noout -text -in " + certificate_);
  for (const std::string& part :
       {std::string("prime256v1"), std::string("DNS:localhost"), std::string("DNS:cim.example.org"),
        std::string("IP Address:127.0.0.1"), "DNS:" + util::kernelHostName(),
        std::string("TLS Web Server Authentication"), std::string("CA:FALSE")}) {
    EXPECT_THAT(text, HasSubstr(part));
  }
}

TEST_F(MakeCertificate, ReplacesNothing) {
  ASSERT_EQ(make().exitCode, 0);
  const std::string before = contentsOf(certificate_) + contentsOf(key_);
  const DaemonOutcome again = make();
  EXPECT_EQ(again.exitCode, 1);
  EXPECT_THAT(again.err, HasSubstr("server.key: is there already"));
  EXPECT_EQ(contentsOf(certificate_) + contentsOf(key_), before);
}

TEST_F(MakeCertificate, WritesBothFilesOrNone) {
  directory_.write("tls/server.crt", "mine");
  const DaemonOutcome outcome = make();
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_THAT(outcome.err, HasSubstr("server.crt: is there already"));
  EXPECT_EQ(contentsOf(certificate_), "mine");
  EXPECT_EQ(
      std::distance(std::filesystem::directory_iterator(directory_ / "tls"), std::filesystem::directory_iterator()), 1);
}

TEST_F(MakeCertificate, IsOneThatClientsTrust) {
  ASSERT_EQ(make().exitCode, 0);
  const TestDaemon daemon("[tls]\ncertificate = \"" + certificate_ + "\"\nkey = \"" + key_ + "\"\n" + kTlsTail);
  EXPECT_THAT(outputOf("curl -sS --cacert " + certificate_ + " https://localhost:" + std::to_string(daemon.tlsPort())),
              HasSubstr("This is zorvacimd "));
}

}  // namespace
}  // namespace zorva::server
