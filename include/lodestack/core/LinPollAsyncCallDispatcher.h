// LinPollAsyncCallDispatcher: a dispatcher driven by its own poll() loop.
//
// One per thread, made by create() (or AsyncCallDispatcher::openDispatcher
// with MainLoopPoll) and shared by everybody on that thread; it lives as long
// as somebody holds a SharedPointer to it. The owning thread drives it by
// calling sleep repeatedly.
#ifndef LODESTACK_CORE_LINPOLLASYNCCALLDISPATCHER_H
#define LODESTACK_CORE_LINPOLLASYNCCALLDISPATCHER_H

#include <poll.h>

#include <vector>

#include "lodestack/core/Export.h"
#include "lodestack/core/LinAsyncCallDispatcher.h"

namespace lodestack {
namespace core {

class LODESTACK_EXPORT LinPollAsyncCallDispatcher : public LinAsyncCallDispatcher {
 public:
  // The calling thread's poll dispatcher, made on first use; null when it
  // cannot be made. Count 0 when new: wrap it in a SharedPointer.
  static LinPollAsyncCallDispatcher* create();
  ~LinPollAsyncCallDispatcher() override;

  bool sleep() override;
  // Polls every watched descriptor for up to `timeoutMs`. 2 on time-out;
  // 1 when at least one callback ran; 0 otherwise (poll failure, nothing
  // dispatched). A descriptor is dispatched only when it reports exactly
  // POLLIN, so one that also reports an error or hang-up is skipped. Sinks
  // attached by a callback are watched from the next sleep on.
  int sleep(int timeoutMs) override;

 protected:
  bool doAttachPollSink(const pollfd& p) override;
  void doDetachPollSink(const pollfd& p) override;

 private:
  LinPollAsyncCallDispatcher();
  bool init();

  std::vector<pollfd> watched_;
};

}  // namespace core
}  // namespace lodestack

#endif  // LODESTACK_CORE_LINPOLLASYNCCALLDISPATCHER_H
