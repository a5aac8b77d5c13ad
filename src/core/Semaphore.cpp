#include <errno.h>
#include <pthread.h>

#include <new>

#include "core/Deadline.h"
#include "lodestack/core/ISemaphore.h"

namespace lodestack {
namespace core {

namespace {

// Unlocks on every way out of a wait, the unwinding of a thread cancelled
// inside it included: the condition wait takes the mutex back before such a
// thread unwinds.
class Unlocker {
 public:
  explicit Unlocker(pthread_mutex_t& mutex) : mutex_(mutex) {}
  ~Unlocker() { pthread_mutex_unlock(&mutex_); }
  Unlocker(const Unlocker&) = delete;
  Unlocker& operator=(const Unlocker&) = delete;

 private:
  pthread_mutex_t& mutex_;
};

class LinSemaphore : public ISemaphore {
 public:
  LinSemaphore() : count_(0), maximum_(0) {}
  ~LinSemaphore() override {
    if (maximum_ == 0) return;
    pthread_cond_destroy(&condition_);
    pthread_mutex_destroy(&mutex_);
  }

  // Only an initial count of 0 succeeds: the initial signal runs before the
  // maximum is stored and is refused, as it always has been.
  bool create(unsigned int initial, unsigned int maximum) {
    if (maximum == 0) return false;
    pthread_mutex_init(&mutex_, nullptr);
    pthread_cond_init(&condition_, nullptr);  // waits on the realtime clock
    if (initial != 0 && !signal(initial, nullptr)) {
      pthread_cond_destroy(&condition_);
      pthread_mutex_destroy(&mutex_);
      return false;
    }
    maximum_ = maximum;
    return true;
  }

  int wait() override { return doWait(false, 0); }
  int tryWait(unsigned int ms) override { return doWait(true, ms); }

  bool signal(unsigned int count, unsigned int* previous) override {
    if (maximum_ == 0 || pthread_mutex_lock(&mutex_) != 0) return false;
    const unsigned int old = count_;
    if (previous) *previous = old;
    const bool fits = static_cast<unsigned long long>(old) + count <= maximum_;
    if (fits) {
      pthread_cond_broadcast(&condition_);
      count_ = old + count;
    }
    pthread_mutex_unlock(&mutex_);
    return fits;
  }

  bool zero() override {
    if (maximum_ == 0 || pthread_mutex_lock(&mutex_) != 0) return false;
    const Unlocker unlocker(mutex_);
    // A wait to "now" on the monotonic clock returns at once (see doWait).
    timespec now{};
    clock_gettime(CLOCK_MONOTONIC, &now);
    const int rc = pthread_cond_timedwait(&condition_, &mutex_, &now);
    const bool ok = rc == 0 || rc == ETIMEDOUT;
    if (ok) count_ = 0;
    return ok;
  }

 private:
  // The timed deadline is measured on the monotonic clock while the
  // condition waits on the realtime clock, so it has always passed: a timed
  // wait on a zero count times out at once. Kept deliberately.
  int doWait(bool timed, unsigned int ms) {
    if (maximum_ == 0) return 0;
    const int lockRc = pthread_mutex_lock(&mutex_);
    if (lockRc != 0) return lockRc == ETIMEDOUT ? 2 : 0;
    const Unlocker unlocker(mutex_);
    timespec deadline{};
    if (timed) deadline = deadlineWithoutCarry(CLOCK_MONOTONIC, ms);
    for (;;) {
      if (count_ > 0) {
        --count_;
        return 1;
      }
      const int rc = timed ? pthread_cond_timedwait(&condition_, &mutex_, &deadline)
                           : pthread_cond_wait(&condition_, &mutex_);
      if (rc != 0) return rc == ETIMEDOUT ? 2 : 0;
    }
  }

  pthread_mutex_t mutex_;
  pthread_cond_t condition_;
  unsigned int count_;    // guarded by mutex_
  unsigned int maximum_;  // 0: not created
};

}  // namespace

ISemaphore::~ISemaphore() = default;

ISemaphore* ISemaphore::create(unsigned int initial, unsigned int maximum) {
  LinSemaphore* semaphore = new (std::nothrow) LinSemaphore;
  if (semaphore && !semaphore->create(initial, maximum)) {
    delete semaphore;
    return nullptr;
  }
  return semaphore;
}

}  // namespace core
}  // namespace lodestack
