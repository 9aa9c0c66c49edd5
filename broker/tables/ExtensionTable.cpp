// CMPIBrokerExtFT: threads, mutexes and conditions, on pthreads. Integer results are 0 or an errno value.

#include <pthread.h>

#include <cerrno>
#include <cstdint>
#include <cstring>
#include <ctime>
#include <new>
#include <string>

#include "broker/core/BrokerCore.h"
#include "broker/objects/TableSupport.h"

namespace zorva::broker {

namespace {

// A mutex or condition begins with a word that names its kind, so that one is not taken for the other.
constexpr std::uint64_t kMutexTag = 0x7a6f7276614d7478;
constexpr std::uint64_t kConditionTag = 0x7a6f727661436e64;

struct Mutex {
  std::uint64_t tag = kMutexTag;
  pthread_mutex_t mutex{};
};

struct Condition {
  std::uint64_t tag = kConditionTag;
  pthread_cond_t condition{};
};

template <typename T>
T* checked(void* handle, std::uint64_t tag) noexcept {
  if (handle == nullptr) return nullptr;
  std::uint64_t found = 0;
  std::memcpy(&found, handle, sizeof found);
  return found == tag ? static_cast<T*>(handle) : nullptr;
}

Mutex* mutexOf(void* handle) noexcept { return checked<Mutex>(handle, kMutexTag); }
Condition* conditionOf(void* handle) noexcept { return checked<Condition>(handle, kConditionTag); }

// A pthread_t is a number; as a handle it is that number as a pointer.
static_assert(sizeof(pthread_t) == sizeof(void*));
// NOLINTNEXTLINE(performance-no-int-to-ptr)
void* handleOf(pthread_t thread) noexcept { return reinterpret_cast<void*>(thread); }
pthread_t threadOf(void* handle) noexcept { return reinterpret_cast<pthread_t>(handle); }

// The file name of a library on this system; the caller frees the text. A path, or a name that is a file name already,
// is not changed.
char* resolveFileName(const char* name) {
  if (name == nullptr || *name == '\0') return nullptr;
  const std::string given(name);
  const bool asItStands = given.find('/') != std::string::npos || given.find(".so") != std::string::npos;
  return strdup(asItStands ? name : ("lib" + given + ".so").c_str());
}

void* newThread(void* (*start)(void*), void* parameter, int detached) {
  if (start == nullptr) return nullptr;
  pthread_attr_t attributes;
  if (pthread_attr_init(&attributes) != 0) return nullptr;
  pthread_attr_setdetachstate(&attributes, detached != 0 ? PTHREAD_CREATE_DETACHED : PTHREAD_CREATE_JOINABLE);
  pthread_t thread{};
  const int failure = pthread_create(&thread, &attributes, start, parameter);
  pthread_attr_destroy(&attributes);
  return failure == 0 ? handleOf(thread) : nullptr;
}

int joinThread(void* thread, void** result) {
  return thread != nullptr ? pthread_join(threadOf(thread), result) : EINVAL;
}

int exitThread(void* result) { pthread_exit(result); }

int cancelThread(void* thread) { return thread != nullptr ? pthread_cancel(threadOf(thread)) : EINVAL; }

int threadSleep(CMPIUint32 milliseconds) {
  timespec rest{static_cast<time_t>(milliseconds / 1000), static_cast<long>(milliseconds % 1000) * 1000000};
  while (nanosleep(&rest, &rest) != 0) {
    if (errno != EINTR) return errno;
  }
  return 0;
}

int threadOnce(int* once, void (*init)(void)) {
  static_assert(sizeof(pthread_once_t) == sizeof(int) && PTHREAD_ONCE_INIT == 0);
  return once != nullptr && init != nullptr ? pthread_once(once, init) : EINVAL;
}

int createThreadKey(CMPI_THREAD_KEY_TYPE* key, void (*cleanup)(void*)) {
  if (key == nullptr) return EINVAL;
  pthread_key_t made = 0;
  const int failure = pthread_key_create(&made, cleanup);
  if (failure == 0) *key = made;
  return failure;
}

int destroyThreadKey(CMPI_THREAD_KEY_TYPE key) { return pthread_key_delete(static_cast<pthread_key_t>(key)); }

void* getThreadSpecific(CMPI_THREAD_KEY_TYPE key) { return pthread_getspecific(static_cast<pthread_key_t>(key)); }

int setThreadSpecific(CMPI_THREAD_KEY_TYPE key, void* value) {
  return pthread_setspecific(static_cast<pthread_key_t>(key), value);
}

// Recursive, because a provider may lock again in an up-call that calls it back.
void* newMutex(int /*options*/) {
  auto* made = new (std::nothrow) Mutex;
  if (made == nullptr) return nullptr;
  pthread_mutexattr_t attributes;
  pthread_mutexattr_init(&attributes);
  pthread_mutexattr_settype(&attributes, PTHREAD_MUTEX_RECURSIVE);
  pthread_mutex_init(&made->mutex, &attributes);
  pthread_mutexattr_destroy(&attributes);
  return made;
}

void destroyMutex(void* handle) {
  Mutex* mutex = mutexOf(handle);
  if (mutex == nullptr) return;
  pthread_mutex_destroy(&mutex->mutex);
  delete mutex;
}

void lockMutex(void* handle) {
  if (Mutex* mutex = mutexOf(handle)) pthread_mutex_lock(&mutex->mutex);
}

void unlockMutex(void* handle) {
  if (Mutex* mutex = mutexOf(handle)) pthread_mutex_unlock(&mutex->mutex);
}

void* newCondition(int /*options*/) {
  auto* made = new (std::nothrow) Condition;
  if (made != nullptr) pthread_cond_init(&made->condition, nullptr);
  return made;
}

void destroyCondition(void* handle) {
  Condition* condition = conditionOf(handle);
  if (condition == nullptr) return;
  pthread_cond_destroy(&condition->condition);
  delete condition;
}

int condWait(void* conditionHandle, void* mutexHandle) {
  Condition* condition = conditionOf(conditionHandle);
  Mutex* mutex = mutexOf(mutexHandle);
  if (condition == nullptr || mutex == nullptr) return EINVAL;
  return pthread_cond_wait(&condition->condition, &mutex->mutex);
}

// `until` is a point in time of the system's clock, as for pthread_cond_timedwait.
int timedCondWait(void* conditionHandle, void* mutexHandle, struct timespec* until) {
  Condition* condition = conditionOf(conditionHandle);
  Mutex* mutex = mutexOf(mutexHandle);
  if (condition == nullptr || mutex == nullptr || until == nullptr) return EINVAL;
  return pthread_cond_timedwait(&condition->condition, &mutex->mutex, until);
}

int signalCondition(void* handle) {
  Condition* condition = conditionOf(handle);
  return condition != nullptr ? pthread_cond_signal(&condition->condition) : EINVAL;
}

}  // namespace

CMPIBrokerExtFT extensionTable = {
    kTableVersion,     guarded<resolveFileName>,
    newThread,         joinThread,
    exitThread,        cancelThread,
    threadSleep,       threadOnce,
    createThreadKey,   destroyThreadKey,
    getThreadSpecific, setThreadSpecific,
    newMutex,          destroyMutex,
    lockMutex,         unlockMutex,
    newCondition,      destroyCondition,
    condWait,          timedCondWait,
    signalCondition,
};

}  // namespace zorva::broker
