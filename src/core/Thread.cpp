#include <errno.h>
#include <pthread.h>

#include <atomic>
#include <new>

#include "core/Deadline.h"
#include "lodestack/core/ISemaphore.h"
#include "lodestack/core/IThread.h"
#include "lodestack/gom/SharedPointer.h"

namespace lodestack {
namespace core {

namespace {

// What the new thread touches: its start gate and observer. Shared by the
// thread and its LinThread, either of which may go first (a LinThread
// dropped before resume only cancels its thread), so the last one out
// deletes it.
class StartBlock {
 public:
  explicit StartBlock(IThreadObserver* observer) : observer(observer), users_(1) {}
  void share() { users_.fetch_add(1, std::memory_order_relaxed); }
  void release() {
    if (users_.fetch_sub(1, std::memory_order_acq_rel) == 1) delete this;
  }

  gom::SharedPointer<ISemaphore> gate;
  IThreadObserver* const observer;

 private:
  ~StartBlock() = default;
  std::atomic<int> users_;
};

class LinThread : public IThread {
 public:
  LinThread() : start_(nullptr), handle_(), live_(false) {}

  // A thread never joined is cancelled, not joined, and then detached so
  // that its resources go back when it ends.
  ~LinThread() override {
    if (live_) {
      pthread_cancel(handle_);
      pthread_detach(handle_);
    }
    if (start_) start_->release();
  }

  bool create(IThreadObserver* observer, bool suspended) {
    start_ = new (std::nothrow) StartBlock(observer);
    if (!start_) return false;
    start_->gate = gom::SharedPointer<ISemaphore>(ISemaphore::create(0, 1));
    if (!start_->gate) return false;
    start_->share();
    if (pthread_create(&handle_, nullptr, &LinThread::entry, start_) != 0) {
      start_->release();
      return false;
    }
    live_ = true;
    if (!suspended) resume();
    return true;
  }

  bool wait() override {
    if (!live_ || pthread_join(handle_, nullptr) != 0) return false;
    live_ = false;
    return true;
  }

  int tryWait(unsigned int ms) override {
    if (!live_) return 0;
    const timespec deadline = deadlineWithoutCarry(CLOCK_REALTIME, ms);
    // An uncarried deadline can be invalid; the join would report EINVAL
    // (0), but this C library spins on such a deadline instead.
    if (deadline.tv_nsec >= 1000000000L) return 0;
    const int rc = pthread_timedjoin_np(handle_, nullptr, &deadline);
    if (rc == 0) {
      live_ = false;
      return 1;
    }
    return rc == ETIMEDOUT ? 2 : 0;
  }

  bool resume() override { return start_->gate->signal(1, nullptr); }

  // Joins a finished thread as a side effect.
  bool isRunning() const override {
    if (!live_) return false;
    const int rc = pthread_tryjoin_np(handle_, nullptr);
    if (rc == 0) live_ = false;
    return rc == EBUSY;
  }

 private:
  // Runs on the new thread; its share of the start block goes when it ends
  // or unwinds from a cancellation.
  static void* entry(void* block) {
    struct Share {
      StartBlock* block;
      ~Share() { block->release(); }
    } share{static_cast<StartBlock*>(block)};
    share.block->gate->wait();
    if (share.block->observer) share.block->observer->threadMain();
    return nullptr;
  }

  StartBlock* start_;  // null only when create failed early
  pthread_t handle_;
  // True from start until joined; a joined handle is never used again.
  mutable bool live_;
};

}  // namespace

IThreadObserver::~IThreadObserver() = default;
IThread::~IThread() = default;

IThread* IThread::create(IThreadObserver* observer, bool suspended) {
  LinThread* thread = new (std::nothrow) LinThread;
  if (thread && !thread->create(observer, suspended)) {
    delete thread;
    return nullptr;
  }
  return thread;
}

// Deliberately returns at once: callers have always relied on it not to block.
void IThread::sleep(int) {}

}  // namespace core
}  // namespace lodestack
