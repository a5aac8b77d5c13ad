// Runs a callback (or a step that may throw), discarding what it throws.
#ifndef LODESTACK_SRC_CORE_GUARDEDCALL_H
#define LODESTACK_SRC_CORE_GUARDEDCALL_H

#include <cxxabi.h>

namespace lodestack {
namespace core {

// True when `call` returned normally. No exception leaves a callback, except
// the unwinding of a cancelled thread, which must go on.
template <class Call>
bool guardedCall(Call&& call) {
  try {
    call();
    return true;
  } catch (abi::__forced_unwind&) {
    throw;
  } catch (...) {
    return false;
  }
}

}  // namespace core
}  // namespace lodestack

#endif  // LODESTACK_SRC_CORE_GUARDEDCALL_H
