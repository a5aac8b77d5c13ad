// EllipseMath: small helpers of the uncertainty-ellipse computations, shared
// by ShapeMatrix and the ellipse distances of schema::Utility. Header-only,
// pure functions; any thread.
//
// Symmetric2by2Matrix::invmat refuses determinants below an absolute bound
// of 1e-19, which covariances in degrees^2 of ellipses a few metres across
// fall under. Here a matrix is singular only when its determinant vanishes
// to working precision relative to the size of its elements.
#ifndef LODESTACK_MATH_ELLIPSEMATH_H
#define LODESTACK_MATH_ELLIPSEMATH_H

#include <cfloat>
#include <cmath>

#include "lodestack/math/Symmetric2by2Matrix.h"

namespace lodestack {

// False when m is singular or not finite; otherwise `inverse` is m^-1.
inline bool invertRelative(const Symmetric2by2Matrix& m, Symmetric2by2Matrix& inverse) {
  const double det = m.det();
  const double scale = std::fabs(m[0] * m[2]) + m[1] * m[1];
  if (!(std::fabs(det) > 8.0 * DBL_EPSILON * scale) || !std::isfinite(det)) return false;
  inverse = Symmetric2by2Matrix(m[2] / det, -m[1] / det, m[0] / det);
  return true;
}

// x^T m y for 2-vectors x, y.
inline double quadraticForm(const Symmetric2by2Matrix& m, const double x[2], const double y[2]) {
  return m[0] * x[0] * y[0] + m[1] * (x[0] * y[1] + x[1] * y[0]) + m[2] * x[1] * y[1];
}

// A longitude difference in degrees brought into [-180, 180], so that two
// ellipses either side of the 180th meridian are seen as neighbours.
inline double wrapLongitudeDifference(double degrees) {
  if (degrees > 180.0 || degrees < -180.0) degrees = std::remainder(degrees, 360.0);
  return degrees;
}

}  // namespace lodestack

#endif  // LODESTACK_MATH_ELLIPSEMATH_H
