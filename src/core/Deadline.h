// Deadlines of the timed lock, wait and join operations.
#ifndef LODESTACK_SRC_CORE_DEADLINE_H
#define LODESTACK_SRC_CORE_DEADLINE_H

#include <time.h>

namespace lodestack {
namespace core {

// Now on `clock` plus `ms`. Deliberately without carrying the nanoseconds
// into the seconds: a sum that reaches a full second stays invalid, and the
// timed call that receives it fails with EINVAL.
inline timespec deadlineWithoutCarry(clockid_t clock, unsigned int ms) {
  timespec t{};
  clock_gettime(clock, &t);
  t.tv_sec += ms / 1000;
  t.tv_nsec += static_cast<long>(ms % 1000) * 1000000L;
  return t;
}

}  // namespace core
}  // namespace lodestack

#endif  // LODESTACK_SRC_CORE_DEADLINE_H
