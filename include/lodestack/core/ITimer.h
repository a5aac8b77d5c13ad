// ITimer: a millisecond timer whose expiries reach an ITimerObserver on the
// calling thread's dispatcher.
//
// Made by ITimer::create on the thread whose dispatcher will deliver the
// expiries (AsyncCallDispatcher::openDispatcher(MainLoopDefault)); it keeps
// that dispatcher alive. Reference counted: keep it in a
// gom::SharedPointer<ITimer>. All operations and every timeout call happen on
// that thread; nothing is locked. The observer is not owned. Operations
// return Status values: 0 Ok, 1 Failed, 6 Refused (no timer descriptor),
// 11 InvalidArgument (a first expiry of 0).
#ifndef LODESTACK_CORE_ITIMER_H
#define LODESTACK_CORE_ITIMER_H

#include "lodestack/core/Export.h"
#include "lodestack/gom/ReferenceCountable.h"

namespace lodestack {
namespace core {

class ITimer;

class LODESTACK_EXPORT ITimerObserver {
 public:
  virtual ~ITimerObserver();
  // One call per expiry. After a long stall one wake-up delivers at most 256
  // calls back to back; further missed expiries are lost. A stop() inside
  // timeout does not shorten such a burst; dropping the last handle to the
  // timer does, so no call follows once the owner has let the timer go.
  virtual void timeout(ITimer* timer) = 0;
};

class LODESTACK_EXPORT ITimer : public gom::ReferenceCountable {
 public:
  ~ITimer() override;

  // Always periodic, deliberately: first expiry after `ms`, then every `ms`,
  // until stop(). `ignored` has no effect. A handler wanting one expiry
  // stops the timer itself.
  virtual int start(int ms, int ignored) = 0;
  // Disarms the timer.
  virtual int stop() = 0;
  // First expiry after `firstMs`, then every `intervalMs` (0: once only).
  // Re-arming replaces any earlier setting. `ignored` has no effect.
  virtual int start(long long firstMs, unsigned long long intervalMs,
                    unsigned int ignored) = 0;

  // A disarmed timer for `observer`, or null for a null observer or when the
  // thread's dispatcher is not a Linux one or the timer cannot be made. The
  // caller owns the result (count 0): wrap it in a SharedPointer.
  static ITimer* create(ITimerObserver* observer);
};

}  // namespace core
}  // namespace lodestack

#endif  // LODESTACK_CORE_ITIMER_H
