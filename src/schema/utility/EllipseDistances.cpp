// Distances and the overlap test between two uncertainty ellipses.
#include <cmath>
#include <limits>

#include "lodestack/math/Midpoint.h"
#include "lodestack/math/ShapeMatrix.h"
#include "lodestack/math/EllipseMath.h"
#include "lodestack/schema/utility/Utility.h"

namespace lodestack {
namespace schema {

namespace {

const double kInfinity = std::numeric_limits<double>::infinity();

// The difference of the centres, latitude first.
void centreDifference(const Midpoint& m1, const Midpoint& m2, double d[2]) {
  d[0] = m2.latitude() - m1.latitude();
  d[1] = wrapLongitudeDifference(m2.longitude() - m1.longitude());
}

}  // namespace

double Utility::mDistance(const Midpoint& m1, const ShapeMatrix& s1, const Midpoint& m2,
                          const ShapeMatrix& s2) {
  double d[2];
  centreDifference(m1, m2, d);
  if (d[0] == 0.0 && d[1] == 0.0) return 0.0;
  Symmetric2by2Matrix inverse;
  if (!invertRelative(s1 + s2, inverse)) return kInfinity;
  return quadraticForm(inverse, d, d);
}

double Utility::bDistance(const Midpoint& m1, const ShapeMatrix& s1, const Midpoint& m2,
                          const ShapeMatrix& s2) {
  double d[2];
  centreDifference(m1, m2, d);
  const Symmetric2by2Matrix mean = (s1 + s2) / 2.0;
  const double det1 = s1.det(), det2 = s2.det(), det = mean.det();
  Symmetric2by2Matrix inverse;
  if (!(det1 > 0.0 && det2 > 0.0 && det > 0.0) || !invertRelative(mean, inverse))
    return kInfinity;
  // Logarithms taken apart: the determinants of small ellipses in degrees^2
  // are tiny, and their product could underflow.
  return 0.125 * quadraticForm(inverse, d, d) +
         0.5 * (std::log(det) - 0.5 * (std::log(det1) + std::log(det2)));
}

bool Utility::intersect(const Midpoint& m1, const ShapeMatrix& s1, const Midpoint& m2,
                        const ShapeMatrix& s2) {
  // The ellipses overlap when d lies in their Minkowski sum, which is the
  // intersection over s in (0, 1) of the ellipses of shape
  // S1 / (1 - s) + S2 / s. So they overlap exactly when
  //   f(s) = s (1 - s) d^T (s S1 + (1 - s) S2)^-1 d
  // stays at most 1 on (0, 1); f is concave there, so a golden-section
  // search finds its maximum.
  double d[2];
  centreDifference(m1, m2, d);
  if (d[0] == 0.0 && d[1] == 0.0) return true;
  Symmetric2by2Matrix unused;
  if (!invertRelative(s1 + s2, unused)) return false;
  auto f = [&](double s) {
    const Symmetric2by2Matrix m(s * s1[0] + (1.0 - s) * s2[0], s * s1[1] + (1.0 - s) * s2[1],
                                s * s1[2] + (1.0 - s) * s2[2]);
    const double det = m.det();
    if (!(det > 0.0)) return 0.0;
    const Symmetric2by2Matrix adj(m[2], -m[1], m[0]);
    return s * (1.0 - s) * quadraticForm(adj, d, d) / det;
  };
  const double g = 0.6180339887498949;  // (sqrt 5 - 1) / 2
  double lo = 0.0, hi = 1.0;
  double x1 = hi - g * (hi - lo), x2 = lo + g * (hi - lo);
  double f1 = f(x1), f2 = f(x2);
  for (int i = 0; i < 80 && f1 <= 1.0 && f2 <= 1.0; ++i) {
    if (f1 < f2) {
      lo = x1;
      x1 = x2;
      f1 = f2;
      x2 = lo + g * (hi - lo);
      f2 = f(x2);
    } else {
      hi = x2;
      x2 = x1;
      f2 = f1;
      x1 = hi - g * (hi - lo);
      f1 = f(x1);
    }
  }
  return f1 <= 1.0 && f2 <= 1.0;
}

}  // namespace schema
}  // namespace lodestack
