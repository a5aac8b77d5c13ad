// IAsyncCallDispatcher: the event loop of one thread.
//
// Every deferred call, descriptor event and timer expiry of the library runs
// on the thread that owns the dispatcher (the thread that opened it through
// AsyncCallDispatcher::openDispatcher) from inside its sleep operations, or,
// for the GLib kind, from the thread's GLib main loop. Any thread may queue
// and remove calls; sleep belongs to the owning thread only. Reference
// counted with a non-atomic count: copy and drop SharedPointers on the owning
// thread only, and hand other threads a plain pointer for queueing. A
// callback may drop the last handle to the dispatcher that runs it; the
// dispatcher goes once the current sleep or dispatch is over.
//
// After fork the child shares the parent's wake-up socket pair, so either
// side may read the other's records: the child must not use a dispatcher
// inherited from the parent, and on the forking thread openDispatcher would
// return exactly that one.
#ifndef LODESTACK_CORE_IASYNCCALLDISPATCHER_H
#define LODESTACK_CORE_IASYNCCALLDISPATCHER_H

#include "lodestack/core/Export.h"
#include "lodestack/core/IAsyncCallReceiver.h"
#include "lodestack/gom/ReferenceCountable.h"

namespace lodestack {
namespace core {

class LODESTACK_EXPORT IAsyncCallDispatcher : public gom::ReferenceCountable {
 public:
  ~IAsyncCallDispatcher() override;

  // Queue one call of function(param) (or receiver->handleAsyncCall(param))
  // on the owning thread. True when stored; false when the lock could not be
  // taken. Any thread. Each stored call runs at most once, in queueing order.
  virtual bool queueAsyncCall(void (*function)(void*), void* param) = 0;
  virtual bool queueAsyncCall(IAsyncCallReceiver* receiver, void* param) = 0;
  // Drop pending calls. Deliberately broad: the function form drops every
  // pending function call whatever its function, the receiver form every
  // pending receiver call whatever its receiver (a null receiver: nothing).
  // When the lock cannot be taken nothing is dropped.
  virtual void removeAllAsyncCall(void (*function)(void*)) = 0;
  virtual void removeAllAsyncCall(IAsyncCallReceiver* receiver) = 0;

  // sleep(-1) == 1: blocks until one event was handled.
  virtual bool sleep() = 0;
  // Waits up to `timeoutMs` (-1: no limit) and handles what is ready. The
  // poll kind returns 2 on time-out, 1 when at least one callback ran and 0
  // otherwise (poll failed, or what was ready was not dispatched). The GLib
  // kind runs one iteration of the default main context and returns 1 when
  // it dispatched anything there (another source too), 0 otherwise,
  // time-out included.
  virtual int sleep(int timeoutMs) = 0;
};

}  // namespace core
}  // namespace lodestack

#endif  // LODESTACK_CORE_IASYNCCALLDISPATCHER_H
