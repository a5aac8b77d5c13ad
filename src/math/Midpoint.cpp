#include "lodestack/math/Midpoint.h"

#include "lodestack/schema/utility/Utility.h"

namespace lodestack {

double Midpoint::distance(const Midpoint& other) const {
  double metres = 0.0;
  if (!schema::Utility::distance(latitude_, longitude_, other.latitude_, other.longitude_, metres))
    return 0.0;
  return metres;
}

}  // namespace lodestack
