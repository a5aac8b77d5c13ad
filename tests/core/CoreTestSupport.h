// Helpers shared by the core tests.
#ifndef LODESTACK_TESTS_CORE_CORETESTSUPPORT_H
#define LODESTACK_TESTS_CORE_CORETESTSUPPORT_H

#include <chrono>
#include <functional>
#include <utility>

#include "lodestack/core/AsyncCallDispatcher.h"
#include "lodestack/core/IAsyncCallDispatcher.h"
#include "lodestack/core/IThread.h"
#include "lodestack/gom/SharedPointer.h"

namespace lodestack {
namespace core {
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
  bool valid() const { return bool(thread_); }
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

}  // namespace testing
}  // namespace core
}  // namespace lodestack

#endif  // LODESTACK_TESTS_CORE_CORETESTSUPPORT_H
