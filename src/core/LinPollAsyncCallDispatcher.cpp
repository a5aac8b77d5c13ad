#include "lodestack/core/LinPollAsyncCallDispatcher.h"

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
  // Callbacks may attach or detach while we walk: walk a copy.
  std::vector<pollfd> ready(watched_);
  const int n = poll(ready.data(), ready.size(), timeoutMs);
  if (n < 0) return 0;
  if (n == 0) return 2;
  bool handled = false;
  for (pollfd& p : ready) {
    // Exactly POLLIN: input together with an error or hang-up is skipped.
    if (p.revents != POLLIN) continue;
    // An earlier callback may have consumed the input meanwhile.
    pollfd again = {p.fd, p.events, 0};
    if (poll(&again, 1, 0) == 1 && again.revents == POLLIN && invokeCallback(again))
      handled = true;
  }
  return handled ? 1 : 0;
}

}  // namespace core
}  // namespace lodestack
