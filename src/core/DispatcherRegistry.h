// The per-thread registry of dispatchers.
#ifndef LODESTACK_SRC_CORE_DISPATCHERREGISTRY_H
#define LODESTACK_SRC_CORE_DISPATCHERREGISTRY_H

namespace lodestack {
namespace core {

class LinPollAsyncCallDispatcher;
class LinGlibAsyncCallDispatcher;

// The calling thread's slots. The dispatcher pointers hold no reference; a
// dispatcher clears its own slot when it is destroyed.
struct ThreadDispatchers {
  int mainLoopType;  // 0: unset
  LinPollAsyncCallDispatcher* poll;
  LinGlibAsyncCallDispatcher* glib;
};

ThreadDispatchers& threadDispatchers();

// Clears `slot` when it names `self` (a dispatcher may die on another thread).
template <class T>
void clearSlot(T*& slot, T* self) {
  if (slot == self) slot = nullptr;
}

}  // namespace core
}  // namespace lodestack

#endif  // LODESTACK_SRC_CORE_DISPATCHERREGISTRY_H
