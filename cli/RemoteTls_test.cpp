// zorvactl --url https:// and unix: as a process, against real TLS with an authority of the test's own.

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>

#include "cli/testing/Forwarder.h"
#include "cli/testing/Running.h"
#include "cli/testing/TestServer.h"

namespace zorva::cli {
namespace {

/// A host whose server is reached over TLS, with a certificate for 127.0.0.1 of an authority that the host trusts only
/// by --ca.
class RemoteTls : public testing::Test {
 protected:
  explicit RemoteTls(const TestCertificate& certificate = makeCertificate({"127.0.0.1"}, &authority()))
      : certificate_(certificate), tls_(certificate_, server_.url()) {
    host_.directory().write("ca.pem", authority().certificate);
  }

  void SetUp() override { ASSERT_NE(server_.url(), "") << "the server did not start"; }

  static const TestCertificate& authority() {
    static const TestCertificate made = makeAuthority("authority of the test");
    return made;
  }

  std::string ca() const { return host_.directory() / "ca.pem"; }

  Outcome run(Words words) const {
    words.insert(words.end(), {"names", "ZORVA_DNSSettingData"});
    return host_.run(words);
  }

  void expectUntrusted(const Words& words, const std::string& told) const {
    const Outcome outcome = run(words);
    EXPECT_EQ(outcome.exitCode, 1);
    EXPECT_EQ(outcome.out, "");
    EXPECT_THAT(outcome.err, AllOf(HasSubstr("nothing was sent"), HasSubstr(told), HasSubstr(certificate_.fingerprint),
                                   HasSubstr("subject: CN"), HasSubstr("valid:"), HasSubstr("--make-certificate")));
    EXPECT_EQ(tls_.received(), "");
  }

  TestHost host_;
  TestServer server_{host_};
  TestCertificate certificate_;
  Forwarder tls_;
};

TEST_F(RemoteTls, TrustsTheGivenAuthority) {
  const Outcome outcome = run({"--url", tls_.url(), "--ca", ca()});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.err;
  EXPECT_EQ(outcome.out, host_.run({"names", "ZORVA_DNSSettingData"}).out);
}

TEST_F(RemoteTls, RefusesAnAuthorityThatTheSystemDoesNotTrust) {
  expectUntrusted({"--url", tls_.url()}, "certificate");
}

TEST_F(RemoteTls, TrustsOnlyTheGivenAuthority) {
  const std::string other = host_.directory().write("other.pem", makeAuthority("another authority").certificate);
  expectUntrusted({"--url", tls_.url(), "--ca", other}, "certificate");
}

TEST_F(RemoteTls, TrustsTheCertificateWithTheFingerprint) {
  std::string spelled = "SHA256:";
  for (std::size_t i = 0; i < 64; i += 2) spelled += certificate_.fingerprint.substr(i, 2) + (i < 62 ? ":" : "");
  for (const std::string& spelling : {certificate_.fingerprint, spelled}) {
    const Outcome outcome = run({"--url", tls_.url(), "--fingerprint", spelling});
    EXPECT_EQ(outcome.exitCode, 0) << outcome.err;
    EXPECT_THAT(outcome.out, HasSubstr("eth0"));
  }
}

TEST_F(RemoteTls, ChecksTheFingerprintOfAConnectionOnce) {
  const Outcome outcome = host_.run({"show", "--url", tls_.url(), "--fingerprint", certificate_.fingerprint});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.err;
  EXPECT_EQ(tls_.connections(), 1U);
}

TEST_F(RemoteTls, SendsNothingToACertificateWithAnotherFingerprint) {
  expectUntrusted({"--url", tls_.url(), "--fingerprint", makeCertificate({"127.0.0.1"}).fingerprint},
                  "is not the one with this fingerprint");
}

}  // namespace
}  // namespace zorva::cli
