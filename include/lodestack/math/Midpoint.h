// Midpoint: the centre of an uncertainty ellipse, a latitude and longitude
// in degrees on the WGS 84 datum.
//
// A plain value type without range checks; any thread may use its own
// copies.
#ifndef LODESTACK_MATH_MIDPOINT_H
#define LODESTACK_MATH_MIDPOINT_H

#include "lodestack/core/Export.h"

namespace lodestack {

class LODESTACK_EXPORT Midpoint {
 public:
  Midpoint() : latitude_(0.0), longitude_(0.0) {}
  Midpoint(double latitude, double longitude) : latitude_(latitude), longitude_(longitude) {}

  double latitude() const { return latitude_; }
  double longitude() const { return longitude_; }
  void setLatitude(double latitude) { latitude_ = latitude; }
  void setLongitude(double longitude) { longitude_ = longitude; }

  // Great-circle distance to `other` in metres (schema::Utility::distance);
  // 0.0 should that fail.
  double distance(const Midpoint& other) const;

  bool operator==(const Midpoint& other) const {
    return latitude_ == other.latitude_ && longitude_ == other.longitude_;
  }
  bool operator!=(const Midpoint& other) const { return !(*this == other); }

 private:
  double latitude_;
  double longitude_;
};

}  // namespace lodestack

#endif  // LODESTACK_MATH_MIDPOINT_H
