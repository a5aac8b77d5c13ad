// Coordinate coding, conversions and geodesy of Utility; the geodesy is
// compared with GeographicLib.
#include <GeographicLib/Ellipsoid.hpp>
#include <GeographicLib/Geodesic.hpp>
#include <gtest/gtest.h>

#include <algorithm>
#include <climits>
#include <cmath>
#include <cstdio>
#include <random>
#include <vector>

#include "lodestack/schema/utility/Utility.h"

using lodestack::schema::Utility;

namespace {

const double kPi = 3.141592653589793;

// The absolute difference of two bearings in degrees, across north.
double angleDifference(double a, double b) {
  const double d = std::fabs(std::remainder(a - b, 360.0));
  return d;
}

}  // namespace

TEST(Geodesy, CoordinateCodingAndAngleConversions) {
  EXPECT_EQ(Utility::latitude(90.0), INT_MAX);
  EXPECT_EQ(Utility::latitude(-90.0), INT_MIN);
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
  EXPECT_EQ(Utility::toDegrees(4.0f), 180.00000500895632);
  EXPECT_DOUBLE_EQ(Utility::toDegrees(0.5f), 0.5 * 180.0 / kPi);
  EXPECT_TRUE(std::isnan(Utility::normalizedSinOrCosValue(std::nan(""))));
}

TEST(Geodesy, PolesHaveNoLongitudeScale) {
  double lon = 1.0, lat = 1.0;
  EXPECT_FALSE(Utility::meterInDegrees(90.0, lon, lat));
  EXPECT_EQ(lon, 0.0);
  EXPECT_EQ(lat, 0.0);
  lon = lat = 1.0;
  EXPECT_FALSE(Utility::degreeInMeters(-90.0, lon, lat));
  EXPECT_EQ(lon, 0.0);
  EXPECT_EQ(lat, 0.0);
  ASSERT_TRUE(Utility::degreeInMeters(0.0, lon, lat));
  EXPECT_NEAR(lon, 111319.5, 0.1);
  EXPECT_NEAR(lat, 110574.3, 0.1);
}

// Metres per degree are the radii of curvature (prime vertical times
// cos phi along the parallel, meridional along the meridian) times pi/180.
TEST(Geodesy, DegreeInMetersMatchesGeographicLibRadiiOfCurvature) {
  using GeographicLib::Ellipsoid;
  const Ellipsoid wgs84(GeographicLib::Constants::WGS84_a(), GeographicLib::Constants::WGS84_f());
  // The ellipsoid of the library's own eccentricity constant.
  const Ellipsoid own(6378137.0, 1.0 - std::sqrt(1.0 - 0.006694380004260814));
  // Towards a pole cos(phi) of a latitude in radians loses relative
  // precision, about 2e-16 / cos(phi); the figures within 60 degrees of the
  // equator are reported apart.
  double worst[2][2] = {};  // [beyond 60 degrees][same eccentricity]
  for (double latitude = -89.99; latitude <= 89.995; latitude += 0.01) {
    double lon = 0.0, lat = 0.0;
    ASSERT_TRUE(Utility::degreeInMeters(latitude, lon, lat)) << latitude;
    for (const Ellipsoid* e : {&wgs84, &own}) {
      const double refLon = e->CircleRadius(latitude) * kPi / 180.0;
      const double refLat = e->MeridionalCurvatureRadius(latitude) * kPi / 180.0;
      const double relative =
          std::max(std::fabs(lon / refLon - 1.0), std::fabs(lat / refLat - 1.0));
      if (e == &own) {
        ASSERT_LT(relative, 1e-15 + 4e-16 / std::cos(latitude * kPi / 180.0)) << latitude;
      }
      double& slot = worst[std::fabs(latitude) > 60.0][e == &own];
      slot = std::max(slot, relative);
    }
  }
  std::printf("degreeInMeters, largest relative difference within 60 degrees of the equator: "
              "%.3g against WGS 84, %.3g against the same eccentricity; beyond: %.3g, %.3g\n",
              worst[0][0], worst[0][1], worst[1][0], worst[1][1]);
  // e^2 = 0.006694380004260814 (from the rounded semi-minor axis 6356752.3142
  // m) sits 1.4e-11 above WGS 84's f (2 - f).
  EXPECT_LT(std::max(worst[0][0], worst[1][0]), 3e-11);
}

TEST(Geodesy, DistanceAndBearingMatchGeographicLibOnTheSphere) {
  const GeographicLib::Geodesic sphere(6371010.0, 0.0);
  std::mt19937_64 random(2024);
  std::uniform_real_distribution<double> unit(-1.0, 1.0);
  struct Pair { double lat1, lon1, lat2, lon2; };
  std::vector<Pair> general;
  for (int i = 0; i < 20000; ++i)
    general.push_back({std::asin(unit(random)) * 180.0 / kPi, 180.0 * unit(random),
                       std::asin(unit(random)) * 180.0 / kPi, 180.0 * unit(random)});
  // acos of the cosine of the central angle delta loses precision towards
  // its ends: a rounding of the cosine moves delta by about 1e-16 / sin delta.
  double worstDistance = 0.0, worstBearing = 0.0, worstMidDistance = 0.0, worstMidBearing = 0.0;
  int compared = 0;
  for (const Pair& p : general) {
    double s12, azi1, azi2;
    const double delta = sphere.Inverse(p.lat1, p.lon1, p.lat2, p.lon2, s12, azi1, azi2) *
                         kPi / 180.0;
    if (delta < 0.01 || delta > kPi - 0.01) continue;
    ++compared;
    double metres = 0.0, degrees = 0.0;
    ASSERT_TRUE(Utility::distance(p.lat1, p.lon1, p.lat2, p.lon2, metres));
    ASSERT_TRUE(Utility::bearing(p.lat1, p.lon1, p.lat2, p.lon2, degrees));
    ASSERT_GE(degrees, 0.0);
    ASSERT_LT(degrees, 360.0);
    const double relative = std::fabs(metres / s12 - 1.0);
    ASSERT_LT(relative, 8e-16 / (delta * std::sin(delta)) + 1e-15) << delta;
    worstDistance = std::max(worstDistance, relative);
    const double turn = angleDifference(degrees, azi1) / 360.0;
    worstBearing = std::max(worstBearing, turn);
    if (delta > 1.0 && delta < kPi - 1.0) {
      worstMidDistance = std::max(worstMidDistance, relative);
      worstMidBearing = std::max(worstMidBearing, turn);
    }
  }
  std::printf("%d random pairs: largest relative difference in distance %.3g, in bearing %.3g "
              "of a turn; for central angles from 1 to pi - 1 rad: %.3g and %.3g\n",
              compared, worstDistance, worstBearing, worstMidDistance, worstMidBearing);
  EXPECT_LT(worstMidDistance, 2e-15);
  EXPECT_LT(worstBearing, 1e-14);
  EXPECT_LT(worstMidBearing, 1e-15);

  // Special cases: the distance still agrees (less precisely, acos is flat
  // near the ends), the bearing follows its stated conventions.
  struct Special { double lat1, lon1, lat2, lon2, bearing, distanceTolerance; };
  const Special specials[] = {
      {10.0, 20.0, -10.0, -160.0, 0.0, 1e-7},      // antipodes
      {0.0, 0.0, 0.0, 180.0, 0.0, 1e-7},           // antipodes on the equator
      {30.0, 10.0, 30.0, 190.0, 0.0, 1e-12},       // half a turn along a parallel
      {-30.0, 10.0, -30.0, -170.0, 180.0, 1e-12},  // the same, southern
      {90.0, 0.0, 10.0, 45.0, 180.0, 1e-12},       // from the north pole
      {-90.0, 0.0, 10.0, 45.0, 0.0, 1e-12},        // from the south pole
      {90.0, 0.0, -90.0, 0.0, 180.0, 1e-7},        // pole to pole
      {10.0, 45.0, 90.0, 0.0, 0.0, 1e-12},         // to the north pole
      {10.0, 45.0, -90.0, 0.0, 180.0, 1e-12},      // to the south pole
      {48.0, 11.0, 48.0, 11.0, 0.0, 0.0},          // identical
      {48.0, 11.0, 48.0 + 1e-10, 11.0, 0.0, 1.0},  // closer than the cosine resolves
  };
  double worstSpecial = 0.0;
  for (const Special& c : specials) {
    double s12, azi1, azi2, metres = -1.0, degrees = -1.0;
    sphere.Inverse(c.lat1, c.lon1, c.lat2, c.lon2, s12, azi1, azi2);
    ASSERT_TRUE(Utility::distance(c.lat1, c.lon1, c.lat2, c.lon2, metres));
    ASSERT_TRUE(Utility::bearing(c.lat1, c.lon1, c.lat2, c.lon2, degrees));
    const double relative = s12 > 0.0 ? std::fabs(metres / s12 - 1.0) : std::fabs(metres);
    if (s12 > 1.0) worstSpecial = std::max(worstSpecial, relative);
    EXPECT_LE(relative, c.distanceTolerance) << c.lat1 << "," << c.lon1 << " to " << c.lat2
                                             << "," << c.lon2 << ": " << metres << " m";
    EXPECT_LE(angleDifference(degrees, c.bearing), 1e-12)
        << c.lat1 << "," << c.lon1 << " to " << c.lat2 << "," << c.lon2 << ": " << degrees;
  }
  std::printf("special cases: largest relative difference %.3g in distance\n", worstSpecial);
}
