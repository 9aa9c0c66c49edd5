// Accounts and fingerprints over IPMI, the service that the firmware names, and the program on such a host.

#include "bmc/Bootstrap.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include "bmc/Target.h"
#include "bmc/testing/TestFirmware.h"
#include "bmc/testing/TestRedfish.h"

namespace zorva::bmc {
namespace {

using namespace std::string_literals;
using agent::testing::contentsOf;
using ::testing::AllOf;
using testing::FakeIpmi;
using ::testing::HasSubstr;
using ::testing::Not;
using testing::TestRedfish;

constexpr std::uint8_t kGetFingerprint = 1;

std::string padded(std::string text) {
  text.resize(16);
  return text;
}

std::string account(const std::string& user, const std::string& password) {
  return "\0\x52"s + padded(user) + padded(password);
}

// The answer with the SHA-256 of these hexadecimal digits.
std::string fingerprint(const std::string& digits) {
  std::string answer = "\0\x52\1"s;
  for (std::size_t i = 0; i < digits.size(); i += 2)
    answer += static_cast<char>(std::stoi(digits.substr(i, 2), nullptr, 16));
  return answer;
}

std::string problemOf(const std::function<void()>& action) {
  try {
    action();
  } catch (const NotOffered& error) {
    return std::string("not offered: ") + error.what();
  } catch (const Failed& error) {
    return error.what();
  }
  return {};
}

std::string problemOfAccount(const std::string& answer) {
  FakeIpmi ipmi([&](const IpmiCommand&) { return answer; });
  return problemOf([&] { askForAccount(ipmi); });
}

TEST(Bootstrap, AnAccountIsAskedForAndBootstrappingStaysEnabled) {
  FakeIpmi ipmi([](const IpmiCommand&) { return account("boot1", "secret of sixtee"); });
  const Login login = askForAccount(ipmi);
  EXPECT_EQ(login.user, "boot1");
  EXPECT_EQ(login.password->text(), "secret of sixtee") << "a text that fills its field has no zero after it";
  ASSERT_EQ(ipmi.asked.size(), 1U);
  EXPECT_EQ(ipmi.asked[0].netFn, 0x2C);
  EXPECT_EQ(ipmi.asked[0].command, 0x02);
  EXPECT_EQ(ipmi.asked[0].data, "\x52\xA5");
}

TEST(Bootstrap, AnAnswerThatIsNoAccountIsSaidInWords) {
  const std::string whole = account("boot1", "secret");
  EXPECT_THAT(problemOfAccount(""), HasSubstr("is empty"));
  EXPECT_THAT(problemOfAccount("\0"s), HasSubstr("another group"));
  EXPECT_THAT(problemOfAccount("\0\x53"s + whole.substr(2)), HasSubstr("another group"));
  EXPECT_THAT(problemOfAccount(whole.substr(0, 33)), HasSubstr("33 bytes in place of 34"));
  EXPECT_THAT(problemOfAccount(whole + "x"), HasSubstr("35 bytes in place of 34"));
  EXPECT_THAT(problemOfAccount(account("", "secret")), HasSubstr("the user name of the account"));
  EXPECT_THAT(problemOfAccount(account("boot1", "")), HasSubstr("the password of the account"));
  EXPECT_THAT(problemOfAccount(account("boot1\0more"s, "secret")), HasSubstr("goes on after its end"));
  EXPECT_THAT(problemOfAccount(account("boot\xFF", "secret")), HasSubstr("no text in UTF-8"));
  EXPECT_THAT(problemOfAccount(account("boot\n1", "secret")), HasSubstr("no text in UTF-8"));
  for (std::size_t size = 0; size < whole.size(); ++size) EXPECT_NE(problemOfAccount(whole.substr(0, size)), "");
  EXPECT_THAT(problemOfAccount(account("boot1",
                                       "secr\xFF"
                                       "et")),
              Not(HasSubstr("secr")));
}

TEST(Bootstrap, WhyThereIsNoAccountIsSaidInWords) {
  EXPECT_THAT(problemOfAccount("\x80\x52"), HasSubstr("not offered: credential bootstrapping is disabled"));
  EXPECT_THAT(problemOfAccount("\xC1"), HasSubstr("not offered: the service processor gives no account over IPMI"));
  EXPECT_THAT(problemOfAccount("\xC3"), HasSubstr("in time"));
  EXPECT_THAT(problemOfAccount("\xFF"), AllOf(HasSubstr("completion code FFh"), Not(HasSubstr("not offered"))));
}

TEST(Bootstrap, AFingerprintIsTheSha256OfTheFirstCertificate) {
  const std::string digits = "00ff" + std::string(60, 'a');
  std::string answer = fingerprint(digits);
  FakeIpmi ipmi([&](const IpmiCommand&) { return answer; });
  EXPECT_EQ(askForFingerprint(ipmi), digits);
  EXPECT_EQ(ipmi.asked[0].command, 0x01);
  EXPECT_EQ(ipmi.asked[0].data, "\x52\x01");
  answer[2] = 2;
  EXPECT_THAT(problemOf([&] { askForFingerprint(ipmi); }), HasSubstr("not offered: "));
  answer = fingerprint(digits).substr(0, 34);
  EXPECT_THAT(problemOf([&] { askForFingerprint(ipmi); }), HasSubstr("34 bytes in place of 35"));
  answer = "\xCB\x52";
  EXPECT_THAT(problemOf([&] { askForFingerprint(ipmi); }), HasSubstr("gives no certificate fingerprint"));
}

TEST(Bootstrap, ARefusedAccountIsReplacedOnceInTenMinutes) {
  int number = 0;
  const auto ipmi = std::make_shared<FakeIpmi>(
      [&](const IpmiCommand&) { return account("boot", "secret" + std::to_string(++number)); });
  Clock::time_point now = Clock::now();
  BootstrapAccount bootstrap(ipmi, [&] { return now; });
  bootstrap.prepare();
  const Login first = bootstrap.login(nullptr);
  EXPECT_EQ(bootstrap.login(nullptr).password->text(), "secret1");
  EXPECT_EQ(ipmi->asked.size(), 1U) << "an account that works is used again";
  EXPECT_THAT(problemOf([&] { bootstrap.login(first.password.get()); }), HasSubstr("after ten minutes"));
  EXPECT_THAT(problemOf([&] { bootstrap.login(first.password.get()); }), HasSubstr("after ten minutes"));
  EXPECT_EQ(ipmi->asked.size(), 1U);
  now += std::chrono::minutes(10);
  EXPECT_EQ(bootstrap.login(first.password.get()).password->text(), "secret2");
  EXPECT_EQ(bootstrap.login(first.password.get()).password->text(), "secret2") << "the refused one was another";
}

TEST(Bootstrap, AFailureThatMayPassIsTriedAgainLater) {
  std::string answer = "\xC3";
  const auto ipmi = std::make_shared<FakeIpmi>([&](const IpmiCommand&) { return answer; });
  Clock::time_point now = Clock::now();
  BootstrapAccount bootstrap(ipmi, [&] { return now; });
  EXPECT_NO_THROW(bootstrap.prepare());
  answer = account("boot", "secret");
  EXPECT_THAT(problemOf([&] { bootstrap.login(nullptr); }), AllOf(HasSubstr("in time"), HasSubstr("ten minutes")));
  now += std::chrono::minutes(10);
  EXPECT_EQ(bootstrap.login(nullptr).user, "boot");
}

TEST(IpmiDevice, AHostWithoutOneIsToldWhatToDo) {
  const auto none = makeIpmiDevice({"/nonexistent/ipmi0", "/nonexistent/ipmi/0"});
  EXPECT_THAT(
      problemOf([&] { none->ask({}); }),
      AllOf(HasSubstr("not offered: "), HasSubstr("no IPMI device (/nonexistent/ipmi0)"), HasSubstr("ipmi_devintf")));
}

TEST(IpmiDevice, AFileThatIsNoneIsAnError) {
  const auto other = makeIpmiDevice({"/nonexistent/ipmi0", "/dev/null"});
  EXPECT_THAT(problemOf([&] { other->ask({0x2C, 2, "\x52\xA5"}); }), HasSubstr("/dev/null: takes no command: "));
}

// A host whose firmware names the tests' Redfish service.
class FirmwareTest : public ::testing::Test {
 protected:
  FirmwareTest() {
    const std::string url = redfish_.url();
    const std::string loopback = "\x7F\0\0\1"s;
    table_ = redfish_.directory().write(
        "DMI", testing::controller(testing::record(1, loopback, std::stoi(url.substr(url.rfind(':') + 1)))));
    config_.file = redfish_.bmcJson();
    fingerprint_ = fingerprint(http::testing::fingerprintByOpenssl(redfish_.certificate()));
    redfish_.tell({{"account", {"boot", "secret1"}}});
  }

  std::unique_ptr<Service> service() { return std::make_unique<Service>(config_, findTarget(config_, table_, ipmi_)); }

  std::string problem() const { return agent::readBmcState(redfish_.bmcJson()).problem; }

  TestRedfish redfish_;
  std::string table_;
  agent::BmcConfig config_;
  std::string fingerprint_;
  std::string account_ = account("boot", "secret1");
  std::shared_ptr<FakeIpmi> ipmi_ = std::make_shared<FakeIpmi>(
      [this](const IpmiCommand& command) { return command.command == kGetFingerprint ? fingerprint_ : account_; });
};

TEST_F(FirmwareTest, IsReadWithAnAccountAndACertificateFromIpmi) {
  const auto reader = service();
  ASSERT_TRUE(reader->readOnce()) << problem();
  EXPECT_NE(agent::readBmcState(redfish_.bmcJson()).tree->find("/bmc.1/eth0/ip"), nullptr);
  EXPECT_THAT(contentsOf(redfish_.bmcJson()), Not(HasSubstr("secret1")));
  ASSERT_TRUE(reader->readOnce());
  EXPECT_EQ(ipmi_->asked.size(), 2U);
}

TEST_F(FirmwareTest, AnotherCertificateIsAcceptedOnlyWhenIpmiNamesIt) {
  redfish_.tell({{"close", true}});
  const auto reader = service();
  ASSERT_TRUE(reader->readOnce()) << problem();
  redfish_.changeCertificate();
  redfish_.requests();
  EXPECT_FALSE(reader->readOnce());
  EXPECT_THAT(problem(), AllOf(HasSubstr("names over IPMI; nothing was sent"), Not(HasSubstr("[bmc] fingerprint"))));
  EXPECT_EQ(redfish_.requests(), std::vector<std::string>());
  const std::string right = fingerprint(http::testing::fingerprintByOpenssl(redfish_.certificate()));
  fingerprint_ = "\xC3";
  EXPECT_FALSE(reader->readOnce());
  EXPECT_THAT(problem(), HasSubstr("over IPMI in time"));
  fingerprint_ = right;
  EXPECT_TRUE(reader->readOnce()) << problem();
}

TEST_F(FirmwareTest, WithoutAFingerprintTheCertificateIsCheckedAsUsual) {
  fingerprint_ = "\xC1";
  EXPECT_FALSE(service()->readOnce()) << "the system's authorities do not know it";
  EXPECT_THAT(problem(), HasSubstr("is not trusted, and nothing was sent"));
  fingerprint_ = "\xC3";
  EXPECT_FALSE(service()->readOnce());
  EXPECT_THAT(problem(), HasSubstr("nothing was sent"));
  config_.caFile = redfish_.authority();
  ipmi_->asked.clear();
  EXPECT_TRUE(service()->readOnce()) << problem();
  EXPECT_EQ(ipmi_->asked.size(), 1U) << "the account alone";
}

TEST_F(FirmwareTest, AnAccountThatIsGoneIsReplacedInTheSameReading) {
  Clock::time_point now = Clock::now();
  const auto bootstrap = std::make_shared<BootstrapAccount>(ipmi_, [&] { return now; });
  Service reader(config_, Target{redfish_.url(), {redfish_.authority(), ""}, [&](const util::Secret* refused) {
                                   return bootstrap->login(refused);
                                 }});
  ASSERT_TRUE(reader.readOnce()) << problem();
  account_ = account("boot", "secret2");
  redfish_.tell({{"account", {"boot", "secret2"}}});
  EXPECT_FALSE(reader.readOnce());
  EXPECT_THAT(problem(), HasSubstr("it is asked again after ten minutes"));
  now += std::chrono::minutes(10);
  EXPECT_TRUE(reader.readOnce()) << problem();
  now += std::chrono::minutes(10);
  account_ = account("boot", "secret3");
  redfish_.tell({{"account", {"boot", "secret3"}}});
  EXPECT_TRUE(reader.readOnce()) << problem();
}

TEST_F(FirmwareTest, AConfiguredLoginIsUsedInPlaceOfAnAccount) {
  const agent::BmcConfig configured = redfish_.config();
  config_.user = configured.user;
  config_.passwordFile = configured.passwordFile;
  redfish_.tell({{"account", {configured.user, testing::kPassword}}});
  EXPECT_TRUE(service()->readOnce()) << problem();
  EXPECT_EQ(ipmi_->asked.size(), 1U) << "the fingerprint alone";
}

TEST_F(FirmwareTest, WithoutAnyLoginThereIsNoTarget) {
  account_ = "\x80";
  EXPECT_THAT(problemOf([&] { service(); }),
              AllOf(HasSubstr("not offered: the firmware names a Redfish service, https://127.0.0.1:"),
                    HasSubstr("bootstrapping is disabled"), HasSubstr("[bmc] user and password_file")));
  EXPECT_THAT(problemOf([&] { findTarget(config_, table_, makeIpmiDevice({"/nonexistent/ipmi0"})); }),
              AllOf(HasSubstr("not offered: "), HasSubstr("no IPMI device"), HasSubstr("[bmc] user")));
  EXPECT_THAT(problemOf([&] { findTarget(config_, "/nonexistent/DMI", ipmi_); }), HasSubstr("the firmware names none"));
}

// In a mount namespace of its own, with that table as the firmware's and without devices for IPMI. The program's status
// and its standard error; -1 if the kernel does not permit it.
std::pair<int, std::string> onSuchAHost(const std::string& table, const std::string& words) {
  const std::string text = http::testing::outputOf(
      "unshare -m sh -c 'mount -t tmpfs none /sys/firmware && mkdir -p /sys/firmware/dmi/tables && cp " + table +
      " /sys/firmware/dmi/tables/DMI || exit; " ZORVA_BIN_DIR "/zorva-bmc " + words + " 2>&1; echo status $?'");
  const std::size_t place = text.rfind("status ");
  if (place == std::string::npos) return {-1, text};
  return {std::stoi(text.substr(place + 7)), text.substr(0, place)};
}

TEST_F(FirmwareTest, TheProgramEndsAsDoneIfItCannotHaveALogin) {
  if (::access("/dev/ipmi0", F_OK) == 0) GTEST_SKIP() << "this host has an IPMI device, which may offer a login";
  const std::string config = redfish_.directory().write("agent.toml", "[bmc]\nfile = \"run/bmc.json\"\n");
  const auto [status, text] = onSuchAHost(table_, "--config " + config);
  if (status < 0) GTEST_SKIP() << "this host permits no mounts: " << text;
  EXPECT_EQ(status, 0) << "the service is not started again";
  EXPECT_THAT(text, AllOf(HasSubstr("zorva-bmc: the firmware names a Redfish service, " + redfish_.url()),
                          HasSubstr("no IPMI device (/dev/ipmi0)")));
  EXPECT_EQ(onSuchAHost(table_, "--once --config " + config).first, 1);
}

}  // namespace
}  // namespace zorva::bmc
