// LinGlibAsyncCallDispatcher: a dispatcher living in the GLib default main
// context.
//
// It adds one custom source to the default GMainContext that watches the
// wake-up socket and every attached descriptor, so queued calls and timers
// run inside an application's ordinary GLib main loop, or from sleep, which
// runs one iteration of that context. One per thread, made by create() (or
// AsyncCallDispatcher::openDispatcher with MainLoopGlib or the thread's
// default) and shared by everybody on that thread. Every GLib dispatcher, on
// whatever thread it was made, attaches to the process's default main
// context: calls queued on one thread's GLib dispatcher, its sinks and its
// timers run on whichever thread iterates that context (an application's
// GMainLoop, or any thread's sleep). That thread is their real owner: keep
// GLib dispatchers on the one thread that iterates the default context.
#ifndef LODESTACK_CORE_LINGLIBASYNCCALLDISPATCHER_H
#define LODESTACK_CORE_LINGLIBASYNCCALLDISPATCHER_H

#include <poll.h>

#include <list>

#include "lodestack/core/Export.h"
#include "lodestack/core/LinAsyncCallDispatcher.h"

struct _GSource;  // GLib's source; this header does not need GLib itself

namespace lodestack {
namespace core {

class LODESTACK_EXPORT LinGlibAsyncCallDispatcher : public LinAsyncCallDispatcher {
 public:
  // The calling thread's GLib dispatcher, made on first use; null when it
  // cannot be made. Count 0 when new: wrap it in a SharedPointer.
  static LinGlibAsyncCallDispatcher* create();
  ~LinGlibAsyncCallDispatcher() override;

  bool sleep() override;
  // Runs one blocking iteration of the default main context, bounding the
  // wait by `timeoutMs` through this dispatcher's source; other sources of
  // the context run in the same iteration. 1 when something was dispatched,
  // else 0.
  int sleep(int timeoutMs) override;

 protected:
  bool doAttachPollSink(const pollfd& p) override;
  // Deferred: the entry is only marked here and erased at the end of the
  // current (or next) dispatch, as GLib or a walk in progress may hold it.
  void doDetachPollSink(const pollfd& p) override;

 private:
  struct Source;
  // Laid out as GLib's GPollFD, whose address GLib keeps.
  struct PollEntry {
    int fd;
    unsigned short events;  // 0 once detached
    unsigned short revents;
  };

  LinGlibAsyncCallDispatcher();
  bool init();
  void removeDetachedPollers();

  static LinGlibAsyncCallDispatcher* dispatcherOf(_GSource* source);
  static int prepareStatic(_GSource* source, int* timeout);
  static int checkStatic(_GSource* source);
  static int dispatchStatic(_GSource* source, int (*callback)(void*), void* data);
  static void finalizeStatic(_GSource* source);

  Source* source_;
  std::list<PollEntry> entries_;  // list nodes: addresses stay put
  int sleepTimeout_;              // -1 outside sleep(int)
};

}  // namespace core
}  // namespace lodestack

#endif  // LODESTACK_CORE_LINGLIBASYNCCALLDISPATCHER_H
