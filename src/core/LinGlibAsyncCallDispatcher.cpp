#include "lodestack/core/LinGlibAsyncCallDispatcher.h"

#include <glib.h>

#include <cstddef>
#include <new>

#include "core/DispatcherRegistry.h"
#include "lodestack/gom/SharedPointer.h"

namespace lodestack {
namespace core {

// GLib's source extended by its attach id and the dispatcher it serves.
struct LinGlibAsyncCallDispatcher::Source {
  GSource base;
  guint id;
  LinGlibAsyncCallDispatcher* dispatcher;
};

static_assert(sizeof(GPollFD) == sizeof(int) + 2 * sizeof(unsigned short) &&
                  offsetof(GPollFD, fd) == 0 &&
                  offsetof(GPollFD, events) == sizeof(int),
              "poll entries must be laid out as GPollFD");

namespace {
constexpr unsigned short kWatchedEvents = G_IO_IN | G_IO_ERR | G_IO_HUP;

GPollFD* asGPollFD(void* entry) { return static_cast<GPollFD*>(entry); }
}  // namespace

LinGlibAsyncCallDispatcher* LinGlibAsyncCallDispatcher::dispatcherOf(_GSource* source) {
  return reinterpret_cast<Source*>(source)->dispatcher;
}

LinGlibAsyncCallDispatcher* LinGlibAsyncCallDispatcher::create() {
  LinGlibAsyncCallDispatcher*& slot = threadDispatchers().glib;
  if (slot) return dynamic_cast<LinGlibAsyncCallDispatcher*>(slot);
  LinGlibAsyncCallDispatcher* dispatcher = new (std::nothrow) LinGlibAsyncCallDispatcher;
  if (!dispatcher) return nullptr;
  if (!dispatcher->init()) {
    delete dispatcher;
    return nullptr;
  }
  slot = dispatcher;
  return dispatcher;
}

LinGlibAsyncCallDispatcher::LinGlibAsyncCallDispatcher()
    : source_(nullptr), sleepTimeout_(-1) {}

LinGlibAsyncCallDispatcher::~LinGlibAsyncCallDispatcher() {
  if (source_) {
    GSource* source = &source_->base;
    source_->dispatcher = nullptr;
    if (!g_source_is_destroyed(source)) g_source_remove(source_->id);
    g_source_destroy(source);
    g_source_unref(source);
    source_ = nullptr;
  }
  clearSlot(threadDispatchers().glib, this);
  entries_.clear();
}

bool LinGlibAsyncCallDispatcher::init() {
  if (!baseInit()) return false;
  static GSourceFuncs funcs = {
      &prepareStatic, &checkStatic, &dispatchStatic, &finalizeStatic, nullptr, nullptr};
  GSource* source = g_source_new(&funcs, sizeof(Source));
  const guint id = g_source_attach(source, nullptr);
  if (id != 0) {
    source_ = reinterpret_cast<Source*>(source);
    source_->id = id;
    source_->dispatcher = this;
  } else {
    g_source_destroy(source);
    g_source_unref(source);
  }
  return attachPollSink({readFd_, POLLIN, 0}, this);
}

bool LinGlibAsyncCallDispatcher::doAttachPollSink(const pollfd& p) {
  entries_.push_back({p.fd, kWatchedEvents, 0});
  if (source_) g_source_add_poll(&source_->base, asGPollFD(&entries_.back()));
  return true;
}

// Marked only; removeDetachedPollers erases it after the dispatch.
void LinGlibAsyncCallDispatcher::doDetachPollSink(const pollfd& p) {
  for (PollEntry& entry : entries_) {
    if (entry.fd == p.fd && entry.events != 0) {
      if (source_) g_source_remove_poll(&source_->base, asGPollFD(&entry));
      entry.events = 0;
      entry.fd = -entry.fd;
      return;
    }
  }
}

void LinGlibAsyncCallDispatcher::removeDetachedPollers() {
  entries_.remove_if([](const PollEntry& entry) { return entry.events == 0; });
}

bool LinGlibAsyncCallDispatcher::sleep() { return sleep(-1) == 1; }

int LinGlibAsyncCallDispatcher::sleep(int timeoutMs) {
  // A callback may drop the last handle to this dispatcher; finish first.
  gom::SharedPointer<LinGlibAsyncCallDispatcher> keepAlive(this);
  sleepTimeout_ = timeoutMs;
  const gboolean dispatched = g_main_context_iteration(nullptr, TRUE);
  sleepTimeout_ = -1;
  return dispatched ? 1 : 0;
}

int LinGlibAsyncCallDispatcher::prepareStatic(_GSource* source, int* timeout) {
  LinGlibAsyncCallDispatcher* self = dispatcherOf(source);
  if (!self) return FALSE;
  self->resendUnsent();
  *timeout = self->sleepTimeout_;
  return FALSE;
}

int LinGlibAsyncCallDispatcher::checkStatic(_GSource* source) {
  LinGlibAsyncCallDispatcher* self = dispatcherOf(source);
  if (!self) return FALSE;
  for (const PollEntry& entry : self->entries_)
    if (entry.events != 0 && entry.revents == G_IO_IN) return TRUE;
  return FALSE;
}

int LinGlibAsyncCallDispatcher::dispatchStatic(_GSource* source, int (*)(void*), void*) {
  LinGlibAsyncCallDispatcher* self = dispatcherOf(source);
  if (!self) return TRUE;
  // A callback may drop the last handle to the dispatcher; finish first.
  gom::SharedPointer<LinGlibAsyncCallDispatcher> keepAlive(self);
  // Entries appended meanwhile have no revents yet; detached ones stay in
  // the list, marked, until the walk is over.
  for (PollEntry& entry : self->entries_) {
    if (entry.events == 0 || entry.revents != G_IO_IN) continue;
    pollfd p = {entry.fd, POLLIN, POLLIN};
    // An earlier callback may have consumed the input meanwhile.
    if (!self->readsWithoutBlocking(p.fd) && (poll(&p, 1, 0) != 1 || p.revents != POLLIN))
      continue;
    self->invokeCallback(p);
  }
  self->removeDetachedPollers();
  return TRUE;
}

void LinGlibAsyncCallDispatcher::finalizeStatic(_GSource*) {}

}  // namespace core
}  // namespace lodestack
