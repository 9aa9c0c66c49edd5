// zorvacimd with users: logins over HTTPS and by client certificates, and what each may do.

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>

#include <chrono>
#include <thread>

#include "access/PasswordHash.h"
#include "http/testing/TestCertificates.h"
#include "http/testing/TestWire.h"
#include "server/testing/TestDaemon.h"

namespace zorva::server {
namespace {

using agent::testing::contentsOf;
using agent::testing::TemporaryDirectory;
using http::testing::fingerprintByOpenssl;
using http::testing::IssuedFiles;
using http::testing::outputOf;
using http::testing::TestAuthority;
using http::testing::Wanted;
using ::testing::AllOf;
using ::testing::EndsWith;
using ::testing::HasSubstr;
using ::testing::Not;
using testing::TestDaemon;

class Login : public ::testing::Test {
 protected:
  Login() {
    writeUsers("alice:" + access::hashPassword("correct horse") +
               ":operate\nrob:" + access::hashPassword("battery staple") + ":read:interop=none\n");
  }

  void writeUsers(const std::string& text) const { ::chmod(directory_.write("users", text).c_str(), 0640); }

  std::string config(const std::string& access = {}) const {
    return "[tls]\ncertificate = \"" + files_.certificate + "\"\nkey = \"" + files_.key + "\"\nclient_ca = \"" +
           authority_.file() + "\"\naddresses = [\"127.0.0.1\"]\nport = 0\n[access]\nusers = \"" +
           (directory_ / "users") + "\"\n" + access;
  }

  /// The response to a request over HTTPS, and its status at the end. `options` are of curl.
  std::string ask(const TestDaemon& daemon, const std::string& whole, const std::string& operation,
                  const std::string& options) const {
    const std::string body = directory_.write("request", whole.substr(whole.find("\r\n\r\n") + 4));
    return outputOf("curl -sS -m 60 -w '%{http_code}' --cacert " + authority_.file() + " " + options +
                    " -H 'Content-Type: application/xml' -H 'CIMOperation: MethodCall' -H 'CIMMethod: " + operation +
                    "' -H 'CIMObject: root/cimv2' --data-binary @" + body +
                    " https://localhost:" + std::to_string(daemon.tlsPort()) + "/cimom");
  }

  std::string read(const TestDaemon& daemon, const std::string& options = {}) const {
    return ask(daemon, http::testing::enumeration("EnumerateInstanceNames", "ZORVA_DNSProtocolEndPoint"),
               "EnumerateInstanceNames", options);
  }

  std::string change(const TestDaemon& daemon, const std::string& options = {}) const {
    return ask(daemon, testing::changeOfDomain(), "SetProperty", options);
  }

  /// Reads until the response ends with that status, for some seconds.
  bool becomes(const TestDaemon& daemon, const std::string& options, const std::string& status) const {
    for (int i = 0; i < 100; ++i) {
      if (read(daemon, options).ends_with(status)) return true;
      std::this_thread::sleep_for(std::chrono::milliseconds(50));
    }
    return false;
  }

  const TemporaryDirectory directory_;
  const TestAuthority authority_{directory_, "ca"};
  const IssuedFiles files_ = authority_.issue("server");
};

const std::string kAlice = "-u 'alice:correct horse'";
const std::string kRob = "-u 'rob:battery staple'";
const auto kMayNot = HasSubstr("<ERROR CODE=\"2\"");
const auto kIsRead = AllOf(HasSubstr(">eth0<"), EndsWith("200"));

TEST_F(Login, PagesOfTheHostAreForUsersWhoMayReadItsSettings) {
  writeUsers("rob:" + access::hashPassword("battery staple") +
             ":read:interop=none\nisa:" + access::hashPassword("red tape") + ":none:interop=read\n");
  const TestDaemon daemon(config("anonymous = \"none\"\n"));
  for (const char* page : {"/metrics", "/watch"}) {
    const auto get = [&](const std::string& options) {
      return outputOf("curl -sS -m 2 -o /dev/null -w '%{http_code}' --cacert " + authority_.file() + " " + options +
                      " https://localhost:" + std::to_string(daemon.tlsPort()) + page + " 2>/dev/null; true");
    };
    EXPECT_EQ(get(""), "401") << page;
    EXPECT_EQ(get("-u 'isa:red tape'"), "403") << page;
    EXPECT_EQ(get(kRob), "200") << page;
  }
}

TEST_F(Login, EachUserMayDoWhatTheRoleSays) {
  const TestDaemon daemon(config());
  for (const std::string& user : {kAlice, kRob, std::string()}) EXPECT_THAT(read(daemon, user), kIsRead) << user;
  EXPECT_THAT(change(daemon), kMayNot);
  EXPECT_THAT(change(daemon, kRob), AllOf(kMayNot, HasSubstr("rob may only read in root/cimv2")));
  EXPECT_THAT(change(daemon, kAlice), AllOf(Not(HasSubstr("<ERROR")), EndsWith("200")));
  EXPECT_TRUE(daemon.logs("user=\"alice\" login=password")) << daemon.log();
}

TEST_F(Login, WrongAndUnknownAreRefusedAlikeAndTheLogHasNoPassword) {
  const TestDaemon daemon(config());
  const std::string wrong = read(daemon, "-u 'alice:open sesame'");
  EXPECT_EQ(wrong, "the user name or the password is wrong\n401");
  EXPECT_TRUE(daemon.logs("failed: wrong password of the user alice; 1 failure, ")) << daemon.log();
  EXPECT_TRUE(becomes(daemon, "-u 'sesame:open sesame'", "wrong\n401"));
  EXPECT_TRUE(daemon.logs("failed: unknown user; 2 failures, ")) << daemon.log();
  EXPECT_THAT(daemon.log(), Not(HasSubstr("sesame")));
}

TEST_F(Login, WithoutAnonymousClientsALoginIsAskedFor) {
  const TestDaemon daemon(config("anonymous = \"none\"\n"));
  EXPECT_THAT(read(daemon, "-i"), AllOf(HasSubstr("WWW-Authenticate: Basic realm=\"zorvacimd\""), EndsWith("401")));
  EXPECT_THAT(read(daemon, "--anyauth " + kAlice), kIsRead);
}

TEST_F(Login, WbemcliLogsIn) {
  const TestDaemon daemon(config("anonymous = \"none\"\n"));
  const auto wbemcli = [&](const std::string& user) {
    return outputOf("wbemcli ein -cacert " + authority_.file() + " 'https://" + user +
                    "localhost:" + std::to_string(daemon.tlsPort()) + "/root/cimv2:ZORVA_DNSProtocolEndPoint'");
  };
  writeUsers("alice:" + access::hashPassword("correct-horse") + ":read\n");
  EXPECT_THAT(wbemcli("alice:correct-horse@"), HasSubstr("Name=\"eth0\""));
  EXPECT_THAT(wbemcli("alice:wrong-horse@"), HasSubstr("Invalid username/password"));
  EXPECT_THAT(wbemcli(""), HasSubstr("Username/password required"));
}

TEST_F(Login, ACertificateStandsForItsUser) {
  const auto withCertificate = [](const IssuedFiles& files) {
    return "--cert " + files.certificate + " --key " + files.key;
  };
  Wanted wanted;
  wanted.forClient = true;
  wanted.subject = "carol";
  const IssuedFiles carol = authority_.issue("carol", wanted);
  wanted.subject = "dave";
  const IssuedFiles dave = authority_.issue("dave", wanted);
  wanted.subject = "mallory";
  const IssuedFiles mallory = authority_.issue("mallory", wanted);
  writeUsers(contentsOf(directory_ / "users") + "carol:*:operate:subject=CN=carol\ndave:*:read:fingerprint=" +
             fingerprintByOpenssl(dave.certificate) + "\n");
  const TestDaemon daemon(config());
  EXPECT_THAT(change(daemon, withCertificate(carol)), Not(HasSubstr("<ERROR")));
  EXPECT_TRUE(daemon.logs("user=\"carol\" login=certificate")) << daemon.log();
  EXPECT_THAT(read(daemon, withCertificate(dave)), kIsRead);
  EXPECT_THAT(change(daemon, withCertificate(dave)), kMayNot);
  EXPECT_EQ(read(daemon, withCertificate(mallory)), "the client certificate belongs to no user of this server\n403");
  EXPECT_THAT(read(daemon, withCertificate(mallory) + " " + kAlice), kIsRead);
}

TEST_F(Login, AChangeOfTheUsersCountsInTheRunningServer) {
  const TestDaemon daemon(config());
  EXPECT_THAT(read(daemon, kAlice), kIsRead);
  writeUsers("bob:" + access::hashPassword("correct horse") + ":read\n");
  EXPECT_THAT(read(daemon, "-u 'bob:correct horse'"), kIsRead);
  EXPECT_TRUE(becomes(daemon, kAlice, "401"));
}

TEST_F(Login, AKnownUserIsServedWhileOthersGuess) {
  const TestDaemon daemon(config("anonymous = \"none\"\n"));
  EXPECT_THAT(read(daemon, kAlice), kIsRead);
  std::vector<std::thread> guessing;
  for (int i = 0; i < 4; ++i) {
    guessing.emplace_back([&daemon, this] {
      outputOf("curl -sS -m 1 -o /dev/null --cacert " + authority_.file() +
               " -u alice:wrong -H 'Content-Type: text/xml' " +
               "-H 'CIMOperation: MethodCall' -H 'CIMMethod: X' -H 'CIMObject: x' --data-binary x 'https://localhost:" +
               std::to_string(daemon.tlsPort()) + "/cimom/[1-4]'");
    });
  }
  for (int i = 0; i < 10; ++i) EXPECT_THAT(read(daemon, kAlice), kIsRead);
  for (std::thread& each : guessing) each.join();
}

}  // namespace
}  // namespace zorva::server
