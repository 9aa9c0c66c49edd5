#include "access/LoginGate.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include "agent/testing/TemporaryDirectory.h"

namespace zorva::access {
namespace {

using Kind = Decision::Kind;
using std::chrono::milliseconds;
using std::chrono::minutes;
using std::chrono::seconds;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;

const std::string kAlice = "Basic YWxpY2U6cGFzc3dvcmQ=";   // alice:password
const std::string kWrong = "Basic YWxpY2U6d3Jvbmc=";       // alice:wrong
const std::string kNobody = "Basic c2VjcmV0OnBhc3N3b3Jk";  // secret:password
constexpr uid_t kMember = 4001;
constexpr uid_t kOther = 4002;

/// Every user's password is "password"; counts how often it is asked.
class CountingVerifier : public PasswordVerifier {
 public:
  bool verify(const std::string&, const User* user, const std::string& password) override {
    ++count;
    return user != nullptr && password == "password";
  }
  int count = 0;
};

class LoginGateTest : public ::testing::Test {
 protected:
  LoginGateTest() {
    options_.usersFile = directory_ / "users";
    writeUsers("alice:*:operate\n");
    services_.log = [this](const std::string& line) { lines_.push_back(line); };
    services_.now = [this] { return now_; };
    services_.passwords = verifier_;
    services_.lookUp = [this](uid_t user, const std::string& group) {
      ++lookUps_;
      return LocalUser{"user" + std::to_string(user), user == kMember && group == "zorva"};
    };
    network_.way = Origin::Way::Network;
    network_.isEncrypted = true;
    network_.address = "192.0.2.7";
  }

  /// Closed to other users, as zorvactl makes it.
  void writeUsers(const std::string& text) const { ::chmod(directory_.write("users", text).c_str(), 0640); }

  LoginGate& gate() {
    if (!gate_) gate_ = std::make_unique<LoginGate>(options_, services_);
    return *gate_;
  }

  /// As the HTTP side asks.
  Decision ask(const Origin& origin, const std::string& login = {}) {
    Decision decision = gate().decide(origin, login.empty() ? nullptr : &login);
    return decision.kind == Kind::MustVerify ? gate().verify(origin, login) : decision;
  }

  static Origin local(uid_t user) {
    Origin origin;
    origin.way = Origin::Way::UnixSocket;
    origin.localUser = user;
    return origin;
  }

  zorva::agent::testing::TemporaryDirectory directory_;
  std::shared_ptr<CountingVerifier> verifier_ = std::make_shared<CountingVerifier>();
  LoginOptions options_;
  LoginServices services_;
  Clock::time_point now_ = Clock::now();
  std::vector<std::string> lines_;
  int lookUps_ = 0;
  Origin network_;
  std::unique_ptr<LoginGate> gate_;
};

Role roleIn(const Decision& decision) {
  return decision.client == nullptr ? Role::None : decision.client->grants.in("root/cimv2");
}

TEST_F(LoginGateTest, OnLoopbackAClientMayReadWithoutALogin) {
  EXPECT_EQ(roleIn(ask({})), Role::Read);
  EXPECT_EQ(ask({}).client->user, "");
  Origin encrypted;
  encrypted.isEncrypted = true;
  EXPECT_EQ(roleIn(ask(encrypted)), Role::Read);
}

TEST_F(LoginGateTest, OnLoopbackTheRoleWithoutALoginIsConfigured) {
  options_.anonymous = Role::Operate;
  EXPECT_EQ(roleIn(ask({})), Role::Operate);
  options_.anonymous = Role::None;
  gate().setOptions(options_);
  EXPECT_EQ(ask({}).kind, Kind::NeedsLogin);
}

TEST_F(LoginGateTest, FromTheNetworkALoginIsNeeded) {
  options_.anonymous = Role::Operate;
  EXPECT_EQ(ask(network_).kind, Kind::NeedsLogin);
  const Decision decision = ask(network_, kAlice);
  EXPECT_EQ(decision.kind, Kind::Admitted);
  EXPECT_EQ(roleIn(decision), Role::Operate);
  EXPECT_EQ(decision.client->user, "alice");
  EXPECT_EQ(decision.client->proof, Proof::Password);
}

TEST_F(LoginGateTest, APasswordIsNotLookedAtWithoutEncryption) {
  const Decision decision = ask({}, kAlice);
  EXPECT_EQ(decision.kind, Kind::NeedsLogin);
  EXPECT_EQ(decision.why, "a login needs https");
  network_.isEncrypted = false;
  EXPECT_EQ(ask(network_, kAlice).kind, Kind::NeedsLogin);
  EXPECT_EQ(gate().verify(network_, kAlice).kind, Kind::NeedsLogin);
  EXPECT_EQ(verifier_->count, 0);
}

TEST_F(LoginGateTest, WrongAndUnknownLookTheSameToTheClient) {
  const Decision wrong = ask(network_, kWrong);
  network_.address = "192.0.2.8";
  const Decision unknown = ask(network_, kNobody);
  EXPECT_EQ(wrong.kind, Kind::NeedsLogin);
  EXPECT_EQ(unknown.kind, Kind::NeedsLogin);
  EXPECT_EQ(wrong.why, unknown.why);
  EXPECT_EQ(wrong.delay, unknown.delay);
  EXPECT_EQ(verifier_->count, 2);
}

TEST_F(LoginGateTest, AFailureLeavesALineWithoutAnythingSecret) {
  ask(network_, kWrong);
  network_.address = "192.0.2.8";
  ask(network_, kNobody);
  EXPECT_THAT(lines_, ElementsAre("a login from 192.0.2.7 failed: wrong password of the user alice; 1 failure, the "
                                  "next login is taken in 0.25 s",
                                  "a login from 192.0.2.8 failed: unknown user; 1 failure, the next login is taken in "
                                  "0.25 s"));
}

TEST_F(LoginGateTest, AfterAFailureTheAddressHasToWait) {
  EXPECT_EQ(ask(network_, kWrong).delay, milliseconds(250));
  const Decision early = ask(network_, kAlice);
  EXPECT_EQ(early.kind, Kind::TooEarly);
  EXPECT_EQ(early.delay, milliseconds(250));
  EXPECT_EQ(gate().verify(network_, kAlice).kind, Kind::TooEarly);
  EXPECT_EQ(verifier_->count, 1);
  Origin other = network_;
  other.address = "192.0.2.8";
  EXPECT_EQ(ask(other, kAlice).kind, Kind::Admitted);
  now_ += milliseconds(250);
  EXPECT_EQ(ask(network_, kWrong).delay, milliseconds(500));
}

TEST_F(LoginGateTest, AVerifiedLoginIsRememberedForFiveMinutes) {
  EXPECT_EQ(ask(network_, kAlice).kind, Kind::Admitted);
  now_ += minutes(4);
  EXPECT_EQ(ask(network_, kAlice).kind, Kind::Admitted);
  EXPECT_EQ(gate().verify(network_, kAlice).kind, Kind::Admitted);
  EXPECT_EQ(verifier_->count, 1);
  EXPECT_EQ(ask(network_, kWrong).kind, Kind::NeedsLogin);
  now_ += minutes(1);
  EXPECT_EQ(gate().decide(network_, &kAlice).kind, Kind::MustVerify);
  EXPECT_EQ(ask(network_, kAlice).kind, Kind::Admitted);
  EXPECT_EQ(verifier_->count, 3);
}

TEST_F(LoginGateTest, AKnownLoginIsTakenWhileOthersOfItsAddressGuess) {
  EXPECT_EQ(ask(network_, kAlice).kind, Kind::Admitted);
  EXPECT_EQ(ask(network_, kWrong).kind, Kind::NeedsLogin);
  EXPECT_EQ(ask(network_, kAlice).kind, Kind::Admitted);
  now_ += minutes(6);
  EXPECT_EQ(ask(network_, kWrong).kind, Kind::NeedsLogin);
  EXPECT_EQ(ask(network_, kAlice).kind, Kind::Admitted);
}

TEST_F(LoginGateTest, AChangeOfTheFileCountsAtOnce) {
  writeUsers("alice:*:operate\nbob:*:read\n");
  EXPECT_EQ(ask(network_, kAlice).kind, Kind::Admitted);
  writeUsers("# a comment\nalice:*:operate\nbob:*:read\n");
  gate().refresh();
  EXPECT_EQ(ask(network_, kAlice).kind, Kind::Admitted);
  EXPECT_EQ(verifier_->count, 1) << "an entry that did not change is still remembered";
  writeUsers("alice:*:read\n");
  gate().refresh();
  EXPECT_EQ(roleIn(ask(network_, kAlice)), Role::Read);
  EXPECT_EQ(verifier_->count, 2);
  writeUsers("");
  gate().refresh();
  EXPECT_EQ(ask(network_, kAlice).kind, Kind::NeedsLogin);
}

TEST_F(LoginGateTest, ANewUserCanLogInAtOnce) {
  EXPECT_EQ(ask(network_, kNobody).kind, Kind::NeedsLogin);
  writeUsers("secret:*:read\n");
  now_ += seconds(1);
  EXPECT_EQ(ask(network_, kNobody).kind, Kind::Admitted);
}

TEST_F(LoginGateTest, ACertificateStandsForItsUser) {
  writeUsers("carol:*:read:root/cimv2=operate:subject=CN=carol\n");
  network_.certificate = Certificate{"CN=carol", std::string(64, 'a')};
  const Decision decision = ask(network_);
  EXPECT_EQ(roleIn(decision), Role::Operate);
  EXPECT_EQ(decision.client->user, "carol");
  EXPECT_EQ(decision.client->proof, Proof::Certificate);
}

TEST_F(LoginGateTest, ACertificateOfNobodyNeedsALogin) {
  for (const auto way : {Origin::Way::Network, Origin::Way::Loopback}) {
    network_.way = way;
    network_.certificate = Certificate{"CN=mallory", std::string(64, 'a')};
    EXPECT_EQ(ask(network_).kind, Kind::Refused);
    EXPECT_EQ(ask(network_, kAlice).kind, Kind::Admitted);
  }
}

TEST_F(LoginGateTest, ACertificateThatWasJustAddedIsTaken) {
  network_.certificate = Certificate{"CN=carol", std::string(64, 'a')};
  EXPECT_EQ(ask(network_).kind, Kind::Refused);
  writeUsers("carol:*:read:fingerprint=" + std::string(64, 'a') + "\n");
  EXPECT_EQ(ask(network_).kind, Kind::Admitted);
}

TEST_F(LoginGateTest, OnTheUnixSocketTheKernelSaysWhoItIs) {
  EXPECT_EQ(roleIn(ask(local(0))), Role::Operate);
  EXPECT_EQ(lookUps_, 0);
  EXPECT_EQ(roleIn(ask(local(kMember))), Role::Operate);
  EXPECT_EQ(roleIn(ask(local(kOther))), Role::Read);
  EXPECT_EQ(ask(local(kOther)).client->user, "user4002");
  EXPECT_EQ(ask(local(kOther)).client->proof, Proof::Kernel);
  EXPECT_EQ(lookUps_, 2);
  now_ += minutes(2);
  ask(local(kOther));
  EXPECT_EQ(lookUps_, 3);
  EXPECT_EQ(roleIn(ask(local(::geteuid()))), Role::Operate);
}

TEST_F(LoginGateTest, OnTheUnixSocketOthersCanBeKeptOut) {
  options_.otherLocal = Role::None;
  EXPECT_EQ(ask(local(kOther)).kind, Kind::Refused);
  EXPECT_EQ(roleIn(ask(local(kMember))), Role::Operate);
}

TEST_F(LoginGateTest, TheUnixSocketTakesNoLogin) {
  EXPECT_EQ(ask(local(kMember), kAlice).kind, Kind::Refused);
  EXPECT_EQ(verifier_->count, 0);
}

TEST(LocalUsers, TheSuperuserHasAName) {
  EXPECT_EQ(lookUpUser(0, "root").name, "root");
  EXPECT_TRUE(lookUpUser(0, "root").isMember);
  EXPECT_FALSE(lookUpUser(0, "no-such-group").isMember);
  EXPECT_EQ(lookUpUser(3'999'999'999U, "root").name, "uid 3999999999");
}

}  // namespace
}  // namespace zorva::access
