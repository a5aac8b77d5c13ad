// Lock failures on demand: the program's own pthread_mutex_lock comes first
// in symbol lookup, so the library's locks reach it too; it fails while a
// FailingLocks asks for it and otherwise hands over to the next definition
// (the C library's, or a sanitizer's in front of it).
#include <dlfcn.h>
#include <errno.h>
#include <pthread.h>

#include <atomic>

#include "core/CoreTestSupport.h"

namespace {

thread_local int locksToFail = 0;

using LockFunction = int (*)(pthread_mutex_t*);
std::atomic<LockFunction> nextLock{nullptr};

}  // namespace

extern "C" int pthread_mutex_lock(pthread_mutex_t* mutex) noexcept {
  if (locksToFail > 0) {
    --locksToFail;
    return EINVAL;
  }
  LockFunction next = nextLock.load(std::memory_order_acquire);
  if (!next) {
    next = reinterpret_cast<LockFunction>(dlsym(RTLD_NEXT, "pthread_mutex_lock"));
    nextLock.store(next, std::memory_order_release);
  }
  return next(mutex);
}

namespace lodestack::core::testing {

FailingLocks::FailingLocks(int count) { locksToFail = count; }
FailingLocks::~FailingLocks() { locksToFail = 0; }
int FailingLocks::left() const { return locksToFail; }

}  // namespace lodestack::core::testing
