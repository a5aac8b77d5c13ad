// IMutex: a process-local mutual-exclusion lock.
//
// Made by IMutex::create and reference counted: callers keep it in a
// gom::SharedPointer<IMutex>. Every mutex of the library is a plain
// (non-recursive) mutex, so a thread that locks it twice blocks on itself.
// lock/tryLock/unlock may be called from any thread; unlock only by the thread
// that holds the lock. Timed operations return 1 acquired, 2 timed out,
// 0 failure.
#ifndef LODESTACK_CORE_IMUTEX_H
#define LODESTACK_CORE_IMUTEX_H

#include <string>

#include "lodestack/core/Export.h"
#include "lodestack/gom/ReferenceCountable.h"

namespace lodestack {
namespace core {

class LODESTACK_EXPORT IMutex : public gom::ReferenceCountable {
 public:
  ~IMutex() override;

  // Blocks until the lock is held; false when the system refused.
  virtual bool lock() = 0;
  // Takes the lock at once (1) or waits up to `ms` milliseconds: 1 acquired,
  // 2 timed out, 0 failure (and 0 at once for `ms` = 0 when the lock is
  // busy). The deadline adds the milliseconds to the realtime clock without
  // carrying into the seconds, so a deadline whose nanoseconds reach a full
  // second is invalid and gives 0.
  virtual int tryLock(unsigned int ms) = 0;
  virtual void unlock() = 0;

  // A new unnamed mutex, or null: named mutexes are not supported (a
  // non-empty `name` gives null), and neither is opening an existing one
  // (`create` = false gives null). `reserved` has no effect. The caller owns
  // the result (count 0): wrap it in a SharedPointer.
  static IMutex* create(const std::wstring& name, bool reserved, bool create);
  // Named mutexes do not exist here: always null.
  static IMutex* open(const std::wstring& name, bool reserved);
};

}  // namespace core
}  // namespace lodestack

#endif  // LODESTACK_CORE_IMUTEX_H
