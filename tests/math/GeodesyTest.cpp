// Coordinate coding, conversions and geodesy of Utility; the geodesy is
// compared with GeographicLib.
#include <GeographicLib/Ellipsoid.hpp>
#include <GeographicLib/Geodesic.hpp>
#include <gtest/gtest.h>

#include <algorithm>
#include <climits>
#include <cmath>
#include <random>

#include "lodestack/schema/utility/Utility.h"

using lodestack::schema::Utility;

namespace {

const double kPi = 3.141592653589793;

// The absolute difference of two bearings in degrees, across north.
double angleDifference(double a, double b) { return std::fabs(std::remainder(a - b, 360.0)); }

}  // namespace

TEST(Geodesy, CoordinateCodingAndAngleConversions) {
  EXPECT_EQ(Utility::latitude(90.0), INT_MAX);
  EXPECT_EQ(Utility::latitude(90.0001), INT_MAX);
  EXPECT_EQ(Utility::latitude(std::nan("")), 0);
  EXPECT_EQ(Utility::longitude(-180.0), INT_MIN);
  EXPECT_EQ(Utility::latitude(-1e-300), -1) << "codes round down";
  EXPECT_LT(Utility::wgs84Latitude(INT_MAX), 90.0);
  EXPECT_EQ(Utility::wgs84Latitude(Utility::latitude(45.0)), 45.0);
  // Coding then decoding loses less than one unit and never rounds up.
  std::mt19937_64 random(7);
  std::uniform_real_distribution<double> lon(-180.0, 180.0);
  for (int i = 0; i < 1000; ++i) {
    const double d = lon(random), back = Utility::wgs84Longitude(Utility::longitude(d));
    ASSERT_TRUE(back <= d && d - back < 180.0 / 2147483648.0) << d;
  }

  EXPECT_EQ(Utility::toRadians(200.0), kPi);
  EXPECT_EQ(Utility::toRadians(-1.0), 0.0);
  EXPECT_EQ(Utility::toDegrees(-1.0f), 0.0);
  EXPECT_EQ(Utility::toDegrees(4.0f), 180.00000500895632) << "clamped to pi as a float";
  EXPECT_TRUE(std::isnan(Utility::normalizedSinOrCosValue(std::nan(""))));
}

// Metres per degree are the radii of curvature (prime vertical times
// cos phi along the parallel, meridional along the meridian) times pi/180.
TEST(Geodesy, DegreeInMetersMatchesGeographicLibRadiiOfCurvature) {
  using GeographicLib::Ellipsoid;
  const Ellipsoid wgs84(GeographicLib::Constants::WGS84_a(), GeographicLib::Constants::WGS84_f());
  // The ellipsoid of the library's own eccentricity constant: e^2 =
  // 0.006694380004260814 (from the rounded semi-minor axis 6356752.3142 m)
  // sits 1.4e-11 above WGS 84's f (2 - f).
  const Ellipsoid own(6378137.0, 1.0 - std::sqrt(1.0 - 0.006694380004260814));
  for (double latitude = -89.99; latitude <= 89.995; latitude += 0.01) {
    double lon = 0.0, lat = 0.0;
    ASSERT_TRUE(Utility::degreeInMeters(latitude, lon, lat)) << latitude;
    auto relative = [&](const Ellipsoid& e) {
      return std::max(std::fabs(lon / (e.CircleRadius(latitude) * kPi / 180.0) - 1.0),
                      std::fabs(lat / (e.MeridionalCurvatureRadius(latitude) * kPi / 180.0) - 1.0));
    };
    // Towards a pole cos(phi) of a latitude in radians loses relative
    // precision, about 2e-16 / cos(phi).
    ASSERT_LT(relative(own), 1e-15 + 4e-16 / std::cos(latitude * kPi / 180.0)) << latitude;
    ASSERT_LT(relative(wgs84), 3e-11) << latitude;
  }
  // The poles have no longitude scale: both results are cleared.
  double lon = 1.0, lat = 1.0;
  EXPECT_FALSE(Utility::meterInDegrees(90.0, lon, lat));
  EXPECT_TRUE(lon == 0.0 && lat == 0.0);
  lon = lat = 1.0;
  EXPECT_FALSE(Utility::degreeInMeters(-90.0, lon, lat));
  EXPECT_TRUE(lon == 0.0 && lat == 0.0);
}

TEST(Geodesy, DistanceAndBearingMatchGeographicLibOnTheSphere) {
  const GeographicLib::Geodesic sphere(6371010.0, 0.0);
  std::mt19937_64 random(2024);
  std::uniform_real_distribution<double> unit(-1.0, 1.0);
  // acos of the cosine of the central angle delta loses precision towards
  // its ends: a rounding of the cosine moves delta by about 1e-16 / sin delta.
  int compared = 0;
  for (int i = 0; i < 20000; ++i) {
    const double lat1 = std::asin(unit(random)) * 180.0 / kPi, lon1 = 180.0 * unit(random);
    const double lat2 = std::asin(unit(random)) * 180.0 / kPi, lon2 = 180.0 * unit(random);
    double s12, azi1, azi2;
    const double delta = sphere.Inverse(lat1, lon1, lat2, lon2, s12, azi1, azi2) * kPi / 180.0;
    if (delta < 0.01 || delta > kPi - 0.01) continue;
    ++compared;
    double metres = 0.0, degrees = 0.0;
    ASSERT_TRUE(Utility::distance(lat1, lon1, lat2, lon2, metres));
    ASSERT_TRUE(Utility::bearing(lat1, lon1, lat2, lon2, degrees));
    ASSERT_TRUE(degrees >= 0.0 && degrees < 360.0) << degrees;
    ASSERT_LT(std::fabs(metres / s12 - 1.0), 8e-16 / (delta * std::sin(delta)) + 1e-15) << delta;
    const bool middle = delta > 1.0 && delta < kPi - 1.0;
    ASSERT_LT(angleDifference(degrees, azi1) / 360.0, middle ? 1e-15 : 1e-14)
        << "share of a turn, delta " << delta;
  }
  EXPECT_GT(compared, 19000);

  // Special cases: the distance still agrees (less precisely, acos is flat
  // near the ends), the bearing follows its stated conventions.
  struct Special { double lat1, lon1, lat2, lon2, bearing, distanceTolerance; };
  const Special specials[] = {
      {10.0, 20.0, -10.0, -160.0, 0.0, 1e-7},      // antipodes
      {30.0, 10.0, 30.0, 190.0, 0.0, 1e-12},       // half a turn along a parallel
      {-30.0, 10.0, -30.0, -170.0, 180.0, 1e-12},  // the same, southern
      {90.0, 0.0, 10.0, 45.0, 180.0, 1e-12},       // from the north pole
      {-90.0, 0.0, 10.0, 45.0, 0.0, 1e-12},        // from the south pole
      {10.0, 45.0, 90.0, 0.0, 0.0, 1e-12},         // to the north pole
      {10.0, 45.0, -90.0, 0.0, 180.0, 1e-12},      // to the south pole
      {48.0, 11.0, 48.0, 11.0, 0.0, 0.0},          // identical
      {48.0, 11.0, 48.0 + 1e-10, 11.0, 0.0, 1.0},  // closer than the cosine resolves
  };
  for (const Special& c : specials) {
    SCOPED_TRACE(testing::Message() << "special case " << &c - specials);
    double s12, azi1, azi2, metres = -1.0, degrees = -1.0;
    sphere.Inverse(c.lat1, c.lon1, c.lat2, c.lon2, s12, azi1, azi2);
    ASSERT_TRUE(Utility::distance(c.lat1, c.lon1, c.lat2, c.lon2, metres));
    ASSERT_TRUE(Utility::bearing(c.lat1, c.lon1, c.lat2, c.lon2, degrees));
    const double relative = s12 > 0.0 ? std::fabs(metres / s12 - 1.0) : std::fabs(metres);
    EXPECT_LE(relative, c.distanceTolerance) << metres << " m";
    EXPECT_LE(angleDifference(degrees, c.bearing), 1e-12) << degrees << " degrees";
  }
}
