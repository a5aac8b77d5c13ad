// StateEstimate: a four-element state, the position (latitude, longitude in
// degrees) followed by two further elements (a velocity, by convention in
// degrees per second), whose covariance is a StateEstimateCovariance.
//
// A plain value type; operator[] takes 0 to 3 and does not check it. Any
// thread may use its own copies.
#ifndef LODESTACK_MATH_STATEESTIMATE_H
#define LODESTACK_MATH_STATEESTIMATE_H

#include "lodestack/core/Export.h"

namespace lodestack {

class LODESTACK_EXPORT StateEstimate {
 public:
  static constexpr unsigned int kSize = 4;

  StateEstimate() : x_{0.0, 0.0, 0.0, 0.0} {}
  StateEstimate(double x0, double x1, double x2, double x3) : x_{x0, x1, x2, x3} {}

  // Always 4.
  unsigned int size() const { return kSize; }
  void clear() { x_[0] = x_[1] = x_[2] = x_[3] = 0.0; }

  double& operator[](unsigned int index) { return x_[index]; }
  double operator[](unsigned int index) const { return x_[index]; }

  StateEstimate& operator+=(const StateEstimate& other) {
    for (unsigned int i = 0; i < kSize; ++i) x_[i] += other.x_[i];
    return *this;
  }
  bool operator==(const StateEstimate& other) const {
    return x_[0] == other.x_[0] && x_[1] == other.x_[1] && x_[2] == other.x_[2] &&
           x_[3] == other.x_[3];
  }
  bool operator!=(const StateEstimate& other) const { return !(*this == other); }

 private:
  double x_[kSize];
};

}  // namespace lodestack

#endif  // LODESTACK_MATH_STATEESTIMATE_H
