// The claim that a request holds while its provider works.

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "broker/Broker.h"
#include "broker/objects/PathText.h"
#include "broker/testing/TestClasses.h"

namespace zorva::broker {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

class ClaimsTest : public ::testing::Test {
 protected:
  ClaimsTest() {
    BrokerOptions options =
        testing::testOptions(ZORVA_LIB_DIR, {testing::testProvider("T_Thing", "Thing", InstanceMi),
                                             testing::testProvider("T_Calling", "Calling", InstanceMi)});
    options.claim = [this](Access access, std::string_view className, const ObjectPath* changed) {
      return claim(access, className, changed);
    };
    broker_.emplace(testing::testClasses(), std::move(options));
  }

  /// Records when it is made, finished and destroyed.
  class Noted : public Claim {
   public:
    Noted(std::vector<std::string>& story, Status end) : story_(story), end_(std::move(end)) {}
    ~Noted() override { story_.emplace_back("released"); }
    Status finish() override {
      story_.emplace_back("finished");
      return end_;
    }

   private:
    std::vector<std::string>& story_;
    Status end_;
  };

  std::unique_ptr<Claim> claim(Access access, std::string_view className, const ObjectPath* changed) {
    if (!refusal_.empty()) throw std::runtime_error(refusal_);
    story_.push_back((access == Access::Read ? "read " : "change ") + std::string(className) +
                     (changed == nullptr ? "" : " " + pathText(*changed)));
    return std::make_unique<Noted>(story_, end_);
  }

  Status read(const std::string& className) {
    return broker_->enumerateInstanceNames({}, className, [this](const ObjectPath&) {
      story_.emplace_back("result");
      return false;
    });
  }

  Status change() {
    Instance instance;
    instance.path = parsePathText("T_Thing.Name=\"a\"").value();
    return broker_->modifyInstance(instance, std::nullopt);
  }

  std::vector<std::string> story_;
  std::string refusal_;
  Status end_;
  std::optional<Broker> broker_;
};

TEST_F(ClaimsTest, AReadGivesItsClaimUpBeforeItsFirstResultIsTaken) {
  EXPECT_TRUE(read("T_Thing").ok());
  EXPECT_THAT(story_, ElementsAre("read T_Thing", "released", "result"));
}

TEST_F(ClaimsTest, WhatAProviderAsksForIsWithinTheClaimThatItsRequestHas) {
  EXPECT_TRUE(read("T_Calling").ok());
  EXPECT_THAT(story_, ElementsAre("read T_Calling", "released", "result"));
}

TEST_F(ClaimsTest, AChangeIsFinishedWithinItsClaim) {
  EXPECT_TRUE(change().ok());
  EXPECT_THAT(story_, ElementsAre("change T_Thing T_Thing.Name=\"a\"", "finished", "released"));
}

TEST_F(ClaimsTest, AFailureThatTheProviderDidNotNoticeIsTheStatus) {
  end_ = {1, "the disk is full"};
  EXPECT_EQ(change().message, "the disk is full");
}

TEST_F(ClaimsTest, WithoutAClaimNothingIsAsked) {
  refusal_ = "somebody else has it";
  for (const Status& status : {read("T_Thing"), change()}) {
    EXPECT_EQ(status.rc, 1);
    EXPECT_EQ(status.message, "somebody else has it");
  }
  EXPECT_THAT(story_, IsEmpty());
}

}  // namespace
}  // namespace zorva::broker
