#include "http/LoginQueue.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <condition_variable>
#include <map>
#include <mutex>
#include <stdexcept>
#include <thread>
#include <utility>
#include <vector>

namespace zorva::http {
namespace {

using access::Decision;
using std::chrono::milliseconds;
using std::chrono::seconds;
using Clock = std::chrono::steady_clock;
using Kind = Decision::Kind;
using ::testing::ElementsAre;

/// verify() waits until the test lets it go on. The login "wrong" fails, "throws" throws.
class SlowGate : public access::Gate {
 public:
  Decision decide(const access::Origin&, const std::string*) override { return {Kind::MustVerify}; }

  Decision verify(const access::Origin& origin, const std::string& authorization) override {
    std::unique_lock lock(mutex_);
    verified_.push_back(origin.address + " " + authorization);
    changed_.notify_all();
    changed_.wait(lock, [this] { return isOpen_; });
    if (authorization == "throws") throw std::runtime_error("broken");
    if (authorization == "wrong") return {Kind::NeedsLogin, nullptr, "wrong", milliseconds(250)};
    return {Kind::Admitted};
  }

  void open() {
    const std::lock_guard lock(mutex_);
    isOpen_ = true;
    changed_.notify_all();
  }

  std::vector<std::string> verified(std::size_t least) {
    std::unique_lock lock(mutex_);
    changed_.wait_for(lock, seconds(20), [&] { return verified_.size() >= least; });
    return verified_;
  }

 private:
  std::mutex mutex_;
  std::condition_variable changed_;
  bool isOpen_ = false;
  std::vector<std::string> verified_;
};

class LoginQueueTest : public ::testing::Test {
 protected:
  ~LoginQueueTest() override { gate_->open(); }

  void submit(const std::string& address, const std::string& authorization = "right") {
    queue_.submit(applicant(address, authorization));
  }

  void hold(milliseconds delay) {
    queue_.hold(applicant("192.0.2.1", "early"), {Kind::TooEarly, nullptr, "early", delay});
  }

  Applicant applicant(const std::string& address, const std::string& authorization) {
    Applicant made{{}, authorization, [this](const Decision& decision) {
                     const std::lock_guard lock(mutex_);
                     decisions_.push_back(decision.kind);
                     changed_.notify_all();
                   }};
    made.origin.way = access::Origin::Way::Network;
    made.origin.address = address;
    return made;
  }

  std::vector<Kind> decisions(std::size_t least) {
    std::unique_lock lock(mutex_);
    changed_.wait_for(lock, seconds(20), [&] { return decisions_.size() >= least; });
    return decisions_;
  }

  /// The thread is in verify() with this one.
  void occupy() {
    submit("192.0.2.1", "first");
    gate_->verified(1);
  }

  std::shared_ptr<SlowGate> gate_ = std::make_shared<SlowGate>();
  std::mutex mutex_;
  std::condition_variable changed_;
  std::vector<Kind> decisions_;
  LoginQueue queue_{gate_};
};

TEST_F(LoginQueueTest, TheClientsTakeTurns) {
  occupy();
  for (const char* each : {"1", "2", "3"}) submit("192.0.2.1", each);
  for (const char* each : {"1", "2"}) submit("192.0.2.2", each);
  submit("192.0.2.3", "1");
  gate_->open();
  EXPECT_THAT(gate_->verified(7), ElementsAre("192.0.2.1 first", "192.0.2.1 1", "192.0.2.2 1", "192.0.2.3 1",
                                              "192.0.2.1 2", "192.0.2.2 2", "192.0.2.1 3"));
  EXPECT_EQ(decisions(7).size(), 7U);
}

TEST_F(LoginQueueTest, OneClientHasAPartOfThePlaces) {
  occupy();
  for (std::size_t i = 0; i < LoginQueue::kMostOfClient; ++i) submit("192.0.2.1");
  EXPECT_TRUE(decisions(0).empty());
  submit("192.0.2.1");
  EXPECT_THAT(decisions(1), ElementsAre(Kind::TooEarly));
}

TEST_F(LoginQueueTest, IfAllPlacesAreTakenTheClientWithMostLosesOne) {
  occupy();
  for (std::size_t i = 0; i < LoginQueue::kMost; ++i) {
    submit("192.0.2." + std::to_string(2 + i / LoginQueue::kMostOfClient), "queued");
  }
  EXPECT_TRUE(decisions(0).empty());
  submit("198.51.100.1");
  EXPECT_THAT(decisions(1), ElementsAre(Kind::TooEarly));
  EXPECT_EQ(queue_.count(), LoginQueue::kMost + 1);
  gate_->open();
  std::vector<std::string> verified = gate_->verified(6);
  verified.resize(6);
  EXPECT_THAT(verified, ::testing::Contains("198.51.100.1 right"));
}

TEST_F(LoginQueueTest, TheAnswerToAFailureIsHeldBackAndTheNextLoginIsChecked) {
  gate_->open();
  submit("192.0.2.1", "wrong");
  gate_->verified(1);
  submit("192.0.2.2");
  EXPECT_THAT(decisions(1), ElementsAre(Kind::Admitted));
  EXPECT_EQ(queue_.count(), 1U);
  queue_.sweep(Clock::now() - seconds(1));
  EXPECT_EQ(decisions(0).size(), 1U);
  queue_.sweep(Clock::now() + seconds(1));
  EXPECT_THAT(decisions(2), ElementsAre(Kind::Admitted, Kind::NeedsLogin));
  EXPECT_EQ(queue_.count(), 0U);
}

TEST_F(LoginQueueTest, HeldAnswersAreLimited) {
  gate_->open();
  for (std::size_t i = 0; i < LoginQueue::kMostHeld; ++i) submit("192.0.2." + std::to_string(i), "wrong");
  submit("198.51.100.1", "wrong");
  EXPECT_THAT(decisions(1), ElementsAre(Kind::NeedsLogin));
  EXPECT_EQ(queue_.count(), LoginQueue::kMostHeld);
}

TEST_F(LoginQueueTest, WhoWaitsTooLongMustComeAgain) {
  occupy();
  submit("192.0.2.2");
  queue_.sweep(Clock::now());
  EXPECT_TRUE(decisions(0).empty());
  queue_.sweep(Clock::now() + 2 * LoginQueue::kLongestWait);
  EXPECT_THAT(decisions(2), ElementsAre(Kind::TooEarly, Kind::TooEarly));
  EXPECT_EQ(queue_.count(), 0U);
  submit("192.0.2.3");
  gate_->open();
  EXPECT_THAT(decisions(3), ElementsAre(Kind::TooEarly, Kind::TooEarly, Kind::Admitted));
}

TEST_F(LoginQueueTest, AtTheEndAllAreGivenUp) {
  occupy();
  submit("192.0.2.2");
  queue_.giveUpAll();
  EXPECT_THAT(decisions(2), ElementsAre(Kind::TooEarly, Kind::TooEarly));
  submit("192.0.2.3");
  EXPECT_EQ(decisions(3).size(), 3U);
  EXPECT_FALSE(queue_.join(milliseconds(1)));
  gate_->open();
  EXPECT_TRUE(queue_.join(seconds(20)));
  EXPECT_EQ(decisions(0).size(), 3U);
}

TEST_F(LoginQueueTest, AGateThatFailsLeavesTheThread) {
  gate_->open();
  submit("192.0.2.1", "throws");
  submit("192.0.2.1");
  EXPECT_THAT(decisions(1), ElementsAre(Kind::Admitted));
  queue_.sweep(Clock::now() + LoginQueue::kTooEarlyIsHeld);
  EXPECT_THAT(decisions(2), ElementsAre(Kind::Admitted, Kind::TooEarly));
}

TEST_F(LoginQueueTest, WhoComesTooEarlyLearnsItAfterAWhileSoThatFewConnectionsAreMade) {
  for (std::size_t i = 0; i < LoginQueue::kMostHeldTooEarly; ++i) hold(seconds(8));
  EXPECT_THAT(decisions(0), ElementsAre());
  hold(seconds(8));
  EXPECT_THAT(decisions(1), ElementsAre(Kind::TooEarly)) << "there is no room for more";
  queue_.sweep(Clock::now() + LoginQueue::kTooEarlyIsHeld / 2);
  EXPECT_EQ(decisions(0).size(), 1U);
  queue_.sweep(Clock::now() + LoginQueue::kTooEarlyIsHeld);
  EXPECT_EQ(decisions(0).size(), 1U + LoginQueue::kMostHeldTooEarly);
  EXPECT_EQ(queue_.count(), 0U);
  queue_.giveUpAll();
  hold(seconds(8));
  EXPECT_EQ(decisions(0).size(), 2U + LoginQueue::kMostHeldTooEarly);
}

TEST_F(LoginQueueTest, WhoMayComeAgainSoonIsNotHeldForLonger) {
  hold(milliseconds(100));
  queue_.sweep(Clock::now() + milliseconds(100));
  EXPECT_THAT(decisions(0), ElementsAre(Kind::TooEarly));
}

}  // namespace
}  // namespace zorva::http
