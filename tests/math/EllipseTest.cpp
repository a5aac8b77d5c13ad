// Shape matrices and the ellipse distances of Utility, each checked against
// an independent computation.
#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <limits>
#include <random>

#include "lodestack/math/Midpoint.h"
#include "lodestack/math/ShapeMatrix.h"
#include "lodestack/math/StateEstimate.h"
#include "lodestack/math/StateEstimateCovariance.h"
#include "lodestack/schema/utility/Utility.h"

using namespace lodestack;
using lodestack::schema::Utility;

namespace {

// (x - m)^T S^-1 (x - m), written out.
double quadratic(const ShapeMatrix& s, const Midpoint& m, double x, double y) {
  const double dx = x - m.latitude(), dy = y - m.longitude();
  return (s[2] * dx * dx - 2 * s[1] * dx * dy + s[0] * dy * dy) / s.det();
}

}  // namespace

TEST(ShapeMatrix, EllipseConversion) {
  ShapeMatrix m(1.0, 2.0, 3.0);
  EXPECT_FALSE(m.ellConvert(90.0, 100.0, 50.0, 10.0));
  EXPECT_EQ(m, ShapeMatrix(1.0, 2.0, 3.0)) << "unchanged at a pole";

  // Back in metres the matrix has the semi-axes squared as eigenvalues and
  // the major axis at the angle, clockwise from north.
  const double latitude = 52.0, major = 400.0, minor = 120.0, angle = 30.0;
  double mLon, mLat;
  ASSERT_TRUE(Utility::degreeInMeters(latitude, mLon, mLat));
  ASSERT_TRUE(m.ellConvert(latitude, major, minor, angle));
  const double nn = m[0] * mLat * mLat, ne = m[1] * mLat * mLon, ee = m[2] * mLon * mLon;
  EXPECT_NEAR(nn + ee, major * major + minor * minor, 1e-7);
  EXPECT_NEAR(nn * ee - ne * ne, major * major * minor * minor, 1e-2);
  const double u[2] = {std::cos(angle * M_PI / 180), std::sin(angle * M_PI / 180)};
  EXPECT_NEAR(nn * u[0] * u[0] + 2 * ne * u[0] * u[1] + ee * u[1] * u[1], major * major, 1e-7);
}

TEST(ShapeMatrix, GrowingUncertainty) {
  double mLon, mLat;
  ASSERT_TRUE(Utility::degreeInMeters(40.0, mLon, mLat));
  ShapeMatrix m;
  ASSERT_TRUE(m.ellConvert(40.0, 50.0, 20.0, 60.0));
  const ShapeMatrix before = m;

  double accumulated = 1.0;
  ASSERT_TRUE(m.increaseUncertainty(40.0, 4.0, 25.0, 3.0, accumulated));
  EXPECT_EQ(accumulated, 13.0);
  EXPECT_NEAR((m[0] - before[0]) * mLat * mLat, 100.0, 1e-9) << "a circle of radius 10 m";
  EXPECT_NEAR((m[2] - before[2]) * mLon * mLon, 100.0, 1e-9);
  EXPECT_EQ(m[1], before[1]);
  EXPECT_FALSE(m.increaseUncertainty(-90.0, 4.0, 25.0, 3.0, accumulated));

  m = before;
  ASSERT_TRUE(m.increaseUncertaintyAtConstRate(40.0, 2.0, 9.0));
  EXPECT_NEAR(std::sqrt(m[0]) * mLat, std::sqrt(before[0]) * mLat + 6.0, 1e-9);
  EXPECT_NEAR(std::sqrt(m[2]) * mLon, std::sqrt(before[2]) * mLon + 6.0, 1e-9);
  EXPECT_EQ(m[1], before[1]);
  EXPECT_FALSE(m.increaseUncertaintyAtConstRate(90.0, 2.0, 9.0));
}

// Against the information form of the same fusion: C = (P^-1 + R^-1)^-1,
// x' = C (P^-1 x + R^-1 z).
TEST(ShapeMatrix, ReweightMeasurementIsTheProductOfGaussians) {
  const ShapeMatrix r(1e-6, -3e-7, 3e-6);
  const StateEstimateCovariance p(2e-6, 5e-7, 1e-6);
  const StateEstimate x(47.0, 8.0, 0.1, 0.2);
  const Midpoint z(47.002, 8.001);
  Symmetric2by2Matrix pi, ri, c;
  ASSERT_TRUE(pi.invmat(ShapeMatrix(p[0], p[1], p[2]) / 1e-6));
  ASSERT_TRUE(ri.invmat(r / 1e-6));
  ASSERT_TRUE(c.invmat(pi + ri));
  c *= 1e-6;
  const double v0 = pi[0] * x[0] + pi[1] * x[1] + ri[0] * z.latitude() + ri[1] * z.longitude();
  const double v1 = pi[1] * x[0] + pi[2] * x[1] + ri[1] * z.latitude() + ri[2] * z.longitude();
  const double lat = (c[0] * v0 + c[1] * v1) / 1e-6, lon = (c[1] * v0 + c[2] * v1) / 1e-6;

  ShapeMatrix fused = r;
  Midpoint combined;
  ASSERT_TRUE(fused.reweightMeasurement(z, x, p, combined));
  EXPECT_NEAR(combined.latitude(), lat, 1e-11);
  EXPECT_NEAR(combined.longitude(), lon, 1e-11);
  for (unsigned int i = 0; i < 3; ++i) EXPECT_NEAR(fused[i], c[i], 1e-18) << i;

  // Across the 180th meridian the fused position stays between the two.
  fused = ShapeMatrix(1e-6, 0.0, 1e-6);
  ASSERT_TRUE(fused.reweightMeasurement(Midpoint(0.0, -179.999), StateEstimate(0.0, 179.999, 0, 0),
                                        StateEstimateCovariance(1e-6, 0.0, 1e-6), combined));
  EXPECT_NEAR(std::fabs(combined.longitude()), 180.0, 1e-9);

  fused = ShapeMatrix();
  EXPECT_FALSE(fused.reweightMeasurement(z, x, StateEstimateCovariance(), combined));
}

TEST(EllipseDistance, MahalanobisAndBhattacharyya) {
  const ShapeMatrix s1(1.0, 0.3, 2.0), s2(2.0, -0.5, 1.0);
  const Midpoint a(10.0, 20.0), b(11.0, 20.5);
  // d^T (S1 + S2)^-1 d with S1 + S2 = (3, -0.2, 3), d = (1, 0.5).
  const double det = 3.0 * 3.0 - 0.04;
  EXPECT_NEAR(Utility::mDistance(a, s1, b, s2), (3.0 * 1 + 2 * 0.2 * 0.5 + 3.0 * 0.25) / det,
              1e-14);
  EXPECT_EQ(Utility::mDistance(a, ShapeMatrix(), b, ShapeMatrix()),
            std::numeric_limits<double>::infinity());
  EXPECT_NEAR(Utility::mDistance(Midpoint(0, 179.5), s1, Midpoint(0, -179.5), s2),
              Utility::mDistance(Midpoint(0, 0.0), s1, Midpoint(0, 1.0), s2), 1e-12)
      << "neighbours across the 180th meridian";
  // Small real ellipses (3 m circles) are far from singular.
  ShapeMatrix small;
  ASSERT_TRUE(small.ellConvert(45.0, 3.0, 3.0, 0.0));
  EXPECT_TRUE(std::isfinite(Utility::mDistance(a, small, Midpoint(10.0001, 20.0), small)));

  // Bhattacharyya distance: -ln of the integral of sqrt(p1 p2) over the
  // plane, summed on a fine grid.
  auto density = [](const ShapeMatrix& s, const Midpoint& m, double x, double y) {
    return std::exp(-0.5 * quadratic(s, m, x, y)) / (2 * M_PI * std::sqrt(s.det()));
  };
  double sum = 0.0;
  const double h = 0.02;
  for (double x = 0.0; x <= 21.0; x += h)
    for (double y = 10.0; y <= 31.0; y += h)
      sum += std::sqrt(density(s1, a, x, y) * density(s2, b, x, y));
  EXPECT_NEAR(Utility::bDistance(a, s1, b, s2), -std::log(sum * h * h), 1e-9);
  EXPECT_NEAR(Utility::bDistance(a, s1, a, s1), 0.0, 1e-15);
  EXPECT_EQ(Utility::bDistance(a, s1, b, ShapeMatrix(1.0, 1.0, 1.0)),
            std::numeric_limits<double>::infinity());
}

// Overlap, against a direct search: the smallest value of the second
// ellipse's quadratic form over the filled first ellipse is at most 1.
TEST(EllipseDistance, IntersectAgreesWithSampling) {
  std::mt19937_64 random(5);
  std::uniform_real_distribution<double> uniform(-1.0, 1.0);
  auto randomShape = [&]() {
    const double l00 = 0.1 + std::fabs(uniform(random)), l11 = 0.1 + std::fabs(uniform(random));
    const double l10 = uniform(random);
    return ShapeMatrix(l00 * l00, l00 * l10, l10 * l10 + l11 * l11);  // L L^T
  };
  int overlapping = 0, separate = 0;
  for (int trial = 0; trial < 400; ++trial) {
    const ShapeMatrix s1 = randomShape(), s2 = randomShape();
    const Midpoint m1(2 * uniform(random), 2 * uniform(random));
    const Midpoint m2(2 * uniform(random), 2 * uniform(random));
    const double l00 = std::sqrt(s1[0]), l10 = s1[1] / l00, l11 = std::sqrt(s1[2] - l10 * l10);
    // Zero when the second centre lies inside the first ellipse.
    double smallest = quadratic(s1, m1, m2.latitude(), m2.longitude()) <= 1.0 ? 0.0 : 1e300;
    for (int k = 0; k < 20000; ++k) {
      const double t = 2 * M_PI * k / 20000, c = std::cos(t), s = std::sin(t);
      smallest = std::min(smallest, quadratic(s2, m2, m1.latitude() + l00 * c,
                                              m1.longitude() + l10 * c + l11 * s));
    }
    if (std::fabs(smallest - 1.0) < 1e-3) continue;  // too close to touching to judge
    const bool expected = smallest <= 1.0;
    (expected ? overlapping : separate)++;
    EXPECT_EQ(Utility::intersect(m1, s1, m2, s2), expected) << "trial " << trial;
    EXPECT_EQ(Utility::intersect(m2, s2, m1, s1), expected) << "trial " << trial << " swapped";
  }
  EXPECT_GT(overlapping, 50);
  EXPECT_GT(separate, 50);
  // Points: inside an ellipse, outside it, and two points.
  const ShapeMatrix unit(1.0, 0.0, 1.0);
  EXPECT_TRUE(Utility::intersect(Midpoint(0, 0), unit, Midpoint(0.6, 0.6), ShapeMatrix()));
  EXPECT_FALSE(Utility::intersect(Midpoint(0, 0), unit, Midpoint(0.8, 0.8), ShapeMatrix()));
  EXPECT_TRUE(Utility::intersect(Midpoint(1, 1), ShapeMatrix(), Midpoint(1, 1), ShapeMatrix()));
  EXPECT_FALSE(Utility::intersect(Midpoint(1, 1), ShapeMatrix(), Midpoint(1, 2), ShapeMatrix()));
}
