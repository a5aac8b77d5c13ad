// How much room a reader reserves for a claimed number of items before their
// bytes have arrived, so that a forged count costs nothing.
#ifndef LODESTACK_SRC_GOM_RESERVATION_H
#define LODESTACK_SRC_GOM_RESERVATION_H

#include <climits>

#include "lodestack/stream/IStream.h"

namespace lodestack {
namespace gom {

// Items for which room is worth reserving out of `count` claimed variant
// records (each at least 4 bytes): a small count whole; beyond it, no more
// than the stream still holds, and only the small count when the stream
// cannot tell its size.
inline unsigned int plausibleItems(IStream& stream, unsigned int count) {
  const unsigned int kSmallCount = 64;
  if (count <= kSmallCount) return count;
  const unsigned int left = stream.bytesLeftHint();
  if (left == UINT_MAX) return kSmallCount;
  return left / 4 < count ? left / 4 : count;
}

}  // namespace gom
}  // namespace lodestack

#endif  // LODESTACK_SRC_GOM_RESERVATION_H
