#include <sys/timerfd.h>
#include <unistd.h>

#include <cstdint>
#include <new>

#include "core/Descriptor.h"
#include "lodestack/core/AsyncCallDispatcher.h"
#include "lodestack/core/ITimer.h"
#include "lodestack/core/LinAsyncCallDispatcher.h"
#include "lodestack/core/Status.h"

namespace lodestack {
namespace core {

namespace {

// At most this many timeout calls per wake-up; surplus expiries are lost.
constexpr std::uint64_t kMaxCallsPerWakeUp = 256;

// A timerfd watched by the calling thread's dispatcher.
class LinTimer : public ITimer, public IPollSink {
 public:
  explicit LinTimer(ITimerObserver* observer)
      : observer_(observer), fd_(0), linDispatcher_(nullptr) {}

  ~LinTimer() override {
    if (fd_ != 0) {
      if (linDispatcher_) linDispatcher_->detachPollSink({fd_, 0, 0});
      close(fd_);
      fd_ = 0;
    }
  }

  bool init() {
    dispatcher_ = AsyncCallDispatcher::openDispatcher(AsyncCallDispatcher::MainLoopDefault);
    linDispatcher_ = dynamic_cast<LinAsyncCallDispatcher*>(dispatcher_.get());
    if (!linDispatcher_) return false;
    // Blocking on purpose: it is read only once the dispatcher saw it ready.
    fd_ = offZero(timerfd_create(CLOCK_REALTIME, TFD_CLOEXEC));
    if (fd_ == -1) {
      fd_ = 0;
      return false;
    }
    return linDispatcher_->attachPollSink({fd_, POLLIN, 0}, this);
  }

  // Periodic with the first delay as period, deliberately (see ITimer).
  int start(int ms, int ignored) override {
    return start(static_cast<long long>(ms), static_cast<unsigned long long>(ms),
                 static_cast<unsigned int>(ignored));
  }

  int start(long long firstMs, unsigned long long intervalMs, unsigned int) override {
    if (fd_ == 0) return Refused;
    if (firstMs == 0) return InvalidArgument;  // a zero expiry would disarm
    itimerspec setting{};
    setting.it_value.tv_sec = static_cast<time_t>(firstMs / 1000);
    setting.it_value.tv_nsec = static_cast<long>((firstMs % 1000) * 1000000);
    setting.it_interval.tv_sec = static_cast<time_t>(intervalMs / 1000);
    setting.it_interval.tv_nsec = static_cast<long>((intervalMs % 1000) * 1000000);
    return timerfd_settime(fd_, 0, &setting, nullptr) == 0 ? Ok : Failed;
  }

  int stop() override {
    if (fd_ == 0) return Refused;
    const itimerspec disarmed{};
    return timerfd_settime(fd_, 0, &disarmed, nullptr) == 0 ? Ok : Failed;
  }

  // A stop() inside timeout does not shorten the burst already counted;
  // dropping the timer does.
  void handlePollEvent(const pollfd& p) override {
    if (p.fd != fd_ || !observer_) throw WrongObjectType;
    // The observer may drop the last handle to this timer from timeout.
    gom::SharedPointer<ITimer> keepAlive(this);
    std::uint64_t expirations = 0;
    if (read(fd_, &expirations, sizeof expirations) != sizeof expirations) return;
    if (expirations > kMaxCallsPerWakeUp) expirations = kMaxCallsPerWakeUp;
    for (std::uint64_t i = 0; i < expirations; ++i) {
      if (observer_) observer_->timeout(this);
      // Only keepAlive is left: the owner let the timer go, and its
      // observer may well have gone with it.
      if (referenceCount() == 1) break;
    }
  }

 private:
  ITimerObserver* observer_;
  int fd_;  // 0: none
  gom::SharedPointer<IAsyncCallDispatcher> dispatcher_;
  LinAsyncCallDispatcher* linDispatcher_;
};

}  // namespace

ITimerObserver::~ITimerObserver() = default;
ITimer::~ITimer() = default;

ITimer* ITimer::create(ITimerObserver* observer) {
  if (!observer) return nullptr;
  LinTimer* timer = new (std::nothrow) LinTimer(observer);
  if (timer && !timer->init()) {
    delete timer;
    return nullptr;
  }
  return timer;
}

}  // namespace core
}  // namespace lodestack
