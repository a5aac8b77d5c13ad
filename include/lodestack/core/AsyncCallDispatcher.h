// AsyncCallDispatcher: opens the calling thread's dispatcher.
//
// Each thread has at most one dispatcher of each kind, kept in a per-thread
// registry without holding a reference: opening twice on one thread gives the
// same object, and once the last SharedPointer is gone the next open makes a
// new one. Call from the thread that will run the loop.
#ifndef LODESTACK_CORE_ASYNCCALLDISPATCHER_H
#define LODESTACK_CORE_ASYNCCALLDISPATCHER_H

#include "lodestack/core/Export.h"
#include "lodestack/core/IAsyncCallDispatcher.h"
#include "lodestack/gom/SharedPointer.h"

namespace lodestack {
namespace core {

class LODESTACK_EXPORT AsyncCallDispatcher {
 public:
  // Values 1, 2 and above 4 are representable but open nothing.
  enum MainLoopType : int {
    MainLoopDefault = 0,  // the thread's chosen type; GLib when none
    MainLoopPoll = 3,     // LinPollAsyncCallDispatcher
    MainLoopGlib = 4      // LinGlibAsyncCallDispatcher
  };

  AsyncCallDispatcher() = delete;

  // Chooses the calling thread's type, once, early. A non-zero type when one
  // is already set throws Status Refused; MainLoopDefault clears the choice.
  static void setMainLoopType(MainLoopType type);
  // The calling thread's dispatcher of the given kind (MainLoopDefault: the
  // thread's type, GLib when unset); empty for other values or when it
  // cannot be made.
  static gom::SharedPointer<IAsyncCallDispatcher> openDispatcher(MainLoopType type);
  static gom::SharedPointer<IAsyncCallDispatcher> openLinPollAsyncDispatcher();
  static gom::SharedPointer<IAsyncCallDispatcher> openLinGlibAsyncDispatcher();
};

}  // namespace core
}  // namespace lodestack

#endif  // LODESTACK_CORE_ASYNCCALLDISPATCHER_H
