#include "lodestack/math/ShapeMatrix.h"

#include <cmath>

#include "lodestack/math/Midpoint.h"
#include "lodestack/math/StateEstimate.h"
#include "lodestack/math/StateEstimateCovariance.h"
#include "lodestack/math/EllipseMath.h"
#include "lodestack/schema/utility/Utility.h"

namespace lodestack {

using schema::Utility;

bool ShapeMatrix::ellConvert(double latitude, double semiMajor, double semiMinor, double angle) {
  double kLon = 0.0, kLat = 0.0;  // degrees per metre
  if (!Utility::meterInDegrees(latitude, kLon, kLat)) return false;
  const double theta = angle * 3.141592653589793 / 180.0;
  const double s = std::sin(theta), c = std::cos(theta);
  const double a = semiMajor * semiMajor, b = semiMinor * semiMinor;
  // A u u^T + B v v^T with u = (cos, sin) the major axis in (north, east)
  // and v = (-sin, cos), scaled from metres to degrees per axis.
  m_[0] = kLat * kLat * (b * s * s + a * c * c);
  m_[1] = kLat * kLon * s * c * (a - b);
  m_[2] = kLon * kLon * (b * c * c + a * s * s);
  return true;
}

bool ShapeMatrix::increaseUncertainty(double latitude, double q, double dt, double x,
                                      double& accumulated) {
  const double r = std::sqrt(q * dt);
  ShapeMatrix growth;
  if (!growth.ellConvert(latitude, r, r, 0.0)) return false;
  *this += growth;
  accumulated += q * x;
  return true;
}

bool ShapeMatrix::increaseUncertaintyAtConstRate(double latitude, double rate, double dt) {
  double mLon = 0.0, mLat = 0.0;  // metres per degree
  if (!Utility::degreeInMeters(latitude, mLon, mLat)) return false;
  const double step = rate * std::sqrt(dt);
  // (sigma + step)^2 - sigma^2 added per axis, in metres^2, then back in
  // degrees^2.
  const double sigmaLat = std::sqrt(mLat * (mLat * m_[0]));
  const double sigmaLon = std::sqrt(mLon * (mLon * m_[2]));
  m_[0] += (rate * rate * dt + 2.0 * sigmaLat * step) / (mLat * mLat);
  m_[2] += (rate * rate * dt + 2.0 * sigmaLon * step) / (mLon * mLon);
  return true;
}

bool ShapeMatrix::reweightMeasurement(const Midpoint& measurement, const StateEstimate& state,
                                      const StateEstimateCovariance& covariance,
                                      Midpoint& combined) {
  // Kalman update of the position x (covariance P) by the measurement z
  // (covariance R): K = P (P + R)^-1, x' = x + K (z - x), P' = P - P (P + R)^-1 P.
  // The same as the product of the two Gaussians, P'^-1 = P^-1 + R^-1,
  // without needing either matrix to be invertible.
  const ShapeMatrix p = covariance.positionBlock();
  Symmetric2by2Matrix sumInverse;
  if (!invertRelative(p + *this, sumInverse)) return false;
  const double innovation[2] = {measurement.latitude() - state[0],
                                wrapLongitudeDifference(measurement.longitude() - state[1])};
  // K = P S^-1 as a full matrix.
  const double k00 = p[0] * sumInverse[0] + p[1] * sumInverse[1];
  const double k01 = p[0] * sumInverse[1] + p[1] * sumInverse[2];
  const double k10 = p[1] * sumInverse[0] + p[2] * sumInverse[1];
  const double k11 = p[1] * sumInverse[1] + p[2] * sumInverse[2];
  double longitude = state[1] + k10 * innovation[0] + k11 * innovation[1];
  if (longitude >= 180.0 || longitude < -180.0)
    longitude -= 360.0 * std::floor((longitude + 180.0) / 360.0);
  combined = Midpoint(state[0] + k00 * innovation[0] + k01 * innovation[1], longitude);
  Symmetric2by2Matrix reduction;
  reduction.prodmat(p, sumInverse);
  *this = p - reduction;
  return true;
}

}  // namespace lodestack
