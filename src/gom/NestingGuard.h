// Counts, per thread, how deeply the reader, the writer, cloning or
// comparison is inside the objects held by variants, so that hostile input
// or an object that holds itself cannot exhaust the stack. All four count
// the same levels, so whatever the writer accepts the reader reads back.
#ifndef LODESTACK_SRC_GOM_NESTINGGUARD_H
#define LODESTACK_SRC_GOM_NESTINGGUARD_H

#include "lodestack/gom/Variant.h"

namespace lodestack {
namespace gom {

class NestingGuard {
 public:
  NestingGuard() { ++depth(); }
  ~NestingGuard() { --depth(); }
  NestingGuard(const NestingGuard&) = delete;
  NestingGuard& operator=(const NestingGuard&) = delete;

  bool ok() const { return depth() <= Variant::kMaxNestingDepth; }

 private:
  static int& depth() {
    // initial-exec: a plain thread-pointer access instead of a call per use.
    static thread_local int value __attribute__((tls_model("initial-exec"))) = 0;
    return value;
  }
};

}  // namespace gom
}  // namespace lodestack

#endif  // LODESTACK_SRC_GOM_NESTINGGUARD_H
