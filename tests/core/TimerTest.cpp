#include <gtest/gtest.h>

#include <chrono>
#include <thread>

#include "core/CoreTestSupport.h"
#include "lodestack/core/AsyncCallDispatcher.h"
#include "lodestack/core/ITimer.h"
#include "lodestack/core/Status.h"

namespace lodestack::core {
namespace {

using namespace testing;

struct CountingObserver : ITimerObserver {
  int calls = 0;
  bool stopOnFirst = false;
  void timeout(ITimer* timer) override {
    if (++calls == 1 && stopOnFirst) {
      EXPECT_EQ(timer->stop(), Ok);
    }
  }
};

// Timers on the poll dispatcher, so the loop is driven by sleep alone.
class TimerTest : public ::testing::Test {
 protected:
  LoopTypeScope scope_{AsyncCallDispatcher::MainLoopPoll};
  SharedPointer<IAsyncCallDispatcher> dispatcher_ =
      AsyncCallDispatcher::openDispatcher(AsyncCallDispatcher::MainLoopDefault);
  CountingObserver observer_;
  SharedPointer<ITimer> timer_{ITimer::create(&observer_)};
};

TEST_F(TimerTest, ArgumentsAndTheTwoStartForms) {
  ASSERT_TRUE(timer_);
  EXPECT_EQ(timer_->start(0, 0), InvalidArgument);
  EXPECT_EQ(timer_->start(0LL, 10ULL, 0u), InvalidArgument);
  EXPECT_EQ(timer_->stop(), Ok);

  // The two-argument form is periodic whatever its second argument says.
  ASSERT_EQ(timer_->start(20, 0), Ok);
  ASSERT_TRUE(runUntil(*dispatcher_, [&] { return observer_.calls >= 3; }))
      << "a periodic timer fired " << observer_.calls << " times";
  EXPECT_EQ(timer_->stop(), Ok);
  const int afterStop = observer_.calls;
  EXPECT_EQ(dispatcher_->sleep(100), 2) << "a stopped timer stays quiet";
  EXPECT_EQ(observer_.calls, afterStop);

  // The three-argument form with interval 0 fires once.
  observer_.calls = 0;
  ASSERT_EQ(timer_->start(30LL, 0ULL, 0u), Ok);
  ASSERT_TRUE(runUntil(*dispatcher_, [&] { return observer_.calls >= 1; }));
  EXPECT_EQ(dispatcher_->sleep(150), 2);
  EXPECT_EQ(observer_.calls, 1);
}

// After 400 missed 1 ms periods one wake-up delivers exactly 256 calls, and
// a stop inside the first of them does not shorten the burst.
TEST_F(TimerTest, ABurstAfterAStallIsCappedAt256) {
  ASSERT_TRUE(timer_);
  observer_.stopOnFirst = true;
  ASSERT_EQ(timer_->start(1LL, 1ULL, 0u), Ok);
  std::this_thread::sleep_for(std::chrono::milliseconds(400));
  ASSERT_EQ(dispatcher_->sleep(5000), 1);
  EXPECT_EQ(observer_.calls, 256);
  EXPECT_EQ(dispatcher_->sleep(50), 2) << "stopped inside the burst";
  EXPECT_EQ(observer_.calls, 256);
}

// The owner drops the timer in the first call of a burst: the burst ends
// there, since its observer may be gone with it.
TEST_F(TimerTest, DroppingTheTimerEndsItsBurst) {
  TimerOwner owner;
  ASSERT_TRUE(owner.timer);
  ASSERT_EQ(owner.timer->start(1LL, 1ULL, 0u), Ok);
  std::this_thread::sleep_for(std::chrono::milliseconds(50));
  ASSERT_EQ(dispatcher_->sleep(5000), 1);
  EXPECT_EQ(owner.calls, 1);
}

}  // namespace
}  // namespace lodestack::core
