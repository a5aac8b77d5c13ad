// StateEstimateCovariance: the covariance of a StateEstimate, a symmetric
// 4 x 4 matrix whose upper 2 x 2 block is the horizontal position
// covariance in degrees^2 (latitude first, as in a ShapeMatrix).
//
// A plain value type; any thread may use its own copies.
#ifndef LODESTACK_MATH_STATEESTIMATECOVARIANCE_H
#define LODESTACK_MATH_STATEESTIMATECOVARIANCE_H

#include "lodestack/math/ShapeMatrix.h"
#include "lodestack/math/Symmetric4by4Matrix.h"

namespace lodestack {

class LODESTACK_EXPORT StateEstimateCovariance : public Symmetric4by4Matrix {
 public:
  // All elements 0.
  StateEstimateCovariance() = default;
  // The position block (latitude variance, covariance, longitude
  // variance); every other element 0.
  StateEstimateCovariance(double latitudeVariance, double covariance,
                          double longitudeVariance);

  StateEstimateCovariance& operator=(const Symmetric4by4Matrix& other) {
    Symmetric4by4Matrix::operator=(other);
    return *this;
  }
  // Replaces the whole matrix by the horizontal covariance `shape`: the
  // position block takes its elements, every other element becomes 0.
  StateEstimateCovariance& operator=(const ShapeMatrix& shape);

  // The position block as a shape matrix.
  ShapeMatrix positionBlock() const { return ShapeMatrix(m_[0], m_[1], m_[2]); }
};

}  // namespace lodestack

#endif  // LODESTACK_MATH_STATEESTIMATECOVARIANCE_H
