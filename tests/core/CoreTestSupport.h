// Helpers shared by the core tests.
#ifndef LODESTACK_TESTS_CORE_CORETESTSUPPORT_H
#define LODESTACK_TESTS_CORE_CORETESTSUPPORT_H

#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <chrono>
#include <functional>
#include <thread>
#include <utility>
#include <vector>

#include "lodestack/core/AsyncCallDispatcher.h"
#include "lodestack/core/IAsyncCallDispatcher.h"
#include "lodestack/core/IPollSink.h"
#include "lodestack/core/IThread.h"
#include "lodestack/core/ITimer.h"
#include "lodestack/gom/SharedPointer.h"

namespace lodestack {
namespace core {

using gom::SharedPointer;

namespace testing {

// Chooses the test thread's loop type for one scope.
class LoopTypeScope {
 public:
  explicit LoopTypeScope(AsyncCallDispatcher::MainLoopType type) {
    AsyncCallDispatcher::setMainLoopType(type);
  }
  ~LoopTypeScope() { AsyncCallDispatcher::setMainLoopType(AsyncCallDispatcher::MainLoopDefault); }
};

// An IThread running a function; wait() joins it.
class FunctionThread : public IThreadObserver {
 public:
  explicit FunctionThread(std::function<void()> body, bool suspended = false)
      : body_(std::move(body)), thread_(IThread::create(this, suspended)) {}
  ~FunctionThread() override {
    if (thread_) thread_->wait();
  }
  IThread& thread() { return *thread_; }
  void threadMain() override { body_(); }

 private:
  std::function<void()> body_;
  gom::SharedPointer<IThread> thread_;
};

inline double secondsSince(std::chrono::steady_clock::time_point start) {
  return std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
}

// Drives `dispatcher` with sleep(100) until `done` holds or `limitSeconds`
// pass; returns `done()`.
inline bool runUntil(IAsyncCallDispatcher& dispatcher, const std::function<bool()>& done,
                     double limitSeconds = 20.0) {
  const auto start = std::chrono::steady_clock::now();
  while (!done() && secondsSince(start) < limitSeconds) dispatcher.sleep(100);
  return done();
}

// The calls in the order they ran, and whether all ran on the owner.
struct CallLog {
  std::vector<long> calls;
  std::thread::id owner = std::this_thread::get_id();
  bool allOnOwner = true;
  void record(long value) {
    allOnOwner = allOnOwner && std::this_thread::get_id() == owner;
    calls.push_back(value);
  }
};
inline CallLog* gLog = nullptr;  // the test's log; owner thread only

inline void* asParam(long value) { return reinterpret_cast<void*>(value); }
inline void logCall(void* param) { gLog->record(reinterpret_cast<long>(param)); }

// Counts its calls, reads one byte (if any) and runs an optional action.
struct CountingSink : IPollSink {
  int calls = 0;
  std::function<void()> action;
  void handlePollEvent(const pollfd& p) override {
    ++calls;
    char byte;
    (void)!read(p.fd, &byte, 1);
    if (action) action();
  }
};

// A stream socket pair; the first end is watched, the second written.
struct SocketPair {
  int fds[2] = {-1, -1};
  SocketPair() { socketpair(AF_UNIX, SOCK_STREAM | SOCK_NONBLOCK, 0, fds); }
  ~SocketPair() {
    for (int fd : fds)
      if (fd >= 0) close(fd);
  }
  bool fill() { return write(fds[1], "x", 1) == 1; }
  void closePeer() {
    close(fds[1]);
    fds[1] = -1;
  }
  pollfd watch() const { return {fds[0], POLLIN, 0}; }
};

// Holds its timer and drops it in its first timeout, as the owner of a
// finished request would.
struct TimerOwner : ITimerObserver {
  SharedPointer<ITimer> timer{ITimer::create(this)};
  int calls = 0;
  void timeout(ITimer*) override {
    ++calls;
    timer.clear();
  }
};

// While it lives, the next `count` pthread_mutex_lock calls made on this
// thread (by the test or the library) fail with EINVAL, as a lock the system
// refuses would. Defined in FailingLocks.cpp.
class FailingLocks {
 public:
  explicit FailingLocks(int count);
  ~FailingLocks();
  FailingLocks(const FailingLocks&) = delete;
  FailingLocks& operator=(const FailingLocks&) = delete;
  // How many of the failures are still to come.
  int left() const;
};

}  // namespace testing
}  // namespace core
}  // namespace lodestack

#endif  // LODESTACK_TESTS_CORE_CORETESTSUPPORT_H
