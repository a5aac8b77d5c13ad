#include <gtest/gtest.h>

#include <fcntl.h>

#include <cstdlib>
#include <filesystem>
#include <memory>
#include <set>
#include <stdexcept>
#include <string>
#include <vector>

#include "core/CoreTestSupport.h"
#include "lodestack/core/LinGlibAsyncCallDispatcher.h"
#include "lodestack/core/LinPollAsyncCallDispatcher.h"
#include "lodestack/core/Status.h"

namespace lodestack::core {
namespace {

using namespace testing;
using Type = AsyncCallDispatcher::MainLoopType;

void otherCall(void* param) { gLog->record(-reinterpret_cast<long>(param)); }
void throwingCall(void*) { throw std::runtime_error("discarded by the dispatcher"); }

struct Receiver : IAsyncCallReceiver {
  explicit Receiver(long base = 0) : base(base) {}
  long base;
  void handleAsyncCall(void* param) override { gLog->record(base + reinterpret_cast<long>(param)); }
};

class DispatcherTest : public ::testing::TestWithParam<Type> {
 protected:
  void SetUp() override {
    gLog = &log_;
    dispatcher_ = AsyncCallDispatcher::openDispatcher(GetParam());
    ASSERT_TRUE(dispatcher_);
  }
  void TearDown() override { gLog = nullptr; }
  bool runCalls(size_t count, double limitSeconds = 60) {
    return runUntil(*dispatcher_, [&] { return log_.calls.size() >= count; }, limitSeconds);
  }
  // What an idle sleep(ms) returns: the poll loop reports a time-out.
  int idle() const { return GetParam() == AsyncCallDispatcher::MainLoopPoll ? 2 : 0; }

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
        if (!(p % 2 ? target->queueAsyncCall(&receivers[p], asParam(i))
                    : target->queueAsyncCall(&logCall, asParam(p * 1000000 + i))))
          std::abort();
      }
    }));
  }
  // Every poll-loop sleep() handles something. GLib may wake an iteration
  // for its own reasons with nothing to dispatch (more often on a loaded
  // machine), so there only progress within a generous time is required.
  const auto start = std::chrono::steady_clock::now();
  while (log_.calls.size() < size_t(kProducers * kCalls)) {
    if (!dispatcher_->sleep()) {
      ASSERT_NE(GetParam(), AsyncCallDispatcher::MainLoopPoll) << "an idle turn of the poll loop";
      ASSERT_LT(secondsSince(start), 60.0) << "calls stopped arriving";
    }
  }
  producers.clear();
  EXPECT_TRUE(log_.allOnOwner) << "every call runs on the owning thread";
  std::vector<long> next(kProducers, 0);
  for (long value : log_.calls) {
    const long p = value / 1000000;
    ASSERT_EQ(value % 1000000, next[p]++) << "producer " << p << " out of order or duplicated";
  }
  EXPECT_EQ(dispatcher_->sleep(50), idle());
}

TEST_P(DispatcherTest, OrderRemovalAndDiscardedExceptions) {
  for (long i = 1; i <= 3; ++i) ASSERT_TRUE(dispatcher_->queueAsyncCall(&logCall, asParam(i)));
  ASSERT_TRUE(dispatcher_->queueAsyncCall(&throwingCall, nullptr));
  ASSERT_TRUE(dispatcher_->queueAsyncCall(&logCall, asParam(4)));
  for (size_t ran = 1; ran <= 3; ++ran) {
    ASSERT_EQ(dispatcher_->sleep(1000), 1);
    EXPECT_EQ(log_.calls.size(), ran) << "one call per turn, in id order";
  }
  ASSERT_TRUE(runCalls(4));
  EXPECT_EQ(log_.calls, (std::vector<long>{1, 2, 3, 4})) << "a throwing call is discarded";

  // Removal goes by kind: one function removes every pending function call,
  // one receiver every pending receiver call.
  log_.calls.clear();
  Receiver first(100), second(200);
  ASSERT_TRUE(dispatcher_->queueAsyncCall(&logCall, asParam(1)));
  ASSERT_TRUE(dispatcher_->queueAsyncCall(&first, asParam(1)));
  ASSERT_TRUE(dispatcher_->queueAsyncCall(&otherCall, asParam(2)));
  ASSERT_TRUE(dispatcher_->queueAsyncCall(&second, asParam(2)));
  dispatcher_->removeAllAsyncCall(&logCall);
  dispatcher_->removeAllAsyncCall(static_cast<IAsyncCallReceiver*>(nullptr));  // no effect
  ASSERT_TRUE(dispatcher_->queueAsyncCall(&logCall, asParam(5)));
  ASSERT_TRUE(runCalls(3));
  EXPECT_EQ(log_.calls, (std::vector<long>{101, 202, 5}));
  log_.calls.clear();

  // Calls queued by another thread and removed (by kind again) before their
  // records are read never run; their records are still consumed.
  IAsyncCallDispatcher* target = dispatcher_.get();
  FunctionThread producer([&] {
    for (long i = 0; i < 100; ++i) target->queueAsyncCall(&logCall, asParam(i));
    target->queueAsyncCall(&first, asParam(7));
  });
  ASSERT_TRUE(producer.thread().wait());
  dispatcher_->removeAllAsyncCall(&otherCall);
  dispatcher_->removeAllAsyncCall(&second);
  EXPECT_EQ(dispatcher_->sleep(1000), 1);
  for (int turn = 0; turn < 100; ++turn) dispatcher_->sleep(0);
  EXPECT_TRUE(log_.calls.empty()) << log_.calls.size() << " removed calls ran";
}

// 100,000 calls queued while the owner is not reading overflow the socket
// pair many times over; every call still runs exactly once, in id order.
TEST_P(DispatcherTest, BurstFromAnotherThreadIsNotLost) {
  constexpr long kCalls = 100000;
  IAsyncCallDispatcher* target = dispatcher_.get();
  bool allQueued = true;
  FunctionThread producer([&] {
    for (long i = 0; i < kCalls; ++i) allQueued &= target->queueAsyncCall(&logCall, asParam(i));
  });
  ASSERT_TRUE(producer.thread().wait());
  EXPECT_TRUE(allQueued);
  ASSERT_TRUE(runCalls(kCalls, 120)) << "only " << log_.calls.size() << " calls ran";
  for (long i = 0; i < kCalls; ++i) ASSERT_EQ(log_.calls[i], i) << "at position " << i;
  EXPECT_EQ(dispatcher_->sleep(20), idle());
  EXPECT_EQ(log_.calls.size(), size_t(kCalls)) << "no call ran twice";
}

void dropLastHandle(void* handle) {
  delete static_cast<SharedPointer<IAsyncCallDispatcher>*>(handle);
  gLog->record(0);
}

// The last handle to the dispatcher goes inside a callback of its sleep(int):
// from a queued call, then with a timer dropped in its timeout. The
// dispatcher outlives that sleep (ASan and valgrind watch); runUntil calls
// no further sleep once the callback has run.
TEST_P(DispatcherTest, LastHandleDroppedInsideACallback) {
  LoopTypeScope scope(GetParam());
  IAsyncCallDispatcher* raw = dispatcher_.get();
  ASSERT_TRUE(raw->queueAsyncCall(&dropLastHandle,
                                  new SharedPointer<IAsyncCallDispatcher>(dispatcher_)));
  dispatcher_.clear();
  EXPECT_TRUE(runUntil(*raw, [&] { return log_.calls.size() == 1; }));

  TimerOwner owner;
  ASSERT_TRUE(owner.timer);
  raw = AsyncCallDispatcher::openDispatcher(GetParam()).get();  // held by the timer alone
  ASSERT_EQ(owner.timer->start(10LL, 0ULL, 0u), Ok);
  EXPECT_TRUE(runUntil(*raw, [&] { return owner.calls == 1; }));
}

// A lock the system refuses: queueing fails, removal drops nothing, and a
// call is not looked up (its record goes, the call stays pending).
TEST_P(DispatcherTest, PendingLockRefused) {
  ASSERT_TRUE(dispatcher_->queueAsyncCall(&logCall, asParam(1)));
  bool queued = true;
  {
    FailingLocks failing(2);
    queued = dispatcher_->queueAsyncCall(&logCall, asParam(2));
    dispatcher_->removeAllAsyncCall(&logCall);
    ASSERT_EQ(failing.left(), 0) << "both went for the lock";
  }
  EXPECT_FALSE(queued);
  EXPECT_EQ(dispatcher_->sleep(1000), 1);
  EXPECT_EQ(log_.calls, std::vector<long>{1}) << "the pending call survived the removal";
  EXPECT_EQ(dispatcher_->sleep(50), idle()) << "nothing was queued";

  ASSERT_TRUE(dispatcher_->queueAsyncCall(&logCall, asParam(3)));
  {
    FailingLocks failing(1);
    for (int turn = 0; turn < 50 && failing.left() > 0; ++turn) dispatcher_->sleep(100);
    ASSERT_EQ(failing.left(), 0) << "the record was read";
  }
  EXPECT_EQ(log_.calls.size(), 1u) << "a call looked up without the lock ran";
  dispatcher_->removeAllAsyncCall(&logCall);
}

INSTANTIATE_TEST_SUITE_P(Backends, DispatcherTest,
                         ::testing::Values(AsyncCallDispatcher::MainLoopPoll,
                                           AsyncCallDispatcher::MainLoopGlib),
                         [](const ::testing::TestParamInfo<Type>& info) {
                           return info.param == AsyncCallDispatcher::MainLoopPoll ? "Poll" : "Glib";
                         });

TEST(AsyncCallDispatcher, PerThreadRegistry) {
  SharedPointer<IAsyncCallDispatcher> byDefault =
      AsyncCallDispatcher::openDispatcher(AsyncCallDispatcher::MainLoopDefault);
  EXPECT_NE(dynamic_cast<LinGlibAsyncCallDispatcher*>(byDefault.get()), nullptr)
      << "GLib when the thread chose nothing";
  EXPECT_EQ(byDefault, AsyncCallDispatcher::openDispatcher(AsyncCallDispatcher::MainLoopGlib));

  LoopTypeScope poll(AsyncCallDispatcher::MainLoopPoll);
  try {
    AsyncCallDispatcher::setMainLoopType(AsyncCallDispatcher::MainLoopGlib);
    ADD_FAILURE() << "a second choice must throw";
  } catch (Status status) {
    EXPECT_EQ(status, Refused);
  }
  SharedPointer<IAsyncCallDispatcher> chosen =
      AsyncCallDispatcher::openDispatcher(AsyncCallDispatcher::MainLoopDefault);
  EXPECT_NE(dynamic_cast<LinPollAsyncCallDispatcher*>(chosen.get()), nullptr);
  EXPECT_EQ(chosen, AsyncCallDispatcher::openLinPollAsyncDispatcher());

  IAsyncCallDispatcher* there = nullptr;
  FunctionThread other([&] {
    there = AsyncCallDispatcher::openDispatcher(AsyncCallDispatcher::MainLoopPoll).get();
  });
  ASSERT_TRUE(other.thread().wait());
  EXPECT_TRUE(there != nullptr && there != chosen.get()) << "each thread has its own";
}

// The process's open descriptors.
std::set<int> openDescriptors() {
  std::set<int> fds;
  for (const auto& entry : std::filesystem::directory_iterator("/proc/self/fd"))
    fds.insert(std::stoi(entry.path().filename().string()));
  for (auto it = fds.begin(); it != fds.end();)  // the listing's own is closed now
    it = fcntl(*it, F_GETFD) == -1 ? fds.erase(it) : std::next(it);
  return fds;
}

// The descriptors of dispatchers and timers are close-on-exec and never 0,
// which means "none" to them, even in a process whose standard input is
// closed: there the first descriptor made would be 0.
TEST(AsyncCallDispatcher, DescriptorsAreCloseOnExecAndNeverZero) {
  // GLib's default context makes its own descriptor once, before counting.
  ASSERT_TRUE(AsyncCallDispatcher::openDispatcher(AsyncCallDispatcher::MainLoopGlib));
  const int savedStdin = dup(0);
  for (bool stdinClosed : {false, true}) {
    if (stdinClosed) close(0);
    const std::set<int> before = openDescriptors();
    FunctionThread owner([&] {  // a thread that has no dispatcher yet
      for (Type type : {AsyncCallDispatcher::MainLoopPoll, AsyncCallDispatcher::MainLoopGlib}) {
        LoopTypeScope scope(type);
        SharedPointer<IAsyncCallDispatcher> dispatcher = AsyncCallDispatcher::openDispatcher(type);
        ASSERT_TRUE(dispatcher) << "type " << type << ", stdin closed " << stdinClosed;
        TimerOwner timerOwner;
        ASSERT_TRUE(timerOwner.timer);
        std::vector<int> made;
        for (int fd : openDescriptors())
          if (!before.count(fd)) made.push_back(fd);
        EXPECT_EQ(made.size(), 3u) << "a socket pair and a timer";
        for (int fd : made) {
          EXPECT_NE(fd, 0);
          EXPECT_TRUE(fcntl(fd, F_GETFD) & FD_CLOEXEC) << "descriptor " << fd;
        }
        ASSERT_EQ(timerOwner.timer->start(10LL, 0ULL, 0u), Ok);
        EXPECT_TRUE(runUntil(*dispatcher, [&] { return timerOwner.calls == 1; }));
      }
    });
    ASSERT_TRUE(owner.thread().wait());
    if (stdinClosed) {
      EXPECT_EQ(fcntl(0, F_GETFD), -1) << "standard input stays closed";
    }
  }
  if (savedStdin >= 0) {
    dup2(savedStdin, 0);
    close(savedStdin);
  }
}

TEST(PollDispatcher, SinksHangUpAndAttachInsideCallbacks) {
  SharedPointer<IAsyncCallDispatcher> opened =
      AsyncCallDispatcher::openDispatcher(AsyncCallDispatcher::MainLoopPoll);
  auto* dispatcher = dynamic_cast<LinPollAsyncCallDispatcher*>(opened.get());
  ASSERT_NE(dispatcher, nullptr);

  SocketPair a, b, closed;
  CountingSink sinkA, sinkB, sinkC;
  EXPECT_FALSE(dispatcher->attachPollSink({0, POLLIN, 0}, &sinkA)) << "descriptor 0 means none";
  ASSERT_TRUE(dispatcher->attachPollSink(a.watch(), &sinkA));
  EXPECT_FALSE(dispatcher->attachPollSink(a.watch(), &sinkB)) << "descriptor taken";

  // Inside its callback, A detaches itself and attaches B, whose descriptor
  // is already readable: B is watched from the next sleep on.
  ASSERT_TRUE(a.fill() && b.fill());
  sinkA.action = [&] {
    dispatcher->detachPollSink(a.watch());
    EXPECT_TRUE(dispatcher->attachPollSink(b.watch(), &sinkB));
  };
  EXPECT_EQ(dispatcher->sleep(1000), 1);
  EXPECT_EQ(sinkB.calls, 0) << "attached during this sleep";
  ASSERT_TRUE(a.fill());
  EXPECT_EQ(dispatcher->sleep(1000), 1);
  EXPECT_EQ(sinkA.calls, 1) << "detached";
  EXPECT_EQ(sinkB.calls, 1);
  dispatcher->detachPollSink(b.watch());

  // Input with a peer hang-up (POLLIN | POLLRDHUP) is never dispatched.
  ASSERT_TRUE(closed.fill());
  closed.closePeer();
  ASSERT_TRUE(dispatcher->attachPollSink(closed.watch(), &sinkC));
  EXPECT_EQ(dispatcher->sleep(100), 0) << "ready but not dispatched";
  EXPECT_EQ(sinkC.calls, 0);
  dispatcher->detachPollSink(closed.watch());
  EXPECT_EQ(dispatcher->sleep(0), 2);
}

}  // namespace
}  // namespace lodestack::core
