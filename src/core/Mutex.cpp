#include <errno.h>
#include <pthread.h>

#include <new>

#include "core/Deadline.h"
#include "lodestack/core/IMutex.h"

namespace lodestack {
namespace core {

namespace {

class LinMutex : public IMutex {
 public:
  LinMutex() : created_(false), held_(false) {}
  ~LinMutex() override {
    if (!created_) return;
    if (held_) pthread_mutex_unlock(&mutex_);
    pthread_mutexattr_destroy(&attributes_);
    pthread_mutex_destroy(&mutex_);
  }

  // The attribute object is prepared as recursive but deliberately not handed
  // to pthread_mutex_init: every mutex of the library is a default one.
  bool create(bool /*reserved*/) {
    pthread_mutexattr_init(&attributes_);
    pthread_mutexattr_settype(&attributes_, PTHREAD_MUTEX_RECURSIVE);
    pthread_mutex_init(&mutex_, nullptr);
    created_ = true;
    return true;
  }

  bool lock() override {
    if (pthread_mutex_lock(&mutex_) != 0) return false;
    held_ = true;
    return true;
  }

  int tryLock(unsigned int ms) override {
    if (pthread_mutex_trylock(&mutex_) == 0) return acquired();
    if (ms == 0) return 0;
    const timespec deadline = deadlineWithoutCarry(CLOCK_REALTIME, ms);
    const int rc = pthread_mutex_timedlock(&mutex_, &deadline);
    if (rc == 0) return acquired();
    return rc == ETIMEDOUT ? 2 : 0;
  }

  void unlock() override {
    held_ = false;
    pthread_mutex_unlock(&mutex_);
  }

 private:
  int acquired() {
    held_ = true;
    return 1;
  }

  pthread_mutex_t mutex_;
  pthread_mutexattr_t attributes_;
  bool created_;
  bool held_;  // written by the holder only; lets the destructor unlock
};

}  // namespace

IMutex::~IMutex() = default;

IMutex* IMutex::create(const std::wstring& name, bool /*reserved*/, bool create) {
  if (!name.empty() || !create) return nullptr;
  LinMutex* mutex = new (std::nothrow) LinMutex;
  if (mutex && !mutex->create(false)) {
    delete mutex;
    return nullptr;
  }
  return mutex;
}

IMutex* IMutex::open(const std::wstring&, bool) { return nullptr; }

}  // namespace core
}  // namespace lodestack
