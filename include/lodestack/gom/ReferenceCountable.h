// ReferenceCountable: the intrusive, non-atomic reference count under every
// heap object of the object model (and of the core layer's timers, threads
// and dispatchers).
//
// The count starts at 0; the handle a factory returns raises it to 1. The
// object deletes itself when decrement() takes the count to 0. The count is a
// plain integer on purpose: an object and all handles to it are used by one
// thread at a time, and a handle copy must cost one increment, nothing more.
#ifndef LODESTACK_GOM_REFERENCECOUNTABLE_H
#define LODESTACK_GOM_REFERENCECOUNTABLE_H

#include "lodestack/core/Export.h"

namespace lodestack {
namespace gom {

class LODESTACK_EXPORT ReferenceCountable {
 public:
  ReferenceCountable() : count_(0) {}
  // A copy is a new object: it starts uncounted, whatever the source's count.
  ReferenceCountable(const ReferenceCountable&) : count_(0) {}
  ReferenceCountable& operator=(const ReferenceCountable&) { return *this; }
  virtual ~ReferenceCountable();

  void increment() { ++count_; }
  // Lowers the count; at zero the object is destroyed through its virtual
  // destructor. The caller must not touch the object afterwards.
  void decrement() {
    if (--count_ == 0) delete this;
  }
  int referenceCount() const { return count_; }

 private:
  int count_;
};

}  // namespace gom
}  // namespace lodestack

#endif  // LODESTACK_GOM_REFERENCECOUNTABLE_H
