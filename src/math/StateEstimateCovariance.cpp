#include "lodestack/math/StateEstimateCovariance.h"

namespace lodestack {

StateEstimateCovariance::StateEstimateCovariance(double latitudeVariance, double covariance,
                                                 double longitudeVariance) {
  m_[0] = latitudeVariance;
  m_[1] = covariance;
  m_[2] = longitudeVariance;
}

StateEstimateCovariance& StateEstimateCovariance::operator=(const ShapeMatrix& shape) {
  clear();
  m_[0] = shape[0];
  m_[1] = shape[1];
  m_[2] = shape[2];
  return *this;
}

}  // namespace lodestack
