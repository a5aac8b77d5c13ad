#include "lodestack/core/AsyncCallDispatcher.h"

#include "core/DispatcherRegistry.h"
#include "lodestack/core/LinGlibAsyncCallDispatcher.h"
#include "lodestack/core/LinPollAsyncCallDispatcher.h"
#include "lodestack/core/Status.h"

namespace lodestack {
namespace core {

ThreadDispatchers& threadDispatchers() {
  static thread_local ThreadDispatchers slots = {0, nullptr, nullptr};
  return slots;
}

void AsyncCallDispatcher::setMainLoopType(MainLoopType type) {
  int& current = threadDispatchers().mainLoopType;
  if (type != MainLoopDefault && current != 0) throw Refused;
  current = type;
}

gom::SharedPointer<IAsyncCallDispatcher> AsyncCallDispatcher::openDispatcher(
    MainLoopType type) {
  switch (type) {
    case MainLoopPoll:
      return openLinPollAsyncDispatcher();
    case MainLoopGlib:
      return openLinGlibAsyncDispatcher();
    case MainLoopDefault: {
      const int chosen = threadDispatchers().mainLoopType;
      return openDispatcher(chosen == 0 ? MainLoopGlib : static_cast<MainLoopType>(chosen));
    }
    default:
      return gom::SharedPointer<IAsyncCallDispatcher>();
  }
}

gom::SharedPointer<IAsyncCallDispatcher> AsyncCallDispatcher::openLinPollAsyncDispatcher() {
  return gom::SharedPointer<IAsyncCallDispatcher>(LinPollAsyncCallDispatcher::create());
}

gom::SharedPointer<IAsyncCallDispatcher> AsyncCallDispatcher::openLinGlibAsyncDispatcher() {
  return gom::SharedPointer<IAsyncCallDispatcher>(LinGlibAsyncCallDispatcher::create());
}

}  // namespace core
}  // namespace lodestack
