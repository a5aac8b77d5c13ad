#include <errno.h>
#include <pthread.h>

#include <new>

#include "core/Deadline.h"
#include "lodestack/core/ISemaphore.h"
#include "lodestack/core/IThread.h"
#include "lodestack/gom/SharedPointer.h"

namespace lodestack {
namespace core {

namespace {

class LinThread : public IThread {
 public:
  LinThread() : observer_(nullptr), handle_(), live_(false) {}

  // A thread never joined is cancelled, not joined, and then detached so
  // that its resources go back when it ends.
  ~LinThread() override {
    if (live_) {
      pthread_cancel(handle_);
      pthread_detach(handle_);
    }
  }

  bool create(IThreadObserver* observer, bool suspended) {
    gate_ = gom::SharedPointer<ISemaphore>(ISemaphore::create(0, 1));
    if (!gate_) return false;
    if (pthread_create(&handle_, nullptr, &LinThread::entry, this) != 0) return false;
    live_ = true;
    observer_ = observer;  // published to the thread by the gate's signal
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

  bool resume() override { return gate_->signal(1, nullptr); }

  // Joins a finished thread as a side effect.
  bool isRunning() const override {
    if (!live_) return false;
    const int rc = pthread_tryjoin_np(handle_, nullptr);
    if (rc == 0) live_ = false;
    return rc == EBUSY;
  }

 private:
  static void* entry(void* self) {
    static_cast<LinThread*>(self)->threadFunction();
    return nullptr;
  }

  void threadFunction() {
    gate_->wait();
    if (observer_) observer_->threadMain();
  }

  IThreadObserver* observer_;
  pthread_t handle_;
  // True from start until joined; a joined handle is never used again.
  mutable bool live_;
  gom::SharedPointer<ISemaphore> gate_;
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
