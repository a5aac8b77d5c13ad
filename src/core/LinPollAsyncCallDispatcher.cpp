#include "lodestack/core/LinPollAsyncCallDispatcher.h"

#include <algorithm>
#include <new>

#include "core/DispatcherRegistry.h"
#include "lodestack/gom/SharedPointer.h"

namespace lodestack {
namespace core {

LinPollAsyncCallDispatcher* LinPollAsyncCallDispatcher::create() {
  LinPollAsyncCallDispatcher*& slot = threadDispatchers().poll;
  if (slot) return dynamic_cast<LinPollAsyncCallDispatcher*>(slot);
  LinPollAsyncCallDispatcher* dispatcher = new (std::nothrow) LinPollAsyncCallDispatcher;
  if (!dispatcher) return nullptr;
  if (!dispatcher->init()) {
    delete dispatcher;
    return nullptr;
  }
  slot = dispatcher;
  return dispatcher;
}

LinPollAsyncCallDispatcher::LinPollAsyncCallDispatcher() = default;

LinPollAsyncCallDispatcher::~LinPollAsyncCallDispatcher() {
  clearSlot(threadDispatchers().poll, this);
}

bool LinPollAsyncCallDispatcher::init() {
  if (!baseInit()) return false;
  return attachPollSink({readFd_, POLLIN, 0}, this);
}

// Watched for input, errors and peer hang-up whatever the caller asked for.
bool LinPollAsyncCallDispatcher::doAttachPollSink(const pollfd& p) {
  watched_.push_back({p.fd, POLLIN | POLLERR | POLLRDHUP, 0});
  return true;
}

void LinPollAsyncCallDispatcher::doDetachPollSink(const pollfd& p) {
  for (auto it = watched_.begin(); it != watched_.end(); ++it) {
    if (it->fd == p.fd) {
      watched_.erase(it);
      return;
    }
  }
}

bool LinPollAsyncCallDispatcher::sleep() { return sleep(-1) == 1; }

int LinPollAsyncCallDispatcher::sleep(int timeoutMs) {
  if (readFd_ == 0) return 0;
  // A callback may drop the last handle to this dispatcher; finish first.
  gom::SharedPointer<LinPollAsyncCallDispatcher> keepAlive(this);
  resendUnsent();
  // Callbacks may attach or detach while we walk: walk a copy (on the stack
  // for the usual handful of descriptors).
  constexpr size_t kOnStack = 16;
  pollfd onStack[kOnStack];
  std::vector<pollfd> onHeap;
  pollfd* ready = onStack;
  const size_t n = watched_.size();
  if (n > kOnStack) {
    onHeap = watched_;
    ready = onHeap.data();
  } else {
    std::copy(watched_.begin(), watched_.end(), onStack);
  }
  const int result = poll(ready, n, timeoutMs);
  if (result < 0) return 0;
  if (result == 0) return 2;
  bool handled = false;
  for (size_t i = 0; i < n; ++i) {
    // Exactly POLLIN: input together with an error or hang-up is skipped.
    if (ready[i].revents != POLLIN) continue;
    pollfd p = {ready[i].fd, ready[i].events, POLLIN};
    // An earlier callback may have consumed the input meanwhile.
    if (!readsWithoutBlocking(p.fd) && (poll(&p, 1, 0) != 1 || p.revents != POLLIN)) continue;
    if (invokeCallback(p)) handled = true;
  }
  return handled ? 1 : 0;
}

}  // namespace core
}  // namespace lodestack
