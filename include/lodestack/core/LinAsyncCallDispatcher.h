// LinAsyncCallDispatcher: the Linux wake-up and descriptor registry under
// both loop back-ends.
//
// Each queued call's id travels as one 4-byte record over a SOCK_SEQPACKET
// socket pair; the read end is the dispatcher's own poll sink, and each
// readiness event consumes one record and runs that one call. When the pair
// is full, the ids that could not be sent are remembered (in order, under the
// pending map's lock) and sent as soon as the owning thread has consumed a
// record (one for each record consumed), ahead of any newer id, so no call
// is stranded and calls run in id order.
//
// Poll sinks are registered per descriptor (at most one sink each; never
// descriptor 0). attachPollSink, detachPollSink and all callbacks belong to
// the owning thread.
#ifndef LODESTACK_CORE_LINASYNCCALLDISPATCHER_H
#define LODESTACK_CORE_LINASYNCCALLDISPATCHER_H

#include <poll.h>

#include <atomic>
#include <deque>
#include <map>

#include "lodestack/core/AsyncCallDispatcherCommon.h"
#include "lodestack/core/Export.h"
#include "lodestack/core/IPollSink.h"

namespace lodestack {
namespace core {

class LODESTACK_EXPORT LinAsyncCallDispatcher : public AsyncCallDispatcherCommon,
                                                public IPollSink {
 public:
  ~LinAsyncCallDispatcher() override;

  // Registers `sink` for the descriptor of `p` (the back-end watches it for
  // input whatever p.events says). False when `sink` is null, the descriptor
  // is 0 or already has a sink, or the back-end refused; nothing changes then.
  // Input that comes with a hang-up is not dispatched and keeps the loop
  // awake (see IPollSink): detach at the end of the input.
  virtual bool attachPollSink(const pollfd& p, IPollSink* sink);
  // Stops watching the descriptor of `p` and forgets its sink.
  virtual void detachPollSink(const pollfd& p);
  // The dispatcher's own sink on the read end: consumes one record.
  void handlePollEvent(const pollfd& p) override;

 protected:
  LinAsyncCallDispatcher();

  // Creates the socket pair; false when it cannot be made.
  bool baseInit();
  bool doScheduleDelegate(unsigned int id) override;
  void duringTake() override;
  virtual bool doAttachPollSink(const pollfd& p) = 0;
  virtual void doDetachPollSink(const pollfd& p) = 0;

  // Calls the sink of the descriptor of `p`: false when there is none or it
  // threw, true otherwise.
  bool invokeCallback(const pollfd& p);
  // Retries remembered ids after a send failed for another reason than a
  // full pair (owning thread, before waiting; takes the lock only then).
  void resendUnsent();
  // The wake-up socket is read without blocking: it needs no second look
  // before its sink is called.
  bool readsWithoutBlocking(int fd) const { return fd == readFd_; }

  int readFd_;   // 0 when not created
  int writeFd_;  // 0 when not created

 private:
  void invokeApc();
  bool sendId(unsigned int id);
  // Sends remembered ids in order until the pair is full; lock held.
  void flushUnsentLocked();

  std::map<int, IPollSink*> sinks_;  // owning thread only
  std::deque<unsigned int> unsent_;  // guarded by pendingLock()
  std::atomic<bool> hasUnsent_;      // a hint readable without the lock
  std::atomic<bool> stalled_;        // a send failed on a pair not full
};

}  // namespace core
}  // namespace lodestack

#endif  // LODESTACK_CORE_LINASYNCCALLDISPATCHER_H
