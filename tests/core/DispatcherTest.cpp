#include <gtest/gtest.h>
#include <sys/socket.h>
#include <unistd.h>

#include <atomic>
#include <cstdlib>
#include <functional>
#include <memory>
#include <stdexcept>
#include <thread>
#include <vector>

#include "core/CoreTestSupport.h"
#include "lodestack/core/AsyncCallDispatcher.h"
#include "lodestack/core/LinGlibAsyncCallDispatcher.h"
#include "lodestack/core/LinPollAsyncCallDispatcher.h"
#include "lodestack/core/Status.h"

namespace lodestack {
namespace core {
namespace {

using gom::SharedPointer;
using testing::FunctionThread;
using testing::LoopTypeScope;
using testing::runUntil;
using Type = AsyncCallDispatcher::MainLoopType;

// What the owner saw: the calls in the order they ran, and on which thread.
struct CallLog {
  std::vector<long> calls;
  std::thread::id owner = std::this_thread::get_id();
  bool allOnOwner = true;
  void record(long value) {
    allOnOwner = allOnOwner && std::this_thread::get_id() == owner;
    calls.push_back(value);
  }
};

CallLog* gLog = nullptr;  // owner thread only
void logCall(void* param) { gLog->record(reinterpret_cast<long>(param)); }
void otherCall(void* param) { gLog->record(-reinterpret_cast<long>(param)); }
void throwingCall(void*) { throw std::runtime_error("discarded by the dispatcher"); }

struct Receiver : IAsyncCallReceiver {
  long base = 0;
  void handleAsyncCall(void* param) override {
    gLog->record(base + reinterpret_cast<long>(param));
  }
};

void* asParam(long value) { return reinterpret_cast<void*>(value); }

class DispatcherTest : public ::testing::TestWithParam<Type> {
 protected:
  void SetUp() override {
    gLog = &log_;
    dispatcher_ = AsyncCallDispatcher::openDispatcher(GetParam());
    ASSERT_TRUE(dispatcher_);
  }
  void TearDown() override { gLog = nullptr; }

  // Runs the loop until `count` calls ran.
  bool runCalls(size_t count, double limitSeconds = 60) {
    return runUntil(*dispatcher_, [&] { return log_.calls.size() >= count; }, limitSeconds);
  }

  CallLog log_;
  SharedPointer<IAsyncCallDispatcher> dispatcher_;
};

TEST_P(DispatcherTest, ProducersQueueWhileOwnerSleeps) {
  constexpr long kProducers = 4, kCalls = 2000;
  IAsyncCallDispatcher* target = dispatcher_.get();  // no handle copies across threads
  std::vector<Receiver> receivers(kProducers);
  std::vector<std::unique_ptr<FunctionThread>> producers;
  for (long p = 0; p < kProducers; ++p) {
    receivers[p].base = p * 1000000;
    producers.emplace_back(new FunctionThread([&, p] {
      for (long i = 0; i < kCalls; ++i) {
        // Odd producers queue receiver calls, even ones function calls.
        const bool ok = p % 2 ? target->queueAsyncCall(&receivers[p], asParam(i))
                              : target->queueAsyncCall(&logCall, asParam(p * 1000000 + i));
        if (!ok) std::abort();
      }
    }));
  }
  // The owner blocks in sleep() and is woken by each record. GLib may wake
  // an iteration for its own reasons (a poll set changed) with nothing to
  // dispatch, so a few idle turns are allowed there.
  const size_t total = kProducers * kCalls;
  int idleTurns = 0;
  while (log_.calls.size() < total) {
    if (!dispatcher_->sleep()) {
      ASSERT_LT(++idleTurns, 5) << "woken with nothing to run";
    }
  }
  if (GetParam() == AsyncCallDispatcher::MainLoopPoll) {
    EXPECT_EQ(idleTurns, 0);
  }
  producers.clear();
  EXPECT_TRUE(log_.allOnOwner) << "every call runs on the owning thread";
  ASSERT_EQ(log_.calls.size(), total);
  std::vector<long> next(kProducers, 0);
  for (long value : log_.calls) {
    const long p = value / 1000000, i = value % 1000000;
    ASSERT_EQ(i, next[p]) << "producer " << p << " out of order or duplicated";
    ++next[p];
  }
  EXPECT_EQ(dispatcher_->sleep(50), GetParam() == AsyncCallDispatcher::MainLoopPoll ? 2 : 0)
      << "nothing left to run";
}

TEST_P(DispatcherTest, OrderRemovalAndDiscardedExceptions) {
  // One call per readiness event, in id order.
  for (long i = 1; i <= 3; ++i) ASSERT_TRUE(dispatcher_->queueAsyncCall(&logCall, asParam(i)));
  ASSERT_TRUE(dispatcher_->queueAsyncCall(&throwingCall, nullptr));
  ASSERT_TRUE(dispatcher_->queueAsyncCall(&logCall, asParam(4)));
  for (size_t ran = 1; ran <= 3; ++ran) {
    ASSERT_EQ(dispatcher_->sleep(1000), 1);
    EXPECT_EQ(log_.calls.size(), ran) << "one call per turn";
  }
  ASSERT_TRUE(runCalls(4));
  EXPECT_EQ(log_.calls, (std::vector<long>{1, 2, 3, 4})) << "a throwing call is discarded";

  // Removal is by kind: a function removes every pending function call,
  // a receiver every pending receiver call.
  log_.calls.clear();
  Receiver first, second;
  first.base = 100;
  second.base = 200;
  ASSERT_TRUE(dispatcher_->queueAsyncCall(&logCall, asParam(1)));
  ASSERT_TRUE(dispatcher_->queueAsyncCall(&first, asParam(1)));
  ASSERT_TRUE(dispatcher_->queueAsyncCall(&otherCall, asParam(2)));
  ASSERT_TRUE(dispatcher_->queueAsyncCall(&second, asParam(2)));
  dispatcher_->removeAllAsyncCall(&logCall);
  dispatcher_->removeAllAsyncCall(static_cast<IAsyncCallReceiver*>(nullptr));  // no effect
  ASSERT_TRUE(dispatcher_->queueAsyncCall(&second, asParam(3)));
  ASSERT_TRUE(runCalls(3));
  EXPECT_EQ(log_.calls, (std::vector<long>{101, 202, 203}));

  log_.calls.clear();
  ASSERT_TRUE(dispatcher_->queueAsyncCall(&first, asParam(1)));
  ASSERT_TRUE(dispatcher_->queueAsyncCall(&logCall, asParam(5)));
  dispatcher_->removeAllAsyncCall(&second);
  ASSERT_TRUE(runCalls(1));
  EXPECT_EQ(log_.calls, (std::vector<long>{5}));

  // Calls queued by another thread and removed before their records are
  // read: the records are consumed and nothing runs.
  log_.calls.clear();
  IAsyncCallDispatcher* target = dispatcher_.get();
  {
    FunctionThread producer([&] {
      for (long i = 0; i < 100; ++i) target->queueAsyncCall(&logCall, asParam(i));
      target->queueAsyncCall(&first, asParam(7));
    });
  }
  dispatcher_->removeAllAsyncCall(&otherCall);
  dispatcher_->removeAllAsyncCall(&first);
  for (int turn = 0; turn < 101; ++turn) dispatcher_->sleep(0);
  EXPECT_TRUE(log_.calls.empty()) << log_.calls.size() << " removed calls ran";
}

// 100,000 calls queued while the owner is not reading overflow the socket
// pair many times over; every call still runs exactly once, in id order.
TEST_P(DispatcherTest, BurstFromAnotherThreadIsNotLost) {
  constexpr long kCalls = 100000;
  IAsyncCallDispatcher* target = dispatcher_.get();
  std::atomic<long> refused{0};
  {
    FunctionThread producer([&] {
      for (long i = 0; i < kCalls; ++i)
        if (!target->queueAsyncCall(&logCall, asParam(i))) ++refused;
    });
  }
  EXPECT_EQ(refused.load(), 0);
  ASSERT_TRUE(runCalls(kCalls, 120)) << "only " << log_.calls.size() << " calls ran";
  for (long i = 0; i < kCalls; ++i) ASSERT_EQ(log_.calls[i], i) << "at position " << i;
  EXPECT_EQ(dispatcher_->sleep(20), GetParam() == AsyncCallDispatcher::MainLoopPoll ? 2 : 0);
  EXPECT_EQ(log_.calls.size(), size_t(kCalls)) << "no call ran twice";
}

INSTANTIATE_TEST_SUITE_P(Backends, DispatcherTest,
                         ::testing::Values(AsyncCallDispatcher::MainLoopPoll,
                                           AsyncCallDispatcher::MainLoopGlib),
                         [](const ::testing::TestParamInfo<Type>& info) {
                           return info.param == AsyncCallDispatcher::MainLoopPoll ? "Poll"
                                                                                  : "Glib";
                         });

TEST(AsyncCallDispatcher, PerThreadRegistry) {
  SharedPointer<IAsyncCallDispatcher> byDefault =
      AsyncCallDispatcher::openDispatcher(AsyncCallDispatcher::MainLoopDefault);
  ASSERT_TRUE(byDefault);
  EXPECT_NE(dynamic_cast<LinGlibAsyncCallDispatcher*>(byDefault.get()), nullptr)
      << "GLib when the thread chose nothing";
  EXPECT_EQ(byDefault, AsyncCallDispatcher::openDispatcher(AsyncCallDispatcher::MainLoopGlib));
  EXPECT_FALSE(AsyncCallDispatcher::openDispatcher(static_cast<Type>(1)));
  EXPECT_FALSE(AsyncCallDispatcher::openDispatcher(static_cast<Type>(5)));

  {
    LoopTypeScope poll(AsyncCallDispatcher::MainLoopPoll);
    EXPECT_THROW(AsyncCallDispatcher::setMainLoopType(AsyncCallDispatcher::MainLoopGlib),
                 Status);
    SharedPointer<IAsyncCallDispatcher> chosen =
        AsyncCallDispatcher::openDispatcher(AsyncCallDispatcher::MainLoopDefault);
    EXPECT_NE(dynamic_cast<LinPollAsyncCallDispatcher*>(chosen.get()), nullptr);
    EXPECT_EQ(chosen, AsyncCallDispatcher::openLinPollAsyncDispatcher());

    // Another thread has its own dispatcher and its own (unset) type.
    IAsyncCallDispatcher* there = nullptr;
    FunctionThread other([&] {
      SharedPointer<IAsyncCallDispatcher> own =
          AsyncCallDispatcher::openDispatcher(AsyncCallDispatcher::MainLoopPoll);
      there = own.get();
    });
    ASSERT_TRUE(other.thread().wait());
    EXPECT_NE(there, nullptr);
    EXPECT_NE(there, chosen.get());
  }
  try {
    AsyncCallDispatcher::setMainLoopType(AsyncCallDispatcher::MainLoopPoll);
    AsyncCallDispatcher::setMainLoopType(AsyncCallDispatcher::MainLoopPoll);
    ADD_FAILURE() << "a second choice must throw";
  } catch (Status status) {
    EXPECT_EQ(status, Refused);
  }
  AsyncCallDispatcher::setMainLoopType(AsyncCallDispatcher::MainLoopDefault);
}

// A sink counting its calls and running an optional action inside them.
struct CountingSink : IPollSink {
  int calls = 0;
  std::function<void()> action;
  void handlePollEvent(const pollfd&) override {
    ++calls;
    if (action) action();
  }
};

// A socket pair whose first end is readable once `fill` wrote to it.
struct Pair {
  int fds[2] = {-1, -1};
  Pair() { EXPECT_EQ(socketpair(AF_UNIX, SOCK_STREAM, 0, fds), 0); }
  ~Pair() {
    for (int fd : fds)
      if (fd >= 0) close(fd);
  }
  void fill() { EXPECT_EQ(write(fds[1], "x", 1), 1); }
  void closePeer() {
    close(fds[1]);
    fds[1] = -1;
  }
  pollfd watch() const { return {fds[0], POLLIN, 0}; }
};

TEST(PollDispatcher, SinksHangUpAndAttachInsideCallbacks) {
  SharedPointer<IAsyncCallDispatcher> opened =
      AsyncCallDispatcher::openDispatcher(AsyncCallDispatcher::MainLoopPoll);
  auto* dispatcher = dynamic_cast<LinPollAsyncCallDispatcher*>(opened.get());
  ASSERT_NE(dispatcher, nullptr);
  EXPECT_EQ(dispatcher->sleep(0), 2) << "idle";

  Pair a, b;
  CountingSink sinkA, sinkB;
  EXPECT_FALSE(dispatcher->attachPollSink({0, POLLIN, 0}, &sinkA)) << "descriptor 0";
  EXPECT_FALSE(dispatcher->attachPollSink(a.watch(), nullptr)) << "null sink";
  ASSERT_TRUE(dispatcher->attachPollSink(a.watch(), &sinkA));
  EXPECT_FALSE(dispatcher->attachPollSink(a.watch(), &sinkB)) << "descriptor taken";

  // Inside its callback, A detaches itself and attaches B, whose descriptor
  // is already readable: B is watched from the next sleep on.
  a.fill();
  b.fill();
  sinkA.action = [&] {
    dispatcher->detachPollSink(a.watch());
    EXPECT_TRUE(dispatcher->attachPollSink(b.watch(), &sinkB));
  };
  EXPECT_EQ(dispatcher->sleep(1000), 1);
  EXPECT_EQ(sinkA.calls, 1);
  EXPECT_EQ(sinkB.calls, 0) << "attached during this sleep";
  EXPECT_EQ(dispatcher->sleep(1000), 1);
  EXPECT_EQ(sinkA.calls, 1) << "detached";
  EXPECT_EQ(sinkB.calls, 1);

  // Input with a peer hang-up (POLLIN | POLLRDHUP) is never dispatched.
  dispatcher->detachPollSink(b.watch());
  Pair closed;
  CountingSink sinkC;
  closed.fill();
  closed.closePeer();
  ASSERT_TRUE(dispatcher->attachPollSink(closed.watch(), &sinkC));
  EXPECT_EQ(dispatcher->sleep(100), 0) << "ready but not dispatched";
  EXPECT_EQ(sinkC.calls, 0);
  dispatcher->detachPollSink(closed.watch());
  EXPECT_EQ(dispatcher->sleep(0), 2);
}

}  // namespace
}  // namespace core
}  // namespace lodestack
