#include "lodestack/gom/ReferenceCountable.h"

namespace lodestack {
namespace gom {

// Out of line so that the class's vtable and type information live in the
// library, once.
ReferenceCountable::~ReferenceCountable() = default;

}  // namespace gom
}  // namespace lodestack
