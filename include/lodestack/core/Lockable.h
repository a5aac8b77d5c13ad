// LockableBase and Lockable<T>: a value together with the lock that guards it.
//
// The library's own classes lock with nothing else. The lock is an IMutex and
// therefore not recursive: a thread must never lock the same LockableBase
// twice. `depth` counts the lock()/successful tryLock() calls not yet matched
// by unlock(), so an unmatched unlock() does nothing. Any thread may lock;
// the value of a Lockable<T> may be touched only while its lock is held.
#ifndef LODESTACK_CORE_LOCKABLE_H
#define LODESTACK_CORE_LOCKABLE_H

#include <utility>

#include "lodestack/core/Export.h"
#include "lodestack/core/IMutex.h"
#include "lodestack/gom/SharedPointer.h"

namespace lodestack {

class LODESTACK_EXPORT LockableBase {
 public:
  LockableBase();
  ~LockableBase();
  LockableBase(const LockableBase&) = delete;
  LockableBase& operator=(const LockableBase&) = delete;

  // Blocks until held; false (nothing held) when there is no mutex or it
  // cannot be taken.
  bool lock();
  // As IMutex::tryLock; 0 when there is no mutex.
  int tryLock(unsigned int ms);
  // Releases one level; nothing when not locked (depth < 1) or no mutex.
  void unlock();

 private:
  gom::SharedPointer<core::IMutex> mutex_;
  int depth_;
};

// Holds a LockableBase locked for the lifetime of the guard.
class ScopedLock {
 public:
  explicit ScopedLock(LockableBase& lockable)
      : lockable_(lockable), locked_(lockable.lock()) {}
  ~ScopedLock() {
    if (locked_) lockable_.unlock();
  }
  ScopedLock(const ScopedLock&) = delete;
  ScopedLock& operator=(const ScopedLock&) = delete;
  bool locked() const { return locked_; }

 private:
  LockableBase& lockable_;
  bool locked_;
};

template <class T>
class Lockable : public LockableBase {
 public:
  template <class... Args>
  explicit Lockable(Args&&... args) : value_(std::forward<Args>(args)...) {}

  // The guarded value; hold the lock while using it.
  T& value() { return value_; }
  const T& value() const { return value_; }

 private:
  T value_;  // destroyed before the LockableBase, as members are
};

}  // namespace lodestack

#endif  // LODESTACK_CORE_LOCKABLE_H
