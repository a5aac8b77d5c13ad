#include "lodestack/core/AsyncCallDispatcherCommon.h"

#include "core/GuardedCall.h"
#include "lodestack/core/Status.h"

namespace lodestack {
namespace core {

IAsyncCallReceiver::~IAsyncCallReceiver() = default;
IAsyncCallDispatcher::~IAsyncCallDispatcher() = default;

namespace {
const AsyncCallDispatcherCommon::Delegate kBlank = {nullptr, nullptr, nullptr};
}  // namespace

// The blank entry under nextId_ is kept on purpose (see the class comment).
AsyncCallDispatcherCommon::AsyncCallDispatcherCommon() : nextId_(1) {
  pending_.value()[nextId_] = kBlank;
}

// Pending calls are dropped, not run.
AsyncCallDispatcherCommon::~AsyncCallDispatcherCommon() {
  ScopedLock lock(pending_);
  pending_.value().clear();
}

bool AsyncCallDispatcherCommon::queueAsyncCall(void (*function)(void*), void* param) {
  return doQueueAsyncCall({nullptr, function, param});
}

bool AsyncCallDispatcherCommon::queueAsyncCall(IAsyncCallReceiver* receiver, void* param) {
  return doQueueAsyncCall({receiver, nullptr, param});
}

void AsyncCallDispatcherCommon::removeAllAsyncCall(void (*function)(void*)) {
  removeDelegate({nullptr, function, nullptr});
}

void AsyncCallDispatcherCommon::removeAllAsyncCall(IAsyncCallReceiver* receiver) {
  if (receiver) removeDelegate({receiver, nullptr, nullptr});
}

bool AsyncCallDispatcherCommon::doQueueAsyncCall(const Delegate& delegate) {
  return guardedCall([&] { addDelegate(delegate); });
}

void AsyncCallDispatcherCommon::addDelegate(const Delegate& delegate) {
  ScopedLock lock(pending_);
  if (!lock.locked()) throw Failed;
  DelegateMap& map = pending_.value();
  map[nextId_] = delegate;
  doScheduleDelegate(nextId_);
  ++nextId_;
  map[nextId_] = kBlank;
}

// Matches on receiver OR function. Every function entry has a null receiver
// and every receiver entry a null function, so each form sweeps its whole
// kind, blank entry included; kept deliberately. Without the lock nothing
// is removed.
void AsyncCallDispatcherCommon::removeDelegate(const Delegate& pattern) {
  ScopedLock lock(pending_);
  if (!lock.locked()) return;
  DelegateMap& map = pending_.value();
  for (auto it = map.begin(); it != map.end();) {
    if (it->second.receiver == pattern.receiver || it->second.function == pattern.function)
      it = map.erase(it);
    else
      ++it;
  }
}

void AsyncCallDispatcherCommon::invokeDelegate(unsigned int id) {
  Delegate delegate;
  {
    // Found and erased in one step: the call runs at most once. Without the
    // lock it is not found.
    ScopedLock lock(pending_);
    if (!lock.locked()) return;
    DelegateMap& map = pending_.value();
    duringTake();
    const auto it = map.find(id);
    if (it == map.end()) return;
    delegate = it->second;
    map.erase(it);
  }
  guardedCall([&] {
    if (delegate.function)
      delegate.function(delegate.param);
    else if (delegate.receiver)
      delegate.receiver->handleAsyncCall(delegate.param);
  });
}

}  // namespace core
}  // namespace lodestack
