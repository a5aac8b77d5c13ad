// IAsyncCallReceiver: the target of a deferred call queued on a dispatcher.
//
// handleAsyncCall runs on the dispatcher's owning thread, once per queued
// call, with no lock held. The dispatcher does not own its receivers: remove
// a receiver's pending calls (removeAllAsyncCall) before destroying it.
#ifndef LODESTACK_CORE_IASYNCCALLRECEIVER_H
#define LODESTACK_CORE_IASYNCCALLRECEIVER_H

#include "lodestack/core/Export.h"

namespace lodestack {
namespace core {

class LODESTACK_EXPORT IAsyncCallReceiver {
 public:
  virtual ~IAsyncCallReceiver();
  // Exceptions thrown here are caught and discarded by the dispatcher.
  virtual void handleAsyncCall(void* param) = 0;
};

}  // namespace core
}  // namespace lodestack

#endif  // LODESTACK_CORE_IASYNCCALLRECEIVER_H
