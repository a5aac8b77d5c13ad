#include <glib.h>
#include <gtest/gtest.h>
#include <sys/socket.h>
#include <unistd.h>

#include <functional>
#include <thread>
#include <vector>

#include "core/CoreTestSupport.h"
#include "lodestack/core/AsyncCallDispatcher.h"
#include "lodestack/core/ITimer.h"
#include "lodestack/core/LinGlibAsyncCallDispatcher.h"

namespace lodestack {
namespace core {
namespace {

using gom::SharedPointer;
using testing::FunctionThread;

struct LoopState {
  GMainLoop* loop = nullptr;
  std::vector<long> calls;
  std::thread::id owner = std::this_thread::get_id();
  bool allOnOwner = true;
  int ticks = 0;
};
LoopState* gState = nullptr;

void recordCall(void* param) {
  gState->allOnOwner = gState->allOnOwner && std::this_thread::get_id() == gState->owner;
  gState->calls.push_back(reinterpret_cast<long>(param));
}
void quitLoop(void*) { g_main_loop_quit(gState->loop); }

// Ticks three times, then queues the call that quits the loop.
struct Ticker : ITimerObserver {
  IAsyncCallDispatcher* dispatcher = nullptr;
  void timeout(ITimer* timer) override {
    if (++gState->ticks == 3) {
      EXPECT_EQ(timer->stop(), 0);
      dispatcher->queueAsyncCall(&quitLoop, nullptr);
    }
  }
};

// Queued calls and timers run inside an application's own GMainLoop.
TEST(GlibDispatcher, RunsInsideAnApplicationsMainLoop) {
  LoopState state;
  gState = &state;
  SharedPointer<IAsyncCallDispatcher> dispatcher =
      AsyncCallDispatcher::openDispatcher(AsyncCallDispatcher::MainLoopGlib);
  ASSERT_TRUE(dispatcher);
  Ticker ticker;
  ticker.dispatcher = dispatcher.get();
  SharedPointer<ITimer> timer(ITimer::create(&ticker));
  ASSERT_TRUE(timer) << "the timer joins the thread's GLib dispatcher";

  IAsyncCallDispatcher* target = dispatcher.get();
  FunctionThread producer([&] {
    for (long i = 0; i < 500; ++i) target->queueAsyncCall(&recordCall, reinterpret_cast<void*>(i));
  });
  ASSERT_TRUE(producer.thread().wait());
  ASSERT_EQ(timer->start(20, 0), 0);

  state.loop = g_main_loop_new(nullptr, FALSE);
  guint guard = g_timeout_add_seconds(
      30, [](gpointer loop) -> gboolean {
        ADD_FAILURE() << "the loop was never quit";
        g_main_loop_quit(static_cast<GMainLoop*>(loop));
        return G_SOURCE_REMOVE;
      },
      state.loop);
  g_main_loop_run(state.loop);
  g_source_remove(guard);
  g_main_loop_unref(state.loop);

  EXPECT_EQ(state.ticks, 3);
  ASSERT_EQ(state.calls.size(), 500u) << "all queued calls ran before the quit";
  for (long i = 0; i < 500; ++i) ASSERT_EQ(state.calls[i], i);
  EXPECT_TRUE(state.allOnOwner);
  gState = nullptr;
}

struct CountingSink : IPollSink {
  int calls = 0;
  std::function<void()> action;
  void handlePollEvent(const pollfd& p) override {
    ++calls;
    char byte;
    EXPECT_EQ(read(p.fd, &byte, 1), 1);
    if (action) action();
  }
};

TEST(GlibDispatcher, DetachInsideADispatchIsDeferred) {
  SharedPointer<IAsyncCallDispatcher> opened =
      AsyncCallDispatcher::openDispatcher(AsyncCallDispatcher::MainLoopGlib);
  auto* dispatcher = dynamic_cast<LinGlibAsyncCallDispatcher*>(opened.get());
  ASSERT_NE(dispatcher, nullptr);

  int a[2], b[2];
  ASSERT_EQ(socketpair(AF_UNIX, SOCK_STREAM, 0, a), 0);
  ASSERT_EQ(socketpair(AF_UNIX, SOCK_STREAM, 0, b), 0);
  const pollfd watchA = {a[0], POLLIN, 0}, watchB = {b[0], POLLIN, 0};
  CountingSink sinkA, sinkB, sinkC;
  ASSERT_TRUE(dispatcher->attachPollSink(watchA, &sinkA));
  ASSERT_TRUE(dispatcher->attachPollSink(watchB, &sinkB));
  ASSERT_EQ(write(a[1], "x", 1), 1);
  ASSERT_EQ(write(b[1], "x", 1), 1);

  // In one dispatch, whichever sink runs first detaches both and hands B's
  // descriptor to a new sink. The detached entries stay valid until the
  // dispatch ends; the other old sink is not called, the new one only later.
  auto swap = [&] {
    dispatcher->detachPollSink(watchA);
    dispatcher->detachPollSink(watchB);
    EXPECT_TRUE(dispatcher->attachPollSink(watchB, &sinkC));
  };
  sinkA.action = swap;
  sinkB.action = swap;
  EXPECT_EQ(dispatcher->sleep(1000), 1);
  EXPECT_EQ(sinkA.calls + sinkB.calls, 1) << "a detached sink ran in the same dispatch";
  EXPECT_EQ(sinkC.calls, 0);

  // The old input of B (if unread) and a new byte reach the new sink.
  ASSERT_EQ(write(b[1], "y", 1), 1);
  for (int turn = 0; turn < 10 && sinkC.calls == 0; ++turn) dispatcher->sleep(200);
  EXPECT_GE(sinkC.calls, 1);
  EXPECT_EQ(sinkA.calls + sinkB.calls, 1);
  dispatcher->detachPollSink(watchB);
  EXPECT_EQ(dispatcher->sleep(0), 0) << "nothing to dispatch";
  for (int fd : {a[0], a[1], b[0], b[1]}) close(fd);
}

}  // namespace
}  // namespace core
}  // namespace lodestack
