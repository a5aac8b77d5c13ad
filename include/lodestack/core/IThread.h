// IThread: a POSIX thread that runs an IThreadObserver's threadMain.
//
// Made by IThread::create and reference counted: callers keep it in a
// gom::SharedPointer<IThread>. A new thread first waits on its start gate and
// runs threadMain only after resume(). Destroying the object cancels a
// thread that was not joined, without waiting for it: one dropped before
// resume() ends at its gate without running threadMain, but one already
// running goes on until its next cancellation point, so call wait() (or see
// isRunning() report false) before dropping the last handle. The observer is
// not owned. The library itself starts no thread; this is offered to its
// users.
#ifndef LODESTACK_CORE_ITHREAD_H
#define LODESTACK_CORE_ITHREAD_H

#include "lodestack/core/Export.h"
#include "lodestack/gom/ReferenceCountable.h"

namespace lodestack {
namespace core {

class LODESTACK_EXPORT IThreadObserver {
 public:
  virtual ~IThreadObserver();
  // The body of the thread; its return ends the thread.
  virtual void threadMain() = 0;
};

class LODESTACK_EXPORT IThread : public gom::ReferenceCountable {
 public:
  ~IThread() override;

  // Joins the thread; true on success.
  virtual bool wait() = 0;
  // Joins with a deadline of `ms` milliseconds on the realtime clock (no
  // carry into the seconds, as IMutex::tryLock): 1 joined, 2 timed out,
  // 0 failure.
  virtual int tryWait(unsigned int ms) = 0;
  // Opens the start gate. A second resume before the thread has started
  // fails (the gate holds at most one).
  virtual bool resume() = 0;
  // True while the thread runs. A finished thread is joined by this very
  // call, which reports false from then on.
  virtual bool isRunning() const = 0;

  // A thread for `observer`, started at once unless `suspended`; null when
  // the thread cannot be made. The caller owns the result (count 0).
  static IThread* create(IThreadObserver* observer, bool suspended);
  // Returns at once without sleeping; kept so for its existing callers.
  static void sleep(int ms);
};

}  // namespace core
}  // namespace lodestack

#endif  // LODESTACK_CORE_ITHREAD_H
