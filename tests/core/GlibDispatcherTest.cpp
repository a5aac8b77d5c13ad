#include <glib.h>
#include <gtest/gtest.h>

#include "core/CoreTestSupport.h"
#include "lodestack/core/ITimer.h"
#include "lodestack/core/LinGlibAsyncCallDispatcher.h"

namespace lodestack::core {
namespace {

using namespace testing;

void quitLoop(void* loop) { g_main_loop_quit(static_cast<GMainLoop*>(loop)); }

// Ticks three times, then stops and queues the call that quits the loop.
struct Ticker : ITimerObserver {
  IAsyncCallDispatcher* dispatcher = nullptr;
  GMainLoop* loop = g_main_loop_new(nullptr, FALSE);
  int ticks = 0;
  ~Ticker() override { g_main_loop_unref(loop); }
  void timeout(ITimer* timer) override {
    if (++ticks == 3) {
      EXPECT_EQ(timer->stop(), 0);
      dispatcher->queueAsyncCall(&quitLoop, loop);
    }
  }
};

// Queued calls and timers run inside an application's own GMainLoop.
TEST(GlibDispatcher, RunsInsideAnApplicationsMainLoop) {
  CallLog log;
  gLog = &log;
  SharedPointer<IAsyncCallDispatcher> dispatcher =
      AsyncCallDispatcher::openDispatcher(AsyncCallDispatcher::MainLoopGlib);
  ASSERT_TRUE(dispatcher);
  Ticker ticker;
  ticker.dispatcher = dispatcher.get();
  SharedPointer<ITimer> timer(ITimer::create(&ticker));
  ASSERT_TRUE(timer) << "the timer joins the thread's GLib dispatcher";

  FunctionThread producer([&] {
    for (long i = 0; i < 500; ++i) ticker.dispatcher->queueAsyncCall(&logCall, asParam(i));
  });
  ASSERT_TRUE(producer.thread().wait());
  ASSERT_EQ(timer->start(20, 0), 0);

  const guint guard = g_timeout_add_seconds(
      30,
      [](gpointer loop) -> gboolean {
        ADD_FAILURE() << "the loop was never quit";
        g_main_loop_quit(static_cast<GMainLoop*>(loop));
        return G_SOURCE_REMOVE;
      },
      ticker.loop);
  g_main_loop_run(ticker.loop);
  g_source_remove(guard);

  EXPECT_EQ(ticker.ticks, 3);
  ASSERT_EQ(log.calls.size(), 500u) << "all queued calls ran before the quit";
  for (long i = 0; i < 500; ++i) ASSERT_EQ(log.calls[i], i);
  EXPECT_TRUE(log.allOnOwner);
  gLog = nullptr;
}

TEST(GlibDispatcher, DetachInsideADispatchIsDeferred) {
  SharedPointer<IAsyncCallDispatcher> opened =
      AsyncCallDispatcher::openDispatcher(AsyncCallDispatcher::MainLoopGlib);
  auto* dispatcher = dynamic_cast<LinGlibAsyncCallDispatcher*>(opened.get());
  ASSERT_NE(dispatcher, nullptr);
  SocketPair a, b;
  CountingSink sinkA, sinkB, sinkC;
  ASSERT_TRUE(dispatcher->attachPollSink(a.watch(), &sinkA));
  ASSERT_TRUE(dispatcher->attachPollSink(b.watch(), &sinkB));
  ASSERT_TRUE(a.fill() && b.fill());

  // In one dispatch, whichever sink runs first detaches both and hands B's
  // descriptor to a new sink. The detached entries stay valid until the
  // dispatch ends (ASan watches); the other old sink is not called, the new
  // one only from the next dispatch on.
  auto swap = [&] {
    dispatcher->detachPollSink(a.watch());
    dispatcher->detachPollSink(b.watch());
    EXPECT_TRUE(dispatcher->attachPollSink(b.watch(), &sinkC));
  };
  sinkA.action = sinkB.action = swap;
  EXPECT_EQ(dispatcher->sleep(1000), 1);
  EXPECT_EQ(sinkA.calls + sinkB.calls, 1) << "a detached sink ran in the same dispatch";
  EXPECT_EQ(sinkC.calls, 0);

  ASSERT_TRUE(b.fill());
  for (int turn = 0; turn < 10 && sinkC.calls == 0; ++turn) dispatcher->sleep(200);
  EXPECT_GE(sinkC.calls, 1);
  EXPECT_EQ(sinkA.calls + sinkB.calls, 1);
}

}  // namespace
}  // namespace lodestack::core
