// CMPIBrokerExtFT and attaching: the broker's functions for providers that run their own threads.

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <atomic>
#include <cerrno>
#include <cstdlib>
#include <ctime>
#include <string>
#include <vector>

#include "broker/Broker.h"
#include "broker/core/BrokerCore.h"
#include "broker/objects/Data.h"
#include "broker/objects/Scope.h"
#include "broker/requests/Request.h"
#include "broker/requests/Result.h"
#include "broker/testing/TestClasses.h"

namespace zorva::broker {
namespace {

class ThreadsTest : public ::testing::Test {
 protected:
  Broker broker_{testing::testClasses(), {.registry = ProviderRegistry()}};
  const CMPIBroker* cmpi_ = broker_.handle();
  BrokerCore& core_ = *BrokerCore::of(cmpi_);
  const CMPIBrokerExtFT& xft_ = *cmpi_->xft;
};

TEST_F(ThreadsTest, FileNamesAreThoseOfTheSystem) {
  for (const auto& [name, file] :
       {std::pair{"x", "libx.so"}, {"/lib/libx.so.1", "/lib/libx.so.1"}, {"libx.so", "libx.so"}}) {
    char* resolved = xft_.resolveFileName(name);
    EXPECT_STREQ(resolved, file);
    std::free(resolved);
  }
  EXPECT_EQ(xft_.resolveFileName(nullptr), nullptr);
  EXPECT_EQ(xft_.resolveFileName(""), nullptr);
}

TEST_F(ThreadsTest, AThreadIsStartedAndJoined) {
  int seen = 0;
  void* thread = xft_.newThread(
      [](void* parameter) -> void* {
        *static_cast<int*>(parameter) = 1;
        return parameter;
      },
      &seen, 0);
  ASSERT_NE(thread, nullptr);
  void* result = nullptr;
  EXPECT_EQ(xft_.joinThread(thread, &result), 0);
  EXPECT_EQ(result, &seen);
  EXPECT_EQ(seen, 1);
  EXPECT_EQ(xft_.newThread(nullptr, nullptr, 0), nullptr);
  EXPECT_EQ(xft_.joinThread(nullptr, nullptr), EINVAL);
}

TEST_F(ThreadsTest, ADetachedThreadEndsByItself) {
  static std::atomic<bool> ended = false;
  ended = false;
  ASSERT_NE(xft_.newThread(
                [](void*) -> void* {
                  ended = true;
                  return nullptr;
                },
                nullptr, 1),
            nullptr);
  for (int i = 0; i < 1000 && !ended; ++i) EXPECT_EQ(xft_.threadSleep(5), 0);
  EXPECT_TRUE(ended);
}

TEST_F(ThreadsTest, AThreadEndsEarly) {
  void* thread = xft_.newThread(
      [](void* parameter) -> void* {
        const auto* table = static_cast<const CMPIBrokerExtFT*>(parameter);
        table->exitThread(parameter);
        return nullptr;
      },
      const_cast<CMPIBrokerExtFT*>(&xft_), 0);
  void* result = nullptr;
  EXPECT_EQ(xft_.joinThread(thread, &result), 0);
  EXPECT_EQ(result, &xft_);
}

TEST_F(ThreadsTest, AThreadIsCancelled) {
  // Has no local variables: AddressSanitizer does not notice that a cancelled thread left this frame.
  void* thread = xft_.newThread(
      [](void*) -> void* {
        for (;;) pause();
      },
      nullptr, 0);
  EXPECT_EQ(xft_.cancelThread(thread), 0);
  void* result = nullptr;
  EXPECT_EQ(xft_.joinThread(thread, &result), 0);
  EXPECT_EQ(result, reinterpret_cast<void*>(-1));  // PTHREAD_CANCELED
  EXPECT_EQ(xft_.cancelThread(nullptr), EINVAL);
}

TEST_F(ThreadsTest, OnceMeansOnce) {
  static int runs = 0;
  runs = 0;
  static int once = 0;
  once = 0;
  EXPECT_EQ(xft_.threadOnce(&once, [] { ++runs; }), 0);
  EXPECT_EQ(xft_.threadOnce(&once, [] { ++runs; }), 0);
  EXPECT_EQ(runs, 1);
  EXPECT_EQ(xft_.threadOnce(nullptr, [] {}), EINVAL);
  EXPECT_EQ(xft_.threadOnce(&once, nullptr), EINVAL);
}

TEST_F(ThreadsTest, KeysHoldAValueForEachThread) {
  unsigned long key = 0;
  ASSERT_EQ(xft_.createThreadKey(&key, nullptr), 0);
  int value = 0;
  EXPECT_EQ(xft_.setThreadSpecific(key, &value), 0);
  EXPECT_EQ(xft_.getThreadSpecific(key), &value);
  EXPECT_EQ(xft_.destroyThreadKey(key), 0);
  EXPECT_EQ(xft_.createThreadKey(nullptr, nullptr), EINVAL);
  EXPECT_NE(xft_.destroyThreadKey(100000), 0);
  EXPECT_NE(xft_.setThreadSpecific(100000, &value), 0);
  EXPECT_EQ(xft_.getThreadSpecific(100000), nullptr);
}

struct Counter {
  const CMPIBrokerExtFT* table;
  void* mutex;
  void* condition;
  int count = 0;
};

TEST_F(ThreadsTest, MutexesAndConditionsKeepThreadsInOrder) {
  Counter counter{&xft_, xft_.newMutex(0), xft_.newCondition(0)};
  std::vector<void*> threads;
  for (int i = 0; i < 4; ++i) {
    threads.push_back(xft_.newThread(
        [](void* parameter) -> void* {
          auto* shared = static_cast<Counter*>(parameter);
          for (int round = 0; round < 1000; ++round) {
            shared->table->lockMutex(shared->mutex);
            ++shared->count;
            shared->table->unlockMutex(shared->mutex);
          }
          shared->table->lockMutex(shared->mutex);
          shared->table->signalCondition(shared->condition);
          shared->table->unlockMutex(shared->mutex);
          return nullptr;
        },
        &counter, 0));
  }
  xft_.lockMutex(counter.mutex);
  timespec until{};
  std::timespec_get(&until, TIME_UTC);
  until.tv_sec += 60;
  while (counter.count < 4000) ASSERT_EQ(xft_.timedCondWait(counter.condition, counter.mutex, &until), 0);
  until.tv_sec -= 120;
  EXPECT_EQ(xft_.timedCondWait(counter.condition, counter.mutex, &until), ETIMEDOUT);
  xft_.unlockMutex(counter.mutex);
  for (void* thread : threads) xft_.joinThread(thread, nullptr);
  xft_.destroyCondition(counter.condition);
  xft_.destroyMutex(counter.mutex);
}

TEST_F(ThreadsTest, AWaitEndsWithASignal) {
  Counter counter{&xft_, xft_.newMutex(0), xft_.newCondition(0)};
  xft_.lockMutex(counter.mutex);
  void* thread = xft_.newThread(
      [](void* parameter) -> void* {
        auto* shared = static_cast<Counter*>(parameter);
        shared->table->lockMutex(shared->mutex);
        shared->count = 1;
        shared->table->signalCondition(shared->condition);
        shared->table->unlockMutex(shared->mutex);
        return nullptr;
      },
      &counter, 0);
  while (counter.count == 0) EXPECT_EQ(xft_.condWait(counter.condition, counter.mutex), 0);
  xft_.unlockMutex(counter.mutex);
  xft_.joinThread(thread, nullptr);
  xft_.destroyCondition(counter.condition);
  xft_.destroyMutex(counter.mutex);
}

TEST_F(ThreadsTest, WhatIsNoMutexOrConditionIsRefused) {
  void* mutex = xft_.newMutex(0);
  void* condition = xft_.newCondition(0);
  timespec now{};
  xft_.lockMutex(nullptr);
  xft_.lockMutex(condition);
  xft_.unlockMutex(nullptr);
  xft_.unlockMutex(condition);
  xft_.destroyMutex(nullptr);
  xft_.destroyMutex(condition);
  xft_.destroyCondition(nullptr);
  xft_.destroyCondition(mutex);
  EXPECT_EQ(xft_.signalCondition(nullptr), EINVAL);
  EXPECT_EQ(xft_.signalCondition(mutex), EINVAL);
  EXPECT_EQ(xft_.condWait(nullptr, mutex), EINVAL);
  EXPECT_EQ(xft_.condWait(mutex, condition), EINVAL);
  EXPECT_EQ(xft_.timedCondWait(condition, nullptr, &now), EINVAL);
  EXPECT_EQ(xft_.timedCondWait(condition, mutex, nullptr), EINVAL);
  xft_.destroyMutex(mutex);
  xft_.destroyCondition(condition);
}

// ---- Attaching ----

struct Work {
  const CMPIBroker* broker;
  const CMPIContext* context;
  const CMPIResult* result = nullptr;
  bool detach = true;
  CMPIrc attached = CMPI_RC_ERROR;
  CMPIrc detached = CMPI_RC_ERROR;
  std::string principal;
};

void* attachedWork(void* parameter) {
  auto* work = static_cast<Work*>(parameter);
  const CMPIBroker* broker = work->broker;
  CMPIStatus status{CMPI_RC_OK, nullptr};
  if (broker->eft->newString(broker, "too early", &status) != nullptr) return nullptr;
  work->attached = broker->bft->attachThread(broker, work->context).rc;
  const CMPIData entry = work->context->ft->getEntry(work->context, CMPIPrincipal, nullptr);
  work->principal = textOf(entry.value.string);
  for (int i = 0; i < 200; ++i) {
    CMPIObjectPath* path = broker->eft->newObjectPath(broker, "root/cimv2", "T_Thing", nullptr);
    path->ft->addKey(path, "Name", reinterpret_cast<const CMPIValue*>("threaded"), CMPI_chars);
    if (work->result != nullptr) work->result->ft->returnObjectPath(work->result, path);
  }
  if (work->detach) work->detached = broker->bft->detachThread(broker, work->context).rc;
  return nullptr;
}

class CountingReceiver : public Receiver {
 public:
  bool takePath(const PathObject&) override {
    ++count;
    return true;
  }
  int count = 0;
};

TEST_F(ThreadsTest, AttachedThreadsMakeObjectsAndReturnThem) {
  Request request(core_);
  request.context().setText(CMPIPrincipal, "alice");
  CountingReceiver receiver;
  ResultObject result(core_, ResultObject::Paths, &receiver, "test");
  std::vector<Work> works;
  std::vector<void*> threads;
  for (int i = 0; i < 4; ++i) {
    works.push_back({cmpi_, cmpi_->bft->prepareAttachThread(cmpi_, &request.context()), &result, true, CMPI_RC_ERROR,
                     CMPI_RC_ERROR, ""});
  }
  for (Work& work : works) threads.push_back(xft_.newThread(attachedWork, &work, 0));
  // The request's own thread goes on meanwhile.
  for (int i = 0; i < 200; ++i) {
    result.ft->returnObjectPath(&result, cmpi_->eft->newObjectPath(cmpi_, "root/cimv2", "T_Thing", nullptr));
  }
  for (void* thread : threads) xft_.joinThread(thread, nullptr);
  for (const Work& work : works) {
    EXPECT_EQ(work.attached, CMPI_RC_OK);
    EXPECT_EQ(work.detached, CMPI_RC_OK);
    EXPECT_EQ(work.principal, "alice");
  }
  EXPECT_EQ(receiver.count, 1000);
}

TEST_F(ThreadsTest, AThreadThatNeverDetachesIsForgottenWithTheBroker) {
  Request request(core_);
  request.context().setText(CMPIPrincipal, "bob");
  Work work{
      cmpi_, cmpi_->bft->prepareAttachThread(cmpi_, &request.context()), nullptr, false, CMPI_RC_ERROR, CMPI_RC_ERROR,
      ""};
  void* thread = xft_.newThread(attachedWork, &work, 0);
  xft_.joinThread(thread, nullptr);
  EXPECT_EQ(work.attached, CMPI_RC_OK);
  EXPECT_EQ(work.principal, "bob");
}

TEST_F(ThreadsTest, AttachingTwiceOrDetachingWithoutIsAFailure) {
  Request request(core_);
  // This thread has the scope of the request already.
  EXPECT_EQ(cmpi_->bft->attachThread(cmpi_, &request.context()).rc, CMPI_RC_ERR_FAILED);
  EXPECT_EQ(cmpi_->bft->detachThread(cmpi_, &request.context()).rc, CMPI_RC_ERR_FAILED);
  EXPECT_EQ(cmpi_->bft->attachThread(cmpi_, nullptr).rc, CMPI_RC_ERR_INVALID_HANDLE);
  EXPECT_EQ(cmpi_->bft->attachThread(nullptr, &request.context()).rc, CMPI_RC_ERR_INVALID_HANDLE);
  EXPECT_EQ(cmpi_->bft->detachThread(cmpi_, nullptr).rc, CMPI_RC_ERR_INVALID_HANDLE);
  EXPECT_EQ(cmpi_->bft->prepareAttachThread(cmpi_, nullptr), nullptr);
  CMPIString* text = cmpi_->eft->newString(cmpi_, "no context", nullptr);
  EXPECT_EQ(cmpi_->bft->attachThread(cmpi_, reinterpret_cast<CMPIContext*>(text)).rc, CMPI_RC_ERR_INVALID_HANDLE);
}

}  // namespace
}  // namespace zorva::broker
