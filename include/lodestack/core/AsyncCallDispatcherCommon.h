// AsyncCallDispatcherCommon: the pending-call table shared by every kind of
// dispatcher.
//
// Pending calls live in an ordered map from id to Delegate, guarded by a
// Lockable. The map always holds a blank Delegate under `nextId`, the id of
// the next call; it does nothing when invoked and is swept away by the
// removeAllAsyncCall forms like any other matching entry. A back-end tells
// the owning thread about each new id through doScheduleDelegate and hands
// the id back to invokeDelegate on that thread. Pending calls are dropped,
// never run, when the dispatcher is destroyed.
#ifndef LODESTACK_CORE_ASYNCCALLDISPATCHERCOMMON_H
#define LODESTACK_CORE_ASYNCCALLDISPATCHERCOMMON_H

#include <map>

#include "lodestack/core/Export.h"
#include "lodestack/core/IAsyncCallDispatcher.h"
#include "lodestack/core/Lockable.h"

namespace lodestack {
namespace core {

class LODESTACK_EXPORT AsyncCallDispatcherCommon : public IAsyncCallDispatcher {
 public:
  // One queued call: exactly one of receiver and function is set, except in
  // the blank entry, where neither is.
  struct Delegate {
    IAsyncCallReceiver* receiver;
    void (*function)(void*);
    void* param;
  };

  ~AsyncCallDispatcherCommon() override;

  bool queueAsyncCall(void (*function)(void*), void* param) override;
  bool queueAsyncCall(IAsyncCallReceiver* receiver, void* param) override;
  void removeAllAsyncCall(void (*function)(void*)) override;
  void removeAllAsyncCall(IAsyncCallReceiver* receiver) override;

 protected:
  AsyncCallDispatcherCommon();

  // Announces a newly stored id to the owning thread. Called with the map
  // locked, from the queueing thread; the result is informative only.
  virtual bool doScheduleDelegate(unsigned int id) = 0;

  // Called by invokeDelegate with the map locked, before it looks the id up:
  // lets a back-end do its owning-thread bookkeeping under the same lock.
  // Does nothing by default.
  virtual void duringTake() {}

  // Runs the call stored under `id`, if it is still pending (owning thread).
  // The entry is removed before the call, so it runs at most once and the
  // target may queue further calls.
  void invokeDelegate(unsigned int id);

  // The lock of the pending map; back-ends may guard their own bookkeeping
  // of scheduled ids with it. Never take it twice on one thread.
  LockableBase& pendingLock() { return pending_; }

 private:
  using DelegateMap = std::map<unsigned int, Delegate>;

  bool doQueueAsyncCall(const Delegate& delegate);
  void addDelegate(const Delegate& delegate);
  // Erases every entry whose receiver or whose function equals the pattern's.
  void removeDelegate(const Delegate& pattern);

  unsigned int nextId_;  // guarded by pending_
  Lockable<DelegateMap> pending_;
};

}  // namespace core
}  // namespace lodestack

#endif  // LODESTACK_CORE_ASYNCCALLDISPATCHERCOMMON_H
