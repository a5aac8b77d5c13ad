// ISemaphore: a counting semaphore with a ceiling.
//
// Made by ISemaphore::create and reference counted: callers keep it in a
// gom::SharedPointer<ISemaphore>. Any thread may signal or wait; every signal
// wakes all waiters, which race for the count.
//
// Kept as the platform layer has always behaved: the timed wait measures its
// deadline on the monotonic clock but waits on the realtime clock, so the
// deadline has always passed. tryWait takes a positive count at once and
// otherwise returns 2 at once, whatever the milliseconds.
#ifndef LODESTACK_CORE_ISEMAPHORE_H
#define LODESTACK_CORE_ISEMAPHORE_H

#include "lodestack/core/Export.h"
#include "lodestack/gom/ReferenceCountable.h"

namespace lodestack {
namespace core {

class LODESTACK_EXPORT ISemaphore : public gom::ReferenceCountable {
 public:
  ~ISemaphore() override;

  // Blocks until the count is positive and takes one: 1 taken, 0 failure.
  virtual int wait() = 0;
  // 1 taken, 2 timed out (at once when the count is 0, see above), 0 failure.
  virtual int tryWait(unsigned int ms) = 0;
  // Adds `count` and wakes every waiter. Stores the count before the call in
  // *previous when given (also when refusing). False, count unchanged, when
  // the result would exceed the maximum.
  virtual bool signal(unsigned int count, unsigned int* previous) = 0;
  // Drops the count to 0; false on a system failure.
  virtual bool zero() = 0;

  // A semaphore with the given ceiling, or null when `maximum` is 0 or
  // `initial` is not 0 (only empty semaphores can be made). The caller owns
  // the result (count 0): wrap it in a SharedPointer.
  static ISemaphore* create(unsigned int initial, unsigned int maximum);
};

}  // namespace core
}  // namespace lodestack

#endif  // LODESTACK_CORE_ISEMAPHORE_H
