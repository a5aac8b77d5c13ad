// IPollSink: the receiver of readiness events of one file descriptor.
//
// Attached to a LinAsyncCallDispatcher for a descriptor; handlePollEvent runs
// on the dispatcher's owning thread whenever that descriptor is readable. The
// dispatcher does not own its sinks: detach before destroying one.
//
// A descriptor that reports input together with an error or hang-up (a peer
// that closed) is never dispatched, yet it stays ready and keeps the loop
// awake: every sleep returns at once. A sink must detach as soon as it sees
// the end of its input by other means (a read that returns 0).
#ifndef LODESTACK_CORE_IPOLLSINK_H
#define LODESTACK_CORE_IPOLLSINK_H

#include <poll.h>

#include "lodestack/core/Export.h"

namespace lodestack {
namespace core {

class LODESTACK_EXPORT IPollSink {
 public:
  virtual ~IPollSink();
  // `p` names the ready descriptor. Exceptions are caught and discarded.
  virtual void handlePollEvent(const pollfd& p) = 0;
};

}  // namespace core
}  // namespace lodestack

#endif  // LODESTACK_CORE_IPOLLSINK_H
